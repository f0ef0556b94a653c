// The built plug-in file as the host loads it: through QPluginLoader, not
// linked in. Nothing of the plug-in's code is part of this program.

#include "IPluginObjectBase.h"
#include "RequestSenderInfo.h"
#include "TestTunnel.h"

#include "IFrameworkTools.h"

#include <QJsonObject>
#include <QPluginLoader>

#include <gtest/gtest.h>

namespace {

const QString PluginFile = QStringLiteral(RECSCHED_PLUGIN_FILE);
const char *const Iid = "com.NORAVEL.PluginServer.PluginInterface";
const char *const ClassName = "PluginRecordingScheduleSettingSrv";

struct Framework : IFrameworkTools
{
    IKoltTunnelClient *tunnel = nullptr;
    IKoltTunnelClient *GetTunnelClient() override { return tunnel; }
};

class PluginLoaderTest : public ::testing::Test
{
protected:
    void SetUp() override { ASSERT_TRUE(loader.load()) << loader.errorString().toStdString(); }
    QPluginLoader loader{PluginFile};
};

TEST_F(PluginLoaderTest, MetadataNamesTheInterfaceClassAndPluginId)
{
    const QJsonObject metaData = loader.metaData();
    EXPECT_EQ(metaData.value(QLatin1String("IID")).toString(), QLatin1String(Iid));
    EXPECT_EQ(metaData.value(QLatin1String("className")).toString(), QLatin1String(ClassName));
    const QJsonObject own = metaData.value(QLatin1String("MetaData")).toObject();
    EXPECT_EQ(own.keys(), QStringList{QStringLiteral("PluginID")});
    EXPECT_EQ(own.value(QLatin1String("PluginID")).toString(),
              QStringLiteral("942E5F3F02EE4D7C879BADCD754F983C"));
    // The header carries the Qt version of the build, major and minor.
    EXPECT_EQ(metaData.value(QLatin1String("version")).toInt(),
              QT_VERSION_MAJOR << 16 | QT_VERSION_MINOR << 8);
}

TEST_F(PluginLoaderTest, HandsOutOneInstance)
{
    QObject *const first = loader.instance();
    ASSERT_NE(first, nullptr);
    EXPECT_EQ(loader.instance(), first);
    QPluginLoader second(PluginFile);
    EXPECT_EQ(second.instance(), first);
    EXPECT_EQ(first->parent(), nullptr);
}

TEST_F(PluginLoaderTest, InstanceIsAPluginObjectBase)
{
    QObject *const instance = loader.instance();
    ASSERT_NE(instance, nullptr);
    IPluginObjectBase *const plugin = qobject_cast<IPluginObjectBase *>(instance);
    ASSERT_NE(plugin, nullptr);
    EXPECT_EQ(static_cast<QObject *>(plugin), instance);
}

struct Cast
{
    const char *name;
    const char *className;
    bool answersItself;
};

void PrintTo(const Cast &cast, std::ostream *os)
{
    *os << cast.className;
}

class MetaCast : public PluginLoaderTest, public ::testing::WithParamInterface<Cast>
{};

TEST_P(MetaCast, AnswersItsClassAndInterfaceOnly)
{
    QObject *const instance = loader.instance();
    ASSERT_NE(instance, nullptr);
    void *const cast = instance->qt_metacast(GetParam().className);
    if (GetParam().answersItself)
        EXPECT_EQ(cast, static_cast<void *>(instance));
    else
        EXPECT_EQ(cast, nullptr);
}

INSTANTIATE_TEST_SUITE_P(
    PluginLoader, MetaCast,
    ::testing::Values(Cast{"InterfaceIdentifier", Iid, true}, Cast{"ClassName", ClassName, true},
                      Cast{"BaseClassNameIsNotAnswered", "IPluginObjectBase", false},
                      Cast{"UnknownName", "SomethingElse", false}),
    [](const auto &info) { return std::string(info.param.name); });

TEST_F(PluginLoaderTest, MetaObjectSitsOnQObjectWithNothingOfItsOwn)
{
    const QMetaObject *const meta = loader.instance()->metaObject();
    EXPECT_STREQ(meta->className(), ClassName);
    EXPECT_EQ(meta->superClass(), &QObject::staticMetaObject);
    EXPECT_EQ(meta->methodCount(), QObject::staticMetaObject.methodCount());
    EXPECT_EQ(meta->propertyCount(), QObject::staticMetaObject.propertyCount());
    EXPECT_EQ(meta->classInfoCount(), 0);
}

TEST_F(PluginLoaderTest, LoadedPluginInitialisesAndAnswers)
{
    auto *const plugin = qobject_cast<IPluginObjectBase *>(loader.instance());
    ASSERT_NE(plugin, nullptr);
    Framework noTunnel;
    EXPECT_FALSE(plugin->InitialPluginBase(&noTunnel));
    TestTunnel tunnel;
    Framework framework;
    framework.tunnel = &tunnel;
    EXPECT_TRUE(plugin->InitialPluginBase(&framework));

    int replies = 0;
    QString code;
    plugin->Request(QStringLiteral("NoSuchCommand"), QVariant(), RequestSenderInfo{},
                    [&](bool, const QString &resultCode, const QString &, const QVariant &) {
                        ++replies;
                        code = resultCode;
                    });
    EXPECT_EQ(replies, 1);
    EXPECT_EQ(code, QStringLiteral("-1"));
    // Leave the loaded instance as it was for the host: without the tunnel
    // that is about to go.
    delete plugin;
}

TEST_F(PluginLoaderTest, LoadedPluginAnswersAQueryThroughTheTunnel)
{
    auto *const plugin = qobject_cast<IPluginObjectBase *>(loader.instance());
    ASSERT_NE(plugin, nullptr);
    TestTunnel tunnel;
    Framework framework;
    framework.tunnel = &tunnel;
    ASSERT_TRUE(plugin->InitialPluginBase(&framework));
    tunnel.queueAnswer(
        {true, QStringLiteral("0"),
         QStringLiteral("<GetRecTmcardRes><Tmcard><Revision>2</Revision><TmcardID>7"
                        "</TmcardID><Name>KOLT2 Customize Recording</Name><Mapping>"
                        "<Ele><Frame><RepeatMod>Weekly</RepeatMod><DayList><Ele "
                        "B=\"6.0\"/></DayList><Intervals><Ele B=\"1800\" "
                        "E=\"86400\"/></Intervals></Frame><RecMode>Continuous"
                        "</RecMode></Ele></Mapping><CamList><Cam><Name>C_4</Name>"
                        "<GrpID>2</GrpID></Cam></CamList></Tmcard></GetRecTmcardRes>"),
         false});

    QVariant data;
    plugin->Request(
        QStringLiteral("GetScheduleRecInfo"), QVariant(), RequestSenderInfo{},
        [&](bool, const QString &, const QString &, const QVariant &value) { data = value; });
    EXPECT_EQ(tunnel.commands(), QStringList{QStringLiteral("GetRecTmcard")});
    EXPECT_EQ(data.toMap(),
              (QVariantMap{{QStringLiteral("RecScheduleType"), 2},
                           {QStringLiteral("CustomizeContent"),
                            QStringLiteral("{\"Rectangles\":[{\"Bottom\":24,\"Left\":5,"
                                           "\"RecordingMode\":\"Continuous\",\"Right\":6,"
                                           "\"Top\":0.5}]}")}}));
    delete plugin;
}

TEST_F(PluginLoaderTest, DeletedInstanceIsMadeAgain)
{
    delete loader.instance();
    QObject *const again = loader.instance();
    ASSERT_NE(again, nullptr);
    EXPECT_NE(qobject_cast<IPluginObjectBase *>(again), nullptr);
}

} // namespace

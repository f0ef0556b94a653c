// The plug-in as a host sees it: the built file loaded through QPluginLoader
// (nothing of its code is linked in), its trace records read from the file
// that the real trace-log library beside it writes.

#include "IPluginObjectBase.h"
#include "IResponser.h"
#include "LocalFrameworkTools.h"
#include "QtPrinters.h"
#include "ReplyRecorder.h"
#include "RequestSenderInfo.h"
#include "TestTunnel.h"

#include <QFile>
#include <QJsonObject>
#include <QPluginLoader>
#include <QTemporaryDir>

#include <gtest/gtest.h>

using namespace Qt::StringLiterals;

namespace {

struct CountingResponser final : IResponser
{
    int calls = 0;
    void Respond(bool, const QString &, const QString &, const QVariant &) override { ++calls; }
};

class Frame : public ::testing::Test
{
protected:
    // The library reads its configuration when the plug-in loads it.
    static void SetUpTestSuite()
    {
        qputenv("QIRNLOG_FILE", logFile().toLocal8Bit());
        qputenv("QIRNLOG_LEVEL", "5");
        ASSERT_TRUE(loader().load()) << loader().errorString().toStdString();
    }
    static QPluginLoader &loader()
    {
        static QPluginLoader loader(QStringLiteral(RECSCHED_PLUGIN_FILE));
        return loader;
    }
    static QString logFile()
    {
        static const QTemporaryDir dir;
        return dir.filePath(u"trace.log"_s);
    }
    // "level text" of each record written since the test began.
    static QStringList records()
    {
        QFile file(logFile());
        QStringList result;
        for (const QString &line : file.open(QIODevice::ReadOnly)
                                       ? QString::fromUtf8(file.readAll()).split(u'\n')
                                       : QStringList()) {
            if (!line.isEmpty())
                result << line.section(u' ', 2, 2) + u' ' + line.section(u' ', 4);
        }
        return result;
    }

    void SetUp() override { QFile::resize(logFile(), 0); }
    // The next test gets a new plug-in object.
    void TearDown() override { delete loader().instance(); }

    IPluginObjectBase *plugin() { return qobject_cast<IPluginObjectBase *>(loader().instance()); }

    TestTunnel tunnel;
    LocalFrameworkTools tools{&tunnel};
    LocalFrameworkTools noTunnel{nullptr};
    ReplyRecorder reply;
};

TEST_F(Frame, LoadsAsTheHostLoadsIt)
{
    const QJsonObject metaData = loader().metaData();
    EXPECT_EQ(metaData[u"IID"_s].toString(), u"com.NORAVEL.PluginServer.PluginInterface"_s);
    EXPECT_EQ(metaData[u"className"_s].toString(), u"PluginRecordingScheduleSettingSrv"_s);
    EXPECT_EQ(metaData[u"MetaData"_s].toObject(),
              (QJsonObject{{u"PluginID"_s, u"942E5F3F02EE4D7C879BADCD754F983C"_s}}));
    EXPECT_NE(plugin(), nullptr) << "the instance is an IPluginObjectBase";
}

struct Initialisation
{
    const char *name;
    int tools; // 0: none, 1: without a tunnel, 2: with one
    bool result;
    QStringList records;
    QStringList sentByAQuery;
};

void PrintTo(const Initialisation &row, std::ostream *os)
{
    *os << row.name;
}

class Initialises : public Frame, public ::testing::WithParamInterface<Initialisation>
{};

TEST_P(Initialises, ReportsAndKeepsTheTunnel)
{
    IFrameworkTools *const given[] = {nullptr, &noTunnel, &tools};
    EXPECT_EQ(plugin()->InitialPluginBase(given[GetParam().tools]), GetParam().result);
    EXPECT_EQ(records(), GetParam().records);
    plugin()->Request(u"GetScheduleRecInfo"_s, QVariant(), RequestSenderInfo{}, reply.callback());
    EXPECT_EQ(tunnel.commands(), GetParam().sentByAQuery);
}

const QString Enter = u"5 PluginRecordingScheduleSettingSrv::InitialPluginBase, Enter"_s;
const QString Leave = u"5 PluginRecordingScheduleSettingSrv::InitialPluginBase, Leave"_s;
const QString NoTunnel =
    u"2 PluginRecordingScheduleSettingSrv::InitialPluginBase, Tunnel client get null."_s;

INSTANTIATE_TEST_SUITE_P(
    Frame, Initialises,
    ::testing::Values(
        Initialisation{"no_tools_fail", 0, false, {Enter, NoTunnel, Leave}, {}},
        Initialisation{"tools_without_tunnel_fail", 1, false, {Enter, NoTunnel, Leave}, {}},
        Initialisation{"a_tunnel_takes_the_requests", 2, true, {Enter, Leave}, {"GetRecTmcard"}}),
    [](const auto &info) { return std::string(info.param.name); });

struct AtOnce
{
    const char *name;
    int tools; // initialised with: -1 nothing, 1 tools without a tunnel, 2 with one
    QString command;
};

void PrintTo(const AtOnce &row, std::ostream *os)
{
    *os << row.name;
}

class AnsweredAtOnce : public Frame, public ::testing::WithParamInterface<AtOnce>
{};

TEST_P(AnsweredAtOnce, WithTrueMinusOneAndNothingSent)
{
    if (GetParam().tools > 0)
        plugin()->InitialPluginBase(GetParam().tools == 2 ? &tools : &noTunnel);
    plugin()->Request(GetParam().command, QVariantMap{{u"TimeCardID"_s, u"5"_s}},
                      RequestSenderInfo{}, reply.callback());
    ASSERT_EQ(reply.count(), 1);
    EXPECT_TRUE(reply.last().flag);
    EXPECT_EQ(reply.last().code, u"-1"_s);
    EXPECT_EQ(reply.last().text, QString());
    EXPECT_FALSE(reply.last().data.isValid());
    EXPECT_TRUE(tunnel.sent().isEmpty());
}

// Without a control, requests once went nowhere: they are answered at once.
INSTANTIATE_TEST_SUITE_P(
    Frame, AnsweredAtOnce,
    ::testing::Values(AtOnce{"another_letter_case_is_unknown", 2, u"delschedule"_s},
                      AtOnce{"a_trailing_space_is_unknown", 2, u"DelSchedule "_s},
                      AtOnce{"continuous_spelt_right_is_unknown", 2,
                             u"DefaultContinuousSchedule"_s},
                      AtOnce{"a_tunnel_command_is_no_client_command", 2, u"GetRecTmcard"_s},
                      AtOnce{"an_empty_command_is_unknown", 2, QString()},
                      AtOnce{"a_query_before_initialisation", -1, u"GetScheduleRecInfo"_s},
                      AtOnce{"a_deletion_before_initialisation", -1, u"DelSchedule"_s},
                      AtOnce{"a_change_after_failed_initialisation", 1, u"AddSchedule"_s}),
    [](const auto &info) { return std::string(info.param.name); });

class EntryPoints : public Frame, public ::testing::WithParamInterface<QString>
{};

// The blocking operations do nothing else: no reply, no call on the responser.
TEST_P(EntryPoints, WriteEnterThenLeave)
{
    CountingResponser responser;
    IPluginObjectBase *const p = plugin();
    const QString &function = GetParam();
    if (function == u"InitialPluginBase")
        p->InitialPluginBase(&tools);
    else if (function == u"Request")
        p->Request(u"Unknown"_s, QVariant(), RequestSenderInfo{}, reply.callback());
    else if (function == u"RequestBlock")
        p->RequestBlock(u"GetScheduleRecInfo"_s, QVariant(), RequestSenderInfo{}, responser);
    else if (function == u"SubscribeEventBlock")
        p->SubscribeEventBlock(u"e"_s, u"f"_s, QVariant(), RequestSenderInfo{}, responser);
    else if (function == u"UnsubscribeEventBlock")
        p->UnsubscribeEventBlock(u"e"_s, QVariant(), responser);
    else
        delete p;
    const QString name = u"PluginRecordingScheduleSettingSrv::"_s + function;
    EXPECT_EQ(records(),
              (QStringList{u"5 "_s + name + u", Enter"_s, u"5 "_s + name + u", Leave"_s}));
    EXPECT_EQ(responser.calls, 0);
}

INSTANTIATE_TEST_SUITE_P(Frame, EntryPoints,
                         ::testing::Values(u"InitialPluginBase"_s, u"Request"_s, u"RequestBlock"_s,
                                           u"SubscribeEventBlock"_s, u"UnsubscribeEventBlock"_s,
                                           u"~PluginRecordingScheduleSettingSrv"_s),
                         [](const auto &info) { return info.param.mid(1).toStdString(); });

} // namespace

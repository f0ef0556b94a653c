// The plug-in as a host sees it: the built file loaded through QPluginLoader
// (nothing of its code is linked in), its trace records read from the file
// that the real trace-log library beside it writes.

#include "IPluginObjectBase.h"
#include "IResponser.h"
#include "LocalFrameworkTools.h"
#include "QtPrinters.h"
#include "ReplyCollector.h"
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

enum Call { Nothing, NoTools, NoTunnel, Tunnel, Request, Block, Subscribe, Unsubscribe, Delete };

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
        file.open(QIODevice::ReadOnly);
        for (const QString &line :
             QString::fromUtf8(file.readAll()).split(u'\n', Qt::SkipEmptyParts))
            result << line.section(u' ', 2, 2) + u' ' + line.section(u' ', 4);
        return result;
    }

    void SetUp() override { QFile::resize(logFile(), 0); }
    // The next test gets a new plug-in object.
    void TearDown() override { delete loader().instance(); }

    bool initialise(int call)
    {
        IFrameworkTools *const given[] = {nullptr, &noTunnel, &tools};
        return plugin()->InitialPluginBase(given[call - NoTools]);
    }
    IPluginObjectBase *plugin() { return qobject_cast<IPluginObjectBase *>(loader().instance()); }

    TestTunnel tunnel;
    LocalFrameworkTools tools{&tunnel};
    LocalFrameworkTools noTunnel{nullptr};
    ReplyCollector replies;
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

struct EntryPoint
{
    const char *name;
    Call call;
    QStringList records;
    QStringList sentByAQueryAfter;
    friend void PrintTo(const EntryPoint &row, std::ostream *os) { *os << row.name; }
};

class EntryPoints : public Frame, public ::testing::WithParamInterface<EntryPoint>
{};

// Initialisation succeeds exactly when there is a tunnel, which then takes
// the requests; the blocking operations do nothing but trace.
TEST_P(EntryPoints, TraceAndLeaveTheTunnelInUse)
{
    CountingResponser responser;
    IPluginObjectBase *const p = plugin();
    const Call call = GetParam().call;
    if (call >= NoTools && call <= Tunnel) {
        EXPECT_EQ(initialise(call), call == Tunnel);
    }
    if (call == Request)
        p->Request(u"Unknown"_s, QVariant(), RequestSenderInfo{}, replies.replyFunction(1));
    if (call == Block)
        p->RequestBlock(u"GetScheduleRecInfo"_s, QVariant(), RequestSenderInfo{}, responser);
    if (call == Subscribe)
        p->SubscribeEventBlock(u"e"_s, u"f"_s, QVariant(), RequestSenderInfo{}, responser);
    if (call == Unsubscribe)
        p->UnsubscribeEventBlock(u"e"_s, QVariant(), responser);
    if (call == Delete)
        delete p;
    EXPECT_EQ(records(), GetParam().records);
    EXPECT_EQ(responser.calls, 0);
    plugin()->Request(u"GetScheduleRecInfo"_s, QVariant(), RequestSenderInfo{},
                      replies.replyFunction(2));
    EXPECT_EQ(tunnel.commands(), GetParam().sentByAQueryAfter);
}

QStringList traced(const char *function)
{
    const QString name = u"5 PluginRecordingScheduleSettingSrv::"_s + QLatin1String(function);
    return {name + u", Enter"_s, name + u", Leave"_s};
}

const QStringList NoTunnelRecords{
    u"5 PluginRecordingScheduleSettingSrv::InitialPluginBase, Enter"_s,
    u"2 PluginRecordingScheduleSettingSrv::InitialPluginBase, Tunnel client get null."_s,
    u"5 PluginRecordingScheduleSettingSrv::InitialPluginBase, Leave"_s};

INSTANTIATE_TEST_SUITE_P(
    Frame, EntryPoints,
    ::testing::Values(
        EntryPoint{"initialisation_without_tools_fails", NoTools, NoTunnelRecords, {}},
        EntryPoint{"initialisation_without_a_tunnel_fails", NoTunnel, NoTunnelRecords, {}},
        EntryPoint{"initialisation_with_a_tunnel",
                   Tunnel,
                   traced("InitialPluginBase"),
                   {u"GetRecTmcard"_s}},
        EntryPoint{"request", Request, traced("Request"), {}},
        EntryPoint{"request_block", Block, traced("RequestBlock"), {}},
        EntryPoint{"subscribe_event_block", Subscribe, traced("SubscribeEventBlock"), {}},
        EntryPoint{"unsubscribe_event_block", Unsubscribe, traced("UnsubscribeEventBlock"), {}},
        EntryPoint{"deletion", Delete, traced("~PluginRecordingScheduleSettingSrv"), {}}),
    [](const auto &info) { return std::string(info.param.name); });

struct AtOnce
{
    const char *name;
    Call initialisation;
    QString command;
    friend void PrintTo(const AtOnce &row, std::ostream *os) { *os << row.name; }
};

class AnsweredAtOnce : public Frame, public ::testing::WithParamInterface<AtOnce>
{};

TEST_P(AnsweredAtOnce, WithTrueMinusOneAndNothingSent)
{
    if (GetParam().initialisation != Nothing)
        initialise(GetParam().initialisation);
    plugin()->Request(GetParam().command, QVariantMap{{u"TimeCardID"_s, u"5"_s}},
                      RequestSenderInfo{}, replies.replyFunction(1));
    ASSERT_EQ(replies.replyCount(1), 1);
    const ReplyCollector::Reply reply = *replies.waitForFirst(1, {});
    EXPECT_TRUE(reply.flag);
    EXPECT_EQ(reply.code, u"-1"_s);
    EXPECT_EQ(reply.text, QString());
    EXPECT_FALSE(reply.data.isValid());
    EXPECT_TRUE(tunnel.sent().isEmpty());
}

// Without a control, requests once went nowhere: they are answered at once.
INSTANTIATE_TEST_SUITE_P(
    Frame, AnsweredAtOnce,
    ::testing::Values(AtOnce{"another_letter_case_is_unknown", Tunnel, u"delschedule"_s},
                      AtOnce{"continuous_spelt_right_is_unknown", Tunnel,
                             u"DefaultContinuousSchedule"_s},
                      AtOnce{"a_query_before_initialisation", Nothing, u"GetScheduleRecInfo"_s},
                      AtOnce{"a_deletion_before_initialisation", Nothing, u"DelSchedule"_s},
                      AtOnce{"a_change_after_failed_initialisation", NoTunnel, u"AddSchedule"_s}),
    [](const auto &info) { return std::string(info.param.name); });

} // namespace

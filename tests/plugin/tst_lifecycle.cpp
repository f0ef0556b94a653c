// Initialisation, replacement and release of the control, the three blocking
// operations, and the Enter/Leave records around every traced entry point.

#include "FakeControl.h"
#include "PluginRecordingScheduleSettingSrv.h"
#include "QtPrinters.h"
#include "ReplyRecorder.h"
#include "RequestSenderInfo.h"
#include "TestLog.h"
#include "TestTunnel.h"

#include "IFrameworkTools.h"
#include "IResponser.h"

#include <gtest/gtest.h>

#include <memory>

namespace {

struct Framework : IFrameworkTools
{
    IKoltTunnelClient *tunnel = nullptr;
    int asked = 0;
    IKoltTunnelClient *GetTunnelClient() override
    {
        ++asked;
        return tunnel;
    }
};

struct CountingResponser : IResponser
{
    int calls = 0;
    void Respond(bool, const QString &, const QString &, const QVariant &) override { ++calls; }
};

QString enter(const char *function)
{
    return QStringLiteral("PluginRecordingScheduleSettingSrv::%1, Enter")
        .arg(QLatin1String(function));
}

QString leave(const char *function)
{
    return QStringLiteral("PluginRecordingScheduleSettingSrv::%1, Leave")
        .arg(QLatin1String(function));
}

class Lifecycle : public ::testing::Test
{
protected:
    void SetUp() override { log.attach(); }
    TestLog log{7};
};

struct MissingTunnel
{
    const char *name;
    bool withFramework;
};

void PrintTo(const MissingTunnel &c, std::ostream *os)
{
    *os << c.name;
}

class WithoutTunnel : public Lifecycle, public ::testing::WithParamInterface<MissingTunnel>
{};

TEST_P(WithoutTunnel, InitialisationFailsWithItsErrorRecord)
{
    Framework framework;
    PluginRecordingScheduleSettingSrv plugin;
    log.clear();
    EXPECT_FALSE(plugin.InitialPluginBase(GetParam().withFramework ? &framework : nullptr));

    const QList<TestLog::Record> records = log.records();
    ASSERT_EQ(records.size(), 3);
    EXPECT_EQ(records[0].text, enter("InitialPluginBase"));
    EXPECT_EQ(records[1].text,
              QStringLiteral("PluginRecordingScheduleSettingSrv::InitialPluginBase, "
                             "Tunnel client get null."));
    EXPECT_EQ(records[1].level(), 2);
    EXPECT_EQ(records[1].selector, (7u << 8) | 2u);
    EXPECT_EQ(records[2].text, leave("InitialPluginBase"));
}

INSTANTIATE_TEST_SUITE_P(Lifecycle, WithoutTunnel,
                         ::testing::Values(MissingTunnel{"FrameworkWithoutTunnelClient", true},
                                           MissingTunnel{"NoFrameworkTools", false}),
                         [](const auto &info) { return std::string(info.param.name); });

TEST_F(Lifecycle, InitialisationWithTunnelReplacesTheControl)
{
    bool released = false;
    auto fake = QSharedPointer<FakeControl>::create([&released] { released = true; });
    TestTunnel tunnel;
    Framework framework;
    framework.tunnel = &tunnel;
    PluginRecordingScheduleSettingSrv plugin;
    plugin.SetRecordingSettingControl(fake);
    fake.reset();

    log.clear();
    EXPECT_TRUE(plugin.InitialPluginBase(&framework));
    EXPECT_TRUE(released) << "the previous control is released";
    EXPECT_EQ(log.texts(), (QStringList{enter("InitialPluginBase"), leave("InitialPluginBase")}));
    EXPECT_TRUE(plugin.InitialPluginBase(&framework)) << "a second initialisation succeeds too";
    EXPECT_EQ(framework.asked, 2);
}

TEST_F(Lifecycle, SecondInitialisationSendsThroughTheSecondTunnel)
{
    TestTunnel first;
    TestTunnel second;
    Framework framework;
    PluginRecordingScheduleSettingSrv plugin;
    framework.tunnel = &first;
    ASSERT_TRUE(plugin.InitialPluginBase(&framework));
    framework.tunnel = &second;
    ASSERT_TRUE(plugin.InitialPluginBase(&framework));

    ReplyRecorder reply;
    plugin.Request(QStringLiteral("GetScheduleRecInfo"), QVariant(), RequestSenderInfo{},
                   reply.callback());
    EXPECT_TRUE(first.sent().isEmpty());
    EXPECT_EQ(second.commands(), QStringList{QStringLiteral("GetRecTmcard")});
    EXPECT_EQ(reply.count(), 1);
}

TEST_F(Lifecycle, FailedInitialisationKeepsThePreviousControl)
{
    const auto fake = QSharedPointer<FakeControl>::create();
    Framework noTunnel;
    PluginRecordingScheduleSettingSrv plugin;
    plugin.SetRecordingSettingControl(fake);
    ASSERT_FALSE(plugin.InitialPluginBase(&noTunnel));

    ReplyRecorder reply;
    plugin.Request(QStringLiteral("GetScheduleRecInfo"), QVariant(), RequestSenderInfo{},
                   reply.callback());
    EXPECT_EQ(fake->operations(), QStringList{QStringLiteral("GetAllScheduleTimecardInfo")});
    EXPECT_EQ(reply.last().code, QStringLiteral("0"));
}

TEST_F(Lifecycle, SettingAControlReplacesThePreviousOne)
{
    bool firstReleased = false;
    auto first = QSharedPointer<FakeControl>::create([&] { firstReleased = true; });
    const auto second = QSharedPointer<FakeControl>::create();
    PluginRecordingScheduleSettingSrv plugin;
    plugin.SetRecordingSettingControl(first);
    plugin.SetRecordingSettingControl(second);
    ReplyRecorder reply;
    plugin.Request(QStringLiteral("GetAllScheduleRecInfo"), QVariant(), RequestSenderInfo{},
                   reply.callback());
    EXPECT_TRUE(first->calls().isEmpty());
    EXPECT_EQ(second->operations(), QStringList{QStringLiteral("GetAllScheduleTimecardInfo")});
    first.reset();
    EXPECT_TRUE(firstReleased) << "the plug-in let go of the first control";
}

TEST_F(Lifecycle, DestructionTracesBeforeTheControlIsReleased)
{
    int recordsWhenReleased = -1;
    auto plugin = std::make_unique<PluginRecordingScheduleSettingSrv>();
    plugin->SetRecordingSettingControl(QSharedPointer<FakeControl>::create(
        [&] { recordsWhenReleased = static_cast<int>(log.records().size()); }));
    log.clear();
    plugin.reset();
    EXPECT_EQ(log.texts(), (QStringList{enter("~PluginRecordingScheduleSettingSrv"),
                                        leave("~PluginRecordingScheduleSettingSrv")}));
    EXPECT_EQ(recordsWhenReleased, 2);
}

TEST_F(Lifecycle, BlockingOperationsOnlyTrace)
{
    const auto fake = QSharedPointer<FakeControl>::create();
    PluginRecordingScheduleSettingSrv plugin;
    plugin.SetRecordingSettingControl(fake);
    CountingResponser responser;
    log.clear();
    plugin.RequestBlock(QStringLiteral("GetScheduleRecInfo"), QVariant(), RequestSenderInfo{},
                        responser);
    plugin.SubscribeEventBlock(QStringLiteral("e"), QStringLiteral("f"), QVariant(),
                               RequestSenderInfo{}, responser);
    plugin.UnsubscribeEventBlock(QStringLiteral("e"), QVariant(), responser);
    EXPECT_EQ(log.texts(),
              (QStringList{enter("RequestBlock"), leave("RequestBlock"),
                           enter("SubscribeEventBlock"), leave("SubscribeEventBlock"),
                           enter("UnsubscribeEventBlock"), leave("UnsubscribeEventBlock")}));
    EXPECT_EQ(responser.calls, 0);
    EXPECT_TRUE(fake->calls().isEmpty()) << "not even the client identity is stored";
}

TEST_F(Lifecycle, EveryEntryPointIsTracedInOrder)
{
    TestTunnel tunnel;
    Framework framework;
    framework.tunnel = &tunnel;
    CountingResponser responser;
    ReplyRecorder reply;
    auto plugin = std::make_unique<PluginRecordingScheduleSettingSrv>();
    plugin->InitialPluginBase(&framework);
    plugin->Request(QStringLiteral("Unknown"), QVariant(), RequestSenderInfo{}, reply.callback());
    plugin->RequestBlock(QString(), QVariant(), RequestSenderInfo{}, responser);
    plugin->SubscribeEventBlock(QString(), QString(), QVariant(), RequestSenderInfo{}, responser);
    plugin->UnsubscribeEventBlock(QString(), QVariant(), responser);
    plugin.reset();

    EXPECT_EQ(log.texts(),
              (QStringList{enter("InitialPluginBase"), leave("InitialPluginBase"), enter("Request"),
                           leave("Request"), enter("RequestBlock"), leave("RequestBlock"),
                           enter("SubscribeEventBlock"), leave("SubscribeEventBlock"),
                           enter("UnsubscribeEventBlock"), leave("UnsubscribeEventBlock"),
                           enter("~PluginRecordingScheduleSettingSrv"),
                           leave("~PluginRecordingScheduleSettingSrv")}));
    for (const TestLog::Record &record : log.records()) {
        EXPECT_EQ(record.selector, (7u << 8) | 5u) << record.text.toStdString();
        EXPECT_TRUE(
            record.sourceFile.contains(QLatin1String("PluginRecordingScheduleSettingSrv/src/")))
            << record.sourceFile.toStdString();
        if (record.text.endsWith(QLatin1String("Leave")))
            EXPECT_EQ(record.sourceLine, 0) << record.text.toStdString();
        else
            EXPECT_GT(record.sourceLine, 0) << record.text.toStdString();
    }
}

TEST_F(Lifecycle, RequestWithoutControlIsTracedToo)
{
    PluginRecordingScheduleSettingSrv plugin;
    ReplyRecorder reply;
    log.clear();
    plugin.Request(QStringLiteral("GetScheduleRecInfo"), QVariant(), RequestSenderInfo{},
                   reply.callback());
    EXPECT_EQ(log.texts(), (QStringList{enter("Request"), leave("Request")}));
    EXPECT_EQ(reply.count(), 1);
}

TEST_F(Lifecycle, RequestLeavesBeforeTheHeldAnswerArrives)
{
    const auto fake = QSharedPointer<FakeControl>::create();
    fake->setFetch(FakeControl::Fetch::Hold);
    PluginRecordingScheduleSettingSrv plugin;
    plugin.SetRecordingSettingControl(fake);
    ReplyRecorder reply;
    log.clear();
    plugin.Request(QStringLiteral("GetScheduleRecInfo"), QVariant(), RequestSenderInfo{},
                   reply.callback());
    EXPECT_EQ(log.texts(), (QStringList{enter("Request"), leave("Request")}));
    fake->deliverHeld();
    EXPECT_EQ(log.texts().size(), 2) << "completions write no Enter/Leave records";
    EXPECT_EQ(reply.count(), 1);
}

TEST_F(Lifecycle, FilterRefusingTraceLevelKeepsErrorRecords)
{
    log.setFilter([](std::uint32_t selector) { return (selector & 0xff) == 5 ? 1 : 0; });
    Framework noTunnel;
    PluginRecordingScheduleSettingSrv plugin;
    EXPECT_FALSE(plugin.InitialPluginBase(&noTunnel));
    EXPECT_EQ(log.texts(), QStringList{QStringLiteral(
                               "PluginRecordingScheduleSettingSrv::InitialPluginBase, Tunnel "
                               "client get null.")});
}

TEST(LifecycleLog, LogObjectWithoutRegisterFunctionWritesWithModuleZero)
{
    TestLog log(7, false);
    log.attach();
    Framework noTunnel;
    PluginRecordingScheduleSettingSrv plugin;
    plugin.InitialPluginBase(&noTunnel);
    const QList<TestLog::Record> records = log.records();
    ASSERT_EQ(records.size(), 3);
    EXPECT_EQ(records[0].selector, 5u);
    EXPECT_EQ(records[1].selector, 2u);
}

TEST(LifecycleLog, WithoutLogEverythingWorksTheSame)
{
    const auto fake = QSharedPointer<FakeControl>::create();
    PluginRecordingScheduleSettingSrv plugin;
    plugin.SetRecordingSettingControl(fake);
    ReplyRecorder reply;
    plugin.Request(QStringLiteral("GetScheduleRecInfo"), QVariant(), RequestSenderInfo{},
                   reply.callback());
    EXPECT_EQ(reply.last().code, QStringLiteral("0"));
}

} // namespace

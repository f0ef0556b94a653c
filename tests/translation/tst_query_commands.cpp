// The three query commands end to end: Request, the time card control, the
// tunnel and the converter, with the server's answers as XML text.

#include "IFrameworkTools.h"
#include "PluginRecordingScheduleSettingSrv.h"
#include "QtPrinters.h"
#include "RecordingScheduleSettingConstants.h"
#include "ReplyRecorder.h"
#include "RequestSenderInfo.h"
#include "TestTunnel.h"
#include "TimecardXml.h"

#include <gtest/gtest.h>

namespace {

using PluginRecordingScheduleSettingCommon::Template::DefaultContinuousMapping;
using PluginRecordingScheduleSettingCommon::Template::DefaultEventMapping;
using Map = QMap<QString, QVariant>;

const QString GetScheduleRecInfo = QStringLiteral("GetScheduleRecInfo");
const QString GetCurrentScheduleInfo = QStringLiteral("GetCurrentScheduleInfo");
const QString GetAllScheduleRecInfo = QStringLiteral("GetAllScheduleRecInfo");

const QString CustomizeMapping = QStringLiteral(
    "<Ele><Frame><Name>Customize time frame</Name><DLMod>SingleDay</DLMod><RepeatMod>Weekly"
    "</RepeatMod><DayList><Ele B=\"1.0\"/><Ele B=\"2.0\"/><Ele B=\"3.0\"/><Ele B=\"5.0\"/>"
    "</DayList><Intervals><Ele B=\"0\" E=\"28800\"/><Ele B=\"64800\" E=\"86400\"/></Intervals>"
    "<Holiday>false</Holiday></Frame><RecMode>Continuous</RecMode></Ele>");
const QString CustomizeDocument = QStringLiteral(
    "{\"Rectangles\":[{\"Bottom\":8,\"Left\":0,\"RecordingMode\":\"Continuous\",\"Right\":3,"
    "\"Top\":0},{\"Bottom\":24,\"Left\":0,\"RecordingMode\":\"Continuous\",\"Right\":3,"
    "\"Top\":18},{\"Bottom\":8,\"Left\":4,\"RecordingMode\":\"Continuous\",\"Right\":5,"
    "\"Top\":0},{\"Bottom\":24,\"Left\":4,\"RecordingMode\":\"Continuous\",\"Right\":5,"
    "\"Top\":18}]}");

struct Framework : IFrameworkTools
{
    IKoltTunnelClient *tunnel = nullptr;
    IKoltTunnelClient *GetTunnelClient() override { return tunnel; }
};

class QueryCommands : public ::testing::Test
{
protected:
    void SetUp() override
    {
        framework.tunnel = &tunnel;
        ASSERT_TRUE(plugin.InitialPluginBase(&framework));
    }

    ReplyRecorder::Reply ask(const QString &command, const TestTunnel::Answer &answer)
    {
        tunnel.queueAnswer(answer);
        ReplyRecorder reply;
        plugin.Request(command, QVariant(), sender, reply.callback());
        EXPECT_TRUE(reply.waitFor(1));
        EXPECT_EQ(reply.count(), 1);
        return reply.last();
    }

    static TestTunnel::Answer answered(const QStringList &timecards, bool flag = false)
    {
        return {true, QStringLiteral("0"), TimecardXml::answer(timecards), flag};
    }

    TestTunnel tunnel;
    Framework framework;
    PluginRecordingScheduleSettingSrv plugin;
    RequestSenderInfo sender{reinterpret_cast<void *>(0x51), {}, {}};
};

TEST_F(QueryCommands, ReadAllTimecardsWithTheTunnelsOwnIdentity)
{
    for (const QString &command :
         {GetScheduleRecInfo, GetCurrentScheduleInfo, GetAllScheduleRecInfo})
        ask(command, answered({}));
    const QList<TestTunnel::Sent> sent = tunnel.sent();
    ASSERT_EQ(sent.size(), 3);
    for (const TestTunnel::Sent &s : sent) {
        EXPECT_EQ(s.command, QStringLiteral("GetRecTmcard"));
        EXPECT_EQ(s.body,
                  QStringLiteral("<GetRecTmcard><TmcardAll>true</TmcardAll></GetRecTmcard>"));
        EXPECT_EQ(s.pluginId, QStringLiteral("942E5F3F02EE4D7C879BADCD754F983C"));
        EXPECT_EQ(s.kind, 1);
        EXPECT_EQ(s.clientId, tunnel.ownId());
    }
}

TEST_F(QueryCommands, CustomisedNextToDefaultTimecard)
{
    const TestTunnel::Answer answer = answered(
        {TimecardXml::timecard("1", "KOLT2 Default Continuous Recording", DefaultContinuousMapping,
                               TimecardXml::cameras({"C_1", "1"})),
         TimecardXml::timecard("7", "KOLT2 Customize Recording", CustomizeMapping,
                               TimecardXml::cameras({"C_2", "1", "C_3", "2"}))});

    const ReplyRecorder::Reply recInfo = ask(GetScheduleRecInfo, answer);
    EXPECT_TRUE(recInfo.flag);
    EXPECT_EQ(recInfo.code, QStringLiteral("0"));
    EXPECT_EQ(recInfo.data.toMap(),
              (Map{{"RecScheduleType", 2}, {"CustomizeContent", CustomizeDocument}}));

    const ReplyRecorder::Reply current = ask(GetCurrentScheduleInfo, answer);
    EXPECT_EQ(current.data.toMap(), (Map{{"RecScheduleType", 4}, {"CustomizeContent", QString()}}));
}

TEST_F(QueryCommands, OnlyTheDefaultTimecardHasCameras)
{
    const TestTunnel::Answer answer =
        answered({TimecardXml::timecard("1", "KOLT2 Default Event Recording", DefaultEventMapping,
                                        TimecardXml::cameras({"C_1", "1"}))});
    EXPECT_EQ(ask(GetScheduleRecInfo, answer).data.toMap().value("RecScheduleType"), QVariant(5));
    EXPECT_EQ(ask(GetCurrentScheduleInfo, answer).data.toMap().value("RecScheduleType"),
              QVariant(1));
}

TEST_F(QueryCommands, AllTimecardsWithTheirDocumentsAndCameras)
{
    const ReplyRecorder::Reply reply = ask(
        GetAllScheduleRecInfo,
        answered({TimecardXml::timecard("1", "KOLT2 Default Continuous Recording",
                                        DefaultContinuousMapping, QString(), "4"),
                  TimecardXml::timecard("12", "KOLT2 Default Event Recording", DefaultEventMapping,
                                        TimecardXml::cameras({"C_12", "3"}), "9")}));
    EXPECT_TRUE(reply.flag);
    EXPECT_EQ(reply.code, QStringLiteral("0"));
    const QList<QVariant> entries = reply.data.toList();
    ASSERT_EQ(entries.size(), 2);
    EXPECT_EQ(entries[0].toMap(),
              (Map{{"ScheduleName", "KOLT2 Default Continuous Recording"},
                   {"TimeCardID", "1"},
                   {"Revision", "4"},
                   {"CustomizeContent",
                    "{\"Rectangles\":[{\"Bottom\":24,\"Left\":0,\"RecordingMode\":\"Continuous\","
                    "\"Right\":7,\"Top\":0}]}"},
                   {"CameraList", QVariantList()}}));
    EXPECT_EQ(entries[1].toMap(),
              (Map{{"ScheduleName", "KOLT2 Default Event Recording"},
                   {"TimeCardID", "12"},
                   {"Revision", "9"},
                   {"CustomizeContent",
                    "{\"Rectangles\":[{\"Bottom\":24,\"Left\":0,\"RecordingMode\":\"Event\","
                    "\"Right\":7,\"Top\":0,\"triggerEvents\":{\"motion\":true,\"pir\":false,"
                    "\"tampering\":false,\"pptz\":false,\"lineDetection\":false,"
                    "\"fieldDetection\":false,\"loitering\":false,\"crowdDetection\":false,"
                    "\"missingObject\":false,\"abandonObject\":false,\"faceDetection\":false,"
                    "\"di\":true,\"traditional\":true,\"recordingStateTrigger\":true,"
                    "\"recordingStateNormal\":true,\"activatedToNormal\":false,"
                    "\"normalToActivated\":false}}]}"},
                   {"CameraList", QVariantList{Map{{"Name", "C_12"}, {"GrpID", "3"}}}}}));
    EXPECT_EQ(entries[1].toMap().value("TimeCardID").typeId(), QMetaType::QString);
}

TEST_F(QueryCommands, EmptyMappingIsOnePlaceholder)
{
    const ReplyRecorder::Reply reply =
        ask(GetAllScheduleRecInfo, answered({TimecardXml::timecard("3", "Empty", QString())}));
    EXPECT_EQ(reply.data.toList().value(0).toMap().value("CustomizeContent"),
              QVariant("{\"Rectangles\":[{\"Bottom\":-1,\"Left\":-1,\"RecordingMode\":\"\","
                       "\"Right\":-1,\"Top\":-1}]}"));
}

// --- Failures, per command -------------------------------------------------------

struct FetchFailure
{
    const char *name;
    TestTunnel::Answer answer;
    bool replyFlag;
};

void PrintTo(const FetchFailure &c, std::ostream *os)
{
    *os << c.name;
}

class FailedFetch : public QueryCommands,
                    public ::testing::WithParamInterface<std::tuple<QString, FetchFailure>>
{};

TEST_P(FailedFetch, AnswersWithTheFetchsOwnFlag)
{
    const auto &[command, failure] = GetParam();
    const ReplyRecorder::Reply reply = ask(command, failure.answer);
    EXPECT_EQ(reply.flag, failure.replyFlag);
    EXPECT_EQ(reply.code, QStringLiteral("-1"));
    EXPECT_TRUE(reply.text.isEmpty());
    EXPECT_FALSE(reply.data.isValid());
}

INSTANTIATE_TEST_SUITE_P(
    QueryCommands, FailedFetch,
    ::testing::Combine(
        ::testing::Values(GetScheduleRecInfo, GetCurrentScheduleInfo, GetAllScheduleRecInfo),
        ::testing::Values(
            FetchFailure{"ExchangeFailedWithFlagFalse", {false, "0", QString(), false}, false},
            FetchFailure{"ExchangeFailedWithFlagTrue", {false, "0", QString(), true}, true},
            FetchFailure{"ServerRefusedWithFlagFalse", {true, "12", QString(), false}, false},
            FetchFailure{"AnswerThatIsNoXml",
                         {true, "0", QStringLiteral("<GetRecTmcardRes>"), false},
                         false})),
    [](const auto &info) {
        return std::get<0>(info.param).toStdString() + "_" + std::get<1>(info.param).name;
    });

class RefusedFetch : public QueryCommands, public ::testing::WithParamInterface<QString>
{};

TEST_P(RefusedFetch, IsAnsweredAtOnce)
{
    tunnel.refuseNext();
    ReplyRecorder reply;
    plugin.Request(GetParam(), QVariant(), sender, reply.callback());
    ASSERT_EQ(reply.count(), 1);
    EXPECT_TRUE(reply.last().flag);
    EXPECT_EQ(reply.last().code, QStringLiteral("-1"));
    EXPECT_FALSE(reply.last().data.isValid());
}

INSTANTIATE_TEST_SUITE_P(QueryCommands, RefusedFetch,
                         ::testing::Values(GetScheduleRecInfo, GetCurrentScheduleInfo,
                                           GetAllScheduleRecInfo),
                         [](const auto &info) { return info.param.toStdString(); });

// --- Answers on the tunnel's thread ------------------------------------------------

TEST(QueryCommandsThreads, AnswersOnTheTunnelsThreadReachEveryClientOnce)
{
    TestTunnel tunnel(TestTunnel::Delivery::OtherThread);
    Framework framework;
    framework.tunnel = &tunnel;
    PluginRecordingScheduleSettingSrv plugin;
    ASSERT_TRUE(plugin.InitialPluginBase(&framework));
    tunnel.setResponder([](const TestTunnel::Sent &) {
        return TestTunnel::Answer{true, "0",
                                  TimecardXml::answer({TimecardXml::timecard(
                                      "7", "KOLT2 Customize Recording", CustomizeMapping,
                                      TimecardXml::cameras({"C_1", "1"}))}),
                                  true};
    });

    const QStringList commands{GetScheduleRecInfo, GetCurrentScheduleInfo, GetAllScheduleRecInfo};
    std::deque<ReplyRecorder> replies(30);
    for (std::size_t i = 0; i < replies.size(); ++i)
        plugin.Request(commands[static_cast<int>(i % 3)], QVariant(),
                       RequestSenderInfo{reinterpret_cast<void *>(i + 1), {}, {}},
                       replies[i].callback());
    for (std::size_t i = 0; i < replies.size(); ++i) {
        ASSERT_TRUE(replies[i].waitFor(1)) << i;
        const ReplyRecorder::Reply reply = replies[i].last();
        EXPECT_EQ(reply.code, QStringLiteral("0"));
        if (i % 3 == 2)
            EXPECT_EQ(reply.data.toList().value(0).toMap().value("CustomizeContent"),
                      QVariant(CustomizeDocument));
        else
            EXPECT_EQ(reply.data.toMap().value("CustomizeContent"), QVariant(CustomizeDocument));
    }
    tunnel.waitIdle();
    for (const ReplyRecorder &reply : replies)
        EXPECT_EQ(reply.count(), 1);
}

} // namespace

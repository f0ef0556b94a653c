// The dispatcher as a client and the control see it: which control operation
// each command starts, what the client gets back, and the client identity
// handed on with every request.

#include "FakeControl.h"
#include "PluginCommands.h"
#include "PluginRecordingScheduleSettingSrv.h"
#include "QtPrinters.h"
#include "ReplyRecorder.h"
#include "RequestSenderInfo.h"
#include "TestLog.h"
#include "TestTunnel.h"

#include "IFrameworkTools.h"

#include <gtest/gtest.h>

#include <deque>
#include <memory>

namespace {

struct Framework : IFrameworkTools
{
    IKoltTunnelClient *tunnel = nullptr;
    IKoltTunnelClient *GetTunnelClient() override { return tunnel; }
};

RequestSenderInfo sender(quintptr id)
{
    RequestSenderInfo info;
    info.clientId = reinterpret_cast<void *>(id);
    return info;
}

const QStringList HandlerCommands{QStringLiteral("AddSchedule"), QStringLiteral("UpdateSchedule"),
                                  QStringLiteral("UpdateCamRecSchedule")};

QStringList allCommands()
{
    return ReadFirstCommands + HandlerCommands;
}

class DispatchTest : public ::testing::Test
{
protected:
    void SetUp() override
    {
        control = QSharedPointer<FakeControl>::create();
        plugin.SetRecordingSettingControl(control);
    }

    QSharedPointer<FakeControl> control;
    PluginRecordingScheduleSettingSrv plugin;
};

TEST(Dispatch, UnknownCommandIsAnsweredAtOnce)
{
    TestTunnel tunnel;
    Framework framework;
    framework.tunnel = &tunnel;
    PluginRecordingScheduleSettingSrv plugin;
    ASSERT_TRUE(plugin.InitialPluginBase(&framework));
    ReplyRecorder reply;
    plugin.Request(QStringLiteral("delschedule"), QVariant(), RequestSenderInfo{},
                   reply.callback());
    ASSERT_EQ(reply.count(), 1);
    EXPECT_TRUE(reply.last().flag);
    EXPECT_EQ(reply.last().code, QStringLiteral("-1"));
    EXPECT_TRUE(reply.last().text.isEmpty());
    EXPECT_FALSE(reply.last().data.isValid());
    EXPECT_TRUE(tunnel.sent().isEmpty());
}

// What the dispatcher itself does for each command, before any answer.
struct Route
{
    const char *name;
    QString command;
    bool readsAllTimecards; // starts with the control's read of all time cards
    bool answeredAtOnce;    // answered (true, "-1") before Request returns
};

void PrintTo(const Route &route, std::ostream *os)
{
    *os << route.name;
}

class Routing : public DispatchTest, public ::testing::WithParamInterface<Route>
{};

TEST_P(Routing, StartsTheCommandOrAnswersItAtOnce)
{
    const Route &route = GetParam();
    control->setFetch(FakeControl::Fetch::Hold);
    ReplyRecorder reply;
    plugin.Request(route.command, ReadablePayload, sender(0x42), reply.callback());

    EXPECT_EQ(control->clientIds(), QList<void *>{reinterpret_cast<void *>(0x42)});
    EXPECT_EQ(control->operations().contains(QStringLiteral("GetAllScheduleTimecardInfo")),
              route.readsAllTimecards);
    EXPECT_EQ(control->held(), route.readsAllTimecards ? 1 : 0);
    if (route.answeredAtOnce) {
        ASSERT_EQ(reply.count(), 1);
        EXPECT_TRUE(reply.last().flag);
        EXPECT_EQ(reply.last().code, QStringLiteral("-1"));
        EXPECT_FALSE(reply.last().data.isValid());
        EXPECT_TRUE(control->operations().isEmpty());
    } else if (route.readsAllTimecards) {
        EXPECT_EQ(reply.count(), 0) << "answered before the time cards were read";
    }
}

INSTANTIATE_TEST_SUITE_P(
    Dispatch, Routing,
    ::testing::Values(
        Route{"DefaultContinousScheduleReadsAllTimecards",
              QStringLiteral("DefaultContinousSchedule"), true, false},
        Route{"DefaultEventScheduleReadsAllTimecards", QStringLiteral("DefaultEventSchedule"), true,
              false},
        Route{"DefaultNotRecordingScheduleReadsAllTimecards",
              QStringLiteral("DefaultNotRecordingSchedule"), true, false},
        Route{"CustomizeScheduleReadsAllTimecards", QStringLiteral("CustomizeSchedule"), true,
              false},
        Route{"GetScheduleRecInfoReadsAllTimecards", QStringLiteral("GetScheduleRecInfo"), true,
              false},
        Route{"GetCurrentScheduleInfoReadsAllTimecards", QStringLiteral("GetCurrentScheduleInfo"),
              true, false},
        Route{"AddScheduleGoesStraightToItsHandler", QStringLiteral("AddSchedule"), false, false},
        Route{"UpdateScheduleGoesStraightToItsHandler", QStringLiteral("UpdateSchedule"), false,
              false},
        Route{"UpdateCamRecScheduleGoesStraightToItsHandler",
              QStringLiteral("UpdateCamRecSchedule"), false, false},
        Route{"GetAllScheduleRecInfoReadsAllTimecards", QStringLiteral("GetAllScheduleRecInfo"),
              true, false},
        Route{"DelScheduleReadsAllTimecards", QStringLiteral("DelSchedule"), true, false},
        Route{"OtherLetterCaseIsUnknown", QStringLiteral("delschedule"), false, true},
        Route{"UpperCaseIsUnknown", QStringLiteral("GETSCHEDULERECINFO"), false, true},
        Route{"TrailingSpaceIsUnknown", QStringLiteral("DelSchedule "), false, true},
        Route{"LeadingSpaceIsUnknown", QStringLiteral(" GetAllScheduleRecInfo"), false, true},
        Route{"CorrectSpellingOfContinousIsUnknown", QStringLiteral("DefaultContinuousSchedule"),
              false, true},
        Route{"PrefixOfACommandIsUnknown", QStringLiteral("GetSchedule"), false, true},
        Route{"EmptyCommandIsUnknown", QString(), false, true},
        Route{"ScheduleTypeWordIsNoCommand", QStringLiteral("Customize"), false, true},
        Route{"TunnelCommandIsNoClientCommand", QStringLiteral("GetRecTmcard"), false, true}),
    [](const auto &info) { return std::string(info.param.name); });

// What the dispatcher binds into the completion of its read: the handler it
// reaches and the payload values it hands on, seen through the first control
// operation that handler makes once the time cards have arrived.
struct Binding
{
    const char *name;
    QString command;
    QVariantMap payload;
    QList<QVariant> timecards;
    QStringList operationsAfterRead;
    QList<QVariant> lastArguments;
    QString failedReadRecord; // the error line when the read fails instead
};

void PrintTo(const Binding &binding, std::ostream *os)
{
    *os << binding.name;
}

class Bindings : public DispatchTest, public ::testing::WithParamInterface<Binding>
{};

TEST_P(Bindings, ReachTheHandlerWithThePayloadValues)
{
    const Binding &binding = GetParam();
    control->setAnswer({true, false, binding.timecards, QStringLiteral("<GetRecTmcardRes/>")});
    ReplyRecorder reply;
    plugin.Request(binding.command, binding.payload, sender(1), reply.callback());
    const QList<FakeControl::Call> calls = control->calls();
    EXPECT_EQ(control->operations(), QStringList{QStringLiteral("GetAllScheduleTimecardInfo")} +
                                         binding.operationsAfterRead);
    EXPECT_EQ(calls.constLast().arguments, binding.lastArguments);
    EXPECT_EQ(reply.count(), 1) << "the refused send is answered";
}

TEST_P(Bindings, FailedReadIsReportedByThatHandler)
{
    TestLog log;
    log.attach();
    control->setAnswer({false, false, {}, {}});
    ReplyRecorder reply;
    plugin.Request(GetParam().command, GetParam().payload, sender(1), reply.callback());
    ASSERT_EQ(reply.count(), 1);
    EXPECT_FALSE(reply.last().flag) << "the read's own flag";
    EXPECT_EQ(reply.last().code, QStringLiteral("-1"));
    EXPECT_EQ(log.texts(2), QStringList{GetParam().failedReadRecord});
}

const QVariantMap Camera{{QStringLiteral("Name"), QStringLiteral("C_4")},
                         {QStringLiteral("GrpID"), QStringLiteral("2")}};
const QVariantMap WithCameras{{QStringLiteral("camRecGroupList"), QVariantList{Camera}}};
const QString Document = QStringLiteral("{\"Rectangles\":[]}");
const QVariantMap Timecard7{{QStringLiteral("TmcardID"), QStringLiteral("7")},
                            {QStringLiteral("Revision"), QStringLiteral("4")}};
const QString ListFailed = QStringLiteral("Fail to get time card list.");
const QString AllFailed = QStringLiteral("Fail to get all schedule time card.");

INSTANTIATE_TEST_SUITE_P(
    Dispatch, Bindings,
    ::testing::Values(
        Binding{"DefaultContinousScheduleCreatesTheContinuousTimecard",
                QStringLiteral("DefaultContinousSchedule"),
                WithCameras,
                {},
                {"GetDefaultContinousTimecardInfo", "CreateDefaultContinuousTimecard"},
                {QVariantList{Camera}},
                ListFailed},
        Binding{"DefaultEventScheduleCreatesTheEventTimecard",
                QStringLiteral("DefaultEventSchedule"),
                WithCameras,
                {},
                {"GetDefaultEventTimecardInfo", "CreateDefaultEventTimecard"},
                {QVariantList{Camera}},
                ListFailed},
        Binding{"CustomizeScheduleHandsOnItsDocument",
                QStringLiteral("CustomizeSchedule"),
                {{QStringLiteral("timeframes"), Document},
                 {QStringLiteral("camRecGroupList"), QVariantList{Camera}}},
                {},
                {"GetCustomizeTimecardInfo", "CreateCustomizeTimecard"},
                {Document, QVariantList{Camera}},
                ListFailed},
        Binding{"DefaultNotRecordingScheduleClearsTheDefaultTimecard",
                QStringLiteral("DefaultNotRecordingSchedule"),
                WithCameras,
                {},
                {"RemoveTimecardCameraList"},
                {1, QVariantList{Camera}},
                AllFailed},
        Binding{"DelScheduleDeletesTheNamedTimecard",
                QStringLiteral("DelSchedule"),
                {{QStringLiteral("TimeCardID"), QStringLiteral("7")}},
                {QVariantMap{{QStringLiteral("TmcardID"), QStringLiteral("3")}}, Timecard7},
                {"DeleteSchedule"},
                {Timecard7},
                AllFailed}),
    [](const auto &info) { return std::string(info.param.name); });

TEST_F(DispatchTest, ClientIdentityIsReplacedOnEveryRequestWhateverTheCommand)
{
    ReplyRecorder reply;
    plugin.Request(QStringLiteral("GetScheduleRecInfo"), QVariant(), sender(1), reply.callback());
    plugin.Request(QStringLiteral("NoSuchCommand"), QVariant(), sender(2), reply.callback());
    plugin.Request(QStringLiteral("AddSchedule"), QVariant(), sender(3), reply.callback());
    plugin.Request(QStringLiteral("GetScheduleRecInfo"), QVariant(), sender(1), reply.callback());
    EXPECT_EQ(control->clientIds(),
              (QList<void *>{reinterpret_cast<void *>(1), reinterpret_cast<void *>(2),
                             reinterpret_cast<void *>(3), reinterpret_cast<void *>(1)}));
    // The identity is stored before the command is looked at.
    EXPECT_EQ(control->calls().first().operation, QStringLiteral("SetClientID"));
}

// Every command, with a refused read of all time cards, answers at once; the
// plain design left these clients waiting for ever.
class RefusedRead : public DispatchTest, public ::testing::WithParamInterface<QString>
{};

TEST_P(RefusedRead, IsAnsweredAtOnce)
{
    control->setFetch(FakeControl::Fetch::Refuse);
    ReplyRecorder reply;
    plugin.Request(GetParam(), QVariant(), sender(7), reply.callback());
    ASSERT_EQ(reply.count(), 1);
    EXPECT_TRUE(reply.last().flag);
    EXPECT_EQ(reply.last().code, QStringLiteral("-1"));
    EXPECT_TRUE(reply.last().text.isEmpty());
    EXPECT_FALSE(reply.last().data.isValid());
}

INSTANTIATE_TEST_SUITE_P(Dispatch, RefusedRead, ::testing::ValuesIn(ReadFirstCommands),
                         [](const auto &info) { return info.param.toStdString(); });

// Payloads of any type: every request still gets exactly one reply, whether
// the read of all time cards then succeeds, fails or is refused.
struct PayloadCase
{
    const char *name;
    QVariant payload;
};

void PrintTo(const PayloadCase &c, std::ostream *os)
{
    *os << c.name;
}

class OddPayload : public DispatchTest,
                   public ::testing::WithParamInterface<std::tuple<QString, PayloadCase>>
{};

TEST_P(OddPayload, GetsExactlyOneReply)
{
    const auto &[command, payload] = GetParam();
    for (const FakeControl::Answer &answer :
         {FakeControl::Answer{true, false, {}, {}}, FakeControl::Answer{false, false, {}, {}},
          FakeControl::Answer{true, true, {QVariant(QStringLiteral("not a map"))}, {}}}) {
        control->setAnswer(answer);
        ReplyRecorder reply;
        plugin.Request(command, payload.payload, sender(9), reply.callback());
        EXPECT_EQ(reply.count(), 1) << "ok " << answer.ok;
        EXPECT_TRUE(reply.last().text.isEmpty());
    }
}

const PayloadCase OddPayloads[] = {
    {"NoPayload", QVariant()},
    {"ListPayload", QVariantList{QStringLiteral("camRecGroupList"), 1}},
    {"StringPayload", QStringLiteral("{\"timeframes\":\"x\"}")},
    {"NumberPayload", 42},
    {"KeysOfTheWrongType",
     QVariantMap{{QStringLiteral("camRecGroupList"), QStringLiteral("C_1")},
                 {QStringLiteral("timeframes"), QVariantList{1, 2}},
                 {QStringLiteral("TimeCardID"), QVariantMap{{QStringLiteral("x"), 1}}},
                 {QStringLiteral("scheduleAddCam"), 3},
                 {QStringLiteral("ScheduleName"), QVariantList{}}}},
};

INSTANTIATE_TEST_SUITE_P(Dispatch, OddPayload,
                         ::testing::Combine(::testing::ValuesIn(allCommands()),
                                            ::testing::ValuesIn(OddPayloads)),
                         [](const auto &info) {
                             return std::get<0>(info.param).toStdString() + "_" +
                                    std::get<1>(info.param).name;
                         });

// Before a control exists, or after it is taken away, a request is answered
// at once instead of reaching a null control.
class NoControl : public ::testing::TestWithParam<QString>
{};

TEST_P(NoControl, AnswersAtOnceBeforeInitialisation)
{
    PluginRecordingScheduleSettingSrv plugin;
    ReplyRecorder reply;
    plugin.Request(GetParam(), QVariantMap(), sender(5), reply.callback());
    ASSERT_EQ(reply.count(), 1);
    EXPECT_TRUE(reply.last().flag);
    EXPECT_EQ(reply.last().code, QStringLiteral("-1"));
    EXPECT_FALSE(reply.last().data.isValid());
}

TEST_P(NoControl, AnswersAtOnceAfterTheControlIsTakenAway)
{
    PluginRecordingScheduleSettingSrv plugin;
    const auto control = QSharedPointer<FakeControl>::create();
    plugin.SetRecordingSettingControl(control);
    plugin.SetRecordingSettingControl({});
    ReplyRecorder reply;
    plugin.Request(GetParam(), QVariantMap(), sender(5), reply.callback());
    ASSERT_EQ(reply.count(), 1);
    EXPECT_EQ(reply.last().code, QStringLiteral("-1"));
    EXPECT_TRUE(control->calls().isEmpty());
}

TEST_P(NoControl, FailedInitialisationLeavesNoControl)
{
    Framework noTunnel;
    PluginRecordingScheduleSettingSrv plugin;
    ASSERT_FALSE(plugin.InitialPluginBase(&noTunnel));
    ReplyRecorder reply;
    plugin.Request(GetParam(), QVariantMap(), sender(5), reply.callback());
    ASSERT_EQ(reply.count(), 1);
    EXPECT_EQ(reply.last().code, QStringLiteral("-1"));
}

INSTANTIATE_TEST_SUITE_P(Dispatch, NoControl,
                         ::testing::ValuesIn(allCommands() << QStringLiteral("Unknown")),
                         [](const auto &info) { return info.param.toStdString(); });

TEST_F(DispatchTest, QueriesIgnoreThePayload)
{
    const QVariantMap timecard{
        {QStringLiteral("TmcardID"), QStringLiteral("7")},
        {QStringLiteral("Name"), QStringLiteral("KOLT2 Customize Recording")},
        {QStringLiteral("CamList"), QVariantMap()}};
    control->setAnswer({true, false, {timecard}, {}});
    for (const QString &command :
         {QStringLiteral("GetScheduleRecInfo"), QStringLiteral("GetCurrentScheduleInfo"),
          QStringLiteral("GetAllScheduleRecInfo")}) {
        ReplyRecorder plain;
        ReplyRecorder odd;
        plugin.Request(command, QVariant(), sender(1), plain.callback());
        plugin.Request(command,
                       QVariantMap{{QStringLiteral("TimeCardID"), QStringLiteral("3")},
                                   {QStringLiteral("camRecGroupList"), QVariantList{1}}},
                       sender(1), odd.callback());
        ASSERT_EQ(plain.count(), 1);
        ASSERT_EQ(odd.count(), 1);
        EXPECT_EQ(plain.last().code, QStringLiteral("0")) << command.toStdString();
        EXPECT_EQ(plain.last().data, odd.last().data) << command.toStdString();
    }
}

} // namespace

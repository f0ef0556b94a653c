// The control's send path, its two reads and its three answer handlers.
#include "ControlTestSupport.h"
#include "TestLog.h"

#include <QSharedPointer>

#include <atomic>
#include <functional>

namespace {

using Sent = TestTunnel::Sent;
using Answer = TestTunnel::Answer;

const QString PluginId = QStringLiteral("942E5F3F02EE4D7C879BADCD754F983C");
const QString OneTimecard = QStringLiteral(
    "<GetRecTmcardRes><Tmcard><Revision>3</Revision><TmcardID>9</TmcardID><Name>Lobby</Name>"
    "<Mapping/></Tmcard></GetRecTmcardRes>");
const QString TimecardAnswer = QStringLiteral(
    "<GetRecTmcardRes><Tmcard><Revision>3</Revision><TmcardID>9</TmcardID><Name>Lobby</Name>"
    "<CamList><Cam><Name>C_1</Name><GrpID>1</GrpID></Cam></CamList></Tmcard></GetRecTmcardRes>");

// One sending operation, started with a completion that counts its calls.
struct Operation
{
    const char *name;
    QString command;
    bool requesterIdentity;
    std::function<bool(RecordingSettingControl &, std::atomic<int> &calls)> start;
};

ControlResultCallback result(std::atomic<int> &calls)
{
    return [&calls](bool, bool) { ++calls; };
}
TimecardListCallback list(std::atomic<int> &calls)
{
    return [&calls](bool, bool, const QList<QVariant> &, const QString &) { ++calls; };
}

const QList<QVariant> Cams{camera("C_1", "1"), camera("C_2", "2")};
const QMap<QString, QVariant> Summary{{"Revision", "5"}, {"TmcardID", "2"}};

// clang-format off
const Operation Operations[] = {
    {"GetAllScheduleTimecardInfo", "GetRecTmcard", false, [](auto &c, auto &n) { return c.GetAllScheduleTimecardInfo(list(n)); }},
    {"GetScheduleTimecardInfoById", "GetRecTmcard", false, [](auto &c, auto &n) { return c.GetScheduleTimecardInfoById(4, list(n)); }},
    {"RemoveTimecardCameraList", "GetRecTmcard", false, [](auto &c, auto &n) { return c.RemoveTimecardCameraList(4, Cams, result(n)); }},
    {"CreateDefaultContinuousTimecard", "InsRecTmcard", false, [](auto &c, auto &n) { return c.CreateDefaultContinuousTimecard(Cams, result(n)); }},
    {"UpdateDefaultContinuousTimecard", "UpdRecTmcard", false, [](auto &c, auto &n) { return c.UpdateDefaultContinuousTimecard(Summary, Cams, result(n)); }},
    {"CreateDefaultEventTimecard", "InsRecTmcard", false, [](auto &c, auto &n) { return c.CreateDefaultEventTimecard(Cams, result(n)); }},
    {"UpdateDefaultEventTimecard", "UpdRecTmcard", false, [](auto &c, auto &n) { return c.UpdateDefaultEventTimecard(Summary, Cams, result(n)); }},
    {"CreateCustomizeTimecard", "InsRecTmcard", false, [](auto &c, auto &n) { return c.CreateCustomizeTimecard("{}", Cams, result(n)); }},
    {"UpdateCustomizeTimecard", "UpdRecTmcard", false, [](auto &c, auto &n) { return c.UpdateCustomizeTimecard(Summary, "{}", Cams, result(n)); }},
    {"AddSchedule", "InsRecTmcard", true, [](auto &c, auto &n) { return c.AddSchedule("L", "{}", [&n](bool, bool, auto &) { ++n; }); }},
    {"UpdateSchedule", "UpdRecTmcard", true, [](auto &c, auto &n) { return c.UpdateSchedule("5", "2", "L", "{}", Cams, result(n)); }},
    {"DeleteSchedule", "DelTmcard", true, [](auto &c, auto &n) { return c.DeleteSchedule(Summary, result(n)); }},
    {"UpdateTimecardCameraList", "UpdRecTmcard", true, [](auto &c, auto &n) { return c.UpdateTimecardCameraList(TimecardAnswer, Cams, result(n), 0); }},
};
// clang-format on

void PrintTo(const Operation &op, std::ostream *out)
{
    *out << op.name;
}

class SendPath : public ::testing::TestWithParam<Operation>
{};

TEST_P(SendPath, SendsOneWellFormedRequestWithTheOperationsCommandAndIdentity)
{
    const Operation &op = GetParam();
    TestTunnel tunnel(TestTunnel::Delivery::Held);
    RecordingSettingControl control(&tunnel);
    int requester = 0;
    control.SetClientID(&requester);
    std::atomic<int> calls{0};

    ASSERT_TRUE(op.start(control, calls));
    ASSERT_EQ(tunnel.sent().size(), 1);
    const Sent sent = tunnel.sent().first();
    EXPECT_EQ(sent.pluginId, PluginId);
    EXPECT_EQ(sent.kind, 1);
    EXPECT_EQ(sent.command, op.command);
    EXPECT_EQ(sent.timeoutMs, 15000);
    EXPECT_FALSE(sent.requestFlag);
    EXPECT_TRUE(sent.extra.isEmpty());
    EXPECT_EQ(sent.clientId,
              op.requesterIdentity ? static_cast<void *>(&requester) : tunnel.ownId());
    EXPECT_TRUE(isWellFormedXml(sent.body)) << sent.body.toStdString();
    EXPECT_EQ(calls, 0) << "the completion waits for the answer";
    tunnel.deliverAll();
    EXPECT_EQ(calls, 1);
}

TEST_P(SendPath, RefusedSendReturnsFalseAndNeverCallsTheCompletion)
{
    TestTunnel tunnel;
    tunnel.refuseNext();
    RecordingSettingControl control(&tunnel);
    std::atomic<int> calls{0};
    EXPECT_FALSE(GetParam().start(control, calls));
    EXPECT_EQ(calls, 0);
}

TEST_P(SendPath, WithoutTunnelNothingIsSentAndNothingLogged)
{
    TestLog log;
    log.attach();
    RecordingSettingControl control(nullptr);
    std::atomic<int> calls{0};
    EXPECT_FALSE(GetParam().start(control, calls));
    EXPECT_EQ(calls, 0);
    EXPECT_TRUE(log.texts().isEmpty()) << log.texts().join('\n').toStdString();
}

INSTANTIATE_TEST_SUITE_P(EveryOperation, SendPath, ::testing::ValuesIn(Operations),
                         [](const auto &info) { return std::string(info.param.name); });

TEST(Reads, BodiesAreTheReadTemplates)
{
    TestTunnel tunnel(TestTunnel::Delivery::Held);
    RecordingSettingControl control(&tunnel);
    control.GetAllScheduleTimecardInfo({});
    control.GetScheduleTimecardInfoById(0, {});
    control.GetScheduleTimecardInfoById(-12, {});
    QStringList bodies;
    for (const Sent &sent : tunnel.sent())
        bodies << sent.body;
    EXPECT_EQ(bodies, QStringList({"<GetRecTmcard><TmcardAll>true</TmcardAll></GetRecTmcard>",
                                   "<GetRecTmcard><TmcardID>0</TmcardID></GetRecTmcard>",
                                   "<GetRecTmcard><TmcardID>-12</TmcardID></GetRecTmcard>"}));
    tunnel.deliverAll();
}

TEST(Identity, StoredIdentityIsReadAtTheMomentOfEachSend)
{
    TestTunnel tunnel(TestTunnel::Delivery::Held);
    RecordingSettingControl control(&tunnel);
    int first = 0;
    int second = 0;
    control.SetClientID(&first);
    control.DeleteSchedule(Summary, {});
    control.SetClientID(&second);
    control.DeleteSchedule(Summary, {});
    ASSERT_EQ(tunnel.sent().size(), 2);
    EXPECT_EQ(tunnel.sent()[0].clientId, &first);
    EXPECT_EQ(tunnel.sent()[1].clientId, &second);
    tunnel.deliverAll();
}

// One answer to one of the three handlers, and what the completion and the
// error log see; every row runs with the tunnel's flag false and true.
enum class Handler { Read, Insert, Result };

struct AnswerRow
{
    const char *name;
    Handler handler;
    Answer answer;
    bool ok;
    QString payload; // names of the time cards read, or the new identifier
    QString logged;
};

void PrintTo(const AnswerRow &row, std::ostream *out)
{
    *out << row.name;
}

class Answers : public ::testing::TestWithParam<AnswerRow>
{};

TEST_P(Answers, CompletionGetsWhatTheAnswerSaysAndTheFlagUnchanged)
{
    const AnswerRow &row = GetParam();
    if (row.ok && row.handler != Handler::Result)
        REQUIRE_CONVERTER();
    TestLog log;
    log.attach();
    for (const bool flag : {false, true}) {
        TestTunnel tunnel;
        tunnel.queueAnswer(Answer{row.answer.ok, row.answer.code, row.answer.content, flag});
        RecordingSettingControl control(&tunnel);
        Completion done;
        if (row.handler == Handler::Read)
            control.GetAllScheduleTimecardInfo(done.timecardList());
        else if (row.handler == Handler::Insert)
            control.AddSchedule("L", "{}", done.timecardId());
        else
            control.DeleteSchedule(Summary, done.result());
        EXPECT_EQ(done.calls, 1);
        EXPECT_EQ(done.ok, row.ok);
        EXPECT_EQ(done.flag, flag);
        QStringList names;
        for (const QVariant &t : done.timecards)
            names << t.toMap().value("Name").toString();
        EXPECT_EQ(row.handler == Handler::Read ? names.join(',') : done.text, row.payload);
        if (row.handler == Handler::Read) {
            EXPECT_EQ(done.text, row.ok ? row.answer.content : QString());
        }
    }
    const QStringList logged = row.logged.isEmpty() ? QStringList() : QStringList{row.logged};
    EXPECT_EQ(log.texts(2), logged + logged) << "one record per failed answer";
}

const QString Failed =
    QStringLiteral("RecordingSettingControl::%1, %1 failed: success:%2, reqRespCode:%3");
const QString Read = QStringLiteral("HdlrTunnelReqGetRecTimecard");
const QString Insert = QStringLiteral("HdlrAddScheduleCallback");
const QString Result = QStringLiteral("HdlrTunnelReqCallback");
const QString Two = QStringLiteral("<GetRecTmcardRes><Tmcard><Name>B</Name></"
                                   "Tmcard><Tmcard><Name>A</Name></Tmcard></GetRecTmcardRes>");

// clang-format off
INSTANTIATE_TEST_SUITE_P(Handlers, Answers, ::testing::Values(
    AnswerRow{"LoneTimecardIsAListOfOne", Handler::Read, {true, "0", OneTimecard}, true, "Lobby", ""},
    AnswerRow{"RepeatedTimecardsKeepTheirOrder", Handler::Read, {true, "0", Two}, true, "B,A", ""},
    AnswerRow{"NoTimecardIsAnEmptyList", Handler::Read, {true, "0", "<GetRecTmcardRes><X/></GetRecTmcardRes>"}, true, "", ""},
    AnswerRow{"ReadExchangeFailed", Handler::Read, {false, "0", OneTimecard}, false, "", Failed.arg(Read).arg(0).arg("0")},
    AnswerRow{"ReadRefused", Handler::Read, {true, "-7", OneTimecard}, false, "", Failed.arg(Read).arg(1).arg("-7")},
    AnswerRow{"ReadUnreadable", Handler::Read, {true, "0", "<GetRecTmcardRes><Tmcard>"}, false, "",
              "RecordingSettingControl::HdlrTunnelReqGetRecTimecard, parse Get Recording Timecard failed."},
    AnswerRow{"NewIdentifierIsRead", Handler::Insert, {true, "0", "<InsRecTmcardRes><TmcardID>42</TmcardID></InsRecTmcardRes>"}, true, "42", ""},
    AnswerRow{"InsertWithoutIdentifierSucceeds", Handler::Insert, {true, "0", "<InsRecTmcardRes><X/></InsRecTmcardRes>"}, true, "", ""},
    AnswerRow{"InsertExchangeFailed", Handler::Insert, {false, "0", ""}, false, "", Failed.arg(Insert).arg(0).arg("0")},
    AnswerRow{"InsertRefused", Handler::Insert, {true, "12", ""}, false, "", Failed.arg(Insert).arg(1).arg("12")},
    AnswerRow{"InsertUnreadable", Handler::Insert, {true, "0", "not xml"}, false, "",
              "RecordingSettingControl::HdlrAddScheduleCallback, parse InsRecTmcardRes failed."},
    AnswerRow{"ResultContentIsNotRead", Handler::Result, {true, "0", "not xml"}, true, "", ""},
    AnswerRow{"ResultExchangeFailed", Handler::Result, {false, "0", ""}, false, "", Failed.arg(Result).arg(0).arg("0")},
    AnswerRow{"ResultCodeMustBeExactlyZero", Handler::Result, {true, "00", ""}, false, "", Failed.arg(Result).arg(1).arg("00")}),
    [](const auto &info) { return std::string(info.param.name); });
// clang-format on

TEST(Lifetime, ReleasedControlLivesUntilEachOfItsAnswersIsHandled)
{
    TestTunnel tunnel(TestTunnel::Delivery::Held);
    tunnel.setResponder([](const Sent &sent) {
        return sent.command == "GetRecTmcard" ? Answer{true, "0", TimecardAnswer, true}
                                              : Answer{true, "0", QString(), true};
    });
    auto control = QSharedPointer<RecordingSettingControl>::create(&tunnel);
    const QWeakPointer<RecordingSettingControl> watch = control;
    Completion read, removed, deleted, added;
    ASSERT_TRUE(control->GetAllScheduleTimecardInfo(read.timecardList()));
    ASSERT_TRUE(control->RemoveTimecardCameraList(9, {camera("C_1", "1")}, removed.result()));
    ASSERT_TRUE(control->DeleteSchedule(Summary, deleted.result()));
    ASSERT_TRUE(control->AddSchedule("Lobby", "{}", added.timecardId()));

    control.reset();
    EXPECT_FALSE(watch.isNull()) << "answers on their way hold the control";
    tunnel.deliverAll();
    EXPECT_TRUE(watch.isNull()) << "the last answer releases it";
    for (const Completion *done : {&read, &removed, &deleted, &added}) {
        EXPECT_EQ(done->calls, 1);
        EXPECT_TRUE(done->flag);
    }
}

} // namespace

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
    std::function<bool(RecordingSettingControl &, std::atomic<int> &calls)> start;
    QString command;
    bool requesterIdentity;
};

ControlResultCallback counting(std::atomic<int> &calls)
{
    return [&calls](bool, bool) { ++calls; };
}

const QList<QVariant> TwoCameras{camera("C_1", "1"), camera("C_2", "2")};
const QMap<QString, QVariant> Summary{{"Revision", "5"}, {"TmcardID", "2"}};

const Operation Operations[] = {
    {"GetAllScheduleTimecardInfo",
     [](auto &c, auto &n) {
         return c.GetAllScheduleTimecardInfo([&n](bool, bool, auto &, auto &) { ++n; });
     },
     "GetRecTmcard", false},
    {"GetScheduleTimecardInfoById",
     [](auto &c, auto &n) {
         return c.GetScheduleTimecardInfoById(4, [&n](bool, bool, auto &, auto &) { ++n; });
     },
     "GetRecTmcard", false},
    {"RemoveTimecardCameraList",
     [](auto &c, auto &n) { return c.RemoveTimecardCameraList(4, TwoCameras, counting(n)); },
     "GetRecTmcard", false},
    {"CreateDefaultContinuousTimecard",
     [](auto &c, auto &n) { return c.CreateDefaultContinuousTimecard(TwoCameras, counting(n)); },
     "InsRecTmcard", false},
    {"UpdateDefaultContinuousTimecard",
     [](auto &c, auto &n) {
         return c.UpdateDefaultContinuousTimecard(Summary, TwoCameras, counting(n));
     },
     "UpdRecTmcard", false},
    {"CreateDefaultEventTimecard",
     [](auto &c, auto &n) { return c.CreateDefaultEventTimecard(TwoCameras, counting(n)); },
     "InsRecTmcard", false},
    {"UpdateDefaultEventTimecard",
     [](auto &c, auto &n) {
         return c.UpdateDefaultEventTimecard(Summary, TwoCameras, counting(n));
     },
     "UpdRecTmcard", false},
    {"CreateCustomizeTimecard",
     [](auto &c, auto &n) { return c.CreateCustomizeTimecard("{}", TwoCameras, counting(n)); },
     "InsRecTmcard", false},
    {"UpdateCustomizeTimecard",
     [](auto &c, auto &n) {
         return c.UpdateCustomizeTimecard(Summary, "{}", TwoCameras, counting(n));
     },
     "UpdRecTmcard", false},
    {"AddSchedule",
     [](auto &c, auto &n) {
         return c.AddSchedule("Lobby", "{}", [&n](bool, bool, auto &) { ++n; });
     },
     "InsRecTmcard", true},
    {"UpdateSchedule",
     [](auto &c, auto &n) {
         return c.UpdateSchedule("5", "2", "Lobby", "{}", TwoCameras, counting(n));
     },
     "UpdRecTmcard", true},
    {"DeleteSchedule", [](auto &c, auto &n) { return c.DeleteSchedule(Summary, counting(n)); },
     "DelTmcard", true},
    {"UpdateTimecardCameraList",
     [](auto &c, auto &n) {
         return c.UpdateTimecardCameraList(TimecardAnswer, TwoCameras, counting(n), 0);
     },
     "UpdRecTmcard", true},
};

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
}

// One answer to one handler, and what the completion and the error log see.
struct AnswerRow
{
    const char *name;
    Answer answer;
    bool needsConverter;
    bool ok;
    QString payload; // the time card names read, or the new identifier
    QString logged;
};

void PrintTo(const AnswerRow &row, std::ostream *out)
{
    *out << row.name;
}

QString timecardNames(const QList<QVariant> &timecards)
{
    QStringList names;
    for (const QVariant &t : timecards)
        names << t.toMap().value("Name").toString();
    return names.join(',');
}

class ReadAnswer : public ::testing::TestWithParam<AnswerRow>
{};

TEST_P(ReadAnswer, CompletionGetsTheTimecardsAndTheFlagUnchanged)
{
    const AnswerRow &row = GetParam();
    if (row.needsConverter)
        REQUIRE_CONVERTER();
    TestLog log;
    log.attach();
    for (const bool flag : {false, true}) {
        TestTunnel tunnel;
        Answer answer = row.answer;
        answer.flag = flag;
        tunnel.queueAnswer(answer);
        RecordingSettingControl control(&tunnel);
        Completion done;
        ASSERT_TRUE(control.GetAllScheduleTimecardInfo(done.timecardList()));
        EXPECT_EQ(done.calls, 1);
        EXPECT_EQ(done.ok, row.ok);
        EXPECT_EQ(done.flag, flag);
        EXPECT_EQ(timecardNames(done.timecards), row.payload);
        EXPECT_EQ(done.text, row.ok ? answer.content : QString());
    }
    const QStringList logged = row.logged.isEmpty() ? QStringList() : QStringList{row.logged};
    EXPECT_EQ(log.texts(2), logged + logged) << "one record per failed answer";
}

const QString GetFailed = QStringLiteral(
    "RecordingSettingControl::HdlrTunnelReqGetRecTimecard, HdlrTunnelReqGetRecTimecard failed: "
    "success:%1, reqRespCode:%2");

const AnswerRow ReadRows[] = {
    {"LoneTimecardIsAListOfOne", {true, "0", OneTimecard, false}, true, true, "Lobby", ""},
    {"RepeatedTimecardsKeepTheirOrder",
     {true, "0",
      "<GetRecTmcardRes><Tmcard><Name>B</Name></Tmcard><Tmcard><Name>A</Name></Tmcard>"
      "</GetRecTmcardRes>",
      false},
     true,
     true,
     "B,A",
     ""},
    {"NoTimecardIsAnEmptyList",
     {true, "0", "<GetRecTmcardRes><Other>1</Other></GetRecTmcardRes>", false},
     true,
     true,
     "",
     ""},
    {"FailedExchange",
     {false, "0", OneTimecard, false},
     false,
     false,
     "",
     GetFailed.arg(0).arg("0")},
    {"ServerRefusal",
     {true, "-7", OneTimecard, false},
     false,
     false,
     "",
     GetFailed.arg(1).arg("-7")},
    {"UnreadableAnswer",
     {true, "0", "<GetRecTmcardRes><Tmcard>", false},
     false,
     false,
     "",
     "RecordingSettingControl::HdlrTunnelReqGetRecTimecard, parse Get Recording Timecard "
     "failed."},
};
INSTANTIATE_TEST_SUITE_P(Answers, ReadAnswer, ::testing::ValuesIn(ReadRows),
                         [](const auto &info) { return std::string(info.param.name); });

class InsertAnswer : public ::testing::TestWithParam<AnswerRow>
{};

TEST_P(InsertAnswer, CompletionGetsTheNewIdentifierAndTheFlagUnchanged)
{
    const AnswerRow &row = GetParam();
    if (row.needsConverter)
        REQUIRE_CONVERTER();
    TestLog log;
    log.attach();
    TestTunnel tunnel;
    Answer answer = row.answer;
    answer.flag = true;
    tunnel.queueAnswer(answer);
    RecordingSettingControl control(&tunnel);
    Completion done;
    ASSERT_TRUE(control.AddSchedule("Lobby", "{}", done.timecardId()));
    EXPECT_EQ(done.calls, 1);
    EXPECT_EQ(done.ok, row.ok);
    EXPECT_TRUE(done.flag);
    EXPECT_EQ(done.text, row.payload);
    EXPECT_EQ(log.texts(2), (row.logged.isEmpty() ? QStringList() : QStringList{row.logged}));
}

const QString AddFailed = QStringLiteral(
    "RecordingSettingControl::HdlrAddScheduleCallback, HdlrAddScheduleCallback failed: "
    "success:%1, reqRespCode:%2");

const AnswerRow InsertRows[] = {
    {"IdentifierIsRead",
     {true, "0", "<InsRecTmcardRes><TmcardID>42</TmcardID></InsRecTmcardRes>", false},
     true,
     true,
     "42",
     ""},
    {"AnswerWithoutIdentifierStillSucceeds",
     {true, "0", "<InsRecTmcardRes><Other>1</Other></InsRecTmcardRes>", false},
     true,
     true,
     "",
     ""},
    {"FailedExchange", {false, "0", "", false}, false, false, "", AddFailed.arg(0).arg("0")},
    {"ServerRefusal", {true, "12", "", false}, false, false, "", AddFailed.arg(1).arg("12")},
    {"UnreadableAnswer",
     {true, "0", "not xml", false},
     false,
     false,
     "",
     "RecordingSettingControl::HdlrAddScheduleCallback, parse InsRecTmcardRes failed."},
};
INSTANTIATE_TEST_SUITE_P(Answers, InsertAnswer, ::testing::ValuesIn(InsertRows),
                         [](const auto &info) { return std::string(info.param.name); });

TEST(ResultAnswer, OnlyOkWithCodeZeroSucceedsAndTheFlagIsHandedOn)
{
    const QString failed = QStringLiteral(
        "RecordingSettingControl::HdlrTunnelReqCallback, HdlrTunnelReqCallback failed: "
        "success:%1, reqRespCode:%2");
    const struct
    {
        Answer answer;
        bool ok;
        QString logged;
    } rows[] = {
        {{true, "0", "ignored", true}, true, ""},
        {{true, "0", "", false}, true, ""},
        {{false, "0", "", true}, false, failed.arg(0).arg("0")},
        {{true, "00", "", false}, false, failed.arg(1).arg("00")},
        {{true, "", "", true}, false, failed.arg(1).arg("")},
    };
    for (const auto &row : rows) {
        TestLog log;
        log.attach();
        TestTunnel tunnel;
        tunnel.queueAnswer(row.answer);
        RecordingSettingControl control(&tunnel);
        Completion done;
        ASSERT_TRUE(control.DeleteSchedule(Summary, done.result()));
        EXPECT_EQ(done.calls, 1);
        EXPECT_EQ(done.ok, row.ok);
        EXPECT_EQ(done.flag, row.answer.flag);
        EXPECT_EQ(log.texts(2), (row.logged.isEmpty() ? QStringList() : QStringList{row.logged}));
    }
}

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

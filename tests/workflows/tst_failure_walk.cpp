// Walks every step of every workflow chain and fails it in each way a step
// can fail: the tunnel refuses the send, the tunnel reports a failed
// exchange, the server refuses, or a read finds no time card. Whatever fails,
// the request gets exactly one reply, "-1", and nothing is sent after the
// failed step.

#include "RecordingScheduleSettingConstants.h"
#include "WorkflowHarness.h"

#include <gtest/gtest.h>

#include <memory>

namespace {

using namespace PluginRecordingScheduleSettingCommon;
using Camera = FakeRecordingServer::Camera;
using Timecard = FakeRecordingServer::Timecard;

enum class Fault { Refused, TunnelFailed, ServerFailed, NoTimecard };

// What a step is, as far as its failures go.
enum class Step {
    Change,      // an insert, update or delete
    Read,        // a read whose empty answer ends the command
    ReadAll,     // a read of all time cards, for which no time card is a valid answer
    RemovalRead, // the read of a removal, after which the control still sends an update
};

struct Chain
{
    const char *name;
    QString command;
    QVariantMap payload;
    QList<Timecard> before;
    std::vector<Step> steps;
};

struct WalkRow
{
    Chain chain;
    size_t step;
    Fault fault;
};

std::string faultName(Fault fault)
{
    switch (fault) {
    case Fault::Refused:
        return "refused";
    case Fault::TunnelFailed:
        return "tunnel_failed";
    case Fault::ServerFailed:
        return "server_failed";
    case Fault::NoTimecard:
        return "no_timecard";
    }
    return {};
}

void PrintTo(const WalkRow &row, std::ostream *os)
{
    *os << row.chain.name << " step " << row.step << " " << faultName(row.fault);
}

QVariantMap entry(const QString &id, const QList<Camera> &cameras)
{
    return QVariantMap{{"scheduleID", id}, {"camIDList", cameraEntries(cameras)}};
}

const Timecard Five{5, 1, "Five", "", {{"C_1", "1"}, {"C_2", "1"}}};
const Timecard Seven{7, 1, "Seven", "", {{"C_3", "1"}}};
const Timecard Nine{9, 1, "Nine", "", {{"C_4", "1"}}};
const Timecard Event{4, 1, TimecardName::DefaultEvent, "", {{"C_8", "1"}}};
const Timecard Continuous{2, 1, TimecardName::DefaultContinuous, "", {{"C_6", "1"}}};

const std::vector<Chain> Chains = {
    {"add_schedule",
     "AddSchedule",
     {{"ScheduleName", "Lobby"}, {"timeframes", LobbyDocument}},
     {},
     {Step::Change}},
    {"update_schedule",
     "UpdateSchedule",
     {{"TimeCardID", "5"}, {"ScheduleName", "Lobby"}, {"timeframes", LobbyDocument}},
     {Five},
     {Step::Read, Step::Change}},
    {"del_schedule", "DelSchedule", {{"TimeCardID", "5"}}, {Five}, {Step::Read, Step::Change}},
    {"cam_rec_removals_then_addition",
     "UpdateCamRecSchedule",
     {{"scheduleRmvCam", QVariantList{entry("5", {{"C_1", "1"}}), entry("7", {{"C_3", "1"}})}},
      {"scheduleAddCam", QVariantList{entry("9", {{"C_1", "1"}})}}},
     {Five, Seven, Nine},
     {Step::Read, Step::Change, Step::Read, Step::Change, Step::Read, Step::Change}},
    {"cam_rec_existing_default_event",
     "UpdateCamRecSchedule",
     {{"scheduleAddCam", QVariantList{entry("-2", {{"C_1", "1"}})}}},
     {Event},
     {Step::ReadAll, Step::Read, Step::Change}},
    {"cam_rec_missing_default_continuous",
     "UpdateCamRecSchedule",
     {{"scheduleAddCam", QVariantList{entry("-3", {{"C_1", "1"}})}}},
     {Event},
     {Step::ReadAll, Step::Change}},
    {"continuous_off_other_timecards",
     "DefaultContinousSchedule",
     {{"camRecGroupList", cameraEntries({{"C_1", "1"}, {"C_3", "1"}})}},
     {Continuous, Five, Seven},
     {Step::ReadAll, Step::RemovalRead, Step::Change, Step::RemovalRead, Step::Change,
      Step::ReadAll, Step::Change}},
    {"event_onto_existing",
     "DefaultEventSchedule",
     {{"camRecGroupList", cameraEntries({{"C_7", "1"}})}},
     {Event},
     {Step::ReadAll, Step::Change}},
    {"customize_created",
     "CustomizeSchedule",
     {{"timeframes", LobbyDocument}, {"camRecGroupList", cameraEntries({{"C_7", "1"}})}},
     {Event},
     {Step::ReadAll, Step::Change}},
    {"not_recording",
     "DefaultNotRecordingSchedule",
     {{"camRecGroupList", cameraEntries({{"C_1", "1"}})}},
     {Five, Seven},
     {Step::ReadAll, Step::RemovalRead, Step::Change, Step::RemovalRead, Step::Change}},
};

std::vector<WalkRow> walkRows()
{
    std::vector<WalkRow> rows;
    for (const Chain &chain : Chains) {
        for (size_t step = 0; step < chain.steps.size(); ++step) {
            for (Fault fault :
                 {Fault::Refused, Fault::TunnelFailed, Fault::ServerFailed, Fault::NoTimecard}) {
                const Step kind = chain.steps[step];
                if (fault == Fault::NoTimecard && (kind == Step::Change || kind == Step::ReadAll))
                    continue;
                rows.push_back(WalkRow{chain, step, fault});
            }
        }
    }
    return rows;
}

// The n-th send (from 0) fails as asked; the others reach the server.
void injectFault(WorkflowHarness &h, size_t step, Fault fault)
{
    auto count = std::make_shared<size_t>(0);
    if (fault == Fault::Refused) {
        h.tunnel.setRefusal([count, step](const TestTunnel::Sent &) { return (*count)++ == step; });
        return;
    }
    FakeRecordingServer *server = &h.server;
    h.tunnel.setResponder([server, count, step, fault](const TestTunnel::Sent &sent) {
        if ((*count)++ != step)
            return server->answer(sent);
        switch (fault) {
        case Fault::TunnelFailed:
            return TestTunnel::Answer{false, QString(), QString(), true};
        case Fault::ServerFailed:
            return TestTunnel::Answer{true, QStringLiteral("-1"), QString(), true};
        default:
            return TestTunnel::Answer{true, QStringLiteral("0"),
                                      QStringLiteral("<GetRecTmcardRes></GetRecTmcardRes>"), true};
        }
    });
}

std::vector<Message> successfulRun(const Chain &chain)
{
    WorkflowHarness h;
    for (const Timecard &timecard : chain.before)
        h.server.put(timecard);
    h.request(chain.command, chain.payload);
    const auto replies = h.replies.replies();
    EXPECT_EQ(replies.size(), 1u);
    EXPECT_TRUE(!replies.empty() && replies[0].code == QStringLiteral("0"));
    return h.messages();
}

class FailureWalk : public ::testing::TestWithParam<WalkRow>
{};

TEST_P(FailureWalk, EndsInExactlyOneFailureReply)
{
    const WalkRow &row = GetParam();
    const std::vector<Message> success = successfulRun(row.chain);
    ASSERT_EQ(success.size(), row.chain.steps.size()) << "the chain's steps are out of date";

    WorkflowHarness h;
    for (const Timecard &timecard : row.chain.before)
        h.server.put(timecard);
    // Every answer carries the flag true, as does a reply the plug-in makes
    // on its own: the walk is about the code and the count of replies.
    h.server.setAnswerFlag(true);
    injectFault(h, row.step, row.fault);
    h.request(row.chain.command, row.chain.payload);

    const auto replies = h.replies.replies();
    ASSERT_EQ(replies.size(), 1u);
    EXPECT_TRUE(replies[0].flag);
    EXPECT_EQ(replies[0].code, QStringLiteral("-1"));
    const std::vector<Message> sent = h.messages();
    const size_t reached = row.fault == Fault::Refused ? row.step : row.step + 1;
    ASSERT_GE(sent.size(), reached);
    EXPECT_EQ(std::vector<Message>(sent.begin(), sent.begin() + reached),
              std::vector<Message>(success.begin(), success.begin() + reached));
    // A removal whose read found nothing still sends the control's update,
    // which the server refuses; nothing goes after it.
    const bool removalUpdate =
        row.fault == Fault::NoTimecard && row.chain.steps[row.step] == Step::RemovalRead;
    EXPECT_LE(sent.size(), reached + (removalUpdate ? 1 : 0));
}

INSTANTIATE_TEST_SUITE_P(EveryStep, FailureWalk, ::testing::ValuesIn(walkRows()),
                         [](const auto &info) {
                             return std::string(info.param.chain.name) + "_step" +
                                    std::to_string(info.param.step) + "_" +
                                    faultName(info.param.fault);
                         });

// Answers that arrive after the plug-in is gone still end their requests.
TEST(PluginGone, AnswersInFlightAreStillAnsweredOnce)
{
    for (const Chain &chain : Chains) {
        SCOPED_TRACE(chain.name);
        WorkflowHarness h(TestTunnel::Delivery::Held);
        for (const Timecard &timecard : chain.before)
            h.server.put(timecard);
        h.request(chain.command, chain.payload);
        ASSERT_EQ(h.tunnel.pending(), 1);
        h.plugin.reset();
        h.tunnel.deliverAll();
        ExpectOneReply(h.replies, true, "-1");
        EXPECT_EQ(h.messages().size(), 1u);
    }
}

} // namespace

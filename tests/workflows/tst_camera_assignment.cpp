// "UpdateCamRecSchedule" through Request, the real control and a test tunnel
// answered by a fake recording server.

#include "RecordingScheduleSettingConstants.h"
#include "TestLog.h"
#include "WorkflowHarness.h"

#include <gtest/gtest.h>

namespace {

using namespace PluginRecordingScheduleSettingCommon;
using Camera = FakeRecordingServer::Camera;
using Timecard = FakeRecordingServer::Timecard;

const QString Command = QStringLiteral("UpdateCamRecSchedule");

QVariantMap entry(const QVariant &id, const QList<Camera> &cameras)
{
    return QVariantMap{{"scheduleID", id}, {"camIDList", cameraEntries(cameras)}};
}

QVariantMap payload(const QVariantList &removals, const QVariantList &additions)
{
    return QVariantMap{{"scheduleRmvCam", removals}, {"scheduleAddCam", additions}};
}

std::string rowName(const char *name)
{
    std::string result = name;
    for (char &c : result)
        c = std::isalnum(static_cast<unsigned char>(c)) ? c : '_';
    return result;
}

class CameraAssignment : public ::testing::Test
{
protected:
    void SetUp() override { log.attach(); }
    TestLog log;
    WorkflowHarness h;
};

TEST_F(CameraAssignment, NothingToDoIsAnsweredAtOnce)
{
    h.request(Command, QVariantMap{{"Other", 1}});
    EXPECT_TRUE(h.messages().empty());
    ExpectOneReply(h.replies, true, "0");
}

TEST_F(CameraAssignment, RemovalsComeFirstOneEntryAfterTheOther)
{
    const Timecard five{5, 1, "Five", "", {{"C_1", "1"}, {"C_2", "1"}}};
    const Timecard seven{7, 2, "Seven", "", {{"C_3", "2"}}};
    const Timecard nine{9, 3, "Nine", "", {{"C_4", "1"}}};
    h.server.put(five);
    h.server.put(seven);
    h.server.put(nine);
    h.server.setAnswerFlag(true);

    h.request(Command, payload({entry("5", {{"C_1", "1"}}), entry("7", {{"C_3", "2"}})},
                               {entry("9", {{"C_1", "1"}})}));

    EXPECT_EQ(h.messages(),
              (std::vector<Message>{
                  msg("GetRecTmcard", Expect::readOne(5)),
                  msg("UpdRecTmcard", Expect::updateCameras(five, {{"C_2", "1"}})),
                  msg("GetRecTmcard", Expect::readOne(7)),
                  // Its last camera gone, the time card goes back without a camera list.
                  msg("UpdRecTmcard", Expect::updateCameras(seven, {})),
                  msg("GetRecTmcard", Expect::readOne(9)),
                  msg("UpdRecTmcard", Expect::updateCameras(nine, {{"C_4", "1"}, {"C_1", "1"}})),
              }));
    ExpectOneReply(h.replies, true, "0");
    EXPECT_TRUE(h.server.find(7)->cameras.isEmpty());
}

TEST_F(CameraAssignment, ACameraTheTimecardHoldsIsNotAddedAgain)
{
    const Timecard nine{9, 3, "Nine", "", {{"C_1", "1"}}};
    h.server.put(nine);
    h.request(Command,
              payload({}, {entry("9", {{"C_1", "1"}, {"C_2", "2"}, {"C_2", "2"}, {"C_1", "3"}})}));
    EXPECT_EQ(h.messages().back(),
              msg("UpdRecTmcard", Expect::updateCameras(nine, {{"C_1", "1"}, {"C_2", "2"}})));
    ExpectOneReply(h.replies, false, "0");
}

// One entry left behind would keep the camera recording by this time card.
TEST_F(CameraAssignment, ACameraStandingTwiceIsRemovedEntirely)
{
    const Timecard five{5, 1, "Five", "", {{"C_1", "1"}, {"C_2", "2"}, {"C_1", "1"}}};
    h.server.put(five);
    h.request(Command, payload({entry("5", {{"C_1", "1"}})}, {}));
    EXPECT_EQ(h.messages().back(),
              msg("UpdRecTmcard", Expect::updateCameras(five, {{"C_2", "2"}})));
    ExpectOneReply(h.replies, false, "0");
}

struct RemovalRow
{
    const char *name;
    QVariantMap camera;
    QList<Camera> left;
};

void PrintTo(const RemovalRow &row, std::ostream *os)
{
    *os << row.name;
}

class RemovalMatching : public CameraAssignment, public ::testing::WithParamInterface<RemovalRow>
{};

TEST_P(RemovalMatching, SendsTheCamerasLeft)
{
    const Timecard five{5, 1, "Five", "", {{"C_1", "1"}, {"C_2", "2"}}};
    h.server.put(five);
    const QVariantMap removal{{"scheduleID", "5"}, {"camIDList", QVariantList{GetParam().camera}}};
    h.request(Command, payload({removal}, {}));
    EXPECT_EQ(h.messages(), (std::vector<Message>{
                                msg("GetRecTmcard", Expect::readOne(5)),
                                msg("UpdRecTmcard", Expect::updateCameras(five, GetParam().left)),
                            }));
    ExpectOneReply(h.replies, false, "0");
}

INSTANTIATE_TEST_SUITE_P(
    UpdateCamRecSchedule, RemovalMatching,
    ::testing::Values(RemovalRow{"group sent as a number still matches the server's text",
                                 {{"Name", "C_1"}, {"GrpID", 1}},
                                 {{"C_2", "2"}}},
                      RemovalRow{"keys other than name and group are ignored",
                                 {{"Name", "C_1"}, {"GrpID", "1"}, {"Model", "X"}},
                                 {{"C_2", "2"}}},
                      RemovalRow{"a different group leaves the camera in place",
                                 {{"Name", "C_1"}, {"GrpID", "2"}},
                                 {{"C_1", "1"}, {"C_2", "2"}}},
                      RemovalRow{"names are compared exactly",
                                 {{"Name", "c_1"}, {"GrpID", "1"}},
                                 {{"C_1", "1"}, {"C_2", "2"}}}),
    [](const auto &info) { return rowName(info.param.name); });

struct RejectedRow
{
    const char *name;
    QVariantMap payload;
};

void PrintTo(const RejectedRow &row, std::ostream *os)
{
    *os << row.name;
}

class RejectedEntries : public CameraAssignment, public ::testing::WithParamInterface<RejectedRow>
{};

// A bad entry anywhere stops the command before its first step, so that no
// time card is half moved; time card 0 shows what a read of "abc" would hit.
TEST_P(RejectedEntries, AnswerAtOnceAndSendNothing)
{
    h.server.put(Timecard{0, 1, "Zero", "", {{"C_1", "1"}}});
    h.server.put(Timecard{5, 1, "Five", "", {{"C_1", "1"}}});
    h.request(Command, GetParam().payload);
    EXPECT_TRUE(h.messages().empty());
    ExpectOneReply(h.replies, true, "-1");
    EXPECT_EQ(h.server.find(0)->revision, 1);
    EXPECT_EQ(h.server.find(5)->revision, 1);
}

INSTANTIATE_TEST_SUITE_P(
    UpdateCamRecSchedule, RejectedEntries,
    ::testing::Values(
        RejectedRow{"removal naming letters", payload({entry("abc", {{"C_1", "1"}})}, {})},
        RejectedRow{"addition naming letters after a valid removal",
                    payload({entry("5", {{"C_1", "1"}})}, {entry("x", {{"C_1", "1"}})})},
        RejectedRow{"addition with an empty identifier",
                    payload({}, {entry("0", {}), entry("", {{"C_1", "1"}})})},
        RejectedRow{"entry without an identifier",
                    payload({QVariantMap{{"camIDList", cameraEntries({{"C_1", "1"}})}}}, {})},
        RejectedRow{"entry that is no map", payload({}, {QVariant("5")})}),
    [](const auto &info) { return rowName(info.param.name); });

struct FixedRow
{
    const char *name;
    QString scheduleId;
    QString timecardName;
    QString mapping;
    bool exists;
};

void PrintTo(const FixedRow &row, std::ostream *os)
{
    *os << row.name;
}

class FixedEntries : public CameraAssignment, public ::testing::WithParamInterface<FixedRow>
{};

// Creating the fixed time card again would leave two of the same name, and
// the lookups by name would see only the last.
TEST_P(FixedEntries, AddToTheFixedTimecardOrCreateItWhenMissing)
{
    const FixedRow &row = GetParam();
    const Timecard fixed{4, 2, row.timecardName, row.mapping, {{"C_1", "1"}}};
    if (row.exists)
        h.server.put(fixed);
    h.server.put(Timecard{6, 1, "Other", "", {}});

    h.request(Command, payload({}, {entry(row.scheduleId, {{"C_5", "1"}, {"C_5", "1"}})}));

    std::vector<Message> expected{msg("GetRecTmcard", Expect::readAll())};
    if (row.exists) {
        expected.push_back(msg("GetRecTmcard", Expect::readOne(4)));
        expected.push_back(
            msg("UpdRecTmcard", Expect::updateCameras(fixed, {{"C_1", "1"}, {"C_5", "1"}})));
    } else {
        expected.push_back(
            msg("InsRecTmcard", Expect::insert(row.timecardName, row.mapping, {{"C_5", "1"}})));
    }
    EXPECT_EQ(h.messages(), expected);
    ExpectOneReply(h.replies, false, "0");
    int named = 0;
    for (const Timecard &timecard : h.server.timecards())
        named += timecard.name == row.timecardName ? 1 : 0;
    EXPECT_EQ(named, 1);
}

INSTANTIATE_TEST_SUITE_P(
    UpdateCamRecSchedule, FixedEntries,
    ::testing::Values(FixedRow{"-2 adds to the existing default event time card", "-2",
                               TimecardName::DefaultEvent, Template::DefaultEventMapping, true},
                      FixedRow{"-2 creates the default event time card when missing", "-2",
                               TimecardName::DefaultEvent, Template::DefaultEventMapping, false},
                      FixedRow{"-3 adds to the existing default continuous time card", "-3",
                               TimecardName::DefaultContinuous, Template::DefaultContinuousMapping,
                               true},
                      FixedRow{"-3 creates the default continuous time card when missing", "-3",
                               TimecardName::DefaultContinuous, Template::DefaultContinuousMapping,
                               false}),
    [](const auto &info) { return rowName(info.param.name); });

struct TimeoutRow
{
    const char *name;
    int held;
    bool removing;
    int changed;
    int timeoutMs;
};

void PrintTo(const TimeoutRow &row, std::ostream *os)
{
    *os << row.name;
}

class CameraTimeouts : public CameraAssignment, public ::testing::WithParamInterface<TimeoutRow>
{};

TEST_P(CameraTimeouts, GrowWithTheCamerasTheServerGoesThrough)
{
    const TimeoutRow &row = GetParam();
    Timecard card{5, 1, "Five", "", {}};
    for (int i = 1; i <= row.held; ++i)
        card.cameras << Camera{QStringLiteral("C_%1").arg(i), "1"};
    h.server.put(card);
    QList<Camera> cameras;
    for (int i = 0; i < row.changed; ++i)
        cameras << Camera{QStringLiteral("C_%1").arg(row.removing ? i + 1 : 100 + i), "1"};
    h.request(Command, row.removing ? payload({entry("5", cameras)}, {})
                                    : payload({}, {entry("5", cameras)}));

    const QList<TestTunnel::Sent> sent = h.tunnel.sent();
    ASSERT_EQ(sent.size(), 2);
    EXPECT_EQ(sent[1].timeoutMs, row.timeoutMs);
    ExpectOneReply(h.replies, false, "0");
}

INSTANTIATE_TEST_SUITE_P(
    UpdateCamRecSchedule, CameraTimeouts,
    ::testing::Values(TimeoutRow{"removal counts the cameras held before", 10, true, 3, 20000},
                      TimeoutRow{"addition counts the cameras held after", 10, false, 3, 26000},
                      TimeoutRow{"never below the minimum", 5, true, 1, 15000}),
    [](const auto &info) { return rowName(info.param.name); });

} // namespace

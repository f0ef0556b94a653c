// "DefaultContinousSchedule", "DefaultEventSchedule", "CustomizeSchedule" and
// "DefaultNotRecordingSchedule" through Request, the real control and a test
// tunnel answered by a fake recording server.

#include "RecordingScheduleSettingConstants.h"
#include "TestLog.h"
#include "WorkflowHarness.h"

#include <gtest/gtest.h>

namespace {

using namespace PluginRecordingScheduleSettingCommon;
using Camera = FakeRecordingServer::Camera;
using Timecard = FakeRecordingServer::Timecard;

std::string rowName(const char *name)
{
    std::string result = name;
    for (char &c : result)
        c = std::isalnum(static_cast<unsigned char>(c)) ? c : '_';
    return result;
}

QVariantMap cameras(const QList<Camera> &list)
{
    return QVariantMap{{"camRecGroupList", cameraEntries(list)}};
}

class DefaultSchedules : public ::testing::Test
{
protected:
    void SetUp() override { log.attach(); }
    TestLog log;
    WorkflowHarness h;
};

TEST_F(DefaultSchedules, AMissingFixedTimecardIsCreatedWithExactlyTheCameras)
{
    h.server.put(Timecard{1, 1, "Default", "", {}});
    h.server.setAnswerFlag(true);
    h.request("DefaultContinousSchedule", cameras({{"C_1", "1"}, {"C_2", "1"}}));
    EXPECT_EQ(h.messages(),
              (std::vector<Message>{
                  msg("GetRecTmcard", Expect::readAll()),
                  msg("InsRecTmcard", Expect::insert(TimecardName::DefaultContinuous,
                                                     Template::DefaultContinuousMapping,
                                                     {{"C_1", "1"}, {"C_2", "1"}})),
              }));
    ExpectOneReply(h.replies, true, "0");
}

TEST_F(DefaultSchedules, AnExistingFixedTimecardGetsTheCamerasBeforeItsOwn)
{
    h.server.put(Timecard{2, 5, TimecardName::DefaultContinuous, "", {{"C_3", "1"}}});
    h.request("DefaultContinousSchedule", cameras({{"C_1", "1"}, {"C_2", "1"}}));
    EXPECT_EQ(h.messages(),
              (std::vector<Message>{
                  msg("GetRecTmcard", Expect::readAll()),
                  msg("UpdRecTmcard", Expect::update(5, 2, TimecardName::DefaultContinuous,
                                                     Template::DefaultContinuousMapping,
                                                     {{"C_1", "1"}, {"C_2", "1"}, {"C_3", "1"}})),
              }));
    ExpectOneReply(h.replies, false, "0");
}

struct MoveRow
{
    const char *name;
    QString command;
    QVariantMap payload;
    QList<Timecard> before;
    std::vector<Message> messages;
    // Cameras of each time card afterwards, by name.
    std::map<QString, QStringList> after;
};

void PrintTo(const MoveRow &row, std::ostream *os)
{
    *os << row.name;
}

class CamerasMove : public DefaultSchedules, public ::testing::WithParamInterface<MoveRow>
{};

// Left on another time card, a camera would go on recording by it too.
TEST_P(CamerasMove, OffEveryOtherTimecardThenOntoTheFixedOne)
{
    const MoveRow &row = GetParam();
    for (const Timecard &timecard : row.before)
        h.server.put(timecard);
    h.request(row.command, row.payload);
    EXPECT_EQ(h.messages(), row.messages);
    ExpectOneReply(h.replies, false, "0");
    std::map<QString, QStringList> after;
    for (const Timecard &timecard : h.server.timecards()) {
        QStringList names;
        for (const Camera &camera : timecard.cameras)
            names << camera.name;
        after[timecard.name] = names;
    }
    EXPECT_EQ(after, row.after);
}

const Timecard ContinuousWithC1{
    2, 4, TimecardName::DefaultContinuous, "", {{"C_1", "1"}, {"C_2", "1"}}};
const Timecard LobbyWithC2{3, 7, "Lobby", LobbyMapping, {{"C_2", "1"}, {"C_4", "1"}}};
const Timecard CustomizeWithC9{5, 2, TimecardName::Customize, "", {{"C_9", "1"}}};

INSTANTIATE_TEST_SUITE_P(
    DefaultSchedules, CamerasMove,
    ::testing::Values(
        MoveRow{
            "to the event schedule off the continuous one",
            "DefaultEventSchedule",
            cameras({{"C_1", "1"}}),
            {ContinuousWithC1},
            {msg("GetRecTmcard", Expect::readAll()), msg("GetRecTmcard", Expect::readOne(2)),
             msg("UpdRecTmcard", Expect::updateCameras(ContinuousWithC1, {{"C_2", "1"}})),
             msg("GetRecTmcard", Expect::readAll()),
             msg("InsRecTmcard", Expect::insert(TimecardName::DefaultEvent,
                                                Template::DefaultEventMapping, {{"C_1", "1"}}))},
            {{TimecardName::DefaultContinuous, {"C_2"}}, {TimecardName::DefaultEvent, {"C_1"}}}},
        MoveRow{"to the customised schedule off every other time card in turn",
                "CustomizeSchedule",
                QVariantMap{{"timeframes", LobbyDocument},
                            {"camRecGroupList", cameraEntries({{"C_1", "1"}, {"C_2", "1"}})}},
                {ContinuousWithC1, LobbyWithC2, CustomizeWithC9},
                {msg("GetRecTmcard", Expect::readAll()), msg("GetRecTmcard", Expect::readOne(2)),
                 msg("UpdRecTmcard", Expect::updateCameras(ContinuousWithC1, {})),
                 msg("GetRecTmcard", Expect::readOne(3)),
                 msg("UpdRecTmcard", Expect::updateCameras(LobbyWithC2, {{"C_4", "1"}})),
                 msg("GetRecTmcard", Expect::readAll()),
                 msg("UpdRecTmcard", Expect::update(2, 5, TimecardName::Customize, LobbyMapping,
                                                    {{"C_1", "1"}, {"C_2", "1"}, {"C_9", "1"}}))},
                {{TimecardName::DefaultContinuous, {}},
                 {"Lobby", {"C_4"}},
                 {TimecardName::Customize, {"C_1", "C_2", "C_9"}}}},
        MoveRow{
            "cameras held by no other time card go straight on",
            "DefaultEventSchedule",
            cameras({{"C_7", "1"}}),
            {ContinuousWithC1},
            {msg("GetRecTmcard", Expect::readAll()),
             msg("InsRecTmcard", Expect::insert(TimecardName::DefaultEvent,
                                                Template::DefaultEventMapping, {{"C_7", "1"}}))},
            {{TimecardName::DefaultContinuous, {"C_1", "C_2"}},
             {TimecardName::DefaultEvent, {"C_7"}}}}),
    [](const auto &info) { return rowName(info.param.name); });

TEST_F(DefaultSchedules, CustomizeScheduleWithAnUnreadableDocumentChangesNothing)
{
    h.server.put(CustomizeWithC9);
    h.request("CustomizeSchedule",
              QVariantMap{{"timeframes", "{"}, {"camRecGroupList", cameraEntries({{"C_1", "1"}})}});
    EXPECT_TRUE(h.messages().empty());
    ExpectOneReply(h.replies, true, "-1");
    EXPECT_EQ(log.texts(2), QStringList{"Time frames parse error. {"});
}

TEST_F(DefaultSchedules, NotRecordingClearsEveryTimecardWithCamerasInTurn)
{
    const Timecard one{1, 1, "Default", "", {{"C_1", "1"}, {"C_2", "1"}}};
    const Timecard three{3, 2, "Lobby", "", {{"C_1", "1"}}};
    const Timecard four{4, 1, "Empty", "", {}};
    h.server.put(one);
    h.server.put(three);
    h.server.put(four);
    h.server.setAnswerFlag(true);
    h.request("DefaultNotRecordingSchedule", cameras({{"C_1", "1"}}));
    EXPECT_EQ(h.messages(), (std::vector<Message>{
                                msg("GetRecTmcard", Expect::readAll()),
                                msg("GetRecTmcard", Expect::readOne(1)),
                                msg("UpdRecTmcard", Expect::updateCameras(one, {{"C_2", "1"}})),
                                msg("GetRecTmcard", Expect::readOne(3)),
                                msg("UpdRecTmcard", Expect::updateCameras(three, {})),
                            }));
    ExpectOneReply(h.replies, true, "0");
}

TEST_F(DefaultSchedules, NotRecordingWithoutCameraListsRewritesTheDefaultTimecard)
{
    const Timecard one{1, 1, "Default", "", {}};
    h.server.put(one);
    h.request("DefaultNotRecordingSchedule", cameras({{"C_1", "1"}}));
    EXPECT_EQ(h.messages(), (std::vector<Message>{
                                msg("GetRecTmcard", Expect::readAll()),
                                msg("GetRecTmcard", Expect::readOne(1)),
                                msg("UpdRecTmcard", Expect::updateCameras(one, {})),
                            }));
    ExpectOneReply(h.replies, false, "0");
}

struct FailedFetchRow
{
    const char *name;
    QString command;
    QString errorLine;
};

void PrintTo(const FailedFetchRow &row, std::ostream *os)
{
    *os << row.name;
}

class FailedFetch : public DefaultSchedules, public ::testing::WithParamInterface<FailedFetchRow>
{};

TEST_P(FailedFetch, AnswersWithTheFetchsOwnFlag)
{
    h.tunnel.setResponder([](const TestTunnel::Sent &) {
        return TestTunnel::Answer{false, QString(), QString(), false};
    });
    h.request(GetParam().command,
              QVariantMap{{"timeframes", LobbyDocument}, {"camRecGroupList", QVariantList()}});
    EXPECT_EQ(h.messages(), std::vector<Message>{msg("GetRecTmcard", Expect::readAll())});
    ExpectOneReply(h.replies, false, "-1");
    EXPECT_TRUE(log.texts(2).contains(GetParam().errorLine));
}

INSTANTIATE_TEST_SUITE_P(
    DefaultSchedules, FailedFetch,
    ::testing::Values(
        FailedFetchRow{"continuous", "DefaultContinousSchedule", "Fail to get time card list."},
        FailedFetchRow{"event", "DefaultEventSchedule", "Fail to get time card list."},
        FailedFetchRow{"customised", "CustomizeSchedule", "Fail to get time card list."},
        FailedFetchRow{"not recording", "DefaultNotRecordingSchedule",
                       "Fail to get all schedule time card."}),
    [](const auto &info) { return rowName(info.param.name); });

} // namespace

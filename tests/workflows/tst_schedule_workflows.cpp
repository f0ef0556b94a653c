// "AddSchedule", "UpdateSchedule" and "DelSchedule" through Request, the real
// control and a test tunnel answered by a fake recording server.

#include "TestLog.h"
#include "WorkflowHarness.h"

#include <gtest/gtest.h>

namespace {

using Camera = FakeRecordingServer::Camera;
using Timecard = FakeRecordingServer::Timecard;

const QString Add = QStringLiteral("AddSchedule");
const QString Update = QStringLiteral("UpdateSchedule");
const QString Delete = QStringLiteral("DelSchedule");

class ScheduleCommands : public ::testing::Test
{
protected:
    void SetUp() override { log.attach(); }

    void expectOneReply(bool flag, const QString &code, const QVariant &data = QVariant())
    {
        ExpectOneReply(h.replies, flag, code, data);
    }

    TestLog log;
    WorkflowHarness h;
};

TEST_F(ScheduleCommands, AddScheduleInsertsOneTimecardAndAnswersItsIdentifier)
{
    h.server.setAnswerFlag(true);
    h.request(Add, QVariantMap{{"ScheduleName", "Lobby"}, {"timeframes", LobbyDocument}});

    EXPECT_EQ(h.messages(),
              std::vector<Message>{msg("InsRecTmcard", Expect::insert("Lobby", LobbyMapping, {}))});
    expectOneReply(true, "0", QVariant(QStringLiteral("100")));
    ASSERT_TRUE(h.server.find(100));
    EXPECT_EQ(h.server.find(100)->name, QStringLiteral("Lobby"));
}

TEST_F(ScheduleCommands, AddScheduleRefusedByTheTunnelIsAnsweredAtOnce)
{
    h.tunnel.refuseNext();
    h.request(Add, QVariantMap{{"ScheduleName", "Lobby"}, {"timeframes", LobbyDocument}});
    EXPECT_TRUE(h.messages().empty());
    expectOneReply(true, "-1");
}

TEST_F(ScheduleCommands, AddScheduleRefusedByTheServerAnswersItsFlagAndAnEmptyIdentifier)
{
    h.tunnel.setResponder([](const TestTunnel::Sent &) {
        return TestTunnel::Answer{true, "-1", QString(), false};
    });
    h.request(Add, QVariantMap{{"ScheduleName", "Lobby"}, {"timeframes", LobbyDocument}});
    expectOneReply(false, "-1", QVariant(QString()));
}

TEST_F(ScheduleCommands, UpdateScheduleReadsTheRevisionThenRewritesTheTimecard)
{
    h.server.put(Timecard{7, 3, "Old", "", {{"C_1", "1"}}});
    h.server.setAnswerFlag(true);
    h.request(Update, QVariantMap{{"TimeCardID", "7"},
                                  {"ScheduleName", "Lobby"},
                                  {"timeframes", LobbyDocument},
                                  {"camRecGroupList", cameraEntries({{"C_2", "2"}})}});

    EXPECT_EQ(h.messages(),
              (std::vector<Message>{
                  msg("GetRecTmcard", Expect::readOne(7)),
                  msg("UpdRecTmcard", Expect::update(3, 7, "Lobby", LobbyMapping, {{"C_2", "2"}})),
              }));
    expectOneReply(true, "0");
    EXPECT_EQ(h.server.find(7)->mapping, LobbyMapping);
}

TEST_F(ScheduleCommands, UpdateScheduleWithADocumentWithoutRectanglesEmptiesTheSchedule)
{
    h.server.put(Timecard{7, 3, "Lobby", LobbyMapping, {}});
    h.request(Update, QVariantMap{{"TimeCardID", "7"},
                                  {"ScheduleName", "Lobby"},
                                  {"timeframes", R"({"Rectangles":[]})"}});
    EXPECT_EQ(h.messages().back(), msg("UpdRecTmcard", Expect::update(3, 7, "Lobby", "", {})));
    expectOneReply(false, "0");
    EXPECT_TRUE(h.server.find(7)->mapping.isEmpty());
}

struct RejectedUpdate
{
    const char *name;
    QVariantMap payload;
    QStringList errorLines;
};

void PrintTo(const RejectedUpdate &row, std::ostream *os)
{
    *os << row.name;
}

class RejectedUpdates : public ScheduleCommands,
                        public ::testing::WithParamInterface<RejectedUpdate>
{};

// Nothing is sent, so nothing on the server changes; time card 0 is there to
// show what a read of "abc" as 0 would have rewritten.
TEST_P(RejectedUpdates, AnswerAtOnceAndSendNothing)
{
    const Timecard zero{0, 1, "Zero", LobbyMapping, {{"C_9", "1"}}};
    const Timecard seven{7, 3, "Lobby", LobbyMapping, {{"C_1", "1"}}};
    h.server.put(zero);
    h.server.put(seven);

    h.request(Update, GetParam().payload);

    EXPECT_TRUE(h.messages().empty());
    expectOneReply(true, "-1");
    EXPECT_EQ(log.texts(2), GetParam().errorLines);
    EXPECT_EQ(h.server.find(0)->mapping, LobbyMapping);
    EXPECT_EQ(h.server.find(7)->mapping, LobbyMapping);
}

QVariantMap updatePayload(const QVariant &id, const QVariant &timeframes = LobbyDocument)
{
    QVariantMap payload{{"ScheduleName", "Lobby"}, {"camRecGroupList", cameraEntries({})}};
    if (id.isValid())
        payload.insert("TimeCardID", id);
    if (timeframes.isValid())
        payload.insert("timeframes", timeframes);
    return payload;
}

INSTANTIATE_TEST_SUITE_P(
    UpdateSchedule, RejectedUpdates,
    ::testing::Values(
        RejectedUpdate{
            "identifier of letters is not read as time card 0", updatePayload("abc"), {}},
        RejectedUpdate{"missing identifier", updatePayload(QVariant()), {}},
        RejectedUpdate{"identifier with a space", updatePayload(" 7"), {}},
        RejectedUpdate{"identifier with trailing letters", updatePayload("7x"), {}},
        RejectedUpdate{"identifier beyond the integer range", updatePayload("99999999999"), {}},
        RejectedUpdate{"missing document does not wipe the time frames",
                       updatePayload("7", QVariant()),
                       {"Time frames parse error. "}},
        RejectedUpdate{"empty document", updatePayload("7", ""), {"Time frames parse error. "}},
        RejectedUpdate{"broken document",
                       updatePayload("7", R"({"Rectangles":[)"),
                       {R"(Time frames parse error. {"Rectangles":[)"}},
        RejectedUpdate{
            "document that is a list", updatePayload("7", "[]"), {"Time frames parse error. []"}}),
    [](const auto &info) {
        std::string name = info.param.name;
        for (char &c : name)
            c = std::isalnum(static_cast<unsigned char>(c)) ? c : '_';
        return name;
    });

TEST_F(ScheduleCommands, DelScheduleDeletesByTheRevisionRead)
{
    h.server.put(Timecard{7, 3, "Lobby", "", {}});
    h.server.put(Timecard{8, 1, "Hall", "", {}});
    h.server.setAnswerFlag(true);
    h.request(Delete, QVariantMap{{"TimeCardID", "7"}});

    EXPECT_EQ(h.messages(),
              (std::vector<Message>{
                  msg("GetRecTmcard", Expect::readAll()),
                  msg("DelTmcard", "<DelTmcard><Revision>3</Revision><TmcardID>7</TmcardID>"
                                   "</DelTmcard>"),
              }));
    expectOneReply(true, "0");
    EXPECT_FALSE(h.server.find(7));
    EXPECT_TRUE(h.server.find(8));
}

TEST_F(ScheduleCommands, DelScheduleComparesIdentifiersAsText)
{
    h.server.put(Timecard{7, 3, "Lobby", "", {}});
    h.request(Delete, QVariantMap{{"TimeCardID", "07"}});
    EXPECT_EQ(h.messages(), std::vector<Message>{msg("GetRecTmcard", Expect::readAll())});
    expectOneReply(true, "-1");
    EXPECT_TRUE(h.server.find(7));
}

TEST_F(ScheduleCommands, DelScheduleWhoseReadFailedAnswersWithTheReadsFlag)
{
    h.tunnel.setResponder([](const TestTunnel::Sent &) {
        return TestTunnel::Answer{false, QString(), QString(), false};
    });
    h.request(Delete, QVariantMap{{"TimeCardID", "7"}});
    expectOneReply(false, "-1");
    EXPECT_TRUE(log.texts(2).contains("Fail to get all schedule time card."));
}

} // namespace

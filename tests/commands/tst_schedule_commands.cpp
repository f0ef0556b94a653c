// "AddSchedule", "UpdateSchedule" and "DelSchedule": named time cards made,
// rewritten and deleted on the server; and a document added reads back the same.

#include "CommandTable.h"

namespace {

// Monday to Friday, 08:00 to 18:00: the mapping the rows call "lobby".
const QString Lobby = QStringLiteral(
    R"({"Rectangles":[{"Left":0,"Right":5,"Top":8,"Bottom":18,"RecordingMode":"Continuous"}]})");

QVariantMap update(const QString &id, const QString &timeframes = Lobby,
                   const QString &cams = QStringLiteral("C_2/1 C_3/2"))
{
    return {{"TimeCardID", id},
            {"ScheduleName", "Lobby"},
            {"timeframes", timeframes},
            {"camRecGroupList", cameras(cams)}};
}

INSTANTIATE_TEST_SUITE_P(
    ScheduleCommands, Commands,
    ::testing::Values(
        CommandRow{"new schedule is a time card without cameras, answered with its identifier", "",
                   "AddSchedule", QVariantMap{{"ScheduleName", "Lobby"}, {"timeframes", Lobby}},
                   "InsRecTmcard", "#1 Default Schedule {continuous week} | #2 Lobby {lobby}",
                   false, "0", QString("2")},
        // Each once stored a nameless time card with no time frames and answered "0".
        CommandRow{"add without a payload sends nothing", "", "AddSchedule", QVariant(), "", "",
                   true, "-1"},
        CommandRow{"add of a payload that is text sends nothing", "", "AddSchedule", "oops", "", "",
                   true, "-1"},
        CommandRow{"add with the time frames given as an object sends nothing", "", "AddSchedule",
                   QVariantMap{{"ScheduleName", "Lobby"}, {"timeframes", QVariantMap()}}, "", "",
                   true, "-1"},
        CommandRow{"add without a name sends nothing", "", "AddSchedule",
                   QVariantMap{{"timeframes", Lobby}}, "", "", true, "-1"},
        CommandRow{"update rewrites name, time frames and the whole camera list",
                   "#5 Old {continuous week} [C_1/1 C_2/1]", "UpdateSchedule", update("5"),
                   "GetRecTmcard(5), UpdRecTmcard(5)", "#5 Lobby {lobby} [C_2/1 C_3/2]", false,
                   "0"},
        CommandRow{"update keeps the camera list exactly as the client sent it", "#5 Old",
                   "UpdateSchedule", update("5", Lobby, "C_1/1 C_1/1"),
                   "GetRecTmcard(5), UpdRecTmcard(5)", "#5 Lobby {lobby} [C_1/1 C_1/1]", false,
                   "0"},
        // Read as a number, "abc" would rewrite time card 0.
        CommandRow{"update of an identifier of letters sends nothing", "#5 Old", "UpdateSchedule",
                   update("abc"), "", "", true, "-1"},
        CommandRow{"update with a document that is not a JSON object sends nothing", "#5 Old",
                   "UpdateSchedule", update("5", "[]"), "", "", true, "-1"},
        CommandRow{"update of a time card the server does not hold sends no change", "#5 Old",
                   "UpdateSchedule", update("9"), "GetRecTmcard(9)", "", true, "-1"},
        CommandRow{"delete removes the time card by the revision read", "#5 Lobby | #6 Hall",
                   "DelSchedule", QVariantMap{{"TimeCardID", "5"}},
                   "GetRecTmcard(all), DelTmcard(5)", "#6 Hall", false, "0"},
        CommandRow{"delete compares identifiers as text", "#5 Lobby", "DelSchedule",
                   QVariantMap{{"TimeCardID", "05"}}, "GetRecTmcard(all)", "", true, "-1"}),
    rowName<CommandRow>);

// A document in the plug-in's own form, added as time card 2 beside the
// fresh server's time card 1, reads back the same; its mode needs escaping in
// XML and in JSON.
TEST(RoundTrip, ReadsBackTheDocumentAdded)
{
    const QString document =
        R"({"Rectangles":[{"Bottom":1,"Left":0,"RecordingMode":"Rec \"A\" \\ <b>&","Right":1,)"
        R"("Top":0}]})";
    LivePlugin live;
    const QVariantMap add{{"ScheduleName", "Trip"}, {"timeframes", document}};
    ASSERT_EQ(live.request("AddSchedule", add).data.toString().toStdString(), "2");
    const QVariantList all = live.request("GetAllScheduleRecInfo", QVariant()).data.toList();
    EXPECT_EQ(all.value(1).toMap()["CustomizeContent"].toString().toStdString(),
              document.toStdString());
}

} // namespace

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

// A document in the plug-in's own form, added, reads back the same.
struct RoundTripRow
{
    const char *name;
    QString document;
};

void PrintTo(const RoundTripRow &row, std::ostream *os)
{
    *os << row.name;
}

class RoundTrip : public ::testing::TestWithParam<RoundTripRow>
{};

// Time card 2 beside the fresh server's time card 1.
TEST_P(RoundTrip, ReadsBackTheDocumentAdded)
{
    LivePlugin live;
    const QVariantMap add{{"ScheduleName", "Trip"}, {"timeframes", GetParam().document}};
    ASSERT_EQ(live.request("AddSchedule", add).data.toString().toStdString(), "2");
    const QVariantList all = live.request("GetAllScheduleRecInfo", QVariant()).data.toList();
    EXPECT_EQ(all.value(1).toMap()["CustomizeContent"].toString().toStdString(),
              GetParam().document.toStdString());
}

INSTANTIATE_TEST_SUITE_P(
    Documents, RoundTrip,
    ::testing::Values(
        RoundTripRow{
            "mode that needs escaping in XML and in JSON",
            R"({"Rectangles":[{"Bottom":1,"Left":0,"RecordingMode":"Rec \"A\" \\ <b>&","Right":1,)"
            R"("Top":0}]})"},
        RoundTripRow{
            "event with every trigger, in the form the plug-in writes it",
            R"({"Rectangles":[{"Bottom":2,"Left":1,"RecordingMode":"Event","Right":3,"Top":1,)"
            R"("triggerEvents":{"motion":false,"pir":true,"tampering":false,"pptz":true,)"
            R"("lineDetection":true,"fieldDetection":false,"loitering":true,"crowdDetection":false,)"
            R"("missingObject":true,"abandonObject":false,"faceDetection":true,"zoneDetection":true,)"
            R"("smartTracking":false,"runningDetection":true,"parkingViolationDetection":false,)"
            R"("restrictedZoneDetection":true,"temperatureThresholdWarning":false,)"
            R"("temperatureThresholdAlarm":true,"temperatureDifferenceWarning":false,)"
            R"("temperatureDifferenceAlarm":true,"temperatureRiseWarning":false,)"
            R"("temperatureRiseAlarm":true,"temperatureSectionAlarm":false,"thermalIntrusion":true,)"
            R"("thermalMultiLoitering":false,"fireSpotDetection":true,"smokerDetection":false,)"
            R"("smokeAndFlameDetection":true,"di":true,)"
            R"("traditional":true,"recordingStateTrigger":false,"recordingStateNormal":true,)"
            R"("activatedToNormal":false,"normalToActivated":true}}]})"}),
    rowName<RoundTripRow>);

} // namespace

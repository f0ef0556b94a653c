// "UpdateCamRecSchedule" and the four default-schedule commands: cameras put
// on time cards and taken off them.

#include "CommandTable.h"

namespace {

QVariantMap entry(const QString &id, const QVariantList &cams)
{
    return {{"scheduleID", id}, {"camIDList", cams}};
}

QVariantMap entry(const QString &id, const QString &cams)
{
    return entry(id, cameras(cams));
}

QVariantMap move(const QVariantList &removals, const QVariantList &additions)
{
    return {{"scheduleRmvCam", removals}, {"scheduleAddCam", additions}};
}

QVariantMap group(const QString &cams)
{
    return {{"camRecGroupList", cameras(cams)}};
}

const QString Continuous = QStringLiteral("KOLT2 Default Continuous Recording");

INSTANTIATE_TEST_SUITE_P(
    UpdateCamRecSchedule, Commands,
    ::testing::Values(
        CommandRow{"nothing to do is answered at once", "#5 Five [C_1/1]", "UpdateCamRecSchedule",
                   QVariantMap{{"Other", 1}}, "", "", true, "0"},
        CommandRow{"removals come first, one entry after the other",
                   "#5 Five [C_1/1 C_2/1] | #7 Seven [C_3/2] | #9 Nine [C_4/1]",
                   "UpdateCamRecSchedule",
                   move({entry("5", "C_1/1"), entry("7", "C_3/2")}, {entry("9", "C_1/1")}),
                   "GetRecTmcard(5), UpdRecTmcard(5), GetRecTmcard(7), UpdRecTmcard(7), "
                   "GetRecTmcard(9), UpdRecTmcard(9)",
                   "#5 Five [C_2/1] | #7 Seven | #9 Nine [C_4/1 C_1/1]", false, "0"},
        CommandRow{"camera the time card holds is not added again", "#9 Nine [C_1/1]",
                   "UpdateCamRecSchedule", move({}, {entry("9", "C_1/3 C_2/2 C_2/2")}),
                   "GetRecTmcard(9), UpdRecTmcard(9)", "#9 Nine [C_1/1 C_2/2]", false, "0"},
        CommandRow{"camera standing twice is removed entirely", "#5 Five [C_1/1 C_2/2 C_1/1]",
                   "UpdateCamRecSchedule", move({entry("5", "C_1/1")}, {}),
                   "GetRecTmcard(5), UpdRecTmcard(5)", "#5 Five [C_2/2]", false, "0"},
        // Compared whole, a client's entry matched only when it held the server's keys alone.
        CommandRow{
            "removal matches by name and group only, the group read as text",
            "#5 Five [C_1/1 C_2/2]", "UpdateCamRecSchedule",
            move({entry("5", {QVariantMap{{"Name", "C_1"}, {"GrpID", 1}, {"Model", "X"}}})}, {}),
            "GetRecTmcard(5), UpdRecTmcard(5)", "#5 Five [C_2/2]", false, "0"},
        CommandRow{"camera of another group stays", "#5 Five [C_1/1 C_2/2]", "UpdateCamRecSchedule",
                   move({entry("5", "C_1/2")}, {}), "GetRecTmcard(5), UpdRecTmcard(5)", "", false,
                   "0"},
        // Checked first, so that no time card is left half moved.
        CommandRow{"identifier of letters anywhere is refused before anything is sent",
                   "#5 Five [C_1/1]", "UpdateCamRecSchedule",
                   move({entry("5", "C_1/1")}, {entry("x", "C_1/1")}), "", "", true, "-1"},
        // Creating it again would leave two time cards of the same name.
        CommandRow{"-2 adds to the existing default event time card",
                   "#4 KOLT2 Default Event Recording {event week} [C_1/1] | #6 Other",
                   "UpdateCamRecSchedule", move({}, {entry("-2", "C_5/1 C_5/1")}),
                   "GetRecTmcard(all), GetRecTmcard(4), UpdRecTmcard(4)",
                   "#4 KOLT2 Default Event Recording {event week} [C_1/1 C_5/1] | #6 Other", false,
                   "0"},
        CommandRow{"-3 creates the default continuous time card when missing, each camera once",
                   "#6 Other", "UpdateCamRecSchedule", move({}, {entry("-3", "C_5/1 C_5/1")}),
                   "GetRecTmcard(all), InsRecTmcard",
                   "#6 Other | #7 " + Continuous + " {continuous week} [C_5/1]", false, "0"}),
    rowName<CommandRow>);

INSTANTIATE_TEST_SUITE_P(
    DefaultSchedules, Commands,
    ::testing::Values(
        CommandRow{"missing fixed time card is created with exactly the cameras", "",
                   "DefaultContinousSchedule", group("C_1/1 C_2/1"),
                   "GetRecTmcard(all), InsRecTmcard",
                   "#1 Default Schedule {continuous week} | #2 " + Continuous +
                       " {continuous week} [C_1/1 C_2/1]",
                   false, "0"},
        CommandRow{"camera named twice stands once on a new fixed time card", "",
                   "DefaultEventSchedule", group("C_20/1 C_21/1 C_20/1"),
                   "GetRecTmcard(all), InsRecTmcard",
                   "#1 Default Schedule {continuous week} | #2 KOLT2 Default Event Recording "
                   "{event week} [C_20/1 C_21/1]",
                   false, "0"},
        CommandRow{"existing fixed time card gets the cameras before its own",
                   "#2 " + Continuous + " [C_3/1]", "DefaultContinousSchedule",
                   group("C_1/1 C_2/1"), "GetRecTmcard(all), UpdRecTmcard(2)",
                   "#2 " + Continuous + " {continuous week} [C_1/1 C_2/1 C_3/1]", false, "0"},
        CommandRow{"camera already on the fixed time card is not added twice",
                   "#2 " + Continuous + " [C_1/1]", "DefaultContinousSchedule",
                   group("C_1/1 C_2/1"), "GetRecTmcard(all), UpdRecTmcard(2)",
                   "#2 " + Continuous + " {continuous week} [C_1/1 C_2/1]", false, "0"},
        // Left on another time card, a camera would go on recording by it too.
        CommandRow{"camera is taken off every other time card before it joins the default event "
                   "schedule",
                   "#2 " + Continuous + " [C_1/1 C_2/1]", "DefaultEventSchedule", group("C_1/1"),
                   "GetRecTmcard(all), GetRecTmcard(2), UpdRecTmcard(2), GetRecTmcard(all), "
                   "InsRecTmcard",
                   "#2 " + Continuous +
                       " [C_2/1] | #3 KOLT2 Default Event Recording {event week} [C_1/1]",
                   false, "0"},
        CommandRow{
            "customised schedule takes the time frames, and the cameras off other time cards",
            "#3 Lobby [C_2/1 C_4/1] | #5 KOLT2 Customize Recording [C_9/1] | #6 Hall [C_1/1]",
            "CustomizeSchedule",
            QVariantMap{
                {"timeframes",
                 R"({"Rectangles":[{"Left":0,"Right":5,"Top":8,"Bottom":18,"RecordingMode":"Continuous"}]})"},
                {"camRecGroupList", cameras("C_1/1 C_2/1")}},
            "GetRecTmcard(all), GetRecTmcard(3), UpdRecTmcard(3), GetRecTmcard(6), "
            "UpdRecTmcard(6), GetRecTmcard(all), UpdRecTmcard(5)",
            "#3 Lobby [C_4/1] | #5 KOLT2 Customize Recording {lobby} [C_1/1 C_2/1 C_9/1] | "
            "#6 Hall",
            false, "0"},
        CommandRow{"customised schedule from a document that is not a JSON object sends nothing",
                   "#5 KOLT2 Customize Recording [C_9/1]", "CustomizeSchedule",
                   QVariantMap{{"timeframes", "{"}, {"camRecGroupList", cameras("C_1/1")}}, "", "",
                   true, "-1"},
        CommandRow{"not recording takes the cameras off every time card with cameras in turn",
                   "#1 Default [C_1/1 C_2/1] | #3 Lobby [C_1/1] | #4 Empty",
                   "DefaultNotRecordingSchedule", group("C_1/1"),
                   "GetRecTmcard(all), GetRecTmcard(1), UpdRecTmcard(1), GetRecTmcard(3), "
                   "UpdRecTmcard(3)",
                   "#1 Default [C_2/1] | #3 Lobby | #4 Empty", false, "0"},
        CommandRow{"not recording without camera lists rewrites time card 1", "",
                   "DefaultNotRecordingSchedule", group("C_1/1"),
                   "GetRecTmcard(all), GetRecTmcard(1), UpdRecTmcard(1)", "", false, "0"}),
    rowName<CommandRow>);

// 2000 ms per camera held before a removal or after an addition; at least 15000 ms.
TEST(UpdateCamRecSchedule, TimeOutGrowsWithTheCamerasOfTheTimeCard)
{
    LivePlugin live;
    live.seed(seedDocument("#5 Ten [C_1/1 C_2/1 C_3/1 C_4/1 C_5/1 C_6/1 C_7/1 C_8/1 C_9/1 C_10/1] "
                           "| #6 Six [C_1/1]"));
    live.request("UpdateCamRecSchedule",
                 move({entry("5", "C_1/1 C_2/1 C_3/1"), entry("6", "C_1/1")},
                      {entry("5", "C_11/1 C_12/1 C_13/1 C_14/1")}));
    QList<int> timeouts;
    for (const LivePlugin::Sent &sent : live.sent())
        timeouts << sent.timeoutMs;
    EXPECT_EQ(timeouts, (QList<int>{15000, 20000, 15000, 15000, 15000, 22000}));
}

} // namespace

// "GetScheduleRecInfo", "GetCurrentScheduleInfo" and "GetAllScheduleRecInfo": the
// schedule in force, and the document written from what the time cards hold.

#include "CommandTable.h"
#include "TriggerNames.h"

namespace {

const QString RecInfo = QStringLiteral("GetScheduleRecInfo");
const QString Current = QStringLiteral("GetCurrentScheduleInfo");

QVariant summary(int type, const QString &content = QString())
{
    return QVariantMap{{QStringLiteral("RecScheduleType"), type},
                       {QStringLiteral("CustomizeContent"), content}};
}

// One time frame: day numbers "1.0 2.0", intervals "0,3600 7200,86400".
QString frame(QString days, QString spans, const QString &mode, const QString &more = QString(),
              const QString &repeat = QStringLiteral("Weekly"))
{
    days = R"(<Ele B=")" + days.replace(" ", R"("/><Ele B=")") + R"("/>)";
    spans =
        R"(<Ele B=")" + spans.replace(" ", R"("/><Ele B=")").replace(",", R"(" E=")") + R"("/>)";
    return QStringLiteral("<Ele><Frame><RepeatMod>%1</RepeatMod><DayList>%2</DayList><Intervals>%3"
                          "</Intervals></Frame><RecMode>%4</RecMode>%5</Ele>")
        .arg(repeat, days, spans, mode.toHtmlEscaped(), more);
}

CommandRow inForce(const char *name, const QString &seed, const QString &command,
                   const QVariant &data, const QStringList &alter = {})
{
    return {name, seed, command, QVariant(), "GetRecTmcard(all)", "", true, "0", data, alter};
}

// The document of the customised time card in force, holding the given mapping.
CommandRow document(const char *name, const QString &mapping, const QString &expected)
{
    return inForce(name, QStringLiteral("#7 KOLT2 Customize Recording {%1} [C_1/1]").arg(mapping),
                   RecInfo, summary(2, expected));
}

QString everyTrigger()
{
    QString elements;
    for (const TriggerName &trigger : TriggerNames)
        elements += QStringLiteral("<%1>true</%1>").arg(QLatin1String(trigger.element));
    return elements + QStringLiteral("<DigiInput>2</DigiInput>");
}

const QString Lobby = QStringLiteral(
    R"({"Rectangles":[{"Bottom":18,"Left":0,"RecordingMode":"Continuous","Right":5,"Top":8}]})");
const QString Both = QStringLiteral(
    "#1 KOLT2 Default Continuous Recording [C_1/1] | #7 KOLT2 Customize Recording {lobby} [C_1/1]");

QVariantMap entry(const QString &id, const QString &name, const QString &content,
                  const QVariantList &cams)
{
    return {{"TimeCardID", id},
            {"ScheduleName", name},
            {"Revision", "1"},
            {"CustomizeContent", content},
            {"CameraList", cams}};
}

INSTANTIATE_TEST_SUITE_P(
    Queries, Commands,
    ::testing::Values(
        inForce("fresh server has no schedule in force", "", RecInfo, summary(5)),
        inForce("customised time card beside the default one is in force", Both, RecInfo,
                summary(2, Lobby)),
        inForce("default time card with cameras counts for the current schedule", Both, Current,
                summary(4)),
        inForce("cameras only on the default time card are no schedule",
                "#1 KOLT2 Default Event Recording [C_1/1]", RecInfo, summary(5)),
        inForce("current schedule classifies the default time card by name",
                "#1 KOLT2 Default Event Recording [C_1/1]", Current, summary(1)),
        inForce("default continuous time card by name",
                "#3 KOLT2 Default Continuous Recording [C_1/1]", RecInfo, summary(0)),
        inForce("name in other letter case is another schedule",
                "#3 kolt2 customize recording [C_1/1]", RecInfo, summary(4)),
        inForce(
            "two time cards with cameras are another schedule",
            "#3 KOLT2 Default Event Recording [C_1/1] | #4 KOLT2 Default Event Recording [C_2/1]",
            RecInfo, summary(4)),
        // Qt reads "4294967297" as 1, the default time card, which would be left out. The
        // server hands out no such identifier now; a file an older server wrote holds it.
        inForce("identifier outside int range is not the default time card",
                "#2 KOLT2 Customize Recording {lobby} [C_1/1]", RecInfo, summary(2, Lobby),
                {"UPDATE tmcard SET id = 4294967297", "UPDATE cam SET tmcard_id = 4294967297"}),
        document(
            "two day runs by two intervals give four rectangles run by run",
            frame("1.0 2.0 3.0 5.0", "0,28800 64800,86400", "Continuous"),
            R"({"Rectangles":[{"Bottom":8,"Left":0,"RecordingMode":"Continuous","Right":3,"Top":0},)"
            R"({"Bottom":24,"Left":0,"RecordingMode":"Continuous","Right":3,"Top":18},)"
            R"({"Bottom":8,"Left":4,"RecordingMode":"Continuous","Right":5,"Top":0},)"
            R"({"Bottom":24,"Left":4,"RecordingMode":"Continuous","Right":5,"Top":18}]})"),
        document(
            "days out of order are runs of their own with six digits of hours",
            frame("3.0 2.0", "1200,86399", "Continuous"),
            R"({"Rectangles":[{"Bottom":23.9997,"Left":2,"RecordingMode":"Continuous","Right":3,)"
            R"("Top":0.333333},{"Bottom":23.9997,"Left":1,"RecordingMode":"Continuous","Right":2,)"
            R"("Top":0.333333}]})"),
        document(
            "default event mapping has the short trigger set", "event week",
            R"({"Rectangles":[{"Bottom":24,"Left":0,"RecordingMode":"Event","Right":7,"Top":0,)"
            R"("triggerEvents":{"motion":true,"pir":false,"tampering":false,"pptz":false,)"
            R"("lineDetection":false,"fieldDetection":false,"loitering":false,)"
            R"("crowdDetection":false,"missingObject":false,"abandonObject":false,)"
            R"("faceDetection":false,"di":true,"traditional":true,"recordingStateTrigger":true,)"
            R"("recordingStateNormal":true,"activatedToNormal":false,"normalToActivated":false}}]})"),
        document(
            "every trigger element present is written in table order",
            frame("7.0", "0,86400", "Event", everyTrigger()),
            R"({"Rectangles":[{"Bottom":24,"Left":6,"RecordingMode":"Event","Right":7,"Top":0,)"
            R"("triggerEvents":{"motion":true,"pir":true,"tampering":true,"pptz":true,)"
            R"("lineDetection":true,"fieldDetection":true,"loitering":true,"crowdDetection":true,)"
            R"("missingObject":true,"abandonObject":true,"faceDetection":true,"zoneDetection":true,)"
            R"("smartTracking":true,"runningDetection":true,"parkingViolationDetection":true,)"
            R"("restrictedZoneDetection":true,"temperatureThresholdWarning":true,)"
            R"("temperatureThresholdAlarm":true,"temperatureDifferenceWarning":true,)"
            R"("temperatureDifferenceAlarm":true,"temperatureRiseWarning":true,)"
            R"("temperatureRiseAlarm":true,"temperatureSectionAlarm":true,"thermalIntrusion":true,)"
            R"("thermalMultiLoitering":true,"fireSpotDetection":true,"smokerDetection":true,)"
            R"("smokeAndFlameDetection":true,"di":true,"traditional":true,)"
            R"("recordingStateTrigger":false,"recordingStateNormal":true,)"
            R"("activatedToNormal":false,"normalToActivated":false}}]})"),
        // Qt reads "4294967297" as 1: recording in the trigger state.
        document(
            "digital input outside int range is off",
            frame("1.0", "0,3600", "Event",
                  "<DigiInput>4294967297</DigiInput><StopUntilDIRising>1</StopUntilDIRising>"),
            R"({"Rectangles":[{"Bottom":1,"Left":0,"RecordingMode":"Event","Right":1,"Top":0,)"
            R"("triggerEvents":{"motion":false,"pir":false,"tampering":false,"pptz":false,)"
            R"("lineDetection":false,"fieldDetection":false,"loitering":false,)"
            R"("crowdDetection":false,"missingObject":false,"abandonObject":false,)"
            R"("faceDetection":false,"di":true,"traditional":false,"recordingStateTrigger":false,)"
            R"("recordingStateNormal":false,"activatedToNormal":false,"normalToActivated":true}}]})"),
        document(
            "frame that does not repeat weekly is a placeholder without triggers",
            frame("1.0", "0,3600", "Event", "<Motion>1</Motion>", "Daily"),
            R"({"Rectangles":[{"Bottom":-1,"Left":-1,"RecordingMode":"Event","Right":-1,"Top":-1}]})"),
        document(
            "mapping without a time frame is one empty placeholder", "",
            R"({"Rectangles":[{"Bottom":-1,"Left":-1,"RecordingMode":"","Right":-1,"Top":-1}]})"),
        // Read as a list, a text became one empty frame per character.
        document(
            "time frame given as text is one empty placeholder", "<Ele>junk</Ele>",
            R"({"Rectangles":[{"Bottom":-1,"Left":-1,"RecordingMode":"","Right":-1,"Top":-1}]})"),
        document(
            "mode is written as an escaped JSON string", frame("1.0", "0,3600", R"(Con"tin\uous)"),
            R"({"Rectangles":[{"Bottom":1,"Left":0,"RecordingMode":"Con\"tin\\uous","Right":1,)"
            R"("Top":0}]})"),
        document(
            "numbers that are not finite read as 0", frame("nan", "inf,-inf", "Continuous"),
            R"({"Rectangles":[{"Bottom":0,"Left":-1,"RecordingMode":"Continuous","Right":0,"Top":0}]})"),
        document("day numbers saturate", frame("1e10", "0,3600", "Continuous"),
                 R"({"Rectangles":[{"Bottom":1,"Left":2147483646,"RecordingMode":"Continuous",)"
                 R"("Right":2147483647,"Top":0}]})"),
        inForce(
            "every time card is listed with identifier, revision and cameras as text",
            "#1 Default Schedule {continuous week} | #12 Hall {lobby} [C_12/3]",
            "GetAllScheduleRecInfo",
            QVariantList{
                entry(
                    "1", "Default Schedule",
                    R"({"Rectangles":[{"Bottom":24,"Left":0,"RecordingMode":"Continuous","Right":7,"Top":0}]})",
                    {}),
                entry("12", "Hall", Lobby, cameras("C_12/3"))})),
    rowName<CommandRow>);

} // namespace

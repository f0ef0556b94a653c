// Each of the eleven commands end to end: plugin-host as a process of its
// own, the built plug-in, the local tunnel and a seeded server. A row checks
// the reply line, the exchanges with the server and the time cards after.

#include "HostProcess.h"

#include <QCoreApplication>
#include <QJsonArray>
#include <QJsonDocument>

namespace {

const QString Seeded[] = {
    QStringLiteral("1 r3 Default Schedule [C_5/1]"),
    QStringLiteral("2 r5 KOLT2 Default Continuous Recording [C_1/1]"),
    QStringLiteral("3 r1 KOLT2 Default Event Recording []"),
    QStringLiteral("7 r2 Office []"),
};

const char *const Lobby =
    R"({"Rectangles":[{"Bottom":18,"Left":0,"RecordingMode":"Continuous","Right":5,"Top":8}]})";

const char *const AllDayContinuous =
    R"({"Rectangles":[{"Bottom":24,"Left":0,"RecordingMode":"Continuous","Right":7,"Top":0}]})";
const char *const AllDayEvent =
    R"({"Rectangles":[{"Bottom":24,"Left":0,"RecordingMode":"Event","Right":7,"Top":0,)"
    R"("triggerEvents":{"motion":true,"pir":false,"tampering":false,"pptz":false,)"
    R"("lineDetection":false,"fieldDetection":false,"loitering":false,"crowdDetection":false,)"
    R"("missingObject":false,"abandonObject":false,"faceDetection":false,"di":true,)"
    R"("traditional":true,"recordingStateTrigger":true,"recordingStateNormal":true,)"
    R"("activatedToNormal":false,"normalToActivated":false}}]})";
const char *const OfficeHours =
    R"({"Rectangles":[{"Bottom":17,"Left":0,"RecordingMode":"Continuous","Right":5,"Top":9}]})";

QJsonObject camera(const char *name, const char *group)
{
    return {{QStringLiteral("Name"), QString::fromLatin1(name)},
            {QStringLiteral("GrpID"), QString::fromLatin1(group)}};
}

QByteArray compact(const QJsonValue &value)
{
    const QByteArray wrapped = QJsonDocument(QJsonArray{value}).toJson(QJsonDocument::Compact);
    return wrapped.mid(1, wrapped.size() - 2);
}

QJsonObject entry(const char *id, const char *revision, const char *name, const char *content,
                  QJsonArray cameras)
{
    return {{QStringLiteral("TimeCardID"), QString::fromLatin1(id)},
            {QStringLiteral("Revision"), QString::fromLatin1(revision)},
            {QStringLiteral("ScheduleName"), QString::fromLatin1(name)},
            {QStringLiteral("CustomizeContent"), QString::fromLatin1(content)},
            {QStringLiteral("CameraList"), cameras}};
}

QByteArray allSchedules()
{
    return compact(QJsonArray{
        entry("1", "3", "Default Schedule", AllDayContinuous, {camera("C_5", "1")}),
        entry("2", "5", "KOLT2 Default Continuous Recording", AllDayContinuous,
              {camera("C_1", "1")}),
        entry("3", "1", "KOLT2 Default Event Recording", AllDayEvent, {}),
        entry("7", "2", "Office", OfficeHours, {}),
    });
}

QByteArray payload(const QJsonObject &object)
{
    return QJsonDocument(object).toJson(QJsonDocument::Compact);
}

struct CommandCase
{
    const char *name;
    QString command;
    QByteArray payload; // empty: none
    bool flag;          // true from the queries, the tunnel's flag (false) otherwise
    QByteArray data;    // the reply's data as printed
    QStringList exchanges;
    // The time cards after: the seeded ones with these lines replaced
    // ("ID ..." replaces card ID; "-ID" removes it; a new ID is added).
    QStringList changes;
};

void PrintTo(const CommandCase &c, std::ostream *os)
{
    *os << c.name;
}

QStringList expectedCards(const QStringList &changes)
{
    std::map<int, QString> cards;
    for (const QString &line : Seeded)
        cards[line.section(QLatin1Char(' '), 0, 0).toInt()] = line;
    for (const QString &change : changes) {
        if (change.startsWith(QLatin1Char('-')))
            cards.erase(change.mid(1).toInt());
        else
            cards[change.section(QLatin1Char(' '), 0, 0).toInt()] = change;
    }
    QStringList lines;
    for (const auto &[id, line] : cards)
        lines << line;
    return lines;
}

class Command : public HostProcess, public testing::WithParamInterface<CommandCase>
{};

TEST_P(Command, RepliesOnceAndChangesTheServerAsAsked)
{
    const CommandCase c = GetParam();
    seed();
    QStringList arguments{QStringLiteral("request"), c.command};
    if (!c.payload.isEmpty())
        arguments << QString::fromUtf8(c.payload);
    const Run run = host(arguments);

    EXPECT_EQ(run.status, 0) << run.err.toStdString();
    EXPECT_EQ(run.err, QByteArray());
    ASSERT_EQ(run.lines().size(), 1) << run.out.toStdString();
    EXPECT_EQ(run.lines().first(), "{\"command\": \"" + c.command.toUtf8() +
                                       "\", \"flag\": " + (c.flag ? "true" : "false") +
                                       ", \"code\": \"0\", \"text\": \"\", \"data\": " + c.data +
                                       "}");
    EXPECT_EQ(exchangeCommands(), c.exchanges);
    for (const QJsonObject &exchange : exchanges()) {
        EXPECT_EQ(exchange.value(QStringLiteral("outcome")).toString(), QStringLiteral("answered"));
        EXPECT_EQ(exchange.value(QStringLiteral("code")).toString(), QStringLiteral("0"))
            << exchange.value(QStringLiteral("content")).toString().toStdString();
    }
    EXPECT_EQ(cards(), expectedCards(c.changes));
}

const QString Get = QStringLiteral("GetRecTmcard");
const QString Ins = QStringLiteral("InsRecTmcard");
const QString Upd = QStringLiteral("UpdRecTmcard");
const QString Del = QStringLiteral("DelTmcard");

INSTANTIATE_TEST_SUITE_P(
    EveryCommand, Command,
    testing::Values(
        CommandCase{"schedule_in_force_leaves_the_default_card_out",
                    QStringLiteral("GetScheduleRecInfo"),
                    {},
                    true,
                    R"({"CustomizeContent":"","RecScheduleType":0})",
                    {Get},
                    {}},
        CommandCase{"current_schedule_counts_the_default_card",
                    QStringLiteral("GetCurrentScheduleInfo"),
                    {},
                    true,
                    R"({"CustomizeContent":"","RecScheduleType":4})",
                    {Get},
                    {}},
        CommandCase{"all_schedules_with_cameras_and_content",
                    QStringLiteral("GetAllScheduleRecInfo"),
                    {},
                    true,
                    allSchedules(),
                    {Get},
                    {}},
        CommandCase{"add_schedule_answers_the_new_identifier",
                    QStringLiteral("AddSchedule"),
                    payload({{QStringLiteral("ScheduleName"), QStringLiteral("Lobby")},
                             {QStringLiteral("timeframes"), QString::fromLatin1(Lobby)}}),
                    false,
                    R"("8")",
                    {Ins},
                    {QStringLiteral("8 r1 Lobby []")}},
        CommandCase{"update_schedule_renames_and_sets_the_cameras",
                    QStringLiteral("UpdateSchedule"),
                    payload({{QStringLiteral("TimeCardID"), QStringLiteral("7")},
                             {QStringLiteral("ScheduleName"), QStringLiteral("Office hours")},
                             {QStringLiteral("timeframes"), QString::fromLatin1(OfficeHours)},
                             {QStringLiteral("camRecGroupList"), QJsonArray{camera("C_9", "4")}}}),
                    false,
                    "null",
                    {Get, Upd},
                    {QStringLiteral("7 r3 Office hours [C_9/4]")}},
        CommandCase{"delete_schedule_by_identifier",
                    QStringLiteral("DelSchedule"),
                    payload({{QStringLiteral("TimeCardID"), QStringLiteral("7")}}),
                    false,
                    "null",
                    {Get, Del},
                    {QStringLiteral("-7")}},
        CommandCase{
            "move_a_camera_between_schedules",
            QStringLiteral("UpdateCamRecSchedule"),
            payload({{QStringLiteral("scheduleRmvCam"),
                      QJsonArray{QJsonObject{
                          {QStringLiteral("scheduleID"), QStringLiteral("2")},
                          {QStringLiteral("camIDList"), QJsonArray{camera("C_1", "1")}}}}},
                     {QStringLiteral("scheduleAddCam"),
                      QJsonArray{QJsonObject{
                          {QStringLiteral("scheduleID"), QStringLiteral("7")},
                          {QStringLiteral("camIDList"), QJsonArray{camera("C_1", "1")}}}}}}),
            false,
            "null",
            {Get, Upd, Get, Upd},
            {QStringLiteral("2 r6 KOLT2 Default Continuous Recording []"),
             QStringLiteral("7 r3 Office [C_1/1]")}},
        CommandCase{"default_continuous_adds_before_the_cameras_it_had",
                    QStringLiteral("DefaultContinousSchedule"),
                    payload({{QStringLiteral("camRecGroupList"), QJsonArray{camera("C_7", "2")}}}),
                    false,
                    "null",
                    {Get, Upd},
                    {QStringLiteral("2 r6 KOLT2 Default Continuous Recording [C_7/2 C_1/1]")}},
        CommandCase{"default_event_updates_the_existing_card",
                    QStringLiteral("DefaultEventSchedule"),
                    payload({{QStringLiteral("camRecGroupList"), QJsonArray{camera("C_8", "2")}}}),
                    false,
                    "null",
                    {Get, Upd},
                    {QStringLiteral("3 r2 KOLT2 Default Event Recording [C_8/2]")}},
        CommandCase{"customize_creates_the_missing_card",
                    QStringLiteral("CustomizeSchedule"),
                    payload({{QStringLiteral("timeframes"), QString::fromLatin1(Lobby)},
                             {QStringLiteral("camRecGroupList"), QJsonArray{camera("C_12", "3")}}}),
                    false,
                    "null",
                    {Get, Ins},
                    {QStringLiteral("8 r1 KOLT2 Customize Recording [C_12/3]")}},
        CommandCase{"not_recording_clears_every_card_with_cameras",
                    QStringLiteral("DefaultNotRecordingSchedule"),
                    payload({{QStringLiteral("camRecGroupList"),
                              QJsonArray{camera("C_5", "1"), camera("C_1", "1")}}}),
                    false,
                    "null",
                    {Get, Get, Upd, Get, Upd},
                    {QStringLiteral("1 r4 Default Schedule []"),
                     QStringLiteral("2 r6 KOLT2 Default Continuous Recording []")}}),
    [](const testing::TestParamInfo<CommandCase> &info) { return std::string(info.param.name); });

} // namespace

int main(int argc, char **argv)
{
    QCoreApplication app(argc, argv);
    testing::InitGoogleTest(&argc, argv);
    return RUN_ALL_TESTS();
}

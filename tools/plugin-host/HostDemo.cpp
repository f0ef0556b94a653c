// plugin-host demo: a short story of real commands against a fresh server,
// told step by step with each schedule drawn as a weekly grid.

#include "HostCommands.h"

#include "HostCommandLine.h"
#include "HostExit.h"
#include "HostOutput.h"
#include "HostPlatform.h"
#include "HostRequest.h"
#include "JsonValues.h"
#include "ReplyLine.h"
#include "RequestRunner.h"
#include "WeekGrid.h"

#include <QJsonDocument>
#include <QJsonObject>
#include <QTemporaryDir>

#include <map>

namespace {

// Weekdays (days 1 to 5) from 08:00 to 18:00, recording all the time, and
// the weekend (days 6 and 7) all day, recording on motion.
const char *const LobbyTimeframes =
    R"({"Rectangles":[{"Bottom":18,"Left":0,"RecordingMode":"Continuous","Right":5,"Top":8},)"
    R"({"Bottom":24,"Left":5,"RecordingMode":"Event","Right":7,"Top":0,"triggerEvents":)"
    R"({"motion":true,"pir":false,"tampering":false,"pptz":false,"lineDetection":false,)"
    R"("fieldDetection":false,"loitering":false,"crowdDetection":false,"missingObject":false,)"
    R"("abandonObject":false,"faceDetection":false,"di":false,"traditional":false,)"
    R"("recordingStateTrigger":false,"recordingStateNormal":false,"activatedToNormal":false,)"
    R"("normalToActivated":false}}]})";

QVariantMap camera(const char *name, const char *group)
{
    return {{QStringLiteral("Name"), QString::fromLatin1(name)},
            {QStringLiteral("GrpID"), QString::fromLatin1(group)}};
}

QVariantList demoCameras()
{
    return {camera("C_1", "1"), camera("C_2", "1"), camera("C_3", "2")};
}

// One time card as GetAllScheduleRecInfo lists it.
struct Schedule
{
    QString name;
    QString revision;
    QString content;
    QVariantList cameras;

    bool operator==(const Schedule &other) const
    {
        return name == other.name && revision == other.revision && content == other.content &&
               cameras == other.cameras;
    }
};

using Schedules = std::map<QString, Schedule>;

QString cameraText(const QVariantList &cameras)
{
    QStringList names;
    for (const QVariant &entry : cameras) {
        const QVariantMap map = entry.toMap();
        names << QStringLiteral("%1 (group %2)")
                     .arg(map.value(QStringLiteral("Name")).toString(),
                          map.value(QStringLiteral("GrpID")).toString());
    }
    return names.isEmpty() ? QStringLiteral("none") : names.join(QStringLiteral(", "));
}

class DemoStory
{
public:
    explicit DemoStory(HostPlatform &platform) : m_runner(platform) {}

    void say(const QString &text) { printText(text); }

    void heading(const QString &text)
    {
        printText(QString());
        printText(QStringLiteral("== %1").arg(text));
    }

    // Sends one request, shows it and its reply line, then draws the
    // schedules it changed. The reply, or nothing when none came.
    std::optional<ReplyCollector::Reply> step(const QString &command, const QVariantMap &payload)
    {
        HostRequest request{command, payload.isEmpty() ? QVariant() : QVariant(payload), {}};
        const QString shown =
            request.payload.isValid()
                ? QString::fromUtf8(JsonValues::compact(QJsonValue::fromVariant(request.payload)))
                : QString();
        printText(QStringLiteral("> %1 %2").arg(command, shown).trimmed());
        std::optional<ReplyCollector::Reply> reply = m_runner.send(request);
        if (!reply) {
            m_failed = true;
            return std::nullopt;
        }
        printText(QStringLiteral("< ") + QString::fromUtf8(replyLine(command, *reply)));
        if (reply->code != QLatin1String("0"))
            say(QStringLiteral("  (the plug-in answered \"%1\": the story goes on without it)")
                    .arg(reply->code));
        showChanges();
        return reply;
    }

    // Reads every time card through the plug-in, quietly.
    std::optional<Schedules> readSchedules()
    {
        const std::optional<ReplyCollector::Reply> reply =
            m_runner.send(HostRequest{QStringLiteral("GetAllScheduleRecInfo"), QVariant(), {}});
        if (!reply) {
            m_failed = true;
            return std::nullopt;
        }
        if (reply->code != QLatin1String("0"))
            return std::nullopt;
        Schedules schedules;
        for (const QVariant &entry : reply->data.toList()) {
            const QVariantMap map = entry.toMap();
            schedules[map.value(QStringLiteral("TimeCardID")).toString()] =
                Schedule{map.value(QStringLiteral("ScheduleName")).toString(),
                         map.value(QStringLiteral("Revision")).toString(),
                         map.value(QStringLiteral("CustomizeContent")).toString(),
                         map.value(QStringLiteral("CameraList")).toList()};
        }
        return schedules;
    }

    // Draws every schedule that is new or changed since the last look, and
    // names those that are gone.
    void showChanges()
    {
        if (m_failed)
            return;
        const std::optional<Schedules> now = readSchedules();
        if (!now)
            return;
        for (const auto &[id, schedule] : *now) {
            const auto before = m_known.find(id);
            if (before != m_known.end() && before->second == schedule)
                continue;
            printText(QString());
            printText(QStringLiteral("  Time card %1 \"%2\" (revision %3%4), cameras: %5")
                          .arg(id, schedule.name, schedule.revision,
                               before == m_known.end() ? QStringLiteral(", new")
                                                       : QStringLiteral(", changed"),
                               cameraText(schedule.cameras)));
            if (before == m_known.end() || before->second.content != schedule.content) {
                for (const QString &line : weekGrid(schedule.content))
                    printText(QStringLiteral("    ") + line);
            } else {
                printText(QStringLiteral("    (time frames unchanged)"));
            }
        }
        for (const auto &[id, schedule] : m_known) {
            if (now->find(id) == now->end())
                printText(QStringLiteral("  Time card %1 \"%2\" is gone").arg(id, schedule.name));
        }
        m_known = *now;
    }

    // The identifier of the time card with this name, or nothing.
    std::optional<QString> idOf(const QString &name) const
    {
        for (const auto &[id, schedule] : m_known) {
            if (schedule.name == name)
                return id;
        }
        return std::nullopt;
    }

    bool failed() const { return m_failed; }
    int finish() { return m_runner.finish(); }

private:
    RequestRunner m_runner;
    Schedules m_known;
    bool m_failed = false;
};

// Moves C_2 from the default event schedule to "Lobby"; false when the
// story cannot go on.
bool moveToLobby(DemoStory &story)
{
    const std::optional<QString> lobby = story.idOf(QStringLiteral("Lobby"));
    const std::optional<QString> event =
        story.idOf(QStringLiteral("KOLT2 Default Event Recording"));
    story.heading(QStringLiteral("Move C_2 from the default event schedule to \"Lobby\""));
    if (lobby && event) {
        const QVariantList moved{camera("C_2", "1")};
        const QVariantMap from{{QStringLiteral("scheduleID"), *event},
                               {QStringLiteral("camIDList"), moved}};
        const QVariantMap to{{QStringLiteral("scheduleID"), *lobby},
                             {QStringLiteral("camIDList"), moved}};
        return story
            .step(QStringLiteral("UpdateCamRecSchedule"),
                  {{QStringLiteral("scheduleRmvCam"), QVariantList{from}},
                   {QStringLiteral("scheduleAddCam"), QVariantList{to}}})
            .has_value();
    }
    story.say(QStringLiteral("  (skipped: the schedules to move between are not there)"));
    return true;
}

void tell(DemoStory &story)
{
    story.heading(QStringLiteral("A fresh recording server holds its default time card"));
    story.say(QStringLiteral("Grids: days 1 to 7 across, hours down; C continuous, E event "
                             "recording, lower case for part of the hour, * where modes "
                             "overlap."));
    story.showChanges();
    if (story.failed())
        return;

    story.heading(QStringLiteral("Create the schedule \"Lobby\": weekdays 08:00-18:00 "
                                 "continuous, weekends on motion"));
    const auto added =
        story.step(QStringLiteral("AddSchedule"),
                   {{QStringLiteral("ScheduleName"), QStringLiteral("Lobby")},
                    {QStringLiteral("timeframes"), QString::fromUtf8(LobbyTimeframes)}});
    if (!added)
        return;

    story.heading(QStringLiteral("Put cameras C_1, C_2 and C_3 on the default event schedule"));
    if (!story.step(QStringLiteral("DefaultEventSchedule"),
                    {{QStringLiteral("camRecGroupList"), demoCameras()}}))
        return;

    if (!moveToLobby(story))
        return;

    story.heading(QStringLiteral("Which schedule is in force? Two time cards hold cameras, "
                                 "so the answer is 4 (more than one)"));
    if (!story.step(QStringLiteral("GetScheduleRecInfo"), {}))
        return;

    story.heading(QStringLiteral("Take C_1, C_2 and C_3 off every schedule"));
    if (!story.step(QStringLiteral("DefaultNotRecordingSchedule"),
                    {{QStringLiteral("camRecGroupList"), demoCameras()}}))
        return;

    story.heading(QStringLiteral("Which schedule is in force now? None holds cameras: 5 (no "
                                 "schedule)"));
    story.step(QStringLiteral("GetScheduleRecInfo"), {});
}

} // namespace

int runDemo(const HostOptions &options)
{
    QTemporaryDir folder;
    if (!folder.isValid()) {
        printError(QStringLiteral("no temporary folder for the demo's server: %1")
                       .arg(folder.errorString()));
        return ExitUsage;
    }
    HostOptions demoOptions = options;
    demoOptions.databaseFile = folder.filePath(QStringLiteral("demo.sqlite"));

    HostPlatform platform(demoOptions);
    if (const std::optional<Failure> failure = platform.start()) {
        printError(failure->message);
        return ExitUsage;
    }
    DemoStory story(platform);
    story.say(QStringLiteral("plugin-host demo: the recording schedule plug-in against a "
                             "temporary recording server"));
    tell(story);
    printText(QString());
    const int status = story.finish();
    story.say(status == ExitOk ? QStringLiteral("Every request got exactly one reply.")
                               : QStringLiteral("Some request did not get exactly one reply."));
    return stopPlatform(platform, status);
}

// The operations that change time cards on the recording server, and the
// lookups of the plug-in's own time cards by their fixed names.
#include "RecordingSettingControl.h"

#include "CameraList.h"
#include "FixedSchedule.h"
#include "RecordingScheduleSettingConstants.h"
#include "TimecardAnswerText.h"
#include "TimecardTemplate.h"

#include <algorithm>

using namespace PluginRecordingScheduleSettingCommon;
using TimecardTemplate::escaped;
using TimecardTemplate::filled;

bool RecordingSettingControl::AddSchedule(const QString &name, const QString &content,
                                          TimecardIdCallback done)
{
    if (!m_tunnel)
        return false;
    const QString body = filled(Template::InsertTimecard,
                                {escaped(name), ComposeScheRecTimeframeMsg(content), QString()});
    return Send(TunnelCommand::InsRecTmcard, body, Timeout::Minimum, Identity::Requester,
                BindTimecardId(std::move(done)));
}

bool RecordingSettingControl::InsertFixedTimecard(const FixedSchedule &fixed,
                                                  const QString &content,
                                                  const QList<QVariant> &cameras, bool perCamera,
                                                  ControlResultCallback done)
{
    if (!m_tunnel)
        return false;
    // Each camera once: a client's list that names one twice would otherwise
    // stand twice on the new time card.
    const QList<QVariant> held = CameraList().merge(cameras).entries();
    const QString body =
        filled(Template::InsertTimecard,
               {fixed.timecardName, MappingOf(fixed, content), ComposeCamRecGrpListMsg(held)});
    // Refused with FixedNameTaken, the request lost a race with another one
    // that created the time card between its read and this insert.
    TunnelResponseHandler handler = [this, &fixed, content, held, done = std::move(done)](
                                        bool ok, const QString &status, const QString &detail,
                                        const QString &code, const QString &answer, bool flag) {
        ControlResultCallback then = done;
        if (ok && code == ServerResponse::FixedNameTaken && done)
            then = [this, &fixed, content, held, done](bool, bool refusedFlag) {
                JoinFixedTimecard(fixed, content, held, refusedFlag, done);
            };
        HdlrTunnelReqCallback(ok, status, detail, code, answer, flag, then);
    };
    return Send(TunnelCommand::InsRecTmcard, body,
                perCamera ? Timeout::forCameras(held.size()) : Timeout::Minimum, Identity::Tunnel,
                std::move(handler));
}

void RecordingSettingControl::JoinFixedTimecard(const FixedSchedule &fixed, const QString &content,
                                                const QList<QVariant> &cameras, bool flag,
                                                ControlResultCallback done)
{
    const auto join = [this, &fixed, content, cameras, done](bool ok, bool readFlag,
                                                             const QList<QVariant> &timecards,
                                                             const QString &) {
        const QMap<QString, QVariant> winner =
            ok ? GetTimecardInfoByName(timecards, fixed.timecardName) : QMap<QString, QVariant>();
        if (winner.isEmpty() || !UpdateFixedTimecard(fixed, winner, content, cameras, done))
            done(false, readFlag);
    };
    if (!GetAllScheduleTimecardInfo(join))
        done(false, flag);
}

bool RecordingSettingControl::CreateCustomizeTimecard(const QString &content,
                                                      const QList<QVariant> &cameras,
                                                      ControlResultCallback done)
{
    return InsertFixedTimecard(FixedSchedule::customize(), content, cameras, false,
                               std::move(done));
}

bool RecordingSettingControl::CreateDefaultContinuousTimecard(const QList<QVariant> &cameras,
                                                              ControlResultCallback done)
{
    return InsertFixedTimecard(FixedSchedule::continuous(), QString(), cameras, true,
                               std::move(done));
}

bool RecordingSettingControl::CreateDefaultEventTimecard(const QList<QVariant> &cameras,
                                                         ControlResultCallback done)
{
    return InsertFixedTimecard(FixedSchedule::event(), QString(), cameras, true, std::move(done));
}

bool RecordingSettingControl::UpdateSchedule(const QString &revision, const QString &timecardId,
                                             const QString &name, const QString &content,
                                             const QList<QVariant> &cameras,
                                             ControlResultCallback done)
{
    if (!m_tunnel)
        return false;
    const QString body =
        filled(Template::UpdateTimecard,
               {escaped(revision), escaped(timecardId), escaped(name),
                ComposeScheRecTimeframeMsg(content), ComposeCamRecGrpListMsg(cameras)});
    return Send(TunnelCommand::UpdRecTmcard, body, Timeout::forCameras(cameras.size()),
                Identity::Requester, BindResult(std::move(done)));
}

QString RecordingSettingControl::MappingOf(const FixedSchedule &fixed, const QString &content) const
{
    return fixed.mapping.isEmpty() ? ComposeScheRecTimeframeMsg(content) : fixed.mapping;
}

bool RecordingSettingControl::UpdateFixedTimecard(const FixedSchedule &fixed,
                                                  const QMap<QString, QVariant> &summary,
                                                  const QString &content,
                                                  const QList<QVariant> &cameras,
                                                  ControlResultCallback done)
{
    if (!m_tunnel)
        return false;
    const QList<QVariant> merged =
        CameraList()
            .merge(cameras)
            .merge(TransContentAsList(summary.value(TimecardKey::CamList)))
            .entries();
    const QString body =
        filled(Template::UpdateTimecard,
               {escaped(summary.value(TimecardKey::Revision).toString()),
                escaped(summary.value(TimecardKey::TmcardID).toString()), fixed.timecardName,
                MappingOf(fixed, content), ComposeCamRecGrpListMsg(merged)});
    return Send(TunnelCommand::UpdRecTmcard, body, Timeout::Minimum, Identity::Tunnel,
                BindResult(std::move(done)));
}

bool RecordingSettingControl::UpdateCustomizeTimecard(const QMap<QString, QVariant> &summary,
                                                      const QString &content,
                                                      const QList<QVariant> &cameras,
                                                      ControlResultCallback done)
{
    return UpdateFixedTimecard(FixedSchedule::customize(), summary, content, cameras,
                               std::move(done));
}

bool RecordingSettingControl::UpdateDefaultContinuousTimecard(
    const QMap<QString, QVariant> &summary, const QList<QVariant> &cameras,
    ControlResultCallback done)
{
    return UpdateFixedTimecard(FixedSchedule::continuous(), summary, QString(), cameras,
                               std::move(done));
}

bool RecordingSettingControl::UpdateDefaultEventTimecard(const QMap<QString, QVariant> &summary,
                                                         const QList<QVariant> &cameras,
                                                         ControlResultCallback done)
{
    return UpdateFixedTimecard(FixedSchedule::event(), summary, QString(), cameras,
                               std::move(done));
}

bool RecordingSettingControl::DeleteSchedule(const QMap<QString, QVariant> &timecard,
                                             ControlResultCallback done)
{
    const QString revision = timecard.value(TimecardKey::Revision).toString();
    const QString timecardId = timecard.value(TimecardKey::TmcardID).toString();
    if (revision.isEmpty() || timecardId.isEmpty())
        return false;
    const QString body = filled(Template::DeleteTimecard, {escaped(revision), escaped(timecardId)});
    return Send(TunnelCommand::DelTmcard, body, Timeout::Minimum, Identity::Requester,
                BindResult(std::move(done)));
}

bool RecordingSettingControl::UpdateTimecardCameraList(const QString &answer,
                                                       const QList<QVariant> &cameras,
                                                       ControlResultCallback done, int timeoutMs)
{
    if (!m_tunnel || answer.isEmpty() || !done)
        return false;
    std::optional<QString> timecard = TimecardAnswerText::timecardOf(answer);
    if (!timecard)
        return false;
    const TimecardAnswerText::CameraListPlace place = TimecardAnswerText::cameraListIn(*timecard);
    switch (place.kind) {
    case TimecardAnswerText::CameraListPlace::Replace:
    case TimecardAnswerText::CameraListPlace::Insert:
        timecard->replace(place.start, place.length, ComposeCamRecGrpListMsg(cameras));
        break;
    case TimecardAnswerText::CameraListPlace::Unchanged:
        break;
    case TimecardAnswerText::CameraListPlace::Unreadable:
        return false;
    }
    const QString body = filled(Template::UpdateTimecardText, {*timecard});
    if (!TimecardAnswerText::isWellFormed(body))
        return false;
    return Send(TunnelCommand::UpdRecTmcard, body, std::max(timeoutMs, Timeout::Minimum),
                Identity::Requester, BindResult(std::move(done)));
}

QMap<QString, QVariant>
RecordingSettingControl::GetTimecardInfoByName(const QList<QVariant> &timecards,
                                               const QString &name) const
{
    QMap<QString, QVariant> summary;
    for (const QVariant &entry : timecards) {
        const QMap<QString, QVariant> timecard = entry.toMap();
        if (timecard.value(TimecardKey::Name).toString() != name)
            continue;
        summary.insert(TimecardKey::Revision, timecard.value(TimecardKey::Revision).toString());
        summary.insert(TimecardKey::TmcardID, timecard.value(TimecardKey::TmcardID).toString());
        const QVariant cameraList = timecard.value(TimecardKey::CamList);
        if (cameraList.typeId() == QMetaType::QVariantMap &&
            cameraList.toMap().contains(TimecardKey::Cam))
            summary.insert(TimecardKey::CamList,
                           TransContentAsList(cameraList.toMap().value(TimecardKey::Cam)));
    }
    return summary;
}

QMap<QString, QVariant>
RecordingSettingControl::GetDefaultContinousTimecardInfo(const QList<QVariant> &timecards)
{
    return GetTimecardInfoByName(timecards, FixedSchedule::continuous().timecardName);
}

QMap<QString, QVariant>
RecordingSettingControl::GetDefaultEventTimecardInfo(const QList<QVariant> &timecards)
{
    return GetTimecardInfoByName(timecards, FixedSchedule::event().timecardName);
}

QMap<QString, QVariant>
RecordingSettingControl::GetCustomizeTimecardInfo(const QList<QVariant> &timecards)
{
    return GetTimecardInfoByName(timecards, FixedSchedule::customize().timecardName);
}

// The operations that change time cards on the recording server, and the
// lookups of the plug-in's own time cards by their fixed names.
#include "RecordingSettingControl.h"

#include "RecordingScheduleSettingConstants.h"
#include "TimecardAnswerText.h"
#include "TimecardTemplate.h"

#include <algorithm>

using namespace PluginRecordingScheduleSettingCommon;
using TimecardTemplate::escaped;
using TimecardTemplate::filled;

namespace {

// A camera list as the converter may give it: a list, or one lone camera.
QList<QVariant> cameraEntries(const QVariant &cameras)
{
    if (cameras.typeId() == QMetaType::QVariantList)
        return cameras.toList();
    if (cameras.typeId() == QMetaType::QVariantMap)
        return {cameras};
    return {};
}

QString cameraName(const QVariant &camera)
{
    return camera.toMap().value(TimecardKey::Name).toString();
}

// The given cameras first, then the time card's own. Merged by name: a
// camera kept twice would go on recording by this time card after one copy
// is removed.
QList<QVariant> mergedCameras(const QList<QVariant> &given, const QList<QVariant> &present)
{
    QList<QVariant> merged;
    merged.reserve(given.size() + present.size());
    QSet<QString> names;
    names.reserve(given.size() + present.size());
    for (const QList<QVariant> *list : {&given, &present}) {
        for (const QVariant &camera : *list) {
            const QString name = cameraName(camera);
            if (names.contains(name))
                continue;
            names.insert(name);
            merged.append(camera);
        }
    }
    return merged;
}

} // namespace

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

bool RecordingSettingControl::InsertFixedTimecard(const QString &name, const QString &mapping,
                                                  const QList<QVariant> &cameras, int timeoutMs,
                                                  ControlResultCallback done)
{
    const QString body =
        filled(Template::InsertTimecard, {name, mapping, ComposeCamRecGrpListMsg(cameras)});
    return Send(TunnelCommand::InsRecTmcard, body, timeoutMs, Identity::Tunnel,
                BindResult(std::move(done)));
}

bool RecordingSettingControl::CreateCustomizeTimecard(const QString &content,
                                                      const QList<QVariant> &cameras,
                                                      ControlResultCallback done)
{
    if (!m_tunnel)
        return false;
    return InsertFixedTimecard(TimecardName::Customize, ComposeScheRecTimeframeMsg(content),
                               cameras, Timeout::Minimum, std::move(done));
}

bool RecordingSettingControl::CreateDefaultContinuousTimecard(const QList<QVariant> &cameras,
                                                              ControlResultCallback done)
{
    return InsertFixedTimecard(TimecardName::DefaultContinuous, Template::DefaultContinuousMapping,
                               cameras, CameraTimeout(cameras.size()), std::move(done));
}

bool RecordingSettingControl::CreateDefaultEventTimecard(const QList<QVariant> &cameras,
                                                         ControlResultCallback done)
{
    return InsertFixedTimecard(TimecardName::DefaultEvent, Template::DefaultEventMapping, cameras,
                               CameraTimeout(cameras.size()), std::move(done));
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
    return Send(TunnelCommand::UpdRecTmcard, body, CameraTimeout(cameras.size()),
                Identity::Requester, BindResult(std::move(done)));
}

bool RecordingSettingControl::UpdateFixedTimecard(const QMap<QString, QVariant> &summary,
                                                  const QString &name, const QString &mapping,
                                                  const QList<QVariant> &cameras,
                                                  ControlResultCallback done)
{
    const QList<QVariant> merged =
        mergedCameras(cameras, cameraEntries(summary.value(TimecardKey::CamList)));
    const QString body =
        filled(Template::UpdateTimecard, {escaped(summary.value(TimecardKey::Revision).toString()),
                                          escaped(summary.value(TimecardKey::TmcardID).toString()),
                                          name, mapping, ComposeCamRecGrpListMsg(merged)});
    return Send(TunnelCommand::UpdRecTmcard, body, Timeout::Minimum, Identity::Tunnel,
                BindResult(std::move(done)));
}

bool RecordingSettingControl::UpdateCustomizeTimecard(const QMap<QString, QVariant> &summary,
                                                      const QString &content,
                                                      const QList<QVariant> &cameras,
                                                      ControlResultCallback done)
{
    if (!m_tunnel)
        return false;
    return UpdateFixedTimecard(summary, TimecardName::Customize,
                               ComposeScheRecTimeframeMsg(content), cameras, std::move(done));
}

bool RecordingSettingControl::UpdateDefaultContinuousTimecard(
    const QMap<QString, QVariant> &summary, const QList<QVariant> &cameras,
    ControlResultCallback done)
{
    return UpdateFixedTimecard(summary, TimecardName::DefaultContinuous,
                               Template::DefaultContinuousMapping, cameras, std::move(done));
}

bool RecordingSettingControl::UpdateDefaultEventTimecard(const QMap<QString, QVariant> &summary,
                                                         const QList<QVariant> &cameras,
                                                         ControlResultCallback done)
{
    return UpdateFixedTimecard(summary, TimecardName::DefaultEvent, Template::DefaultEventMapping,
                               cameras, std::move(done));
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
    return GetTimecardInfoByName(timecards, TimecardName::DefaultContinuous);
}

QMap<QString, QVariant>
RecordingSettingControl::GetDefaultEventTimecardInfo(const QList<QVariant> &timecards)
{
    return GetTimecardInfoByName(timecards, TimecardName::DefaultEvent);
}

QMap<QString, QVariant>
RecordingSettingControl::GetCustomizeTimecardInfo(const QList<QVariant> &timecards)
{
    return GetTimecardInfoByName(timecards, TimecardName::Customize);
}

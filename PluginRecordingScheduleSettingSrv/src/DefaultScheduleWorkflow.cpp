// "DefaultContinousSchedule", "DefaultEventSchedule", "CustomizeSchedule" and
// "DefaultNotRecordingSchedule": a group of cameras goes onto one fixed time
// card, or off every time card. Each command is a chain that starts from the
// dispatcher's read of all time cards and ends in exactly one reply; time
// cards cleared before a failure stay cleared.

#include "PluginRecordingScheduleSettingSrv.h"

#include "RecordingScheduleSettingConstants.h"
#include "TraceLog.h"

#include <QSet>

#include <algorithm>

using namespace PluginRecordingScheduleSettingCommon;

namespace {

bool IsFixedTimecardType(const QString &type)
{
    return type == ScheduleTypeWord::Continous || type == ScheduleTypeWord::Event ||
           type == ScheduleTypeWord::Customize;
}

} // namespace

void PluginRecordingScheduleSettingSrv::UpdateTimecardCamList(
    bool ok, bool flag, const QList<QVariant> &timecards, const QString &type,
    const QString &content, const QList<QVariant> &cameras, ResponseCallback reply)
{
    if (!ok) {
        TRACE_ERROR("Fail to get time card list.");
        HdlrReqCallback(false, flag, reply);
        return;
    }
    if (!IsFixedTimecardType(type)) {
        TRACE_ERROR("%s, Invalid schedule recording type.",
                    "PluginRecordingScheduleSettingSrv::UpdateTimecardCamList");
        HdlrReqCallback(false, flag, reply);
        return;
    }

    const VariantMap summary = GetTimecardInfo(timecards, type);
    // Left on another time card, a camera would go on recording by it too,
    // and the queries would report its schedule as "other".
    const QList<int> holders = TimecardIDThatHoldsAnyCamera(timecards, cameras, summary);
    if (holders.isEmpty())
        PutCamerasOnFixedTimecard(summary, type, content, cameras, reply);
    else
        RemoveCamerasFromTimecards(holders, type, content, cameras, reply);
}

QMap<QString, QVariant>
PluginRecordingScheduleSettingSrv::GetTimecardInfo(const QList<QVariant> &timecards,
                                                   const QString &type)
{
    const QSharedPointer<IRecordingSettingControl> control = Control();
    if (!control)
        return {};
    if (type == ScheduleTypeWord::Continous)
        return control->GetDefaultContinousTimecardInfo(timecards);
    if (type == ScheduleTypeWord::Event)
        return control->GetDefaultEventTimecardInfo(timecards);
    if (type == ScheduleTypeWord::Customize)
        return control->GetCustomizeTimecardInfo(timecards);
    return {};
}

QList<int>
PluginRecordingScheduleSettingSrv::TimecardIDThatHoldsAnyCamera(const QList<QVariant> &timecards,
                                                                const QList<QVariant> &cameras,
                                                                const VariantMap &except) const
{
    QSet<QString> names;
    for (const QVariant &camera : cameras) {
        const QString name = camera.toMap().value(PayloadKey::Name).toString();
        if (!name.isEmpty())
            names.insert(name);
    }

    QList<int> holders;
    if (names.isEmpty())
        return holders;
    for (const QVariant &entry : timecards) {
        const VariantMap timecard = entry.toMap();
        const QString id = timecard.value(TimecardKey::TmcardID).toString();
        if (except.contains(TimecardKey::TmcardID) &&
            id == except.value(TimecardKey::TmcardID).toString())
            continue;
        const QList<QVariant> held = GetCameraList(timecard);
        const bool holds = std::any_of(held.cbegin(), held.cend(), [&](const QVariant &camera) {
            return names.contains(camera.toMap().value(TimecardKey::Name).toString());
        });
        if (holds)
            holders.append(id.toInt());
    }
    return holders;
}

void PluginRecordingScheduleSettingSrv::PutCamerasOnFixedTimecard(const VariantMap &summary,
                                                                  const QString &type,
                                                                  const QString &content,
                                                                  const QList<QVariant> &cameras,
                                                                  ResponseCallback reply)
{
    const QSharedPointer<IRecordingSettingControl> control = Control();
    if (!control) {
        ReplyFailure(reply);
        return;
    }
    const ControlResultCallback done = ReplyCompletion(reply);
    const bool missing = summary.isEmpty();
    bool sent = false;
    if (type == ScheduleTypeWord::Continous) {
        sent = missing ? control->CreateDefaultContinuousTimecard(cameras, done)
                       : control->UpdateDefaultContinuousTimecard(summary, cameras, done);
    } else if (type == ScheduleTypeWord::Event) {
        sent = missing ? control->CreateDefaultEventTimecard(cameras, done)
                       : control->UpdateDefaultEventTimecard(summary, cameras, done);
    } else if (type == ScheduleTypeWord::Customize) {
        sent = missing ? control->CreateCustomizeTimecard(content, cameras, done)
                       : control->UpdateCustomizeTimecard(summary, content, cameras, done);
    }
    if (!sent)
        ReplyFailure(reply);
}

void PluginRecordingScheduleSettingSrv::HandleGetAllTimecardRes(
    bool ok, bool flag, const QList<QVariant> &timecards, const QString &, const QString &type,
    const QString &content, const QList<QVariant> &cameras, ResponseCallback reply)
{
    if (!ok) {
        TRACE_ERROR("Fail to get all schedule time card.");
        HdlrReqCallback(false, flag, reply);
        return;
    }
    RemoveCamerasFromTimecards(TimecardIDThatNeedsToRemoveCameraList(timecards), type, content,
                               cameras, reply);
}

void PluginRecordingScheduleSettingSrv::RemoveCamerasFromTimecards(QList<int> timecardIds,
                                                                   const QString &type,
                                                                   const QString &content,
                                                                   const QList<QVariant> &cameras,
                                                                   ResponseCallback reply)
{
    const int timecardId = timecardIds.takeFirst();
    const QSharedPointer<IRecordingSettingControl> control = Control();
    const bool sent =
        control &&
        control->RemoveTimecardCameraList(
            timecardId, cameras,
            Guard(reply, [this, type, content, cameras, timecardIds, reply](bool ok, bool flag) {
                HandleRemoveTimecardCamListRes(ok, flag, type, content, cameras, timecardIds,
                                               reply);
            }));
    if (!sent)
        ReplyFailure(reply);
}

void PluginRecordingScheduleSettingSrv::HandleRemoveTimecardCamListRes(
    bool ok, bool flag, QString type, const QString &content, QList<QVariant> cameras,
    QList<int> timecardIds, ResponseCallback reply)
{
    if (!ok) {
        TRACE_ERROR("Fail to remove camera list of default time card.");
        HdlrReqCallback(false, flag, reply);
        return;
    }
    if (!timecardIds.isEmpty()) {
        RemoveCamerasFromTimecards(std::move(timecardIds), type, content, cameras, reply);
        return;
    }
    if (type == ScheduleTypeWord::NotRecording) {
        HdlrReqCallback(true, flag, reply);
        return;
    }

    // The cameras are off every other time card; what the fixed one holds now
    // is read afresh, since the removals changed the server. This second pass
    // removes nothing more, so two commands moving the same camera cannot
    // chase each other for ever.
    const QSharedPointer<IRecordingSettingControl> control = Control();
    const bool sent =
        control &&
        control->GetAllScheduleTimecardInfo(Guard(
            reply, [this, type, content, cameras,
                    reply](bool ok, bool flag, const QList<QVariant> &timecards, const QString &) {
                if (!ok) {
                    TRACE_ERROR("Fail to get time card list.");
                    HdlrReqCallback(false, flag, reply);
                    return;
                }
                PutCamerasOnFixedTimecard(GetTimecardInfo(timecards, type), type, content, cameras,
                                          reply);
            }));
    if (!sent)
        ReplyFailure(reply);
}

// "UpdateCamRecSchedule": moves cameras between time cards, one entry at a
// time, removals first. What is left to do travels in each step's completion
// as a copy of the payload without the finished entries; the chain ends in
// exactly one reply, after the last entry or at the first failure. Steps that
// succeeded before a failure stay done.

#include "PluginRecordingScheduleSettingSrv.h"

#include "RecordingScheduleSettingConstants.h"
#include "TraceLog.h"

#include <algorithm>

using namespace PluginRecordingScheduleSettingCommon;

namespace {

// Addition entries that stand for the fixed default time cards.
const QString DefaultEventEntry = QStringLiteral("-2");
const QString DefaultContinuousEntry = QStringLiteral("-3");

QString TextOf(const QVariant &camera, const QString &key)
{
    return camera.toMap().value(key).toString();
}

// Matched by name and group as text, whatever else the client's entry holds:
// a group sent as the number 1 would otherwise never meet the server's "1",
// and nothing would be removed. Every match goes, so that a camera that
// stands twice stops recording by this time card.
void RemoveCameras(QList<QVariant> &cameras, const QList<QVariant> &removal)
{
    for (const QVariant &gone : removal) {
        const QString name = TextOf(gone, PayloadKey::Name);
        const QString group = TextOf(gone, PayloadKey::GrpID);
        cameras.removeIf([&](const QVariant &camera) {
            return TextOf(camera, PayloadKey::Name) == name &&
                   TextOf(camera, PayloadKey::GrpID) == group;
        });
    }
}

// A camera whose name the time card already holds is not appended again:
// standing twice, it would go on recording after one entry is removed.
void AppendNewCameras(QList<QVariant> &cameras, const QList<QVariant> &additions)
{
    for (const QVariant &added : additions) {
        const QString name = TextOf(added, PayloadKey::Name);
        const bool held = std::any_of(cameras.cbegin(), cameras.cend(), [&](const QVariant &c) {
            return TextOf(c, PayloadKey::Name) == name;
        });
        if (!held)
            cameras.append(added);
    }
}

} // namespace

void PluginRecordingScheduleSettingSrv::HandleUpdateCameraRecordingSchedule(const QVariant &payload,
                                                                            ResponseCallback reply)
{
    const VariantMap map = payload.toMap();
    const QList<QVariant> removals = map.value(PayloadKey::ScheduleRmvCam).toList();
    const QList<QVariant> additions = map.value(PayloadKey::ScheduleAddCam).toList();
    if (removals.isEmpty() && additions.isEmpty()) {
        HdlrReqCallback(true, true, reply);
        return;
    }

    // Every entry is checked before the first step: one that names no time
    // card would otherwise fail the command after earlier entries had changed
    // the server, or read time card 0 and change whatever it holds.
    const auto namesTimecard = [](const QVariant &entry) {
        int unused = 0;
        return ReadTimecardId(entry.toMap().value(PayloadKey::ScheduleID).toString(), &unused);
    };
    if (!std::all_of(removals.cbegin(), removals.cend(), namesTimecard) ||
        !std::all_of(additions.cbegin(), additions.cend(), namesTimecard)) {
        ReplyFailure(reply);
        return;
    }

    if (!RemoveCamerasFromSchedule(payload, reply))
        AddCamerasToSchedule(payload, reply);
}

bool PluginRecordingScheduleSettingSrv::RemoveCamerasFromSchedule(const QVariant &payload,
                                                                  ResponseCallback reply)
{
    VariantMap remaining = payload.toMap();
    QList<QVariant> removals = remaining.value(PayloadKey::ScheduleRmvCam).toList();
    if (removals.isEmpty())
        return false;
    const VariantMap entry = removals.takeFirst().toMap();
    remaining.insert(PayloadKey::ScheduleRmvCam, removals);

    int timecardId = 0;
    ReadTimecardId(entry.value(PayloadKey::ScheduleID).toString(), &timecardId);
    const QList<QVariant> cameras = entry.value(PayloadKey::CamIDList).toList();

    const QSharedPointer<IRecordingSettingControl> control = Control();
    const bool sent =
        control && control->GetScheduleTimecardInfoById(
                       timecardId, ChangeCamerasAfterRead(true, cameras, remaining, reply));
    if (!sent)
        HandleUpdateCameraRecordingScheduleCallback(false, true, remaining, reply);
    return true;
}

bool PluginRecordingScheduleSettingSrv::AddCamerasToSchedule(const QVariant &payload,
                                                             ResponseCallback reply)
{
    VariantMap remaining = payload.toMap();
    QList<QVariant> additions = remaining.value(PayloadKey::ScheduleAddCam).toList();
    if (additions.isEmpty())
        return false;
    const VariantMap entry = additions.takeFirst().toMap();
    remaining.insert(PayloadKey::ScheduleAddCam, additions);

    const QString timecardIdText = entry.value(PayloadKey::ScheduleID).toString();
    const QList<QVariant> cameras = entry.value(PayloadKey::CamIDList).toList();

    const QSharedPointer<IRecordingSettingControl> control = Control();
    bool sent = false;
    if (control &&
        (timecardIdText == DefaultEventEntry || timecardIdText == DefaultContinuousEntry)) {
        // The fixed time card is looked for first: creating it again would
        // leave two time cards of the same fixed name on the server.
        const QString type = timecardIdText == DefaultEventEntry ? ScheduleTypeWord::Event
                                                                 : ScheduleTypeWord::Continous;
        sent = control->GetAllScheduleTimecardInfo(
            Guard(reply, [this, type, cameras, remaining,
                          reply](bool ok, bool, const QList<QVariant> &timecards, const QString &) {
                AddCamerasToFixedTimecard(ok, timecards, type, cameras, remaining, reply);
            }));
    } else if (control) {
        int timecardId = 0;
        ReadTimecardId(timecardIdText, &timecardId);
        sent = control->GetScheduleTimecardInfoById(
            timecardId, ChangeCamerasAfterRead(false, cameras, remaining, reply));
    }
    if (!sent)
        HandleUpdateCameraRecordingScheduleCallback(false, true, remaining, reply);
    return true;
}

void PluginRecordingScheduleSettingSrv::AddCamerasToFixedTimecard(
    bool ok, const QList<QVariant> &timecards, const QString &type, const QList<QVariant> &cameras,
    const VariantMap &remaining, ResponseCallback reply)
{
    const QSharedPointer<IRecordingSettingControl> control = Control();
    if (!ok || !control) {
        HandleUpdateCameraRecordingScheduleCallback(false, true, remaining, reply);
        return;
    }
    const VariantMap summary = GetTimecardInfo(timecards, type);
    bool sent = false;
    if (summary.isEmpty()) {
        QList<QVariant> created;
        AppendNewCameras(created, cameras);
        const ControlResultCallback done = CameraStepCompletion(remaining, reply);
        sent = type == ScheduleTypeWord::Event
                   ? control->CreateDefaultEventTimecard(created, done)
                   : control->CreateDefaultContinuousTimecard(created, done);
    } else {
        int timecardId = 0;
        sent = ReadTimecardId(summary.value(TimecardKey::TmcardID).toString(), &timecardId) &&
               control->GetScheduleTimecardInfoById(
                   timecardId, ChangeCamerasAfterRead(false, cameras, remaining, reply));
    }
    if (!sent)
        HandleUpdateCameraRecordingScheduleCallback(false, true, remaining, reply);
}

TimecardListCallback PluginRecordingScheduleSettingSrv::ChangeCamerasAfterRead(
    bool removing, const QList<QVariant> &cameras, const VariantMap &remaining,
    const ResponseCallback &reply)
{
    return Guard(
        reply, [this, removing, cameras, remaining,
                reply](bool ok, bool, const QList<QVariant> &timecards, const QString &answer) {
            if (!ok || timecards.isEmpty()) {
                HandleUpdateCameraRecordingScheduleCallback(false, true, remaining, reply);
                return;
            }
            QList<QVariant> changed = GetCameraList(timecards.first().toMap());
            // The time-out grows with the cameras the server has to go through:
            // those it holds now for a removal, those it will hold for an addition.
            int timeoutMs = Timeout::PerCamera * static_cast<int>(changed.size());
            if (removing) {
                RemoveCameras(changed, cameras);
            } else {
                AppendNewCameras(changed, cameras);
                timeoutMs = Timeout::PerCamera * static_cast<int>(changed.size());
            }
            const QSharedPointer<IRecordingSettingControl> control = Control();
            const bool sent =
                control && control->UpdateTimecardCameraList(
                               answer, changed, CameraStepCompletion(remaining, reply), timeoutMs);
            if (!sent)
                HandleUpdateCameraRecordingScheduleCallback(false, true, remaining, reply);
        });
}

ControlResultCallback
PluginRecordingScheduleSettingSrv::CameraStepCompletion(const VariantMap &remaining,
                                                        const ResponseCallback &reply)
{
    return Guard(reply, [this, remaining, reply](bool ok, bool flag) {
        HandleUpdateCameraRecordingScheduleCallback(ok, flag, QVariant(remaining), reply);
    });
}

void PluginRecordingScheduleSettingSrv::HandleUpdateCameraRecordingScheduleCallback(
    bool ok, bool flag, const QVariant &remaining, ResponseCallback reply)
{
    if (!ok) {
        TRACE_ERROR("HandleUpdateCameraRecordingScheduleCallback gets a failed response.");
        HdlrReqCallback(false, flag, reply);
        return;
    }
    const VariantMap map = remaining.toMap();
    if (!map.value(PayloadKey::ScheduleRmvCam).toList().isEmpty() ||
        !map.value(PayloadKey::ScheduleAddCam).toList().isEmpty()) {
        HandleUpdateCameraRecordingSchedule(remaining, reply);
        return;
    }
    HdlrReqCallback(true, flag, reply);
}

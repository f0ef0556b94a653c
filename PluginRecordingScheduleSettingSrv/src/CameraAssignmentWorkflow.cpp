// "UpdateCamRecSchedule": moves cameras between time cards, one entry at a
// time, removals first. What is left to do travels in each step's completion
// as a copy of the payload without the finished entries; the chain ends in
// exactly one reply, after the last entry or at the first failure. Steps that
// succeeded before a failure stay done.

#include "PluginRecordingScheduleSettingSrv.h"

#include "CameraList.h"
#include "ClientInput.h"
#include "FixedSchedule.h"
#include "RecordingScheduleSettingConstants.h"
#include "TraceLog.h"

#include <algorithm>

using namespace PluginRecordingScheduleSettingCommon;

namespace {

// The first entry of the payload's list under key, taken out: the payload
// left describes what remains to do.
QVariantMap takeFirstEntry(QVariantMap &remaining, const QString &key)
{
    QList<QVariant> entries = remaining.value(key).toList();
    const QVariantMap entry = entries.takeFirst().toMap();
    remaining.insert(key, entries);
    return entry;
}

// The read completion of one entry: the time card's cameras changed, then
// written back with a time-out that grows with the cameras the server goes
// through. Every failure ends the step through step(false, true).
TimecardListCallback changeAfterRead(const LifetimeGuard &guard, const ResponseCallback &reply,
                                     ControlResultCallback step, bool removing,
                                     const QList<QVariant> &cameras)
{
    // Runs only while the plug-in lives, so guard is still there.
    return guard.bind(reply, [&guard, step, removing, cameras](bool ok, bool,
                                                               const QList<QVariant> &timecards,
                                                               const QString &answer) {
        if (!ok || timecards.isEmpty())
            return step(false, true);
        CameraList changed = CameraList::onTimecard(timecards.first().toMap());
        // Those it holds now for a removal, those it will hold for an addition.
        const auto held = changed.entries().size();
        if (removing)
            changed.remove(cameras);
        else
            changed.merge(cameras);
        const int timeoutMs =
            Timeout::PerCamera * static_cast<int>(removing ? held : changed.entries().size());
        const QSharedPointer<IRecordingSettingControl> control = guard.control();
        if (!control ||
            !control->UpdateTimecardCameraList(answer, changed.entries(), step, timeoutMs))
            step(false, true);
    });
}

} // namespace

void PluginRecordingScheduleSettingSrv::HandleUpdateCameraRecordingSchedule(const QVariant &payload,
                                                                            ResponseCallback reply)
{
    const QVariantMap map = payload.toMap();
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
        return ClientInput::timecardId(entry.toMap().value(PayloadKey::ScheduleID).toString())
            .has_value();
    };
    if (!std::all_of(removals.cbegin(), removals.cend(), namesTimecard) ||
        !std::all_of(additions.cbegin(), additions.cend(), namesTimecard)) {
        replyFailure(reply);
        return;
    }

    if (!RemoveCamerasFromSchedule(payload, reply))
        AddCamerasToSchedule(payload, reply);
}

bool PluginRecordingScheduleSettingSrv::RemoveCamerasFromSchedule(const QVariant &payload,
                                                                  ResponseCallback reply)
{
    QVariantMap remaining = payload.toMap();
    if (remaining.value(PayloadKey::ScheduleRmvCam).toList().isEmpty())
        return false;
    const QVariantMap entry = takeFirstEntry(remaining, PayloadKey::ScheduleRmvCam);
    const ControlResultCallback step =
        m_lifetime.bind(reply, [this, remaining, reply](bool ok, bool flag) {
            HandleUpdateCameraRecordingScheduleCallback(ok, flag, remaining, reply);
        });

    const int timecardId =
        ClientInput::timecardId(entry.value(PayloadKey::ScheduleID).toString()).value_or(0);
    const QSharedPointer<IRecordingSettingControl> control = m_lifetime.control();
    if (!control || !control->GetScheduleTimecardInfoById(
                        timecardId, changeAfterRead(m_lifetime, reply, step, true,
                                                    entry.value(PayloadKey::CamIDList).toList())))
        step(false, true);
    return true;
}

bool PluginRecordingScheduleSettingSrv::AddCamerasToSchedule(const QVariant &payload,
                                                             ResponseCallback reply)
{
    QVariantMap remaining = payload.toMap();
    if (remaining.value(PayloadKey::ScheduleAddCam).toList().isEmpty())
        return false;
    const QVariantMap entry = takeFirstEntry(remaining, PayloadKey::ScheduleAddCam);
    const ControlResultCallback step =
        m_lifetime.bind(reply, [this, remaining, reply](bool ok, bool flag) {
            HandleUpdateCameraRecordingScheduleCallback(ok, flag, remaining, reply);
        });

    const QString timecardIdText = entry.value(PayloadKey::ScheduleID).toString();
    const QList<QVariant> cameras = entry.value(PayloadKey::CamIDList).toList();
    const FixedSchedule *fixed = FixedSchedule::byAdditionEntry(timecardIdText);
    // A fixed time card is looked for first: creating it again would leave
    // two time cards of the same fixed name on the server.
    const auto addToFixed = [this, fixed, cameras, reply, step](
                                bool ok, bool, const QList<QVariant> &timecards, const QString &) {
        const QSharedPointer<IRecordingSettingControl> control = m_lifetime.control();
        if (!ok || !control)
            return step(false, true);
        const QVariantMap summary = fixed->summaryIn(*control, timecards);
        const std::optional<int> timecardId =
            ClientInput::timecardId(summary.value(TimecardKey::TmcardID).toString());
        const bool sent =
            summary.isEmpty()
                ? fixed->create(*control, QString(), cameras, step)
                : timecardId &&
                      control->GetScheduleTimecardInfoById(
                          *timecardId, changeAfterRead(m_lifetime, reply, step, false, cameras));
        if (!sent)
            step(false, true);
    };

    const QSharedPointer<IRecordingSettingControl> control = m_lifetime.control();
    const bool sent =
        control && (fixed ? control->GetAllScheduleTimecardInfo(m_lifetime.bind(reply, addToFixed))
                          : control->GetScheduleTimecardInfoById(
                                ClientInput::timecardId(timecardIdText).value_or(0),
                                changeAfterRead(m_lifetime, reply, step, false, cameras)));
    if (!sent)
        step(false, true);
    return true;
}

void PluginRecordingScheduleSettingSrv::HandleUpdateCameraRecordingScheduleCallback(
    bool ok, bool flag, const QVariant &remaining, ResponseCallback reply)
{
    if (!ok) {
        TRACE_ERROR("HandleUpdateCameraRecordingScheduleCallback gets a failed response.");
        HdlrReqCallback(false, flag, reply);
        return;
    }
    const QVariantMap map = remaining.toMap();
    if (!map.value(PayloadKey::ScheduleRmvCam).toList().isEmpty() ||
        !map.value(PayloadKey::ScheduleAddCam).toList().isEmpty()) {
        HandleUpdateCameraRecordingSchedule(remaining, reply);
        return;
    }
    HdlrReqCallback(true, flag, reply);
}

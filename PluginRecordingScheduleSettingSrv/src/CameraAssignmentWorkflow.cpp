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

// One entry of the payload's list under key, taken out, and the step
// completion S that carries on through carryOn with what remains to do.
struct Step
{
    QVariantMap entry;
    ControlResultCallback done;
};

template <typename Plugin, typename CarryOn>
std::optional<Step> takeStep(Plugin *plugin, CarryOn carryOn, const LifetimeGuard &guard,
                             const QVariant &payload, const QString &key,
                             const ResponseCallback &reply)
{
    QVariantMap remaining = payload.toMap();
    QList<QVariant> entries = remaining.value(key).toList();
    if (entries.isEmpty())
        return std::nullopt;
    const QVariantMap entry = entries.takeFirst().toMap();
    remaining.insert(key, entries);
    return Step{entry, guard.bind(reply, [plugin, carryOn, remaining, reply](bool ok, bool flag) {
                    (plugin->*carryOn)(ok, flag, QVariant(remaining), reply);
                })};
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
        const int timeoutMs = Timeout::forCameras(removing ? held : changed.entries().size());
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
    const std::optional<Step> step = takeStep(
        this, &PluginRecordingScheduleSettingSrv::HandleUpdateCameraRecordingScheduleCallback,
        m_lifetime, payload, PayloadKey::ScheduleRmvCam, reply);
    if (!step)
        return false;
    const int timecardId =
        ClientInput::timecardId(step->entry.value(PayloadKey::ScheduleID).toString()).value_or(0);
    const QSharedPointer<IRecordingSettingControl> control = m_lifetime.control();
    if (!control ||
        !control->GetScheduleTimecardInfoById(
            timecardId, changeAfterRead(m_lifetime, reply, step->done, true,
                                        step->entry.value(PayloadKey::CamIDList).toList())))
        step->done(false, true);
    return true;
}

bool PluginRecordingScheduleSettingSrv::AddCamerasToSchedule(const QVariant &payload,
                                                             ResponseCallback reply)
{
    const std::optional<Step> step = takeStep(
        this, &PluginRecordingScheduleSettingSrv::HandleUpdateCameraRecordingScheduleCallback,
        m_lifetime, payload, PayloadKey::ScheduleAddCam, reply);
    if (!step)
        return false;
    const QString timecardIdText = step->entry.value(PayloadKey::ScheduleID).toString();
    const QList<QVariant> cameras = step->entry.value(PayloadKey::CamIDList).toList();
    const FixedSchedule *fixed = FixedSchedule::byAdditionEntry(timecardIdText);
    // A fixed time card is looked for first: creating it again would leave
    // two time cards of the same fixed name on the server.
    const auto addToFixed = [this, fixed, cameras, reply, done = step->done](
                                bool ok, bool, const QList<QVariant> &timecards, const QString &) {
        const QSharedPointer<IRecordingSettingControl> control = m_lifetime.control();
        if (!ok || !control)
            return done(false, true);
        const QVariantMap summary = fixed->summaryIn(*control, timecards);
        const std::optional<int> timecardId =
            ClientInput::timecardId(summary.value(TimecardKey::TmcardID).toString());
        const bool sent =
            summary.isEmpty()
                ? fixed->put(*control, summary, QString(), cameras, done)
                : timecardId &&
                      control->GetScheduleTimecardInfoById(
                          *timecardId, changeAfterRead(m_lifetime, reply, done, false, cameras));
        if (!sent)
            done(false, true);
    };

    const QSharedPointer<IRecordingSettingControl> control = m_lifetime.control();
    const bool sent =
        control && (fixed ? control->GetAllScheduleTimecardInfo(m_lifetime.bind(reply, addToFixed))
                          : control->GetScheduleTimecardInfoById(
                                ClientInput::timecardId(timecardIdText).value_or(0),
                                changeAfterRead(m_lifetime, reply, step->done, false, cameras)));
    if (!sent)
        step->done(false, true);
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

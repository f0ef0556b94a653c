// "GetScheduleRecInfo", "GetCurrentScheduleInfo" and "GetAllScheduleRecInfo":
// each reads all time cards afresh and answers from the control's
// completion, on the tunnel's thread, exactly once.

#include "PluginRecordingScheduleSettingSrv.h"

#include "RecordingScheduleSettingConstants.h"
#include "TimecardReadings.h"
#include "TraceLog.h"

using namespace PluginRecordingScheduleSettingCommon;

namespace {

void replyFetchFailed(bool flag, const ResponseCallback &reply)
{
    TRACE_ERROR("Fail to get all schedule time card.");
    if (reply)
        reply(flag, ResultCode::Failure, QString(), QVariant());
}

} // namespace

void PluginRecordingScheduleSettingSrv::ParseScheduleTimecardAndRequestCallback(
    bool ok, bool flag, const QList<QVariant> &timecards, ResponseCallback reply)
{
    if (!ok) {
        replyFetchFailed(flag, reply);
        return;
    }
    const VariantMap summary = ParseScheduleTimecard(
        timecards, TimecardIDThatHasCameraListExceptDefaultSchedule(timecards));
    if (reply)
        reply(true, ResultCode::Success, QString(), summary);
}

void PluginRecordingScheduleSettingSrv::ParseCurrentScheduleTimecardAndRequestCallback(
    bool ok, bool flag, const QList<QVariant> &timecards, ResponseCallback reply)
{
    if (!ok) {
        replyFetchFailed(flag, reply);
        return;
    }
    const VariantMap summary =
        ParseScheduleTimecard(timecards, TimecardIDThatHasCameraList(timecards));
    if (reply)
        reply(true, ResultCode::Success, QString(), summary);
}

void PluginRecordingScheduleSettingSrv::ParseAllScheduleTimecardAndRequestCallback(
    bool ok, bool flag, const QList<QVariant> &timecards, ResponseCallback reply)
{
    using namespace TimecardReadings;
    if (!ok) {
        replyFetchFailed(flag, reply);
        return;
    }
    QList<QVariant> schedules;
    schedules.reserve(timecards.size());
    for (const QVariant &entry : timecards) {
        const VariantMap timecard = entry.toMap();
        schedules.append(VariantMap{
            {PayloadKey::ScheduleName, text(timecard.value(TimecardKey::Name))},
            {PayloadKey::TimeCardID, text(timecard.value(TimecardKey::TmcardID))},
            {PayloadKey::Revision, text(timecard.value(TimecardKey::Revision))},
            {PayloadKey::CustomizeContent, GetCustomizeSchedule(timecard)},
            {PayloadKey::CameraList, GetCameraList(timecard)},
        });
    }
    if (reply)
        reply(true, ResultCode::Success, QString(), schedules);
}

void PluginRecordingScheduleSettingSrv::getAllScheduleRecInfo(ResponseCallback reply)
{
    const QSharedPointer<IRecordingSettingControl> control = Control();
    // Refused or impossible read: answered at once, or the client would wait
    // for an answer that never comes.
    if (!control || !control->GetAllScheduleTimecardInfo(Guard(
                        reply, [this, reply](bool ok, bool flag, const QList<QVariant> &timecards,
                                             const QString &) {
                            ParseAllScheduleTimecardAndRequestCallback(ok, flag, timecards, reply);
                        })))
        ReplyFailure(reply);
}

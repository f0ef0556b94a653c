// "GetScheduleRecInfo", "GetCurrentScheduleInfo" and "GetAllScheduleRecInfo":
// each reads all time cards afresh and answers from the control's
// completion, on the tunnel's thread, exactly once.

#include "PluginRecordingScheduleSettingSrv.h"

#include "RecordingScheduleSettingConstants.h"
#include "TimecardReadings.h"
#include "TraceLog.h"

using namespace PluginRecordingScheduleSettingCommon;
using TimecardReadings::text;

namespace {

// A query's one reply: the fetch's failure with its flag, or what answer()
// makes of the time cards.
template <typename Answer>
void replyQuery(bool ok, bool flag, const ResponseCallback &reply, Answer answer)
{
    if (!ok) {
        TRACE_ERROR("Fail to get all schedule time card.");
        if (reply)
            reply(flag, ResultCode::Failure, QString(), QVariant());
        return;
    }
    const QVariant data = answer();
    if (reply)
        reply(true, ResultCode::Success, QString(), data);
}

} // namespace

void PluginRecordingScheduleSettingSrv::ParseScheduleTimecardAndRequestCallback(
    bool ok, bool flag, const QList<QVariant> &timecards, ResponseCallback reply)
{
    replyQuery(ok, flag, reply, [&] {
        return ParseScheduleTimecard(timecards,
                                     TimecardIDThatHasCameraListExceptDefaultSchedule(timecards));
    });
}

void PluginRecordingScheduleSettingSrv::ParseCurrentScheduleTimecardAndRequestCallback(
    bool ok, bool flag, const QList<QVariant> &timecards, ResponseCallback reply)
{
    replyQuery(ok, flag, reply, [&] {
        return ParseScheduleTimecard(timecards, TimecardIDThatHasCameraList(timecards));
    });
}

void PluginRecordingScheduleSettingSrv::ParseAllScheduleTimecardAndRequestCallback(
    bool ok, bool flag, const QList<QVariant> &timecards, ResponseCallback reply)
{
    replyQuery(ok, flag, reply, [&] {
        QList<QVariant> schedules;
        schedules.reserve(timecards.size());
        for (const QVariant &entry : timecards) {
            const QVariantMap timecard = entry.toMap();
            schedules.append(QVariantMap{
                {PayloadKey::ScheduleName, text(timecard.value(TimecardKey::Name))},
                {PayloadKey::TimeCardID, text(timecard.value(TimecardKey::TmcardID))},
                {PayloadKey::Revision, text(timecard.value(TimecardKey::Revision))},
                {PayloadKey::CustomizeContent, GetCustomizeSchedule(timecard)},
                {PayloadKey::CameraList, GetCameraList(timecard)},
            });
        }
        return schedules;
    });
}

void PluginRecordingScheduleSettingSrv::getAllScheduleRecInfo(ResponseCallback reply)
{
    const QSharedPointer<IRecordingSettingControl> control = m_lifetime.control();
    // Refused or impossible read: answered at once, or the client would wait
    // for an answer that never comes.
    if (!control || !control->GetAllScheduleTimecardInfo(m_lifetime.bind(
                        reply, [this, reply](bool ok, bool flag, const QList<QVariant> &timecards,
                                             const QString &) {
                            ParseAllScheduleTimecardAndRequestCallback(ok, flag, timecards, reply);
                        })))
        replyFailure(reply);
}

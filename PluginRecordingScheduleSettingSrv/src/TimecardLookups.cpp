// Which time cards have cameras, and which cameras one time card has. A time
// card has cameras when its entry has the key "CamList", whatever it holds.

#include "PluginRecordingScheduleSettingSrv.h"

#include "CameraList.h"
#include "RecordingScheduleSettingConstants.h"
#include "TimecardReadings.h"

using namespace PluginRecordingScheduleSettingCommon;
using namespace TimecardReadings;

namespace {

// The time card that the server creates itself and that holds every camera
// no other time card holds.
constexpr int DefaultTimecardId = 1;

template <typename Keep>
QList<int> timecardsWithCameras(const QList<QVariant> &timecards, Keep keep)
{
    QList<int> ids;
    for (const QVariant &entry : timecards) {
        const QVariantMap timecard = entry.toMap();
        if (!timecard.contains(TimecardKey::CamList))
            continue;
        const int id = integer(timecard.value(TimecardKey::TmcardID));
        if (keep(id))
            ids.append(id);
    }
    return ids;
}

} // namespace

QList<int> PluginRecordingScheduleSettingSrv::TimecardIDThatHasCameraList(
    const QList<QVariant> &timecards) const
{
    return timecardsWithCameras(timecards, [](int) { return true; });
}

QList<int> PluginRecordingScheduleSettingSrv::TimecardIDThatHasCameraListExceptDefaultSchedule(
    const QList<QVariant> &timecards) const
{
    return timecardsWithCameras(timecards, [](int id) { return id != DefaultTimecardId; });
}

QList<int> PluginRecordingScheduleSettingSrv::TimecardIDThatNeedsToRemoveCameraList(
    const QList<QVariant> &timecards) const
{
    const QList<int> ids = TimecardIDThatHasCameraList(timecards);
    return ids.isEmpty() ? QList<int>{DefaultTimecardId} : ids;
}

QList<QVariant> PluginRecordingScheduleSettingSrv::GetCameraList(const QVariantMap &timecard) const
{
    return CameraList::onTimecard(timecard).entries();
}

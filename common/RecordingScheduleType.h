#pragma once

#include <QtGlobal>

namespace PluginRecordingScheduleSettingCommon {

// The kind of schedule in force for a set of cameras; stored and streamed as
// a 32-bit int.
enum RecordingScheduleType : qint32 {
    DefaultContinuous = 0,
    DefaultEvent = 1,
    Customized = 2,
    // 3 is not produced by this plug-in.
    Other = 4,
    NoSchedule = 5,
};

} // namespace PluginRecordingScheduleSettingCommon

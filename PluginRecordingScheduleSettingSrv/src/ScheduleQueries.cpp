// Placeholder until the schedule queries land.
#include "PluginRecordingScheduleSettingSrv.h"

void PluginRecordingScheduleSettingSrv::ParseScheduleTimecardAndRequestCallback(bool, bool, const QList<QVariant> &, ResponseCallback reply) { ReplyFailure(reply); }
void PluginRecordingScheduleSettingSrv::ParseCurrentScheduleTimecardAndRequestCallback(bool, bool, const QList<QVariant> &, ResponseCallback reply) { ReplyFailure(reply); }
void PluginRecordingScheduleSettingSrv::ParseAllScheduleTimecardAndRequestCallback(bool, bool, const QList<QVariant> &, ResponseCallback reply) { ReplyFailure(reply); }
void PluginRecordingScheduleSettingSrv::getAllScheduleRecInfo(ResponseCallback reply) { ReplyFailure(reply); }

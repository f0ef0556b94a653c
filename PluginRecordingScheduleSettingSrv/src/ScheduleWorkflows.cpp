// Placeholder until the workflows land.
#include "PluginRecordingScheduleSettingSrv.h"

void PluginRecordingScheduleSettingSrv::HandleAddSchedule(const QVariant &, ResponseCallback reply) { ReplyFailure(reply); }
void PluginRecordingScheduleSettingSrv::HandleUpdateSchedule(const QVariant &, ResponseCallback reply) { ReplyFailure(reply); }
void PluginRecordingScheduleSettingSrv::HandleDeleteSchedule(bool, bool, const QList<QVariant> &, QString, ResponseCallback reply) { ReplyFailure(reply); }
void PluginRecordingScheduleSettingSrv::HdlrAddScheduleCallback(bool, bool, const QString &, ResponseCallback reply) { ReplyFailure(reply); }
void PluginRecordingScheduleSettingSrv::HdlrReqCallback(bool, bool, ResponseCallback reply) { ReplyFailure(reply); }
void PluginRecordingScheduleSettingSrv::HandleUpdateCameraRecordingSchedule(const QVariant &, ResponseCallback reply) { ReplyFailure(reply); }
bool PluginRecordingScheduleSettingSrv::RemoveCamerasFromSchedule(const QVariant &, ResponseCallback) { return false; }
bool PluginRecordingScheduleSettingSrv::AddCamerasToSchedule(const QVariant &, ResponseCallback) { return false; }
void PluginRecordingScheduleSettingSrv::HandleUpdateCameraRecordingScheduleCallback(bool, bool, const QVariant &, ResponseCallback reply) { ReplyFailure(reply); }
void PluginRecordingScheduleSettingSrv::UpdateTimecardCamList(bool, bool, const QList<QVariant> &, const QString &, const QString &, const QList<QVariant> &, ResponseCallback reply) { ReplyFailure(reply); }
void PluginRecordingScheduleSettingSrv::HandleGetAllTimecardRes(bool, bool, const QList<QVariant> &, const QString &, const QString &, const QString &, const QList<QVariant> &, ResponseCallback reply) { ReplyFailure(reply); }
QMap<QString, QVariant> PluginRecordingScheduleSettingSrv::GetTimecardInfo(const QList<QVariant> &, const QString &) { return {}; }
void PluginRecordingScheduleSettingSrv::HandleRemoveTimecardCamListRes(bool, bool, QString, const QString &, QList<QVariant>, QList<int>, ResponseCallback reply) { ReplyFailure(reply); }

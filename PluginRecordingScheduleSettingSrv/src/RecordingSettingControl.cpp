// Placeholder: every operation refuses until the control lands.
#include "RecordingSettingControl.h"

RecordingSettingControl::RecordingSettingControl(IKoltTunnelClient *tunnel) : m_tunnel(tunnel) {}
RecordingSettingControl::RecordingSettingControl(const RecordingSettingControl &other)
    : IRecordingSettingControl(other), QEnableSharedFromThis<RecordingSettingControl>(other),
      m_tunnel(other.m_tunnel), m_clientId(other.m_clientId.load())
{
}
RecordingSettingControl &RecordingSettingControl::operator=(const RecordingSettingControl &other)
{
    m_tunnel = other.m_tunnel;
    m_clientId.store(other.m_clientId.load());
    return *this;
}
RecordingSettingControl::~RecordingSettingControl() = default;
bool RecordingSettingControl::GetAllScheduleTimecardInfo(TimecardListCallback) { return false; }
bool RecordingSettingControl::GetScheduleTimecardInfoById(int, TimecardListCallback) { return false; }
bool RecordingSettingControl::RemoveTimecardCameraList(int, const QList<QVariant> &, ControlResultCallback) { return false; }
bool RecordingSettingControl::CreateDefaultContinuousTimecard(const QList<QVariant> &, ControlResultCallback) { return false; }
bool RecordingSettingControl::UpdateDefaultContinuousTimecard(const QMap<QString, QVariant> &, const QList<QVariant> &, ControlResultCallback) { return false; }
bool RecordingSettingControl::CreateDefaultEventTimecard(const QList<QVariant> &, ControlResultCallback) { return false; }
bool RecordingSettingControl::UpdateDefaultEventTimecard(const QMap<QString, QVariant> &, const QList<QVariant> &, ControlResultCallback) { return false; }
bool RecordingSettingControl::CreateCustomizeTimecard(const QString &, const QList<QVariant> &, ControlResultCallback) { return false; }
bool RecordingSettingControl::UpdateCustomizeTimecard(const QMap<QString, QVariant> &, const QString &, const QList<QVariant> &, ControlResultCallback) { return false; }
bool RecordingSettingControl::AddSchedule(const QString &, const QString &, TimecardIdCallback) { return false; }
bool RecordingSettingControl::UpdateSchedule(const QString &, const QString &, const QString &, const QString &, const QList<QVariant> &, ControlResultCallback) { return false; }
bool RecordingSettingControl::DeleteSchedule(const QMap<QString, QVariant> &, ControlResultCallback) { return false; }
bool RecordingSettingControl::UpdateTimecardCameraList(const QString &, const QList<QVariant> &, ControlResultCallback, int) { return false; }
QMap<QString, QVariant> RecordingSettingControl::GetDefaultContinousTimecardInfo(const QList<QVariant> &) { return {}; }
QMap<QString, QVariant> RecordingSettingControl::GetDefaultEventTimecardInfo(const QList<QVariant> &) { return {}; }
QMap<QString, QVariant> RecordingSettingControl::GetCustomizeTimecardInfo(const QList<QVariant> &) { return {}; }
void RecordingSettingControl::SetClientID(void *const clientId) { m_clientId.store(clientId); }

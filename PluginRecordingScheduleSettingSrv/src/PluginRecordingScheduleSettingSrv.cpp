#include "PluginRecordingScheduleSettingSrv.h"

#include "IFrameworkTools.h"
#include "RecordingSettingControl.h"
#include "TraceLog.h"

#include <new>

PluginRecordingScheduleSettingSrv::PluginRecordingScheduleSettingSrv() = default;

PluginRecordingScheduleSettingSrv::~PluginRecordingScheduleSettingSrv()
{
    {
        TRACE_SCOPE("PluginRecordingScheduleSettingSrv::~PluginRecordingScheduleSettingSrv");
        // Waits for the completions running now on other threads; later ones
        // answer on their own without touching this object.
        m_lifetime.end();
    }
    // The control is released after the Leave record, with the members.
}

bool PluginRecordingScheduleSettingSrv::InitialPluginBase(IFrameworkTools *tools)
{
    TRACE_SCOPE("PluginRecordingScheduleSettingSrv::InitialPluginBase");
    IKoltTunnelClient *tunnel = tools ? tools->GetTunnelClient() : nullptr;
    if (!tunnel) {
        TRACE_ERROR("%s, Tunnel client get null.",
                    "PluginRecordingScheduleSettingSrv::InitialPluginBase");
        return false;
    }
    QSharedPointer<IRecordingSettingControl> control;
    try {
        control = QSharedPointer<RecordingSettingControl>::create(tunnel);
    } catch (const std::bad_alloc &) {
        TRACE_ERROR("%s, Create recording setting control failed.",
                    "PluginRecordingScheduleSettingSrv::InitialPluginBase");
        return false;
    }
    SetRecordingSettingControl(std::move(control));
    return true;
}

void PluginRecordingScheduleSettingSrv::SetRecordingSettingControl(
    QSharedPointer<IRecordingSettingControl> control)
{
    m_lifetime.setControl(std::move(control));
}

void PluginRecordingScheduleSettingSrv::RequestBlock(const QString &, const QVariant &,
                                                     const RequestSenderInfo &, IResponser &)
{
    TRACE_SCOPE("PluginRecordingScheduleSettingSrv::RequestBlock");
}

void PluginRecordingScheduleSettingSrv::SubscribeEventBlock(const QString &, const QString &,
                                                            const QVariant &,
                                                            const RequestSenderInfo &, IResponser &)
{
    TRACE_SCOPE("PluginRecordingScheduleSettingSrv::SubscribeEventBlock");
}

void PluginRecordingScheduleSettingSrv::UnsubscribeEventBlock(const QString &, const QVariant &,
                                                              IResponser &)
{
    TRACE_SCOPE("PluginRecordingScheduleSettingSrv::UnsubscribeEventBlock");
}

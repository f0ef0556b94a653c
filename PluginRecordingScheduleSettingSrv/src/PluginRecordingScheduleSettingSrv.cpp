#include "PluginRecordingScheduleSettingSrv.h"

#include "IFrameworkTools.h"
#include "RecordingScheduleSettingConstants.h"
#include "RecordingSettingControl.h"
#include "TraceLog.h"

#include <new>

using namespace PluginRecordingScheduleSettingCommon;

PluginRecordingScheduleSettingSrv::PluginRecordingScheduleSettingSrv()
    : m_lifetime(std::make_shared<PluginLifetime>())
{
}

PluginRecordingScheduleSettingSrv::~PluginRecordingScheduleSettingSrv()
{
    {
        TRACE_SCOPE("PluginRecordingScheduleSettingSrv::~PluginRecordingScheduleSettingSrv");
        // Waits for a completion that is running now; later ones answer on
        // their own without touching this object.
        m_lifetime->end();
    }
    // The control is released after the Leave record, with the members.
}

bool PluginRecordingScheduleSettingSrv::InitialPluginBase(IFrameworkTools *tools)
{
    TRACE_SCOPE("PluginRecordingScheduleSettingSrv::InitialPluginBase");
    IKoltTunnelClient *tunnel = tools ? tools->GetTunnelClient() : nullptr;
    if (!tunnel) {
        TRACE_ERROR("%s, Tunnel client get null.", "PluginRecordingScheduleSettingSrv::InitialPluginBase");
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
    QSharedPointer<IRecordingSettingControl> previous;
    m_lifetime->runIfAlive([&] {
        previous = std::move(m_control);
        m_control = std::move(control);
    });
    // The previous control goes outside the lock; answers in flight keep it
    // alive until they have been handled.
}

void PluginRecordingScheduleSettingSrv::RequestBlock(const QString &, const QVariant &,
                                                     const RequestSenderInfo &, IResponser &)
{
    TRACE_SCOPE("PluginRecordingScheduleSettingSrv::RequestBlock");
}

void PluginRecordingScheduleSettingSrv::SubscribeEventBlock(const QString &, const QString &,
                                                            const QVariant &,
                                                            const RequestSenderInfo &,
                                                            IResponser &)
{
    TRACE_SCOPE("PluginRecordingScheduleSettingSrv::SubscribeEventBlock");
}

void PluginRecordingScheduleSettingSrv::UnsubscribeEventBlock(const QString &, const QVariant &,
                                                              IResponser &)
{
    TRACE_SCOPE("PluginRecordingScheduleSettingSrv::UnsubscribeEventBlock");
}

QSharedPointer<IRecordingSettingControl> PluginRecordingScheduleSettingSrv::Control()
{
    QSharedPointer<IRecordingSettingControl> control;
    m_lifetime->runIfAlive([&] { control = m_control; });
    return control;
}

void PluginRecordingScheduleSettingSrv::ReplyFailure(const ResponseCallback &reply)
{
    if (reply)
        reply(true, ResultCode::Failure, QString(), QVariant());
}

namespace {

// Wraps fn so that it runs only while the plug-in lives; a late call answers
// the request itself, so that it still gets its one reply.
template <typename... Values>
std::function<void(Values...)> guarded(const std::shared_ptr<PluginLifetime> &lifetime,
                                       const ResponseCallback &reply,
                                       std::function<void(Values...)> fn)
{
    return [lifetime, reply, fn = std::move(fn)](Values... values) {
        if (!lifetime->runIfAlive([&] { fn(values...); }) && reply)
            reply(true, ResultCode::Failure, QString(), QVariant());
    };
}

} // namespace

ControlResultCallback PluginRecordingScheduleSettingSrv::Guard(
    const ResponseCallback &reply, std::function<void(bool, bool)> fn) const
{
    return guarded(m_lifetime, reply, std::move(fn));
}

TimecardListCallback PluginRecordingScheduleSettingSrv::Guard(
    const ResponseCallback &reply,
    std::function<void(bool, bool, const QList<QVariant> &, const QString &)> fn) const
{
    return guarded(m_lifetime, reply, std::move(fn));
}

TimecardIdCallback PluginRecordingScheduleSettingSrv::Guard(
    const ResponseCallback &reply, std::function<void(bool, bool, const QString &)> fn) const
{
    return guarded(m_lifetime, reply, std::move(fn));
}

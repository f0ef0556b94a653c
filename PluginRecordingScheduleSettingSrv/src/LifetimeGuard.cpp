#include "LifetimeGuard.h"

#include "RecordingScheduleSettingConstants.h"

using namespace PluginRecordingScheduleSettingCommon;

void replyFailure(const ResponseCallback &reply)
{
    if (reply)
        reply(true, ResultCode::Failure, QString(), QVariant());
}

QSharedPointer<IRecordingSettingControl> LifetimeGuard::control() const
{
    QSharedPointer<IRecordingSettingControl> control;
    m_lifetime->lockedIfAlive([&] { control = m_control; });
    return control;
}

void LifetimeGuard::setControl(QSharedPointer<IRecordingSettingControl> control)
{
    QSharedPointer<IRecordingSettingControl> previous;
    m_lifetime->lockedIfAlive([&] {
        previous = std::move(m_control);
        m_control = std::move(control);
    });
    // The previous control goes outside the lock; answers in flight keep it
    // alive until they have been handled.
}

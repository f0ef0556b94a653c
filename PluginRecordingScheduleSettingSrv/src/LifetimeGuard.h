#pragma once

#include "IRecordingSettingControl.h"
#include "PluginLifetime.h"
#include "ResponseCallback.h"

#include <QSharedPointer>

#include <memory>

// Answers (true, "-1", "", invalid): the reply of a request that the plug-in
// ends on its own.
void replyFailure(const ResponseCallback &reply);

// A plug-in object's control and the completions bound to the object's
// lifetime. Completions arrive on the tunnels' threads and may outlive the
// object: while it lives they run side by side, none under a lock, and its
// destructor waits for them; afterwards they answer their request with
// (true, "-1") themselves and touch nothing else, so every request still gets
// exactly one reply.
class LifetimeGuard
{
public:
    LifetimeGuard() : m_lifetime(std::make_shared<PluginLifetime>()) {}

    // The control as it is now (null when there is none). Read and replaced
    // under the lock, called outside it.
    QSharedPointer<IRecordingSettingControl> control() const;
    void setControl(QSharedPointer<IRecordingSettingControl> control);
    // Called once by the object's destructor; waits for the completions
    // running on other threads.
    void end() { m_lifetime->end(); }

    // fn as a completion of any of the control's kinds, bound to the object's
    // lifetime; reply is what a late call answers.
    template <typename Fn> auto bind(ResponseCallback reply, Fn fn) const
    {
        return [lifetime = m_lifetime, reply = std::move(reply),
                fn = std::move(fn)](const auto &...values) {
            if (!lifetime->runIfAlive([&] { fn(values...); }))
                replyFailure(reply);
        };
    }

private:
    std::shared_ptr<PluginLifetime> m_lifetime;
    QSharedPointer<IRecordingSettingControl> m_control;
};

#pragma once

#include <mutex>

// Shared by a plug-in object and every completion bound to it. Completions
// arrive on the tunnel's thread and may outlive the object: each one runs
// under this lock and only while the object is alive. The lock is recursive
// because a tunnel may answer inside the send that a completion makes.
class PluginLifetime
{
public:
    // Runs fn under the lock if the object is still alive; false otherwise.
    template <typename Fn>
    bool runIfAlive(Fn &&fn)
    {
        const std::lock_guard<std::recursive_mutex> lock(m_mutex);
        if (!m_alive)
            return false;
        fn();
        return true;
    }

    // Called once by the object's destructor; waits for a running completion.
    void end()
    {
        const std::lock_guard<std::recursive_mutex> lock(m_mutex);
        m_alive = false;
    }

private:
    std::recursive_mutex m_mutex;
    bool m_alive = true;
};

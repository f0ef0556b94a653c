#pragma once

#include <algorithm>
#include <condition_variable>
#include <mutex>
#include <thread>
#include <vector>

// Shared by a plug-in object and every completion bound to it. Completions
// arrive on the tunnels' threads and may outlive the object. The lock is held
// only to look at the object's state and to count a completion in and out,
// never while a completion runs: a completion calls out into the host's reply
// and into the tunnel, and either may call back into the plug-in from this
// thread or wait for another that does. Held across those, it would hand
// answers out one at a time and deadlock such hosts.
class PluginLifetime
{
public:
    // Runs fn if the object is still alive, counted in for its whole run so
    // that the destructor waits for it; false (fn not run) otherwise.
    template <typename Fn> bool runIfAlive(Fn &&fn)
    {
        const std::thread::id self = std::this_thread::get_id();
        {
            const std::lock_guard<std::mutex> lock(m_mutex);
            if (!m_alive)
                return false;
            m_running.push_back(self);
        }
        // Counted out however fn ends: a host's reply may throw.
        const Leaving leaving{*this, self};
        fn();
        return true;
    }

    // Runs fn under the lock if the object is still alive: a short look at
    // what the object shares with its completions. fn must not call out.
    template <typename Fn> bool lockedIfAlive(Fn &&fn)
    {
        const std::lock_guard<std::mutex> lock(m_mutex);
        if (!m_alive)
            return false;
        fn();
        return true;
    }

    // Called once by the object's destructor: later completions answer on
    // their own, and it waits until those running on other threads have
    // left. Those of this thread are not waited for: the host deletes the
    // object from inside a reply, and they do not touch it after that reply.
    void end()
    {
        const std::thread::id self = std::this_thread::get_id();
        std::unique_lock<std::mutex> lock(m_mutex);
        m_alive = false;
        m_left.wait(lock, [&] {
            return std::all_of(m_running.begin(), m_running.end(),
                               [&](std::thread::id id) { return id == self; });
        });
    }

private:
    struct Leaving
    {
        PluginLifetime &lifetime;
        std::thread::id self;
        ~Leaving() { lifetime.leave(self); }
    };

    void leave(std::thread::id self)
    {
        {
            const std::lock_guard<std::mutex> lock(m_mutex);
            m_running.erase(std::find(m_running.begin(), m_running.end(), self));
        }
        m_left.notify_all();
    }

    std::mutex m_mutex;
    std::condition_variable m_left;
    bool m_alive = true;
    // One entry per completion running now (a tunnel may answer inside the
    // send a completion makes, so one thread can stand more than once).
    std::vector<std::thread::id> m_running;
};

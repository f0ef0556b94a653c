#pragma once

#include "ResponseCallback.h"

#include <QString>
#include <QVariant>

#include <chrono>
#include <condition_variable>
#include <mutex>
#include <vector>

// Keeps every reply given through the callbacks it hands out; replies may
// arrive on any thread.
class ReplyRecorder
{
public:
    struct Reply
    {
        bool flag = false;
        QString code;
        QString text;
        QVariant data;
    };

    ResponseCallback callback()
    {
        return [this](bool flag, const QString &code, const QString &text, const QVariant &data) {
            {
                const std::lock_guard<std::mutex> lock(m_mutex);
                m_replies.push_back({flag, code, text, data});
            }
            m_changed.notify_all();
        };
    }

    std::vector<Reply> replies() const
    {
        const std::lock_guard<std::mutex> lock(m_mutex);
        return m_replies;
    }
    int count() const
    {
        const std::lock_guard<std::mutex> lock(m_mutex);
        return static_cast<int>(m_replies.size());
    }
    Reply last() const
    {
        const std::lock_guard<std::mutex> lock(m_mutex);
        return m_replies.empty() ? Reply{} : m_replies.back();
    }
    // Waits until n replies have arrived; false on time-out.
    bool waitFor(int n, std::chrono::milliseconds timeout = std::chrono::seconds(10)) const
    {
        std::unique_lock<std::mutex> lock(m_mutex);
        return m_changed.wait_for(lock, timeout,
                                  [&] { return m_replies.size() >= static_cast<size_t>(n); });
    }

private:
    mutable std::mutex m_mutex;
    mutable std::condition_variable m_changed;
    std::vector<Reply> m_replies;
};

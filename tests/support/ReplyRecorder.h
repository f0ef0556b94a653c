#pragma once

#include "ResponseCallback.h"

#include <QString>
#include <QVariant>

#include <chrono>
#include <condition_variable>
#include <mutex>
#include <vector>

// Keeps every reply given through the callbacks it hands out, from any thread.
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
            const std::lock_guard<std::mutex> lock(m_mutex);
            m_replies.push_back({flag, code, text, data});
            m_changed.notify_all();
        };
    }
    std::vector<Reply> replies() const
    {
        const std::lock_guard<std::mutex> lock(m_mutex);
        return m_replies;
    }
    int count() const { return static_cast<int>(replies().size()); }
    Reply last() const
    {
        const std::vector<Reply> all = replies();
        return all.empty() ? Reply{} : all.back();
    }
    // Waits until n replies have arrived; false on time-out.
    bool waitFor(int n, std::chrono::milliseconds timeout = std::chrono::seconds(10)) const
    {
        std::unique_lock<std::mutex> lock(m_mutex);
        return m_changed.wait_for(lock, timeout, [&] { return m_replies.size() >= size_t(n); });
    }

private:
    mutable std::mutex m_mutex;
    mutable std::condition_variable m_changed;
    std::vector<Reply> m_replies;
};

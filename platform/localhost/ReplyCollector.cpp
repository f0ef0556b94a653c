#include "ReplyCollector.h"

ResponseCallback ReplyCollector::replyFunction(int request)
{
    return
        [this, request](bool flag, const QString &code, const QString &text, const QVariant &data) {
            record(request, Reply{flag, code, text, data});
        };
}

void ReplyCollector::record(int request, Reply reply)
{
    {
        const std::lock_guard<std::mutex> lock(m_mutex);
        Entry &entry = m_entries[request];
        ++entry.count;
        if (!entry.first)
            entry.first = std::move(reply);
    }
    m_replied.notify_all();
}

std::optional<ReplyCollector::Reply> ReplyCollector::waitForFirst(int request,
                                                                  std::chrono::milliseconds timeout)
{
    std::unique_lock<std::mutex> lock(m_mutex);
    const bool answered = m_replied.wait_for(lock, timeout, [&] {
        const auto found = m_entries.find(request);
        return found != m_entries.end() && found->second.first.has_value();
    });
    if (!answered)
        return std::nullopt;
    return m_entries[request].first;
}

int ReplyCollector::replyCount(int request) const
{
    const std::lock_guard<std::mutex> lock(m_mutex);
    const auto found = m_entries.find(request);
    return found == m_entries.end() ? 0 : found->second.count;
}

std::vector<int> ReplyCollector::answeredMoreThanOnce() const
{
    const std::lock_guard<std::mutex> lock(m_mutex);
    std::vector<int> requests;
    for (const auto &[request, entry] : m_entries) {
        if (entry.count > 1)
            requests.push_back(request);
    }
    return requests;
}

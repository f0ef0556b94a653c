#pragma once

#include "ResponseCallback.h"

#include <QString>
#include <QVariant>

#include <chrono>
#include <condition_variable>
#include <map>
#include <mutex>
#include <optional>
#include <vector>

// Collects the replies of numbered requests. The reply functions it hands
// out may be called from any thread (the plug-in answers from the tunnel's),
// any number of times; it keeps the first reply of each request and counts
// them all, so that the host can tell a missing reply from a second one.
class ReplyCollector
{
public:
    struct Reply
    {
        bool flag = false;
        QString code;
        QString text;
        QVariant data;
    };

    // The reply function to hand the plug-in with request number `request`.
    // It must not outlive the collector.
    ResponseCallback replyFunction(int request);

    // Waits until the request has its first reply; nothing when the time-out
    // passes first.
    std::optional<Reply> waitForFirst(int request, std::chrono::milliseconds timeout);

    int replyCount(int request) const;
    // Requests answered more than once, in ascending order.
    std::vector<int> answeredMoreThanOnce() const;

private:
    struct Entry
    {
        int count = 0;
        std::optional<Reply> first;
    };

    void record(int request, Reply reply);

    mutable std::mutex m_mutex;
    std::condition_variable m_replied;
    std::map<int, Entry> m_entries;
};

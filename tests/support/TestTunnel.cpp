#include "TestTunnel.h"

TestTunnel::~TestTunnel()
{
    locked([&] { m_stopping = true; });
    m_wake.notify_all();
    m_worker.join();
    for (const Held &held : std::deque<Held>(std::move(m_held)))
        deliver({held.first, Answer{false, QString(), QString(), false}});
}

QStringList TestTunnel::commands() const
{
    QStringList result;
    for (const Sent &s : sent())
        result << s.command;
    return result;
}

bool TestTunnel::SendRequest(const QString &pluginId, void *clientId, int kind,
                             const QString &command, TunnelRequest &request)
{
    const Sent sent{pluginId,     clientId,          kind,         command,
                    request.body, request.timeoutMs, request.flag, request.extra};
    Held held{request.onResponse, Answer{}};
    std::unique_lock<std::mutex> lock(m_mutex);
    if (m_refusal && m_refusal(sent))
        return false;
    m_sent.append(sent);
    if (m_responder)
        held.second = m_responder(sent);
    if (m_delivery == Delivery::Immediately) {
        lock.unlock();
        deliver(held);
    } else {
        m_held.push_back(std::move(held));
        m_wake.notify_all();
    }
    return true;
}

void TestTunnel::deliver(const Held &held)
{
    const Answer &a = held.second;
    if (held.first)
        held.first(a.ok, QString(), QString(), a.code, a.content, a.flag);
}

bool TestTunnel::deliverNext()
{
    std::unique_lock<std::mutex> lock(m_mutex);
    if (m_held.empty())
        return false;
    const Held held = std::move(m_held.front());
    m_held.pop_front();
    lock.unlock();
    deliver(held);
    return true;
}

void TestTunnel::waitIdle()
{
    std::unique_lock<std::mutex> lock(m_mutex);
    m_idle.wait(lock, [this] {
        return m_delivery != Delivery::OtherThread || (m_held.empty() && !m_busy);
    });
}

void TestTunnel::workerLoop()
{
    std::unique_lock<std::mutex> lock(m_mutex);
    for (;;) {
        m_wake.wait(lock, [this] {
            return m_stopping || (m_delivery == Delivery::OtherThread && !m_held.empty());
        });
        if (m_stopping)
            return;
        const Held held = std::move(m_held.front());
        m_held.pop_front();
        m_busy = true;
        lock.unlock();
        deliver(held);
        lock.lock();
        m_busy = false;
        m_idle.notify_all();
    }
}

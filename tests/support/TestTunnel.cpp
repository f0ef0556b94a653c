#include "TestTunnel.h"

TestTunnel::TestTunnel(Delivery delivery) : m_delivery(delivery)
{
    m_worker = std::thread([this] { workerLoop(); });
}

TestTunnel::~TestTunnel()
{
    {
        const std::lock_guard<std::mutex> lock(m_mutex);
        m_stopping = true;
    }
    m_wake.notify_all();
    m_worker.join();
    // Whatever is still held is answered as failed: every accepted request
    // gets its one answer.
    std::deque<std::pair<Pending, Answer>> left;
    {
        const std::lock_guard<std::mutex> lock(m_mutex);
        left.swap(m_pending);
    }
    for (auto &entry : left)
        deliver(entry.first, Answer{false, QString(), QString(), false});
}

void TestTunnel::setDelivery(Delivery delivery)
{
    const std::lock_guard<std::mutex> lock(m_mutex);
    m_delivery = delivery;
}

void TestTunnel::setResponder(Responder responder)
{
    const std::lock_guard<std::mutex> lock(m_mutex);
    m_responder = std::move(responder);
}

void TestTunnel::queueAnswer(const Answer &answer)
{
    const std::lock_guard<std::mutex> lock(m_mutex);
    m_answers.push_back(answer);
}

void TestTunnel::refuseNext(int n)
{
    const std::lock_guard<std::mutex> lock(m_mutex);
    m_refuseNext = n;
}

void TestTunnel::setRefusal(std::function<bool(const Sent &)> refuse)
{
    const std::lock_guard<std::mutex> lock(m_mutex);
    m_refusal = std::move(refuse);
}

QList<TestTunnel::Sent> TestTunnel::sent() const
{
    const std::lock_guard<std::mutex> lock(m_mutex);
    return m_sent;
}

QStringList TestTunnel::commands() const
{
    QStringList result;
    for (const Sent &s : sent())
        result << s.command;
    return result;
}

int TestTunnel::pending() const
{
    const std::lock_guard<std::mutex> lock(m_mutex);
    return static_cast<int>(m_pending.size());
}

TestTunnel::Answer TestTunnel::answerFor(const Sent &sent)
{
    if (m_responder)
        return m_responder(sent);
    if (m_answers.empty())
        return Answer{};
    Answer answer = m_answers.front();
    m_answers.pop_front();
    return answer;
}

bool TestTunnel::SendRequest(const QString &pluginId, void *clientId, int kind,
                             const QString &command, TunnelRequest &request)
{
    Pending pending{Sent{pluginId, clientId, kind, command, request.body, request.timeoutMs,
                         request.flag, request.extra},
                    request.onResponse};
    Answer answer;
    Delivery delivery;
    {
        const std::lock_guard<std::mutex> lock(m_mutex);
        if (m_refuseNext > 0 || (m_refusal && m_refusal(pending.sent))) {
            if (m_refuseNext > 0)
                --m_refuseNext;
            return false;
        }
        m_sent.append(pending.sent);
        answer = answerFor(pending.sent);
        delivery = m_delivery;
        if (delivery != Delivery::Immediately)
            m_pending.emplace_back(std::move(pending), answer);
    }
    if (delivery == Delivery::Immediately)
        deliver(pending, answer);
    else if (delivery == Delivery::OtherThread)
        m_wake.notify_all();
    return true;
}

void TestTunnel::deliver(Pending &pending, const Answer &answer)
{
    if (pending.handler)
        pending.handler(answer.ok, QString(), QString(), answer.code, answer.content, answer.flag);
}

bool TestTunnel::deliverNext()
{
    std::pair<Pending, Answer> entry;
    {
        const std::lock_guard<std::mutex> lock(m_mutex);
        if (m_pending.empty())
            return false;
        entry = std::move(m_pending.front());
        m_pending.pop_front();
    }
    deliver(entry.first, entry.second);
    return true;
}

void TestTunnel::deliverAll()
{
    while (deliverNext()) {
    }
}

void TestTunnel::waitIdle()
{
    std::unique_lock<std::mutex> lock(m_mutex);
    m_idle.wait(lock, [this] {
        return m_delivery != Delivery::OtherThread || (m_pending.empty() && !m_busy);
    });
}

void TestTunnel::workerLoop()
{
    std::unique_lock<std::mutex> lock(m_mutex);
    for (;;) {
        m_wake.wait(lock, [this] {
            return m_stopping || (m_delivery == Delivery::OtherThread && !m_pending.empty());
        });
        if (m_stopping)
            return;
        auto entry = std::move(m_pending.front());
        m_pending.pop_front();
        m_busy = true;
        lock.unlock();
        deliver(entry.first, entry.second);
        lock.lock();
        m_busy = false;
        m_idle.notify_all();
    }
}

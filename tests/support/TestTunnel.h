#pragma once

#include "IKoltTunnelClient.h"

#include <QList>
#include <QStringList>

#include <condition_variable>
#include <deque>
#include <functional>
#include <mutex>
#include <thread>

// A scripted tunnel: records every send and answers with scripted values, at
// once (inside SendRequest), when the test says so, or in order from a thread
// of its own. Handlers are called outside its lock; whatever it still holds
// when it goes is answered ok false, so every taken send gets one answer.
class TestTunnel final : public IKoltTunnelClient
{
public:
    struct Sent
    {
        QString pluginId;
        void *clientId = nullptr;
        int kind = 0;
        QString command;
        QString body;
        int timeoutMs = 0;
        bool requestFlag = false;
        QString extra;
    };
    struct Answer
    {
        bool ok = true;
        QString code = QStringLiteral("0");
        QString content;
        bool flag = false;
    };
    enum class Delivery { Immediately, Held, OtherThread };
    // Answers one send, under the tunnel's lock. Without one, every answer
    // is ok, code "0", no content.
    using Responder = std::function<Answer(const Sent &)>;

    explicit TestTunnel(Delivery delivery = Delivery::Immediately) : m_delivery(delivery) {}
    ~TestTunnel() override;

    void setResponder(Responder responder)
    {
        locked([&] { m_responder = std::move(responder); });
    }
    // Every send the predicate picks is refused.
    void setRefusal(std::function<bool(const Sent &)> refuse)
    {
        locked([&] { m_refusal = std::move(refuse); });
    }

    QList<Sent> sent() const
    {
        return locked([&] { return m_sent; });
    }
    QStringList commands() const;
    int pending() const
    {
        return locked([&] { return int(m_held.size()); });
    }
    // Held: answers the oldest send held, on the caller's thread; false when
    // none is held.
    bool deliverNext();
    void deliverAll()
    {
        while (deliverNext()) {
        }
    }
    // OtherThread: waits until everything taken has been answered.
    void waitIdle();

    void *ownId() const { return const_cast<TestTunnel *>(this); }
    bool IsConnected() const override { return true; }
    void *GetClientID() override { return ownId(); }
    QString GetServerAddress() const override { return QStringLiteral("test"); }
    bool SendRequest(const QString &pluginId, void *clientId, int kind, const QString &command,
                     TunnelRequest &request) override;

private:
    using Held = std::pair<TunnelResponseHandler, Answer>;
    template <typename F> auto locked(F f) const -> decltype(f())
    {
        const std::scoped_lock lock(m_mutex);
        return f();
    }
    static void deliver(const Held &held);
    void workerLoop();

    mutable std::mutex m_mutex;
    std::condition_variable m_wake;
    std::condition_variable m_idle;
    const Delivery m_delivery;
    Responder m_responder;
    std::function<bool(const Sent &)> m_refusal;
    QList<Sent> m_sent;
    std::deque<Held> m_held;
    bool m_busy = false;
    bool m_stopping = false;
    std::thread m_worker{[this] { workerLoop(); }};
};

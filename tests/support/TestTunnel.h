#pragma once

#include "IKoltTunnelClient.h"

#include <QList>
#include <QString>

#include <condition_variable>
#include <deque>
#include <functional>
#include <mutex>
#include <thread>

// A tunnel for unit tests: records every send and answers with scripted
// values, at once (inside SendRequest), when the test says so, or from a
// thread of its own. Thread-safe; handlers are always called outside its lock.
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

    enum class Delivery {
        Immediately, // inside SendRequest, on the sender's thread
        Held,        // when the test calls deliverNext() or deliverAll()
        OtherThread, // in order, on the tunnel's own thread
    };

    // Computes the answer to one send; by default answers come from the
    // queue of scripted answers, and an empty queue answers ok with code "0"
    // and no content.
    using Responder = std::function<Answer(const Sent &)>;

    explicit TestTunnel(Delivery delivery = Delivery::Immediately);
    ~TestTunnel() override;

    void setDelivery(Delivery delivery);
    void setResponder(Responder responder);
    void queueAnswer(const Answer &answer);
    // The next n sends are refused (SendRequest returns false).
    void refuseNext(int n = 1);
    // Refuses every send for which the predicate holds.
    void setRefusal(std::function<bool(const Sent &)> refuse);

    QList<Sent> sent() const;
    QStringList commands() const;
    int pending() const;
    bool deliverNext();
    void deliverAll();
    // Waits until the tunnel's thread has delivered everything it took.
    void waitIdle();

    void *ownId() const { return const_cast<TestTunnel *>(this); }

    bool IsConnected() const override { return true; }
    void *GetClientID() override { return ownId(); }
    QString GetServerAddress() const override { return QStringLiteral("test"); }
    bool SendRequest(const QString &pluginId, void *clientId, int kind, const QString &command,
                     TunnelRequest &request) override;

private:
    struct Pending
    {
        Sent sent;
        TunnelResponseHandler handler;
    };

    Answer answerFor(const Sent &sent);
    static void deliver(Pending &pending, const Answer &answer);
    void workerLoop();

    mutable std::mutex m_mutex;
    std::condition_variable m_wake;
    std::condition_variable m_idle;
    Delivery m_delivery;
    Responder m_responder;
    std::deque<Answer> m_answers;
    int m_refuseNext = 0;
    std::function<bool(const Sent &)> m_refusal;
    QList<Sent> m_sent;
    std::deque<std::pair<Pending, Answer>> m_pending;
    bool m_busy = false;
    bool m_stopping = false;
    std::thread m_worker;
};

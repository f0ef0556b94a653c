#pragma once

#include "LocalTunnel.h"

#include <QString>

#include <gtest/gtest.h>

#include <atomic>
#include <condition_variable>
#include <mutex>
#include <thread>
#include <vector>

inline void PrintTo(const QString &text, std::ostream *os)
{
    *os << '"' << text.toStdString() << '"';
}

// One call of an answer handler as the caller sees it.
struct Delivery
{
    int tag = 0;
    bool ok = false;
    QString status;
    QString detail;
    QString code;
    QString content;
    bool flag = false;
    std::thread::id thread;
};

// Collects handler calls from the tunnel's delivery thread.
class Deliveries
{
public:
    TunnelResponseHandler handler(int tag)
    {
        return [this, tag](bool ok, const QString &status, const QString &detail,
                           const QString &code, const QString &content, bool flag) {
            const std::lock_guard<std::mutex> lock(m_mutex);
            m_calls.push_back(
                {tag, ok, status, detail, code, content, flag, std::this_thread::get_id()});
            m_changed.notify_all();
        };
    }

    void waitFor(std::size_t count)
    {
        std::unique_lock<std::mutex> lock(m_mutex);
        m_changed.wait(lock, [&] { return m_calls.size() >= count; });
    }

    std::vector<Delivery> calls() const
    {
        const std::lock_guard<std::mutex> lock(m_mutex);
        return m_calls;
    }

private:
    mutable std::mutex m_mutex;
    std::condition_variable m_changed;
    std::vector<Delivery> m_calls;
};

// A gate the backend waits at until the test opens it.
class Gate
{
public:
    void wait()
    {
        std::unique_lock<std::mutex> lock(m_mutex);
        ++m_waiting;
        m_changed.notify_all();
        m_changed.wait(lock, [&] { return m_open; });
    }
    void waitUntilReached(int count = 1)
    {
        std::unique_lock<std::mutex> lock(m_mutex);
        m_changed.wait(lock, [&] { return m_waiting >= count; });
    }
    void open()
    {
        const std::lock_guard<std::mutex> lock(m_mutex);
        m_open = true;
        m_changed.notify_all();
    }

private:
    std::mutex m_mutex;
    std::condition_variable m_changed;
    int m_waiting = 0;
    bool m_open = false;
};

// A backend that echoes the body with code "0", waits at the gate for the
// command "Wait", and records what it was asked, on which thread.
struct EchoBackend
{
    Gate gate;
    std::mutex mutex;
    std::vector<QString> asked;
    std::vector<QString> bodies;
    std::thread::id thread;

    TunnelBackendFactory factory()
    {
        return [this](QString *) -> TunnelBackend {
            return [this](const QString &command, const QString &body) {
                {
                    const std::lock_guard<std::mutex> lock(mutex);
                    asked.push_back(command);
                    bodies.push_back(body);
                    thread = std::this_thread::get_id();
                }
                if (command == QLatin1String("Wait"))
                    gate.wait();
                return ServerAnswer{QStringLiteral("0"), body};
            };
        };
    }

    std::vector<QString> commands()
    {
        const std::lock_guard<std::mutex> lock(mutex);
        return asked;
    }

    std::vector<int> bodiesAsNumbers()
    {
        const std::lock_guard<std::mutex> lock(mutex);
        std::vector<int> numbers;
        for (const QString &body : bodies)
            numbers.push_back(body.toInt());
        return numbers;
    }
};

inline bool send(IKoltTunnelClient &tunnel, const QString &command, const QString &body,
                 TunnelResponseHandler handler, int timeoutMs = 15000, bool flag = false,
                 void *identity = nullptr)
{
    TunnelRequest request;
    request.flag = flag;
    request.timeoutMs = timeoutMs;
    request.body = body;
    request.onResponse = std::move(handler);
    return tunnel.SendRequest(QStringLiteral("942E5F3F02EE4D7C879BADCD754F983C"),
                              identity ? identity : tunnel.GetClientID(), 1, command, request);
}

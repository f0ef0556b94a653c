#pragma once

#include "IKoltTunnelClient.h"
#include "RecordingServer.h"

#include <QString>

#include <chrono>
#include <cstddef>
#include <functional>
#include <memory>
#include <optional>

class ExchangeLog;

// What the tunnel talks to: one request in, one answer out. Called only on
// the tunnel's backend thread.
using TunnelBackend = std::function<ServerAnswer(const QString &command, const QString &body)>;
// What a backend factory makes: the backend, or (empty) why there is none.
struct StartedBackend
{
    TunnelBackend backend;
    QString error;
};
// Called once, on the backend thread, before any request: creates the
// backend there (so a database connection lives on the thread that uses it).
// An empty backend leaves the tunnel disconnected. The backend function is
// destroyed on the backend thread too.
using TunnelBackendFactory = std::function<StartedBackend()>;

struct LocalTunnelOptions
{
    // Requests taken but not yet answered; SendRequest refuses beyond it.
    std::size_t queueBound = 1024;
    // Fault injection, e.g. "latency=50ms,refuse=0.1,fail@3"; see README.md.
    QString faults;
    quint64 faultSeed = 1;
    // When set, every exchange is appended to this file as one JSON line.
    QString exchangeLogPath;
    QString serverAddress = QStringLiteral("local");
};

// A backend factory that opens a RecordingServer on the backend thread.
// When server is given, *server points at it once the tunnel is constructed
// and stays valid until the tunnel is destroyed; use it only inside
// runOnBackend.
TunnelBackendFactory recordingServerBackend(const QString &databasePath,
                                            AnswerLayout layout = AnswerLayout::Compact,
                                            RecordingServer **server = nullptr);

// The host's tunnel on one machine. Requests go, in the order they were
// taken, to the backend on a thread of the tunnel's own; answers are
// delivered on a second thread of its own, never on the caller's thread,
// each accepted request's handler exactly once:
// - with ok true, the server's code and answer, status and detail empty,
//   and the request's own flag;
// - with ok false and empty texts when the time-out passed first (the late
//   answer is dropped; a request still waiting for the server is then never
//   carried out), when an injected fault failed it, or when the tunnel is
//   destroyed first.
// Handlers may send further requests; they must not destroy the tunnel.
class LocalTunnel final : public IKoltTunnelClient
{
public:
    // Starts both threads and waits until the factory has run.
    explicit LocalTunnel(TunnelBackendFactory factory, LocalTunnelOptions options = {});
    // Refuses new requests, delivers ok false to every request not yet
    // answered, waits for a backend call in progress and destroys the backend
    // on its thread.
    ~LocalTunnel() override;
    LocalTunnel(const LocalTunnel &) = delete;
    LocalTunnel &operator=(const LocalTunnel &) = delete;

    // Why the tunnel is not connected: the factory's error or a fault text
    // that does not parse. Empty when connected.
    QString errorString() const;

    bool IsConnected() const override;
    void *GetClientID() override;
    QString GetServerAddress() const override;
    bool SendRequest(const QString &pluginId, void *clientId, int kind, const QString &command,
                     TunnelRequest &request) override;

    // Runs task on the backend thread, after the requests already taken, and
    // waits for it: the way to seed or dump through the backend's own
    // connection. False (task not run) when disconnected or shutting down.
    // Do not call it from inside the task.
    bool runOnBackend(const std::function<void()> &task);

    // Waits until every request taken so far has had its handler called,
    // requests sent by handlers meanwhile included; returns at once when
    // the tunnel is not connected. The timed form is false when the time-out
    // passed first.
    void waitIdle();
    bool waitIdle(std::chrono::milliseconds timeout);

    // The exchange log (closed when no path was given). Destruction writes
    // the last records, so hold it past the tunnel to ask whether every
    // record was written.
    std::shared_ptr<const ExchangeLog> exchangeLog() const;

    // Why a fault text does not parse; nothing when it does. Command lines
    // check their fault text with it before starting.
    static std::optional<QString> faultTextError(const QString &text);

private:
    struct State;
    std::unique_ptr<State> m_state;
};

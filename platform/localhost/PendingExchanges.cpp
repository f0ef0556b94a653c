#include "PendingExchanges.h"

#include <atomic>

void PendingExchanges::Count::add()
{
    const std::lock_guard<std::mutex> lock(mutex);
    ++pending;
}

void PendingExchanges::Count::done()
{
    {
        const std::lock_guard<std::mutex> lock(mutex);
        --pending;
    }
    idle.notify_all();
}

PendingExchanges::PendingExchanges(IKoltTunnelClient *tunnel)
    : m_tunnel(tunnel), m_count(std::make_shared<Count>())
{}

PendingExchanges::~PendingExchanges() = default;

bool PendingExchanges::waitIdle(std::chrono::milliseconds timeout)
{
    std::unique_lock<std::mutex> lock(m_count->mutex);
    return m_count->idle.wait_for(lock, timeout, [&] { return m_count->pending == 0; });
}

int PendingExchanges::pending() const
{
    const std::lock_guard<std::mutex> lock(m_count->mutex);
    return m_count->pending;
}

bool PendingExchanges::IsConnected() const
{
    return m_tunnel->IsConnected();
}

void *PendingExchanges::GetClientID()
{
    return m_tunnel->GetClientID();
}

QString PendingExchanges::GetServerAddress() const
{
    return m_tunnel->GetServerAddress();
}

bool PendingExchanges::SendRequest(const QString &pluginId, void *clientId, int kind,
                                   const QString &command, TunnelRequest &request)
{
    // Counted before the send: a tunnel may answer before SendRequest returns.
    m_count->add();
    // A tunnel that breaks its contract and answers twice must not count
    // another exchange as done.
    auto answered = std::make_shared<std::atomic<bool>>(false);
    TunnelResponseHandler handler = std::move(request.onResponse);
    request.onResponse = [count = m_count, answered,
                          handler](bool ok, const QString &status, const QString &detail,
                                   const QString &code, const QString &content, bool flag) {
        if (handler)
            handler(ok, status, detail, code, content, flag);
        if (!answered->exchange(true))
            count->done();
    };
    const bool taken = m_tunnel->SendRequest(pluginId, clientId, kind, command, request);
    if (!taken && !answered->exchange(true))
        m_count->done();
    return taken;
}

#pragma once

#include "IKoltTunnelClient.h"

#include <chrono>
#include <condition_variable>
#include <memory>
#include <mutex>

// Stands between the plug-in and a tunnel and counts the exchanges that the
// tunnel has taken and not yet answered. An exchange counts as answered once
// its answer handler has returned, so when the count is back to zero every
// completion that the answer started (and any reply it gave) has run.
class PendingExchanges final : public IKoltTunnelClient
{
public:
    // The tunnel is not owned and must outlive this object.
    explicit PendingExchanges(IKoltTunnelClient *tunnel);
    ~PendingExchanges() override;

    // True when no exchange is outstanding, at once or within the time-out.
    bool waitIdle(std::chrono::milliseconds timeout);
    int pending() const;

    bool IsConnected() const override;
    void *GetClientID() override;
    QString GetServerAddress() const override;
    bool SendRequest(const QString &pluginId, void *clientId, int kind, const QString &command,
                     TunnelRequest &request) override;

private:
    // Shared with the wrapped handlers, which the tunnel may keep past this
    // object's life.
    struct Count
    {
        mutable std::mutex mutex;
        std::condition_variable idle;
        int pending = 0;
        void add();
        void done();
    };

    IKoltTunnelClient *m_tunnel;
    std::shared_ptr<Count> m_count;
};

#pragma once

#include <QString>

#include <functional>

// Called once by the tunnel with the answer to one request: ok is true when
// the exchange with the recording server succeeded; the two strings after it
// are the tunnel's own and carry nothing the plug-in reads; responseCode "0"
// means the server accepted the request; content is the server's XML answer;
// flag is the tunnel's own value, handed on unchanged to whoever waits.
using TunnelResponseHandler =
    std::function<void(bool ok, const QString &status, const QString &detail,
                       const QString &responseCode, const QString &content, bool flag)>;

// The record handed to SendRequest. The caller destroys it as soon as
// SendRequest returns; the tunnel keeps its own copy of what it needs.
struct TunnelRequest
{
    bool flag = false;
    qint32 timeoutMs = 15000;
    QString body;
    QString extra;
    TunnelResponseHandler onResponse;
};

// The host's tunnel to the recording server.
class IKoltTunnelClient
{
public:
    virtual ~IKoltTunnelClient() = default;

    virtual bool IsConnected() const = 0;
    // The tunnel's own client identity, an opaque value.
    virtual void *GetClientID() = 0;
    virtual QString GetServerAddress() const = 0;
    // True when the tunnel took the request: its handler is then called
    // exactly once, later, with the answer or with ok false. False: nothing
    // was sent and the handler is never called.
    virtual bool SendRequest(const QString &pluginId, void *clientId, int kind,
                             const QString &command, TunnelRequest &request) = 0;
};

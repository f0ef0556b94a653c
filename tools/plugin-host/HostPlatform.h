#pragma once

#include "HostCommandLine.h"
#include "ReplyCollector.h"
#include "Requesters.h"

#include <QString>

#include <memory>

class IPluginObjectBase;
class LocalFrameworkTools;
class LocalTunnel;
class PendingExchanges;
class PluginLibrary;

// The platform of one plugin-host run: the plug-in file, the simulated
// recording server behind the local tunnel, and the host's side of requests.
// Each step fails with a message for standard error; nothing is sent before
// every step has succeeded.
class HostPlatform
{
public:
    explicit HostPlatform(const HostOptions &options);
    // The plug-in object goes first, then the tunnel, which answers whatever
    // is still on its way (ok false) while the replies can still be counted.
    ~HostPlatform();
    HostPlatform(const HostPlatform &) = delete;
    HostPlatform &operator=(const HostPlatform &) = delete;

    // Loads and checks the plug-in file; nothing of the server is touched.
    bool loadPlugin(QString *error);
    // Opens the server's database behind a local tunnel.
    bool startTunnel(QString *error);
    // Hands the plug-in the framework with the tunnel.
    bool initialisePlugin(QString *error);
    // The three steps above, in order, up to the first that fails.
    bool start(QString *error);

    IPluginObjectBase *plugin() const;
    // The tunnel as the plug-in sees it: every exchange is counted.
    PendingExchanges &exchanges() { return *m_exchanges; }
    LocalTunnel &tunnel() { return *m_tunnel; }
    ReplyCollector &replies() { return m_replies; }
    Requesters &requesters() { return m_requesters; }
    const HostOptions &options() const { return m_options; }

private:
    HostOptions m_options;
    // Declared first so that it is destroyed last: late replies reach it.
    ReplyCollector m_replies;
    Requesters m_requesters;
    std::unique_ptr<LocalTunnel> m_tunnel;
    std::unique_ptr<PendingExchanges> m_exchanges;
    std::unique_ptr<LocalFrameworkTools> m_framework;
    std::unique_ptr<PluginLibrary> m_library;
};

// The database file when --db is not given, in the user's data location;
// its folder is created.
QString defaultDatabasePath();

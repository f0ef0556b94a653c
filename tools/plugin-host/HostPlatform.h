#pragma once

#include "HostCommandLine.h"
#include "HostResult.h"
#include "ReplyCollector.h"
#include "Requesters.h"

#include <QString>

#include <memory>
#include <optional>

class IPluginObjectBase;
class LocalFrameworkTools;
class LocalTunnel;
class PluginLibrary;
enum class AnswerLayout;

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

    // Each step gives why it failed, or nothing.
    // Loads and checks the plug-in file; nothing of the server is touched.
    std::optional<Failure> loadPlugin();
    // Opens the server's database behind a local tunnel.
    std::optional<Failure> startTunnel();
    // Hands the plug-in the framework with the tunnel.
    std::optional<Failure> initialisePlugin();
    // The three steps above, in order, up to the first that fails.
    std::optional<Failure> start();
    // Deletes the plug-in object and stops the tunnel, which logs what was
    // still on its way; why the exchange log missed a record, or nothing.
    std::optional<Failure> stop();

    IPluginObjectBase *plugin() const;
    // The tunnel the plug-in is given; waitIdle() on it waits until every
    // answer handler (and the replies it gave) has run.
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
    std::unique_ptr<LocalFrameworkTools> m_framework;
    std::unique_ptr<PluginLibrary> m_library;
};

// The server's database: --db, or a file in the user's data location, whose
// folder is created.
QString databasePath(const HostOptions &options);
// The server's answer layout that --answer-layout names.
HostResult<AnswerLayout> answerLayout(const HostOptions &options);

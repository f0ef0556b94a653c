#pragma once

#include "LocalFrameworkTools.h"
#include "LocalTunnel.h"
#include "PluginRecordingScheduleSettingSrv.h"
#include "ReplyCollector.h"

#include <QTemporaryDir>

// The plug-in as a host runs it, on a local tunnel to the simulated recording
// server on a fresh SQLite file; answers come on the tunnel's threads.
class LivePlugin
{
public:
    struct Sent
    {
        QString command, body;
        int timeoutMs = 0;
    };

    LivePlugin();
    // Replaces the server's time cards with those of a "GetRecTmcardRes" text.
    void seed(const QString &getRecTmcardRes);
    QString databasePath() const { return m_dir.filePath(QStringLiteral("server.db")); }
    // The server's answer to a read of all time cards.
    QString dump();
    // The one reply, after every exchange it started; none or a second fails the test.
    ReplyCollector::Reply request(const QString &command, const QVariant &payload);
    // What was sent, in order (each step waits for the last), from the exchange log.
    QList<Sent> sent() const;

private:
    // Destroyed bottom up: the plug-in, then the tunnel, which ends what is on its way.
    QTemporaryDir m_dir;
    ReplyCollector m_replies;
    int m_requests = 0;
    RecordingServer *m_server = nullptr;
    std::unique_ptr<LocalTunnel> m_tunnel;
    std::unique_ptr<LocalFrameworkTools> m_framework;
    PluginRecordingScheduleSettingSrv m_plugin;
};

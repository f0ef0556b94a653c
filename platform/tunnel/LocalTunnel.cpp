#include "LocalTunnel.h"

struct LocalTunnel::State
{
    QString error = QStringLiteral("not implemented yet");
    LocalTunnelOptions options;
};

TunnelBackendFactory recordingServerBackend(const QString &databasePath, AnswerLayout layout,
                                            RecordingServer **server)
{
    return [databasePath, layout, server](QString *error) -> TunnelBackend {
        auto owned = std::make_shared<RecordingServer>(databasePath, layout);
        if (!owned->open(error))
            return {};
        if (server)
            *server = owned.get();
        return [owned](const QString &command, const QString &body) {
            return owned->handle(command, body);
        };
    };
}

LocalTunnel::LocalTunnel(TunnelBackendFactory, LocalTunnelOptions options)
    : m_state(std::make_unique<State>())
{
    m_state->options = std::move(options);
}

LocalTunnel::~LocalTunnel() = default;

QString LocalTunnel::errorString() const
{
    return m_state->error;
}
bool LocalTunnel::IsConnected() const
{
    return false;
}
void *LocalTunnel::GetClientID()
{
    return this;
}
QString LocalTunnel::GetServerAddress() const
{
    return m_state->options.serverAddress;
}

bool LocalTunnel::SendRequest(const QString &, void *, int, const QString &, TunnelRequest &)
{
    return false;
}

bool LocalTunnel::runOnBackend(const std::function<void()> &)
{
    return false;
}
void LocalTunnel::waitIdle()
{}

bool LocalTunnel::checkFaults(const QString &spec, QString *error)
{
    if (spec.isEmpty())
        return true;
    if (error)
        *error = QStringLiteral("not implemented yet");
    return false;
}

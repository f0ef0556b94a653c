#include "HostPlatform.h"

#include "IPluginObjectBase.h"
#include "LocalFrameworkTools.h"
#include "LocalTunnel.h"
#include "PendingExchanges.h"
#include "PluginLibrary.h"
#include "RecordingScheduleSettingConstants.h"

#include <QDir>
#include <QStandardPaths>

HostPlatform::HostPlatform(const HostOptions &options) : m_options(options)
{}

HostPlatform::~HostPlatform()
{
    m_library.reset();
    m_framework.reset();
    m_tunnel.reset();
    m_exchanges.reset();
}

bool HostPlatform::loadPlugin(QString *error)
{
    m_library = std::make_unique<PluginLibrary>(m_options.pluginFile,
                                                QStringLiteral(PLUGIN_SERVER_INTERFACE_IID),
                                                PluginRecordingScheduleSettingCommon::PluginId);
    if (m_library->load())
        return true;
    *error = QStringLiteral("the plug-in does not load: %1").arg(m_library->errorString());
    return false;
}

bool HostPlatform::startTunnel(QString *error)
{
    const std::optional<AnswerLayout> layout = parseAnswerLayout(m_options.answerLayout);
    if (!layout) {
        *error = QStringLiteral("--answer-layout takes compact, indented or crlf, not \"%1\"")
                     .arg(m_options.answerLayout);
        return false;
    }
    QString reason;
    if (!LocalTunnel::checkFaults(m_options.faults, &reason)) {
        *error = QStringLiteral("--faults: %1").arg(reason);
        return false;
    }
    const QString database =
        m_options.databaseFile.isEmpty() ? defaultDatabasePath() : m_options.databaseFile;

    LocalTunnelOptions tunnelOptions;
    tunnelOptions.faults = m_options.faults;
    tunnelOptions.faultSeed = m_options.faultSeed;
    tunnelOptions.exchangeLogPath = m_options.exchangesFile;
    m_tunnel =
        std::make_unique<LocalTunnel>(recordingServerBackend(database, *layout), tunnelOptions);
    if (!m_tunnel->IsConnected()) {
        *error = QStringLiteral("the server does not start: %1").arg(m_tunnel->errorString());
        return false;
    }
    m_exchanges = std::make_unique<PendingExchanges>(m_tunnel.get());
    return true;
}

bool HostPlatform::initialisePlugin(QString *error)
{
    m_framework = std::make_unique<LocalFrameworkTools>(m_exchanges.get());
    if (plugin()->InitialPluginBase(m_framework.get()))
        return true;
    *error = QStringLiteral("the plug-in refused to initialise");
    return false;
}

bool HostPlatform::start(QString *error)
{
    return loadPlugin(error) && startTunnel(error) && initialisePlugin(error);
}

IPluginObjectBase *HostPlatform::plugin() const
{
    return m_library ? m_library->plugin() : nullptr;
}

QString defaultDatabasePath()
{
    const QString folder = QStandardPaths::writableLocation(QStandardPaths::AppDataLocation);
    QDir().mkpath(folder);
    return QDir(folder).filePath(QStringLiteral("recording-server.sqlite"));
}

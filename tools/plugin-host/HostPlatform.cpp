#include "HostPlatform.h"

#include "ExchangeLog.h"
#include "IPluginObjectBase.h"
#include "LocalFrameworkTools.h"
#include "LocalTunnel.h"
#include "PluginLibrary.h"
#include "RecordingScheduleSettingConstants.h"

#include <QDir>
#include <QStandardPaths>

HostPlatform::HostPlatform(const HostOptions &options) : m_options(options)
{}

HostPlatform::~HostPlatform()
{
    stop();
}

std::optional<Failure> HostPlatform::stop()
{
    const std::shared_ptr<const ExchangeLog> log = m_tunnel ? m_tunnel->exchangeLog() : nullptr;
    m_library.reset();
    m_framework.reset();
    m_tunnel.reset();
    if (const std::optional<QString> failure = log ? log->writeFailure() : std::nullopt)
        return Failure{*failure};
    return std::nullopt;
}

std::optional<Failure> HostPlatform::loadPlugin()
{
    m_library = std::make_unique<PluginLibrary>(m_options.pluginFile,
                                                QStringLiteral(PLUGIN_SERVER_INTERFACE_IID),
                                                PluginRecordingScheduleSettingCommon::PluginId);
    if (m_library->load())
        return std::nullopt;
    return Failure{QStringLiteral("the plug-in does not load: %1").arg(m_library->errorString())};
}

std::optional<Failure> HostPlatform::startTunnel()
{
    const HostResult<AnswerLayout> layout = answerLayout(m_options);
    if (!layout)
        return Failure{layout.error()};
    if (const std::optional<QString> reason = LocalTunnel::faultTextError(m_options.faults))
        return Failure{QStringLiteral("--faults: %1").arg(*reason)};

    LocalTunnelOptions tunnelOptions;
    tunnelOptions.faults = m_options.faults;
    tunnelOptions.faultSeed = m_options.faultSeed;
    tunnelOptions.exchangeLogPath = m_options.exchangesFile;
    m_tunnel = std::make_unique<LocalTunnel>(
        recordingServerBackend(databasePath(m_options), *layout), tunnelOptions);
    if (!m_tunnel->IsConnected())
        return Failure{
            QStringLiteral("the server does not start: %1").arg(m_tunnel->errorString())};
    return std::nullopt;
}

std::optional<Failure> HostPlatform::initialisePlugin()
{
    m_framework = std::make_unique<LocalFrameworkTools>(m_tunnel.get());
    if (plugin()->InitialPluginBase(m_framework.get()))
        return std::nullopt;
    return Failure{QStringLiteral("the plug-in refused to initialise")};
}

std::optional<Failure> HostPlatform::start()
{
    if (std::optional<Failure> failure = loadPlugin())
        return failure;
    if (std::optional<Failure> failure = startTunnel())
        return failure;
    return initialisePlugin();
}

IPluginObjectBase *HostPlatform::plugin() const
{
    return m_library ? m_library->plugin() : nullptr;
}

QString databasePath(const HostOptions &options)
{
    if (!options.databaseFile.isEmpty())
        return options.databaseFile;
    const QString folder = QStandardPaths::writableLocation(QStandardPaths::AppDataLocation);
    QDir().mkpath(folder);
    return QDir(folder).filePath(QStringLiteral("recording-server.sqlite"));
}

HostResult<AnswerLayout> answerLayout(const HostOptions &options)
{
    if (const std::optional<AnswerLayout> layout = parseAnswerLayout(options.answerLayout))
        return *layout;
    return Failure{QStringLiteral("--answer-layout takes compact, indented or crlf, not \"%1\"")
                       .arg(options.answerLayout)};
}

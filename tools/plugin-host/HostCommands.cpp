#include "HostCommands.h"

#include "HostCommandLine.h"
#include "HostExit.h"
#include "HostOutput.h"
#include "HostPlatform.h"
#include "HostRequest.h"
#include "JsonValues.h"
#include "LocalTunnel.h"
#include "PendingExchanges.h"
#include "RecordingScheduleSettingConstants.h"
#include "RecordingServer.h"
#include "RequestRunner.h"
#include "Requesters.h"

#include <QFile>

#include <chrono>
#include <condition_variable>
#include <mutex>

namespace {

// Reads a whole file, or standard input for "-"; nothing, with the message,
// when it cannot be read.
std::optional<QByteArray> readInput(const QString &fileName, QString *error)
{
    QFile file;
    const bool opened = fileName == QLatin1String("-")
                            ? file.open(stdin, QIODevice::ReadOnly)
                            : (file.setFileName(fileName), file.open(QIODevice::ReadOnly));
    if (!opened) {
        *error = QStringLiteral("%1: %2").arg(fileName, file.errorString());
        return std::nullopt;
    }
    return file.readAll();
}

int runRequests(const HostOptions &options, const std::vector<HostRequest> &requests)
{
    HostPlatform platform(options);
    QString error;
    if (!platform.start(&error)) {
        printError(error);
        return ExitUsage;
    }
    RequestRunner runner(platform);
    runner.run(requests);
    return runner.finish();
}

// Opens the server's database on this thread, for the commands that work on
// it without the plug-in.
bool openServer(const HostOptions &options, RecordingServer **server,
                std::unique_ptr<RecordingServer> *holder)
{
    const std::optional<AnswerLayout> layout = parseAnswerLayout(options.answerLayout);
    if (!layout) {
        printError(QStringLiteral("--answer-layout takes compact, indented or crlf, not \"%1\"")
                       .arg(options.answerLayout));
        return false;
    }
    const QString database =
        options.databaseFile.isEmpty() ? defaultDatabasePath() : options.databaseFile;
    *holder = std::make_unique<RecordingServer>(database, *layout);
    if (const Refusal refusal = (*holder)->open(); refusal.refused()) {
        printError(QStringLiteral("the server's database does not open: %1").arg(refusal.reason));
        return false;
    }
    *server = holder->get();
    return true;
}

// The one answer of a raw exchange, which the tunnel delivers on its thread.
class RawAnswer
{
public:
    TunnelResponseHandler handler()
    {
        return [this](bool ok, const QString &, const QString &, const QString &code,
                      const QString &content, bool) {
            {
                const std::lock_guard<std::mutex> lock(m_mutex);
                if (m_count++ == 0) {
                    m_ok = ok;
                    m_code = code;
                    m_content = content;
                }
            }
            m_answered.notify_all();
        };
    }

    bool wait(std::chrono::milliseconds timeout)
    {
        std::unique_lock<std::mutex> lock(m_mutex);
        return m_answered.wait_for(lock, timeout, [this] { return m_count > 0; });
    }

    QByteArray line() const
    {
        const std::lock_guard<std::mutex> lock(m_mutex);
        using JsonValues::compact;
        return "{\"ok\": " + compact(m_ok) + ", \"code\": " + compact(m_code) +
               ", \"content\": " + compact(m_content) + '}';
    }

    int count() const
    {
        const std::lock_guard<std::mutex> lock(m_mutex);
        return m_count;
    }

private:
    mutable std::mutex m_mutex;
    std::condition_variable m_answered;
    int m_count = 0;
    bool m_ok = false;
    QString m_code;
    QString m_content;
};

// How much longer than its own time-out the host waits for the tunnel to
// answer a raw exchange before it counts the answer as missing.
constexpr std::chrono::milliseconds RawAnswerGrace{5000};

} // namespace

int runHostCommand(const HostOptions &options)
{
    const QString &command = options.command;
    if (command == QLatin1String("request"))
        return runRequest(options);
    if (command == QLatin1String("session"))
        return runSession(options);
    if (command == QLatin1String("seed"))
        return runSeed(options);
    if (command == QLatin1String("dump"))
        return runDump(options);
    if (command == QLatin1String("raw"))
        return runRaw(options);
    return runDemo(options);
}

int runRequest(const HostOptions &options)
{
    HostRequest request;
    request.command = options.arguments.at(0);
    if (options.arguments.size() > 1) {
        QString error;
        const std::optional<QJsonValue> payload =
            JsonValues::parse(options.arguments.at(1).toUtf8(), &error);
        if (!payload) {
            printError(QStringLiteral("PAYLOAD is not JSON: %1").arg(error));
            return ExitUsage;
        }
        request.payload = payload->toVariant();
    }
    return runRequests(options, {request});
}

int runSession(const HostOptions &options)
{
    const QString fileName =
        options.arguments.isEmpty() ? QStringLiteral("-") : options.arguments.first();
    QString error;
    const std::optional<QByteArray> text = readInput(fileName, &error);
    if (!text) {
        printError(error);
        return ExitUsage;
    }
    const std::optional<std::vector<HostRequest>> requests = readSession(*text, &error);
    if (!requests) {
        printError(QStringLiteral("%1: %2").arg(
            fileName == QLatin1String("-") ? QStringLiteral("standard input") : fileName, error));
        return ExitUsage;
    }
    return runRequests(options, *requests);
}

int runSeed(const HostOptions &options)
{
    QString error;
    const std::optional<QByteArray> xml = readInput(options.arguments.first(), &error);
    if (!xml) {
        printError(error);
        return ExitUsage;
    }
    RecordingServer *server = nullptr;
    std::unique_ptr<RecordingServer> holder;
    if (!openServer(options, &server, &holder))
        return ExitUsage;
    if (const Refusal refusal = server->seed(QString::fromUtf8(*xml)); refusal.refused()) {
        printError(QStringLiteral("%1: %2").arg(options.arguments.first(), refusal.text()));
        return ExitUsage;
    }
    return ExitOk;
}

int runDump(const HostOptions &options)
{
    RecordingServer *server = nullptr;
    std::unique_ptr<RecordingServer> holder;
    if (!openServer(options, &server, &holder))
        return ExitUsage;
    QByteArray text = server->dump().toUtf8();
    if (text.endsWith('\n'))
        text.chop(1);
    printLine(text);
    return ExitOk;
}

int runRaw(const HostOptions &options)
{
    // Outlives the platform, whose tunnel answers a late exchange as it stops.
    RawAnswer answer;
    HostPlatform platform(options);
    QString error;
    if (!platform.startTunnel(&error)) {
        printError(error);
        return ExitUsage;
    }
    TunnelRequest request;
    request.timeoutMs = options.replyTimeoutMs;
    request.body = options.arguments.at(1);
    request.onResponse = answer.handler();
    const bool taken = platform.exchanges().SendRequest(
        PluginRecordingScheduleSettingCommon::PluginId, Requesters::identityOf(options.client), 1,
        options.arguments.at(0), request);
    if (!taken) {
        printError(QStringLiteral("the tunnel did not take the request"));
        return ExitReplies;
    }
    if (!answer.wait(std::chrono::milliseconds(options.replyTimeoutMs) + RawAnswerGrace)) {
        printError(QStringLiteral("no answer within %1 ms").arg(options.replyTimeoutMs));
        return ExitReplies;
    }
    printLine(answer.line());
    platform.exchanges().waitIdle(RawAnswerGrace);
    if (answer.count() > 1) {
        printError(QStringLiteral("%1 answers to one request").arg(answer.count()));
        return ExitReplies;
    }
    return ExitOk;
}

#include "HostCommands.h"

#include "HostCommandLine.h"
#include "HostExit.h"
#include "HostOutput.h"
#include "HostPlatform.h"
#include "HostRequest.h"
#include "JsonValues.h"
#include "LocalTunnel.h"
#include "RecordingScheduleSettingConstants.h"
#include "RecordingServer.h"
#include "RequestRunner.h"
#include "Requesters.h"

#include <QFile>
#include <QXmlStreamReader>

#include <chrono>
#include <condition_variable>
#include <mutex>

namespace {

// Reads a whole file, or standard input for "-".
HostResult<QByteArray> readInput(const QString &fileName)
{
    QFile file;
    const bool opened = fileName == QLatin1String("-")
                            ? file.open(stdin, QIODevice::ReadOnly)
                            : (file.setFileName(fileName), file.open(QIODevice::ReadOnly));
    if (!opened)
        return Failure{QStringLiteral("%1: %2").arg(fileName, file.errorString())};
    return file.readAll();
}

int runRequests(const HostOptions &options, const std::vector<HostRequest> &requests)
{
    HostPlatform platform(options);
    if (const std::optional<Failure> failure = platform.start()) {
        printError(failure->message);
        return ExitUsage;
    }
    RequestRunner runner(platform);
    runner.run(requests);
    return stopPlatform(platform, runner.finish());
}

// The reason an <Error> answer gives, or the whole answer when it has none.
QString refusalReason(const QString &content)
{
    QXmlStreamReader xml(content);
    while (!xml.atEnd()) {
        if (xml.readNext() == QXmlStreamReader::StartElement &&
            xml.name() == QLatin1String("Reason"))
            return xml.readElementText();
    }
    return content.trimmed();
}

// Opens the server's database on this thread, for the commands that work on
// it without the plug-in.
HostResult<std::shared_ptr<RecordingServer>> openServer(const HostOptions &options)
{
    const HostResult<AnswerLayout> layout = answerLayout(options);
    if (!layout)
        return Failure{layout.error()};
    auto server = std::make_shared<RecordingServer>(databasePath(options), *layout);
    if (const Refusal refusal = server->open(); refusal.refused())
        return Failure{
            QStringLiteral("the server's database does not open: %1").arg(refusal.reason)};
    return server;
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

int stopPlatform(HostPlatform &platform, int status)
{
    const std::optional<Failure> failure = platform.stop();
    if (!failure)
        return status;
    printError(failure->message);
    return status == ExitOk ? ExitReplies : status;
}

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
        const HostResult<QJsonValue> payload = JsonValues::parse(options.rawArguments.at(1));
        if (!payload) {
            printError(QStringLiteral("PAYLOAD is not JSON: %1").arg(payload.error()));
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
    const HostResult<QByteArray> text = readInput(fileName);
    if (!text) {
        printError(text.error());
        return ExitUsage;
    }
    const HostResult<std::vector<HostRequest>> requests = readSession(*text);
    if (!requests) {
        printError(QStringLiteral("%1: %2").arg(
            fileName == QLatin1String("-") ? QStringLiteral("standard input") : fileName,
            requests.error()));
        return ExitUsage;
    }
    return runRequests(options, *requests);
}

int runSeed(const HostOptions &options)
{
    const HostResult<QByteArray> xml = readInput(options.arguments.first());
    if (!xml) {
        printError(xml.error());
        return ExitUsage;
    }
    const HostResult<std::shared_ptr<RecordingServer>> server = openServer(options);
    if (!server) {
        printError(server.error());
        return ExitUsage;
    }
    if (const Refusal refusal = (*server)->seed(QString::fromUtf8(*xml)); refusal.refused()) {
        printError(QStringLiteral("%1: %2").arg(options.arguments.first(), refusal.text()));
        return ExitUsage;
    }
    return ExitOk;
}

int runDump(const HostOptions &options)
{
    const HostResult<std::shared_ptr<RecordingServer>> server = openServer(options);
    if (!server) {
        printError(server.error());
        return ExitUsage;
    }
    const ServerAnswer answer = (*server)->handle(
        QStringLiteral("GetRecTmcard"),
        QStringLiteral("<GetRecTmcard><TmcardAll>true</TmcardAll></GetRecTmcard>"));
    // A refusal printed as the dump would pass for a server without time cards.
    if (answer.code != QLatin1String("0")) {
        printError(QStringLiteral("the server refused the dump: code %1: %2")
                       .arg(answer.code, refusalReason(answer.content)));
        return ExitUsage;
    }
    QByteArray text = answer.content.toUtf8();
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
    if (const std::optional<Failure> failure = platform.startTunnel()) {
        printError(failure->message);
        return ExitUsage;
    }
    TunnelRequest request;
    request.timeoutMs = options.replyTimeoutMs;
    request.body = options.arguments.at(1);
    request.onResponse = answer.handler();
    const bool taken = platform.tunnel().SendRequest(PluginRecordingScheduleSettingCommon::PluginId,
                                                     Requesters::identityOf(options.client), 1,
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
    platform.tunnel().waitIdle(RawAnswerGrace);
    if (answer.count() > 1) {
        printError(QStringLiteral("%1 answers to one request").arg(answer.count()));
        return ExitReplies;
    }
    return stopPlatform(platform, ExitOk);
}

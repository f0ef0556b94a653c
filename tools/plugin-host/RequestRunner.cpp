#include "RequestRunner.h"

#include "HostExit.h"
#include "HostOutput.h"
#include "HostPlatform.h"
#include "IPluginObjectBase.h"
#include "LocalTunnel.h"
#include "ReplyLine.h"

#include <chrono>
#include <exception>

RequestRunner::RequestRunner(HostPlatform &platform) : m_platform(platform)
{}

std::optional<ReplyCollector::Reply> RequestRunner::send(const HostRequest &request)
{
    const int number = static_cast<int>(m_commands.size());
    m_commands.push_back(request.command);
    const qint64 client = request.client.value_or(m_platform.options().client);
    try {
        m_platform.plugin()->Request(request.command, request.payload,
                                     m_platform.requesters().sender(client),
                                     m_platform.replies().replyFunction(number));
    } catch (const std::exception &e) {
        printError(QStringLiteral("request %1 (%2): the plug-in threw: %3")
                       .arg(number + 1)
                       .arg(request.command, QString::fromLocal8Bit(e.what())));
    } catch (...) {
        printError(QStringLiteral("request %1 (%2): the plug-in threw")
                       .arg(number + 1)
                       .arg(request.command));
    }
    const int timeoutMs = m_platform.options().replyTimeoutMs;
    std::optional<ReplyCollector::Reply> reply =
        m_platform.replies().waitForFirst(number, std::chrono::milliseconds(timeoutMs));
    if (!reply) {
        m_unanswered = true;
        printError(QStringLiteral("request %1 (%2): no reply within %3 ms")
                       .arg(number + 1)
                       .arg(request.command)
                       .arg(timeoutMs));
    }
    return reply;
}

void RequestRunner::run(const std::vector<HostRequest> &requests)
{
    for (std::size_t i = 0; i < requests.size(); ++i) {
        const std::optional<ReplyCollector::Reply> reply = send(requests[i]);
        if (reply)
            printLine(replyLine(requests[i].command, *reply));
        // Without its reply, or with it lost on the way out, the caller
        // cannot know what the next request would start from.
        if (!reply || standardOutputFailure()) {
            if (i + 1 < requests.size())
                printError(
                    QStringLiteral("%1 later request(s) not sent").arg(requests.size() - i - 1));
            return;
        }
    }
}

int RequestRunner::finish()
{
    const auto timeout = std::chrono::milliseconds(m_platform.options().replyTimeoutMs);
    m_platform.tunnel().waitIdle(timeout);
    int status = m_unanswered ? ExitReplies : ExitOk;
    for (const int number : m_platform.replies().answeredMoreThanOnce()) {
        printError(QStringLiteral("request %1 (%2): %3 replies")
                       .arg(number + 1)
                       .arg(m_commands[static_cast<std::size_t>(number)])
                       .arg(m_platform.replies().replyCount(number)));
        status = ExitReplies;
    }
    return status;
}

#pragma once

#include "HostRequest.h"
#include "ReplyCollector.h"

#include <QString>

#include <optional>
#include <vector>

class HostPlatform;

// Sends requests to the plug-in one after the other, each after the reply
// to the one before, and keeps the account the exit status is made of.
class RequestRunner
{
public:
    explicit RequestRunner(HostPlatform &platform);

    // Sends one request and waits for its first reply. Nothing, with the
    // reason on standard error, when none came within the reply time-out.
    std::optional<ReplyCollector::Reply> send(const HostRequest &request);

    // Sends the requests in order and prints each reply as one line on
    // standard output; stops at the first request left without a reply.
    void run(const std::vector<HostRequest> &requests);

    // Waits for the exchanges still on their way, so that a second reply
    // they would bring is seen, and gives the exit status: ExitOk when every
    // request sent got exactly one reply, else ExitReplies (with each
    // offender on standard error).
    int finish();

private:
    HostPlatform &m_platform;
    std::vector<QString> m_commands;
    bool m_unanswered = false;
};

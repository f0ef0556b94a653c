#pragma once

#include "HostResult.h"

#include <QByteArray>
#include <QString>
#include <QVariant>

#include <optional>
#include <vector>

// One request as plugin-host sends it to the plug-in.
struct HostRequest
{
    QString command;
    // Invalid when the request carries no payload.
    QVariant payload;
    // The requester's client number; the host's default when absent.
    std::optional<qint64> client;
};

// Client numbers are whole numbers that JSON carries exactly: 0 to 2^53,
// written as whole numbers (no fraction, no exponent) in a session as on
// the command line.
std::optional<qint64> clientNumber(const QString &text);

// Reads a session: JSON Lines, one object per line,
// {"command": NAME, "payload": VALUE, "client": N}, "payload" and "client"
// optional, each key once; blank lines are skipped. The whole text is checked before
// anything is sent, so a bad line sends nothing: the requests, or
// "line N: reason".
HostResult<std::vector<HostRequest>> readSession(const QByteArray &text);

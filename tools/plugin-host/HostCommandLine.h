#pragma once

#include "HostResult.h"

#include <QByteArrayList>
#include <QString>
#include <QStringList>

#include <optional>

class QCoreApplication;

// What plugin-host was asked to do: one command word with its arguments and
// the options that shape the local platform.
struct HostOptions
{
    QString command;
    QStringList arguments;
    // The same arguments as the bytes given: a payload is read from these,
    // so that bytes that are not UTF-8 are refused, not made U+FFFD.
    QByteArrayList rawArguments;

    QString pluginFile;
    QString databaseFile;
    QString exchangesFile;
    QString answerLayout;
    QString faults;
    quint64 faultSeed = 1;
    int replyTimeoutMs = 60000;
    qint64 client = 1;
    std::optional<int> traceLevel;
};

// Reads the command line of the running application, whose arguments as
// given (argv) are rawArguments. --help and --version
// print and end the process with status 0; any other mistake gives the
// message for standard error.
HostResult<HostOptions> parseHostCommandLine(const QCoreApplication &app,
                                             const QByteArrayList &rawArguments);

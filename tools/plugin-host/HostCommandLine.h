#pragma once

#include "HostResult.h"

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

// Reads the command line of the running application. --help and --version
// print and end the process with status 0; any other mistake gives the
// message for standard error.
HostResult<HostOptions> parseHostCommandLine(const QCoreApplication &app);

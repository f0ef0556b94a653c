#include "HostOutput.h"

#include <cstdio>

void printLine(const QByteArray &line)
{
    std::fwrite(line.constData(), 1, static_cast<std::size_t>(line.size()), stdout);
    std::fputc('\n', stdout);
    std::fflush(stdout);
}

void printText(const QString &text)
{
    printLine(text.toUtf8());
}

void printError(const QString &message)
{
    const QByteArray line = "plugin-host: " + message.toUtf8() + '\n';
    std::fwrite(line.constData(), 1, static_cast<std::size_t>(line.size()), stderr);
    std::fflush(stderr);
}

#include "HostOutput.h"

#include <cerrno>
#include <cstdio>
#include <cstring>

namespace {

// Set by the first write to standard output that fails; written on the
// main thread only.
std::optional<QString> outputFailure;

} // namespace

void printLine(const QByteArray &line)
{
    const std::size_t size = static_cast<std::size_t>(line.size());
    errno = 0;
    const bool written = std::fwrite(line.constData(), 1, size, stdout) == size &&
                         std::fputc('\n', stdout) != EOF && std::fflush(stdout) == 0;
    if (!written && !outputFailure)
        outputFailure = QString::fromLocal8Bit(std::strerror(errno != 0 ? errno : EIO));
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

std::optional<QString> standardOutputFailure()
{
    return outputFailure;
}

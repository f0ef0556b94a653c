#include "LoggerFile.h"

#include "ProbeRun.h"

#include <cstdio>

LoggerFile::LoggerFile(int threshold) : m_path(m_dir.filePath(QStringLiteral("trace.log")))
{
    std::FILE *stream = std::fopen(m_path.toLocal8Bit().constData(), "a");
    m_logger = std::make_unique<TraceLogger>(TraceLogger::Destination{stream, stream != nullptr},
                                             threshold);
}

QStringList LoggerFile::lines() const
{
    return fileLines(m_path);
}

bool LoggerFile::record(std::uint32_t selector, const char *sourceFile, int sourceLine,
                        const char *format, ...)
{
    if (!m_logger->wants(selector, sourceFile, sourceLine))
        return false;
    std::va_list args;
    va_start(args, format);
    m_logger->write(format, args);
    va_end(args);
    return true;
}

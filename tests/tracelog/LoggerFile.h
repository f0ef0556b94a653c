#pragma once

#include "TraceLogger.h"

#include <QStringList>
#include <QTemporaryDir>

#include <cstdarg>
#include <memory>

// A TraceLogger writing into a file of a temporary directory.
class LoggerFile
{
public:
    explicit LoggerFile(int threshold = TraceLogger::DefaultThreshold);

    TraceLogger &logger() { return *m_logger; }
    QStringList lines() const;

    // What a module does for one record: ask, then write if wanted.
    bool record(std::uint32_t selector, const char *sourceFile, int sourceLine, const char *format,
                ...);

private:
    QTemporaryDir m_dir;
    QString m_path;
    std::unique_ptr<TraceLogger> m_logger;
};

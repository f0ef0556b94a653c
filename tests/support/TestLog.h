#pragma once

#include "LogTraceObject.h"

#include <QList>
#include <QStringList>

#include <cstdint>
#include <functional>
#include <mutex>

// A log object that keeps every record the plug-in's trace facility writes
// while it is attached; the destructor turns logging off again.
class TestLog
{
public:
    struct Record
    {
        std::uint32_t selector;
        QString sourceFile;
        int sourceLine;
        QString text;
        int level() const { return static_cast<int>(selector & 0xff); }
    };

    explicit TestLog(std::int32_t moduleId = 7);
    ~TestLog();
    TestLog(const TestLog &) = delete;
    TestLog &operator=(const TestLog &) = delete;

    void attach();
    // Records for which the filter returns non-zero are not wanted.
    void setFilter(std::function<std::int32_t(std::uint32_t selector)> filter);

    QList<Record> records() const;
    // Texts of the records at one level, or of all when level is 0.
    QStringList texts(int level = 0) const;
    int filterCalls() const;

    LogTraceObject object{};

private:
    static void write(void *context, const char *format, ...);

    mutable std::mutex m_mutex;
    std::int32_t m_moduleId;
    std::function<std::int32_t(std::uint32_t)> m_filter;
    QList<Record> m_records;
    int m_filterCalls = 0;
};

#pragma once

#include "LogTraceObject.h"

#include <QList>
#include <QString>

#include <cstdint>
#include <functional>
#include <mutex>

// A log object for tests: keeps every record the plug-in writes through the
// trace facility. attach() makes it the plug-in's log object; the destructor
// turns logging off again.
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

    // withRegister: whether the object offers a register function.
    explicit TestLog(std::int32_t moduleId = 7, bool withRegister = true);
    ~TestLog();
    TestLog(const TestLog &) = delete;
    TestLog &operator=(const TestLog &) = delete;

    void attach();
    // Records for which the filter returns non-zero are not wanted.
    void setFilter(std::function<std::int32_t(std::uint32_t selector)> filter);

    QList<Record> records() const;
    QStringList texts() const;
    // Texts of records at one level.
    QStringList texts(int level) const;
    int filterCalls() const;
    void clear();

    LogTraceObject object{};

private:
    static void registerModule(void *context, std::int32_t kind, const char *name,
                               std::int32_t *moduleId);
    static std::int32_t filter(void *context, std::uint32_t selector, std::int32_t reserved,
                               const char *file, std::int32_t line);
    static void write(void *context, const char *format, ...);

    mutable std::mutex m_mutex;
    std::int32_t m_moduleId;
    std::function<std::int32_t(std::uint32_t)> m_filter;
    QList<Record> m_records;
    int m_filterCalls = 0;
};

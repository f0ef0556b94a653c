#include "TestLog.h"

#include "TraceLog.h"

#include <cstdarg>
#include <cstdio>

namespace {
// As in the real library, a record's selector and origin travel from the
// filter call to the write call that follows it on the same thread.
thread_local TestLog::Record t_pending{};
} // namespace

TestLog::TestLog(std::int32_t moduleId) : m_moduleId(moduleId)
{
    object.context = this;
    object.registerModule = [](void *context, std::int32_t, const char *, std::int32_t *id) {
        if (context && id)
            *id = static_cast<TestLog *>(context)->m_moduleId;
    };
    object.filter = [](void *context, std::uint32_t selector, std::int32_t, const char *file,
                       std::int32_t line) -> std::int32_t {
        auto *self = static_cast<TestLog *>(context);
        const std::lock_guard<std::mutex> lock(self->m_mutex);
        ++self->m_filterCalls;
        if (self->m_filter && self->m_filter(selector) != 0)
            return 1;
        t_pending = Record{selector, QString::fromUtf8(file), line, QString()};
        return 0;
    };
    object.write = &TestLog::write;
}

TestLog::~TestLog()
{
    TraceLog::attach(nullptr);
}

void TestLog::attach()
{
    TraceLog::attach(&object);
}

void TestLog::setFilter(std::function<std::int32_t(std::uint32_t)> filter)
{
    const std::lock_guard<std::mutex> lock(m_mutex);
    m_filter = std::move(filter);
}

QList<TestLog::Record> TestLog::records() const
{
    const std::lock_guard<std::mutex> lock(m_mutex);
    return m_records;
}

QStringList TestLog::texts(int level) const
{
    QStringList result;
    for (const Record &r : records()) {
        if (level == 0 || r.level() == level)
            result << r.text;
    }
    return result;
}

void TestLog::write(void *context, const char *format, ...)
{
    char buffer[4096];
    va_list args;
    va_start(args, format);
    std::vsnprintf(buffer, sizeof buffer, format, args);
    va_end(args);
    auto *self = static_cast<TestLog *>(context);
    const std::lock_guard<std::mutex> lock(self->m_mutex);
    self->m_records.append(t_pending);
    self->m_records.back().text = QString::fromLocal8Bit(buffer);
}

int TestLog::filterCalls() const
{
    const std::lock_guard<std::mutex> lock(m_mutex);
    return m_filterCalls;
}

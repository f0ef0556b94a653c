#pragma once

#include <cstdarg>
#include <cstdint>
#include <cstdio>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

// The trace-log library's one logger. Modules register by name; before each
// record a module asks wants() with its selector (module id << 8 | level) and
// only then formats the record through write() on the same thread. Any thread
// may call any member at any time.
class TraceLogger
{
public:
    // Where records go: nowhere, or a stream that is closed with the logger
    // when owned.
    struct Destination
    {
        std::FILE *stream = nullptr;
        bool owned = false;
    };

    // Longest record text; longer ones are cut and marked.
    static constexpr std::size_t MaxText = std::size_t{16} * 1024;
    static constexpr int DefaultThreshold = 2;

    TraceLogger(Destination destination, int threshold);
    ~TraceLogger();
    TraceLogger(const TraceLogger &) = delete;
    TraceLogger &operator=(const TraceLogger &) = delete;

    // QIRNLOG_FILE and QIRNLOG_LEVEL, read now; see README.md.
    static std::unique_ptr<TraceLogger> fromEnvironment();

    // The module's identifier, 1 and up; the same name always gets the same
    // one. 0 for a null name or when identifiers run out.
    std::int32_t registerModule(const char *name);

    // True when records of this selector's level are written; the selector
    // and origin are then kept for the next write() on this thread.
    bool wants(std::uint32_t selector, const char *sourceFile, int sourceLine);

    // Writes one record line for the selector that wants() last accepted on
    // this thread; dropped when there is none.
    void write(const char *format, std::va_list args);

private:
    std::string moduleName(std::uint32_t moduleId) const;

    Destination m_destination;
    const int m_threshold;
    mutable std::mutex m_mutex;
    std::vector<std::string> m_modules;
};

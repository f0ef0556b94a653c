#pragma once

// The plug-in's diagnostics, written through the host's trace-log library.
// When the library, its export or its object is missing, logging is off and
// nothing else changes.

#include "LogTraceObject.h"

#include <cstdint>

namespace TraceLog {

enum Level : std::uint32_t { Error = 2, Trace = 5 };

// Takes the library's object: registers the module and keeps the object for
// every later record. Start-up calls it once; tests hand in their own object.
// Null turns logging off.
void attach(LogTraceObject *object);
std::int32_t moduleId();

// Asks the library's filter whether a record is wanted and returns the log
// object to write it through, or null. Nothing is formatted before the
// filter says yes.
const LogTraceObject *wanted(Level level, const char *sourceFile, int sourceLine);

// Writes "%s, Enter" on construction and "%s, Leave" (line 0) when the scope
// is left by any path, an exception included.
class Scope
{
public:
    Scope(const char *sourceFile, const char *function, int sourceLine);
    ~Scope();
    Scope(const Scope &) = delete;
    Scope &operator=(const Scope &) = delete;

private:
    const char *m_sourceFile;
    const char *m_function;
};

} // namespace TraceLog

// Writes one error record. The format must be a string literal of ours:
// untrusted text only ever travels as an argument. Arguments are evaluated
// only when the filter wants the record.
#define TRACE_ERROR(format, ...)                                                                   \
    do {                                                                                           \
        if (const LogTraceObject *traceObject_ =                                                   \
                TraceLog::wanted(TraceLog::Error, __FILE__, __LINE__);                             \
            traceObject_ && traceObject_->write)                                                   \
            traceObject_->write(traceObject_->context, "" format, ##__VA_ARGS__);                  \
    } while (false)

#define TRACE_SCOPE(function) const TraceLog::Scope traceScope_(__FILE__, function, __LINE__)

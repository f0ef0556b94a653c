// The library's one export and the global object it hands out.

#include "LogTraceObject.h"
#include "TraceLogger.h"

#include <cstdarg>

namespace {

void registerModule(void *context, std::int32_t, const char *moduleName, std::int32_t *moduleId)
{
    if (context && moduleId)
        *moduleId = static_cast<TraceLogger *>(context)->registerModule(moduleName);
}

std::int32_t filter(void *context, std::uint32_t selector, std::int32_t, const char *sourceFile,
                    std::int32_t sourceLine)
{
    if (!context)
        return 1;
    return static_cast<TraceLogger *>(context)->wants(selector, sourceFile, sourceLine) ? 0 : 1;
}

void write(void *context, const char *format, ...)
{
    if (!context)
        return;
    std::va_list args;
    va_start(args, format);
    static_cast<TraceLogger *>(context)->write(format, args);
    va_end(args);
}

} // namespace

extern "C" __attribute__((visibility("default"))) void
LogTrace_GetGlobalObject(std::int32_t, LogTraceObject **object)
{
    // Configuration is read once, at the first call; the object lives until
    // the library unloads.
    static const std::unique_ptr<TraceLogger> logger = TraceLogger::fromEnvironment();
    static LogTraceObject global{logger.get(), &registerModule, &filter, &write};
    if (object)
        *object = &global;
}

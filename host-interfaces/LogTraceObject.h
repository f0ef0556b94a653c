#pragma once

#include <cstdint>

// The trace-log library's global object as a module sees it. Every member may
// be null. The library owns the object; it lives until the library unloads.
extern "C" {

using LogTraceRegisterFn = void (*)(void *context, std::int32_t kind, const char *moduleName,
                                    std::int32_t *moduleId);
// 0 means the record is wanted. selector = module id << 8 | level.
using LogTraceFilterFn = std::int32_t (*)(void *context, std::uint32_t selector,
                                          std::int32_t reserved, const char *sourceFile,
                                          std::int32_t sourceLine);
// Writes one printf-style record for the selector last passed to the filter
// on this thread.
using LogTraceWriteFn = void (*)(void *context, const char *format, ...);

struct LogTraceObject
{
    void *context;
    LogTraceRegisterFn registerModule;
    LogTraceFilterFn filter;
    LogTraceWriteFn write;
};

// The library's one export: stores its global object in *object.
using LogTraceGetGlobalObjectFn = void (*)(std::int32_t reserved, LogTraceObject **object);
}

#define LOG_TRACE_LIBRARY_NAME "QirnLogUtl"
#define LOG_TRACE_GET_GLOBAL_OBJECT "LogTrace_GetGlobalObject"

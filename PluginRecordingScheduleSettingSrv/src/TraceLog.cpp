#include "TraceLog.h"

#include "LogTraceObject.h"

#include <QDir>
#include <QFileInfo>
#include <QLibrary>

#include <atomic>
#include <dlfcn.h>
#include <memory>

namespace TraceLog {
namespace {

// Written at start-up (or by a test before it starts threads), read after.
std::atomic<LogTraceObject *> g_object{nullptr};
// Atomic: a test re-attaches while answers of an earlier one may still log.
std::atomic<std::int32_t> g_moduleId{0};

constexpr std::int32_t RegisterKind = 19;
constexpr const char *ModuleName = "RecordingScheduleSettingSrv";

QString pluginDirectory()
{
    Dl_info info{};
    if (dladdr(reinterpret_cast<void *>(&pluginDirectory), &info) == 0 || !info.dli_fname)
        return {};
    return QFileInfo(QString::fromLocal8Bit(info.dli_fname)).absolutePath();
}

// Loads the trace-log library when the plug-in library loads and frees it
// when the plug-in library unloads. It is looked for beside the plug-in file
// first, then by name through the system's library search path.
class LibraryHolder
{
public:
    LibraryHolder()
    {
        const QString besidePlugin =
            QDir(pluginDirectory()).filePath(QStringLiteral(LOG_TRACE_LIBRARY_NAME));
        for (const QString &name : {besidePlugin, QStringLiteral(LOG_TRACE_LIBRARY_NAME)}) {
            auto library = std::make_unique<QLibrary>(name);
            if (library->load()) {
                m_library = std::move(library);
                break;
            }
        }
        if (!m_library)
            return;
        const auto getObject = reinterpret_cast<LogTraceGetGlobalObjectFn>(
            m_library->resolve(LOG_TRACE_GET_GLOBAL_OBJECT));
        if (!getObject)
            return;
        LogTraceObject *object = nullptr;
        getObject(0, &object);
        attach(object);
    }

    ~LibraryHolder()
    {
        if (!m_library)
            return;
        g_object.store(nullptr);
        m_library->unload();
    }

    LibraryHolder(const LibraryHolder &) = delete;
    LibraryHolder &operator=(const LibraryHolder &) = delete;

private:
    std::unique_ptr<QLibrary> m_library;
};

const LibraryHolder g_library;

} // namespace

void attach(LogTraceObject *object)
{
    std::int32_t id = 0;
    if (object && object->registerModule)
        object->registerModule(object->context, RegisterKind, ModuleName, &id);
    g_moduleId.store(id);
    g_object.store(object);
}

std::int32_t moduleId()
{
    return g_moduleId.load();
}

const LogTraceObject *wanted(Level level, const char *sourceFile, int sourceLine)
{
    const LogTraceObject *object = g_object.load();
    if (!object || !object->context || !object->filter)
        return nullptr;
    const auto selector = static_cast<std::uint32_t>(g_moduleId.load()) << 8 | level;
    return object->filter(object->context, selector, 0, sourceFile, sourceLine) == 0 ? object
                                                                                     : nullptr;
}

Scope::Scope(const char *sourceFile, const char *function, int sourceLine)
    : m_sourceFile(sourceFile), m_function(function)
{
    const LogTraceObject *object = wanted(Trace, m_sourceFile, sourceLine);
    if (object && object->write)
        object->write(object->context, "%s, Enter", m_function);
}

Scope::~Scope()
{
    const LogTraceObject *object = wanted(Trace, m_sourceFile, 0);
    if (object && object->write)
        object->write(object->context, "%s, Leave", m_function);
}

} // namespace TraceLog

// Runs in a child process of the trace-log tests, so that each run reads the
// QIRNLOG_* environment afresh:
//   qirnlog_probe library <libQirnLogUtl.so> [threads]
//   qirnlog_probe plugin <plug-in file>
// It prints what it saw on standard output, one fact a line.

#include "IPluginObjectBase.h"
#include "LogTraceObject.h"
#include "RequestSenderInfo.h"

#include <QCoreApplication>
#include <QLibrary>
#include <QPluginLoader>

#include <cstdio>
#include <thread>
#include <vector>

namespace {

constexpr std::uint32_t Error = 2;
constexpr std::uint32_t Trace = 5;

int wants(const LogTraceObject *log, std::int32_t module, std::uint32_t level, int line)
{
    return log->filter(log->context, static_cast<std::uint32_t>(module) << 8 | level, 0,
                       "/src/probe/Probe.cpp", line);
}

int probeLibrary(const QString &path, bool threaded)
{
    QLibrary library(path);
    const auto getObject =
        reinterpret_cast<LogTraceGetGlobalObjectFn>(library.resolve(LOG_TRACE_GET_GLOBAL_OBJECT));
    if (!getObject) {
        std::printf("no export\n");
        return 1;
    }
    LogTraceObject *log = nullptr;
    LogTraceObject *again = nullptr;
    getObject(0, &log);
    getObject(0, &again);
    std::printf("same object=%d\n", log && log == again);
    if (!log || !log->registerModule || !log->filter || !log->write)
        return 1;

    std::int32_t probe = 0;
    std::int32_t other = 0;
    std::int32_t probeAgain = 0;
    log->registerModule(log->context, 19, "Probe", &probe);
    log->registerModule(log->context, 19, "Other", &other);
    log->registerModule(log->context, 19, "Probe", &probeAgain);
    std::printf("ids=%d,%d,%d\n", probe, other, probeAgain);

    const int errorWanted = wants(log, probe, Error, 10);
    if (errorWanted == 0)
        log->write(log->context, "%s, code:%s", "Probe::error", "%n%s\nforged");
    const int traceWanted = wants(log, probe, Trace, 11);
    if (traceWanted == 0)
        log->write(log->context, "%s, Enter", "Probe::trace");
    std::printf("filter error=%d trace=%d\n", errorWanted, traceWanted);
    std::fflush(stdout);

    if (threaded) {
        std::vector<std::thread> writers;
        for (int t = 0; t < 4; ++t) {
            writers.emplace_back([log, probe, t] {
                const std::string filler(300, static_cast<char>('a' + t));
                for (int i = 0; i < 2000; ++i) {
                    if (wants(log, probe, Error, 100 + t) == 0)
                        log->write(log->context, "writer %d record %d %s", t, i, filler.c_str());
                }
            });
        }
        for (std::thread &writer : writers)
            writer.join();
    }
    return 0;
}

int probePlugin(const QString &path)
{
    QPluginLoader loader(path);
    auto *plugin = qobject_cast<IPluginObjectBase *>(loader.instance());
    std::printf("loaded=%d\n", plugin != nullptr);
    if (!plugin) {
        std::printf("error=%s\n", qPrintable(loader.errorString()));
        return 1;
    }
    std::printf("initialised=%d\n", plugin->InitialPluginBase(nullptr));
    int replies = 0;
    QString code;
    plugin->Request(QStringLiteral("NoSuchCommand"), QVariant(), RequestSenderInfo{},
                    [&](bool, const QString &resultCode, const QString &, const QVariant &) {
                        ++replies;
                        code = resultCode;
                    });
    std::printf("replies=%d code=%s\n", replies, qPrintable(code));
    return 0;
}

} // namespace

int main(int argc, char **argv)
{
    QCoreApplication app(argc, argv);
    const QStringList args = app.arguments();
    if (args.size() >= 3 && args[1] == QLatin1String("library"))
        return probeLibrary(args[2], args.size() >= 4 && args[3] == QLatin1String("threads"));
    if (args.size() >= 3 && args[1] == QLatin1String("plugin"))
        return probePlugin(args[2]);
    std::fprintf(stderr, "usage: qirnlog_probe library|plugin PATH [threads]\n");
    return 2;
}

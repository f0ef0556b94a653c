// The trace-log library as plugin-host's plug-in reaches it, and the plug-in's
// own trace facility. Tests named *Threads* carry the label "threads".

#include "TestLog.h"
#include "TraceLog.h"

#include <QFile>
#include <QJsonDocument>
#include <QJsonObject>
#include <QLibrary>
#include <QProcess>
#include <QRegularExpression>
#include <QTemporaryDir>

#include <gtest/gtest.h>

#include <stdexcept>
#include <thread>

namespace {

// The records of a trace text, each without its time stamp and origin.
QStringList traceRecords(const QByteArray &text)
{
    static const QRegularExpression stampAndOrigin(
        R"(^\d{4}-\d\d-\d\dT\d\d:\d\d:\d\d\.\d{3}Z (\S+ \d+) \S+:\d+ )",
        QRegularExpression::MultilineOption);
    return QString::fromUtf8(text).replace(stampAndOrigin, "\\1 ").split('\n', Qt::SkipEmptyParts);
}

// How the plug-in finds the library, and how QIRNLOG_FILE and QIRNLOG_LEVEL
// configure it, seen in the records of a request with unreadable time frames.
enum class Placement { BesideLibrary, Alone, AloneOnLibraryPath };

struct HostRow
{
    const char *name;
    const char *file; // "log": a file in a temporary folder; null: unset
    const char *level;
    Placement placement;
    QStringList records;
    QString timeframes = "x";
    friend void PrintTo(const HostRow &row, std::ostream *out) { *out << row.name; }
};

class PluginInHost : public testing::TestWithParam<HostRow>
{};

TEST_P(PluginInHost, TracesThroughTheLibraryWhenItIsThere)
{
    const HostRow &row = GetParam();
    QTemporaryDir dir;
    QString plugin = RECSCHED_PLUGIN;
    QProcessEnvironment env = QProcessEnvironment::systemEnvironment();
    for (const char *key : {"QIRNLOG_FILE", "QIRNLOG_LEVEL", "LD_LIBRARY_PATH"})
        env.remove(key);
    if (row.placement != Placement::BesideLibrary) {
        plugin = dir.filePath("plugin.so");
        ASSERT_TRUE(QFile::copy(RECSCHED_PLUGIN, plugin));
    }
    if (row.placement == Placement::AloneOnLibraryPath)
        env.insert("LD_LIBRARY_PATH", QFileInfo(QIRNLOG_LIBRARY).absolutePath());
    if (row.file)
        env.insert("QIRNLOG_FILE",
                   row.file == QLatin1String("log") ? dir.filePath("log") : row.file);
    if (row.level)
        env.insert("QIRNLOG_LEVEL", row.level);
    const QJsonObject payload{{"ScheduleName", "A"}, {"timeframes", row.timeframes}};
    QProcess host;
    host.setProcessEnvironment(env);
    host.start(PLUGIN_HOST, {"--db", dir.filePath("db"), "--plugin", plugin, "request",
                             "AddSchedule", QJsonDocument(payload).toJson()});
    ASSERT_TRUE(host.waitForFinished(60000));
    EXPECT_EQ(host.exitCode(), 0);
    QFile log(dir.filePath("log"));
    QByteArray text = host.readAllStandardError();
    if (row.file != QLatin1String("stderr"))
        text = log.open(QIODevice::ReadOnly) ? log.readAll() : QByteArray();
    EXPECT_EQ(traceRecords(text), row.records);
}

const QString kModule = "RecordingScheduleSettingSrv ";
const QStringList kError = {kModule + "2 Time frames parse error. x"};
const QString kForged = "%n%s\n2024-01-01T00:00:00.000Z Forged 2 y:1 z\r\t\\\x1b";
const QStringList kForgedRecord = {
    kModule +
    R"(2 Time frames parse error. %n%s\n2024-01-01T00:00:00.000Z Forged 2 y:1 z\r\t\\\x1b)"};

const QString kCut(20000, 'x');
const QStringList kCutRecord = {kModule + "2 Time frames parse error. " + kCut.left(16384 - 25) +
                                "...(cut)"};

const HostRow hostRows[] = {
    {"nothing_set_writes_nothing", nullptr, nullptr, Placement::BesideLibrary, {}},
    {"file_at_the_default_level_2", "log", nullptr, Placement::BesideLibrary, kError},
    {"unreadable_level_is_the_default", "log", "verbose", Placement::BesideLibrary, kError},
    {"level_1_keeps_errors_out", "log", "1", Placement::BesideLibrary, {}},
    {"unwritable_path_writes_nothing", "/nonexistent/log", "5", Placement::BesideLibrary, {}},
    {"stderr_at_the_default_level", "stderr", nullptr, Placement::BesideLibrary, kError},
    {"plugin_without_the_library_writes_nothing", "log", "5", Placement::Alone, {}},
    {"library_found_on_the_library_path", "log", "2", Placement::AloneOnLibraryPath, kError},
    {"client_text_cannot_forge_or_split_a_record", "log", "2", Placement::BesideLibrary,
     kForgedRecord, kForged},
    {"client_text_over_16_KiB_is_cut_and_marked", "log", "2", Placement::BesideLibrary, kCutRecord,
     kCut},
};

INSTANTIATE_TEST_SUITE_P(QirnLogUtl, PluginInHost, testing::ValuesIn(hostRows),
                         [](const auto &info) { return info.param.name; });

TEST(QirnLogUtl, ExportsOnlyTheGlobalObjectFunction)
{
    QLibrary library(QIRNLOG_LIBRARY);
    EXPECT_NE(library.resolve("LogTrace_GetGlobalObject"), nullptr);
    EXPECT_EQ(library.resolve("_ZN11TraceLogger14registerModuleEPKc"), nullptr);
}

// Each writer also writes once more after each record, and once after a
// refused filter call: neither may appear, whatever the other threads asked.
TEST(QirnLogUtlThreads, ConcurrentWritersGiveWholeLinesOnlyAfterTheirOwnFilterCall)
{
    // The library reads its configuration when the process starts.
    const QString path = qEnvironmentVariable("QIRNLOG_FILE");
    if (path.isEmpty())
        GTEST_SKIP() << "CTest runs it with QIRNLOG_FILE set";
    ASSERT_TRUE(QFile::resize(path, 0));
    QLibrary library(QIRNLOG_LIBRARY);
    LogTraceObject *log = nullptr;
    reinterpret_cast<LogTraceGetGlobalObjectFn>(library.resolve("LogTrace_GetGlobalObject"))(0,
                                                                                             &log);
    ASSERT_NE(log, nullptr);
    std::int32_t module = 0;
    log->registerModule(log->context, 0, "Mod", &module);
    std::vector<std::thread> writers;
    writers.reserve(4);
    for (int t = 0; t < 4; ++t) {
        writers.emplace_back([log, module, t] {
            const std::string filler(300, static_cast<char>('a' + t));
            for (int i = 0; i < 2000; ++i) {
                if (log->filter(log->context, module << 8 | 2, 0, "w.cpp", t) == 0)
                    log->write(log->context, "%d %s", i, filler.c_str());
                log->write(log->context, "a second write for one filter call");
                if (log->filter(log->context, module << 8 | 5, 0, "w.cpp", t) != 0)
                    log->write(log->context, "after a refused filter call");
            }
        });
    }
    for (std::thread &writer : writers)
        writer.join();
    QFile file(path);
    ASSERT_TRUE(file.open(QIODevice::ReadOnly));
    const QStringList records = traceRecords(file.readAll());
    ASSERT_EQ(records.size(), 4 * 2000);
    const QRegularExpression whole("^Mod 2 \\d+ (a{300}|b{300}|c{300}|d{300})$");
    for (const QString &record : records)
        ASSERT_TRUE(whole.match(record).hasMatch()) << record.toStdString();
}

int g_line = 0;

void traced(int value)
{
    g_line = __LINE__ + 1;
    TRACE_SCOPE("Sample::traced");
    TRACE_ERROR("%s, failed with %d", "Sample::traced", value);
    throw std::runtime_error("left by an exception");
}

TEST(TraceFacility, ScopeWritesEnterAndLeaveOnEveryPathWithModuleLevelAndOrigin)
{
    TestLog log(7);
    log.attach();
    EXPECT_THROW(traced(3), std::runtime_error);
    const QList<TestLog::Record> records = log.records();
    ASSERT_EQ(records.size(), 3);
    const auto expect = [&](int i, std::uint32_t selector, int line, const char *text) {
        EXPECT_EQ(records[i].selector, selector);
        EXPECT_EQ(records[i].sourceFile, __FILE__);
        EXPECT_EQ(records[i].sourceLine, line);
        EXPECT_EQ(records[i].text, text);
    };
    expect(0, 7 << 8 | 5, g_line, "Sample::traced, Enter");
    expect(1, 7 << 8 | 2, g_line + 1, "Sample::traced, failed with 3");
    expect(2, 7 << 8 | 5, 0, "Sample::traced, Leave");
}

TEST(TraceFacility, AsksTheFilterBeforeAnyArgumentIsEvaluated)
{
    TestLog log;
    log.setFilter([](std::uint32_t) { return 1; });
    log.attach();
    int evaluated = 0;
    TRACE_ERROR("%d", ++evaluated);
    EXPECT_EQ(evaluated, 0);
    EXPECT_EQ(log.filterCalls(), 1);
    EXPECT_TRUE(log.records().isEmpty());
}

} // namespace

// The trace-log library as the plug-in reaches it in plugin-host, the record
// lines it writes, and the plug-in's own trace facility. Tests named
// *Threads* carry the label "threads".

#include "TestLog.h"
#include "TraceLog.h"
#include "TraceLogger.h"

#include <QFile>
#include <QLibrary>
#include <QProcess>
#include <QRegularExpression>
#include <QTemporaryDir>

#include <gtest/gtest.h>

#include <cstdarg>
#include <stdexcept>
#include <thread>

namespace {

// The records of a trace text, each without its time stamp.
QStringList traceRecords(const QByteArray &text)
{
    static const QRegularExpression stamp(R"(^\d{4}-\d\d-\d\dT\d\d:\d\d:\d\d\.\d{3}Z )");
    QStringList records;
    for (const QString &line : QString::fromUtf8(text).split('\n', Qt::SkipEmptyParts))
        records << (stamp.match(line).hasMatch() ? line.mid(25) : "no time stamp: " + line);
    return records;
}

// What the library's write function does with a record.
void writeRecord(TraceLogger &logger, const char *format, ...)
{
    std::va_list args;
    va_start(args, format);
    logger.write(format, args);
    va_end(args);
}

struct LoggedFile
{
    explicit LoggedFile(int threshold) : logger({file, false}, threshold) {}
    ~LoggedFile() { std::fclose(file); }
    QStringList records()
    {
        QByteArray text(static_cast<qsizetype>(std::ftell(file)), '\0');
        std::rewind(file);
        text.resize(static_cast<qsizetype>(std::fread(text.data(), 1, text.size(), file)));
        return traceRecords(text);
    }

    std::FILE *file = std::tmpfile();
    TraceLogger logger;
};

struct RecordRow
{
    const char *name;
    int threshold;
    std::uint32_t level;
    const char *format;
    std::string argument;
    QStringList records;
};

TEST(TraceLogger, WritesEachRecordAsOneEscapedLine)
{
    const RecordRow rows[] = {
        {"errors at the default threshold",
         2,
         2,
         "%s, failed",
         "Ctl::Hdlr",
         {"Mod 2 a.cpp:7 Ctl::Hdlr, failed"}},
        {"no Enter and Leave at the default threshold", 2, 5, "%s, Enter", "Ctl::Hdlr", {}},
        {"Enter and Leave at threshold 5", 5, 5, "%s, Enter", "Ctl", {"Mod 5 a.cpp:7 Ctl, Enter"}},
        {"threshold 0 keeps level 1 out", 0, 1, "%s", "x", {}},
        {"conversions in an argument are literal",
         2,
         2,
         "code:%s",
         "%n%s%x",
         {"Mod 2 a.cpp:7 code:%n%s%x"}},
        {"line breaks in an argument cannot forge a record",
         2,
         2,
         "content:%s",
         "a\nb\r\n2024-01-01T00:00:00.000Z Forged 2 x:1 y",
         {"Mod 2 a.cpp:7 content:a\\nb\\r\\n2024-01-01T00:00:00.000Z Forged 2 x:1 y"}},
        {"control characters and backslashes are escaped",
         2,
         2,
         "%s",
         "t\tb\\e\x1b",
         {"Mod 2 a.cpp:7 t\\tb\\\\e\\x1b"}},
        {"text over 16 KiB is cut and marked",
         2,
         2,
         "%s",
         std::string(20000, 'x'),
         {"Mod 2 a.cpp:7 " + QString(16384, 'x') + "...(cut)"}},
    };
    for (const RecordRow &row : rows) {
        SCOPED_TRACE(row.name);
        LoggedFile logged(row.threshold);
        const auto module = static_cast<std::uint32_t>(logged.logger.registerModule("Mod"));
        if (logged.logger.wants(module << 8 | row.level, "/src/ctl/a.cpp", 7))
            writeRecord(logged.logger, row.format, row.argument.c_str());
        EXPECT_EQ(logged.records(), row.records);
    }
}

TEST(QirnLogUtl, ExportsOnlyTheGlobalObjectFunction)
{
    QLibrary library(QIRNLOG_LIBRARY);
    EXPECT_NE(library.resolve("LogTrace_GetGlobalObject"), nullptr);
    EXPECT_EQ(library.resolve("_ZN11TraceLogger14registerModuleEPKc"), nullptr);
}

// How plugin-host's plug-in finds the library, and how QIRNLOG_FILE and
// QIRNLOG_LEVEL configure it, seen in the records of one refused request.
enum class Placement { BesideLibrary, Alone, AloneOnLibraryPath };

struct HostRow
{
    const char *name;
    const char *file; // "log": a file in a temporary folder; null: unset
    const char *level;
    Placement placement;
    QStringList records;
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
    QProcess host;
    host.setProcessEnvironment(env);
    host.start(PLUGIN_HOST, {"--db", dir.filePath("db"), "--plugin", plugin, "request",
                             "AddSchedule", R"({"ScheduleName": "A", "timeframes": "x"})"});
    ASSERT_TRUE(host.waitForFinished(60000));
    EXPECT_EQ(host.exitCode(), 0);
    QFile log(dir.filePath("log"));
    QByteArray text = host.readAllStandardError();
    if (row.file != QLatin1String("stderr"))
        text = log.open(QIODevice::ReadOnly) ? log.readAll() : QByteArray();
    // Which source file writes a record is the plug-in's own affair.
    EXPECT_EQ(traceRecords(text).replaceInStrings(QRegularExpression(" \\S+:\\d+ "), " "),
              row.records);
}

const QStringList kErrors = {"RecordingScheduleSettingSrv 2 Time frames parse error. x"};
const QStringList kAll = {
    "RecordingScheduleSettingSrv 5 PluginRecordingScheduleSettingSrv::InitialPluginBase, Enter",
    "RecordingScheduleSettingSrv 5 PluginRecordingScheduleSettingSrv::InitialPluginBase, Leave",
    "RecordingScheduleSettingSrv 5 PluginRecordingScheduleSettingSrv::Request, Enter",
    "RecordingScheduleSettingSrv 2 Time frames parse error. x",
    "RecordingScheduleSettingSrv 5 PluginRecordingScheduleSettingSrv::Request, Leave",
    "RecordingScheduleSettingSrv 5 "
    "PluginRecordingScheduleSettingSrv::~PluginRecordingScheduleSettingSrv, Enter",
    "RecordingScheduleSettingSrv 5 "
    "PluginRecordingScheduleSettingSrv::~PluginRecordingScheduleSettingSrv, Leave",
};

const HostRow hostRows[] = {
    {"nothing_set_writes_nothing", nullptr, nullptr, Placement::BesideLibrary, {}},
    {"a_level_alone_writes_nothing", nullptr, "5", Placement::BesideLibrary, {}},
    {"file_at_the_default_level", "log", nullptr, Placement::BesideLibrary, kErrors},
    {"unreadable_level_is_the_default", "log", "verbose", Placement::BesideLibrary, kErrors},
    {"file_at_level_1", "log", "1", Placement::BesideLibrary, {}},
    {"unwritable_path_writes_nothing", "/nonexistent/dir/log", "5", Placement::BesideLibrary, {}},
    {"stderr_at_level_5", "stderr", "5", Placement::BesideLibrary, kAll},
    {"plugin_without_the_library_writes_nothing", "log", "5", Placement::Alone, {}},
    {"library_found_on_the_library_path", "log", "5", Placement::AloneOnLibraryPath, kAll},
};

INSTANTIATE_TEST_SUITE_P(QirnLogUtl, PluginInHost, testing::ValuesIn(hostRows),
                         [](const auto &info) { return info.param.name; });

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

TEST(TraceFacility, AsksTheFilterFirstAndIsSilentWithoutAWholeLogObject)
{
    const struct
    {
        const char *name;
        void (*silence)(TestLog &);
        int filterCalls;
    } rows[] = {
        {"filter says no", [](TestLog &log) { log.setFilter([](std::uint32_t) { return 1; }); }, 3},
        {"no filter function", [](TestLog &log) { log.object.filter = nullptr; }, 0},
        {"no context", [](TestLog &log) { log.object.context = nullptr; }, 0},
        {"no write function", [](TestLog &log) { log.object.write = nullptr; }, 3},
    };
    for (const auto &row : rows) {
        SCOPED_TRACE(row.name);
        TestLog log;
        row.silence(log);
        log.attach();
        int evaluated = 0;
        {
            TRACE_SCOPE("Sample::scope");
            TRACE_ERROR("%d", ++evaluated);
        }
        EXPECT_EQ(evaluated, 0);
        EXPECT_TRUE(log.records().isEmpty());
        EXPECT_EQ(log.filterCalls(), row.filterCalls);
    }
}

// Each writer also writes once more after each record, and once after a
// refused filter call: neither may appear, whatever the other threads asked.
TEST(TraceLoggerThreads, ConcurrentWritersGiveWholeLinesOnlyAfterTheirOwnFilterCall)
{
    LoggedFile logged(2);
    std::vector<std::thread> writers;
    for (int t = 0; t < 4; ++t) {
        writers.emplace_back([&logged, t] {
            const std::string filler(300, static_cast<char>('a' + t));
            for (int i = 0; i < 2000; ++i) {
                if (logged.logger.wants(1 << 8 | 2, "w.cpp", t))
                    writeRecord(logged.logger, "%d %s", i, filler.c_str());
                writeRecord(logged.logger, "a second write for one filter call");
                if (!logged.logger.wants(1 << 8 | 5, "w.cpp", t))
                    writeRecord(logged.logger, "after a refused filter call");
            }
        });
    }
    for (std::thread &writer : writers)
        writer.join();
    int next[4] = {};
    const QStringList records = logged.records();
    ASSERT_EQ(records.size(), 4 * 2000);
    for (const QString &record : records) {
        const int t = record.mid(11, 1).toInt();
        ASSERT_EQ(
            record,
            QString("#1 2 w.cpp:%1 %2 %3").arg(t).arg(next[t]++).arg(QString(300, QChar('a' + t))));
    }
}

} // namespace

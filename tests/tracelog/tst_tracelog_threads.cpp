// Records written from several threads at once: each one a whole line, with
// the origin that its own thread's filter call gave.

#include "LoggerFile.h"
#include "ProbeRun.h"
#include "TestLog.h"
#include "TraceLog.h"

#include <QRegularExpression>

#include <gtest/gtest.h>

#include <thread>
#include <vector>

namespace {

constexpr int Writers = 4;
constexpr int RecordsEach = 2000;
constexpr int FillerLength = 300;

// Every line is a whole record of one writer, and each writer's records are
// all there, in its own order.
void expectWholeLines(const QStringList &lines, const QString &module)
{
    ASSERT_EQ(lines.size(), Writers * RecordsEach);
    const QRegularExpression record(RECORD_LINE_PATTERN);
    const QRegularExpression text(QStringLiteral("^writer (\\d) record (\\d+) ([a-z]+)$"));
    int next[Writers] = {};
    for (const QString &line : lines) {
        const QRegularExpressionMatch match = record.match(line);
        ASSERT_TRUE(match.hasMatch()) << line.toStdString();
        EXPECT_EQ(match.captured(1), module);
        const QRegularExpressionMatch body = text.match(match.captured(5));
        ASSERT_TRUE(body.hasMatch()) << line.toStdString();
        const int writer = body.captured(1).toInt();
        ASSERT_LT(writer, Writers);
        EXPECT_EQ(match.captured(4).toInt(), 100 + writer);
        EXPECT_EQ(body.captured(2).toInt(), next[writer]++);
        EXPECT_EQ(body.captured(3), QString(FillerLength, QChar('a' + writer)));
    }
}

TEST(TraceLoggerThreads, ConcurrentWritersGiveWholeLines)
{
    LoggerFile file(2);
    const std::int32_t module = file.logger().registerModule("Mod");
    std::vector<std::thread> writers;
    for (int t = 0; t < Writers; ++t) {
        writers.emplace_back([&file, module, t] {
            const std::string filler(FillerLength, static_cast<char>('a' + t));
            for (int i = 0; i < RecordsEach; ++i)
                file.record(static_cast<std::uint32_t>(module) << 8 | 2, "w.cpp", 100 + t,
                            "writer %d record %d %s", t, i, filler.c_str());
        });
    }
    for (std::thread &writer : writers)
        writer.join();
    expectWholeLines(file.lines(), "Mod");
}

TEST(TraceLoggerThreads, AFilterCallOnAnotherThreadDoesNotCount)
{
    LoggerFile file(2);
    TraceLogger &logger = file.logger();
    const auto write = [&logger](const char *format, ...) {
        std::va_list args;
        va_start(args, format);
        logger.write(format, args);
        va_end(args);
    };
    ASSERT_TRUE(logger.wants(1 << 8 | 2, "mine.cpp", 1));
    std::thread other([&] { write("from a thread that never asked"); });
    other.join();
    write("mine");
    const QStringList lines = file.lines();
    ASSERT_EQ(lines.size(), 1);
    EXPECT_TRUE(lines[0].endsWith("mine.cpp:1 mine"));
}

TEST(QirnLogUtlThreads, ConcurrentWritersThroughTheExportGiveWholeLines)
{
    QTemporaryDir dir;
    const QString path = dir.filePath("trace.log");
    const ProbeRun run = ProbeRun::start({"library", QIRNLOG_LIBRARY, "threads"},
                                         {{"QIRNLOG_FILE", path}, {"QIRNLOG_LEVEL", "2"}});
    ASSERT_EQ(run.exitCode, 0) << run.err.toStdString();
    QStringList lines = fileLines(path);
    ASSERT_FALSE(lines.isEmpty());
    lines.removeFirst(); // the probe's single-threaded record
    expectWholeLines(lines, "Probe");
}

TEST(TraceFacilityThreads, RecordsFromSeveralThreadsKeepTheirOwnSelectors)
{
    TestLog log;
    log.attach();
    std::vector<std::thread> threads;
    for (int t = 0; t < Writers; ++t) {
        threads.emplace_back([t] {
            for (int i = 0; i < 200; ++i) {
                TRACE_SCOPE("Sample::threaded");
                TRACE_ERROR("thread %d", t);
            }
        });
    }
    for (std::thread &thread : threads)
        thread.join();
    const QList<TestLog::Record> records = log.records();
    ASSERT_EQ(records.size(), Writers * 200 * 3);
    for (const TestLog::Record &record : records) {
        if (record.text.startsWith("thread "))
            EXPECT_EQ(record.level(), 2);
        else
            EXPECT_EQ(record.level(), 5) << record.text.toStdString();
    }
}

} // namespace

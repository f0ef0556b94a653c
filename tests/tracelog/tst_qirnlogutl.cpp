// libQirnLogUtl.so as a module loads it, and the plug-in with and without it.
// Each case runs in a child process: the library reads its environment once.

#include "ProbeRun.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QRegularExpression>
#include <QTemporaryDir>

#include <gtest/gtest.h>

#include <ostream>

namespace {

enum class Destination { Unset, File, Stderr, Unwritable };

struct EnvironmentRow
{
    const char *name;
    Destination destination;
    const char *level; // null: unset
    bool errorWritten;
    bool traceWritten;
};

std::ostream &operator<<(std::ostream &out, const EnvironmentRow &row)
{
    return out << row.name;
}

class QirnLogUtlEnvironment : public testing::TestWithParam<EnvironmentRow>
{};

TEST_P(QirnLogUtlEnvironment, ChoosesDestinationAndThreshold)
{
    const EnvironmentRow &row = GetParam();
    QTemporaryDir dir;
    const QString path = dir.filePath("trace.log");
    QMap<QString, QString> env;
    if (row.destination == Destination::File)
        env["QIRNLOG_FILE"] = path;
    else if (row.destination == Destination::Stderr)
        env["QIRNLOG_FILE"] = "stderr";
    else if (row.destination == Destination::Unwritable)
        env["QIRNLOG_FILE"] = dir.filePath("missing/dir/trace.log");
    if (row.level)
        env["QIRNLOG_LEVEL"] = row.level;

    const ProbeRun run = ProbeRun::start({"library", QIRNLOG_LIBRARY}, env);
    ASSERT_EQ(run.exitCode, 0) << run.err.toStdString();
    EXPECT_TRUE(run.out.contains("same object=1"));
    EXPECT_TRUE(run.out.contains("ids=1,2,1"));
    EXPECT_TRUE(run.out.contains(QStringLiteral("filter error=%1 trace=%2")
                                     .arg(row.errorWritten ? 0 : 1)
                                     .arg(row.traceWritten ? 0 : 1)));

    const QStringList lines = row.destination == Destination::Stderr
                                  ? run.err.split('\n', Qt::SkipEmptyParts)
                                  : fileLines(path);
    QStringList expected;
    if (row.errorWritten)
        expected << "Probe 2 Probe.cpp:10 Probe::error, code:%n%s\\nforged";
    if (row.traceWritten)
        expected << "Probe 5 Probe.cpp:11 Probe::trace, Enter";
    ASSERT_EQ(lines.size(), expected.size()) << run.err.toStdString();
    for (int i = 0; i < lines.size(); ++i) {
        EXPECT_TRUE(QRegularExpression(RECORD_LINE_PATTERN).match(lines[i]).hasMatch());
        EXPECT_TRUE(lines[i].endsWith(expected[i])) << lines[i].toStdString();
    }
    if (row.destination != Destination::Stderr) {
        EXPECT_TRUE(run.err.isEmpty()) << run.err.toStdString();
    }
}

const EnvironmentRow environmentRows[] = {
    {"nothing set: off and silent", Destination::Unset, nullptr, false, false},
    {"level alone does not turn logging on", Destination::Unset, "5", false, false},
    {"file with the default level: errors only", Destination::File, nullptr, true, false},
    {"file with level 5: errors and Enter/Leave", Destination::File, "5", true, true},
    {"stderr as destination", Destination::Stderr, "5", true, true},
    {"unreadable level falls back to errors only", Destination::File, "verbose", true, false},
    {"level 1 keeps errors out", Destination::File, "1", false, false},
    {"unwritable path: off, and the module still runs", Destination::Unwritable, "5", false, false},
};

INSTANTIATE_TEST_SUITE_P(QirnLogUtl, QirnLogUtlEnvironment, testing::ValuesIn(environmentRows));

// Where the plug-in file lies decides whether it finds the library.
enum class Placement { BesideLibrary, Alone, AloneWithLibraryPath };

struct PluginRow
{
    const char *name;
    Placement placement;
    bool logging; // QIRNLOG_FILE set, level 5
    bool traced;
};

std::ostream &operator<<(std::ostream &out, const PluginRow &row)
{
    return out << row.name;
}

class PluginWithTraceLibrary : public testing::TestWithParam<PluginRow>
{};

TEST_P(PluginWithTraceLibrary, LoadsAndAnswersEitherWay)
{
    const PluginRow &row = GetParam();
    QTemporaryDir dir;
    const QString logPath = dir.filePath("trace.log");
    QString plugin = QStringLiteral(RECSCHED_PLUGIN);
    QMap<QString, QString> env;
    if (row.placement != Placement::BesideLibrary) {
        plugin = dir.filePath(QFileInfo(plugin).fileName());
        ASSERT_TRUE(QFile::copy(QStringLiteral(RECSCHED_PLUGIN), plugin));
    }
    if (row.placement == Placement::AloneWithLibraryPath)
        env["LD_LIBRARY_PATH"] = QFileInfo(QStringLiteral(QIRNLOG_LIBRARY)).absolutePath();
    if (row.logging) {
        env["QIRNLOG_FILE"] = logPath;
        env["QIRNLOG_LEVEL"] = "5";
    }

    const ProbeRun run = ProbeRun::start({"plugin", plugin}, env);
    ASSERT_EQ(run.exitCode, 0) << run.out.join('\n').toStdString() << run.err.toStdString();
    EXPECT_EQ(run.out, QStringList({"loaded=1", "initialised=0", "replies=1 code=-1"}));
    EXPECT_TRUE(run.err.isEmpty()) << run.err.toStdString();

    const QStringList lines = fileLines(logPath);
    if (!row.traced) {
        EXPECT_TRUE(lines.isEmpty()) << lines.join('\n').toStdString();
        return;
    }
    QStringList texts;
    for (const QString &line : lines) {
        const QRegularExpressionMatch match = QRegularExpression(RECORD_LINE_PATTERN).match(line);
        ASSERT_TRUE(match.hasMatch()) << line.toStdString();
        EXPECT_EQ(match.captured(1), "RecordingScheduleSettingSrv");
        texts << match.captured(2) + ' ' + match.captured(5);
    }
    EXPECT_EQ(texts,
              QStringList({
                  "5 PluginRecordingScheduleSettingSrv::InitialPluginBase, Enter",
                  "2 PluginRecordingScheduleSettingSrv::InitialPluginBase, Tunnel client get null.",
                  "5 PluginRecordingScheduleSettingSrv::InitialPluginBase, Leave",
                  "5 PluginRecordingScheduleSettingSrv::Request, Enter",
                  "5 PluginRecordingScheduleSettingSrv::Request, Leave",
              }));
}

const PluginRow pluginRows[] = {
    {"beside the library: traced", Placement::BesideLibrary, true, true},
    {"beside the library with logging off: silent", Placement::BesideLibrary, false, false},
    {"without the library: untraced", Placement::Alone, true, false},
    {"library found by name through the library path", Placement::AloneWithLibraryPath, true, true},
};

INSTANTIATE_TEST_SUITE_P(QirnLogUtl, PluginWithTraceLibrary, testing::ValuesIn(pluginRows));

} // namespace

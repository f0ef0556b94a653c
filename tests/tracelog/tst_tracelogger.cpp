// The trace-log library's logger: registration, the level threshold and the
// record lines it writes.

#include "LoggerFile.h"
#include "ProbeRun.h"

#include <QRegularExpression>

#include <gtest/gtest.h>

#include <ostream>
#include <string>

namespace {

constexpr std::uint32_t selector(std::int32_t module, std::uint32_t level)
{
    return static_cast<std::uint32_t>(module) << 8 | level;
}

TEST(TraceLoggerRegister, NamesGetStableDistinctIdentifiersFromOne)
{
    TraceLogger logger({}, 2);
    const std::int32_t first = logger.registerModule("RecordingScheduleSettingSrv");
    const std::int32_t second = logger.registerModule("Other");
    EXPECT_EQ(first, 1);
    EXPECT_EQ(second, 2);
    EXPECT_EQ(logger.registerModule("RecordingScheduleSettingSrv"), first);
    EXPECT_EQ(logger.registerModule(nullptr), 0);
}

struct ThresholdRow
{
    const char *name;
    int threshold;
    std::uint32_t level;
    bool written;
};

std::ostream &operator<<(std::ostream &out, const ThresholdRow &row)
{
    return out << row.name;
}

class TraceLoggerThreshold : public testing::TestWithParam<ThresholdRow>
{};

TEST_P(TraceLoggerThreshold, WritesLevelsUpToTheThreshold)
{
    LoggerFile file(GetParam().threshold);
    const std::int32_t module = file.logger().registerModule("Mod");
    EXPECT_EQ(file.record(selector(module, GetParam().level), "a.cpp", 1, "text"),
              GetParam().written);
    EXPECT_EQ(file.lines().size(), GetParam().written ? 1 : 0);
}

const ThresholdRow thresholdRows[] = {
    {"default threshold writes errors", TraceLogger::DefaultThreshold, 2, true},
    {"default threshold keeps Enter and Leave out", TraceLogger::DefaultThreshold, 5, false},
    {"a more severe level than the threshold is written", 2, 1, true},
    {"threshold 5 writes Enter and Leave", 5, 5, true},
    {"threshold 0 keeps level 1 out", 0, 1, false},
};

INSTANTIATE_TEST_SUITE_P(TraceLogger, TraceLoggerThreshold, testing::ValuesIn(thresholdRows));

TEST(TraceLoggerThreshold, NoDestinationWantsNothing)
{
    TraceLogger logger({}, 255);
    EXPECT_FALSE(logger.wants(selector(1, 0), "a.cpp", 1));
}

struct LineRow
{
    const char *name;
    std::int32_t registered; // 0: the module is not registered
    const char *format;
    std::string argument;
    QString module;
    QString text;
};

std::ostream &operator<<(std::ostream &out, const LineRow &row)
{
    return out << row.name;
}

class TraceLoggerLine : public testing::TestWithParam<LineRow>
{};

TEST_P(TraceLoggerLine, IsOneLineWithTimeModuleLevelOriginAndText)
{
    LoggerFile file(5);
    std::int32_t module = 42;
    if (GetParam().registered)
        module = file.logger().registerModule("RecordingScheduleSettingSrv");
    ASSERT_TRUE(file.record(selector(module, 2), "/build/src/RecordingSettingControl.cpp", 321,
                            GetParam().format, GetParam().argument.c_str()));

    const QStringList lines = file.lines();
    ASSERT_EQ(lines.size(), 1);
    const QRegularExpressionMatch match = QRegularExpression(RECORD_LINE_PATTERN).match(lines[0]);
    ASSERT_TRUE(match.hasMatch()) << lines[0].toStdString();
    EXPECT_EQ(match.captured(1), GetParam().module);
    EXPECT_EQ(match.captured(2), "2");
    EXPECT_EQ(match.captured(3), "RecordingSettingControl.cpp");
    EXPECT_EQ(match.captured(4), "321");
    EXPECT_EQ(match.captured(5), GetParam().text);
}

const LineRow lineRows[] = {
    {"registered module is named", 1, "%s, parse failed.", "Ctl::Hdlr",
     "RecordingScheduleSettingSrv", "Ctl::Hdlr, parse failed."},
    {"unknown module is shown by number", 0, "%s", "x", "#42", "x"},
    {"conversions in an argument are printed literally", 1, "code:%s", "%n%s%x%p",
     "RecordingScheduleSettingSrv", "code:%n%s%x%p"},
    {"line breaks in an argument cannot split the record", 1, "content:%s",
     "a\nb\r\n2024-01-01T00:00:00.000Z Forged 2 x:1 y", "RecordingScheduleSettingSrv",
     "content:a\\nb\\r\\n2024-01-01T00:00:00.000Z Forged 2 x:1 y"},
    {"other control characters and backslashes are escaped", 1, "%s", std::string("t\tb\\e\x1b", 6),
     "RecordingScheduleSettingSrv", "t\\tb\\\\e\\x1b"},
};

INSTANTIATE_TEST_SUITE_P(TraceLogger, TraceLoggerLine, testing::ValuesIn(lineRows));

TEST(TraceLoggerLine, OverlongTextIsCutAndMarked)
{
    LoggerFile file(5);
    const std::string huge(TraceLogger::MaxText * 4, 'x');
    ASSERT_TRUE(file.record(selector(1, 2), "a.cpp", 1, "%s", huge.c_str()));
    const QStringList lines = file.lines();
    ASSERT_EQ(lines.size(), 1);
    EXPECT_TRUE(lines[0].endsWith(QString(200, 'x') + "...(cut)"));
    EXPECT_LT(lines[0].size(), static_cast<qsizetype>(TraceLogger::MaxText + 200));
}

TEST(TraceLoggerWrite, OnlyTheWriteThatFollowsAnAcceptedFilterIsWritten)
{
    LoggerFile file(2);
    TraceLogger &logger = file.logger();
    const auto write = [&logger](const char *format, ...) {
        std::va_list args;
        va_start(args, format);
        logger.write(format, args);
        va_end(args);
    };

    write("never asked");
    EXPECT_FALSE(logger.wants(selector(1, 5), "a.cpp", 1));
    write("refused");
    EXPECT_TRUE(logger.wants(selector(1, 2), "a.cpp", 2));
    write("accepted");
    write("second write for one filter call");

    const QStringList lines = file.lines();
    ASSERT_EQ(lines.size(), 1);
    EXPECT_TRUE(lines[0].endsWith(" accepted"));
}

TEST(TraceLoggerWrite, AFilterCallOfAnotherLoggerDoesNotCount)
{
    LoggerFile first(2);
    LoggerFile second(2);
    ASSERT_TRUE(first.logger().wants(selector(1, 2), "a.cpp", 1));
    const auto writeSecond = [&second](const char *format, ...) {
        std::va_list args;
        va_start(args, format);
        second.logger().write(format, args);
        va_end(args);
    };
    writeSecond("not for this logger");
    EXPECT_TRUE(second.lines().isEmpty());
}

} // namespace

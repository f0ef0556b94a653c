// The plug-in's side of tracing, seen through a test log object: which
// records it asks for, with which selector and origin, and what it never does.

#include "IFrameworkTools.h"
#include "PluginRecordingScheduleSettingSrv.h"
#include "TestLog.h"
#include "TraceLog.h"

#include <gtest/gtest.h>

#include <ostream>
#include <stdexcept>

namespace {

constexpr std::uint32_t Enter = 5;
constexpr std::uint32_t Error = 2;

int g_enterLine = 0;
int g_errorLine = 0;

void tracedWithError(int value)
{
    g_enterLine = __LINE__ + 1;
    TRACE_SCOPE("Sample::tracedWithError");
    g_errorLine = __LINE__ + 1;
    TRACE_ERROR("%s, failed with %d", "Sample::tracedWithError", value);
}

void tracedThrowing()
{
    TRACE_SCOPE("Sample::tracedThrowing");
    throw std::runtime_error("boom");
}

struct SelectorRow
{
    const char *name;
    bool withRegister;
    std::int32_t expectedModule;
};

std::ostream &operator<<(std::ostream &out, const SelectorRow &row)
{
    return out << row.name;
}

class TraceSelector : public testing::TestWithParam<SelectorRow>
{};

TEST_P(TraceSelector, CarriesModuleLevelAndOrigin)
{
    TestLog log(7, GetParam().withRegister);
    log.attach();
    tracedWithError(3);

    const std::uint32_t module = static_cast<std::uint32_t>(GetParam().expectedModule) << 8;
    const QList<TestLog::Record> records = log.records();
    ASSERT_EQ(records.size(), 3);
    const QString file = QStringLiteral(__FILE__);
    EXPECT_EQ(records[0].selector, module | Enter);
    EXPECT_EQ(records[0].sourceFile, file);
    EXPECT_EQ(records[0].sourceLine, g_enterLine);
    EXPECT_EQ(records[0].text, "Sample::tracedWithError, Enter");
    EXPECT_EQ(records[1].selector, module | Error);
    EXPECT_EQ(records[1].sourceLine, g_errorLine);
    EXPECT_EQ(records[1].text, "Sample::tracedWithError, failed with 3");
    EXPECT_EQ(records[2].selector, module | Enter);
    EXPECT_EQ(records[2].sourceLine, 0);
    EXPECT_EQ(records[2].text, "Sample::tracedWithError, Leave");
}

const SelectorRow selectorRows[] = {
    {"registered module id shifted by 8, ORed with the level", true, 7},
    {"no register function: module id 0, records still asked for", false, 0},
};

INSTANTIATE_TEST_SUITE_P(TraceLog, TraceSelector, testing::ValuesIn(selectorRows));

TEST(TraceScope, LeaveIsWrittenWhenTheScopeIsLeftByAnException)
{
    TestLog log;
    log.attach();
    EXPECT_THROW(tracedThrowing(), std::runtime_error);
    const QList<TestLog::Record> records = log.records();
    ASSERT_EQ(records.size(), 2);
    EXPECT_EQ(records[1].text, "Sample::tracedThrowing, Leave");
    EXPECT_EQ(records[1].sourceLine, 0);
}

TEST(TraceFilter, IsAskedBeforeAnyArgumentIsEvaluated)
{
    TestLog log;
    log.attach();
    int evaluated = 0;
    const auto costly = [&evaluated] { return ++evaluated; };

    log.setFilter([](std::uint32_t) { return 1; });
    TRACE_ERROR("%d", costly());
    EXPECT_EQ(evaluated, 0);
    EXPECT_EQ(log.filterCalls(), 1);
    EXPECT_TRUE(log.records().isEmpty());

    log.setFilter({});
    TRACE_ERROR("%d", costly());
    EXPECT_EQ(evaluated, 1);
    EXPECT_EQ(log.texts(), QStringList{"1"});
}

TEST(TraceFilter, UntrustedTextIsPrintedLiterally)
{
    TestLog log;
    log.attach();
    const QByteArray code = QByteArrayLiteral("%s%n%x%p");
    TRACE_ERROR("%s, reqRespCode:%s", "Sample::handler", code.constData());
    EXPECT_EQ(log.texts(), QStringList{"Sample::handler, reqRespCode:%s%n%x%p"});
}

TEST(TraceFilter, RefusingLevel5SilencesEnterAndLeaveOnly)
{
    TestLog log;
    log.attach();
    log.setFilter([](std::uint32_t selector) { return (selector & 0xff) == Enter ? 1 : 0; });
    PluginRecordingScheduleSettingSrv plugin;
    EXPECT_FALSE(plugin.InitialPluginBase(nullptr));
    const QList<TestLog::Record> records = log.records();
    ASSERT_EQ(records.size(), 1);
    EXPECT_EQ(records[0].text,
              "PluginRecordingScheduleSettingSrv::InitialPluginBase, Tunnel client get null.");
    EXPECT_TRUE(records[0].sourceFile.endsWith("PluginRecordingScheduleSettingSrv.cpp"));
}

// Each row takes one piece away from the log object.
struct MissingRow
{
    const char *name;
    void (*breakObject)(LogTraceObject &);
    bool attachNull;
    int expectedFilterCalls;
};

std::ostream &operator<<(std::ostream &out, const MissingRow &row)
{
    return out << row.name;
}

class TraceMissingPiece : public testing::TestWithParam<MissingRow>
{};

TEST_P(TraceMissingPiece, WritesNothingAndGoesOn)
{
    TestLog log;
    GetParam().breakObject(log.object);
    if (GetParam().attachNull)
        TraceLog::attach(nullptr);
    else
        log.attach();

    int evaluated = 0;
    {
        TRACE_SCOPE("Sample::scope");
        TRACE_ERROR("%d", ++evaluated);
    }
    tracedWithError(1);
    EXPECT_EQ(evaluated, 0);
    EXPECT_TRUE(log.records().isEmpty());
    EXPECT_EQ(log.filterCalls(), GetParam().expectedFilterCalls);
}

const MissingRow missingRows[] = {
    {"no log object", [](LogTraceObject &) {}, true, 0},
    {"no filter function", [](LogTraceObject &o) { o.filter = nullptr; }, false, 0},
    {"no context", [](LogTraceObject &o) { o.context = nullptr; }, false, 0},
    {"no write function: asked, dropped, arguments untouched",
     [](LogTraceObject &o) { o.write = nullptr; }, false, 6},
};

INSTANTIATE_TEST_SUITE_P(TraceLog, TraceMissingPiece, testing::ValuesIn(missingRows));

} // namespace

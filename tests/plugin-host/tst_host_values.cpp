// What plugin-host reads and prints without a process of its own: payload
// JSON, reply lines, session files and the weekly grid of the demo.

#include "HostRequest.h"
#include "JsonValues.h"
#include "ReplyLine.h"
#include "WeekGrid.h"

#include <gtest/gtest.h>

namespace {

struct PayloadCase
{
    const char *name;
    QByteArray text;
    bool parses;
    QByteArray compact; // how the parsed value prints again
};

void PrintTo(const PayloadCase &c, std::ostream *os)
{
    *os << c.name;
}

class Payload : public testing::TestWithParam<PayloadCase>
{};

TEST_P(Payload, ParsesAnyOneJsonValue)
{
    const PayloadCase c = GetParam();
    QString error;
    const std::optional<QJsonValue> value = JsonValues::parse(c.text, &error);
    ASSERT_EQ(value.has_value(), c.parses) << error.toStdString();
    if (value)
        EXPECT_EQ(JsonValues::compact(*value), c.compact);
    else
        EXPECT_FALSE(error.isEmpty());
}

INSTANTIATE_TEST_SUITE_P(
    Texts, Payload,
    testing::Values(
        PayloadCase{"object", R"({"TimeCardID": "7"})", true, R"({"TimeCardID":"7"})"},
        PayloadCase{"array", "[1, 2]", true, "[1,2]"},
        PayloadCase{"string_scalar", R"("abc")", true, R"("abc")"},
        PayloadCase{"negative_number", "-1", true, "-1"}, PayloadCase{"null", "null", true, "null"},
        PayloadCase{"true", " true ", true, "true"}, PayloadCase{"bare_word", "abc", false, ""},
        PayloadCase{"empty_text", "", false, ""}, PayloadCase{"two_values", "1, 2", false, ""},
        PayloadCase{"bracket_smuggled_value", "1],[2", false, ""},
        PayloadCase{"unclosed_object", R"({"a": 1)", false, ""},
        PayloadCase{"trailing_garbage", "{} x", false, ""}),
    [](const testing::TestParamInfo<PayloadCase> &info) { return std::string(info.param.name); });

struct LineCase
{
    const char *name;
    ReplyCollector::Reply reply;
    QByteArray line;
};

void PrintTo(const LineCase &c, std::ostream *os)
{
    *os << c.name;
}

class Line : public testing::TestWithParam<LineCase>
{};

TEST_P(Line, KeepsItsKeyOrderAndSpacing)
{
    EXPECT_EQ(replyLine(QStringLiteral("GetScheduleRecInfo"), GetParam().reply), GetParam().line);
}

QVariantMap summary()
{
    return {{QStringLiteral("RecScheduleType"), 5},
            {QStringLiteral("CustomizeContent"), QString()}};
}

INSTANTIATE_TEST_SUITE_P(
    Replies, Line,
    testing::Values(
        LineCase{
            "invalid_data_is_null",
            {true, QStringLiteral("-1"), QString(), QVariant()},
            R"({"command": "GetScheduleRecInfo", "flag": true, "code": "-1", "text": "", "data": null})"},
        LineCase{
            "map_data_is_an_object",
            {false, QStringLiteral("0"), QString(), summary()},
            R"({"command": "GetScheduleRecInfo", "flag": false, "code": "0", "text": "", "data": {"CustomizeContent":"","RecScheduleType":5}})"},
        LineCase{
            "string_data_is_escaped",
            {true, QStringLiteral("0"), QStringLiteral("a\"b"), QStringLiteral("{\"R\":[]}\n")},
            R"({"command": "GetScheduleRecInfo", "flag": true, "code": "0", "text": "a\"b", "data": "{\"R\":[]}\n"})"}),
    [](const testing::TestParamInfo<LineCase> &info) { return std::string(info.param.name); });

struct SessionCase
{
    const char *name;
    QByteArray text;
    int requests; // -1: refused
    const char *error;
};

void PrintTo(const SessionCase &c, std::ostream *os)
{
    *os << c.name;
}

class Session : public testing::TestWithParam<SessionCase>
{};

TEST_P(Session, IsCheckedWholeBeforeAnythingIsSent)
{
    const SessionCase c = GetParam();
    QString error;
    const auto requests = readSession(c.text, &error);
    if (c.requests < 0) {
        EXPECT_FALSE(requests.has_value());
        EXPECT_TRUE(error.contains(QString::fromUtf8(c.error))) << error.toStdString();
    } else {
        ASSERT_TRUE(requests.has_value()) << error.toStdString();
        EXPECT_EQ(static_cast<int>(requests->size()), c.requests);
    }
}

INSTANTIATE_TEST_SUITE_P(
    Files, Session,
    testing::Values(
        SessionCase{
            "lines_and_blank_lines",
            "{\"command\": \"A\"}\n\n  \r\n{\"command\": \"B\", \"payload\": 1, \"client\": 3}\r\n",
            2, ""},
        SessionCase{"byte_order_mark_is_skipped", "\xEF\xBB\xBF{\"command\": \"A\"}", 1, ""},
        SessionCase{"empty_file_sends_nothing", "", 0, ""},
        SessionCase{"line_that_is_not_an_object", "{\"command\": \"A\"}\n[\"A\"]\n", -1,
                    "line 2: a request is a JSON object"},
        SessionCase{"line_that_does_not_parse", "{\"command\": \"A\"}\n{\"command\": \n", -1,
                    "line 2:"},
        SessionCase{"missing_command", "{\"payload\": {}}", -1, "\"command\" must be a string"},
        SessionCase{"command_not_a_string", "{\"command\": 5}", -1, "\"command\" must be a string"},
        SessionCase{"misspelt_key", "{\"command\": \"A\", \"paylod\": {}}", -1,
                    "unknown key \"paylod\""},
        SessionCase{"fractional_client", "{\"command\": \"A\", \"client\": 1.5}", -1, "\"client\""},
        SessionCase{"negative_client", "{\"command\": \"A\", \"client\": -1}", -1, "\"client\""},
        SessionCase{"client_as_text", "{\"command\": \"A\", \"client\": \"1\"}", -1, "\"client\""}),
    [](const testing::TestParamInfo<SessionCase> &info) { return std::string(info.param.name); });

TEST(Session, CarriesPayloadAndClientAsGiven)
{
    QString error;
    const auto requests = readSession(
        R"({"command": "DelSchedule", "payload": {"TimeCardID": "7"}, "client": 9007199254740992}
{"command": "GetScheduleRecInfo", "payload": null})",
        &error);
    ASSERT_TRUE(requests.has_value());
    EXPECT_EQ(requests->at(0).command, QStringLiteral("DelSchedule"));
    EXPECT_EQ(requests->at(0).payload.toMap().value(QStringLiteral("TimeCardID")).toString(),
              QStringLiteral("7"));
    EXPECT_EQ(requests->at(0).client, qint64(1) << 53);
    EXPECT_FALSE(requests->at(1).client.has_value());
    EXPECT_TRUE(requests->at(1).payload.isValid());
    EXPECT_TRUE(requests->at(1).payload.isNull());
}

TEST(WeekGrid, MarksWholeAndPartHoursPerDay)
{
    // Days 1 to 5, 08:00 to 18:00 continuous; day 7, 08:30 to 09:00 event.
    const QStringList grid = weekGrid(QStringLiteral(
        R"({"Rectangles":[{"Bottom":18,"Left":0,"RecordingMode":"Continuous","Right":5,"Top":8},)"
        R"({"Bottom":9,"Left":6,"RecordingMode":"Event","Right":7,"Top":8.5}]})"));
    ASSERT_EQ(grid.size(), 25);
    EXPECT_EQ(grid.at(0), QStringLiteral("         1  2  3  4  5  6  7"));
    EXPECT_EQ(grid.at(1 + 7), QStringLiteral("07:00    .  .  .  .  .  .  ."));
    EXPECT_EQ(grid.at(1 + 8), QStringLiteral("08:00    C  C  C  C  C  .  e"));
    EXPECT_EQ(grid.at(1 + 17), QStringLiteral("17:00    C  C  C  C  C  .  ."));
    EXPECT_EQ(grid.at(1 + 18), QStringLiteral("18:00    .  .  .  .  .  .  ."));
}

TEST(WeekGrid, OverlappingModesAndFramesThatAreNotWeekly)
{
    const QStringList grid = weekGrid(QStringLiteral(
        R"({"Rectangles":[{"Bottom":24,"Left":0,"RecordingMode":"Continuous","Right":7,"Top":0},)"
        R"({"Bottom":1,"Left":0,"RecordingMode":"Event","Right":1,"Top":0},)"
        R"({"Bottom":-1,"Left":-1,"RecordingMode":"Event","Right":-1,"Top":-1}]})"));
    ASSERT_EQ(grid.size(), 26);
    EXPECT_EQ(grid.at(1), QStringLiteral("00:00    *  C  C  C  C  C  C"));
    EXPECT_EQ(grid.at(25), QStringLiteral("not weekly: Event"));
}

TEST(WeekGrid, TextThatIsNoScheduleSaysSo)
{
    EXPECT_EQ(weekGrid(QStringLiteral("{")), QStringList{QStringLiteral("(no schedule content)")});
    EXPECT_EQ(weekGrid(QString()), QStringList{QStringLiteral("(no schedule content)")});
    // Coordinates out of the week are clipped, not written past it.
    EXPECT_EQ(
        weekGrid(
            QStringLiteral(
                R"({"Rectangles":[{"Bottom":99,"Left":5,"RecordingMode":"x","Right":70,"Top":23}]})"))
            .at(24),
        QStringLiteral("23:00    .  .  .  .  .  X  X"));
}

} // namespace

// plugin-host's own failures and promises, driven as a process: usage
// errors and bad input send nothing and change nothing, a plug-in file that
// is not ours does not load, a late server still gives exactly one reply.

#include "HostProcess.h"

#include <QCoreApplication>
#include <QFile>

namespace {

struct UsageCase
{
    const char *name;
    QStringList arguments;
    const char *message;
};

void PrintTo(const UsageCase &c, std::ostream *os)
{
    *os << c.name;
}

class Refused : public HostProcess, public testing::WithParamInterface<UsageCase>
{};

TEST_P(Refused, WithStatusTwoAndNothingSent)
{
    seed();
    const QStringList before = cards();
    QFile text(path(QStringLiteral("text.so")));
    ASSERT_TRUE(text.open(QIODevice::WriteOnly));
    text.write("{\"command\": \"GetScheduleRecInfo\"}\n[\"GetScheduleRecInfo\"]\n");
    text.close();

    QStringList arguments = GetParam().arguments;
    arguments.replaceInStrings(QStringLiteral("TEXTFILE"), text.fileName());
    const Run run = host(arguments);
    EXPECT_EQ(run.status, 2);
    EXPECT_EQ(run.out, QByteArray());
    const QString message =
        QString::fromUtf8(GetParam().message).replace(QStringLiteral("TEXTFILE"), text.fileName());
    EXPECT_TRUE(run.err.contains(message.toUtf8())) << run.err.toStdString();
    EXPECT_TRUE(exchanges().isEmpty());
    EXPECT_EQ(cards(), before);
}

INSTANTIATE_TEST_SUITE_P(
    Mistakes, Refused,
    testing::Values(
        UsageCase{"payload_that_is_not_json",
                  {QStringLiteral("request"), QStringLiteral("AddSchedule"),
                   QStringLiteral(R"({"ScheduleName": )")},
                  "PAYLOAD is not JSON"},
        UsageCase{
            "payload_of_two_values",
            {QStringLiteral("request"), QStringLiteral("AddSchedule"), QStringLiteral("{} {}")},
            "PAYLOAD is not JSON"},
        UsageCase{"missing_plugin",
                  {QStringLiteral("--plugin"), QStringLiteral("/nonexistent/plugin.so"),
                   QStringLiteral("request"), QStringLiteral("GetScheduleRecInfo")},
                  "the plug-in does not load: /nonexistent/plugin.so: no such file"},
        UsageCase{"plugin_that_is_a_text_file",
                  {QStringLiteral("--plugin"), QStringLiteral("TEXTFILE"),
                   QStringLiteral("request"), QStringLiteral("GetScheduleRecInfo")},
                  "not a valid ELF object"},
        UsageCase{"plugin_that_is_another_library",
                  {QStringLiteral("--plugin"), QStringLiteral(OTHER_LIBRARY_FILE),
                   QStringLiteral("request"), QStringLiteral("GetScheduleRecInfo")},
                  "is not a Qt plugin"},
        UsageCase{"session_line_that_is_not_an_object",
                  {QStringLiteral("session"), QStringLiteral("TEXTFILE")},
                  "line 2: a request is a JSON object"},
        UsageCase{"unreadable_session_file",
                  {QStringLiteral("session"), QStringLiteral("/nonexistent/session.jsonl")},
                  "/nonexistent/session.jsonl"},
        UsageCase{"seed_file_that_is_no_answer",
                  {QStringLiteral("seed"), QStringLiteral("TEXTFILE")},
                  "TEXTFILE"},
        UsageCase{"no_command", {}, "no command given"},
        UsageCase{"unknown_command", {QStringLiteral("reqest")}, "unknown command \"reqest\""},
        UsageCase{"request_without_a_name", {QStringLiteral("request")}, "request NAME [PAYLOAD]"},
        UsageCase{"raw_without_a_body",
                  {QStringLiteral("raw"), QStringLiteral("GetRecTmcard")},
                  "raw COMMAND BODY"},
        UsageCase{"option_after_the_command",
                  {QStringLiteral("request"), QStringLiteral("GetScheduleRecInfo"),
                   QStringLiteral("--client"), QStringLiteral("3")},
                  "options go before the command"},
        UsageCase{"unknown_option", {QStringLiteral("--colour"), QStringLiteral("dump")}, "colour"},
        UsageCase{"reply_timeout_of_zero",
                  {QStringLiteral("--reply-timeout"), QStringLiteral("0"), QStringLiteral("dump")},
                  "--reply-timeout"},
        UsageCase{"negative_client",
                  {QStringLiteral("--client"), QStringLiteral("-1"), QStringLiteral("dump")},
                  "--client"},
        UsageCase{"unknown_answer_layout",
                  {QStringLiteral("--answer-layout"), QStringLiteral("pretty"),
                   QStringLiteral("request"), QStringLiteral("GetScheduleRecInfo")},
                  "--answer-layout"},
        UsageCase{"fault_specification_that_does_not_parse",
                  {QStringLiteral("--faults"), QStringLiteral("slow"), QStringLiteral("request"),
                   QStringLiteral("GetScheduleRecInfo")},
                  "--faults"}),
    [](const testing::TestParamInfo<UsageCase> &info) { return std::string(info.param.name); });

class LateServer : public HostProcess
{};

TEST_F(LateServer, PastTheReplyTimeOutEndsWithStatusThree)
{
    seed();
    const Run run =
        host({QStringLiteral("--faults"), QStringLiteral("latency=10s"),
              QStringLiteral("--reply-timeout"), QStringLiteral("300"), QStringLiteral("session")},
             "{\"command\": \"GetScheduleRecInfo\"}\n{\"command\": \"Nope\"}\n");
    EXPECT_EQ(run.status, 3);
    EXPECT_EQ(run.out, QByteArray());
    EXPECT_TRUE(run.err.contains("request 1 (GetScheduleRecInfo): no reply within 300 ms"))
        << run.err.toStdString();
    EXPECT_TRUE(run.err.contains("1 later request(s) not sent")) << run.err.toStdString();
}

TEST_F(LateServer, PastTheRequestTimeOutGivesOneFailedReply)
{
    seed();
    // The plug-in's reads wait 15 s; the answer comes 5 s after that.
    const Run run = host({QStringLiteral("--faults"), QStringLiteral("latency=20s"),
                          QStringLiteral("request"), QStringLiteral("GetScheduleRecInfo")});
    EXPECT_EQ(run.status, 0) << run.err.toStdString();
    ASSERT_EQ(run.lines().size(), 1);
    EXPECT_EQ(
        run.lines().first(),
        R"({"command": "GetScheduleRecInfo", "flag": false, "code": "-1", "text": "", "data": null})");
    ASSERT_EQ(exchanges().size(), 1);
    EXPECT_EQ(exchanges().first().value(QStringLiteral("outcome")).toString(),
              QStringLiteral("timeout"));
    EXPECT_FALSE(exchanges().first().value(QStringLiteral("ok")).toBool());
}

TEST_F(LateServer, RawExchangeWaitsAsLongAsTheReplyTimeOut)
{
    seed();
    const QString read = QStringLiteral("<GetRecTmcard><TmcardID>3</TmcardID></GetRecTmcard>");
    const Run late = host({QStringLiteral("--faults"), QStringLiteral("latency=5s"),
                           QStringLiteral("--reply-timeout"), QStringLiteral("300"),
                           QStringLiteral("raw"), QStringLiteral("GetRecTmcard"), read});
    EXPECT_EQ(late.status, 0) << late.err.toStdString();
    EXPECT_EQ(late.out, "{\"ok\": false, \"code\": \"\", \"content\": \"\"}\n");

    const Run answered = host(
        {QStringLiteral("raw"), QStringLiteral("DelTmcard"),
         QStringLiteral("<DelTmcard><Revision>2</Revision><TmcardID>7</TmcardID></DelTmcard>")});
    EXPECT_EQ(answered.status, 0) << answered.err.toStdString();
    EXPECT_TRUE(answered.out.startsWith("{\"ok\": true, \"code\": \"0\", \"content\": "))
        << answered.out.toStdString();
    EXPECT_EQ(cards().size(), 3);
}

// A plug-in that replies twice, never or by throwing: plugin-host tells,
// with status 3, instead of printing as if all were well.
class BrokenPlugin : public HostProcess
{
protected:
    Run misbehaving(const QStringList &arguments, const QByteArray &input = {})
    {
        return host(
            QStringList{QStringLiteral("--plugin"), QStringLiteral(MISBEHAVING_PLUGIN_FILE)} +
                arguments,
            input);
    }
};

struct EchoCase
{
    const char *name;
    const char *payload; // null: none
    QByteArray data;
};

void PrintTo(const EchoCase &c, std::ostream *os)
{
    *os << c.name;
}

class Echo : public BrokenPlugin, public testing::WithParamInterface<EchoCase>
{};

TEST_P(Echo, PayloadReachesThePluginAsAnyJsonValue)
{
    QStringList arguments{QStringLiteral("request"), QStringLiteral("Echo")};
    if (GetParam().payload)
        arguments << QString::fromUtf8(GetParam().payload);
    const Run run = misbehaving(arguments);
    EXPECT_EQ(run.status, 0) << run.err.toStdString();
    EXPECT_EQ(run.out, R"({"command": "Echo", "flag": true, "code": "0", "text": "", "data": )" +
                           GetParam().data + "}\n");
}

INSTANTIATE_TEST_SUITE_P(
    Payloads, Echo,
    testing::Values(EchoCase{"absent_is_no_payload", nullptr, "null"},
                    EchoCase{"null", "null", "null"},
                    EchoCase{"negative_number_is_no_option", "-1", "-1"},
                    EchoCase{"string", R"("Lobby \u00e9")", "\"Lobby \xc3\xa9\""},
                    EchoCase{"nested_object", R"({"b": [1, 2.5, "x", null, true], "a": {}})",
                             R"({"a":{},"b":[1,2.5,"x",null,true]})"},
                    EchoCase{"empty_array", "[]", "[]"}),
    [](const testing::TestParamInfo<EchoCase> &info) { return std::string(info.param.name); });

TEST_F(BrokenPlugin, SecondReplyEndsWithStatusThree)
{
    const Run run =
        misbehaving({QStringLiteral("request"), QStringLiteral("Twice"), QStringLiteral("1")});
    EXPECT_EQ(run.status, 3);
    EXPECT_EQ(run.lines().size(), 1);
    EXPECT_TRUE(run.err.contains("request 1 (Twice): 2 replies")) << run.err.toStdString();
}

TEST_F(BrokenPlugin, MissingReplyStopsTheSession)
{
    const Run run = misbehaving(
        {QStringLiteral("--reply-timeout"), QStringLiteral("200"), QStringLiteral("session")},
        "{\"command\": \"Echo\"}\n{\"command\": \"Never\"}\n{\"command\": \"Echo\"}\n");
    EXPECT_EQ(run.status, 3);
    EXPECT_EQ(run.lines().size(), 1);
    EXPECT_TRUE(run.err.contains("request 2 (Never): no reply within 200 ms"))
        << run.err.toStdString();
    EXPECT_TRUE(run.err.contains("1 later request(s) not sent")) << run.err.toStdString();
}

TEST_F(BrokenPlugin, ThrowingPluginDoesNotTakeTheHostDown)
{
    const Run run = misbehaving({QStringLiteral("--reply-timeout"), QStringLiteral("200"),
                                 QStringLiteral("request"), QStringLiteral("Throw")});
    EXPECT_EQ(run.status, 3);
    EXPECT_EQ(run.out, QByteArray());
    EXPECT_TRUE(run.err.contains("request 1 (Throw): the plug-in threw: thrown on purpose"))
        << run.err.toStdString();
}

} // namespace

int main(int argc, char **argv)
{
    QCoreApplication app(argc, argv);
    testing::InitGoogleTest(&argc, argv);
    return RUN_ALL_TESTS();
}

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

} // namespace

int main(int argc, char **argv)
{
    QCoreApplication app(argc, argv);
    testing::InitGoogleTest(&argc, argv);
    return RUN_ALL_TESTS();
}

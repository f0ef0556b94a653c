// plugin-host's options and sessions as tools that drive it see them: help
// and version, the default database, requester identities, the server's
// answer layouts and trace records on standard error.

#include "HostProcess.h"

#include <QCoreApplication>
#include <QFile>
#include <QFileInfo>

namespace {

class Options : public HostProcess
{};

TEST_F(Options, HelpAndVersionEndWithStatusZero)
{
    const Run help = bare({QStringLiteral("--help")});
    EXPECT_EQ(help.status, 0);
    EXPECT_TRUE(help.out.contains("request NAME [PAYLOAD]"));
    EXPECT_TRUE(help.out.contains("--trace-level"));
    const Run version = bare({QStringLiteral("--version")});
    EXPECT_EQ(version.status, 0);
    EXPECT_EQ(version.out, "plugin-host 1.0.0\n");
}

TEST_F(Options, DefaultDatabaseIsCreatedInTheUserDataLocation)
{
    const Run run = bare({QStringLiteral("dump")});
    EXPECT_EQ(run.status, 0) << run.err.toStdString();
    EXPECT_TRUE(
        QFileInfo::exists(path(QStringLiteral("data-home/plugin-host/recording-server.sqlite"))));
    // A fresh server holds its default time card.
    EXPECT_EQ(cardLines(QString::fromUtf8(run.out)),
              QStringList{QStringLiteral("1 r1 Default Schedule []")});
}

TEST_F(Options, SessionRepliesInOrderWithEachRequestersIdentity)
{
    seed();
    const QByteArray session =
        R"({"command": "AddSchedule", "payload": {"ScheduleName": "Hall", "timeframes": "{\"Rectangles\":[]}"}, "client": 5}

{"command": "Nope", "client": 9}
{"command": "GetScheduleRecInfo", "payload": [1, 2]}
)";
    const Run run =
        host({QStringLiteral("--client"), QStringLiteral("4"), QStringLiteral("session")}, session);
    EXPECT_EQ(run.status, 0) << run.err.toStdString();
    ASSERT_EQ(run.lines().size(), 3) << run.out.toStdString();
    EXPECT_EQ(run.lines().at(0),
              R"({"command": "AddSchedule", "flag": false, "code": "0", "text": "", "data": "8"})");
    EXPECT_EQ(run.lines().at(1),
              R"({"command": "Nope", "flag": true, "code": "-1", "text": "", "data": null})");
    EXPECT_EQ(
        run.lines().at(2),
        R"({"command": "GetScheduleRecInfo", "flag": true, "code": "0", "text": "", "data": {"CustomizeContent":"","RecScheduleType":0}})");
    const QList<QJsonObject> sent = exchanges();
    ASSERT_EQ(sent.size(), 2);
    EXPECT_EQ(sent.at(0).value(QStringLiteral("command")).toString(),
              QStringLiteral("InsRecTmcard"));
    EXPECT_EQ(sent.at(0).value(QStringLiteral("identity")).toString(), QStringLiteral("0x5"));
    EXPECT_EQ(sent.at(1).value(QStringLiteral("command")).toString(),
              QStringLiteral("GetRecTmcard"));
}

struct LayoutCase
{
    const char *name;
    const char *layout;
};

void PrintTo(const LayoutCase &c, std::ostream *os)
{
    *os << c.name;
}

class Layout : public HostProcess, public testing::WithParamInterface<LayoutCase>
{};

TEST_P(Layout, AnswersReadTheSameWhateverTheServersLayout)
{
    seed();
    const Run compact = host({QStringLiteral("request"), QStringLiteral("GetAllScheduleRecInfo")});
    const Run laidOut =
        host({QStringLiteral("--answer-layout"), QString::fromLatin1(GetParam().layout),
              QStringLiteral("request"), QStringLiteral("GetAllScheduleRecInfo")});
    EXPECT_EQ(laidOut.status, 0) << laidOut.err.toStdString();
    EXPECT_EQ(laidOut.out, compact.out);
    const QList<QJsonObject> sent = exchanges();
    ASSERT_EQ(sent.size(), 2);
    EXPECT_NE(sent.at(1).value(QStringLiteral("content")),
              sent.at(0).value(QStringLiteral("content")));
}

INSTANTIATE_TEST_SUITE_P(Answers, Layout,
                         testing::Values(LayoutCase{"indented", "indented"},
                                         LayoutCase{"crlf", "crlf"},
                                         LayoutCase{"letter_case_ignored", "CRLF"}),
                         [](const testing::TestParamInfo<LayoutCase> &info) {
                             return std::string(info.param.name);
                         });

TEST_F(Options, TraceLevelSendsTheRecordsToStandardError)
{
    seed();
    const Run traced = host({QStringLiteral("--trace-level"), QStringLiteral("5"),
                             QStringLiteral("request"), QStringLiteral("Nope")});
    EXPECT_EQ(traced.status, 0);
    EXPECT_TRUE(traced.err.contains("PluginRecordingScheduleSettingSrv::Request, Enter"))
        << traced.err.toStdString();
    EXPECT_TRUE(traced.err.contains("PluginRecordingScheduleSettingSrv::InitialPluginBase, Leave"));
    EXPECT_EQ(traced.lines().size(), 1);

    // Level 2 keeps the Enter and Leave records (level 5) out; none is asked: silence.
    const Run errorsOnly = host({QStringLiteral("--trace-level"), QStringLiteral("2"),
                                 QStringLiteral("request"), QStringLiteral("Nope")});
    EXPECT_EQ(errorsOnly.err, QByteArray());
    const Run silent = host({QStringLiteral("request"), QStringLiteral("Nope")});
    EXPECT_EQ(silent.err, QByteArray());
}

// The README's session example: its input and output appear in the README
// exactly as the files here hold them, and the program prints that output.
TEST_F(Options, ReadmeSessionPrintsWhatTheReadmeShows)
{
    seed();
    const auto read = [](const QString &fileName) {
        QFile file(fileName);
        EXPECT_TRUE(file.open(QIODevice::ReadOnly)) << fileName.toStdString();
        return file.readAll();
    };
    const QByteArray expected = read(dataFile(QStringLiteral("session.out")));
    const Run run = host({QStringLiteral("session"), dataFile(QStringLiteral("session.jsonl"))});
    EXPECT_EQ(run.status, 0) << run.err.toStdString();
    EXPECT_EQ(run.out, expected);

    const Run raw = host({QStringLiteral("raw"), QStringLiteral("GetRecTmcard"),
                          QStringLiteral("<GetRecTmcard><TmcardID>8</TmcardID></GetRecTmcard>")});
    EXPECT_EQ(raw.out,
              R"({"ok": true, "code": "0", "content": "<GetRecTmcardRes></GetRecTmcardRes>"})"
              "\n");

    // The lead may fold this README into the top-level one: either counts.
    const QByteArray readme = read(QStringLiteral(SOURCE_ROOT "/tools/plugin-host/README.md")) +
                              read(QStringLiteral(SOURCE_ROOT "/README.md"));
    for (const QByteArray &line :
         read(dataFile(QStringLiteral("session.jsonl"))).split('\n') + expected.split('\n')) {
        if (!line.isEmpty()) {
            EXPECT_TRUE(readme.contains("    " + line + '\n')) << line.toStdString();
        }
    }
    EXPECT_TRUE(readme.contains(raw.out.trimmed())) << raw.out.toStdString();
}

// The README's main job: the story runs through on a fresh server of its
// own, every command succeeds, and the schedules it changed are drawn.
TEST_F(Options, DemoTellsItsStoryAndEndsWithStatusZero)
{
    seed();
    const QStringList before = cards();
    const Run run = bare({QStringLiteral("--db"), database(), QStringLiteral("demo")});
    EXPECT_EQ(run.status, 0) << run.err.toStdString();
    EXPECT_EQ(run.err, QByteArray());
    QStringList commands;
    for (const QByteArray &line : run.lines()) {
        if (!line.startsWith("< "))
            continue;
        commands << QString::fromUtf8(line.mid(2).split('"').value(3));
        EXPECT_TRUE(line.contains(R"("code": "0")")) << line.toStdString();
    }
    EXPECT_EQ(
        commands,
        (QStringList{QStringLiteral("AddSchedule"), QStringLiteral("DefaultEventSchedule"),
                     QStringLiteral("UpdateCamRecSchedule"), QStringLiteral("GetScheduleRecInfo"),
                     QStringLiteral("DefaultNotRecordingSchedule"),
                     QStringLiteral("GetScheduleRecInfo")}));
    EXPECT_TRUE(run.out.contains("Time card 2 \"Lobby\" (revision 1, new), cameras: none\n"
                                 "             1  2  3  4  5  6  7\n"
                                 "    00:00    .  .  .  .  .  E  E\n"));
    EXPECT_TRUE(run.out.contains("    08:00    C  C  C  C  C  E  E\n"));
    EXPECT_TRUE(run.out.contains("cameras: C_1 (group 1), C_2 (group 1), C_3 (group 2)\n"));
    EXPECT_TRUE(run.out.endsWith("Every request got exactly one reply.\n"));
    // The demo's server is a temporary one: --db is left alone.
    EXPECT_EQ(cards(), before);
}

} // namespace

int main(int argc, char **argv)
{
    QCoreApplication app(argc, argv);
    testing::InitGoogleTest(&argc, argv);
    return RUN_ALL_TESTS();
}

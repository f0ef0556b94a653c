// The simulated recording server on a file of its own: answers, codes, time cards after.

#include "RecordingServer.h"
#include "RunSql.h"

#include <QFile>
#include <QTemporaryDir>

#include <gtest/gtest.h>

#include <atomic>
#include <csignal>
#include <future>
#include <iostream>
#include <memory>
#include <sys/stat.h>
#include <thread>
#include <unistd.h>

namespace {

const auto tag = [](const char *n, const QString &in) { return QString("<%1>%2</%1>").arg(n, in); };
const auto cards = [](const QString &inner) { return tag("GetRecTmcardRes", inner); };
const auto insert = [](const QString &card) { return tag("InsRecTmcard", tag("Tmcard", card)); };
const auto update = [](const QString &card) { return tag("UpdRecTmcard", tag("Tmcard", card)); };
const auto refusal = [](int code, const QString &reason) {
    return tag("Error", tag("Code", QString::number(code)) + tag("Reason", reason));
};
const auto fields = [](qint64 id, const QString &name) {
    return tag("Revision", "1") + tag("TmcardID", QString::number(id)) + tag("Name", name) +
           "<Mapping></Mapping>";
};
const auto card = [](qint64 id, const QString &name) { return tag("Tmcard", fields(id, name)); };
// A time card whose mapping nests elements this many levels below the Mapping.
const auto deep = [](int levels, qint64 id) {
    return fields(id, "N").replace("<Mapping>", "<Mapping>" + QString("<Ele>").repeated(levels) +
                                                    QString("</Ele>").repeated(levels));
};

// A fresh database holds this one time card: continuous all week.
const QString kDefault =
    "<Tmcard><Revision>1</Revision><TmcardID>1</TmcardID><Name>Default Schedule</Name><Mapping>"
    "<Ele><Frame><Name>Always</Name><Holiday>false</Holiday><RepeatMod>Weekly</RepeatMod><DLMod>"
    "SingleDay</DLMod><Intervals><Ele B=\"0\" E=\"86400\"/></Intervals><DayList><Ele B=\"1.0\"/>"
    "<Ele B=\"2.0\"/><Ele B=\"3.0\"/><Ele B=\"4.0\"/><Ele B=\"5.0\"/><Ele B=\"6.0\"/><Ele "
    "B=\"7.0\"/></DayList><Range><Period><TmS>2016-03-29 00:00:00.000</TmS><TmE>2035-01-01 "
    "00:00:00.000</TmE></Period><End>false</End></Range><RepeatFreq>1</RepeatFreq></Frame>"
    "<RecMode>Continuous</RecMode><AllEvent>true</AllEvent><Motion>true</Motion><ContMotNum>1"
    "</ContMotNum><DigiInput>3</DigiInput></Ele></Mapping></Tmcard>";

class ServerTest : public testing::Test
{
protected:
    void SetUp() override { reopen(); }
    QString path() const { return dir.filePath("recserver.db"); }
    void reopen()
    {
        server = std::make_unique<RecordingServer>(path());
        ASSERT_FALSE(server->open().refused());
    }
    // "seed" stands for RecordingServer::seed, answered with the refusal's reason.
    ServerAnswer ask(const QString &command, const QString &body)
    {
        if (command != "seed")
            return server->handle(command, body);
        const Refusal refused = server->seed(body);
        return {serverCodeText(refused.code), refused.reason};
    }

    QTemporaryDir dir;
    std::unique_ptr<RecordingServer> server;
};

struct Row
{
    const char *name;
    const char *command;
    QString body;
    const char *code;
    QString answer;
    QString after = kDefault; // all the time cards after it
    // When set, the request runs in a child process that is killed (SIGKILL
    // from the statement hook) before this statement of its write commits.
    int killAtStatement = 0;
    QString seeded = {}; // the time cards before it, when not the fresh server's
    friend void PrintTo(const Row &row, std::ostream *out) { *out << row.name; }
};

class Requests : public ServerTest, public testing::WithParamInterface<Row>
{};

TEST_P(Requests, AnswerAndLeaveTheTimecards)
{
    const Row &row = GetParam();
    if (!row.seeded.isEmpty())
        ask("seed", cards(row.seeded));
    if (row.killAtStatement == 0) {
        const ServerAnswer answer = ask(row.command, row.body);
        EXPECT_EQ(answer.code, row.code);
        EXPECT_EQ(answer.content.toStdString(), row.answer.toStdString());
    } else {
        GTEST_FLAG_SET(death_test_style, "fast");
        server.reset(); // the child opens a connection of its own
        EXPECT_EXIT(
            {
                RecordingServer child(path());
                child.open();
                child.setStatementHook([&row](int statement) {
                    if (statement == row.killAtStatement)
                        raise(SIGKILL);
                });
                child.handle(row.command, row.body);
                _exit(0); // not killed: the write had fewer statements
            },
            testing::KilledBySignal(SIGKILL), "");
        reopen();
    }
    EXPECT_EQ(server->dump().toStdString(), cards(row.after).toStdString());
}

const QString kCameras =
    "<CamList>" + QString("<Cam><Name>C</Name><RecGrpID>1</RecGrpID></Cam>").repeated(20000) +
    "</CamList>";
const QString kCard = "<Revision>1</Revision><TmcardID>1</TmcardID><Name>N</Name><Mapping/>";
const QString kDelete = "<DelTmcard><Revision>1</Revision><TmcardID>1</TmcardID></DelTmcard>";
const QString kEvent = "KOLT2 Default Event Recording";
const QString kCustomize = "KOLT2 Customize Recording";

const Row rows[] = {
    {"read_of_one", "GetRecTmcard", "<GetRecTmcard><TmcardID>1</TmcardID></GetRecTmcard>", "0",
     cards(kDefault)},
    {"read_of_an_identifier_not_held_is_empty", "GetRecTmcard",
     "<GetRecTmcard><TmcardID>9</TmcardID></GetRecTmcard>", "0", cards("")},
    {"insert_takes_the_next_identifier_and_revision_1", "InsRecTmcard",
     insert("<Revision>7</Revision><TmcardID>9</TmcardID><Name>Hall</Name><Mapping/><CamList><Cam>"
            "<Name>C_2</Name><RecGrpID>4</RecGrpID></Cam></CamList>"),
     "0", "<InsRecTmcardRes><TmcardID>2</TmcardID></InsRecTmcardRes>",
     kDefault +
         "<Tmcard><Revision>1</Revision><TmcardID>2</TmcardID><Name>Hall</Name><Mapping>"
         "</Mapping><CamList><Cam><Name>C_2</Name><GrpID>4</GrpID></Cam></CamList></Tmcard>"},
    {"markup_in_names_and_mappings_reads_back_as_sent", "InsRecTmcard",
     insert("<Name>A &amp; B &lt;x&gt;</Name><Mapping><Ele N='x\"y'>a &amp; "
            "b<!--c--></Ele></Mapping>"),
     "0", "<InsRecTmcardRes><TmcardID>2</TmcardID></InsRecTmcardRes>",
     kDefault + "<Tmcard><Revision>1</Revision><TmcardID>2</TmcardID><Name>A &amp; B &lt;x&gt;"
                "</Name><Mapping><Ele N=\"x&quot;y\">a &amp; b</Ele></Mapping></Tmcard>"},
    {"update_replaces_the_time_card_and_raises_its_revision", "UpdRecTmcard",
     update("<Revision>1</Revision><TmcardID>1</TmcardID><Name>Hall</Name><Mapping>\n  <Ele>\n"
            "    <RecMode>Event</RecMode>\n  </Ele>\n</Mapping><CamList><Cam><Name>C_1</Name>"
            "<GrpID>3</GrpID></Cam></CamList>"),
     "0", "<UpdRecTmcardRes><TmcardID>1</TmcardID><Revision>2</Revision></UpdRecTmcardRes>",
     "<Tmcard><Revision>2</Revision><TmcardID>1</TmcardID><Name>Hall</Name><Mapping><Ele><RecMode>"
     "Event</RecMode></Ele></Mapping><CamList><Cam><Name>C_1</Name><GrpID>3</GrpID></Cam></CamList>"
     "</Tmcard>"},
    {"delete_removes_the_time_card", "DelTmcard", kDelete, "0",
     "<DelTmcardRes><TmcardID>1</TmcardID></DelTmcardRes>", ""},
    {"DTD", "InsRecTmcard",
     "<!DOCTYPE InsRecTmcard [<!ENTITY x \"boom\">]>" + insert("<Name>&x;</Name><Mapping/>"), "1",
     refusal(1, "a DTD is not accepted")},
    {"syntax_error_after_a_structural_fault", "InsRecTmcard", "<InsRecTmcard><Bogus/></Oops>", "1",
     refusal(1, "Opening and ending tag mismatch.")},
    {"refusal_quoting_characters_XML_cannot_carry_is_well_formed", "Get\x01Rec\x1f", "<x/>", "2",
     refusal(2, "unknown command &quot;Get\uFFFDRec\uFFFD&quot;")},
    {"body_of_another_command", "InsRecTmcard", "<DelTmcard/>", "3",
     refusal(3, "root &lt;DelTmcard&gt; where &lt;InsRecTmcard&gt; belongs")},
    {"update_built_from_an_empty_read", "UpdRecTmcard", "<UpdRecTmcard></UpdRecTmcard>", "4",
     refusal(4, "&lt;Tmcard&gt; missing in &lt;UpdRecTmcard&gt;")},
    {"signed_revision", "DelTmcard",
     "<DelTmcard><Revision>+1</Revision><TmcardID>1</TmcardID></DelTmcard>", "5",
     refusal(5, "&lt;Revision&gt; is not a decimal integer: &quot;+1&quot;")},
    {"update_of_a_time_card_not_held", "UpdRecTmcard",
     update("<Revision>1</Revision><TmcardID>42</TmcardID><Name>X</Name><Mapping/>"), "6",
     refusal(6, "no time card 42")},
    {"update_with_an_older_revision", "UpdRecTmcard",
     update("<Revision>0</Revision><TmcardID>1</TmcardID><Name>X</Name><Mapping/>"), "7",
     refusal(7, "time card 1 is at revision 1, not 0")},
    {"insert_killed_among_its_cameras", "InsRecTmcard", insert(kCard + kCameras), "", "", kDefault,
     15000},
    {"update_killed_after_the_cameras_were_cleared", "UpdRecTmcard", update(kCard + kCameras), "",
     "", kDefault, 3},
    {"delete_killed_after_the_cameras_went", "DelTmcard", kDelete, "", "", kDefault, 2},
    {"seed_keeps_identifiers_and_revisions", "seed",
     cards("<Tmcard><Revision>9</Revision><TmcardID>7</TmcardID><Name>N</Name><Mapping/></Tmcard>"),
     "0", "",
     "<Tmcard><Revision>9</Revision><TmcardID>7</TmcardID><Name>N</Name><Mapping></Mapping></"
     "Tmcard>"},
    {"seed_of_another_answer", "seed", "<InsRecTmcardRes/>", "3",
     "root <InsRecTmcardRes> where <GetRecTmcardRes> belongs"},
    {"insert_nested_64_levels_deep_is_stored", "InsRecTmcard", insert(deep(61, 1)), "0",
     "<InsRecTmcardRes><TmcardID>2</TmcardID></InsRecTmcardRes>",
     kDefault + tag("Tmcard", deep(61, 2))},
    {"insert_nested_65_levels_deep_is_refused", "InsRecTmcard", insert(deep(62, 1)), "4",
     refusal(4, "nested deeper than 64 levels")},
    {"update_nested_a_hundred_thousand_levels_deep_is_refused", "UpdRecTmcard",
     update(deep(100000, 1)), "4", refusal(4, "nested deeper than 64 levels")},
    {"seed_nested_65_levels_deep_is_refused", "seed", cards(tag("Tmcard", deep(62, 1))), "4",
     "nested deeper than 64 levels"},
    {"insert_of_a_second_time_card_with_a_fixed_name_is_refused", "InsRecTmcard",
     insert(fields(1, kEvent)), "9",
     refusal(9, "time card 1 is named &quot;KOLT2 Default Event Recording&quot; already"),
     card(1, kEvent), 0, card(1, kEvent)},
    {"update_giving_a_time_card_the_fixed_name_another_holds_is_refused", "UpdRecTmcard",
     update(fields(2, kCustomize)), "9",
     refusal(9, "time card 1 is named &quot;KOLT2 Customize Recording&quot; already"),
     card(1, kCustomize) + card(2, "Hall"), 0, card(1, kCustomize) + card(2, "Hall")},
    {"insert_after_identifier_2147483647_is_refused", "InsRecTmcard",
     insert("<Name>N</Name><Mapping/>"), "10",
     refusal(10, "no time card identifier left up to 2147483647"), card(2147483647, "Top"), 0,
     card(2147483647, "Top")},
    {"seed_with_an_identifier_beyond_31_bits_is_refused", "seed", cards(card(2147483648, "Big")),
     "5", "time card identifier 2147483648 is beyond 2147483647"},
};

INSTANTIATE_TEST_SUITE_P(Server, Requests, testing::ValuesIn(rows),
                         [](const auto &info) { return info.param.name; });

// A refused file stays byte for byte as it was: no tables, WAL switch or version.
TEST_F(ServerTest, OpenInitialisesAnEmptyFileAndLeavesFilesNotOursUntouched)
{
    const std::pair<QStringList, QString> files[] = {
        {{}, ""},
        {{"CREATE TABLE tmcard (id)", "PRAGMA user_version=2"},
         ": schema version 2, this server knows 1"},
        {{"CREATE TABLE t (x)", "INSERT INTO t VALUES (1)"},
         ": not a time card database: it holds tables of another kind"},
    };
    for (const auto &[statements, reason] : files) {
        const QString file = dir.filePath(QString("file%1.db").arg(reason.size()));
        runSql(file, statements);
        QFile bytes(file);
        const QByteArray before =
            bytes.open(QIODevice::ReadOnly | QIODevice::Unbuffered) ? bytes.readAll() : "";
        RecordingServer opened(file);
        EXPECT_EQ(opened.open().reason, reason.isEmpty() ? "" : file + reason);
        EXPECT_EQ(opened.dump(),
                  reason.isEmpty() ? cards(kDefault) : refusal(8, "database not open"));
        EXPECT_EQ(bytes.seek(0) && bytes.readAll() == before, !reason.isEmpty());
    }
}

// The child opens the file as a user who may not write it (root may write any file).
TEST_F(ServerTest, ReadOnlyFileIsRefusedPlainly)
{
    ASSERT_EQ(chmod(qPrintable(path()), 0444) + chmod(qPrintable(dir.path()), 0755), 0);
    GTEST_FLAG_SET(death_test_style, "fast");
    EXPECT_EXIT(
        {
            if (getuid() == 0 && (setgid(65534) != 0 || setuid(65534) != 0))
                _exit(2);
            std::cerr << RecordingServer(path()).open().reason.toStdString();
            _exit(0);
        },
        testing::ExitedWithCode(0), "db: the file is read-only, and the server writes to it$");
}

TEST_F(ServerTest, OfTwoWritersInsertingOneFixedNameAtOnceOneIsRefused)
{
    std::atomic<int> ready{0};
    const auto write = [&] {
        RecordingServer writer(path());
        writer.open();
        for (++ready; ready < 2;)
            std::this_thread::yield();
        return writer.handle("InsRecTmcard", insert(tag("Name", kEvent) + "<Mapping/>")).code;
    };
    auto first = std::async(std::launch::async, write);
    auto second = std::async(std::launch::async, write);
    const QString codes = first.get() + second.get();
    EXPECT_TRUE(codes == "09" || codes == "90") << codes.toStdString();
    EXPECT_EQ(server->dump().count(tag("Name", kEvent)), 1);
}

} // namespace

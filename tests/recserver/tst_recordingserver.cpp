// The simulated recording server on a file of its own: answers, codes, time cards after.

#include "RecordingServer.h"

#include <QSqlDatabase>
#include <QSqlQuery>
#include <QTemporaryDir>

#include <gtest/gtest.h>

#include <csignal>
#include <memory>
#include <unistd.h>

namespace {

const auto tag = [](const char *n, const QString &in) { return QString("<%1>%2</%1>").arg(n, in); };
const auto cards = [](const QString &inner) { return tag("GetRecTmcardRes", inner); };
const auto insert = [](const QString &card) { return tag("InsRecTmcard", tag("Tmcard", card)); };
const auto update = [](const QString &card) { return tag("UpdRecTmcard", tag("Tmcard", card)); };
const auto refusal = [](int code, const QString &reason) {
    return tag("Error", tag("Code", QString::number(code)) + tag("Reason", reason));
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
    friend void PrintTo(const Row &row, std::ostream *out) { *out << row.name; }
};

class Requests : public ServerTest, public testing::WithParamInterface<Row>
{};

TEST_P(Requests, AnswerAndLeaveTheTimecards)
{
    const Row &row = GetParam();
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
};

INSTANTIATE_TEST_SUITE_P(Server, Requests, testing::ValuesIn(rows),
                         [](const auto &info) { return info.param.name; });

TEST_F(ServerTest, NewerSchemaIsRefusedAndEveryRequestAnswersStorageFailure)
{
    server.reset();
    {
        QSqlDatabase db = QSqlDatabase::addDatabase("QSQLITE", "newer");
        db.setDatabaseName(path());
        ASSERT_TRUE(db.open() && QSqlQuery(db).exec("PRAGMA user_version=2"));
    }
    QSqlDatabase::removeDatabase("newer");
    RecordingServer newer(path());
    EXPECT_EQ(newer.open().reason, path() + ": schema version 2, this server knows 1");
    EXPECT_EQ(newer.handle("DelTmcard", "<DelTmcard/>").content, refusal(8, "database not open"));
}

const QString kNested =
    cards("<Tmcard><Revision>3</Revision><TmcardID>5</TmcardID><Name>Lobby</Name><Mapping><Ele>"
          "<DayList><Ele B=\"1.0\"/></DayList><Motion></Motion></Ele></Mapping><CamList><Cam>"
          "<Name>C_1</Name><GrpID>2</GrpID></Cam></CamList></Tmcard>");

// The plug-in sends a time card cut from a read answer back as an update,
// in whatever layout the server answered; a dump seeds the same state.
TEST_F(ServerTest, AnswerLayoutsAreReadBack)
{
    const std::pair<AnswerLayout, QString> layouts[] = {
        {AnswerLayout::Indented,
         "<GetRecTmcardRes>\n  <Tmcard>\n    <Revision>3</Revision>\n    <TmcardID>5</TmcardID>\n"
         "    <Name>Lobby</Name>\n    <Mapping>\n      <Ele>\n        <DayList>\n"
         "          <Ele B=\"1.0\"/>\n        </DayList>\n        <Motion></Motion>\n      </Ele>\n"
         "    </Mapping>\n    <CamList>\n      <Cam>\n        <Name>C_1</Name>\n"
         "        <GrpID>2</GrpID>\n      </Cam>\n    </CamList>\n  "
         "</Tmcard>\n</GetRecTmcardRes>\n"},
        {AnswerLayout::Crlf,
         "<GetRecTmcardRes>\r\n<Tmcard>\r\n<Revision>3</Revision>\r\n<TmcardID>5</TmcardID>\r\n"
         "<Name>Lobby</Name>\r\n<Mapping>\r\n<Ele>\r\n<DayList>\r\n<Ele "
         "B=\"1.0\"/>\r\n</DayList>\r\n"
         "<Motion></Motion>\r\n</Ele>\r\n</Mapping>\r\n<CamList>\r\n<Cam>\r\n<Name>C_1</Name>\r\n"
         "<GrpID>2</GrpID>\r\n</Cam>\r\n</CamList>\r\n</Tmcard>\r\n</GetRecTmcardRes>\r\n"},
    };
    for (const auto &[layout, expected] : layouts) {
        SCOPED_TRACE(static_cast<int>(layout));
        ASSERT_EQ(ask("seed", kNested).code, "0");
        server->setLayout(layout);
        const QString read = server->dump();
        EXPECT_EQ(read.toStdString(), expected.toStdString());
        EXPECT_EQ(ask("seed", read).code, "0");
        const qsizetype from = read.indexOf("<Tmcard>");
        const QString card = read.mid(from, read.indexOf("</Tmcard>") + 9 - from);
        EXPECT_EQ(ask("UpdRecTmcard", tag("UpdRecTmcard", card)).code, "0");
        server->setLayout(AnswerLayout::Compact);
        EXPECT_EQ(server->dump(), QString(kNested).replace("<Revision>3<", "<Revision>4<"));
    }
}

} // namespace

#include "ServerFixture.h"

#include <QFile>
#include <QSqlDatabase>
#include <QSqlQuery>
#include <QVariant>
#include <QXmlStreamReader>

#include <cctype>

namespace {

const QString kDefaultCard =
    QStringLiteral("<Tmcard><Revision>1</Revision><TmcardID>1</TmcardID><Name>Default "
                   "Schedule</Name><Mapping>%1</Mapping></Tmcard>")
        .arg(RecordingServer::defaultTimecardMapping());

QString answerOf(const QString &cards)
{
    return QStringLiteral("<GetRecTmcardRes>%1</GetRecTmcardRes>").arg(cards);
}

} // namespace

using RecordingServerTest = ServerFixture;

TEST_F(RecordingServerTest, FreshDatabaseHoldsOnlyTheDefaultTimecard)
{
    EXPECT_EQ(server->dump(), answerOf(kDefaultCard));
    EXPECT_EQ(readOne(1), answerOf(kDefaultCard));
}

TEST_F(RecordingServerTest, InsertAssignsTheNextIdentifierAndFirstRevision)
{
    const ServerAnswer answer =
        ask(QStringLiteral("InsRecTmcard"),
            insertBody(QStringLiteral("Lobby"), weekdayMapping(), cameraList({{"C_12", 3}})));
    EXPECT_EQ(answer.code, QStringLiteral("0"));
    EXPECT_EQ(answer.content,
              QStringLiteral("<InsRecTmcardRes><TmcardID>2</TmcardID></InsRecTmcardRes>"));
    // Cameras come back with GrpID, the mapping exactly as it was sent.
    EXPECT_EQ(readOne(2),
              answerOf(QStringLiteral(
                           "<Tmcard><Revision>1</Revision><TmcardID>2</TmcardID><Name>Lobby</Name>"
                           "<Mapping>%1</Mapping><CamList><Cam><Name>C_12</Name><GrpID>3</GrpID>"
                           "</Cam></CamList></Tmcard>")
                           .arg(weekdayMapping())));
}

TEST_F(RecordingServerTest, TimecardWithoutCamerasHasNoCameraList)
{
    ask(QStringLiteral("InsRecTmcard"), insertBody(QStringLiteral("Empty"), QString()));
    EXPECT_EQ(readOne(2),
              answerOf(QStringLiteral("<Tmcard><Revision>1</Revision><TmcardID>2</TmcardID>"
                                      "<Name>Empty</Name><Mapping></Mapping></Tmcard>")));
    // An empty camera list element stores no cameras either.
    ask(QStringLiteral("UpdRecTmcard"), updateBody(1, 2, QStringLiteral("Empty"), QString(),
                                                   QStringLiteral("<CamList></CamList>")));
    EXPECT_FALSE(readOne(2).contains(QLatin1String("CamList")));
}

TEST_F(RecordingServerTest, EscapedNamesRoundTrip)
{
    const QString escaped = QStringLiteral("A &amp; B &lt;x&gt; &quot;q&quot; &apos;s&apos;");
    ask(QStringLiteral("InsRecTmcard"),
        insertBody(escaped, QString(),
                   QStringLiteral("<CamList><Cam><Name>C_&amp;1</Name>"
                                  "<RecGrpID>1</RecGrpID></Cam></CamList>")));
    const QString read = readOne(2);
    EXPECT_TRUE(read.contains(QStringLiteral("<Name>%1</Name>").arg(escaped)))
        << read.toStdString();
    EXPECT_TRUE(read.contains(QStringLiteral("<Name>C_&amp;1</Name>")));
}

TEST_F(RecordingServerTest, ReadAllIsInIdentifierOrder)
{
    for (const char *name : {"B", "A", "C"})
        ask(QStringLiteral("InsRecTmcard"), insertBody(QLatin1String(name), QString()));
    const QString all = server->dump();
    const qsizetype b = all.indexOf(QLatin1String("<TmcardID>2</TmcardID><Name>B"));
    const qsizetype a = all.indexOf(QLatin1String("<TmcardID>3</TmcardID><Name>A"));
    const qsizetype c = all.indexOf(QLatin1String("<TmcardID>4</TmcardID><Name>C"));
    EXPECT_TRUE(all.startsWith(answerOf(kDefaultCard).chopped(18)));
    EXPECT_TRUE(b > 0 && b < a && a < c);
}

TEST_F(RecordingServerTest, ReadOfUnknownIdentifierIsEmptyAndAccepted)
{
    const ServerAnswer answer =
        ask(QStringLiteral("GetRecTmcard"),
            QStringLiteral("<GetRecTmcard><TmcardID>99</TmcardID></GetRecTmcard>"));
    EXPECT_EQ(answer.code, QStringLiteral("0"));
    EXPECT_EQ(answer.content, QStringLiteral("<GetRecTmcardRes></GetRecTmcardRes>"));
}

TEST_F(RecordingServerTest, UpdateReplacesEverythingAndRaisesTheRevision)
{
    ask(QStringLiteral("InsRecTmcard"), insertBody(QStringLiteral("Lobby"), weekdayMapping(),
                                                   cameraList({{"C_1", 1}, {"C_2", 2}})));
    const ServerAnswer answer =
        ask(QStringLiteral("UpdRecTmcard"),
            updateBody(1, 2, QStringLiteral("Hall"),
                       QStringLiteral("<Ele><RecMode>Event</RecMode></Ele>"),
                       cameraList({{"C_9", 4}})));
    EXPECT_EQ(answer.code, QStringLiteral("0"));
    EXPECT_EQ(
        answer.content,
        QStringLiteral(
            "<UpdRecTmcardRes><TmcardID>2</TmcardID><Revision>2</Revision></UpdRecTmcardRes>"));
    EXPECT_EQ(readOne(2),
              answerOf(QStringLiteral(
                  "<Tmcard><Revision>2</Revision><TmcardID>2</TmcardID><Name>Hall</Name>"
                  "<Mapping><Ele><RecMode>Event</RecMode></Ele></Mapping><CamList><Cam>"
                  "<Name>C_9</Name><GrpID>4</GrpID></Cam></CamList></Tmcard>")));
}

// The plug-in sends a time card text taken from a read answer back with only
// its camera list replaced, in whatever layout the server answered.
class UpdateFromAnswerText : public ServerFixture,
                             public ::testing::WithParamInterface<AnswerLayout>
{};

TEST_P(UpdateFromAnswerText, IsAcceptedInEveryLayout)
{
    ask(QStringLiteral("InsRecTmcard"), insertBody(QStringLiteral("Lobby"), weekdayMapping(),
                                                   cameraList({{"C_1", 1}, {"C_2", 2}})));
    server->setLayout(GetParam());
    QString text = readOne(2).trimmed();
    text = text.mid(17, text.size() - 17 - 18);
    const ServerAnswer answer = ask(QStringLiteral("UpdRecTmcard"),
                                    QStringLiteral("<UpdRecTmcard>%1</UpdRecTmcard>").arg(text));
    EXPECT_EQ(answer.code, QStringLiteral("0")) << answer.content.toStdString();
    server->setLayout(AnswerLayout::Compact);
    // Cameras kept in their GrpID form; the mapping is stored as before.
    EXPECT_EQ(
        readOne(2),
        answerOf(QStringLiteral(
                     "<Tmcard><Revision>2</Revision><TmcardID>2</TmcardID><Name>Lobby</Name>"
                     "<Mapping>%1</Mapping><CamList><Cam><Name>C_1</Name><GrpID>1</GrpID></Cam>"
                     "<Cam><Name>C_2</Name><GrpID>2</GrpID></Cam></CamList></Tmcard>")
                     .arg(weekdayMapping())));
}

INSTANTIATE_TEST_SUITE_P(Layouts, UpdateFromAnswerText,
                         ::testing::Values(AnswerLayout::Compact, AnswerLayout::Indented,
                                           AnswerLayout::Crlf));

TEST_F(RecordingServerTest, StaleRevisionLosesToTheFirstWriter)
{
    ask(QStringLiteral("InsRecTmcard"), insertBody(QStringLiteral("Lobby"), QString()));
    // Two clients read revision 1; the first update wins.
    EXPECT_EQ(
        ask(QStringLiteral("UpdRecTmcard"), updateBody(1, 2, QStringLiteral("First"), QString()))
            .code,
        QStringLiteral("0"));
    const QString before = server->dump();
    const ServerAnswer second =
        ask(QStringLiteral("UpdRecTmcard"), updateBody(1, 2, QStringLiteral("Second"), QString()));
    EXPECT_EQ(second.code, QStringLiteral("7"));
    EXPECT_EQ(server->dump(), before);
    EXPECT_EQ(
        ask(QStringLiteral("DelTmcard"),
            QStringLiteral("<DelTmcard><Revision>1</Revision><TmcardID>2</TmcardID></DelTmcard>"))
            .code,
        QStringLiteral("7"));
    EXPECT_EQ(server->dump(), before);
}

TEST_F(RecordingServerTest, DeleteRemovesTheTimecardWithItsCamerasAndNeverReusesItsIdentifier)
{
    ask(QStringLiteral("InsRecTmcard"),
        insertBody(QStringLiteral("Gone"), QString(), cameraList({{"C_1", 1}})));
    const ServerAnswer answer =
        ask(QStringLiteral("DelTmcard"),
            QStringLiteral("<DelTmcard><Revision>1</Revision><TmcardID>2</TmcardID></DelTmcard>"));
    EXPECT_EQ(answer.code, QStringLiteral("0"));
    EXPECT_EQ(server->dump(), answerOf(kDefaultCard));
    close();
    {
        QSqlDatabase db =
            QSqlDatabase::addDatabase(QStringLiteral("QSQLITE"), QStringLiteral("check"));
        db.setDatabaseName(path());
        ASSERT_TRUE(db.open());
        QSqlQuery cameras(db);
        ASSERT_TRUE(cameras.exec(QStringLiteral("SELECT count(*) FROM cam")) && cameras.next());
        EXPECT_EQ(cameras.value(0).toInt(), 0);
    }
    QSqlDatabase::removeDatabase(QStringLiteral("check"));
    reopen();
    EXPECT_EQ(
        ask(QStringLiteral("InsRecTmcard"), insertBody(QStringLiteral("New"), QString())).content,
        QStringLiteral("<InsRecTmcardRes><TmcardID>3</TmcardID></InsRecTmcardRes>"));
}

struct RefusalRow
{
    const char *behaviour;
    const char *command;
    const char *body;
    int code;
};

class Refusals : public ServerFixture, public ::testing::WithParamInterface<RefusalRow>
{};

TEST_P(Refusals, AnswerTheirCodeAndChangeNothing)
{
    ASSERT_EQ(ask(QStringLiteral("InsRecTmcard"),
                  insertBody(QStringLiteral("Lobby"), weekdayMapping(), cameraList({{"C_1", 1}})))
                  .code,
              QStringLiteral("0"));
    const QString before = server->dump();
    const ServerAnswer answer =
        ask(QString::fromUtf8(GetParam().command), QString::fromUtf8(GetParam().body));
    EXPECT_EQ(answer.code, QString::number(GetParam().code)) << answer.content.toStdString();
    EXPECT_TRUE(
        answer.content.startsWith(QStringLiteral("<Error><Code>%1</Code>").arg(GetParam().code)))
        << answer.content.toStdString();
    EXPECT_EQ(server->dump(), before);
}

const RefusalRow kRefusals[] = {
    {"empty body is malformed", "InsRecTmcard", "", 1},
    {"unclosed element is malformed", "UpdRecTmcard",
     "<UpdRecTmcard><Tmcard><Revision>1</Revision><TmcardID>2</TmcardID><Name>X</Name><Mapping/>",
     1},
    {"unescaped less-than in a name is malformed", "InsRecTmcard",
     "<InsRecTmcard><Tmcard><Name>a<b</Name><Mapping/></Tmcard></InsRecTmcard>", 1},
    {"DTD with an entity is refused", "InsRecTmcard",
     "<!DOCTYPE InsRecTmcard [<!ENTITY x \"boom\">]><InsRecTmcard><Tmcard><Name>&x;</Name>"
     "<Mapping/></Tmcard></InsRecTmcard>",
     1},
    {"content after the root is malformed", "DelTmcard",
     "<DelTmcard><Revision>1</Revision><TmcardID>2</TmcardID></DelTmcard><DelTmcard/>", 1},
    {"syntax error after a structural one is reported as malformed", "InsRecTmcard",
     "<InsRecTmcard><Bogus/></Oops>", 1},
    {"unknown command", "SetRecTmcard", "<SetRecTmcard/>", 2},
    {"command name is case-sensitive", "delTmcard",
     "<DelTmcard><Revision>1</Revision><TmcardID>2</TmcardID></DelTmcard>", 2},
    {"update body under the insert command", "InsRecTmcard",
     "<UpdRecTmcard><Tmcard><Revision>1</Revision><TmcardID>2</TmcardID><Name>X</Name><Mapping/>"
     "</Tmcard></UpdRecTmcard>",
     3},
    {"delete body under the update command", "UpdRecTmcard",
     "<DelTmcard><Revision>1</Revision><TmcardID>2</TmcardID></DelTmcard>", 3},
    {"insert without a name", "InsRecTmcard",
     "<InsRecTmcard><Tmcard><Mapping/></Tmcard></InsRecTmcard>", 4},
    {"insert without a mapping", "InsRecTmcard",
     "<InsRecTmcard><Tmcard><Name>X</Name></Tmcard></InsRecTmcard>", 4},
    {"insert without a time card", "InsRecTmcard", "<InsRecTmcard></InsRecTmcard>", 4},
    {"two time cards in one insert", "InsRecTmcard",
     "<InsRecTmcard><Tmcard><Name>X</Name><Mapping/></Tmcard><Tmcard><Name>Y</Name><Mapping/>"
     "</Tmcard></InsRecTmcard>",
     4},
    {"name given twice", "InsRecTmcard",
     "<InsRecTmcard><Tmcard><Name>X</Name><Name>Y</Name><Mapping/></Tmcard></InsRecTmcard>", 4},
    {"unknown element in a time card", "InsRecTmcard",
     "<InsRecTmcard><Tmcard><Name>X</Name><Mapping/><Owner>me</Owner></Tmcard></InsRecTmcard>", 4},
    {"camera without a group", "InsRecTmcard",
     "<InsRecTmcard><Tmcard><Name>X</Name><Mapping/><CamList><Cam><Name>C_1</Name></Cam>"
     "</CamList></Tmcard></InsRecTmcard>",
     4},
    {"text beside elements of a time card", "InsRecTmcard",
     "<InsRecTmcard><Tmcard>junk<Name>X</Name><Mapping/></Tmcard></InsRecTmcard>", 4},
    {"update without a revision", "UpdRecTmcard",
     "<UpdRecTmcard><Tmcard><TmcardID>2</TmcardID><Name>X</Name><Mapping/></Tmcard></UpdRecTmcard>",
     4},
    {"update without an identifier", "UpdRecTmcard",
     "<UpdRecTmcard><Tmcard><Revision>1</Revision><Name>X</Name><Mapping/></Tmcard></UpdRecTmcard>",
     4},
    {"update without a time card, as built from an empty read", "UpdRecTmcard",
     "<UpdRecTmcard></UpdRecTmcard>", 4},
    {"delete without a revision", "DelTmcard", "<DelTmcard><TmcardID>2</TmcardID></DelTmcard>", 4},
    {"read asking for all and one", "GetRecTmcard",
     "<GetRecTmcard><TmcardAll>true</TmcardAll><TmcardID>1</TmcardID></GetRecTmcard>", 4},
    {"read asking for nothing", "GetRecTmcard", "<GetRecTmcard/>", 4},
    {"non-numeric revision", "UpdRecTmcard",
     "<UpdRecTmcard><Tmcard><Revision>one</Revision><TmcardID>2</TmcardID><Name>X</Name>"
     "<Mapping/></Tmcard></UpdRecTmcard>",
     5},
    {"empty identifier", "DelTmcard",
     "<DelTmcard><Revision>1</Revision><TmcardID></TmcardID></DelTmcard>", 5},
    {"revision beyond 64 bits", "DelTmcard",
     "<DelTmcard><Revision>99999999999999999999</Revision><TmcardID>2</TmcardID></DelTmcard>", 5},
    {"fractional identifier in a read", "GetRecTmcard",
     "<GetRecTmcard><TmcardID>2.0</TmcardID></GetRecTmcard>", 5},
    {"non-numeric group", "InsRecTmcard",
     "<InsRecTmcard><Tmcard><Name>X</Name><Mapping/><CamList><Cam><Name>C_1</Name>"
     "<RecGrpID>g1</RecGrpID></Cam></CamList></Tmcard></InsRecTmcard>",
     5},
    {"negative group", "InsRecTmcard",
     "<InsRecTmcard><Tmcard><Name>X</Name><Mapping/><CamList><Cam><Name>C_1</Name>"
     "<RecGrpID>-1</RecGrpID></Cam></CamList></Tmcard></InsRecTmcard>",
     5},
    {"empty camera name", "InsRecTmcard",
     "<InsRecTmcard><Tmcard><Name>X</Name><Mapping/><CamList><Cam><Name></Name>"
     "<RecGrpID>1</RecGrpID></Cam></CamList></Tmcard></InsRecTmcard>",
     5},
    {"TmcardAll false", "GetRecTmcard", "<GetRecTmcard><TmcardAll>false</TmcardAll></GetRecTmcard>",
     5},
    {"update of an unknown time card", "UpdRecTmcard",
     "<UpdRecTmcard><Tmcard><Revision>1</Revision><TmcardID>42</TmcardID><Name>X</Name><Mapping/>"
     "</Tmcard></UpdRecTmcard>",
     6},
    {"delete of an unknown time card", "DelTmcard",
     "<DelTmcard><Revision>1</Revision><TmcardID>42</TmcardID></DelTmcard>", 6},
    {"update with an older revision", "UpdRecTmcard",
     "<UpdRecTmcard><Tmcard><Revision>0</Revision><TmcardID>2</TmcardID><Name>X</Name><Mapping/>"
     "</Tmcard></UpdRecTmcard>",
     7},
    {"update with a newer revision", "UpdRecTmcard",
     "<UpdRecTmcard><Tmcard><Revision>2</Revision><TmcardID>2</TmcardID><Name>X</Name><Mapping/>"
     "</Tmcard></UpdRecTmcard>",
     7},
    {"delete with the wrong revision", "DelTmcard",
     "<DelTmcard><Revision>5</Revision><TmcardID>2</TmcardID></DelTmcard>", 7},
};

INSTANTIATE_TEST_SUITE_P(Bodies, Refusals, ::testing::ValuesIn(kRefusals),
                         [](const ::testing::TestParamInfo<RefusalRow> &info) {
                             std::string name;
                             for (const char *c = info.param.behaviour; *c; ++c)
                                 name += std::isalnum(static_cast<unsigned char>(*c)) ? *c : '_';
                             return name;
                         });

TEST_F(RecordingServerTest, OneHundredThousandCamerasOnOneTimecard)
{
    QString cameras;
    for (int i = 0; i < 100000; ++i)
        cameras +=
            QStringLiteral("<Cam><Name>C_%1</Name><RecGrpID>%2</RecGrpID></Cam>").arg(i).arg(i % 7);
    cameras = QStringLiteral("<CamList>%1</CamList>").arg(cameras);
    ASSERT_EQ(
        ask(QStringLiteral("InsRecTmcard"), insertBody(QStringLiteral("Many"), QString(), cameras))
            .code,
        QStringLiteral("0"));
    const QString read = readOne(2);
    EXPECT_EQ(read.count(QLatin1String("<Cam>")), 100000);
    EXPECT_TRUE(
        read.contains(QLatin1String("<CamList><Cam><Name>C_0</Name><GrpID>0</GrpID></Cam>")));
    EXPECT_TRUE(read.endsWith(QLatin1String(
        "<Cam><Name>C_99999</Name><GrpID>4</GrpID></Cam></CamList></Tmcard></GetRecTmcardRes>")));
    // The read text goes back as an update and replaces all of them.
    const QString card = read.mid(17, read.size() - 35);
    EXPECT_EQ(ask(QStringLiteral("UpdRecTmcard"),
                  QStringLiteral("<UpdRecTmcard>%1</UpdRecTmcard>").arg(card))
                  .code,
              QStringLiteral("0"));
    EXPECT_EQ(readOne(2).count(QLatin1String("<Cam>")), 100000);
}

TEST_F(RecordingServerTest, SeedReplacesAllTimecardsKeepingIdentifiersAndRevisions)
{
    const QString seeded = answerOf(QStringLiteral("<Tmcard><Revision>4</Revision><TmcardID>3</"
                                                   "TmcardID><Name>KOLT2 Customize Recording</Name>"
                                                   "<Mapping>%1</Mapping><CamList><Cam><Name>C_5</"
                                                   "Name><GrpID>2</GrpID></Cam></CamList></Tmcard>"
                                                   "<Tmcard><Revision>9</Revision><TmcardID>7</"
                                                   "TmcardID><Name>Night</Name><Mapping></Mapping>"
                                                   "</Tmcard>")
                                        .arg(weekdayMapping()));
    QString error;
    ASSERT_TRUE(server->seed(seeded, &error)) << error.toStdString();
    EXPECT_EQ(server->dump(), seeded);
    EXPECT_EQ(
        ask(QStringLiteral("InsRecTmcard"), insertBody(QStringLiteral("Next"), QString())).content,
        QStringLiteral("<InsRecTmcardRes><TmcardID>8</TmcardID></InsRecTmcardRes>"));
}

TEST_F(RecordingServerTest, DumpInEveryLayoutSeedsTheSameState)
{
    ask(QStringLiteral("InsRecTmcard"),
        insertBody(QStringLiteral("Lobby"), weekdayMapping(), cameraList({{"C_1", 1}})));
    const QString compact = server->dump();
    for (const AnswerLayout layout : {AnswerLayout::Indented, AnswerLayout::Crlf}) {
        server->setLayout(layout);
        const QString laidOut = server->dump();
        server->setLayout(AnswerLayout::Compact);
        ASSERT_TRUE(server->seed(laidOut));
        EXPECT_EQ(server->dump(), compact);
    }
}

TEST_F(RecordingServerTest, RefusedSeedChangesNothing)
{
    const QString before = server->dump();
    const char *const documents[] = {
        "<GetRecTmcardRes><Tmcard><Revision>1</Revision><TmcardID>3</TmcardID><Name>A</Name>"
        "<Mapping/></Tmcard><Tmcard><Revision>1</Revision><TmcardID>3</TmcardID><Name>B</Name>"
        "<Mapping/></Tmcard></GetRecTmcardRes>",
        "<GetRecTmcardRes><Tmcard><Revision>1</Revision><TmcardID>0</TmcardID><Name>A</Name>"
        "<Mapping/></Tmcard></GetRecTmcardRes>",
        "<GetRecTmcardRes><Tmcard><TmcardID>3</TmcardID><Name>A</Name><Mapping/></Tmcard>"
        "</GetRecTmcardRes>",
        "<InsRecTmcardRes><TmcardID>3</TmcardID></InsRecTmcardRes>",
        "<GetRecTmcardRes><Tmcard>",
    };
    for (const char *document : documents) {
        QString error;
        EXPECT_FALSE(server->seed(QString::fromUtf8(document), &error)) << document;
        EXPECT_FALSE(error.isEmpty());
        EXPECT_EQ(server->dump(), before) << document;
    }
}

TEST_F(RecordingServerTest, StateSurvivesReopening)
{
    ask(QStringLiteral("InsRecTmcard"),
        insertBody(QStringLiteral("Kept"), weekdayMapping(), cameraList({{"C_3", 1}})));
    const QString before = server->dump();
    reopen();
    EXPECT_EQ(server->dump(), before);
}

TEST_F(RecordingServerTest, OpenRefusesNewerSchemaAndForeignFiles)
{
    close();
    {
        QSqlDatabase db =
            QSqlDatabase::addDatabase(QStringLiteral("QSQLITE"), QStringLiteral("newer"));
        db.setDatabaseName(path());
        ASSERT_TRUE(db.open());
        QSqlQuery query(db);
        ASSERT_TRUE(query.exec(QStringLiteral("PRAGMA user_version=2")));
    }
    QSqlDatabase::removeDatabase(QStringLiteral("newer"));
    RecordingServer newer(path());
    QString error;
    EXPECT_FALSE(newer.open(&error));
    EXPECT_TRUE(error.contains(QLatin1String("schema version 2"))) << error.toStdString();
    EXPECT_EQ(
        newer
            .handle(QStringLiteral("GetRecTmcard"),
                    QStringLiteral("<GetRecTmcard><TmcardAll>true</TmcardAll></GetRecTmcard>"))
            .code,
        QStringLiteral("8"));

    const QString garbage = m_dir.filePath(QStringLiteral("garbage.db"));
    QFile file(garbage);
    ASSERT_TRUE(file.open(QIODevice::WriteOnly));
    file.write(QByteArray(4096, 'x'));
    file.close();
    RecordingServer foreign(garbage);
    EXPECT_FALSE(foreign.open(&error));
    EXPECT_FALSE(error.isEmpty());
}

// A refusal may quote the client's raw input; characters XML cannot carry
// would otherwise make the answer itself unreadable.
TEST_F(RecordingServerTest, RefusalsQuotingRawInputAreStillWellFormed)
{
    const ServerAnswer answers[] = {
        ask(QStringLiteral("Get\x01Rec\x1f"), QStringLiteral("<x/>")),
        ask(QStringLiteral("InsRecTmcard"),
            QStringLiteral("<InsRecTmcard><Tmcard><Name>a &am\x01; b")),
        ask(QStringLiteral("GetRecTmcard"),
            QStringLiteral("<GetRecTmcard><TmcardID>%1\x02</TmcardID>").arg(QChar(0xD800))),
    };
    for (const ServerAnswer &answer : answers) {
        EXPECT_NE(answer.code, QStringLiteral("0"));
        QXmlStreamReader reader(answer.content);
        while (!reader.atEnd())
            reader.readNext();
        EXPECT_FALSE(reader.hasError()) << answer.content.toStdString();
    }
}

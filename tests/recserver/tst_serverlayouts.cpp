#include "ServerFixture.h"

#include <QStringList>

namespace {

const QString kCard = QStringLiteral(
    "<GetRecTmcardRes><Tmcard><Revision>3</Revision><TmcardID>5</TmcardID><Name>Lobby</Name>"
    "<Mapping><Ele><Frame><Name>F</Name><DayList><Ele B=\"1.0\"/></DayList></Frame>"
    "<RecMode>Event</RecMode><Motion></Motion></Ele></Mapping><CamList><Cam><Name>C_1</Name>"
    "<GrpID>2</GrpID></Cam></CamList></Tmcard></GetRecTmcardRes>");

const QStringList kLines = {
    QStringLiteral("<GetRecTmcardRes>"),
    QStringLiteral("  <Tmcard>"),
    QStringLiteral("    <Revision>3</Revision>"),
    QStringLiteral("    <TmcardID>5</TmcardID>"),
    QStringLiteral("    <Name>Lobby</Name>"),
    QStringLiteral("    <Mapping>"),
    QStringLiteral("      <Ele>"),
    QStringLiteral("        <Frame>"),
    QStringLiteral("          <Name>F</Name>"),
    QStringLiteral("          <DayList>"),
    QStringLiteral("            <Ele B=\"1.0\"/>"),
    QStringLiteral("          </DayList>"),
    QStringLiteral("        </Frame>"),
    QStringLiteral("        <RecMode>Event</RecMode>"),
    QStringLiteral("        <Motion></Motion>"),
    QStringLiteral("      </Ele>"),
    QStringLiteral("    </Mapping>"),
    QStringLiteral("    <CamList>"),
    QStringLiteral("      <Cam>"),
    QStringLiteral("        <Name>C_1</Name>"),
    QStringLiteral("        <GrpID>2</GrpID>"),
    QStringLiteral("      </Cam>"),
    QStringLiteral("    </CamList>"),
    QStringLiteral("  </Tmcard>"),
    QStringLiteral("</GetRecTmcardRes>"),
};

QString crlfText()
{
    QString text;
    for (const QString &line : kLines)
        text += line.trimmed() + QLatin1String("\r\n");
    return text;
}

} // namespace

struct LayoutRow
{
    const char *behaviour;
    AnswerLayout layout;
    QString expected;
};

class AnswerLayouts : public ServerFixture, public ::testing::WithParamInterface<LayoutRow>
{};

TEST_P(AnswerLayouts, WriteTheReadAnswer)
{
    ASSERT_TRUE(server->seed(kCard));
    server->setLayout(GetParam().layout);
    EXPECT_EQ(server->dump(), GetParam().expected);
}

TEST_P(AnswerLayouts, WriteTheSameElementsForEveryAnswer)
{
    server->setLayout(GetParam().layout);
    const ServerAnswer inserted =
        ask(QStringLiteral("InsRecTmcard"), insertBody(QStringLiteral("X"), QString()));
    const ServerAnswer refused = ask(QStringLiteral("DelTmcard"), QStringLiteral("<DelTmcard/>"));
    EXPECT_EQ(compactOf(inserted.content),
              QStringLiteral("<InsRecTmcardRes><TmcardID>2</TmcardID></InsRecTmcardRes>"));
    EXPECT_TRUE(
        compactOf(refused.content).startsWith(QStringLiteral("<Error><Code>4</Code><Reason>")));
}

INSTANTIATE_TEST_SUITE_P(
    Layouts, AnswerLayouts,
    ::testing::Values(
        LayoutRow{"compact has no white space between elements", AnswerLayout::Compact, kCard},
        LayoutRow{"indented has two spaces a level and LF line ends", AnswerLayout::Indented,
                  kLines.join(QLatin1Char('\n')) + QLatin1Char('\n')},
        LayoutRow{"crlf has CRLF line ends and no indentation", AnswerLayout::Crlf, crlfText()}),
    [](const ::testing::TestParamInfo<LayoutRow> &info) {
        std::string name;
        for (const char *c = info.param.behaviour; *c; ++c)
            name += std::isalnum(static_cast<unsigned char>(*c)) ? *c : '_';
        return name;
    });

TEST(AnswerLayoutNames, ParseInAnyLetterCase)
{
    AnswerLayout layout = AnswerLayout::Compact;
    EXPECT_TRUE(parseAnswerLayout(QStringLiteral("CRLF"), &layout));
    EXPECT_EQ(layout, AnswerLayout::Crlf);
    EXPECT_TRUE(parseAnswerLayout(QStringLiteral("indented"), &layout));
    EXPECT_EQ(layout, AnswerLayout::Indented);
    EXPECT_FALSE(parseAnswerLayout(QStringLiteral("pretty"), &layout));
}

using MappingText = ServerFixture;

// The mapping comes back as the client sent it, whatever layout it came in.
TEST_F(MappingText, IsStoredCanonicallyAndWrittenBackAsSent)
{
    const QString sent = QStringLiteral(
        "<Ele><Frame><Name>a &amp; b</Name><Note></Note><Ele B=\"1.0\" E=\"x&quot;y\"/></Frame>"
        "<RecMode> </RecMode></Ele>");
    ask(QStringLiteral("InsRecTmcard"), insertBody(QStringLiteral("M"), sent));
    EXPECT_TRUE(readOne(2).contains(QStringLiteral("<Mapping>%1</Mapping>").arg(sent)));

    // Same mapping sent indented, with a comment: stored the same.
    const QString indented = QStringLiteral(
        "\n  <Ele>\r\n    <Frame><!-- note -->\n      <Name>a &amp; b</Name>\n      <Note></Note>\n"
        "      <Ele B=\"1.0\" E='x\"y'/>\n    </Frame>\n    <RecMode> </RecMode>\n  </Ele>\n");
    ask(QStringLiteral("UpdRecTmcard"), updateBody(1, 2, QStringLiteral("M"), indented));
    EXPECT_TRUE(readOne(2).contains(QStringLiteral("<Mapping>%1</Mapping>").arg(sent)))
        << readOne(2).toStdString();
}

// Camera removal in the plug-in deletes CRLF pairs from the camera list and
// then matches each camera exactly: the Crlf layout must survive that.
TEST_F(MappingText, CrlfCameraListReadsCompactOnceLineEndsAreRemoved)
{
    ask(QStringLiteral("InsRecTmcard"),
        insertBody(QStringLiteral("C"), QString(), cameraList({{"C_1", 1}, {"C_22", 3}})));
    server->setLayout(AnswerLayout::Crlf);
    QString text = readOne(2);
    text = text.mid(text.indexOf(QLatin1String("<CamList>")));
    text.remove(QLatin1String("\r\n"));
    EXPECT_TRUE(text.startsWith(
        QLatin1String("<CamList><Cam><Name>C_1</Name><GrpID>1</GrpID></Cam><Cam><Name>C_22</"
                      "Name><GrpID>3</GrpID></Cam></CamList>")));
}

// Composition of time card messages from client input: the bytes sent for a
// schedule content document, a name and a camera list.
#include "ControlTestSupport.h"
#include "TestLog.h"

#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>
#include <QRegularExpression>

#include <cmath>
#include <limits>

namespace {

// A schedule named Lobby, days 1 to 5 from 08:00 to 18:00 in mode
// "Continuous", with camera C_12 in recording group 3.
const QString LobbyBody = QStringLiteral(
    R"(<InsRecTmcard><Tmcard><Revision>0</Revision><TmcardID>0</TmcardID><Name>Lobby</Name><Mapping><Ele><Frame><Name>Customize time frame</Name><DLMod>SingleDay</DLMod><RepeatMod>Weekly</RepeatMod><DayList><Ele B="1.0"/><Ele B="2.0"/><Ele B="3.0"/><Ele B="4.0"/><Ele B="5.0"/></DayList><Intervals><Ele B="28800" E="64800"/></Intervals><Holiday>false</Holiday><Range><Period><TmS>2016-03-29 00:00:00.000</TmS><TmE>2035-01-01 00:00:00.000</TmE></Period><End>false</End></Range><RepeatFreq>1</RepeatFreq></Frame><RecMode>Continuous</RecMode></Ele></Mapping><CamList><Cam><Name>C_12</Name><RecGrpID>3</RecGrpID></Cam></CamList></Tmcard></InsRecTmcard>)");
const QString LobbyContent = QStringLiteral(
    R"({"Rectangles":[{"Bottom":18,"Left":0,"RecordingMode":"Continuous","Right":5,"Top":8}]})");
const QString DefaultContinuousMapping = QStringLiteral(
    R"(<Ele><Frame><Name>Always</Name><Holiday>false</Holiday><RepeatMod>Weekly</RepeatMod><DLMod>SingleDay</DLMod><Intervals><Ele B="0" E="86400"/></Intervals><DayList><Ele B="1.0"/><Ele B="2.0"/><Ele B="3.0"/><Ele B="4.0"/><Ele B="5.0"/><Ele B="6.0"/><Ele B="7.0"/></DayList><Range><Period><TmS>2016-03-29 00:00:00.000</TmS><TmE>2035-01-01 00:00:00.000</TmE></Period><End>false</End></Range><RepeatFreq>1</RepeatFreq></Frame><RecMode>Continuous</RecMode><AllEvent>true</AllEvent><Motion>true</Motion><ContMotNum>1</ContMotNum><DigiInput>3</DigiInput></Ele>)");
const QString DefaultEventMapping = QStringLiteral(
    R"(<Ele><Frame><Name>Always</Name><Holiday>false</Holiday><RepeatMod>Weekly</RepeatMod><DLMod>SingleDay</DLMod><Intervals><Ele B="0" E="86400"/></Intervals><DayList><Ele B="1.0"/><Ele B="2.0"/><Ele B="3.0"/><Ele B="4.0"/><Ele B="5.0"/><Ele B="6.0"/><Ele B="7.0"/></DayList><Range><Period><TmS>2016-03-29 00:00:00.000</TmS><TmE>2035-01-01 00:00:00.000</TmE></Period><End>false</End></Range><RepeatFreq>1</RepeatFreq></Frame><RecMode>Event</RecMode><AllEvent>true</AllEvent><Motion>true</Motion><ContMotNum>1</ContMotNum><DigiInput>3</DigiInput></Ele>)");

QString sentBody(TestTunnel &tunnel)
{
    return tunnel.sent().isEmpty() ? QString() : tunnel.sent().last().body;
}

// The Mapping content sent for a document by AddSchedule.
QString mappingSentFor(const QString &content)
{
    TestTunnel tunnel;
    RecordingSettingControl control(&tunnel);
    control.AddSchedule(QStringLiteral("S"), content, {});
    const QString body = sentBody(tunnel);
    const qsizetype from = body.indexOf("<Mapping>") + 9;
    return body.mid(from, body.lastIndexOf("</Mapping>") - from);
}

QString withoutCameraList(QString body)
{
    return body.remove(QRegularExpression("<CamList>.*</CamList>"));
}

TEST(WorkedExamples, InsertOfTheLobbySchedule)
{
    TestTunnel tunnel;
    RecordingSettingControl control(&tunnel);
    ASSERT_TRUE(control.AddSchedule("Lobby", LobbyContent, {}));
    EXPECT_EQ(sentBody(tunnel), withoutCameraList(LobbyBody));
    ASSERT_TRUE(control.CreateCustomizeTimecard(LobbyContent, {camera("C_12", "3")}, {}));
    EXPECT_EQ(
        sentBody(tunnel),
        QString(LobbyBody).replace("<Name>Lobby</Name>", "<Name>KOLT2 Customize Recording</Name>"));
    EXPECT_EQ(tunnel.commands(), QStringList({"InsRecTmcard", "InsRecTmcard"}));
}

TEST(WorkedExamples, EventRectangleCarriesAllTriggerElements)
{
    const QString content = QStringLiteral(
        R"({"Rectangles":[{"Bottom":18,"Left":0,"RecordingMode":"Event","Right":5,"Top":8,)"
        R"("triggerEvents":{"motion":true,"di":true,"traditional":true,)"
        R"("recordingStateTrigger":true,"recordingStateNormal":false}}]})");
    const QString frame =
        LobbyBody.mid(LobbyBody.indexOf("<Frame>"),
                      LobbyBody.indexOf("<RecMode>") - LobbyBody.indexOf("<Frame>"));
    const QString triggers = QStringLiteral(
        "<Motion>1</Motion><ContMotNum>1</ContMotNum><DigiInput>1</DigiInput><PIR>0</PIR>"
        "<Tampering>0</Tampering><PPTZTrigger>0</PPTZTrigger>"
        "<StopUntilDIFalling>0</StopUntilDIFalling><StopUntilDIRising>0</StopUntilDIRising>"
        "<LineDetection>0</LineDetection><FieldDetection>0</FieldDetection>"
        "<Loitering>0</Loitering><CrowdDetection>0</CrowdDetection>"
        "<MissingObject>0</MissingObject><AbandonObject>0</AbandonObject>"
        "<FaceDetection>0</FaceDetection><ZoneDetection>0</ZoneDetection>"
        "<SmartTracking>0</SmartTracking><RunningDetection>0</RunningDetection>"
        "<ParkingViolationDetection>0</ParkingViolationDetection>"
        "<RestrictedZoneDetection>0</RestrictedZoneDetection>"
        "<TemperatureThresholdWarning>0</TemperatureThresholdWarning>"
        "<TemperatureThresholdAlarm>0</TemperatureThresholdAlarm>"
        "<TemperatureDifferenceWarning>0</TemperatureDifferenceWarning>"
        "<TemperatureDifferenceAlarm>0</TemperatureDifferenceAlarm>"
        "<TemperatureRiseWarning>0</TemperatureRiseWarning>"
        "<TemperatureRiseAlarm>0</TemperatureRiseAlarm>"
        "<TemperatureSectionAlarm>0</TemperatureSectionAlarm>"
        "<ThermalIntrusion>0</ThermalIntrusion><ThermalMultiLoitering>0</ThermalMultiLoitering>"
        "<FireSpotDetection>0</FireSpotDetection><SmokerDetection>0</SmokerDetection>"
        "<SmokeAndFlameDetection>0</SmokeAndFlameDetection>");
    EXPECT_EQ(mappingSentFor(content),
              "<Ele>" + frame + "<RecMode>Event</RecMode>" + triggers + "</Ele>");
    EXPECT_EQ(mappingSentFor(QString(content).replace("\"Event\"", "\"Continuous\"")),
              "<Ele>" + frame + "<RecMode>Continuous</RecMode></Ele>");
}

TEST(WorkedExamples, UpdateAndInsertOfTheDefaultTimecards)
{
    TestTunnel tunnel;
    RecordingSettingControl control(&tunnel);
    const QMap<QString, QVariant> summary{
        {"Revision", "5"}, {"TmcardID", "2"}, {"CamList", QList<QVariant>{camera("C_1", "1")}}};
    ASSERT_TRUE(control.UpdateDefaultContinuousTimecard(summary, {camera("C_7", "2")}, {}));
    EXPECT_EQ(
        sentBody(tunnel),
        QStringLiteral(
            R"(<UpdRecTmcard><Tmcard><Revision>5</Revision><TmcardID>2</TmcardID><Name>KOLT2 Default Continuous Recording</Name><Mapping>)") +
            DefaultContinuousMapping +
            QStringLiteral(
                R"(</Mapping><CamList><Cam><Name>C_7</Name><RecGrpID>2</RecGrpID></Cam><Cam><Name>C_1</Name><RecGrpID>1</RecGrpID></Cam></CamList></Tmcard></UpdRecTmcard>)"));
    ASSERT_TRUE(control.CreateDefaultEventTimecard({}, {}));
    EXPECT_EQ(sentBody(tunnel), "<InsRecTmcard><Tmcard><Revision>0</Revision><TmcardID>0</TmcardID>"
                                "<Name>KOLT2 Default Event Recording</Name><Mapping>" +
                                    DefaultEventMapping + "</Mapping></Tmcard></InsRecTmcard>");
    EXPECT_EQ(tunnel.commands(), QStringList({"UpdRecTmcard", "InsRecTmcard"}));
}

struct Row
{
    const char *name;
    QString input;
    QString expected;
};

void PrintTo(const Row &row, std::ostream *out)
{
    *out << row.name;
}

QString rectangle(const QString &fields)
{
    return R"({"Rectangles":[{"RecordingMode":"Continuous",)" + fields + "}]}";
}

QString days(std::initializer_list<int> numbers)
{
    QString entries;
    for (const int day : numbers)
        entries += QStringLiteral("<Ele B=\"%1.0\"/>").arg(day);
    return "<DayList>" + entries + "</DayList>";
}

class DayList : public ::testing::TestWithParam<Row>
{};

TEST_P(DayList, DaysFromLeftPlusOneToRightWithinTheWeek)
{
    const QString mapping = mappingSentFor(rectangle(GetParam().input + R"(,"Top":0,"Bottom":1)"));
    const qsizetype from = mapping.indexOf("<DayList>");
    EXPECT_EQ(mapping.mid(from, mapping.indexOf("</DayList>") + 10 - from), GetParam().expected);
}

// clang-format off
INSTANTIATE_TEST_SUITE_P(Rectangles, DayList, ::testing::Values(
    Row{"SixToSevenIsDaySeven", R"("Left":6,"Right":7)", days({7})},
    Row{"EqualBoundsGiveNoDay", R"("Left":3,"Right":3)", days({})},
    Row{"ReversedBoundsGiveNoDay", R"("Left":5,"Right":2)", days({})},
    Row{"WholeWeek", R"("Left":0,"Right":7)", days({1, 2, 3, 4, 5, 6, 7})},
    Row{"NegativeLeftStartsAtDayOne", R"("Left":-5,"Right":2)", days({1, 2})},
    Row{"HugeRightStopsAtDaySeven", R"("Left":5,"Right":2000000000)", days({6, 7})},
    Row{"BeyondIntRangeSaturates", R"("Left":-1e300,"Right":1e300)", days({1, 2, 3, 4, 5, 6, 7})},
    Row{"MissingBoundsGiveNoDay", R"("Top":0)", days({})}),
    [](const auto &info) { return std::string(info.param.name); });
// clang-format on

class Interval : public ::testing::TestWithParam<Row>
{};

TEST_P(Interval, HoursBecomeSecondsRoundedToTheNearest)
{
    const QString mapping = mappingSentFor(rectangle(R"("Left":0,"Right":1,)" + GetParam().input));
    const qsizetype from = mapping.indexOf("<Intervals>") + 11;
    EXPECT_EQ(mapping.mid(from, mapping.indexOf("</Intervals>") - from), GetParam().expected);
}

// clang-format off
INSTANTIATE_TEST_SUITE_P(Rectangles, Interval, ::testing::Values(
    Row{"QuarterHours", R"("Top":8.25,"Bottom":24)", R"(<Ele B="29700" E="86400"/>)"},
    Row{"SixDigitHoursKeepTheirSecond", R"("Top":0.333333,"Bottom":23.9997)", R"(<Ele B="1200" E="86399"/>)"},
    Row{"HugeHoursSaturate", R"("Top":-1e300,"Bottom":1e300)", R"(<Ele B="-2147483648" E="2147483647"/>)"},
    Row{"MissingHoursAreZero", R"("Left":0)", R"(<Ele B="0" E="0"/>)"},
    Row{"OutOfDayGoesOutAsComputed", R"("Top":-1,"Bottom":25)", R"(<Ele B="-3600" E="90000"/>)"}),
    [](const auto &info) { return std::string(info.param.name); });
// clang-format on

TEST_F(RecordingSettingControlTest, EverySecondOfTheDaySurvivesTheTripThroughTheDocument)
{
    const RecordingSettingControl control(nullptr);
    int moved = 0;
    for (int second = 0; second <= 86400; ++second) {
        const double hours = QString::number(second / 3600.0, 'g', 6).toDouble();
        const QString expected = QStringLiteral("<Ele B=\"%1\" E=\"%1\"/>").arg(second);
        moved += composeInterval(control, hours, hours) == expected ? 0 : 1;
    }
    EXPECT_EQ(moved, 0);
}

TEST_F(RecordingSettingControlTest, NotANumberIsZeroAndInfinitySaturates)
{
    const RecordingSettingControl control(nullptr);
    EXPECT_EQ(composeInterval(control, std::nan(""), std::numeric_limits<double>::infinity()),
              R"(<Ele B="0" E="2147483647"/>)");
}

QString triggerSet(const QString &triggerEvents, const QString &mode = "Event")
{
    const QString mapping = mappingSentFor(
        R"({"Rectangles":[{"Left":0,"Right":1,"RecordingMode":")" + mode + "\"" +
        (triggerEvents.isNull() ? QString() : ",\"triggerEvents\":" + triggerEvents) + "}]}");
    const qsizetype from = mapping.indexOf("</RecMode>") + 10;
    QStringList set;
    QXmlStreamReader reader("<t>" + mapping.mid(from, mapping.lastIndexOf("</Ele>") - from) +
                            "</t>");
    reader.readNextStartElement();
    while (reader.readNextStartElement()) {
        const QString element = reader.name().toString();
        const QString value = reader.readElementText();
        if (value != "0")
            set << element + "=" + value;
    }
    return set.join(' ');
}

class Triggers : public ::testing::TestWithParam<Row>
{};

TEST_P(Triggers, NonZeroTriggerElements)
{
    EXPECT_EQ(triggerSet(GetParam().input), GetParam().expected);
}

// clang-format off
INSTANTIATE_TEST_SUITE_P(EventRectangles, Triggers, ::testing::Values(
    Row{"OnlyMotion", R"({"motion":true})", "Motion=1 ContMotNum=1"},
    Row{"DigitalInputOnTrigger", R"({"di":true,"traditional":true,"recordingStateTrigger":true})", "ContMotNum=1 DigiInput=1"},
    Row{"DigitalInputOnNormal", R"({"di":true,"traditional":true,"recordingStateNormal":true})", "ContMotNum=1 DigiInput=2"},
    Row{"DigitalInputOnBoth", R"({"di":true,"traditional":true,"recordingStateTrigger":true,"recordingStateNormal":true})", "ContMotNum=1 DigiInput=3"},
    Row{"DigitalInputWithoutStates", R"({"di":true,"traditional":true})", "ContMotNum=1"},
    Row{"NotTraditionalIgnoresStates", R"({"di":true,"traditional":false,"recordingStateTrigger":true})", "ContMotNum=1"},
    Row{"StopUntilFlagsStandOnTheirOwn", R"({"activatedToNormal":true,"normalToActivated":true,"Motion":true})", "ContMotNum=1 StopUntilDIFalling=1 StopUntilDIRising=1"},
    Row{"LastOfTheTable", R"({"smokeAndFlameDetection":true,"pptz":1})", "ContMotNum=1 PPTZTrigger=1 SmokeAndFlameDetection=1"}),
    [](const auto &info) { return std::string(info.param.name); });
// clang-format on

TEST(Triggers, OnlyTheExactEventModeGetsTriggerElements)
{
    TestLog log;
    log.attach();
    EXPECT_EQ(triggerSet(R"({"motion":true})", "event"), "");
    EXPECT_TRUE(log.texts().isEmpty());
    EXPECT_EQ(triggerSet(QString(), "Event"), "");
    EXPECT_EQ(triggerSet("{}", "Event"), "");
    EXPECT_EQ(log.texts(2),
              QStringList({"trigget events map is empty", "trigget events map is empty"}));
}

TEST(Documents, OddDocumentsStillSendAWellFormedTimecard)
{
    TestLog log;
    log.attach();
    const Row rows[] = {
        {"NotJson", "{Rectangles", {}},
        {"NotAnObject", "[1,2]", {}},
        {"Empty", "", {}},
        {"NoRectangles", R"({"Rectangles":[]})", {}},
        {"RectanglesNotAList", R"({"Rectangles":"x"})", {}},
        {"EntryNotAnObject", R"({"Rectangles":[7]})", {}},
    };
    for (const Row &row : rows) {
        TestTunnel tunnel;
        RecordingSettingControl control(&tunnel);
        ASSERT_TRUE(control.AddSchedule("S", row.input, {})) << row.name;
        EXPECT_TRUE(isWellFormedXml(sentBody(tunnel))) << row.name;
    }
    EXPECT_EQ(mappingSentFor(R"({"Rectangles":[]})"), "");
    const QString odd = mappingSentFor(R"({"Rectangles":[7]})");
    EXPECT_TRUE(odd.contains("<DayList></DayList><Intervals><Ele B=\"0\" E=\"0\"/></Intervals>"));
    EXPECT_TRUE(odd.endsWith("<RecMode></RecMode></Ele>"));
    EXPECT_EQ(log.texts(2),
              QStringList({"Time frames parse error. {Rectangles", "Time frames parse error. [1,2]",
                           "Time frames parse error. "}));
}

TEST(Documents, TwoRectanglesOnTheSameHoursGiveTwoMappingElementsInOrder)
{
    const QString mapping = mappingSentFor(
        R"({"Rectangles":[{"Left":0,"Right":1,"RecordingMode":"A"},{"Left":0,"Right":1,"RecordingMode":"B"}]})");
    EXPECT_EQ(mapping.count("<Ele><Frame>"), 2);
    EXPECT_LT(mapping.indexOf("<RecMode>A"), mapping.indexOf("<RecMode>B"));
}

class Escaping : public ::testing::TestWithParam<Row>
{};

// Text put into a template reaches the server as the same text.
TEST_P(Escaping, NameCameraAndModeReadBackAsSent)
{
    const QString text = GetParam().input;
    const QString expected = GetParam().expected.isNull() ? text : GetParam().expected;
    TestTunnel tunnel;
    RecordingSettingControl control(&tunnel);
    const QString content =
        QJsonDocument(
            QJsonObject{{"Rectangles", QJsonArray{QJsonObject{
                                           {"Left", 0}, {"Right", 1}, {"RecordingMode", text}}}}})
            .toJson();
    ASSERT_TRUE(control.UpdateSchedule(text, text, text, content, {camera(text, text)}, {}));
    const QString body = sentBody(tunnel);
    ASSERT_TRUE(isWellFormedXml(body)) << body.toStdString();
    for (const char *element : {"Revision", "TmcardID", "Name", "RecMode", "RecGrpID"})
        EXPECT_EQ(elementText(body, element), expected) << element;
    EXPECT_EQ(elementText(body.mid(body.indexOf("<Cam>")), "Name"), expected);
    EXPECT_EQ(body.count("<Tmcard>"), 1);
}

// clang-format off
INSTANTIATE_TEST_SUITE_P(Texts, Escaping, ::testing::Values(
    Row{"MarkupCannotRewriteAnotherField", "A</Name><TmcardID>5</TmcardID><Name>B", {}},
    Row{"AmpersandAndLessThan", "R&D <1> & 2", {}},
    Row{"Quotes", R"(say "hi" 'there')", {}},
    Row{"MarkerInsideANameIsNotFilled", "50%1 off %2%3", {}},
    Row{"EntityLookalike", "&amp;&lt;", {}},
    Row{"CarriageReturnSurvives", "a\r\nb\rc", {}},
    Row{"CharacterXmlCannotCarryIsReplaced", QString("a") + QChar(1) + "b", QString("a") + QChar(0xFFFD) + "b"},
    Row{"LoneSurrogateIsReplaced", QString("a") + QChar(0xD800), QString("a") + QChar(0xFFFD)},
    Row{"PairedSurrogatesStay", QString::fromUtf8("cam \xF0\x9F\x93\xB7"), {}}),
    [](const auto &info) { return std::string(info.param.name); });
// clang-format on

} // namespace

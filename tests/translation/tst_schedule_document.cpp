// The schedule content document a client reads for a time card's mapping,
// as "GetAllScheduleRecInfo" hands it out: exact text, and always JSON.

#include "QtPrinters.h"
#include "QueryRunner.h"
#include "TimecardTrees.h"

#include <QJsonArray>

#include <gtest/gtest.h>

#include <random>

using namespace TimecardTrees;

namespace {

const QString OneDay = QStringLiteral("1.0");
const Interval WholeDay{QStringLiteral("0"), QStringLiteral("86400")};

QString documentOf(const QVariant &mappingEle)
{
    QueryRunner runner;
    const QString document = runner.document(mappingEle);
    EXPECT_EQ(runner.replies, 1);
    EXPECT_TRUE(parsedDocument(document).value(QLatin1String("Rectangles")).isArray())
        << "not JSON: " << document.toStdString();
    return document;
}

QString continuousRectangle(const QString &bottom, const QString &left, const QString &right,
                            const QString &top)
{
    return QStringLiteral("{\"Bottom\":%1,\"Left\":%2,\"RecordingMode\":\"Continuous\",\"Right\":%"
                          "3,\"Top\":%4}")
        .arg(bottom, left, right, top);
}

QString rectangles(const QStringList &objects)
{
    return QStringLiteral("{\"Rectangles\":[") + objects.join(QLatin1Char(',')) +
           QStringLiteral("]}");
}

// --- Worked examples --------------------------------------------------------

TEST(ScheduleDocument, TwoRunsByTwoIntervalsGiveFourRectanglesRunByRun)
{
    const Map weekdays = mapping(
        frame(days({"1.0", "2.0", "3.0", "5.0"}), intervals({{"0", "28800"}, {"64800", "86400"}})),
        QStringLiteral("Continuous"));
    EXPECT_EQ(
        documentOf(weekdays),
        QStringLiteral("{\"Rectangles\":[{\"Bottom\":8,\"Left\":0,\"RecordingMode\":\"Continuous\","
                       "\"Right\":3,\"Top\":0},{\"Bottom\":24,\"Left\":0,\"RecordingMode\":"
                       "\"Continuous\",\"Right\":3,\"Top\":18},{\"Bottom\":8,\"Left\":4,"
                       "\"RecordingMode\":\"Continuous\",\"Right\":5,\"Top\":0},{\"Bottom\":24,"
                       "\"Left\":4,\"RecordingMode\":\"Continuous\",\"Right\":5,\"Top\":18}]}"));
}

TEST(ScheduleDocument, DefaultEventMappingHasTheShortTriggerSet)
{
    EXPECT_EQ(
        documentOf(defaultMapping(QStringLiteral("Event"))),
        QStringLiteral(
            "{\"Rectangles\":[{\"Bottom\":24,\"Left\":0,\"RecordingMode\":\"Event\",\"Right\":7,"
            "\"Top\":0,\"triggerEvents\":{\"motion\":true,\"pir\":false,\"tampering\":false,"
            "\"pptz\":false,\"lineDetection\":false,\"fieldDetection\":false,\"loitering\":false,"
            "\"crowdDetection\":false,\"missingObject\":false,\"abandonObject\":false,"
            "\"faceDetection\":false,\"di\":true,\"traditional\":true,\"recordingStateTrigger\":"
            "true,\"recordingStateNormal\":true,\"activatedToNormal\":false,"
            "\"normalToActivated\":false}}]}"));
}

TEST(ScheduleDocument, DefaultContinuousMappingIsOneWholeWeekRectangle)
{
    EXPECT_EQ(documentOf(defaultMapping(QStringLiteral("Continuous"))),
              QStringLiteral("{\"Rectangles\":[{\"Bottom\":24,\"Left\":0,\"RecordingMode\":"
                             "\"Continuous\",\"Right\":7,\"Top\":0}]}"));
}

// --- Day runs ----------------------------------------------------------------

struct DayCase
{
    const char *name;
    QVariant dayEntries; // invalid: no "DayList" at all
    QList<QPair<qint64, qint64>> runs;
};

void PrintTo(const DayCase &c, std::ostream *os)
{
    *os << c.name;
}

class DayRuns : public ::testing::TestWithParam<DayCase>
{};

TEST_P(DayRuns, GiveLeftAndRightInTimeCardOrder)
{
    Map frameMap = frame(GetParam().dayEntries, intervals({WholeDay}));
    if (!GetParam().dayEntries.isValid())
        frameMap.remove(QStringLiteral("DayList"));
    const QJsonArray rects =
        parsedDocument(documentOf(mapping(frameMap, QStringLiteral("Continuous"))))
            .value(QLatin1String("Rectangles"))
            .toArray();
    QList<QPair<qint64, qint64>> runs;
    for (const QJsonValue &rect : rects)
        runs.append(
            {rect[QLatin1String("Left")].toInteger(), rect[QLatin1String("Right")].toInteger()});
    EXPECT_EQ(runs, GetParam().runs);
}

constexpr qint64 IntMax = 2147483647;
constexpr qint64 IntMin = -2147483647 - 1;

INSTANTIATE_TEST_SUITE_P(
    ScheduleDocument, DayRuns,
    ::testing::Values(
        DayCase{"WholeWeekAscendingIsOneRun",
                days({"1.0", "2.0", "3.0", "4.0", "5.0", "6.0", "7.0"}),
                {{0, 7}}},
        DayCase{"WholeWeekDescendingIsSevenRuns",
                days({"7.0", "6.0", "5.0", "4.0", "3.0", "2.0", "1.0"}),
                {{6, 7}, {5, 6}, {4, 5}, {3, 4}, {2, 3}, {1, 2}, {0, 1}}},
        DayCase{"GapsStartNewRuns", days({"1.0", "3.0", "5.0"}), {{0, 1}, {2, 3}, {4, 5}}},
        DayCase{"OnlyTheNextDayExtendsARun",
                days({"1.0", "2.0", "3.0", "5.0", "6.0"}),
                {{0, 3}, {4, 6}}},
        DayCase{"RunsAreNotSorted", days({"3.0", "2.0", "1.0"}), {{2, 3}, {1, 2}, {0, 1}}},
        DayCase{"RepeatedDayIsARunOfItsOwn", days({"1.0", "1.0"}), {{0, 1}, {0, 1}}},
        DayCase{"LoneDayEntryGivenAsAMap", days({"4.0"}), {{3, 4}}},
        DayCase{"SundayAloneIsTheLastColumn", days({"7.0"}), {{6, 7}}},
        DayCase{"FractionIsTruncated", days({"2.9"}), {{1, 2}}},
        DayCase{"NegativeFractionIsTruncatedTowardZero", days({"-1.5"}), {{-2, -1}}},
        DayCase{"MissingDayListIsDayZero", QVariant(), {{-1, 0}}},
        DayCase{"TextThatIsNoNumberIsDayZero", days({"Monday"}), {{-1, 0}}},
        DayCase{"DayEntryWithoutAttributeIsDayZero", QStringLiteral("3"), {{-1, 0}}},
        DayCase{"EmptyListOfDaysIsDayZero", QVariantList(), {{-1, 0}}},
        DayCase{"NotANumberIsDayZero", days({"nan"}), {{-1, 0}}},
        DayCase{"InfinityIsDayZero", days({"inf"}), {{-1, 0}}},
        DayCase{"OverflowingNumberIsDayZero", days({"1e400"}), {{-1, 0}}},
        DayCase{"HugeDaySaturates", days({"1e10"}), {{IntMax - 1, IntMax}}},
        DayCase{"HugeNegativeDaySaturates", days({"-1e10"}), {{IntMin - 1, IntMin}}},
        DayCase{"SaturatedDaysDoNotOverflowTheRun",
                days({"2147483647", "1e12"}),
                {{IntMax - 1, IntMax}, {IntMax - 1, IntMax}}}),
    [](const auto &info) { return std::string(info.param.name); });

// --- Intervals and number forms --------------------------------------------------

struct IntervalCase
{
    const char *name;
    QVariant intervalEntries; // invalid: no "Intervals" at all
    QStringList topBottom;    // the texts of Top and Bottom, per interval
};

void PrintTo(const IntervalCase &c, std::ostream *os)
{
    *os << c.name;
}

class Intervals : public ::testing::TestWithParam<IntervalCase>
{};

TEST_P(Intervals, GiveTopAndBottomInHoursWithSixDigits)
{
    Map frameMap = frame(days({OneDay}), GetParam().intervalEntries);
    if (!GetParam().intervalEntries.isValid())
        frameMap.remove(QStringLiteral("Intervals"));
    QStringList expected;
    for (int i = 0; i + 1 < GetParam().topBottom.size(); i += 2)
        expected << continuousRectangle(GetParam().topBottom[i + 1], QStringLiteral("0"),
                                        QStringLiteral("1"), GetParam().topBottom[i]);
    EXPECT_EQ(documentOf(mapping(frameMap, QStringLiteral("Continuous"))), rectangles(expected));
}

INSTANTIATE_TEST_SUITE_P(
    ScheduleDocument, Intervals,
    ::testing::Values(
        IntervalCase{"WholeDay", intervals({WholeDay}), {"0", "24"}},
        IntervalCase{"HalfHour", intervals({{"0", "1800"}}), {"0", "0.5"}},
        IntervalCase{"QuarterPastEight", intervals({{"29700", "86399"}}), {"8.25", "23.9997"}},
        IntervalCase{
            "SixSignificantDigits", intervals({{"1200", "30000"}}), {"0.333333", "8.33333"}},
        IntervalCase{"DecimalSeconds", intervals({{"1800.0", "3600.5"}}), {"0.5", "1.00014"}},
        IntervalCase{"TwoIntervalsInTimeCardOrder",
                     intervals({{"64800", "86400"}, {"0", "28800"}}),
                     {"18", "24", "0", "8"}},
        IntervalCase{"ReversedIntervalIsWrittenAsItIs", intervals({{"7200", "3600"}}), {"2", "1"}},
        IntervalCase{"NegativeSecondsAreNotClamped", intervals({{"-3600", "90000"}}), {"-1", "25"}},
        IntervalCase{
            "HugeSecondsUseTheExponentForm", intervals({{"3.6e10", "3.6e-3"}}), {"1e+07", "1e-06"}},
        IntervalCase{"MissingIntervalsAreZeroToZero", QVariant(), {"0", "0"}},
        IntervalCase{
            "MissingEndIsZero", Map{{QStringLiteral("@B"), QStringLiteral("3600")}}, {"1", "0"}},
        IntervalCase{"TextThatIsNoNumberIsZero", intervals({{"eight", "18:00"}}), {"0", "0"}},
        IntervalCase{"NotANumberIsZero", intervals({{"nan", "NaN"}}), {"0", "0"}},
        IntervalCase{"InfinityIsZero", intervals({{"inf", "-inf"}}), {"0", "0"}},
        IntervalCase{"OverflowIsZero", intervals({{"1e400", "-1e400"}}), {"0", "0"}}),
    [](const auto &info) { return std::string(info.param.name); });

// --- Rectangles and frames ------------------------------------------------------

TEST(ScheduleDocument, FramesAreNeverMergedAndKeepTheirOrder)
{
    const Map late = mapping(frame(days({"2.0"}), intervals({{"72000", "86400"}})),
                             QStringLiteral("Continuous"));
    const Map early =
        mapping(frame(days({"1.0"}), intervals({{"0", "3600"}})), QStringLiteral("Continuous"));
    EXPECT_EQ(documentOf(QVariantList{late, early, early}),
              rectangles({continuousRectangle("24", "1", "2", "20"),
                          continuousRectangle("1", "0", "1", "0"),
                          continuousRectangle("1", "0", "1", "0")}));
}

struct PlaceholderCase
{
    const char *name;
    QVariant mappingEle;
    QString expected;
};

void PrintTo(const PlaceholderCase &c, std::ostream *os)
{
    *os << c.name;
}

class Placeholders : public ::testing::TestWithParam<PlaceholderCase>
{};

TEST_P(Placeholders, StandForFramesThatDoNotRepeatWeekly)
{
    EXPECT_EQ(documentOf(GetParam().mappingEle), GetParam().expected);
}

const QString EmptyPlaceholder = QStringLiteral(
    "{\"Rectangles\":[{\"Bottom\":-1,\"Left\":-1,\"RecordingMode\":\"\",\"Right\":-1,"
    "\"Top\":-1}]}");

INSTANTIATE_TEST_SUITE_P(
    ScheduleDocument, Placeholders,
    ::testing::Values(
        PlaceholderCase{"OtherRepeatModeKeepsTheMode",
                        mapping(frame(days({OneDay}), intervals({WholeDay}), "Daily"),
                                QStringLiteral("Continuous")),
                        QStringLiteral("{\"Rectangles\":[{\"Bottom\":-1,\"Left\":-1,"
                                       "\"RecordingMode\":\"Continuous\",\"Right\":-1,"
                                       "\"Top\":-1}]}")},
        PlaceholderCase{"RepeatModeIsCaseSensitive",
                        mapping(frame(days({OneDay}), intervals({WholeDay}), "weekly"),
                                QStringLiteral("Continuous")),
                        QStringLiteral("{\"Rectangles\":[{\"Bottom\":-1,\"Left\":-1,"
                                       "\"RecordingMode\":\"Continuous\",\"Right\":-1,"
                                       "\"Top\":-1}]}")},
        PlaceholderCase{"EventPlaceholderHasNoTriggerEvents",
                        mapping(frame(days({OneDay}), intervals({WholeDay}), ""),
                                QStringLiteral("Event"), defaultTriggers()),
                        QStringLiteral("{\"Rectangles\":[{\"Bottom\":-1,\"Left\":-1,"
                                       "\"RecordingMode\":\"Event\",\"Right\":-1,"
                                       "\"Top\":-1}]}")},
        PlaceholderCase{"MappingWithoutElementIsOneEmptyFrame", QVariant(), EmptyPlaceholder},
        PlaceholderCase{"EmptyListOfMappingElementsIsOneEmptyFrame", QVariantList(),
                        EmptyPlaceholder},
        PlaceholderCase{"MappingElementThatIsTextIsOneEmptyFrame", QStringLiteral("junk"),
                        EmptyPlaceholder},
        PlaceholderCase{"PlaceholdersAndRectanglesMix",
                        QVariantList{Map(), mapping(frame(days({OneDay}), intervals({WholeDay})),
                                                    QStringLiteral("Continuous"))},
                        QStringLiteral("{\"Rectangles\":[{\"Bottom\":-1,\"Left\":-1,"
                                       "\"RecordingMode\":\"\",\"Right\":-1,\"Top\":-1},"
                                       "{\"Bottom\":24,\"Left\":0,\"RecordingMode\":"
                                       "\"Continuous\",\"Right\":1,\"Top\":0}]}")}),
    [](const auto &info) { return std::string(info.param.name); });

TEST(ScheduleDocument, TimecardWithoutMappingIsOneEmptyFrame)
{
    QueryRunner runner;
    const ReplyRecorder::Reply reply = runner.run(QStringLiteral("GetAllScheduleRecInfo"),
                                                  {Map{{QStringLiteral("TmcardID"), "4"}}});
    EXPECT_EQ(reply.data.toList().value(0).toMap().value(QStringLiteral("CustomizeContent")),
              EmptyPlaceholder);
}

// --- Trigger events ---------------------------------------------------------------

QString triggerEventsOf(const Map &triggers, const QString &mode = QStringLiteral("Event"))
{
    const QString document =
        documentOf(mapping(frame(days({OneDay}), intervals({WholeDay})), mode, triggers));
    const int start = document.indexOf(QLatin1String(",\"triggerEvents\":"));
    return start < 0 ? QString() : document.mid(start, document.size() - start - 3);
}

struct TriggerCase
{
    const char *name;
    Map triggers;
    QString expected; // the trigger event text, from its leading comma
};

void PrintTo(const TriggerCase &c, std::ostream *os)
{
    *os << c.name;
}

class TriggerEvents : public ::testing::TestWithParam<TriggerCase>
{};

TEST_P(TriggerEvents, ReflectTheTimecardElements)
{
    EXPECT_EQ(triggerEventsOf(GetParam().triggers), GetParam().expected);
}

QString triggerText(const QString &firstEleven, const QString &optional, const QString &digital)
{
    return QStringLiteral(",\"triggerEvents\":{") + firstEleven + optional + digital +
           QLatin1Char('}');
}

const QString NoneOfTheEleven = QStringLiteral(
    "\"motion\":false,\"pir\":false,\"tampering\":false,\"pptz\":false,\"lineDetection\":false,"
    "\"fieldDetection\":false,\"loitering\":false,\"crowdDetection\":false,\"missingObject\":"
    "false,\"abandonObject\":false,\"faceDetection\":false");
const QString AllOfTheEleven =
    QString(NoneOfTheEleven).replace(QLatin1String("false"), QLatin1String("true"));
const QString NoDigitalInput = QStringLiteral(
    ",\"di\":false,\"traditional\":false,\"recordingStateTrigger\":false,"
    "\"recordingStateNormal\":false,\"activatedToNormal\":false,\"normalToActivated\":false");

QString digitalInput(bool di, bool traditional, bool trigger, bool normal, bool falling,
                     bool rising)
{
    const auto b = [](bool v) { return v ? QStringLiteral("true") : QStringLiteral("false"); };
    return QStringLiteral(",\"di\":%1,\"traditional\":%2,\"recordingStateTrigger\":%3,"
                          "\"recordingStateNormal\":%4,\"activatedToNormal\":%5,"
                          "\"normalToActivated\":%6")
        .arg(b(di), b(traditional), b(trigger), b(normal), b(falling), b(rising));
}

Map allElements(const QString &value, bool withOptional)
{
    Map result;
    for (const char *name :
         {"Motion", "PIR", "Tampering", "PPTZTrigger", "LineDetection", "FieldDetection",
          "Loitering", "CrowdDetection", "MissingObject", "AbandonObject", "FaceDetection"})
        result.insert(QLatin1String(name), value);
    if (withOptional) {
        for (const char *name :
             {"ZoneDetection", "SmartTracking", "RunningDetection", "ParkingViolationDetection",
              "RestrictedZoneDetection", "TemperatureThresholdWarning", "TemperatureThresholdAlarm",
              "TemperatureDifferenceWarning", "TemperatureDifferenceAlarm",
              "TemperatureRiseWarning", "TemperatureRiseAlarm", "TemperatureSectionAlarm",
              "ThermalIntrusion", "ThermalMultiLoitering", "FireSpotDetection", "SmokerDetection",
              "SmokeAndFlameDetection"})
            result.insert(QLatin1String(name), value);
    }
    return result;
}

const QString AllOptional = QStringLiteral(
    ",\"zoneDetection\":true,\"smartTracking\":true,\"runningDetection\":true,"
    "\"parkingViolationDetection\":true,\"restrictedZoneDetection\":true,"
    "\"temperatureThresholdWarning\":true,\"temperatureThresholdAlarm\":true,"
    "\"temperatureDifferenceWarning\":true,\"temperatureDifferenceAlarm\":true,"
    "\"temperatureRiseWarning\":true,\"temperatureRiseAlarm\":true,"
    "\"temperatureSectionAlarm\":true,\"thermalIntrusion\":true,\"thermalMultiLoitering\":true,"
    "\"fireSpotDetection\":true,\"smokerDetection\":true,\"smokeAndFlameDetection\":true");

Map with(Map base, const QString &key, const QString &value)
{
    base.insert(key, value);
    return base;
}

INSTANTIATE_TEST_SUITE_P(
    ScheduleDocument, TriggerEvents,
    ::testing::Values(
        TriggerCase{"NoElementsAreAllFalseWithoutOptionalKeys", Map(),
                    triggerText(NoneOfTheEleven, QString(), NoDigitalInput)},
        TriggerCase{"FirstElevenSetWithDigitalInputZero",
                    with(allElements("1", false), "DigiInput", "0"),
                    triggerText(AllOfTheEleven, QString(), NoDigitalInput)},
        TriggerCase{"AllSeventeenOptionalElementsInTableOrder", allElements("true", true),
                    triggerText(AllOfTheEleven, AllOptional, NoDigitalInput)},
        TriggerCase{"PresentButEmptyOptionalElementIsFalse",
                    Map{{QStringLiteral("ZoneDetection"), QString()}},
                    triggerText(NoneOfTheEleven, QStringLiteral(",\"zoneDetection\":false"),
                                NoDigitalInput)},
        TriggerCase{"BooleanTextsFalse",
                    Map{{"Motion", "0"},
                        {"PIR", "false"},
                        {"Tampering", "FALSE"},
                        {"PPTZTrigger", ""},
                        {"SmartTracking", "False"}},
                    triggerText(NoneOfTheEleven, QStringLiteral(",\"smartTracking\":false"),
                                NoDigitalInput)},
        TriggerCase{"BooleanTextsTrue",
                    Map{{"Motion", "1"},
                        {"PIR", "true"},
                        {"Tampering", "TRUE"},
                        {"PPTZTrigger", "yes"},
                        {"SmartTracking", "2"}},
                    triggerText(QString(NoneOfTheEleven)
                                    .replace("\"motion\":false", "\"motion\":true")
                                    .replace("\"pir\":false", "\"pir\":true")
                                    .replace("\"tampering\":false", "\"tampering\":true")
                                    .replace("\"pptz\":false", "\"pptz\":true"),
                                QStringLiteral(",\"smartTracking\":true"), NoDigitalInput)},
        TriggerCase{"ElementWithChildrenIsFalse", Map{{"Motion", Map{{"x", "1"}}}},
                    triggerText(NoneOfTheEleven, QString(), NoDigitalInput)},
        TriggerCase{"DigitalInputOne", Map{{"DigiInput", "1"}},
                    triggerText(NoneOfTheEleven, QString(),
                                digitalInput(true, true, true, false, false, false))},
        TriggerCase{"DigitalInputTwo", Map{{"DigiInput", "2"}},
                    triggerText(NoneOfTheEleven, QString(),
                                digitalInput(true, true, false, true, false, false))},
        TriggerCase{"DigitalInputThree", Map{{"DigiInput", "3"}},
                    triggerText(NoneOfTheEleven, QString(),
                                digitalInput(true, true, true, true, false, false))},
        TriggerCase{"DigitalInputFourIsTraditionalWithoutStates", Map{{"DigiInput", "4"}},
                    triggerText(NoneOfTheEleven, QString(),
                                digitalInput(true, true, false, false, false, false))},
        TriggerCase{"NegativeDigitalInputIsOff", Map{{"DigiInput", "-1"}},
                    triggerText(NoneOfTheEleven, QString(), NoDigitalInput)},
        TriggerCase{"DigitalInputWithFractionIsNoInteger", Map{{"DigiInput", "3.0"}},
                    triggerText(NoneOfTheEleven, QString(), NoDigitalInput)},
        TriggerCase{"OverlongDigitalInputIsNoIntegerNotAWrappedOne",
                    Map{{"DigiInput", "4294967297"}},
                    triggerText(NoneOfTheEleven, QString(), NoDigitalInput)},
        TriggerCase{"FallingFlagAloneTurnsDigitalInputOn", Map{{"StopUntilDIFalling", "true"}},
                    triggerText(NoneOfTheEleven, QString(),
                                digitalInput(true, false, false, false, true, false))},
        TriggerCase{"RisingFlagWithDigitalInputZero",
                    Map{{"DigiInput", "0"}, {"StopUntilDIRising", "1"}},
                    triggerText(NoneOfTheEleven, QString(),
                                digitalInput(true, false, false, false, false, true))},
        TriggerCase{"UnknownElementsAreIgnored",
                    Map{{"AllEvent", "true"}, {"ContMotNum", "1"}, {"Other", "1"}},
                    triggerText(NoneOfTheEleven, QString(), NoDigitalInput)}),
    [](const auto &info) { return std::string(info.param.name); });

TEST(ScheduleDocument, OnlyTheExactEventModeHasTriggerEvents)
{
    EXPECT_TRUE(triggerEventsOf(defaultTriggers(), QStringLiteral("event")).isEmpty());
    EXPECT_TRUE(triggerEventsOf(defaultTriggers(), QStringLiteral("Event ")).isEmpty());
    EXPECT_TRUE(triggerEventsOf(defaultTriggers(), QStringLiteral("Continuous")).isEmpty());
    EXPECT_FALSE(triggerEventsOf(defaultTriggers(), QStringLiteral("Event")).isEmpty());
}

TEST(ScheduleDocument, EveryRectangleOfAnEventFrameCarriesTheSameTriggers)
{
    const QString document = documentOf(
        mapping(frame(days({"1.0", "3.0"}), intervals({{"0", "3600"}, {"7200", "10800"}})),
                QStringLiteral("Event"), Map{{"PIR", "1"}, {"DigiInput", "2"}}));
    const QJsonArray rects = parsedDocument(document)[QLatin1String("Rectangles")].toArray();
    ASSERT_EQ(rects.size(), 4);
    for (const QJsonValue &rect : rects)
        EXPECT_EQ(rect[QLatin1String("triggerEvents")], rects[0][QLatin1String("triggerEvents")]);
    EXPECT_TRUE(rects[3][QLatin1String("triggerEvents")][QLatin1String("pir")].toBool());
}

// --- Mode texts: always a JSON string --------------------------------------------

struct ModeCase
{
    const char *name;
    QString mode;
    QString written; // between the quotes
};

void PrintTo(const ModeCase &c, std::ostream *os)
{
    *os << c.name;
}

class ModeText : public ::testing::TestWithParam<ModeCase>
{};

TEST_P(ModeText, IsWrittenAsAJsonStringThatReadsBackUnchanged)
{
    for (const QString &repeat : {QStringLiteral("Weekly"), QStringLiteral("Once")}) {
        const QString document = documentOf(
            mapping(frame(days({OneDay}), intervals({WholeDay}), repeat), GetParam().mode));
        EXPECT_TRUE(document.contains(QStringLiteral("\"RecordingMode\":\"") + GetParam().written +
                                      QStringLiteral("\",")))
            << document.toStdString();
        EXPECT_EQ(
            parsedDocument(document)[QLatin1String("Rectangles")][0][QLatin1String("RecordingMode")]
                .toString(),
            GetParam().mode);
    }
}

INSTANTIATE_TEST_SUITE_P(
    ScheduleDocument, ModeText,
    ::testing::Values(
        ModeCase{"ContinuousIsUnchanged", QStringLiteral("Continuous"),
                 QStringLiteral("Continuous")},
        ModeCase{"EventIsUnchanged", QStringLiteral("Event"), QStringLiteral("Event")},
        ModeCase{"EmptyModeIsAnEmptyString", QString(), QString()},
        ModeCase{"NonLatinLettersAreKept", QStringLiteral("\u00c9v\u00e9nement \u65e5"),
                 QStringLiteral("\u00c9v\u00e9nement \u65e5")},
        ModeCase{"QuoteIsEscaped", QStringLiteral("Con\"tinuous"),
                 QStringLiteral("Con\\\"tinuous")},
        ModeCase{"BackslashIsEscaped", QStringLiteral("C:\\rec"), QStringLiteral("C:\\\\rec")},
        ModeCase{"LineBreakIsEscaped", QStringLiteral("a\nb\tc"), QStringLiteral("a\\nb\\tc")},
        ModeCase{"ControlCharacterIsEscaped", QStringLiteral("a\x01z"),
                 QStringLiteral("a\\u0001z")},
        ModeCase{"QuoteAndBraceCannotEndTheDocument", QStringLiteral("\"}]}"),
                 QStringLiteral("\\\"}]}")},
        ModeCase{"LoneSurrogateIsEscaped", QString(QChar(0xD800)) + QStringLiteral("x"),
                 QStringLiteral("\\ud800x")}),
    [](const auto &info) { return std::string(info.param.name); });

// --- Whatever the time card holds, the document is JSON -------------------------

// Builds odd trees from a small alphabet of values: lists where maps belong,
// texts where lists belong, numbers that are no numbers.
class TreeGenerator
{
public:
    explicit TreeGenerator(unsigned seed) : m_random(seed) {}

    QVariant mappingEle()
    {
        return repeatedOf([this] { return mappingElement(); });
    }

private:
    int pick(int n) { return std::uniform_int_distribution<int>(0, n - 1)(m_random); }

    QVariant scalar()
    {
        static const QStringList texts{
            "",           "0",          "1",     "3",     "7.0",     "-1",
            "2.5",        "86400",      "1e400", "nan",   "-inf",    "inf",
            "1e10",       "-1e10",      "true",  "FALSE", "Weekly",  "Event",
            "Continuous", "\"",         "\\",    "\n",    "a\"b\\c", QString(QChar(0xDC00)),
            "\u00e9",     "4294967297", " 3 ",   "0x10"};
        return texts[pick(texts.size())];
    }

    template <typename Make> QVariant repeatedOf(Make make)
    {
        switch (pick(5)) {
        case 0:
            return QVariant();
        case 1:
            return scalar();
        case 2:
            return make();
        default: {
            QVariantList list;
            for (int i = pick(5); i > 0; --i)
                list << make();
            return list;
        }
        }
    }

    QVariant valueOr(QVariant likely)
    {
        switch (pick(6)) {
        case 0:
            return QVariant();
        case 1:
            return scalar();
        case 2:
            return QVariantList{likely, scalar()};
        default:
            return likely;
        }
    }

    QVariant mappingElement()
    {
        static const QStringList triggers{"Motion",           "PIR",       "ZoneDetection",
                                          "SmokerDetection",  "DigiInput", "StopUntilDIFalling",
                                          "StopUntilDIRising"};
        Map element;
        element.insert("RecMode", pick(2) ? QVariant(pick(2) ? "Event" : "Continuous") : scalar());
        Map frameMap;
        frameMap.insert("RepeatMod", pick(4) ? QVariant("Weekly") : scalar());
        frameMap.insert("DayList", valueOr(Map{{"Ele", repeatedOf([this] {
                                                    return valueOr(Map{{"@B", scalar()}});
                                                })}}));
        frameMap.insert("Intervals",
                        valueOr(Map{{"Ele", repeatedOf([this] {
                                         return valueOr(Map{{"@B", scalar()}, {"@E", scalar()}});
                                     })}}));
        element.insert("Frame", valueOr(frameMap));
        for (const QString &trigger : triggers) {
            if (pick(2))
                element.insert(trigger, scalar());
        }
        return valueOr(element);
    }

    std::mt19937 m_random;
};

TEST(ScheduleDocument, AnyTimecardGivesAJsonDocument)
{
    TreeGenerator generator(20240611);
    QueryRunner runner;
    for (int i = 0; i < 3000; ++i) {
        const QVariant mappingEle = generator.mappingEle();
        const QString document = runner.document(mappingEle);
        const QJsonObject json = parsedDocument(document);
        ASSERT_TRUE(json.value(QLatin1String("Rectangles")).isArray())
            << "round " << i << ": " << document.toStdString();
        ASSERT_EQ(json.keys(), QStringList{QStringLiteral("Rectangles")});
        for (const QJsonValue &rect : json.value(QLatin1String("Rectangles")).toArray()) {
            ASSERT_TRUE(rect[QLatin1String("Bottom")].isDouble()) << document.toStdString();
            ASSERT_TRUE(rect[QLatin1String("Top")].isDouble()) << document.toStdString();
            ASSERT_TRUE(rect[QLatin1String("RecordingMode")].isString()) << document.toStdString();
        }
    }
}

} // namespace

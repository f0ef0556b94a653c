// A document the plug-in writes, sent back by a client unchanged, gives the
// same schedule; and once composed, a document reads back as the same text.
// Both directions run through the real control, tunnel and converter: the
// composer's Mapping is read back as the server would return it.

#include "IFrameworkTools.h"
#include "PluginRecordingScheduleSettingSrv.h"
#include "QtPrinters.h"
#include "RecordingScheduleSettingConstants.h"
#include "RecordingSettingControl.h"
#include "ReplyRecorder.h"
#include "RequestSenderInfo.h"
#include "TestTunnel.h"
#include "TimecardXml.h"

#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>

#include <gtest/gtest.h>

#include <cmath>
#include <random>

namespace {

using namespace PluginRecordingScheduleSettingCommon;

struct Framework : IFrameworkTools
{
    IKoltTunnelClient *tunnel = nullptr;
    IKoltTunnelClient *GetTunnelClient() override { return tunnel; }
};

// One rectangle as a client sees it: times to the second, absent trigger
// keys as false.
struct Rectangle
{
    qint64 left = 0;
    qint64 right = 0;
    qint64 topSeconds = 0;
    qint64 bottomSeconds = 0;
    QString mode;
    QMap<QString, bool> triggers;

    bool operator==(const Rectangle &other) const
    {
        if (left != other.left || right != other.right || topSeconds != other.topSeconds ||
            bottomSeconds != other.bottomSeconds || mode != other.mode)
            return false;
        QStringList keys = triggers.keys() + other.triggers.keys();
        for (const QString &key : keys) {
            if (triggers.value(key) != other.triggers.value(key))
                return false;
        }
        return true;
    }
};

void PrintTo(const Rectangle &r, std::ostream *os)
{
    *os << "{" << r.left << "-" << r.right << " " << r.topSeconds << "s-" << r.bottomSeconds << "s "
        << r.mode.toStdString() << " triggers:";
    for (auto it = r.triggers.cbegin(); it != r.triggers.cend(); ++it) {
        if (it.value())
            *os << " " << it.key().toStdString();
    }
    *os << "}";
}

QList<Rectangle> scheduleOf(const QString &document)
{
    QList<Rectangle> result;
    const QJsonArray rects = QJsonDocument::fromJson(document.toUtf8())
                                 .object()
                                 .value(QLatin1String("Rectangles"))
                                 .toArray();
    for (const QJsonValue &value : rects) {
        const QJsonObject rect = value.toObject();
        Rectangle r;
        r.left = rect.value(QLatin1String("Left")).toInteger();
        r.right = rect.value(QLatin1String("Right")).toInteger();
        r.topSeconds = std::llround(rect.value(QLatin1String("Top")).toDouble() * 3600);
        r.bottomSeconds = std::llround(rect.value(QLatin1String("Bottom")).toDouble() * 3600);
        r.mode = rect.value(QLatin1String("RecordingMode")).toString();
        const QJsonObject triggers = rect.value(QLatin1String("triggerEvents")).toObject();
        for (auto it = triggers.begin(); it != triggers.end(); ++it)
            r.triggers.insert(it.key(), it.value().toBool());
        result.append(r);
    }
    return result;
}

class RoundTrip : public ::testing::Test
{
protected:
    void SetUp() override
    {
        framework.tunnel = &serverSide;
        ASSERT_TRUE(plugin.InitialPluginBase(&framework));
    }

    // The document a client reads for a time card with this mapping.
    QString read(const QString &mapping)
    {
        serverSide.queueAnswer(
            {true, QStringLiteral("0"),
             TimecardXml::answer({TimecardXml::timecard("5", "Round trip", mapping)}), false});
        ReplyRecorder reply;
        plugin.Request(QStringLiteral("GetAllScheduleRecInfo"), QVariant(), RequestSenderInfo{},
                       reply.callback());
        EXPECT_EQ(reply.last().code, QStringLiteral("0"));
        return reply.last().data.toList().value(0).toMap().value("CustomizeContent").toString();
    }

    // The Mapping that the control sends for a document a client sent.
    QString compose(const QString &document)
    {
        const int before = composerSide.sent().size();
        composer->AddSchedule(QStringLiteral("Round trip"), document,
                              [](bool, bool, const QString &) {});
        const QList<TestTunnel::Sent> sent = composerSide.sent();
        EXPECT_EQ(sent.size(), before + 1);
        const QString body = sent.constLast().body;
        const int start = body.indexOf(QLatin1String("<Mapping>")) + 9;
        return body.mid(start, body.lastIndexOf(QLatin1String("</Mapping>")) - start);
    }

    void expectRoundTrip(const QString &mapping)
    {
        const QString written = read(mapping);
        ASSERT_TRUE(QJsonDocument::fromJson(written.toUtf8()).isObject()) << written.toStdString();
        const QString readBack = read(compose(written));
        EXPECT_EQ(scheduleOf(readBack), scheduleOf(written))
            << "written:   " << written.toStdString() << "\nread back: " << readBack.toStdString();
        EXPECT_EQ(read(compose(readBack)), readBack) << "a composed document is stable";
    }

    TestTunnel serverSide;
    Framework framework;
    PluginRecordingScheduleSettingSrv plugin;
    TestTunnel composerSide;
    QSharedPointer<RecordingSettingControl> composer =
        QSharedPointer<RecordingSettingControl>::create(&composerSide);
};

QString frameXml(const QList<int> &days, const QList<QPair<int, int>> &intervals)
{
    QString dayList;
    for (const int day : days)
        dayList += QStringLiteral("<Ele B=\"%1.0\"/>").arg(day);
    QString intervalList;
    for (const auto &[begin, end] : intervals)
        intervalList += QStringLiteral("<Ele B=\"%1\" E=\"%2\"/>").arg(begin).arg(end);
    return QStringLiteral("<Frame><Name>Customize time frame</Name><DLMod>SingleDay</DLMod>"
                          "<RepeatMod>Weekly</RepeatMod><DayList>%1</DayList><Intervals>%2"
                          "</Intervals><Holiday>false</Holiday></Frame>")
        .arg(dayList, intervalList);
}

QString mappingXml(const QList<int> &days, const QList<QPair<int, int>> &intervals,
                   const QString &mode, const QString &triggers = QString())
{
    return QStringLiteral("<Ele>") + frameXml(days, intervals) + QStringLiteral("<RecMode>") +
           mode + QStringLiteral("</RecMode>") + triggers + QStringLiteral("</Ele>");
}

struct MappingCase
{
    const char *name;
    QString mapping;
};

void PrintTo(const MappingCase &c, std::ostream *os)
{
    *os << c.name;
}

class RoundTripTable : public RoundTrip, public ::testing::WithParamInterface<MappingCase>
{};

TEST_P(RoundTripTable, GivesTheSameSchedule)
{
    expectRoundTrip(GetParam().mapping);
}

const QString Weekdays = mappingXml({1, 2, 3, 5}, {{0, 28800}, {64800, 86400}}, "Continuous");

INSTANTIATE_TEST_SUITE_P(
    RoundTrip, RoundTripTable,
    ::testing::Values(
        MappingCase{"DefaultContinuousMapping", Template::DefaultContinuousMapping},
        MappingCase{"DefaultEventMappingWithTheShortTriggerSet", Template::DefaultEventMapping},
        MappingCase{"TwoRunsByTwoIntervals", Weekdays},
        MappingCase{"DaysInReverseOrderWithThirdsOfAnHour",
                    mappingXml({7, 6, 5, 4, 3, 2, 1}, {{1200, 30000}}, "Continuous")},
        MappingCase{"RepeatedDaysAndReversedInterval",
                    mappingXml({1, 1, 3}, {{7200, 3600}}, "Continuous")},
        MappingCase{"LastAndFirstSecondOfTheDay",
                    mappingXml({7}, {{86399, 86400}, {0, 1}, {43201, 43199}}, "Continuous")},
        MappingCase{"EventWithEveryComposedTrigger",
                    mappingXml({2, 3}, {{3600, 7200}}, "Event",
                               "<Motion>0</Motion><ContMotNum>1</ContMotNum><DigiInput>2"
                               "</DigiInput><PIR>1</PIR><Tampering>0</Tampering><PPTZTrigger>1"
                               "</PPTZTrigger><StopUntilDIFalling>0</StopUntilDIFalling>"
                               "<StopUntilDIRising>1</StopUntilDIRising><LineDetection>1"
                               "</LineDetection><ZoneDetection>1</ZoneDetection>"
                               "<SmokeAndFlameDetection>1</SmokeAndFlameDetection>")},
        MappingCase{"EventWithStopFlagOnly",
                    mappingXml({4}, {{0, 86400}}, "Event",
                               "<Motion>true</Motion><DigiInput>0</DigiInput>"
                               "<StopUntilDIFalling>true</StopUntilDIFalling>")},
        MappingCase{"OverlappingFramesInTwoModes",
                    Weekdays + mappingXml({1, 2}, {{0, 86400}}, "Event",
                                          "<Motion>1</Motion><DigiInput>1</DigiInput>")},
        MappingCase{"ModeThatNeedsEscapingBothWays",
                    mappingXml({1}, {{0, 3600}}, "Rec &quot;A&quot; \\ &lt;b&gt;&amp;")},
        MappingCase{"LowerCaseEventHasNoTriggers",
                    mappingXml({1}, {{0, 3600}}, "event", "<Motion>1</Motion>")}),
    [](const auto &info) { return std::string(info.param.name); });

// Mappings a server may hold: days 1 to 7 in any order, intervals on whole
// seconds, and every trigger setting the digital-input keys can express.
class MappingGenerator
{
public:
    explicit MappingGenerator(unsigned seed) : m_random(seed) {}

    QString mapping()
    {
        QString result;
        for (int frames = pick(1, 3); frames > 0; --frames) {
            QList<int> days;
            for (int n = pick(1, 7); n > 0; --n)
                days << pick(1, 7);
            QList<QPair<int, int>> intervals;
            for (int n = pick(1, 3); n > 0; --n)
                intervals.append({pick(0, 86400), pick(0, 86400)});
            const bool event = pick(0, 1) == 1;
            result += mappingXml(days, intervals, event ? "Event" : "Continuous",
                                 event ? triggers() : QString());
        }
        return result;
    }

private:
    int pick(int low, int high) { return std::uniform_int_distribution<int>(low, high)(m_random); }

    QString flag()
    {
        static const char *const texts[] = {"0", "1", "true", "false"};
        return QLatin1String(texts[pick(0, 3)]);
    }

    QString triggers()
    {
        static const char *const always[] = {
            "Motion",         "PIR",       "Tampering",      "PPTZTrigger",   "LineDetection",
            "FieldDetection", "Loitering", "CrowdDetection", "MissingObject", "AbandonObject",
            "FaceDetection"};
        static const char *const optional[] = {"ZoneDetection",
                                               "SmartTracking",
                                               "RunningDetection",
                                               "ParkingViolationDetection",
                                               "RestrictedZoneDetection",
                                               "TemperatureThresholdWarning",
                                               "TemperatureThresholdAlarm",
                                               "TemperatureDifferenceWarning",
                                               "TemperatureDifferenceAlarm",
                                               "TemperatureRiseWarning",
                                               "TemperatureRiseAlarm",
                                               "TemperatureSectionAlarm",
                                               "ThermalIntrusion",
                                               "ThermalMultiLoitering",
                                               "FireSpotDetection",
                                               "SmokerDetection",
                                               "SmokeAndFlameDetection"};
        QString result;
        const auto element = [&](const char *name, const QString &value) {
            result += QStringLiteral("<%1>%2</%1>").arg(QLatin1String(name), value);
        };
        for (const char *name : always)
            element(name, flag());
        element("ContMotNum", QStringLiteral("1"));
        element("DigiInput", QString::number(pick(0, 3)));
        element("StopUntilDIFalling", flag());
        element("StopUntilDIRising", flag());
        for (const char *name : optional) {
            if (pick(0, 1))
                element(name, flag());
        }
        return result;
    }

    std::mt19937 m_random;
};

TEST_F(RoundTrip, GeneratedMappingsGiveTheSameSchedule)
{
    MappingGenerator generator(7031);
    for (int i = 0; i < 300; ++i) {
        SCOPED_TRACE(i);
        expectRoundTrip(generator.mapping());
        if (HasFailure())
            break;
    }
}

} // namespace

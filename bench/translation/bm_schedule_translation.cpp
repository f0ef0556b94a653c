// How the schedule document grows with the time card: one time card with many
// Mapping elements, and many time cards for "GetAllScheduleRecInfo". Both run
// through Request with a control that hands the time cards back at once. The
// baseline writes the same variant tree as JSON with QJsonDocument, a plain
// linear walk, so that the ratio between the two shows whether the
// translation keeps pace as the input grows.

#include "AnsweringControl.h"
#include "PluginRecordingScheduleSettingSrv.h"
#include "RequestSenderInfo.h"

#include <QJsonDocument>

#include <benchmark/benchmark.h>

namespace {

using Map = QMap<QString, QVariant>;

// A Mapping element like the composer writes: one day, one interval, an
// event frame with its 32 trigger elements.
QVariant mappingElement(int i)
{
    Map element{
        {"RecMode", "Event"},
        {"Frame", Map{{"Name", "Customize time frame"},
                      {"RepeatMod", "Weekly"},
                      {"DayList", Map{{"Ele", Map{{"@B", QStringLiteral("%1.0").arg(i % 7 + 1)}}}}},
                      {"Intervals",
                       Map{{"Ele", Map{{"@B", QString::number(i % 86400)}, {"@E", "86400"}}}}}}}};
    for (const char *name : {"Motion",
                             "ContMotNum",
                             "DigiInput",
                             "PIR",
                             "Tampering",
                             "PPTZTrigger",
                             "StopUntilDIFalling",
                             "StopUntilDIRising",
                             "LineDetection",
                             "FieldDetection",
                             "Loitering",
                             "CrowdDetection",
                             "MissingObject",
                             "AbandonObject",
                             "FaceDetection",
                             "ZoneDetection",
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
                             "SmokeAndFlameDetection"})
        element.insert(QLatin1String(name), QStringLiteral("1"));
    return element;
}

QVariant timecard(int id, const QVariant &mappingEle)
{
    const Map cam{{"Name", QStringLiteral("C_%1").arg(id)}, {"GrpID", "1"}};
    return Map{{"Revision", "1"},
               {"TmcardID", QString::number(id)},
               {"Name", QStringLiteral("Schedule %1").arg(id)},
               {"Mapping", Map{{"Ele", mappingEle}}},
               {"CamList", Map{{"Cam", QVariantList{cam, cam}}}}};
}

QList<QVariant> oneTimecardWith(int mappings)
{
    QVariantList elements;
    for (int i = 0; i < mappings; ++i)
        elements << mappingElement(i);
    return {timecard(5, elements)};
}

QList<QVariant> timecards(int count)
{
    QList<QVariant> result;
    for (int i = 0; i < count; ++i)
        result << timecard(i + 2, QVariantList{mappingElement(i), mappingElement(i + 3)});
    return result;
}

void runAllScheduleRecInfo(benchmark::State &state, const QList<QVariant> &input)
{
    PluginRecordingScheduleSettingSrv plugin;
    plugin.SetRecordingSettingControl(QSharedPointer<AnsweringControl>::create(input));
    qsizetype written = 0;
    for (auto _ : state) {
        plugin.Request(QStringLiteral("GetAllScheduleRecInfo"), QVariant(), RequestSenderInfo{},
                       [&](bool, const QString &, const QString &, const QVariant &data) {
                           for (const QVariant &entry : data.toList())
                               written += entry.toMap().value("CustomizeContent").toString().size();
                       });
    }
    benchmark::DoNotOptimize(written);
    state.SetComplexityN(state.range(0));
}

void baseline(benchmark::State &state, const QList<QVariant> &input)
{
    qsizetype written = 0;
    for (auto _ : state)
        written +=
            QJsonDocument::fromVariant(QVariant(input)).toJson(QJsonDocument::Compact).size();
    benchmark::DoNotOptimize(written);
    state.SetComplexityN(state.range(0));
}

void BM_Mappings_Translation(benchmark::State &state)
{
    runAllScheduleRecInfo(state, oneTimecardWith(static_cast<int>(state.range(0))));
}

void BM_Mappings_Baseline(benchmark::State &state)
{
    baseline(state, oneTimecardWith(static_cast<int>(state.range(0))));
}

void BM_Timecards_Translation(benchmark::State &state)
{
    runAllScheduleRecInfo(state, timecards(static_cast<int>(state.range(0))));
}

void BM_Timecards_Baseline(benchmark::State &state)
{
    baseline(state, timecards(static_cast<int>(state.range(0))));
}

} // namespace

namespace {

// Sizes doubling over the range where a quadratic cost would show.
void doublingFrom(benchmark::internal::Benchmark *benchmark, int first)
{
    for (int size = first; size <= first * 16; size *= 2)
        benchmark->Arg(size);
    benchmark->Complexity(benchmark::oN)->Unit(benchmark::kMillisecond);
}

void mappingSizes(benchmark::internal::Benchmark *benchmark)
{
    doublingFrom(benchmark, 1250);
}

void timecardSizes(benchmark::internal::Benchmark *benchmark)
{
    doublingFrom(benchmark, 125);
}

} // namespace

BENCHMARK(BM_Mappings_Translation)->Apply(mappingSizes);
BENCHMARK(BM_Mappings_Baseline)->Apply(mappingSizes);
BENCHMARK(BM_Timecards_Translation)->Apply(timecardSizes);
BENCHMARK(BM_Timecards_Baseline)->Apply(timecardSizes);

BENCHMARK_MAIN();

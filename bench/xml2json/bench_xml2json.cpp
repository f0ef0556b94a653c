// The converter against a bare QXmlStreamReader pass over the same text: the
// difference is what building the variant tree costs.

#include "XML2Json.h"

#include <QString>
#include <QXmlStreamReader>

#include <benchmark/benchmark.h>

#include <cstdio>
#include <map>
#include <string>

namespace {

const char *const Triggers[] = {"Motion",
                                "ContMotNum",
                                "DigiInput",
                                "PIR",
                                "Tampering",
                                "PPTZTrigger",
                                "LineDetection",
                                "FieldDetection",
                                "Loitering",
                                "FaceDetection",
                                "SmokeAndFlameDetection"};

QString timecard(int id)
{
    QString mapping;
    for (int e = 0; e < 4; ++e) {
        QString days;
        for (int d = 1; d <= 7; ++d)
            days += QStringLiteral("<Ele B=\"%1.0\"/>").arg(d);
        QString triggers;
        for (const char *trigger : Triggers)
            triggers += QStringLiteral("<%1>1</%1>").arg(QLatin1String(trigger));
        mapping += QStringLiteral(
                       "<Ele><Frame><Name>Customize time frame</Name><DLMod>SingleDay</DLMod>"
                       "<RepeatMod>Weekly</RepeatMod><DayList>%1</DayList><Intervals>"
                       "<Ele B=\"%2\" E=\"%3\"/></Intervals><Holiday>false</Holiday><Range><Period>"
                       "<TmS>2016-03-29 00:00:00.000</TmS><TmE>2035-01-01 00:00:00.000</TmE>"
                       "</Period><End>false</End></Range><RepeatFreq>1</RepeatFreq></Frame>"
                       "<RecMode>Event</RecMode>%4</Ele>")
                       .arg(days)
                       .arg(e * 3600)
                       .arg(e * 3600 + 1800)
                       .arg(triggers);
    }
    QString cams;
    for (int c = 0; c < 16; ++c)
        cams += QStringLiteral("<Cam><Name>C_%1</Name><GrpID>%2</GrpID></Cam>")
                    .arg(id * 16 + c)
                    .arg(c % 4);
    return QStringLiteral(
               "<Tmcard><Revision>4</Revision><TmcardID>%1</TmcardID><Name>Card %1</Name>"
               "<Mapping>%2</Mapping><CamList>%3</CamList></Tmcard>")
        .arg(QString::number(id), mapping, cams);
}

// A "GetRecTmcardRes" answer of about 1 MB (UTF-8).
const QString &megabyteAnswer()
{
    static const QString answer = [] {
        QString xml = QStringLiteral("<GetRecTmcardRes>");
        for (int id = 1; xml.size() < 1000 * 1000; ++id)
            xml += timecard(id);
        return xml + QStringLiteral("</GetRecTmcardRes>");
    }();
    return answer;
}

void BM_BareReader(benchmark::State &state)
{
    const QString &xml = megabyteAnswer();
    for (auto _ : state) {
        QXmlStreamReader reader(xml);
        qsizetype seen = 0;
        while (!reader.atEnd()) {
            reader.readNext();
            seen += reader.name().size() + reader.text().size() + reader.attributes().size();
        }
        benchmark::DoNotOptimize(seen);
    }
    state.SetBytesProcessed(state.iterations() * xml.toUtf8().size());
}
BENCHMARK(BM_BareReader)->Unit(benchmark::kMillisecond);

void BM_Parse(benchmark::State &state)
{
    const QString &xml = megabyteAnswer();
    const XML2Json converter;
    for (auto _ : state) {
        QVariant tree = converter.parse(xml);
        benchmark::DoNotOptimize(tree);
    }
    state.SetBytesProcessed(state.iterations() * xml.toUtf8().size());
}
BENCHMARK(BM_Parse)->Unit(benchmark::kMillisecond);

QString siblings(qsizetype count)
{
    QString xml = QStringLiteral("<CamList>");
    for (qsizetype i = 0; i < count; ++i)
        xml += QStringLiteral("<Cam>%1</Cam>").arg(i);
    return xml + QStringLiteral("</CamList>");
}

void BM_SiblingsBareReader(benchmark::State &state)
{
    const QString xml = siblings(state.range(0));
    for (auto _ : state) {
        QXmlStreamReader reader(xml);
        qsizetype seen = 0;
        while (!reader.atEnd()) {
            reader.readNext();
            seen += reader.name().size() + reader.text().size();
        }
        benchmark::DoNotOptimize(seen);
    }
    state.SetComplexityN(state.range(0));
}
BENCHMARK(BM_SiblingsBareReader)
    ->RangeMultiplier(10)
    ->Range(1000, 1000000)
    ->Complexity()
    ->Unit(benchmark::kMillisecond);

void BM_Siblings(benchmark::State &state)
{
    const QString xml = siblings(state.range(0));
    const XML2Json converter;
    for (auto _ : state) {
        QVariant tree = converter.parse(xml);
        benchmark::DoNotOptimize(tree);
    }
    state.SetComplexityN(state.range(0));
}
BENCHMARK(BM_Siblings)
    ->RangeMultiplier(10)
    ->Range(1000, 1000000)
    ->Complexity()
    ->Unit(benchmark::kMillisecond);

void BM_DeepNestingRefused(benchmark::State &state)
{
    const QString xml = QStringLiteral("<a>").repeated(state.range(0)) + QStringLiteral("x") +
                        QStringLiteral("</a>").repeated(state.range(0));
    const XML2Json converter;
    for (auto _ : state) {
        QVariant tree = converter.parse(xml);
        if (tree.isValid())
            state.SkipWithError("deep document was accepted");
        benchmark::DoNotOptimize(tree);
    }
}
BENCHMARK(BM_DeepNestingRefused)->Arg(100000)->Unit(benchmark::kMicrosecond);

// Prints the parse/bare-reader ratio after the usual table, in CPU time:
// the machine is shared, wall time is noisy.
class RatioReporter final : public benchmark::ConsoleReporter
{
public:
    void ReportRuns(const std::vector<Run> &runs) override
    {
        for (const Run &run : runs) {
            if (run.run_type == Run::RT_Iteration && run.iterations > 0)
                m_seconds[run.benchmark_name()] = run.cpu_accumulated_time / run.iterations;
        }
        ConsoleReporter::ReportRuns(runs);
    }

    void Finalize() override
    {
        ConsoleReporter::Finalize();
        const auto bare = m_seconds.find("BM_BareReader");
        const auto parse = m_seconds.find("BM_Parse");
        if (bare != m_seconds.end() && parse != m_seconds.end() && bare->second > 0)
            std::printf("1 MB answer, CPU time: parse %.2f ms, bare reader %.2f ms, ratio %.2f\n",
                        parse->second * 1e3, bare->second * 1e3, parse->second / bare->second);
    }

private:
    std::map<std::string, double> m_seconds;
};

} // namespace

int main(int argc, char **argv)
{
    benchmark::Initialize(&argc, argv);
    if (benchmark::ReportUnrecognizedArguments(argc, argv))
        return 1;
    RatioReporter reporter;
    benchmark::RunSpecifiedBenchmarks(&reporter);
    benchmark::Shutdown();
    return 0;
}

// Whether answers complete side by side. One plug-in, one real control, a
// tunnel that answers each send at once on the sender's thread with 1,000
// time cards: every "GetAllScheduleRecInfo" is read, converted and translated
// on the thread that asked. The same work runs on 1 and on 2 threads at once;
// with no lock held while an answer is handled, 2 threads finish close to
// twice as many answers a second as 1 on a machine with two free cores. The
// ratio is printed after the table.

#include "IFrameworkTools.h"
#include "IKoltTunnelClient.h"
#include "PluginRecordingScheduleSettingSrv.h"
#include "RequestSenderInfo.h"

#include <benchmark/benchmark.h>

#include <atomic>
#include <cstdio>
#include <map>
#include <memory>

using namespace Qt::StringLiterals;

namespace {

constexpr int Timecards = 1000;

// A customised time card with one continuous frame on weekdays, as the
// composer writes it, and two cameras.
QString timecardXml(int id)
{
    return uR"(<Tmcard><Revision>1</Revision><TmcardID>%1</TmcardID><Name>Schedule %1</Name>)"
           uR"(<Mapping><Ele><Frame><Name>Customize time frame</Name><RepeatMod>Weekly</RepeatMod>)"
           uR"(<Intervals><Ele B="28800" E="64800"/></Intervals><DayList><Ele B="1.0"/>)"
           uR"(<Ele B="2.0"/><Ele B="3.0"/><Ele B="4.0"/><Ele B="5.0"/></DayList></Frame>)"
           uR"(<RecMode>Continuous</RecMode></Ele></Mapping><CamList><Cam><Name>C_%1</Name>)"
           uR"(<GrpID>1</GrpID></Cam><Cam><Name>D_%1</Name><GrpID>2</GrpID></Cam></CamList>)"
           uR"(</Tmcard>)"_s.arg(id);
}

// Answers every send at once with all time cards.
class AllTimecardsTunnel final : public IKoltTunnelClient, public IFrameworkTools
{
public:
    AllTimecardsTunnel()
    {
        QString all = u"<GetRecTmcardRes>"_s;
        for (int id = 2; id < 2 + Timecards; ++id)
            all += timecardXml(id);
        m_all = all + u"</GetRecTmcardRes>"_s;
    }

    IKoltTunnelClient *GetTunnelClient() override { return this; }
    bool IsConnected() const override { return true; }
    void *GetClientID() override { return this; }
    QString GetServerAddress() const override { return u"bench"_s; }
    bool SendRequest(const QString &, void *, int, const QString &, TunnelRequest &request) override
    {
        request.onResponse(true, QString(), QString(), u"0"_s, m_all, false);
        return true;
    }

private:
    QString m_all;
};

// Shared by the benchmark's threads, made once.
struct Site
{
    Site() { plugin.InitialPluginBase(&tunnel); }
    AllTimecardsTunnel tunnel;
    PluginRecordingScheduleSettingSrv plugin;
};

Site &site()
{
    static Site shared;
    return shared;
}

void BM_AllScheduleRecInfo(benchmark::State &state)
{
    PluginRecordingScheduleSettingSrv &plugin = site().plugin;
    std::atomic<int> schedules = 0;
    for (auto _ : state) {
        plugin.Request(u"GetAllScheduleRecInfo"_s, QVariant(), RequestSenderInfo{},
                       [&](bool, const QString &code, const QString &, const QVariant &data) {
                           if (code == u"0")
                               schedules += int(data.toList().size());
                       });
    }
    if (schedules != state.iterations() * Timecards)
        state.SkipWithError("an answer was not translated whole");
    state.SetItemsProcessed(state.iterations());
}
BENCHMARK(BM_AllScheduleRecInfo)
    ->Threads(1)
    ->Threads(2)
    ->UseRealTime()
    ->MinTime(2.0)
    ->Unit(benchmark::kMillisecond);

// Keeps the answers a second of each thread count for the ratio.
class RatioReporter final : public benchmark::ConsoleReporter
{
public:
    RatioReporter() : ConsoleReporter(OO_None) {}
    void ReportRuns(const std::vector<Run> &runs) override
    {
        ConsoleReporter::ReportRuns(runs);
        for (const Run &run : runs) {
            const auto rate = run.counters.find("items_per_second");
            if (!run.error_occurred && run.run_type == Run::RT_Iteration &&
                rate != run.counters.end())
                perSecond[run.threads] = rate->second;
        }
    }
    std::map<int64_t, double> perSecond;
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
    if (reporter.perSecond.count(1) && reporter.perSecond.count(2))
        std::printf("answers a second, 2 threads against 1: %.2f\n",
                    reporter.perSecond[2] / reporter.perSecond[1]);
    return 0;
}

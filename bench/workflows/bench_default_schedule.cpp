// What taking cameras off the other time cards costs a default schedule
// command. Baseline: "DefaultEventSchedule" for cameras that no other time
// card holds (one read, one change). Subject: the same command when one other
// time card holds one of the cameras (read, removal read and update, read
// again, change). Both run through Request and the real control on a tunnel
// that answers at once with fixed texts, so the figures are the plug-in's
// own work: composing, parsing and the lookups. A command without cameras
// shows what looking through the time cards for them costs.

#include "IFrameworkTools.h"
#include "IKoltTunnelClient.h"
#include "PluginRecordingScheduleSettingSrv.h"
#include "RequestSenderInfo.h"

#include <benchmark/benchmark.h>

namespace {

constexpr int Timecards = 50;
constexpr int CamerasPerTimecard = 20;

QString timecardXml(int id, int firstCamera)
{
    QString cameras;
    for (int c = 0; c < CamerasPerTimecard; ++c)
        cameras +=
            QStringLiteral("<Cam><Name>C_%1</Name><GrpID>1</GrpID></Cam>").arg(firstCamera + c);
    return QStringLiteral(
               "<Tmcard><Revision>1</Revision><TmcardID>%1</TmcardID><Name>Card %1</Name>"
               "<Mapping></Mapping><CamList>%2</CamList></Tmcard>")
        .arg(id)
        .arg(cameras);
}

// Answers every send at once: all time cards, the one asked for, or success.
class FixedTunnel final : public IKoltTunnelClient
{
public:
    FixedTunnel()
    {
        QString all;
        for (int id = 2; id < 2 + Timecards; ++id)
            all += timecardXml(id, id * 100);
        m_all = QStringLiteral("<GetRecTmcardRes>") + all + QStringLiteral("</GetRecTmcardRes>");
    }

    bool IsConnected() const override { return true; }
    void *GetClientID() override { return this; }
    QString GetServerAddress() const override { return QStringLiteral("bench"); }
    bool SendRequest(const QString &, void *, int, const QString &command,
                     TunnelRequest &request) override
    {
        QString content;
        if (command == QStringLiteral("GetRecTmcard")) {
            if (request.body.contains(QStringLiteral("TmcardAll"))) {
                content = m_all;
            } else {
                const int id = request.body.section(QStringLiteral("<TmcardID>"), 1)
                                   .section(QStringLiteral("</TmcardID>"), 0, 0)
                                   .toInt();
                content = QStringLiteral("<GetRecTmcardRes>") + timecardXml(id, id * 100) +
                          QStringLiteral("</GetRecTmcardRes>");
            }
        }
        request.onResponse(true, QString(), QString(), QStringLiteral("0"), content, false);
        return true;
    }

private:
    QString m_all;
};

struct Framework final : IFrameworkTools
{
    IKoltTunnelClient *tunnel = nullptr;
    IKoltTunnelClient *GetTunnelClient() override { return tunnel; }
};

// heldCamera 0: no camera at all, so no time card is looked through.
void runDefaultEvent(benchmark::State &state, int heldCamera)
{
    FixedTunnel tunnel;
    Framework framework;
    framework.tunnel = &tunnel;
    PluginRecordingScheduleSettingSrv plugin;
    plugin.InitialPluginBase(&framework);
    QVariantList cameras;
    if (heldCamera != 0)
        cameras << QVariantMap{{QStringLiteral("Name"), QStringLiteral("C_%1").arg(heldCamera)},
                               {QStringLiteral("GrpID"), QStringLiteral("1")}};
    const QVariantMap payload{{QStringLiteral("camRecGroupList"), cameras}};
    int replies = 0;
    for (auto _ : state) {
        plugin.Request(
            QStringLiteral("DefaultEventSchedule"), payload, RequestSenderInfo{},
            [&replies](bool, const QString &, const QString &, const QVariant &) { ++replies; });
    }
    if (replies != state.iterations())
        state.SkipWithError("a request was not answered");
}

void BM_NoCameraToLookFor(benchmark::State &state)
{
    runDefaultEvent(state, 0);
}
BENCHMARK(BM_NoCameraToLookFor)->Unit(benchmark::kMicrosecond);

void BM_CamerasHeldNowhereElse(benchmark::State &state)
{
    runDefaultEvent(state, 1);
}
BENCHMARK(BM_CamerasHeldNowhereElse)->Unit(benchmark::kMicrosecond);

void BM_CameraTakenOffAnotherTimecard(benchmark::State &state)
{
    runDefaultEvent(state, 2 * 100 + 5);
}
BENCHMARK(BM_CameraTakenOffAnotherTimecard)->Unit(benchmark::kMicrosecond);

} // namespace

BENCHMARK_MAIN();

// Many workflow commands at once: several plug-ins, each on its own tunnel
// that answers on its own thread, each fed by several requester threads, all
// against one server. Every request gets exactly one reply.

#include "FakeRecordingServer.h"
#include "IFrameworkTools.h"
#include "PluginRecordingScheduleSettingSrv.h"
#include "RequestSenderInfo.h"
#include "TestTunnel.h"
#include "WorkflowHarness.h"

#include <gtest/gtest.h>

#include <atomic>
#include <chrono>
#include <condition_variable>
#include <memory>
#include <mutex>
#include <thread>
#include <vector>

namespace {

using Camera = FakeRecordingServer::Camera;
using Timecard = FakeRecordingServer::Timecard;

constexpr int Plugins = 3;
constexpr int RequestersPerPlugin = 2;
constexpr int RequestsPerRequester = 40;
constexpr int Requests = Plugins * RequestersPerPlugin * RequestsPerRequester;

struct Framework final : IFrameworkTools
{
    IKoltTunnelClient *tunnel = nullptr;
    IKoltTunnelClient *GetTunnelClient() override { return tunnel; }
};

// Counts replies per request; wakes the test when all have arrived.
class ReplyCounter
{
public:
    ResponseCallback callback(int request)
    {
        return [this, request](bool, const QString &, const QString &, const QVariant &) {
            m_counts[request].fetch_add(1);
            const std::lock_guard<std::mutex> lock(m_mutex);
            ++m_total;
            m_arrived.notify_all();
        };
    }

    bool waitForAll(int expected)
    {
        std::unique_lock<std::mutex> lock(m_mutex);
        return m_arrived.wait_for(lock, std::chrono::seconds(120),
                                  [&] { return m_total >= expected; });
    }

    int count(int request) const { return m_counts[request].load(); }

private:
    std::atomic<int> m_counts[Requests] = {};
    std::mutex m_mutex;
    std::condition_variable m_arrived;
    int m_total = 0;
};

QVariantMap entry(int id, const QList<Camera> &cameras)
{
    return QVariantMap{{"scheduleID", QString::number(id)}, {"camIDList", cameraEntries(cameras)}};
}

// The n-th command of the mix: every workflow, on time cards and cameras
// that other requests touch at the same time.
std::pair<QString, QVariantMap> command(int n)
{
    const Camera camera{QStringLiteral("C_%1").arg(n % 7), "1"};
    switch (n % 9) {
    case 0:
        return {"UpdateCamRecSchedule",
                {{"scheduleRmvCam", QVariantList{entry(1 + n % 4, {camera})}},
                 {"scheduleAddCam", QVariantList{entry(1 + (n + 1) % 4, {camera})}}}};
    case 1:
        return {"UpdateCamRecSchedule", {{"scheduleAddCam", QVariantList{entry(-2, {camera})}}}};
    case 2:
        return {"DefaultEventSchedule", {{"camRecGroupList", cameraEntries({camera})}}};
    case 3:
        return {"DefaultContinousSchedule", {{"camRecGroupList", cameraEntries({camera})}}};
    case 4:
        return {"CustomizeSchedule",
                {{"timeframes", LobbyDocument}, {"camRecGroupList", cameraEntries({camera})}}};
    case 5:
        return {"DefaultNotRecordingSchedule", {{"camRecGroupList", cameraEntries({camera})}}};
    case 6:
        return {"AddSchedule", {{"ScheduleName", "Hall"}, {"timeframes", LobbyDocument}}};
    case 7:
        return {"UpdateSchedule",
                {{"TimeCardID", QString::number(1 + n % 4)},
                 {"ScheduleName", "Hall"},
                 {"timeframes", LobbyDocument},
                 {"camRecGroupList", cameraEntries({camera})}}};
    default:
        return {"DelSchedule", {{"TimeCardID", QString::number(100 + n)}}};
    }
}

struct Site
{
    explicit Site(FakeRecordingServer &server) : tunnel(TestTunnel::Delivery::OtherThread)
    {
        tunnel.setResponder(
            [&server](const TestTunnel::Sent &sent) { return server.answer(sent); });
        framework.tunnel = &tunnel;
        plugin = std::make_unique<PluginRecordingScheduleSettingSrv>();
        plugin->InitialPluginBase(&framework);
    }

    TestTunnel tunnel;
    Framework framework;
    std::unique_ptr<PluginRecordingScheduleSettingSrv> plugin;
};

void seed(FakeRecordingServer &server)
{
    for (int id = 1; id <= 4; ++id)
        server.put(Timecard{id, 1, QStringLiteral("Card %1").arg(id), "", {{"C_1", "1"}}});
}

// Each requester thread sends its share of the mix through one plug-in.
void runRequesters(std::vector<std::unique_ptr<Site>> &sites, ReplyCounter &counter)
{
    std::vector<std::thread> requesters;
    for (int p = 0; p < Plugins; ++p) {
        for (int r = 0; r < RequestersPerPlugin; ++r) {
            requesters.emplace_back([&sites, &counter, p, r] {
                for (int i = 0; i < RequestsPerRequester; ++i) {
                    const int n = (p * RequestersPerPlugin + r) * RequestsPerRequester + i;
                    const auto [name, payload] = command(n);
                    RequestSenderInfo sender;
                    sender.clientId = reinterpret_cast<void *>(static_cast<quintptr>(n + 1));
                    sites[p]->plugin->Request(name, payload, sender, counter.callback(n));
                }
            });
        }
    }
    for (std::thread &requester : requesters)
        requester.join();
}

std::vector<std::unique_ptr<Site>> makeSites(FakeRecordingServer &server)
{
    std::vector<std::unique_ptr<Site>> sites;
    for (int p = 0; p < Plugins; ++p)
        sites.push_back(std::make_unique<Site>(server));
    return sites;
}

// Once every request has its reply and the tunnels are quiet, no request may
// have had a second one.
void expectEachAnsweredOnce(const std::vector<std::unique_ptr<Site>> &sites, ReplyCounter &counter)
{
    ASSERT_TRUE(counter.waitForAll(Requests));
    for (const auto &site : sites)
        site->tunnel.waitIdle();
    for (int n = 0; n < Requests; ++n)
        EXPECT_EQ(counter.count(n), 1) << "request " << n << " " << command(n).first.toStdString();
}

TEST(WorkflowThreads, EveryRequestGetsExactlyOneReply)
{
    FakeRecordingServer server;
    seed(server);
    ReplyCounter counter;
    std::vector<std::unique_ptr<Site>> sites = makeSites(server);

    runRequesters(sites, counter);

    expectEachAnsweredOnce(sites, counter);
}

TEST(WorkflowThreads, PluginsDeletedWithAnswersOnTheirWayStillAnswerEveryRequest)
{
    FakeRecordingServer server;
    seed(server);
    ReplyCounter counter;
    std::vector<std::unique_ptr<Site>> sites = makeSites(server);

    runRequesters(sites, counter);
    for (const auto &site : sites)
        site->plugin.reset();

    expectEachAnsweredOnce(sites, counter);
}

} // namespace

#include "TunnelFixture.h"

#include <memory>

// Four sender threads, 2,500 requests each, with every kind of fault mixed
// in: each request the tunnel took gets exactly one handler call, on the
// delivery thread; each one it refused gets none.
namespace {

constexpr int kThreads = 4;
constexpr int kPerThread = 2500;

struct Tally
{
    std::vector<std::atomic<int>> calls = std::vector<std::atomic<int>>(kThreads * kPerThread);
    std::vector<std::atomic<bool>> accepted = std::vector<std::atomic<bool>>(kThreads * kPerThread);
    std::atomic<int> onSenderThread{0};
};

void sendAll(LocalTunnel &tunnel, Tally &tally)
{
    std::vector<std::thread> senders;
    for (int t = 0; t < kThreads; ++t) {
        senders.emplace_back([&tunnel, &tally, t] {
            const std::thread::id self = std::this_thread::get_id();
            for (int i = 0; i < kPerThread; ++i) {
                const int id = t * kPerThread + i;
                const auto handler = [&tally, id, self](bool, const QString &, const QString &,
                                                        const QString &, const QString &, bool) {
                    tally.calls[static_cast<std::size_t>(id)]++;
                    if (std::this_thread::get_id() == self)
                        tally.onSenderThread++;
                };
                // A full queue refuses too: try again a little later.
                bool taken = false;
                for (int attempt = 0; attempt < 100 && !taken; ++attempt) {
                    taken = send(tunnel,
                                 i % 3 ? QStringLiteral("GetRecTmcard")
                                       : QStringLiteral("UpdRecTmcard"),
                                 QString::number(id), handler, i % 50 == 0 ? 0 : 15000);
                    if (!taken)
                        std::this_thread::sleep_for(std::chrono::microseconds(200));
                }
                tally.accepted[static_cast<std::size_t>(id)] = taken;
            }
        });
    }
    for (std::thread &sender : senders)
        sender.join();
}

void expectExactlyOnce(const Tally &tally, int *acceptedCount)
{
    *acceptedCount = 0;
    for (std::size_t id = 0; id < tally.calls.size(); ++id) {
        const int expected = tally.accepted[id] ? 1 : 0;
        *acceptedCount += expected;
        ASSERT_EQ(tally.calls[id].load(), expected) << "request " << id;
    }
    EXPECT_EQ(tally.onSenderThread.load(), 0);
}

LocalTunnelOptions loadOptions()
{
    LocalTunnelOptions options;
    options.queueBound = 512;
    options.faults = QStringLiteral("refuse=0.05,fail=0.05,drop=0.05,code=0.05:7,reorder=0.2,"
                                    "latency@UpdRecTmcard=0-1ms");
    return options;
}

} // namespace

TEST(TunnelUnderLoad, EveryAcceptedRequestIsAnsweredExactlyOnce)
{
    EchoBackend backend;
    Tally tally;
    {
        LocalTunnel tunnel(backend.factory(), loadOptions());
        sendAll(tunnel, tally);
        tunnel.waitIdle();
    }
    int accepted = 0;
    expectExactlyOnce(tally, &accepted);
    EXPECT_GT(accepted, kThreads * kPerThread / 2);
}

TEST(TunnelUnderLoad, DestroyingItMidStreamStillAnswersEveryAcceptedRequestOnce)
{
    EchoBackend backend;
    Tally tally;
    {
        LocalTunnelOptions options = loadOptions();
        options.faults += QStringLiteral(",latency=2ms");
        LocalTunnel tunnel(backend.factory(), options);
        sendAll(tunnel, tally);
        // No waitIdle: most requests are still pending here.
    }
    int accepted = 0;
    expectExactlyOnce(tally, &accepted);
    EXPECT_GT(accepted, 0);
}

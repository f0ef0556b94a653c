// The local tunnel as a caller sees it: which thread answers and how often,
// what a time-out, a full queue, destruction and each injected fault do, and
// the exchange log's lines.

#include "LocalTunnel.h"

#include <QFile>
#include <QRegularExpression>
#include <QTemporaryDir>

#include <gtest/gtest.h>

#include <atomic>
#include <condition_variable>
#include <mutex>
#include <thread>

using namespace Qt::StringLiterals;

namespace {

struct Delivery
{
    int tag = 0;
    bool ok = false;
    QString code;
    QString content;
    bool flag = false;
    std::thread::id thread;
};

// A backend that echoes each body with code "0" but holds every call while
// its gate is shut, and a recorder of handler calls. Read calls and asked
// once the tunnel is idle or gone.
struct Script
{
    TunnelResponseHandler handler(int tag)
    {
        return [this, tag](bool ok, auto &, auto &, auto &code, auto &content, bool flag) {
            const std::lock_guard<std::mutex> lock(mutex);
            calls.push_back({tag, ok, code, content, flag, std::this_thread::get_id()});
            changed.notify_all();
        };
    }
    TunnelBackendFactory echo()
    {
        return [this] {
            return StartedBackend{[this](auto &, auto &body) { return answer(body); }, {}};
        };
    }
    ServerAnswer answer(const QString &body)
    {
        std::unique_lock<std::mutex> lock(mutex);
        asked += body.toStdString();
        backend = std::this_thread::get_id();
        changed.notify_all();
        changed.wait(lock, [this] { return open; });
        return {u"0"_s, body};
    }
    void openGate()
    {
        const std::lock_guard<std::mutex> lock(mutex);
        open = true;
        changed.notify_all();
    }
    // Waits for this many handler calls and bodies asked.
    void waitFor(std::size_t called, std::size_t bodies = 0)
    {
        std::unique_lock<std::mutex> lock(mutex);
        changed.wait(lock, [&] { return calls.size() >= called && asked.size() >= bodies; });
    }

    std::mutex mutex;
    std::condition_variable changed;
    bool open = false;
    std::vector<Delivery> calls;
    std::string asked; // not QString: Qt frees text out of the race checker's sight
    std::thread::id backend;
};

bool send(IKoltTunnelClient &tunnel, const QString &command, const QString &body,
          TunnelResponseHandler handler, int timeoutMs = 15000, bool flag = false)
{
    TunnelRequest request{flag, timeoutMs, body, QString(), std::move(handler)};
    return tunnel.SendRequest(u"942E5F3F02EE4D7C879BADCD754F983C"_s,
                              reinterpret_cast<void *>(quintptr(7)), 1, command, request);
}

TEST(LocalTunnel, RecordingServerAnswersComeBackWithEachRequestsFlag)
{
    QTemporaryDir dir;
    RecordingServer *server = nullptr;
    LocalTunnel tunnel(recordingServerBackend(dir.filePath(u"t.db"_s), {}, &server));
    QString dumped;
    ASSERT_TRUE(tunnel.runOnBackend([&] { dumped = server->dump(); }));
    Script script;
    send(tunnel, u"GetRecTmcard"_s, u"<GetRecTmcard><TmcardAll>true</TmcardAll></GetRecTmcard>"_s,
         script.handler(1), 15000, true);
    send(tunnel, u"DelTmcard"_s, u"<DelTmcard/>"_s, script.handler(2));
    script.waitFor(2);
    const std::vector<Delivery> &calls = script.calls;
    EXPECT_TRUE(calls[0].ok && calls[0].flag && calls[0].code == u"0"_s &&
                calls[0].content == dumped);
    EXPECT_TRUE(calls[1].ok && !calls[1].flag && calls[1].code == u"4"_s)
        << "a refusal by the server is a good exchange";
}

struct FaultRow
{
    const char *behaviour;
    const char *faults;
    const char *outcomes; // per request: r refused, a answered, f ok false, digit: that code
    const char *order;    // the order the taken requests were delivered in
    const char *asked;    // the requests the server carried out
    std::size_t queueBound = 1024;
};

class InjectedFaults : public testing::TestWithParam<FaultRow>
{};

// Requests A1, B2, A3 and B4, all sent while the server holds the first one
// it is asked; each has a time-out of 500 ms.
TEST_P(InjectedFaults, HitTheRequestsTheySelect)
{
    Script script;
    const QString faults = QString::fromUtf8(GetParam().faults);
    LocalTunnel tunnel(script.echo(), {GetParam().queueBound, faults, 1, {}, u"local"_s});
    std::string outcomes = "rrrr";
    for (int i = 1; i <= 4; ++i)
        send(tunnel, i % 2 ? u"A"_s : u"B"_s, QString::number(i), script.handler(i), 500);
    script.openGate();
    tunnel.waitIdle();
    std::string order;
    for (const Delivery &call : script.calls) {
        order += char('0' + call.tag);
        outcomes[call.tag - 1] = !call.ok ? 'f' : call.code.at(0).toLatin1();
        EXPECT_TRUE(call.thread != std::this_thread::get_id() && call.thread != script.backend)
            << "answers come on the tunnel's delivery thread";
    }
    std::replace(outcomes.begin(), outcomes.end(), '0', 'a');
    EXPECT_EQ(outcomes, GetParam().outcomes);
    EXPECT_EQ(order, GetParam().order);
    EXPECT_EQ(script.asked, GetParam().asked);
}

INSTANTIATE_TEST_SUITE_P(
    Kinds, InjectedFaults,
    testing::Values(
        FaultRow{"no_faults", "", "aaaa", "1234", "1234"},
        FaultRow{"full_queue_refuses", "", "aarr", "12", "12", 2},
        FaultRow{"refuse_the_second", "refuse@2", "araa", "134", "134"},
        FaultRow{"fail_the_third_without_asking_the_server", "fail@3", "aafa", "1234", "124"},
        FaultRow{"drop_after_the_server_carried_it_out", "drop@1", "faaa", "1234", "1234"},
        FaultRow{"code_for_one_command_without_asking", "code@B=7", "a7a7", "1234", "13"},
        FaultRow{"code_for_the_second_of_a_command", "code@A#2=9", "aa9a", "1234", "124"},
        FaultRow{"range_of_requests", "fail@2-3", "affa", "1234", "14"},
        FaultRow{"from_a_request_on", "refuse@3+", "aarr", "12", "12"},
        FaultRow{"latency_beyond_the_time_out", "latency@4=5s", "aaaf", "1234", "1234"},
        FaultRow{"latency_within_the_time_out", "latency@1=100-200ms", "aaaa", "2341", "1234"},
        FaultRow{"probabilities_drawn_from_the_seed", "refuse=0.2,code=0.4:6", "r6a6", "234", "3"},
        FaultRow{"refuse_wins_over_fail_and_fail_over_code", "code=5,fail@2+,refuse@4", "5ffr",
                 "123", ""},
        FaultRow{"reorder_holds_an_answer_until_a_later_one_went_out", "reorder@2", "aaaa", "1324",
                 "1234"},
        FaultRow{"held_answer_goes_out_when_nothing_else_is_pending", "reorder@4", "aaaa", "1234",
                 "1234"}),
    [](const testing::TestParamInfo<FaultRow> &info) { return std::string(info.param.behaviour); });

// Request 1 is held by the server past its time-out, 2 times out in the
// queue, 3 is still pending when the tunnel is destroyed, 4 is refused: each
// taken one gets ok false once, the late answer to 1 is only logged, and the
// exchange log has one line per exchange, written as its handler is called.
TEST(LocalTunnel, TimeOutsAndDestructionDeliverOkFalseOnceAndTheLogSaysWhy)
{
    QTemporaryDir dir;
    const QString log = dir.filePath(u"exchanges.jsonl"_s);
    Script script;
    auto tunnel = std::make_unique<LocalTunnel>(
        script.echo(), LocalTunnelOptions{1024, u"refuse@4"_s, 1, log, u"local"_s});
    send(*tunnel, u"InsRecTmcard"_s, u"<b>\"1\"</b>"_s, script.handler(1), 300);
    send(*tunnel, u"Queued"_s, u"2"_s, script.handler(2), 100);
    send(*tunnel, u"Pending"_s, u"3"_s, script.handler(3), 15000, true);
    EXPECT_FALSE(send(*tunnel, u"Refused"_s, u"4"_s, script.handler(4)));
    script.waitFor(2, 1);
    // The destructor waits for the backend call in progress: the gate opens
    // once every pending request has had its ok false.
    std::thread destroyer([&] { tunnel.reset(); });
    script.waitFor(3);
    script.openGate();
    destroyer.join();
    std::string order;
    for (const Delivery &call : script.calls)
        order +=
            call.ok || !call.code.isEmpty() || !call.content.isEmpty() ? '?' : char('0' + call.tag);
    EXPECT_EQ(order, "213");
    EXPECT_EQ(script.asked, "<b>\"1\"</b>") << "a time-out in the queue: never carried out";
    QFile file(log);
    ASSERT_TRUE(file.open(QIODevice::ReadOnly));
    EXPECT_EQ(
        QString::fromUtf8(file.readAll())
            .replace(QRegularExpression(u"\"elapsedMs\":\\d+"_s), u"\"elapsedMs\":N"_s)
            .toStdString(),
        R"({"body":"4","code":"","command":"Refused","content":"","elapsedMs":N,"faults":"refuse","flag":false,"identity":"0x7","kind":1,"ok":false,"outcome":"refused","ownIdentity":false,"pluginId":"942E5F3F02EE4D7C879BADCD754F983C","seq":4,"timeoutMs":15000}
{"body":"2","code":"","command":"Queued","content":"","elapsedMs":N,"faults":"","flag":false,"identity":"0x7","kind":1,"ok":false,"outcome":"timeout","ownIdentity":false,"pluginId":"942E5F3F02EE4D7C879BADCD754F983C","seq":2,"timeoutMs":100}
{"body":"<b>\"1\"</b>","code":"","command":"InsRecTmcard","content":"","elapsedMs":N,"faults":"","flag":false,"identity":"0x7","kind":1,"ok":false,"outcome":"timeout","ownIdentity":false,"pluginId":"942E5F3F02EE4D7C879BADCD754F983C","seq":1,"timeoutMs":300}
{"body":"3","code":"","command":"Pending","content":"","elapsedMs":N,"faults":"","flag":true,"identity":"0x7","kind":1,"ok":false,"outcome":"shutdown","ownIdentity":false,"pluginId":"942E5F3F02EE4D7C879BADCD754F983C","seq":3,"timeoutMs":15000}
{"body":"","code":"0","command":"InsRecTmcard","content":"<b>\"1\"</b>","elapsedMs":N,"faults":"","flag":false,"identity":"0x0","kind":0,"ok":false,"outcome":"late","ownIdentity":false,"pluginId":"","seq":1,"timeoutMs":0}
)");
}

// Four sender threads, every kind of fault mixed in, the tunnel destroyed
// while most requests are still pending: each request taken gets exactly one
// handler call, each one refused gets none.
TEST(LocalTunnelUnderLoad, EveryTakenRequestIsAnsweredExactlyOnce)
{
    constexpr std::size_t Senders = 4;
    constexpr std::size_t Each = 1000;
    std::vector<std::atomic<int>> calls(Senders * Each);
    std::vector<char> taken(Senders * Each);
    Script script;
    script.openGate();
    {
        const QString faults =
            u"refuse=0.05,fail=0.05,drop=0.05,code=0.05:7,reorder=0.2,latency@U=0-1ms"_s;
        LocalTunnel tunnel(script.echo(), {256, faults, 1, {}, u"local"_s});
        std::vector<std::thread> senders;
        senders.reserve(Senders);
        for (std::size_t t = 0; t < Senders; ++t) {
            senders.emplace_back([&, t] {
                for (std::size_t i = t * Each; i < (t + 1) * Each; ++i)
                    taken[i] = send(
                        tunnel, i % 3 ? u"G"_s : u"U"_s, QString(),
                        [&, i](bool, auto &, auto &, auto &, auto &, bool) { ++calls[i]; },
                        i % 50 ? 15000 : 0);
            });
        }
        for (std::thread &sender : senders)
            sender.join();
    }
    for (std::size_t i = 0; i < calls.size(); ++i)
        ASSERT_EQ(calls[i].load(), taken[i] ? 1 : 0) << "request " << i;
}

} // namespace

#include "TunnelFixture.h"

// What each injected fault does to the request it hits, seen from the
// sender: the return of SendRequest, the handler's values and whether the
// server was asked at all.

LocalTunnelOptions withFaults(const QString &faults)
{
    LocalTunnelOptions options;
    options.faults = faults;
    return options;
}

struct FaultRow
{
    const char *behaviour;
    const char *faults;
    // Outcome of each of four requests "A", "B", "A", "B": 'r' refused,
    // 'a' answered, 'f' ok false, a digit: ok true with that code.
    const char *outcomes;
    // Which requests reached the backend, by position (1-based).
    std::vector<int> asked;
};

class InjectedFaults : public ::testing::TestWithParam<FaultRow>
{};

TEST_P(InjectedFaults, HitTheRequestsTheySelect)
{
    EchoBackend backend;
    Deliveries deliveries;
    LocalTunnel tunnel(backend.factory(), withFaults(QString::fromUtf8(GetParam().faults)));
    ASSERT_TRUE(tunnel.IsConnected()) << tunnel.errorString().toStdString();
    std::string outcomes;
    for (int i = 1; i <= 4; ++i) {
        const QString command = i % 2 ? QStringLiteral("A") : QStringLiteral("B");
        if (!send(tunnel, command, QString::number(i), deliveries.handler(i), 500)) {
            outcomes += 'r';
            continue;
        }
        tunnel.waitIdle();
        const Delivery call = deliveries.calls().back();
        outcomes += !call.ok                          ? 'f'
                    : call.code == QLatin1String("0") ? 'a'
                                                      : call.code.toStdString().front();
    }
    EXPECT_EQ(outcomes, GetParam().outcomes);
    EXPECT_EQ(backend.bodiesAsNumbers(), GetParam().asked);
}

INSTANTIATE_TEST_SUITE_P(
    Kinds, InjectedFaults,
    ::testing::Values(
        FaultRow{"no_faults", "", "aaaa", {1, 2, 3, 4}},
        FaultRow{"refuse_the_second", "refuse@2", "araa", {1, 3, 4}},
        FaultRow{"fail_the_third_without_asking_the_server", "fail@3", "aafa", {1, 2, 4}},
        FaultRow{"drop_after_the_server_carried_it_out", "drop@1", "faaa", {1, 2, 3, 4}},
        FaultRow{"code_for_one_command", "code@B=7", "a7a7", {1, 3}},
        FaultRow{"code_for_the_second_of_a_command", "code@A#2=9", "aa9a", {1, 2, 4}},
        FaultRow{"range_of_requests", "fail@2-3", "affa", {1, 4}},
        FaultRow{"from_a_request_on", "refuse@3+", "aarr", {1, 2}},
        FaultRow{"latency_beyond_the_time_out", "latency@4=5s", "aaaf", {1, 2, 3, 4}},
        FaultRow{"certain_probability", "fail=1", "ffff", {}},
        FaultRow{"zero_probability", "fail=0,refuse=0.0", "aaaa", {1, 2, 3, 4}}),
    [](const ::testing::TestParamInfo<FaultRow> &info) {
        return std::string(info.param.behaviour);
    });

TEST(InjectedFaults, ReorderHoldsAnAnswerUntilALaterOneWentOut)
{
    EchoBackend backend;
    Deliveries deliveries;
    LocalTunnel tunnel(backend.factory(), withFaults(QStringLiteral("reorder@2")));
    ASSERT_TRUE(send(tunnel, QStringLiteral("Wait"), QString(), deliveries.handler(1)));
    backend.gate.waitUntilReached();
    for (int i = 2; i <= 4; ++i)
        ASSERT_TRUE(send(tunnel, QStringLiteral("X"), QString(), deliveries.handler(i)));
    backend.gate.open();
    tunnel.waitIdle();
    std::vector<int> order;
    for (const Delivery &call : deliveries.calls()) {
        order.push_back(call.tag);
        EXPECT_TRUE(call.ok);
    }
    EXPECT_EQ(order, (std::vector<int>{1, 3, 2, 4}));
}

TEST(InjectedFaults, HeldAnswerGoesOutWhenNothingElseIsPending)
{
    EchoBackend backend;
    Deliveries deliveries;
    LocalTunnel tunnel(backend.factory(), withFaults(QStringLiteral("reorder")));
    ASSERT_TRUE(send(tunnel, QStringLiteral("X"), QString(), deliveries.handler(1)));
    deliveries.waitFor(1);
    EXPECT_TRUE(deliveries.calls().front().ok);
}

// The same specification and seed give the same faults for the same requests.
std::string runSeeded(quint64 seed)
{
    EchoBackend backend;
    Deliveries deliveries;
    LocalTunnelOptions options =
        withFaults(QStringLiteral("refuse=0.2,fail=0.2,code=0.2:5,drop=0.1,latency=0-3ms"));
    options.faultSeed = seed;
    LocalTunnel tunnel(backend.factory(), options);
    std::string outcomes;
    for (int i = 0; i < 200; ++i) {
        if (!send(tunnel, QStringLiteral("X"), QString(), deliveries.handler(i))) {
            outcomes += 'r';
            continue;
        }
        tunnel.waitIdle();
        const Delivery call = deliveries.calls().back();
        outcomes += !call.ok ? 'f' : call.code == QLatin1String("0") ? 'a' : 'c';
    }
    return outcomes;
}

TEST(InjectedFaults, AreReproducibleFromTheSeed)
{
    const std::string first = runSeeded(42);
    EXPECT_EQ(runSeeded(42), first);
    EXPECT_NE(runSeeded(43), first);
    for (const char kind : {'r', 'f', 'a', 'c'})
        EXPECT_NE(first.find(kind), std::string::npos) << kind;
}

struct SpecRow
{
    const char *text;
    bool valid;
};

class FaultSpecifications : public ::testing::TestWithParam<SpecRow>
{};

TEST_P(FaultSpecifications, AreCheckedBeforeUse)
{
    QString error;
    EXPECT_EQ(LocalTunnel::checkFaults(QString::fromUtf8(GetParam().text), &error),
              GetParam().valid)
        << error.toStdString();
    EXPECT_EQ(error.isEmpty(), GetParam().valid);
    EchoBackend backend;
    const LocalTunnel tunnel(backend.factory(), withFaults(QString::fromUtf8(GetParam().text)));
    EXPECT_EQ(tunnel.IsConnected(), GetParam().valid)
        << "a bad specification leaves it disconnected";
}

INSTANTIATE_TEST_SUITE_P(
    Grammar, FaultSpecifications,
    ::testing::Values(SpecRow{"latency=50ms,refuse=0.1,fail=0.05,code=0.05:7,reorder=0.2", true},
                      SpecRow{"fail@3", true}, SpecRow{"latency@UpdRecTmcard#2=2s", true},
                      SpecRow{"latency=10-80ms", true}, SpecRow{"code@GetRecTmcard=-1", true},
                      SpecRow{"drop@5-9", true}, SpecRow{"", true}, SpecRow{"explode=0.1", false},
                      SpecRow{"fail=1.5", false}, SpecRow{"code=0", false}, SpecRow{"code", false},
                      SpecRow{"fail@0", false}, SpecRow{"fail@3-1", false},
                      SpecRow{"latency", false}, SpecRow{"latency=fast", false},
                      SpecRow{"latency=80-10ms", false}, SpecRow{"fail@Get Rec", false}));

#include "TunnelFixture.h"

#include <QFile>
#include <QJsonDocument>
#include <QJsonObject>
#include <QTemporaryDir>

TEST(LocalTunnel, DeliversEachAnswerOnceInOrderOnItsOwnThread)
{
    EchoBackend backend;
    Deliveries deliveries;
    {
        LocalTunnel tunnel(backend.factory());
        ASSERT_TRUE(tunnel.IsConnected()) << tunnel.errorString().toStdString();
        for (int i = 0; i < 200; ++i)
            ASSERT_TRUE(send(tunnel, QStringLiteral("GetRecTmcard"), QString::number(i),
                             deliveries.handler(i), 15000, i % 2 == 0));
        tunnel.waitIdle();
    }
    const std::vector<Delivery> calls = deliveries.calls();
    ASSERT_EQ(calls.size(), 200u);
    for (int i = 0; i < 200; ++i) {
        const Delivery &call = calls[static_cast<std::size_t>(i)];
        EXPECT_EQ(call.tag, i);
        EXPECT_TRUE(call.ok);
        EXPECT_EQ(call.code, QStringLiteral("0"));
        EXPECT_EQ(call.content, QString::number(i));
        EXPECT_TRUE(call.status.isEmpty() && call.detail.isEmpty());
        EXPECT_EQ(call.flag, i % 2 == 0) << "the request's own flag comes back";
        EXPECT_NE(call.thread, std::this_thread::get_id());
        EXPECT_NE(call.thread, backend.thread) << "delivery and backend are separate threads";
    }
}

TEST(LocalTunnel, AnswersFromTheRecordingServerAndRunsClosuresOnItsThread)
{
    QTemporaryDir dir;
    RecordingServer *server = nullptr;
    LocalTunnel tunnel(recordingServerBackend(dir.filePath(QStringLiteral("t.db")),
                                              AnswerLayout::Compact, &server));
    ASSERT_TRUE(tunnel.IsConnected()) << tunnel.errorString().toStdString();
    ASSERT_NE(server, nullptr);

    QString dumped;
    ASSERT_TRUE(tunnel.runOnBackend([&] {
        server->seed(
            QStringLiteral("<GetRecTmcardRes><Tmcard><Revision>2</Revision><TmcardID>4"
                           "</TmcardID><Name>N</Name><Mapping/></Tmcard></GetRecTmcardRes>"));
        dumped = server->dump();
    }));
    Deliveries deliveries;
    ASSERT_TRUE(send(tunnel, QStringLiteral("GetRecTmcard"),
                     QStringLiteral("<GetRecTmcard><TmcardAll>true</TmcardAll></GetRecTmcard>"),
                     deliveries.handler(0)));
    ASSERT_TRUE(send(tunnel, QStringLiteral("DelTmcard"), QStringLiteral("<DelTmcard/>"),
                     deliveries.handler(1)));
    tunnel.waitIdle();
    const std::vector<Delivery> calls = deliveries.calls();
    ASSERT_EQ(calls.size(), 2u);
    EXPECT_TRUE(calls[0].ok);
    EXPECT_EQ(calls[0].content, dumped);
    EXPECT_TRUE(dumped.contains(QLatin1String("<TmcardID>4</TmcardID>")));
    EXPECT_TRUE(calls[1].ok) << "a refusal by the server is still a good exchange";
    EXPECT_EQ(calls[1].code, QStringLiteral("4"));
}

TEST(LocalTunnel, TimedOutRequestGetsOkFalseOnceAndItsLateAnswerIsDropped)
{
    EchoBackend backend;
    Deliveries deliveries;
    LocalTunnel tunnel(backend.factory());
    ASSERT_TRUE(
        send(tunnel, QStringLiteral("Wait"), QStringLiteral("slow"), deliveries.handler(1), 20));
    // Delivered while the backend still holds the request.
    deliveries.waitFor(1);
    backend.gate.waitUntilReached();
    backend.gate.open();
    tunnel.waitIdle();
    ASSERT_TRUE(
        send(tunnel, QStringLiteral("Next"), QStringLiteral("next"), deliveries.handler(2)));
    tunnel.waitIdle();
    const std::vector<Delivery> calls = deliveries.calls();
    ASSERT_EQ(calls.size(), 2u);
    EXPECT_EQ(calls[0].tag, 1);
    EXPECT_FALSE(calls[0].ok);
    EXPECT_TRUE(calls[0].code.isEmpty() && calls[0].content.isEmpty());
    EXPECT_EQ(calls[1].tag, 2);
    EXPECT_TRUE(calls[1].ok);
}

TEST(LocalTunnel, RequestThatTimesOutWhileQueuedIsNeverCarriedOut)
{
    EchoBackend backend;
    Deliveries deliveries;
    LocalTunnel tunnel(backend.factory());
    ASSERT_TRUE(send(tunnel, QStringLiteral("Wait"), QString(), deliveries.handler(1)));
    backend.gate.waitUntilReached();
    ASSERT_TRUE(send(tunnel, QStringLiteral("Queued"), QString(), deliveries.handler(2), 10));
    deliveries.waitFor(1);
    backend.gate.open();
    tunnel.waitIdle();
    const std::vector<Delivery> calls = deliveries.calls();
    ASSERT_EQ(calls.size(), 2u);
    EXPECT_EQ(calls[0].tag, 2);
    EXPECT_FALSE(calls[0].ok);
    EXPECT_EQ(calls[1].tag, 1);
    EXPECT_TRUE(calls[1].ok);
    EXPECT_EQ(backend.commands(), std::vector<QString>{QStringLiteral("Wait")});
}

TEST(LocalTunnel, BoundedQueueRefusesWhenFull)
{
    EchoBackend backend;
    Deliveries deliveries;
    LocalTunnelOptions options;
    options.queueBound = 3;
    LocalTunnel tunnel(backend.factory(), options);
    ASSERT_TRUE(send(tunnel, QStringLiteral("Wait"), QString(), deliveries.handler(0)));
    ASSERT_TRUE(send(tunnel, QStringLiteral("A"), QString(), deliveries.handler(1)));
    ASSERT_TRUE(send(tunnel, QStringLiteral("B"), QString(), deliveries.handler(2)));
    EXPECT_FALSE(send(tunnel, QStringLiteral("C"), QString(), deliveries.handler(3)));
    backend.gate.open();
    tunnel.waitIdle();
    EXPECT_TRUE(send(tunnel, QStringLiteral("D"), QString(), deliveries.handler(4)));
    tunnel.waitIdle();
    std::vector<int> tags;
    for (const Delivery &call : deliveries.calls())
        tags.push_back(call.tag);
    EXPECT_EQ(tags, (std::vector<int>{0, 1, 2, 4}));
}

TEST(LocalTunnel, DestroyingItDeliversOkFalseToEveryPendingRequest)
{
    EchoBackend backend;
    Deliveries deliveries;
    auto tunnel = std::make_unique<LocalTunnel>(backend.factory());
    ASSERT_TRUE(send(*tunnel, QStringLiteral("Wait"), QString(), deliveries.handler(0)));
    for (int i = 1; i <= 10; ++i)
        ASSERT_TRUE(send(*tunnel, QStringLiteral("Queued"), QString(), deliveries.handler(i)));
    backend.gate.waitUntilReached();
    // The destructor waits for the backend call in progress; the pending
    // requests are answered before that.
    std::thread destroyer([&] { tunnel.reset(); });
    deliveries.waitFor(11);
    backend.gate.open();
    destroyer.join();
    const std::vector<Delivery> calls = deliveries.calls();
    ASSERT_EQ(calls.size(), 11u);
    for (const Delivery &call : calls) {
        EXPECT_FALSE(call.ok);
        EXPECT_NE(call.thread, std::this_thread::get_id());
    }
    EXPECT_EQ(backend.commands(), std::vector<QString>{QStringLiteral("Wait")});
}

TEST(LocalTunnel, HandlersMaySendTheNextRequest)
{
    EchoBackend backend;
    Deliveries deliveries;
    LocalTunnel tunnel(backend.factory());
    std::atomic<bool> chained{false};
    ASSERT_TRUE(
        send(tunnel, QStringLiteral("First"), QString(),
             [&](bool, const QString &, const QString &, const QString &, const QString &, bool) {
                 chained = send(tunnel, QStringLiteral("Second"), QString(), deliveries.handler(2));
             }));
    deliveries.waitFor(1);
    EXPECT_TRUE(chained);
    EXPECT_EQ(backend.commands(),
              (std::vector<QString>{QStringLiteral("First"), QStringLiteral("Second")}));
}

TEST(LocalTunnel, RunsClosuresOnTheBackendThreadAfterQueuedRequests)
{
    EchoBackend backend;
    LocalTunnel tunnel(backend.factory());
    Deliveries deliveries;
    ASSERT_TRUE(send(tunnel, QStringLiteral("Before"), QString(), deliveries.handler(0)));
    std::thread::id ranOn;
    std::size_t seen = 0;
    ASSERT_TRUE(tunnel.runOnBackend([&] {
        ranOn = std::this_thread::get_id();
        seen = backend.commands().size();
    }));
    EXPECT_EQ(ranOn, backend.thread);
    EXPECT_EQ(seen, 1u);
}

TEST(LocalTunnel, DisconnectedWhenTheBackendCannotStart)
{
    LocalTunnel tunnel(recordingServerBackend(QStringLiteral("/nonexistent/dir/t.db")));
    EXPECT_FALSE(tunnel.IsConnected());
    EXPECT_FALSE(tunnel.errorString().isEmpty());
    Deliveries deliveries;
    EXPECT_FALSE(send(tunnel, QStringLiteral("GetRecTmcard"), QString(), deliveries.handler(0)));
    EXPECT_FALSE(tunnel.runOnBackend([] {}));
    tunnel.waitIdle();
}

TEST(LocalTunnel, RefusesARequestWithoutHandler)
{
    EchoBackend backend;
    LocalTunnel tunnel(backend.factory());
    EXPECT_FALSE(send(tunnel, QStringLiteral("X"), QString(), TunnelResponseHandler()));
}

TEST(LocalTunnel, LogsEveryExchangeAsOneJsonLineAppended)
{
    QTemporaryDir dir;
    const QString path = dir.filePath(QStringLiteral("exchanges.jsonl"));
    EchoBackend backend;
    int foreignIdentity = 0;
    for (int round = 0; round < 2; ++round) {
        LocalTunnelOptions options;
        options.exchangeLogPath = path;
        options.faults = QStringLiteral("refuse@2");
        LocalTunnel tunnel(backend.factory(), options);
        Deliveries deliveries;
        ASSERT_TRUE(send(tunnel, QStringLiteral("InsRecTmcard"), QStringLiteral("<b>\"x\"</b>"),
                         deliveries.handler(0), 1234, true, &foreignIdentity));
        tunnel.waitIdle();
        ASSERT_FALSE(
            send(tunnel, QStringLiteral("GetRecTmcard"), QString(), deliveries.handler(1)));
        tunnel.waitIdle();
    }
    QFile file(path);
    ASSERT_TRUE(file.open(QIODevice::ReadOnly));
    const QList<QByteArray> lines = file.readAll().split('\n');
    ASSERT_EQ(lines.size(), 5); // four records and the final line end
    for (int round = 0; round < 2; ++round) {
        const QJsonObject answered = QJsonDocument::fromJson(lines[2 * round]).object();
        const QJsonObject refused = QJsonDocument::fromJson(lines[2 * round + 1]).object();
        EXPECT_EQ(refused.value(QStringLiteral("outcome")).toString(), QStringLiteral("refused"));
        EXPECT_EQ(refused.value(QStringLiteral("command")).toString(),
                  QStringLiteral("GetRecTmcard"));
        EXPECT_TRUE(refused.value(QStringLiteral("ownIdentity")).toBool());
        EXPECT_EQ(answered.value(QStringLiteral("outcome")).toString(), QStringLiteral("answered"));
        EXPECT_EQ(answered.value(QStringLiteral("command")).toString(),
                  QStringLiteral("InsRecTmcard"));
        EXPECT_EQ(answered.value(QStringLiteral("body")).toString(),
                  QStringLiteral("<b>\"x\"</b>"));
        EXPECT_EQ(answered.value(QStringLiteral("content")).toString(),
                  QStringLiteral("<b>\"x\"</b>"));
        EXPECT_EQ(answered.value(QStringLiteral("timeoutMs")).toInt(), 1234);
        EXPECT_TRUE(answered.value(QStringLiteral("ok")).toBool());
        EXPECT_EQ(answered.value(QStringLiteral("code")).toString(), QStringLiteral("0"));
        EXPECT_FALSE(answered.value(QStringLiteral("ownIdentity")).toBool());
        EXPECT_EQ(answered.value(QStringLiteral("identity")).toString(),
                  QStringLiteral("0x%1").arg(reinterpret_cast<quintptr>(&foreignIdentity), 0, 16));
    }
}

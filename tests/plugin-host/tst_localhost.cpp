// The local host runtime: replies counted per request across threads,
// exchanges counted until their answer handlers have returned, requester
// records, and plug-in files checked before their code runs.

#include "IPluginObjectBase.h"
#include "LocalFrameworkTools.h"
#include "PendingExchanges.h"
#include "PluginLibrary.h"
#include "RecordingScheduleSettingConstants.h"
#include "ReplyCollector.h"
#include "Requesters.h"
#include "TestTunnel.h"

#include <QFile>
#include <QTemporaryDir>

#include <gtest/gtest.h>

#include <atomic>
#include <thread>

using namespace std::chrono_literals;

namespace {

TEST(ReplyCollector, FirstReplyFromAnotherThreadWakesTheWaiter)
{
    ReplyCollector collector;
    const ResponseCallback reply = collector.replyFunction(0);
    std::thread tunnelThread([reply] {
        std::this_thread::sleep_for(20ms);
        reply(false, QStringLiteral("-1"), QString(), QVariant(7));
    });
    const auto first = collector.waitForFirst(0, 10s);
    tunnelThread.join();
    ASSERT_TRUE(first.has_value());
    EXPECT_FALSE(first->flag);
    EXPECT_EQ(first->code, QStringLiteral("-1"));
    EXPECT_EQ(first->data.toInt(), 7);
}

TEST(ReplyCollector, NoReplyWithinTheTimeOutGivesNothing)
{
    ReplyCollector collector;
    const ResponseCallback reply = collector.replyFunction(0);
    EXPECT_FALSE(collector.waitForFirst(0, 10ms).has_value());
    EXPECT_EQ(collector.replyCount(0), 0);
    // A reply for another request does not answer this one.
    collector.replyFunction(1)(true, QStringLiteral("0"), QString(), QVariant());
    EXPECT_FALSE(collector.waitForFirst(0, 10ms).has_value());
}

TEST(ReplyCollector, SecondRepliesAreCountedAndTheFirstIsKept)
{
    ReplyCollector collector;
    const ResponseCallback first = collector.replyFunction(0);
    const ResponseCallback second = collector.replyFunction(1);
    std::vector<std::thread> threads;
    for (int i = 0; i < 4; ++i)
        threads.emplace_back(
            [second] { second(true, QStringLiteral("0"), QString(), QVariant()); });
    first(true, QStringLiteral("0"), QString(), QVariant(QStringLiteral("kept")));
    first(false, QStringLiteral("-1"), QString(), QVariant());
    for (std::thread &thread : threads)
        thread.join();
    EXPECT_EQ(collector.waitForFirst(0, 0ms)->data.toString(), QStringLiteral("kept"));
    EXPECT_EQ(collector.replyCount(0), 2);
    EXPECT_EQ(collector.replyCount(1), 4);
    EXPECT_EQ(collector.answeredMoreThanOnce(), (std::vector<int>{0, 1}));
}

TunnelRequest requestWith(TunnelResponseHandler handler)
{
    TunnelRequest request;
    request.body = QStringLiteral("<GetRecTmcard><TmcardAll>true</TmcardAll></GetRecTmcard>");
    request.onResponse = std::move(handler);
    return request;
}

TEST(PendingExchanges, CountsUntilTheAnswerHandlerHasReturned)
{
    TestTunnel tunnel(TestTunnel::Delivery::Held);
    PendingExchanges exchanges(&tunnel);
    std::atomic<bool> handled{false};
    TunnelRequest request = requestWith(
        [&](bool, const QString &, const QString &, const QString &, const QString &, bool) {
            std::this_thread::sleep_for(20ms);
            handled = true;
        });
    ASSERT_TRUE(exchanges.SendRequest(QStringLiteral("id"), nullptr, 1,
                                      QStringLiteral("GetRecTmcard"), request));
    EXPECT_EQ(exchanges.pending(), 1);
    EXPECT_FALSE(exchanges.waitIdle(10ms));
    tunnel.setDelivery(TestTunnel::Delivery::OtherThread);
    std::thread deliverer([&] { tunnel.deliverAll(); });
    EXPECT_TRUE(exchanges.waitIdle(10s));
    EXPECT_TRUE(handled);
    deliverer.join();
}

TEST(PendingExchanges, PassesTheSendThroughUnchanged)
{
    TestTunnel tunnel;
    PendingExchanges exchanges(&tunnel);
    int calls = 0;
    TunnelRequest request = requestWith([&](bool, const QString &, const QString &, const QString &,
                                            const QString &, bool) { ++calls; });
    request.timeoutMs = 16000;
    ASSERT_TRUE(exchanges.SendRequest(QStringLiteral("id"), Requesters::identityOf(4), 1,
                                      QStringLiteral("GetRecTmcard"), request));
    ASSERT_EQ(tunnel.sent().size(), 1);
    const TestTunnel::Sent sent = tunnel.sent().first();
    EXPECT_EQ(sent.clientId, Requesters::identityOf(4));
    EXPECT_EQ(sent.timeoutMs, 16000);
    EXPECT_EQ(sent.body, request.body);
    EXPECT_EQ(calls, 1);
    EXPECT_EQ(exchanges.GetClientID(), tunnel.GetClientID());
    EXPECT_EQ(exchanges.pending(), 0);
}

TEST(PendingExchanges, ARefusedSendIsNotPending)
{
    TestTunnel tunnel;
    tunnel.refuseNext();
    PendingExchanges exchanges(&tunnel);
    TunnelRequest request = requestWith({});
    EXPECT_FALSE(exchanges.SendRequest(QStringLiteral("id"), nullptr, 1,
                                       QStringLiteral("GetRecTmcard"), request));
    EXPECT_EQ(exchanges.pending(), 0);
    EXPECT_TRUE(exchanges.waitIdle(0ms));
}

TEST(Requesters, ANumberIsItsOwnIdentityAndKeepsItsRecord)
{
    Requesters requesters;
    const RequestSenderInfo &seven = requesters.sender(7);
    const RequestSenderInfo &zero = requesters.sender(0);
    EXPECT_EQ(Requesters::clientOf(seven.clientId), 7);
    EXPECT_EQ(zero.clientId, nullptr);
    EXPECT_EQ(&requesters.sender(7), &seven);
    const qint64 big = qint64(1) << 53;
    EXPECT_EQ(Requesters::clientOf(requesters.sender(big).clientId), big);
    EXPECT_EQ(seven.userName, QStringLiteral("client 7"));
}

TEST(LocalFrameworkTools, HandsOutTheTunnelItWasMadeWith)
{
    TestTunnel tunnel;
    LocalFrameworkTools tools(&tunnel);
    EXPECT_EQ(tools.GetTunnelClient(), &tunnel);
    LocalFrameworkTools none(nullptr);
    EXPECT_EQ(none.GetTunnelClient(), nullptr);
}

PluginLibrary builtPlugin(const QString &iid = QStringLiteral(PLUGIN_SERVER_INTERFACE_IID),
                          const QString &pluginId = PluginRecordingScheduleSettingCommon::PluginId)
{
    return PluginLibrary(QStringLiteral(BUILT_PLUGIN_FILE), iid, pluginId);
}

TEST(PluginLibrary, LoadsTheBuiltPlugin)
{
    PluginLibrary library = builtPlugin();
    ASSERT_TRUE(library.load()) << library.errorString().toStdString();
    ASSERT_NE(library.plugin(), nullptr);
    TestTunnel tunnel;
    LocalFrameworkTools tools(&tunnel);
    EXPECT_TRUE(library.plugin()->InitialPluginBase(&tools));
    library.releasePlugin();
    EXPECT_EQ(library.plugin(), nullptr);
}

struct Refusal
{
    const char *name;
    QString file;
    QString iid;
    QString pluginId;
    const char *reason;
};

void PrintTo(const Refusal &r, std::ostream *os)
{
    *os << r.name;
}

class PluginLibraryRefuses : public testing::TestWithParam<Refusal>
{};

TEST_P(PluginLibraryRefuses, WithAReason)
{
    QTemporaryDir dir;
    QFile text(dir.filePath(QStringLiteral("text.so")));
    ASSERT_TRUE(text.open(QIODevice::WriteOnly));
    text.write("not a library\n");
    text.close();

    const Refusal refusal = GetParam();
    const QString file = refusal.file == QLatin1String("TEXT") ? text.fileName() : refusal.file;
    PluginLibrary library(file, refusal.iid, refusal.pluginId);
    EXPECT_FALSE(library.load());
    EXPECT_EQ(library.plugin(), nullptr);
    EXPECT_TRUE(library.errorString().contains(QString::fromUtf8(refusal.reason)))
        << library.errorString().toStdString();
}

const QString Iid = QStringLiteral(PLUGIN_SERVER_INTERFACE_IID);
const QString Id = PluginRecordingScheduleSettingCommon::PluginId;

INSTANTIATE_TEST_SUITE_P(
    Files, PluginLibraryRefuses,
    testing::Values(Refusal{"missing_file", QStringLiteral("/nonexistent/plugin.so"), Iid, Id,
                            "no such file"},
                    Refusal{"text_file", QStringLiteral("TEXT"), Iid, Id, "ELF"},
                    Refusal{"library_that_is_no_plugin", QStringLiteral(OTHER_LIBRARY_FILE), Iid,
                            Id, "not a Qt plugin"},
                    Refusal{"other_interface", QStringLiteral(BUILT_PLUGIN_FILE),
                            QStringLiteral("com.example.Other"), Id, "interface"},
                    Refusal{"other_plugin_id", QStringLiteral(BUILT_PLUGIN_FILE), Iid,
                            QStringLiteral("00000000000000000000000000000000"), "PluginID"}),
    [](const testing::TestParamInfo<Refusal> &info) { return std::string(info.param.name); });

} // namespace

// Answers that arrive after the plug-in object is gone. The host may delete
// the plug-in while the tunnel still holds answers; each of those requests is
// answered (true, "-1") by its completion, once, and nothing touches the
// deleted object.

#include "FakeControl.h"
#include "PluginCommands.h"
#include "PluginRecordingScheduleSettingSrv.h"
#include "QtPrinters.h"
#include "ReplyRecorder.h"
#include "RequestSenderInfo.h"
#include "TestTunnel.h"

#include "IFrameworkTools.h"

#include <gtest/gtest.h>

#include <deque>
#include <memory>
#include <thread>

namespace {

TEST(PluginLifetime, AnswersHeldPastDeletionAreEachAnsweredOnce)
{
    const auto control = QSharedPointer<FakeControl>::create();
    control->setFetch(FakeControl::Fetch::Hold);
    control->setAnswer({true, false, {}, {}});
    auto plugin = std::make_unique<PluginRecordingScheduleSettingSrv>();
    plugin->SetRecordingSettingControl(control);

    std::deque<ReplyRecorder> replies;
    for (const QString &command : ReadFirstCommands) {
        replies.emplace_back();
        plugin->Request(command, ReadablePayload, RequestSenderInfo{}, replies.back().callback());
    }
    ASSERT_EQ(control->held(), ReadFirstCommands.size());
    plugin.reset();

    // The tunnel's thread delivers what it held.
    std::thread tunnel([&] { control->deliverHeld(); });
    tunnel.join();

    for (std::size_t i = 0; i < replies.size(); ++i) {
        const QString command = ReadFirstCommands.at(static_cast<int>(i));
        ASSERT_EQ(replies[i].count(), 1) << command.toStdString();
        EXPECT_TRUE(replies[i].last().flag) << command.toStdString();
        EXPECT_EQ(replies[i].last().code, QStringLiteral("-1")) << command.toStdString();
        EXPECT_FALSE(replies[i].last().data.isValid()) << command.toStdString();
    }
}

TEST(PluginLifetime, DeletionRacingWithAnswersLeavesOneReplyPerRequest)
{
    for (int round = 0; round < 20; ++round) {
        const auto control = QSharedPointer<FakeControl>::create();
        control->setFetch(FakeControl::Fetch::Hold);
        auto plugin = std::make_unique<PluginRecordingScheduleSettingSrv>();
        plugin->SetRecordingSettingControl(control);

        std::deque<ReplyRecorder> replies(40);
        for (ReplyRecorder &reply : replies)
            plugin->Request(QStringLiteral("GetAllScheduleRecInfo"), QVariant(),
                            RequestSenderInfo{}, reply.callback());

        std::thread tunnel([&] { control->deliverHeld(); });
        plugin.reset(); // on the host's thread, while answers arrive
        tunnel.join();

        // Each request is answered either from its time cards (while the
        // plug-in lived) or as failed (after it was gone), never both.
        for (const ReplyRecorder &reply : replies) {
            ASSERT_EQ(reply.count(), 1);
            const ReplyRecorder::Reply answer = reply.last();
            if (answer.code == QLatin1String("0"))
                EXPECT_TRUE(answer.data.isValid());
            else
                EXPECT_EQ(answer.code, QStringLiteral("-1"));
        }
    }
}

struct Framework : IFrameworkTools
{
    IKoltTunnelClient *tunnel = nullptr;
    IKoltTunnelClient *GetTunnelClient() override { return tunnel; }
};

// The same through the real control: the tunnel holds the answers, the host
// deletes the plug-in, then the tunnel's thread delivers them.
TEST(PluginLifetime, TunnelAnswersPastDeletionAreEachAnsweredOnce)
{
    TestTunnel tunnel(TestTunnel::Delivery::Held);
    Framework framework;
    framework.tunnel = &tunnel;
    auto plugin = std::make_unique<PluginRecordingScheduleSettingSrv>();
    ASSERT_TRUE(plugin->InitialPluginBase(&framework));

    std::deque<ReplyRecorder> replies;
    for (const QString &command : ReadFirstCommands) {
        replies.emplace_back();
        plugin->Request(command, ReadablePayload, RequestSenderInfo{}, replies.back().callback());
    }
    ASSERT_EQ(tunnel.pending(), ReadFirstCommands.size());
    plugin.reset();

    std::thread delivery([&] { tunnel.deliverAll(); });
    delivery.join();

    for (std::size_t i = 0; i < replies.size(); ++i) {
        const std::string command = ReadFirstCommands.at(static_cast<int>(i)).toStdString();
        ASSERT_EQ(replies[i].count(), 1) << command;
        EXPECT_TRUE(replies[i].last().flag) << command;
        EXPECT_EQ(replies[i].last().code, QStringLiteral("-1")) << command;
    }
    EXPECT_EQ(tunnel.sent().size(), ReadFirstCommands.size()) << "nothing sent after deletion";
}

TEST(PluginLifetime, ReplacedControlKeepsServingItsAnswers)
{
    const auto first = QSharedPointer<FakeControl>::create();
    first->setFetch(FakeControl::Fetch::Hold);
    PluginRecordingScheduleSettingSrv plugin;
    plugin.SetRecordingSettingControl(first);
    ReplyRecorder reply;
    plugin.Request(QStringLiteral("GetScheduleRecInfo"), QVariant(), RequestSenderInfo{},
                   reply.callback());
    plugin.SetRecordingSettingControl(QSharedPointer<FakeControl>::create());

    std::thread tunnel([&] { first->deliverHeld(); });
    tunnel.join();
    ASSERT_EQ(reply.count(), 1);
    EXPECT_EQ(reply.last().code, QStringLiteral("0"));
}

} // namespace

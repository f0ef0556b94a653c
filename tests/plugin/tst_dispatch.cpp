#include "PluginRecordingScheduleSettingSrv.h"
#include "RequestSenderInfo.h"
#include "TestTunnel.h"

#include "IFrameworkTools.h"

#include <gtest/gtest.h>

namespace {

struct Framework : IFrameworkTools
{
    IKoltTunnelClient *tunnel = nullptr;
    IKoltTunnelClient *GetTunnelClient() override { return tunnel; }
};

struct Reply
{
    int calls = 0;
    bool flag = false;
    QString code;
    QVariant data;
};

ResponseCallback recorder(Reply &reply)
{
    return [&reply](bool flag, const QString &code, const QString &, const QVariant &data) {
        ++reply.calls;
        reply.flag = flag;
        reply.code = code;
        reply.data = data;
    };
}

TEST(Dispatch, UnknownCommandIsAnsweredAtOnce)
{
    TestTunnel tunnel;
    Framework framework;
    framework.tunnel = &tunnel;
    PluginRecordingScheduleSettingSrv plugin;
    ASSERT_TRUE(plugin.InitialPluginBase(&framework));
    Reply reply;
    plugin.Request(QStringLiteral("delschedule"), QVariant(), RequestSenderInfo{}, recorder(reply));
    EXPECT_EQ(reply.calls, 1);
    EXPECT_TRUE(reply.flag);
    EXPECT_EQ(reply.code, QStringLiteral("-1"));
    EXPECT_FALSE(reply.data.isValid());
    EXPECT_TRUE(tunnel.sent().isEmpty());
}

} // namespace

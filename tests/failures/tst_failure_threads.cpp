// The table of command chains run at once: several plug-ins, each on a tunnel
// that answers on its own thread, each fed by several requester threads,
// while the host's thread does something to the plug-ins. Every request gets
// exactly one reply.

#include "CommandChains.h"
#include "LocalFrameworkTools.h"
#include "PluginRecordingScheduleSettingSrv.h"
#include "ReplyRecorder.h"
#include "RequestSenderInfo.h"

#include <gtest/gtest.h>

#include <deque>
#include <memory>
#include <thread>

namespace {

constexpr int Plugins = 3;
constexpr int Requesters = 6; // two per plug-in
constexpr size_t Rounds = 3;

struct Site
{
    Site() { tunnel.setResponder(serverAnswer); }
    TestTunnel tunnel{TestTunnel::Delivery::OtherThread};
    LocalFrameworkTools tools{&tunnel};
    std::unique_ptr<PluginRecordingScheduleSettingSrv> plugin =
        std::make_unique<PluginRecordingScheduleSettingSrv>();
};

// What the host's thread does while the requests are on their way.
enum class Meanwhile {
    Nothing,
    // Replaces each control while requesters read it and answers of the old
    // one are due: the pointer is read and replaced under one lock, and each
    // request keeps its own control alive.
    Reinitialise,
    // Deletes the plug-ins once the requesters are done, racing the tunnels'
    // threads that deliver the late answers.
    DeletePlugins,
};

class Concurrent : public ::testing::TestWithParam<Meanwhile>
{};

TEST_P(Concurrent, EveryRequestGetsExactlyOneReply)
{
    std::vector<std::unique_ptr<Site>> sites;
    for (int p = 0; p < Plugins; ++p) {
        sites.push_back(std::make_unique<Site>());
        ASSERT_TRUE(sites.back()->plugin->InitialPluginBase(&sites.back()->tools));
    }
    const size_t each = Chains.size() * Rounds;
    std::deque<ReplyRecorder> replies(Requesters * each);
    std::vector<std::thread> requesters;
    for (int r = 0; r < Requesters; ++r) {
        requesters.emplace_back([&, r] {
            for (size_t i = 0; i < each; ++i) {
                const Chain &chain = Chains[i % Chains.size()];
                sites[r % Plugins]->plugin->Request(
                    chain.command, chain.payload, RequestSenderInfo{&replies[r * each + i], {}, {}},
                    replies[r * each + i].callback());
            }
        });
    }
    for (int i = 0; GetParam() == Meanwhile::Reinitialise && i < 20; ++i) {
        for (const auto &site : sites)
            EXPECT_TRUE(site->plugin->InitialPluginBase(&site->tools));
    }
    for (std::thread &requester : requesters)
        requester.join();
    for (const auto &site : sites) {
        if (GetParam() == Meanwhile::DeletePlugins)
            site->plugin.reset();
    }

    for (const ReplyRecorder &reply : replies)
        ASSERT_TRUE(reply.waitFor(1, std::chrono::seconds(120)));
    for (const auto &site : sites)
        site->tunnel.waitIdle();
    for (size_t n = 0; n < replies.size(); ++n) {
        const char *const chain = Chains[n % each % Chains.size()].name;
        ASSERT_EQ(replies[n].count(), 1) << chain;
        const QString code = replies[n].last().code;
        if (GetParam() != Meanwhile::DeletePlugins || code != u"-1") {
            EXPECT_EQ(code, u"0"_s) << chain;
        }
    }
}

const char *const RunNames[] = {"alone", "controls_replaced", "plugins_deleted"};

INSTANTIATE_TEST_SUITE_P(Chains, Concurrent,
                         ::testing::Values(Meanwhile::Nothing, Meanwhile::Reinitialise,
                                           Meanwhile::DeletePlugins),
                         [](const auto &info) { return RunNames[static_cast<int>(info.param)]; });

} // namespace

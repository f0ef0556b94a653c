// The table of command chains, walked: each chain succeeds against the
// scripted server; each step failing in each way ends the request with
// exactly one reply and sends nothing more; and the plug-in deleted while an
// answer is on its way still gives each request its one reply.

#include "CommandChains.h"
#include "LocalFrameworkTools.h"
#include "PluginRecordingScheduleSettingSrv.h"
#include "QtPrinters.h"
#include "ReplyRecorder.h"
#include "RequestSenderInfo.h"

#include <gtest/gtest.h>

#include <memory>
#include <string>

namespace {

enum class Fault { SendRefused, TunnelFailed, ServerRefused, UnreadableAnswer };
const char *const FaultNames[] = {"send_refused", "tunnel_failed", "server_refused", "unreadable"};

// A failed step's answer carries the flag true; good answers carry false.
TestTunnel::Answer failed(Fault fault)
{
    switch (fault) {
    case Fault::TunnelFailed:
        return {false, QString(), QString(), true};
    case Fault::ServerRefused:
        return {true, u"3"_s, QString(), true};
    default:
        return {true, u"0"_s, u"<GetRecTmcardRes><Tmcard><TmcardID>5"_s, true};
    }
}

QStringList commandsUpTo(const Chain &chain, size_t count)
{
    QStringList commands;
    for (size_t i = 0; i < count && i < chain.exchanges.size(); ++i)
        commands << chain.exchanges[i].command;
    return commands;
}

// The plug-in on a scripted tunnel answering as serverAnswer() does, except
// where a test fails one step.
struct Site
{
    explicit Site(TestTunnel::Delivery delivery) : tunnel(delivery)
    {
        EXPECT_TRUE(plugin->InitialPluginBase(&tools));
    }
    void request(const Chain &chain)
    {
        plugin->Request(chain.command, chain.payload, RequestSenderInfo{}, reply.callback());
    }

    ReplyRecorder reply;
    TestTunnel tunnel;
    LocalFrameworkTools tools{&tunnel};
    std::unique_ptr<PluginRecordingScheduleSettingSrv> plugin =
        std::make_unique<PluginRecordingScheduleSettingSrv>();
};

class ChainSucceeds : public ::testing::TestWithParam<Chain>
{};

TEST_P(ChainSucceeds, MakesItsExchangesAndAnswersZero)
{
    Site site(TestTunnel::Delivery::Immediately);
    site.tunnel.setResponder(serverAnswer);
    site.request(GetParam());
    EXPECT_EQ(site.tunnel.commands(), commandsUpTo(GetParam(), SIZE_MAX));
    ASSERT_EQ(site.reply.count(), 1);
    EXPECT_EQ(site.reply.last().code, u"0"_s);
}

INSTANTIATE_TEST_SUITE_P(Chains, ChainSucceeds, ::testing::ValuesIn(Chains),
                         [](const auto &info) { return std::string(info.param.name); });

struct StepRow
{
    Chain chain;
    size_t step;
    Fault fault;
};

void PrintTo(const StepRow &row, std::ostream *os)
{
    *os << row.chain.name << " step " << row.step;
}

std::vector<StepRow> stepRows(bool everyFault)
{
    std::vector<StepRow> rows;
    for (const Chain &chain : Chains) {
        for (size_t step = 0; step < chain.exchanges.size(); ++step) {
            for (Fault fault : {Fault::SendRefused, Fault::TunnelFailed, Fault::ServerRefused,
                                Fault::UnreadableAnswer}) {
                if (fault != Fault::UnreadableAnswer || chain.exchanges[step].readsAnswer)
                    rows.push_back({chain, step, fault});
                if (!everyFault)
                    break;
            }
        }
    }
    return rows;
}

std::string stepRowName(const ::testing::TestParamInfo<StepRow> &info)
{
    return std::string(info.param.chain.name) + "_step" + std::to_string(info.param.step) + "_" +
           FaultNames[static_cast<int>(info.param.fault)];
}

class StepFails : public ::testing::TestWithParam<StepRow>
{};

// Refused sends were once left unanswered (a refused first read among them):
// every refusal now ends its request at once.
TEST_P(StepFails, EndsInOneFailureReplyAndSendsNothingMore)
{
    const StepRow &row = GetParam();
    Site site(TestTunnel::Delivery::Immediately);
    const bool refuse = row.fault == Fault::SendRefused;
    site.tunnel.setRefusal(
        [&, n = size_t(0)](const TestTunnel::Sent &) mutable { return refuse && n++ == row.step; });
    site.tunnel.setResponder([&, n = size_t(0)](const TestTunnel::Sent &sent) mutable {
        return !refuse && n++ == row.step ? failed(row.fault) : serverAnswer(sent);
    });
    site.request(row.chain);
    EXPECT_EQ(site.tunnel.commands(), commandsUpTo(row.chain, row.step + (refuse ? 0 : 1)));
    ASSERT_EQ(site.reply.count(), 1);
    EXPECT_EQ(site.reply.last().flag, !(refuse && row.chain.exchanges[row.step].afterControlRead));
    EXPECT_EQ(site.reply.last().code, u"-1"_s);
}

INSTANTIATE_TEST_SUITE_P(Chains, StepFails, ::testing::ValuesIn(stepRows(true)), stepRowName);

class PluginGone : public ::testing::TestWithParam<StepRow>
{};

// Deleted while the answer to this step is on its way: the late completion
// answers (true, "-1") itself and touches nothing, so nothing more is sent.
TEST_P(PluginGone, LateAnswerEndsTheRequestOnce)
{
    const StepRow &row = GetParam();
    Site site(TestTunnel::Delivery::Held);
    site.tunnel.setResponder(serverAnswer);
    site.request(row.chain);
    for (size_t i = 0; i < row.step; ++i)
        site.tunnel.deliverNext();
    ASSERT_EQ(site.tunnel.pending(), 1);
    site.plugin.reset();
    site.tunnel.deliverAll();
    const bool controlGoesOn = row.step + 1 < row.chain.exchanges.size() &&
                               row.chain.exchanges[row.step + 1].afterControlRead;
    EXPECT_EQ(site.tunnel.commands(), commandsUpTo(row.chain, row.step + (controlGoesOn ? 2 : 1)));
    ASSERT_EQ(site.reply.count(), 1);
    EXPECT_TRUE(site.reply.last().flag);
    EXPECT_EQ(site.reply.last().code, u"-1"_s);
}

INSTANTIATE_TEST_SUITE_P(Chains, PluginGone, ::testing::ValuesIn(stepRows(false)),
                         [](const auto &info) {
                             return std::string(info.param.chain.name) + "_step" +
                                    std::to_string(info.param.step);
                         });

} // namespace

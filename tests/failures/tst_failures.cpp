// Every command as the chain of exchanges it makes with the recording server,
// in one table that drives: the chain succeeding; each step failing in each
// way; the plug-in deleted while a step's answer is on its way; and all of it
// at once on several threads. Whatever happens, a request gets one reply.

#include "LocalFrameworkTools.h"
#include "PluginRecordingScheduleSettingSrv.h"
#include "QtPrinters.h"
#include "ReplyCollector.h"
#include "RequestSenderInfo.h"
#include "TestTunnel.h"

#include <gtest/gtest.h>

#include <atomic>
#include <chrono>
#include <cstdint>
#include <memory>
#include <thread>

using namespace Qt::StringLiterals;

namespace {

// One exchange: the tunnel command; whether the answer's content is read (only
// then can an unreadable answer fail it); and whether the control sends it on
// its own after its read, so that it goes even when the plug-in is gone, and a
// refusal hands on that read's flag.
struct Exchange
{
    QString command;
    bool readsAnswer = false;
    bool afterControlRead = false;
};

const Exchange Read{u"GetRecTmcard"_s, true};
const Exchange Insert{u"InsRecTmcard"_s};
const Exchange InsertNamed{u"InsRecTmcard"_s, true}; // the new identifier is read
const Exchange Update{u"UpdRecTmcard"_s};
const Exchange RemovalUpdate{u"UpdRecTmcard"_s, false, true};
const Exchange Delete{u"DelTmcard"_s};

struct Chain
{
    const char *name;
    QString command;
    QVariantMap payload;
    std::vector<Exchange> exchanges;
};

QVariantList cameras(const QString &name)
{
    return {QVariantMap{{u"Name"_s, name}, {u"GrpID"_s, u"1"_s}}};
}

QVariantList entry(const QString &timecardId, const QString &camera)
{
    return {QVariantMap{{u"scheduleID"_s, timecardId}, {u"camIDList"_s, cameras(camera)}}};
}

const QString Weekdays =
    uR"({"Rectangles":[{"Left":0,"Right":5,"Top":8,"Bottom":18,"RecordingMode":"Continuous"}]})"_s;

// Against the server of serverAnswer(), which has no default continuous and
// no customised time card.
const std::vector<Chain> Chains = {
    {"add_schedule",
     u"AddSchedule"_s,
     {{u"ScheduleName"_s, u"Yard"_s}, {u"timeframes"_s, Weekdays}},
     {InsertNamed}},
    {"update_schedule",
     u"UpdateSchedule"_s,
     {{u"TimeCardID"_s, u"5"_s}, {u"ScheduleName"_s, u"Lobby"_s}, {u"timeframes"_s, Weekdays}},
     {Read, Update}},
    {"del_schedule", u"DelSchedule"_s, {{u"TimeCardID"_s, u"5"_s}}, {Read, Delete}},
    {"cameras_moved",
     u"UpdateCamRecSchedule"_s,
     {{u"scheduleRmvCam"_s, entry(u"5"_s, u"C_1"_s)},
      {u"scheduleAddCam"_s, entry(u"7"_s, u"C_1"_s)}},
     {Read, Update, Read, Update}},
    {"cameras_onto_default_event",
     u"UpdateCamRecSchedule"_s,
     {{u"scheduleAddCam"_s, entry(u"-2"_s, u"C_2"_s)}},
     {Read, Read, Update}},
    {"cameras_onto_missing_default_continuous",
     u"UpdateCamRecSchedule"_s,
     {{u"scheduleAddCam"_s, entry(u"-3"_s, u"C_2"_s)}},
     {Read, Insert}},
    {"continuous_takes_camera_off_lobby",
     u"DefaultContinousSchedule"_s,
     {{u"camRecGroupList"_s, cameras(u"C_1"_s)}},
     {Read, Read, RemovalUpdate, Read, Insert}},
    {"event_onto_existing",
     u"DefaultEventSchedule"_s,
     {{u"camRecGroupList"_s, cameras(u"C_2"_s)}},
     {Read, Update}},
    {"customize_created",
     u"CustomizeSchedule"_s,
     {{u"timeframes"_s, Weekdays}, {u"camRecGroupList"_s, cameras(u"C_2"_s)}},
     {Read, Insert}},
    {"not_recording_clears_every_list",
     u"DefaultNotRecordingSchedule"_s,
     {{u"camRecGroupList"_s, cameras(u"C_1"_s)}},
     {Read, Read, RemovalUpdate, Read, RemovalUpdate, Read, RemovalUpdate}},
    {"schedule_rec_info", u"GetScheduleRecInfo"_s, {}, {Read}},
    {"current_schedule_info", u"GetCurrentScheduleInfo"_s, {}, {Read}},
    {"all_schedule_rec_info", u"GetAllScheduleRecInfo"_s, {}, {Read}},
};

// A server holding the default event time card 4 (C_8), "Lobby" 5 (C_1) and
// "Hall" 7 (C_3). Nothing changes them, so an answer depends on the request
// alone, whichever thread asks.
TestTunnel::Answer serverAnswer(const TestTunnel::Sent &sent)
{
    if (sent.command == u"InsRecTmcard")
        return {true, u"0"_s, u"<InsRecTmcardRes><TmcardID>9</TmcardID></InsRecTmcardRes>"_s};
    if (sent.command != u"GetRecTmcard")
        return {};
    const std::pair<QString, QString> held[] = {
        {u"4"_s, u"<Name>KOLT2 Default Event Recording</Name><Mapping/><CamList><Cam><Name>C_8"_s},
        {u"5"_s, u"<Name>Lobby</Name><Mapping/><CamList><Cam><Name>C_1"_s},
        {u"7"_s, u"<Name>Hall</Name><Mapping/><CamList><Cam><Name>C_3"_s}};
    QString answer = u"<GetRecTmcardRes>"_s;
    for (const auto &[id, card] : held) {
        if (sent.body.contains(u"<TmcardAll>true"_s) || sent.body.contains(u">%1<"_s.arg(id)))
            answer += u"<Tmcard><Revision>2</Revision><TmcardID>%1</TmcardID>%2</Name><GrpID>1"
                      "</GrpID></Cam></CamList></Tmcard>"_s.arg(id, card);
    }
    return {true, u"0"_s, answer + u"</GetRecTmcardRes>"_s};
}

struct Site
{
    explicit Site(TestTunnel::Delivery delivery) : tunnel(delivery)
    {
        tunnel.setResponder(serverAnswer);
        EXPECT_TRUE(plugin->InitialPluginBase(&tools));
    }
    ReplyCollector replies;
    TestTunnel tunnel;
    LocalFrameworkTools tools{&tunnel};
    std::unique_ptr<PluginRecordingScheduleSettingSrv> plugin =
        std::make_unique<PluginRecordingScheduleSettingSrv>();
};

enum class Fault { None, SendRefused, TunnelFailed, ServerRefused, Unreadable, PluginGone };
const char *const FaultNames[] = {"succeeds",       "send_refused", "tunnel_failed",
                                  "server_refused", "unreadable",   "plugin_gone"};

// A failed step's answer carries the flag true; good answers carry false.
TestTunnel::Answer failed(Fault fault)
{
    if (fault == Fault::TunnelFailed)
        return {false, QString(), QString(), true};
    if (fault == Fault::ServerRefused)
        return {true, u"3"_s, QString(), true};
    return {true, u"0"_s, u"<GetRecTmcardRes><Tmcard><TmcardID>5"_s, true};
}

struct Row
{
    Chain chain;
    size_t step; // the failing step; the chain's length when nothing fails
    Fault fault;
};

void PrintTo(const Row &row, std::ostream *os)
{
    *os << row.chain.name << " step " << row.step << " " << FaultNames[int(row.fault)];
}

std::vector<Row> rows()
{
    std::vector<Row> rows;
    for (const Chain &chain : Chains) {
        rows.push_back({chain, chain.exchanges.size(), Fault::None});
        for (size_t step = 0; step < chain.exchanges.size(); ++step) {
            for (int fault = 1; fault <= int(Fault::PluginGone); ++fault) {
                if (Fault(fault) != Fault::Unreadable || chain.exchanges[step].readsAnswer)
                    rows.push_back({chain, step, Fault(fault)});
            }
        }
    }
    return rows;
}

class Walk : public ::testing::TestWithParam<Row>
{};

// Refused sends were once left unanswered, a refused first read among them;
// and answers after the plug-in was deleted reached the deleted object.
TEST_P(Walk, EndsInOneReplyAndSendsNothingAfterTheFailedStep)
{
    const Row &row = GetParam();
    const std::vector<Exchange> &exchanges = row.chain.exchanges;
    const bool refuse = row.fault == Fault::SendRefused;
    const bool answerFails = row.fault >= Fault::TunnelFailed && row.fault <= Fault::Unreadable;
    Site site(TestTunnel::Delivery::Held);
    site.tunnel.setRefusal(
        [&, n = size_t(0)](const auto &) mutable { return n++ == row.step && refuse; });
    site.tunnel.setResponder([&, n = size_t(0)](const TestTunnel::Sent &sent) mutable {
        return n++ == row.step && answerFails ? failed(row.fault) : serverAnswer(sent);
    });
    site.plugin->Request(row.chain.command, row.chain.payload, {}, site.replies.replyFunction(1));
    for (size_t i = 0; site.tunnel.pending() > 0; ++i) {
        if (row.fault == Fault::PluginGone && i == row.step)
            site.plugin.reset();
        site.tunnel.deliverNext();
    }

    // The control still sends its own step after its read when the plug-in is gone.
    size_t sent = std::min(row.step + (refuse ? 0 : 1), exchanges.size());
    if (row.fault == Fault::PluginGone && sent < exchanges.size())
        sent += exchanges[sent].afterControlRead ? 1 : 0;
    QStringList expected;
    for (size_t i = 0; i < sent; ++i)
        expected << exchanges[i].command;
    EXPECT_EQ(site.tunnel.commands(), expected);
    ASSERT_EQ(site.replies.replyCount(1), 1);
    const ReplyCollector::Reply reply = *site.replies.waitForFirst(1, {});
    EXPECT_EQ(reply.code, row.fault == Fault::None ? u"0"_s : u"-1"_s);
    if (row.fault != Fault::None) {
        EXPECT_EQ(reply.flag, !(refuse && exchanges[row.step].afterControlRead));
    }
}

INSTANTIATE_TEST_SUITE_P(Chains, Walk, ::testing::ValuesIn(rows()), [](const auto &info) {
    return std::string(info.param.chain.name) + "_step" + std::to_string(info.param.step) + "_" +
           FaultNames[int(info.param.fault)];
});

// What the host's thread does while every chain runs on several plug-ins,
// each on a tunnel answering on its own thread and fed by two requester
// threads. Every request writes its requester's identity into the control,
// which sends from the tunnels' threads read. Labelled "threads":
// ThreadSanitizer runs these again.
enum class Meanwhile {
    Nothing,
    // The control pointer is read and replaced under one lock, and each
    // request keeps its own control alive until its answers are in.
    ReplaceControls,
    // Deletion races the tunnels' threads delivering late answers.
    DeletePlugins,
};

const char *const RunNames[] = {"alone", "controls_replaced", "plugins_deleted"};

void PrintTo(Meanwhile meanwhile, std::ostream *os)
{
    *os << RunNames[int(meanwhile)];
}

class Concurrent : public ::testing::TestWithParam<Meanwhile>
{};

TEST_P(Concurrent, EveryRequestGetsExactlyOneReply)
{
    constexpr int Plugins = 3;
    constexpr int Requesters = 2 * Plugins;
    const size_t each = Chains.size() * 3;
    std::vector<std::unique_ptr<Site>> sites;
    for (int p = 0; p < Plugins; ++p)
        sites.push_back(std::make_unique<Site>(TestTunnel::Delivery::OtherThread));
    ReplyCollector replies;
    std::vector<std::thread> requesters;
    for (int r = 0; r < Requesters; ++r) {
        requesters.emplace_back([&, r] {
            for (size_t i = 0; i < each; ++i) {
                const Chain &chain = Chains[i % Chains.size()];
                // Each request its own requester: the control's identity keeps changing.
                const int n = int(r * each + i);
                sites[r % Plugins]->plugin->Request(
                    chain.command, chain.payload,
                    RequestSenderInfo{reinterpret_cast<void *>(std::uintptr_t(n) + 1), {}, {}},
                    replies.replyFunction(n));
            }
        });
    }
    for (int i = 0; GetParam() == Meanwhile::ReplaceControls && i < 20; ++i) {
        for (const auto &site : sites)
            EXPECT_TRUE(site->plugin->InitialPluginBase(&site->tools));
    }
    for (std::thread &requester : requesters)
        requester.join();
    for (const auto &site : sites) {
        if (GetParam() == Meanwhile::DeletePlugins)
            site->plugin.reset();
    }

    for (size_t n = 0; n < Requesters * each; ++n)
        ASSERT_TRUE(replies.waitForFirst(int(n), std::chrono::seconds(120)));
    for (const auto &site : sites)
        site->tunnel.waitIdle();
    for (size_t n = 0; n < Requesters * each; ++n) {
        const char *const chain = Chains[n % each % Chains.size()].name;
        ASSERT_EQ(replies.replyCount(int(n)), 1) << chain;
        const QString code = replies.waitForFirst(int(n), {})->code;
        if (GetParam() != Meanwhile::DeletePlugins || code != u"-1") {
            EXPECT_EQ(code, u"0"_s) << chain;
        }
    }
}

INSTANTIATE_TEST_SUITE_P(Chains, Concurrent,
                         ::testing::Values(Meanwhile::Nothing, Meanwhile::ReplaceControls,
                                           Meanwhile::DeletePlugins),
                         [](const auto &info) { return RunNames[int(info.param)]; });

// Hosts that act inside their replies, which come on 1 or 2 threads taking the
// held answers in turn (the test's own first); requests 1 and 2 ask
// "GetAllScheduleRecInfo" before any answer. A wait that would deadlock gives
// up after 5 s and fails the row. Labelled "threads".
struct Host
{
    Site site{TestTunnel::Delivery::Held};
    void (*inside)(Host &, int request) = nullptr;
    std::thread helper;
    std::atomic<int> counted = 0;
    const std::chrono::steady_clock::time_point deadline =
        std::chrono::steady_clock::now() + std::chrono::seconds(5);

    void ask(int n)
    {
        site.plugin->Request(u"GetAllScheduleRecInfo"_s, {}, {},
                             [this, n, record = site.replies.replyFunction(n)](auto... reply) {
                                 record(reply...);
                                 inside(*this, n);
                             });
    }
    // Counts in and waits until another thread has counted in too.
    bool joinedByAnother()
    {
        for (++counted; counted < 2 && std::chrono::steady_clock::now() < deadline;)
            std::this_thread::yield();
        return counted >= 2;
    }
};

struct HostRow
{
    const char *name;
    int tunnelThreads;
    const char *codes; // the replies of requests 1, 2, ...
    void (*inside)(Host &, int request);
    friend void PrintTo(const HostRow &row, std::ostream *os) { *os << row.name; }
};

const HostRow HostRows[] = {
    {"reply_asks_again_from_inside_the_reply", 1, "0 0 0",
     [](Host &host, int n) { n == 1 ? host.ask(3) : void(); }},
    {"reply_deletes_the_plugin_and_the_answer_after_it_comes_late", 1, "0 -1",
     [](Host &host, int n) { n == 1 ? host.site.plugin.reset() : void(); }},
    {"reply_waits_until_a_request_on_another_thread_has_returned", 1, "0 0 0",
     [](Host &host, int n) {
         if (n == 1)
             host.helper = std::thread([&host] { host.ask(3), ++host.counted; });
         EXPECT_TRUE(n != 1 || host.joinedByAnother()) << "Request blocked by the reply";
     }},
    {"answers_on_two_threads_run_at_once_and_one_reply_deletes_the_plugin", 2, "0 0",
     [](Host &host, int n) {
         EXPECT_TRUE(host.joinedByAnother()) << "answers one at a time";
         n == 1 ? host.site.plugin.reset() : void();
     }},
};

class HostReplies : public ::testing::TestWithParam<HostRow>
{};

TEST_P(HostReplies, NoDeadlockAndOneReplyEach)
{
    Host host;
    host.inside = GetParam().inside;
    host.ask(1), host.ask(2);
    std::thread second(
        [&] { GetParam().tunnelThreads == 2 ? host.site.tunnel.deliverAll() : void(); });
    host.site.tunnel.deliverAll();
    second.join();
    if (host.helper.joinable())
        host.helper.join();
    host.site.tunnel.deliverAll(); // what was sent after the tunnel's threads ran dry
    const QStringList codes = QString::fromLatin1(GetParam().codes).split(u' ');
    for (int n = 1; n <= codes.size(); ++n) {
        ASSERT_EQ(host.site.replies.replyCount(n), 1) << "request " << n;
        EXPECT_EQ(host.site.replies.waitForFirst(n, {})->code, codes[n - 1]) << "request " << n;
    }
}

INSTANTIATE_TEST_SUITE_P(Host, HostReplies, ::testing::ValuesIn(HostRows),
                         [](const auto &info) { return std::string(info.param.name); });

} // namespace

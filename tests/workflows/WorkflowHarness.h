#pragma once

#include "FakeRecordingServer.h"
#include "IFrameworkTools.h"
#include "PluginRecordingScheduleSettingSrv.h"
#include "ReplyRecorder.h"
#include "TestTunnel.h"

#include <QVariantMap>

#include <memory>
#include <ostream>
#include <string>
#include <vector>

// Asserts that exactly one reply arrived, and what it says.
void ExpectOneReply(const ReplyRecorder &log, bool flag, const QString &code,
                    const QVariant &data = QVariant());

// One message as the tunnel took it.
struct Message
{
    std::string command;
    std::string body;
    bool operator==(const Message &other) const
    {
        return command == other.command && body == other.body;
    }
};
void PrintTo(const Message &message, std::ostream *os);
Message msg(const QString &command, const QString &body);

// The plug-in initialised with the real control on a test tunnel whose
// answers come from a FakeRecordingServer.
class WorkflowHarness
{
public:
    explicit WorkflowHarness(TestTunnel::Delivery delivery = TestTunnel::Delivery::Immediately);
    ~WorkflowHarness();

    void request(const QString &command, const QVariant &payload);
    std::vector<Message> messages() const;

    // Declared so that the tunnel, which answers what it still holds when it
    // goes, goes before the server and the replies.
    FakeRecordingServer server;
    ReplyRecorder replies;
    TestTunnel tunnel;
    std::unique_ptr<PluginRecordingScheduleSettingSrv> plugin;

private:
    struct Framework final : IFrameworkTools
    {
        IKoltTunnelClient *tunnel = nullptr;
        IKoltTunnelClient *GetTunnelClient() override { return tunnel; }
    };
    Framework m_framework;
};

// Texts of requests as the control composes them.
namespace Expect {
QString readAll();
QString readOne(int id);
// A camera list element of requests ("RecGrpID"); empty for no cameras.
QString cameraList(const QList<FakeRecordingServer::Camera> &cameras);
QString insert(const QString &name, const QString &mapping,
               const QList<FakeRecordingServer::Camera> &cameras);
QString update(int revision, int id, const QString &name, const QString &mapping,
               const QList<FakeRecordingServer::Camera> &cameras);
// The time card as read, sent back with the given cameras.
QString updateCameras(FakeRecordingServer::Timecard timecard,
                      const QList<FakeRecordingServer::Camera> &cameras);
} // namespace Expect

// Camera entries as clients send them.
QVariantList cameraEntries(const QList<FakeRecordingServer::Camera> &cameras);

// A schedule of one continuous time frame, Monday to Friday, 08:00 to 18:00,
// and the mapping the control composes from it.
inline const QString LobbyDocument = QStringLiteral(
    R"({"Rectangles":[{"Left":0,"Right":5,"Top":8,"Bottom":18,"RecordingMode":"Continuous"}]})");
inline const QString LobbyMapping = QStringLiteral(
    R"(<Ele><Frame><Name>Customize time frame</Name><DLMod>SingleDay</DLMod><RepeatMod>Weekly</RepeatMod>)"
    R"(<DayList><Ele B="1.0"/><Ele B="2.0"/><Ele B="3.0"/><Ele B="4.0"/><Ele B="5.0"/></DayList>)"
    R"(<Intervals><Ele B="28800" E="64800"/></Intervals><Holiday>false</Holiday><Range><Period>)"
    R"(<TmS>2016-03-29 00:00:00.000</TmS><TmE>2035-01-01 00:00:00.000</TmE></Period><End>false</End>)"
    R"(</Range><RepeatFreq>1</RepeatFreq></Frame><RecMode>Continuous</RecMode></Ele>)");

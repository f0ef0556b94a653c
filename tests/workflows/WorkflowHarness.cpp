#include "WorkflowHarness.h"

#include "RequestSenderInfo.h"

#include <gtest/gtest.h>

void ExpectOneReply(const ReplyRecorder &log, bool flag, const QString &code, const QVariant &data)
{
    const auto replies = log.replies();
    ASSERT_EQ(replies.size(), 1u);
    EXPECT_EQ(replies[0].flag, flag);
    EXPECT_EQ(replies[0].code, code);
    EXPECT_TRUE(replies[0].text.isEmpty());
    EXPECT_EQ(replies[0].data, data);
}

void PrintTo(const Message &message, std::ostream *os)
{
    *os << message.command << ": " << message.body;
}

Message msg(const QString &command, const QString &body)
{
    return Message{command.toStdString(), body.toStdString()};
}

WorkflowHarness::WorkflowHarness(TestTunnel::Delivery delivery)
    : tunnel(delivery), plugin(std::make_unique<PluginRecordingScheduleSettingSrv>())
{
    tunnel.setResponder([this](const TestTunnel::Sent &sent) { return server.answer(sent); });
    m_framework.tunnel = &tunnel;
    plugin->InitialPluginBase(&m_framework);
}

WorkflowHarness::~WorkflowHarness()
{
    // The plug-in goes before the tunnel: answers still held are then
    // delivered to a plug-in that is gone, and answer on their own.
    plugin.reset();
}

void WorkflowHarness::request(const QString &command, const QVariant &payload)
{
    plugin->Request(command, payload, RequestSenderInfo{}, replies.callback());
}

std::vector<Message> WorkflowHarness::messages() const
{
    std::vector<Message> result;
    for (const TestTunnel::Sent &sent : tunnel.sent())
        result.push_back(msg(sent.command, sent.body));
    return result;
}

namespace Expect {

QString readAll()
{
    return QStringLiteral("<GetRecTmcard><TmcardAll>true</TmcardAll></GetRecTmcard>");
}

QString readOne(int id)
{
    return QStringLiteral("<GetRecTmcard><TmcardID>%1</TmcardID></GetRecTmcard>").arg(id);
}

QString cameraList(const QList<FakeRecordingServer::Camera> &cameras)
{
    QString entries;
    for (const FakeRecordingServer::Camera &camera : cameras)
        entries += QStringLiteral("<Cam><Name>%1</Name><RecGrpID>%2</RecGrpID></Cam>")
                       .arg(camera.name, camera.group);
    return entries.isEmpty() ? QString()
                             : QStringLiteral("<CamList>") + entries + QStringLiteral("</CamList>");
}

QString insert(const QString &name, const QString &mapping,
               const QList<FakeRecordingServer::Camera> &cameras)
{
    return QStringLiteral("<InsRecTmcard><Tmcard><Revision>0</Revision><TmcardID>0</TmcardID>"
                          "<Name>") +
           name + QStringLiteral("</Name><Mapping>") + mapping + QStringLiteral("</Mapping>") +
           cameraList(cameras) + QStringLiteral("</Tmcard></InsRecTmcard>");
}

QString update(int revision, int id, const QString &name, const QString &mapping,
               const QList<FakeRecordingServer::Camera> &cameras)
{
    return QStringLiteral("<UpdRecTmcard><Tmcard><Revision>%1</Revision><TmcardID>%2</TmcardID>"
                          "<Name>")
               .arg(revision)
               .arg(id) +
           name + QStringLiteral("</Name><Mapping>") + mapping + QStringLiteral("</Mapping>") +
           cameraList(cameras) + QStringLiteral("</Tmcard></UpdRecTmcard>");
}

QString updateCameras(FakeRecordingServer::Timecard timecard,
                      const QList<FakeRecordingServer::Camera> &cameras)
{
    timecard.cameras = cameras;
    return QStringLiteral("<UpdRecTmcard>") +
           FakeRecordingServer::timecardXml(timecard, QStringLiteral("RecGrpID")) +
           QStringLiteral("</UpdRecTmcard>");
}

} // namespace Expect

QVariantList cameraEntries(const QList<FakeRecordingServer::Camera> &cameras)
{
    QVariantList entries;
    for (const FakeRecordingServer::Camera &camera : cameras)
        entries << QVariantMap{{QStringLiteral("Name"), camera.name},
                               {QStringLiteral("GrpID"), camera.group}};
    return entries;
}

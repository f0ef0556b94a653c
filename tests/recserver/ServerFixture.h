#pragma once

#include "RecordingServer.h"

#include <QRegularExpression>
#include <QString>
#include <QTemporaryDir>

#include <gtest/gtest.h>

#include <memory>

// A server on a database file of its own, fresh for every test.
class ServerFixture : public ::testing::Test
{
protected:
    void SetUp() override
    {
        ASSERT_TRUE(m_dir.isValid());
        reopen();
    }

    QString path() const { return m_dir.filePath(QStringLiteral("recserver.db")); }

    void reopen(AnswerLayout layout = AnswerLayout::Compact)
    {
        server.reset();
        server = std::make_unique<RecordingServer>(path(), layout);
        QString error;
        ASSERT_TRUE(server->open(&error)) << error.toStdString();
    }

    void close() { server.reset(); }

    ServerAnswer ask(const QString &command, const QString &body)
    {
        return server->handle(command, body);
    }

    QString readOne(qint64 id)
    {
        return ask(QStringLiteral("GetRecTmcard"),
                   QStringLiteral("<GetRecTmcard><TmcardID>%1</TmcardID></GetRecTmcard>").arg(id))
            .content;
    }

    QTemporaryDir m_dir;
    std::unique_ptr<RecordingServer> server;
};

inline QString insertBody(const QString &name, const QString &mapping, const QString &cameras = {})
{
    return QStringLiteral("<InsRecTmcard><Tmcard><Revision>0</Revision><TmcardID>0</TmcardID>"
                          "<Name>%1</Name><Mapping>%2</Mapping>%3</Tmcard></InsRecTmcard>")
        .arg(name, mapping, cameras);
}

inline QString updateBody(qint64 revision, qint64 id, const QString &name, const QString &mapping,
                          const QString &cameras = {})
{
    return QStringLiteral("<UpdRecTmcard><Tmcard><Revision>%1</Revision><TmcardID>%2</TmcardID>"
                          "<Name>%3</Name><Mapping>%4</Mapping>%5</Tmcard></UpdRecTmcard>")
        .arg(revision)
        .arg(id)
        .arg(name, mapping, cameras);
}

inline QString cameraList(std::initializer_list<std::pair<const char *, int>> cameras,
                          const char *groupTag = "RecGrpID")
{
    QString list;
    for (const auto &camera : cameras)
        list += QStringLiteral("<Cam><Name>%1</Name><%3>%2</%3></Cam>")
                    .arg(QLatin1String(camera.first))
                    .arg(camera.second)
                    .arg(QLatin1String(groupTag));
    return QStringLiteral("<CamList>%1</CamList>").arg(list);
}

// The time frame the plug-in composes for days 1 to 5, 08:00 to 18:00.
inline QString weekdayMapping()
{
    return QStringLiteral(
        "<Ele><Frame><Name>Customize time frame</Name><DLMod>SingleDay</DLMod>"
        "<RepeatMod>Weekly</RepeatMod><DayList><Ele B=\"1.0\"/><Ele B=\"2.0\"/><Ele B=\"3.0\"/>"
        "<Ele B=\"4.0\"/><Ele B=\"5.0\"/></DayList><Intervals><Ele B=\"28800\" E=\"64800\"/>"
        "</Intervals><Holiday>false</Holiday><Range><Period><TmS>2016-03-29 00:00:00.000</TmS>"
        "<TmE>2035-01-01 00:00:00.000</TmE></Period><End>false</End></Range>"
        "<RepeatFreq>1</RepeatFreq></Frame><RecMode>Continuous</RecMode></Ele>");
}

inline QString compactOf(QString text)
{
    static const QRegularExpression lineEnds(QStringLiteral("\r?\n *"));
    return text.remove(lineEnds);
}

inline void PrintTo(const QString &text, std::ostream *os)
{
    *os << '"' << text.toStdString() << '"';
}

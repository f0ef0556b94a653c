#pragma once

#include "FakeControl.h"
#include "PluginRecordingScheduleSettingSrv.h"
#include "ReplyRecorder.h"
#include "RequestSenderInfo.h"
#include "TimecardTrees.h"

#include <QJsonDocument>
#include <QJsonObject>

// Runs a command through the plug-in's Request against a control that hands
// back the given time cards at once, and returns the one reply.
class QueryRunner
{
public:
    QueryRunner()
    {
        control = QSharedPointer<FakeControl>::create();
        plugin.SetRecordingSettingControl(control);
    }

    ReplyRecorder::Reply run(const QString &command, const QList<QVariant> &timecards,
                             bool ok = true, bool flag = false)
    {
        control->setAnswer({ok, flag, timecards, QString()});
        ReplyRecorder reply;
        plugin.Request(command, QVariant(), RequestSenderInfo{}, reply.callback());
        replies = reply.count();
        return reply.last();
    }

    // The schedule content document that "GetAllScheduleRecInfo" gives for a
    // time card whose mapping holds the given "Ele" value.
    QString document(const QVariant &mappingEle)
    {
        const ReplyRecorder::Reply reply =
            run(QStringLiteral("GetAllScheduleRecInfo"),
                {TimecardTrees::timecard(QStringLiteral("5"),
                                         QStringLiteral("KOLT2 Customize Recording"), mappingEle)});
        return reply.data.toList()
            .value(0)
            .toMap()
            .value(QStringLiteral("CustomizeContent"))
            .toString();
    }

    QSharedPointer<FakeControl> control;
    PluginRecordingScheduleSettingSrv plugin;
    int replies = 0;
};

// The document parsed as JSON; null when it is not a JSON object.
inline QJsonObject parsedDocument(const QString &document)
{
    QJsonParseError error{};
    const QJsonDocument json = QJsonDocument::fromJson(document.toUtf8(), &error);
    return error.error == QJsonParseError::NoError && json.isObject() ? json.object()
                                                                      : QJsonObject();
}

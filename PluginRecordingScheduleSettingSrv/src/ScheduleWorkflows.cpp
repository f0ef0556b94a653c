// "AddSchedule", "UpdateSchedule" and "DelSchedule": one or two exchanges with
// the recording server, then exactly one reply. Everything a later step needs
// travels in its completion; the plug-in keeps nothing.

#include "PluginRecordingScheduleSettingSrv.h"

#include "RecordingScheduleSettingConstants.h"
#include "TraceLog.h"

#include <QJsonDocument>

using namespace PluginRecordingScheduleSettingCommon;

bool PluginRecordingScheduleSettingSrv::ReadTimecardId(const QString &text, int *timecardId)
{
    const int first = text.startsWith(QLatin1Char('-')) ? 1 : 0;
    if (text.size() == first)
        return false;
    for (int i = first; i < text.size(); ++i) {
        const char16_t c = text.at(i).unicode();
        if (c < u'0' || c > u'9')
            return false;
    }
    bool inRange = false;
    const int value = text.toInt(&inRange, 10);
    if (!inRange)
        return false;
    *timecardId = value;
    return true;
}

bool PluginRecordingScheduleSettingSrv::TimeframesReadable(const QString &content)
{
    if (QJsonDocument::fromJson(content.toUtf8()).isObject())
        return true;
    TRACE_ERROR("Time frames parse error. %s", content.toLocal8Bit().constData());
    return false;
}

ControlResultCallback
PluginRecordingScheduleSettingSrv::ReplyCompletion(const ResponseCallback &reply)
{
    return Guard(reply, [this, reply](bool ok, bool flag) { HdlrReqCallback(ok, flag, reply); });
}

void PluginRecordingScheduleSettingSrv::HandleAddSchedule(const QVariant &payload,
                                                          ResponseCallback reply)
{
    const VariantMap map = payload.toMap();
    const QString name = map.value(PayloadKey::ScheduleName).toString();
    const QString content = map.value(PayloadKey::Timeframes).toString();

    const QSharedPointer<IRecordingSettingControl> control = Control();
    const bool sent =
        control && control->AddSchedule(
                       name, content,
                       Guard(reply, [this, reply](bool ok, bool flag, const QString &timecardId) {
                           HdlrAddScheduleCallback(ok, flag, timecardId, reply);
                       }));
    if (!sent)
        ReplyFailure(reply);
}

void PluginRecordingScheduleSettingSrv::HdlrAddScheduleCallback(bool ok, bool flag,
                                                                const QString &timecardId,
                                                                ResponseCallback reply)
{
    if (reply)
        reply(flag, ok ? ResultCode::Success : ResultCode::Failure, QString(),
              QVariant(timecardId));
}

void PluginRecordingScheduleSettingSrv::HandleUpdateSchedule(const QVariant &payload,
                                                             ResponseCallback reply)
{
    const VariantMap map = payload.toMap();
    const QString timecardIdText = map.value(PayloadKey::TimeCardID).toString();
    const QString name = map.value(PayloadKey::ScheduleName).toString();
    const QString content = map.value(PayloadKey::Timeframes).toString();
    const QList<QVariant> cameras = map.value(PayloadKey::CamRecGroupList).toList();

    // A text that is no number would read time card 0 and update whatever the
    // server keeps there; an unreadable document would wipe the time frames.
    int timecardId = 0;
    if (!ReadTimecardId(timecardIdText, &timecardId) || !TimeframesReadable(content)) {
        ReplyFailure(reply);
        return;
    }

    const QSharedPointer<IRecordingSettingControl> control = Control();
    const bool sent =
        control &&
        control->GetScheduleTimecardInfoById(
            timecardId,
            Guard(reply, [this, timecardIdText, name, content, cameras,
                          reply](bool ok, bool, const QList<QVariant> &timecards, const QString &) {
                if (!ok || timecards.isEmpty()) {
                    ReplyFailure(reply);
                    return;
                }
                // The update carries the revision just read, so that the server
                // can refuse it when the time card has changed since.
                const QString revision =
                    timecards.first().toMap().value(TimecardKey::Revision).toString();
                const QSharedPointer<IRecordingSettingControl> control = Control();
                const bool sent =
                    control && control->UpdateSchedule(revision, timecardIdText, name, content,
                                                       cameras, ReplyCompletion(reply));
                if (!sent)
                    ReplyFailure(reply);
            }));
    if (!sent)
        ReplyFailure(reply);
}

void PluginRecordingScheduleSettingSrv::HandleDeleteSchedule(bool ok, bool flag,
                                                             const QList<QVariant> &timecards,
                                                             QString timecardId,
                                                             ResponseCallback reply)
{
    if (!ok) {
        TRACE_ERROR("Fail to get all schedule time card.");
        HdlrReqCallback(false, flag, reply);
        return;
    }

    // Identifiers are compared as the client wrote them: "07" is not time card 7.
    VariantMap timecard;
    for (const QVariant &entry : timecards) {
        const VariantMap map = entry.toMap();
        if (map.value(TimecardKey::TmcardID).toString() == timecardId) {
            timecard.insert(TimecardKey::Revision, map.value(TimecardKey::Revision));
            timecard.insert(TimecardKey::TmcardID, QVariant(timecardId));
            break;
        }
    }

    const QSharedPointer<IRecordingSettingControl> control = Control();
    const bool sent =
        !timecard.isEmpty() && control && control->DeleteSchedule(timecard, ReplyCompletion(reply));
    if (!sent)
        ReplyFailure(reply);
}

void PluginRecordingScheduleSettingSrv::HdlrReqCallback(bool ok, bool flag, ResponseCallback reply)
{
    if (reply)
        reply(flag, ok ? ResultCode::Success : ResultCode::Failure, QString(), QVariant());
}

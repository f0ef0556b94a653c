// "AddSchedule", "UpdateSchedule" and "DelSchedule": one or two exchanges with
// the recording server, then exactly one reply. Everything a later step needs
// travels in its completion; the plug-in keeps nothing.

#include "PluginRecordingScheduleSettingSrv.h"

#include "ClientInput.h"
#include "RecordingScheduleSettingConstants.h"
#include "TraceLog.h"

using namespace PluginRecordingScheduleSettingCommon;

void PluginRecordingScheduleSettingSrv::HandleAddSchedule(const QVariant &payload,
                                                          ResponseCallback reply)
{
    const QVariantMap map = payload.toMap();
    const QString content = map.value(PayloadKey::Timeframes).toString();
    // Without a name or a readable document the server would store a
    // nameless time card with no time frames. A document without rectangles
    // stays a schedule of its own: an empty one.
    if (!map.contains(PayloadKey::ScheduleName) || !ClientInput::timeframes(content)) {
        replyFailure(reply);
        return;
    }
    const QSharedPointer<IRecordingSettingControl> control = m_lifetime.control();
    const bool sent =
        control &&
        control->AddSchedule(
            map.value(PayloadKey::ScheduleName).toString(), content,
            m_lifetime.bind(reply, [this, reply](bool ok, bool flag, const QString &timecardId) {
                HdlrAddScheduleCallback(ok, flag, timecardId, reply);
            }));
    if (!sent)
        replyFailure(reply);
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
    const QVariantMap map = payload.toMap();
    const QString timecardIdText = map.value(PayloadKey::TimeCardID).toString();
    const QString content = map.value(PayloadKey::Timeframes).toString();
    // A text that is no number would read time card 0 and update whatever the
    // server keeps there; an unreadable document would wipe the time frames.
    const std::optional<int> timecardId = ClientInput::timecardId(timecardIdText);
    if (!timecardId || !ClientInput::timeframes(content)) {
        replyFailure(reply);
        return;
    }

    // The update carries the revision just read, so that the server can
    // refuse it when the time card has changed since. The camera list goes as
    // the client sent it: it states the whole list the time card is to hold.
    const auto update = [this, timecardIdText, content, reply,
                         name = map.value(PayloadKey::ScheduleName).toString(),
                         cameras = map.value(PayloadKey::CamRecGroupList).toList()](
                            bool ok, bool, const QList<QVariant> &timecards, const QString &) {
        const QSharedPointer<IRecordingSettingControl> control = m_lifetime.control();
        const bool sent =
            ok && !timecards.isEmpty() && control &&
            control->UpdateSchedule(
                timecards.first().toMap().value(TimecardKey::Revision).toString(), timecardIdText,
                name, content, cameras, m_lifetime.bind(reply, [this, reply](bool ok, bool flag) {
                    HdlrReqCallback(ok, flag, reply);
                }));
        if (!sent)
            replyFailure(reply);
    };
    const QSharedPointer<IRecordingSettingControl> control = m_lifetime.control();
    if (!control ||
        !control->GetScheduleTimecardInfoById(*timecardId, m_lifetime.bind(reply, update)))
        replyFailure(reply);
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
    QVariantMap timecard;
    for (const QVariant &entry : timecards) {
        const QVariantMap map = entry.toMap();
        if (map.value(TimecardKey::TmcardID).toString() == timecardId) {
            timecard.insert(TimecardKey::Revision, map.value(TimecardKey::Revision));
            timecard.insert(TimecardKey::TmcardID, QVariant(timecardId));
            break;
        }
    }

    const QSharedPointer<IRecordingSettingControl> control = m_lifetime.control();
    const bool sent =
        !timecard.isEmpty() && control &&
        control->DeleteSchedule(timecard, m_lifetime.bind(reply, [this, reply](bool ok, bool flag) {
            HdlrReqCallback(ok, flag, reply);
        }));
    if (!sent)
        replyFailure(reply);
}

void PluginRecordingScheduleSettingSrv::HdlrReqCallback(bool ok, bool flag, ResponseCallback reply)
{
    if (reply)
        reply(flag, ok ? ResultCode::Success : ResultCode::Failure, QString(), QVariant());
}

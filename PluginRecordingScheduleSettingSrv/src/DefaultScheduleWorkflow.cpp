// "DefaultContinousSchedule", "DefaultEventSchedule", "CustomizeSchedule" and
// "DefaultNotRecordingSchedule": a group of cameras goes onto one fixed time
// card, or off every time card. Each command is a chain that starts from the
// dispatcher's read of all time cards and ends in exactly one reply; time
// cards cleared before a failure stay cleared.

#include "PluginRecordingScheduleSettingSrv.h"

#include "CameraList.h"
#include "FixedSchedule.h"
#include "RecordingScheduleSettingConstants.h"
#include "TraceLog.h"

using namespace PluginRecordingScheduleSettingCommon;

namespace {

// The time cards other than the fixed one (its summary) that hold any of
// the cameras, matched by name.
QList<int> timecardsHoldingAny(const QList<QVariant> &timecards, const QList<QVariant> &cameras,
                               const QVariantMap &fixedSummary)
{
    QSet<QString> names = CameraList(cameras).names();
    names.remove(QString());
    QList<int> holders;
    if (names.isEmpty())
        return holders;
    for (const QVariant &entry : timecards) {
        const QVariantMap timecard = entry.toMap();
        const QString id = timecard.value(TimecardKey::TmcardID).toString();
        if (fixedSummary.contains(TimecardKey::TmcardID) &&
            id == fixedSummary.value(TimecardKey::TmcardID).toString())
            continue;
        if (CameraList::onTimecard(timecard).names().intersects(names))
            holders.append(id.toInt());
    }
    return holders;
}

// The cameras onto the fixed time card, created when the server has none;
// done answers the request, or the request is answered at once when the
// control refuses to send.
void putOnFixedTimecard(const QSharedPointer<IRecordingSettingControl> &control,
                        const FixedSchedule *fixed, const QVariantMap &summary,
                        const QString &content, const QList<QVariant> &cameras,
                        const ResponseCallback &reply, ControlResultCallback done)
{
    if (!control || !fixed || !fixed->put(*control, summary, content, cameras, std::move(done)))
        replyFailure(reply);
}

} // namespace

void PluginRecordingScheduleSettingSrv::UpdateTimecardCamList(
    bool ok, bool flag, const QList<QVariant> &timecards, const QString &type,
    const QString &content, const QList<QVariant> &cameras, ResponseCallback reply)
{
    if (!ok) {
        TRACE_ERROR("Fail to get time card list.");
        HdlrReqCallback(false, flag, reply);
        return;
    }
    const FixedSchedule *fixed = FixedSchedule::byWord(type);
    if (!fixed || !fixed->hasTimecard()) {
        TRACE_ERROR("%s, Invalid schedule recording type.",
                    "PluginRecordingScheduleSettingSrv::UpdateTimecardCamList");
        HdlrReqCallback(false, flag, reply);
        return;
    }

    const QVariantMap summary = GetTimecardInfo(timecards, type);
    // Left on another time card, a camera would go on recording by it too,
    // and the queries would report its schedule as "other".
    const QList<int> holders = timecardsHoldingAny(timecards, cameras, summary);
    if (!holders.isEmpty()) {
        HandleRemoveTimecardCamListRes(true, flag, type, content, cameras, holders, reply);
        return;
    }
    putOnFixedTimecard(m_lifetime.control(), fixed, summary, content, cameras, reply,
                       m_lifetime.bind(reply, [this, reply](bool ok, bool flag) {
                           HdlrReqCallback(ok, flag, reply);
                       }));
}

QVariantMap PluginRecordingScheduleSettingSrv::GetTimecardInfo(const QList<QVariant> &timecards,
                                                               const QString &type)
{
    const FixedSchedule *fixed = FixedSchedule::byWord(type);
    const QSharedPointer<IRecordingSettingControl> control = m_lifetime.control();
    return fixed && control ? fixed->summaryIn(*control, timecards) : QVariantMap();
}

void PluginRecordingScheduleSettingSrv::HandleGetAllTimecardRes(
    bool ok, bool flag, const QList<QVariant> &timecards, const QString &, const QString &type,
    const QString &content, const QList<QVariant> &cameras, ResponseCallback reply)
{
    if (!ok) {
        TRACE_ERROR("Fail to get all schedule time card.");
        HdlrReqCallback(false, flag, reply);
        return;
    }
    HandleRemoveTimecardCamListRes(true, flag, type, content, cameras,
                                   TimecardIDThatNeedsToRemoveCameraList(timecards), reply);
}

void PluginRecordingScheduleSettingSrv::HandleRemoveTimecardCamListRes(
    bool ok, bool flag, QString type, const QString &content, QList<QVariant> cameras,
    QList<int> timecardIds, ResponseCallback reply)
{
    if (!ok) {
        TRACE_ERROR("Fail to remove camera list of default time card.");
        HdlrReqCallback(false, flag, reply);
        return;
    }
    const QSharedPointer<IRecordingSettingControl> control = m_lifetime.control();
    if (!timecardIds.isEmpty()) {
        const int timecardId = timecardIds.takeFirst();
        const bool sent =
            control && control->RemoveTimecardCameraList(
                           timecardId, cameras,
                           m_lifetime.bind(reply, [this, type, content, cameras, timecardIds,
                                                   reply](bool ok, bool flag) {
                               HandleRemoveTimecardCamListRes(ok, flag, type, content, cameras,
                                                              timecardIds, reply);
                           }));
        if (!sent)
            replyFailure(reply);
        return;
    }
    const FixedSchedule *fixed = FixedSchedule::byWord(type);
    if (fixed && !fixed->hasTimecard()) {
        HdlrReqCallback(true, flag, reply);
        return;
    }

    // The cameras are off every other time card; what the fixed one holds now
    // is read afresh, since the removals changed the server. This second pass
    // removes nothing more, so two commands moving the same camera cannot
    // chase each other for ever.
    const auto put = [this, fixed, type, content, cameras, reply](
                         bool ok, bool flag, const QList<QVariant> &timecards, const QString &) {
        if (!ok) {
            TRACE_ERROR("Fail to get time card list.");
            HdlrReqCallback(false, flag, reply);
            return;
        }
        putOnFixedTimecard(m_lifetime.control(), fixed, GetTimecardInfo(timecards, type), content,
                           cameras, reply,
                           m_lifetime.bind(reply, [this, reply](bool ok, bool flag) {
                               HdlrReqCallback(ok, flag, reply);
                           }));
    };
    if (!control || !control->GetAllScheduleTimecardInfo(m_lifetime.bind(reply, put)))
        replyFailure(reply);
}

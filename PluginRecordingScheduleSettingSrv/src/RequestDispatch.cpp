// The one door through which clients' commands reach the plug-in.

#include "PluginRecordingScheduleSettingSrv.h"

#include "RecordingScheduleSettingConstants.h"
#include "RequestSenderInfo.h"
#include "TraceLog.h"

using namespace PluginRecordingScheduleSettingCommon;

void PluginRecordingScheduleSettingSrv::Request(const QString &command, const QVariant &payload,
                                                const RequestSenderInfo &sender,
                                                ResponseCallback reply)
{
    TRACE_SCOPE("PluginRecordingScheduleSettingSrv::Request");
    const VariantMap map = payload.toMap();

    const QSharedPointer<IRecordingSettingControl> control = Control();
    // Without a control nothing can be sent; the request is answered at once
    // instead of being dereferenced into a crash.
    if (!control) {
        ReplyFailure(reply);
        return;
    }
    control->SetClientID(sender.clientId);

    // Commands that start with a read of all time cards; a refused read is
    // answered at once, so that the client is not left waiting.
    const auto readAll = [&](TimecardListCallback done) {
        if (!control->GetAllScheduleTimecardInfo(std::move(done)))
            ReplyFailure(reply);
    };
    const auto assignDefault = [&](const QString &type, const QString &content) {
        const QList<QVariant> cameras = map.value(PayloadKey::CamRecGroupList).toList();
        readAll(Guard(reply, [this, type, content, cameras, reply](
                                 bool ok, bool flag, const QList<QVariant> &timecards,
                                 const QString &) {
            UpdateTimecardCamList(ok, flag, timecards, type, content, cameras, reply);
        }));
    };

    if (command == Command::DefaultContinousSchedule) {
        assignDefault(ScheduleTypeWord::Continous, QString());
    } else if (command == Command::DefaultEventSchedule) {
        assignDefault(ScheduleTypeWord::Event, QString());
    } else if (command == Command::DefaultNotRecordingSchedule) {
        const QList<QVariant> cameras = map.value(PayloadKey::CamRecGroupList).toList();
        readAll(Guard(reply, [this, cameras, reply](bool ok, bool flag,
                                                    const QList<QVariant> &timecards,
                                                    const QString &answer) {
            HandleGetAllTimecardRes(ok, flag, timecards, answer, ScheduleTypeWord::NotRecording,
                                    QString(), cameras, reply);
        }));
    } else if (command == Command::CustomizeSchedule) {
        const QString content = map.value(PayloadKey::Timeframes).toString();
        // An unreadable document would wipe the customised time frames.
        if (TimeframesReadable(content))
            assignDefault(ScheduleTypeWord::Customize, content);
        else
            ReplyFailure(reply);
    } else if (command == Command::GetScheduleRecInfo) {
        readAll(Guard(reply, [this, reply](bool ok, bool flag, const QList<QVariant> &timecards,
                                           const QString &) {
            ParseScheduleTimecardAndRequestCallback(ok, flag, timecards, reply);
        }));
    } else if (command == Command::GetCurrentScheduleInfo) {
        readAll(Guard(reply, [this, reply](bool ok, bool flag, const QList<QVariant> &timecards,
                                           const QString &) {
            ParseCurrentScheduleTimecardAndRequestCallback(ok, flag, timecards, reply);
        }));
    } else if (command == Command::AddSchedule) {
        HandleAddSchedule(payload, reply);
    } else if (command == Command::UpdateSchedule) {
        HandleUpdateSchedule(payload, reply);
    } else if (command == Command::UpdateCamRecSchedule) {
        HandleUpdateCameraRecordingSchedule(payload, reply);
    } else if (command == Command::GetAllScheduleRecInfo) {
        getAllScheduleRecInfo(reply);
    } else if (command == Command::DelSchedule) {
        const QString timecardId = map.value(PayloadKey::TimeCardID).toString();
        readAll(Guard(reply, [this, timecardId, reply](bool ok, bool flag,
                                                       const QList<QVariant> &timecards,
                                                       const QString &) {
            HandleDeleteSchedule(ok, flag, timecards, timecardId, reply);
        }));
    } else {
        ReplyFailure(reply);
    }
}

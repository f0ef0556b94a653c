// The one door through which clients' commands reach the plug-in.

#include "PluginRecordingScheduleSettingSrv.h"

#include "ClientInput.h"
#include "RecordingScheduleSettingConstants.h"
#include "RequestSenderInfo.h"
#include "TraceLog.h"

#include <utility>

using namespace PluginRecordingScheduleSettingCommon;

void PluginRecordingScheduleSettingSrv::Request(const QString &command, const QVariant &payload,
                                                const RequestSenderInfo &sender,
                                                ResponseCallback reply)
{
    TRACE_SCOPE("PluginRecordingScheduleSettingSrv::Request");
    using Self = PluginRecordingScheduleSettingSrv;
    using Timecards = QList<QVariant>;

    // One command's request as the rows below start it.
    struct Call
    {
        Self &self;
        const QVariant &payload;
        const QVariantMap map;
        const ResponseCallback &reply;
        IRecordingSettingControl &control;

        QString text(const QString &key) const { return map.value(key).toString(); }
        QList<QVariant> cameras() const { return map.value(PayloadKey::CamRecGroupList).toList(); }

        // The read of all time cards that most commands start with; refused,
        // the request is answered at once, so the client is not left waiting.
        void readAll(TimecardListCallback done) const
        {
            if (!control.GetAllScheduleTimecardInfo(self.m_lifetime.bind(reply, std::move(done))))
                replyFailure(reply);
        }
        TimecardListCallback putOn(const QString &type, const QString &content) const
        {
            return [&self = self, type, content, cameras = cameras(), reply = reply](
                       bool ok, bool flag, const Timecards &timecards, const QString &) {
                self.UpdateTimecardCamList(ok, flag, timecards, type, content, cameras, reply);
            };
        }
        TimecardListCallback takeOff() const
        {
            return [&self = self, cameras = cameras(), reply = reply](
                       bool ok, bool flag, const Timecards &timecards, const QString &answer) {
                self.HandleGetAllTimecardRes(ok, flag, timecards, answer,
                                             ScheduleTypeWord::NotRecording, QString(), cameras,
                                             reply);
            };
        }
        using Query = void (Self::*)(bool, bool, const Timecards &, ResponseCallback);
        TimecardListCallback answer(Query query) const
        {
            return [&self = self, query,
                    reply = reply](bool ok, bool flag, const Timecards &timecards,
                                   const QString &) { (self.*query)(ok, flag, timecards, reply); };
        }
        TimecardListCallback deleteOne(const QString &timecardId) const
        {
            return [&self = self, timecardId, reply = reply](
                       bool ok, bool flag, const Timecards &timecards, const QString &) {
                self.HandleDeleteSchedule(ok, flag, timecards, timecardId, reply);
            };
        }
    };

    // One row per command, compared in this order; the first that matches
    // starts: the payload keys it reads, the read it starts and the
    // completion of that read, or the handler it hands the request to.
    using Start = void (*)(const Call &);
    static const std::pair<const QString &, Start> routes[] = {
        {Command::DefaultContinousSchedule,
         [](const Call &c) { c.readAll(c.putOn(ScheduleTypeWord::Continous, QString())); }},
        {Command::DefaultEventSchedule,
         [](const Call &c) { c.readAll(c.putOn(ScheduleTypeWord::Event, QString())); }},
        {Command::DefaultNotRecordingSchedule, [](const Call &c) { c.readAll(c.takeOff()); }},
        {Command::CustomizeSchedule,
         [](const Call &c) {
             const QString content = c.text(PayloadKey::Timeframes);
             // An unreadable document would wipe the customised time frames.
             if (ClientInput::timeframes(content))
                 c.readAll(c.putOn(ScheduleTypeWord::Customize, content));
             else
                 replyFailure(c.reply);
         }},
        {Command::GetScheduleRecInfo,
         [](const Call &c) {
             c.readAll(c.answer(&Self::ParseScheduleTimecardAndRequestCallback));
         }},
        {Command::GetCurrentScheduleInfo,
         [](const Call &c) {
             c.readAll(c.answer(&Self::ParseCurrentScheduleTimecardAndRequestCallback));
         }},
        {Command::AddSchedule, [](const Call &c) { c.self.HandleAddSchedule(c.payload, c.reply); }},
        {Command::UpdateSchedule,
         [](const Call &c) { c.self.HandleUpdateSchedule(c.payload, c.reply); }},
        {Command::UpdateCamRecSchedule,
         [](const Call &c) { c.self.HandleUpdateCameraRecordingSchedule(c.payload, c.reply); }},
        {Command::GetAllScheduleRecInfo,
         [](const Call &c) { c.self.getAllScheduleRecInfo(c.reply); }},
        {Command::DelSchedule,
         [](const Call &c) { c.readAll(c.deleteOne(c.text(PayloadKey::TimeCardID))); }},
    };

    const QSharedPointer<IRecordingSettingControl> control = m_lifetime.control();
    // Without a control nothing can be sent; the request is answered at once
    // instead of being dereferenced into a crash.
    if (!control) {
        replyFailure(reply);
        return;
    }
    control->SetClientID(sender.clientId);

    const Call call{*this, payload, payload.toMap(), reply, *control};
    for (const auto &[name, start] : routes) {
        if (command == name) {
            start(call);
            return;
        }
    }
    replyFailure(reply);
}

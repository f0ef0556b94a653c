// Taking cameras off one time card: read it by identifier, rewrite the
// camera list inside the server's own answer text, send it back. The name,
// mapping and revision go back exactly as the server sent them.
#include "RecordingSettingControl.h"

#include "CameraList.h"
#include "RecordingScheduleSettingConstants.h"
#include "TimecardAnswerText.h"
#include "TimecardTemplate.h"
#include "TraceLog.h"

#include <QXmlStreamReader>

using namespace PluginRecordingScheduleSettingCommon;

namespace {

const QString RecGrpID = QStringLiteral("RecGrpID");

} // namespace

bool RecordingSettingControl::RemoveTimecardCameraList(int timecardId,
                                                       const QList<QVariant> &cameras,
                                                       ControlResultCallback done)
{
    // Runs on the tunnel's thread; the read request keeps this control alive.
    TimecardListCallback edit = [this, cameras, done = std::move(done)](
                                    bool ok, bool flag, const QList<QVariant> &timecards,
                                    const QString &answer) {
        HdlrRmvDefTimecardCameraList(ok, flag, timecards, cameras, answer, done);
    };
    return GetScheduleTimecardInfoById(timecardId, std::move(edit));
}

void RecordingSettingControl::HdlrRmvDefTimecardCameraList(bool ok, bool flag,
                                                           const QList<QVariant> &,
                                                           const QList<QVariant> &removal,
                                                           const QString &answer,
                                                           ControlResultCallback done)
{
    if (!done)
        return;
    const auto fail = [&] {
        TRACE_ERROR("%s, HdlrRmvDefTimecardCameraList failed.",
                    "RecordingSettingControl::HdlrRmvDefTimecardCameraList");
        done(false, flag);
    };
    if (!ok)
        return fail();
    std::optional<QString> timecard = TimecardAnswerText::timecardOf(answer);
    if (!timecard)
        return fail();
    const TimecardAnswerText::CameraListPlace place = TimecardAnswerText::cameraListIn(*timecard);
    if (place.kind == TimecardAnswerText::CameraListPlace::Unreadable)
        return fail();
    if (place.kind == TimecardAnswerText::CameraListPlace::Replace) {
        // Never an update that silently empties the list: a camera list that
        // cannot be read leaves the time card as it is.
        const std::optional<QString> kept =
            RemoveCamera(timecard->mid(place.start, place.length), CameraList(removal).names());
        if (!kept)
            return fail();
        timecard->replace(place.start, place.length, *kept);
    }
    const QString body = TimecardTemplate::filled(Template::UpdateTimecardText, {*timecard});
    if (!TimecardAnswerText::isWellFormed(body))
        return fail();
    // The completion travels in the update's handler; a copy answers the
    // caller when the tunnel refuses the update, which would otherwise leave
    // the caller waiting for ever.
    if (!Send(TunnelCommand::UpdRecTmcard, body, Timeout::forCameras(removal.size()),
              Identity::Tunnel, BindResult(done)))
        fail();
}

std::optional<QString> RecordingSettingControl::RemoveCamera(const QString &cameraListText,
                                                             const QSet<QString> &removal) const
{
    QXmlStreamReader reader(cameraListText);
    QString kept;
    const auto keep = [&](const QString &name, const QString &group) {
        if (removal.contains(name))
            return;
        TimecardTemplate::appendFilled(
            kept, Template::Camera,
            {TimecardTemplate::escaped(name), TimecardTemplate::escaped(group)});
    };
    if (!reader.readNextStartElement() || reader.name() != TimecardKey::CamList)
        return std::nullopt;
    while (reader.readNextStartElement()) {
        if (reader.name() != TimecardKey::Cam) {
            reader.skipCurrentElement();
            continue;
        }
        QString name;
        QString group;
        bool groupRead = false;
        while (reader.readNextStartElement()) {
            const QStringView element = reader.name();
            if (element == TimecardKey::Name) {
                name = reader.readElementText(QXmlStreamReader::IncludeChildElements);
            } else if (element == TimecardKey::GrpID || (element == RecGrpID && !groupRead)) {
                groupRead = element == TimecardKey::GrpID;
                group = reader.readElementText(QXmlStreamReader::IncludeChildElements);
            } else {
                reader.skipCurrentElement();
            }
        }
        keep(name, group);
    }
    while (!reader.atEnd())
        reader.readNext();
    if (reader.hasError())
        return std::nullopt;
    if (kept.isEmpty())
        return QString();
    return TimecardTemplate::filled(Template::CameraList, {kept});
}

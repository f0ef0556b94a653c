// Turning what a client sends into the fragments of a time card: the schedule
// content document into Mapping elements, a camera list into a CamList
// element. Pure text work on the caller's thread; nothing is sent from here.
#include "RecordingSettingControl.h"

#include "ClientInput.h"
#include "RecordingScheduleSettingConstants.h"
#include "TimecardTemplate.h"
#include "TraceLog.h"
#include "TriggerTable.h"

#include <QJsonArray>
#include <QJsonObject>
#include <QXmlStreamWriter>

#include <algorithm>
#include <cmath>
#include <limits>

using namespace PluginRecordingScheduleSettingCommon;

namespace {

const QString DigitalInputKey = QStringLiteral("di");
const QString TraditionalKey = QStringLiteral("traditional");
const QString RecordingStateTriggerKey = QStringLiteral("recordingStateTrigger");
const QString RecordingStateNormalKey = QStringLiteral("recordingStateNormal");

constexpr int FirstDay = 1;
constexpr int LastDay = 7;
constexpr double SecondsPerHour = 3600.0;
constexpr double HoursPerDay = 24.0;

// Saturated: a cast of NaN or of a value beyond the int range is undefined.
int saturatedInt(double value)
{
    if (std::isnan(value))
        return 0;
    if (value >= double(std::numeric_limits<int>::max()))
        return std::numeric_limits<int>::max();
    if (value <= double(std::numeric_limits<int>::min()))
        return std::numeric_limits<int>::min();
    return static_cast<int>(std::round(value));
}

// A document value read as an integer: numbers round to the nearest, as
// the variant's own reading does, but saturate instead of wrapping.
int integerOf(const QJsonValue &value)
{
    const QVariant variant = value.toVariant();
    switch (variant.typeId()) {
    case QMetaType::Double:
    case QMetaType::Float:
        return saturatedInt(variant.toDouble());
    default: {
        const qlonglong number = variant.toLongLong();
        return static_cast<int>(std::clamp<qlonglong>(number, std::numeric_limits<int>::min(),
                                                      std::numeric_limits<int>::max()));
    }
    }
}

double numberOf(const QJsonValue &value)
{
    return value.toVariant().toDouble();
}

// A rectangle is an object with a mode. Anything else (null, a number, a
// text, an empty object) would become a time frame with no mode.
bool isRectangle(const QJsonValue &entry)
{
    const QJsonValue mode = entry.toObject().value(DocKey::RecordingMode);
    return mode.isString() && !mode.toString().isEmpty();
}

} // namespace

QString RecordingSettingControl::ComposeScheRecTimeframeMsg(const QString &content) const
{
    const std::optional<QJsonObject> document = ClientInput::timeframes(content);
    if (!document)
        return {};
    const QJsonValue rectangles = document->value(DocKey::Rectangles);
    if (!rectangles.isArray())
        return {};

    const QJsonArray list = rectangles.toArray();
    QString mapping;
    QString frame;
    QString days;
    QString interval;
    bool sized = false;
    for (const QJsonValue entry : list) {
        if (!isRectangle(entry))
            continue;
        const QJsonObject rectangle = entry.toObject();
        frame.clear();
        days = ComposeDayListMsg(integerOf(rectangle.value(DocKey::Left)),
                                 integerOf(rectangle.value(DocKey::Right)));
        interval = ComposeIntervalMsg(numberOf(rectangle.value(DocKey::Top)),
                                      numberOf(rectangle.value(DocKey::Bottom)));
        TimecardTemplate::appendFilled(frame, Template::Frame,
                                       {Template::CustomizeFrameName, days, interval});
        const QString mode = rectangle.value(DocKey::RecordingMode).toString();
        const QString triggers =
            mode == RecordingMode::Event
                ? ComposeTriggerEventsMsg(
                      rectangle.value(DocKey::TriggerEvents).toObject().toVariantMap())
                : QString();
        // Escaped: a mode with '<' would otherwise end the element.
        TimecardTemplate::appendFilled(mapping, Template::MappingElement,
                                       {frame, TimecardTemplate::escaped(mode), triggers});
        // Sized once from the first element: grown piecemeal, a large
        // schedule's mapping would be copied over and over.
        if (!sized) {
            mapping.reserve(mapping.size() * list.size() * 5 / 4);
            sized = true;
        }
    }
    return mapping;
}

QString
RecordingSettingControl::ComposeTriggerEventsMsg(const QMap<QString, QVariant> &triggers) const
{
    if (triggers.isEmpty()) {
        TRACE_ERROR("trigget events map is empty");
        return {};
    }
    QString text;
    QXmlStreamWriter writer(&text);
    writer.setAutoFormatting(false);
    for (const Triggers::Row &row : Triggers::Rows) {
        switch (row.kind) {
        case Triggers::Row::MotionCount:
            writer.writeTextElement(row.element, QStringLiteral("1"));
            break;
        case Triggers::Row::DigitalInput:
            writer.writeTextElement(row.element, GetDITraditionalRecMode(triggers));
            break;
        default:
            writer.writeTextElement(row.element, triggers.value(row.key).toBool()
                                                     ? QStringLiteral("1")
                                                     : QStringLiteral("0"));
        }
    }
    return text;
}

QString
RecordingSettingControl::GetDITraditionalRecMode(const QMap<QString, QVariant> &triggers) const
{
    if (!triggers.value(DigitalInputKey).toBool() || !triggers.value(TraditionalKey).toBool())
        return QStringLiteral("0");
    const bool onTrigger = triggers.value(RecordingStateTriggerKey).toBool();
    const bool onNormal = triggers.value(RecordingStateNormalKey).toBool();
    return QString::number((onTrigger ? 1 : 0) | (onNormal ? 2 : 0));
}

QString RecordingSettingControl::ComposeDayListMsg(int first, int last) const
{
    // Only the grid's seven columns: a client's Right of 2000000000 would
    // otherwise build gigabytes of day entries.
    const qint64 from = std::max<qint64>(qint64(first) + 1, FirstDay);
    const qint64 to = std::min<qint64>(last, LastDay);
    QString days;
    for (qint64 day = from; day <= to; ++day)
        TimecardTemplate::appendFilled(days, Template::DayEntry, {QString::number(day)});
    return days;
}

QString RecordingSettingControl::ComposeIntervalMsg(double beginHours, double endHours) const
{
    // Held to the day: a Bottom of 24.5 would otherwise end past midnight,
    // and one of 1e308 would read back as hour 596523.
    const auto seconds = [](double hours) {
        return saturatedInt(std::clamp(std::isnan(hours) ? 0.0 : hours, 0.0, HoursPerDay) *
                            SecondsPerHour);
    };
    // Rounded to the nearest second: the document's hours carry six
    // significant digits, and truncation would move 00:20:00 to 00:19:59 on
    // every read and save.
    return TimecardTemplate::filled(Template::IntervalEntry, {QString::number(seconds(beginHours)),
                                                              QString::number(seconds(endHours))});
}

QString RecordingSettingControl::ComposeCamRecGrpListMsg(const QList<QVariant> &cameras) const
{
    if (cameras.isEmpty())
        return {};
    QString entries;
    for (const QVariant &camera : cameras) {
        const QMap<QString, QVariant> entry = camera.toMap();
        TimecardTemplate::appendFilled(
            entries, Template::Camera,
            {TimecardTemplate::escaped(entry.value(TimecardKey::Name).toString()),
             TimecardTemplate::escaped(entry.value(TimecardKey::GrpID).toString())});
    }
    return TimecardTemplate::filled(Template::CameraList, {entries});
}

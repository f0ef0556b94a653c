// Time cards into the client's schedule content document and the summary of
// the schedule in force. Pure: reads only its arguments, runs on whichever
// thread delivers the control's completion.

#include "PluginRecordingScheduleSettingSrv.h"

#include "FixedSchedule.h"
#include "RecordingScheduleSettingConstants.h"
#include "TimecardReadings.h"
#include "TriggerTable.h"

#include <QJsonArray>
#include <QJsonDocument>

#include <algorithm>
#include <array>
#include <utility>
#include <vector>

using namespace PluginRecordingScheduleSettingCommon;
using namespace TimecardReadings;

namespace {

// An element that may repeat, read as frames are: a missing or empty one
// still counts as one entry, an empty map.
QList<QVariant> atLeastOne(const QVariant &value)
{
    QList<QVariant> list = asList(value);
    if (list.isEmpty())
        list.append(QVariant());
    return list;
}

QLatin1String boolText(bool value)
{
    return value ? QLatin1String("true") : QLatin1String("false");
}

QString hoursText(double seconds)
{
    return QString::number(seconds / 3600.0, 'g', 6);
}

bool needsEscaping(const QString &text)
{
    for (const QChar c : text) {
        if (c.unicode() < 0x20 || c == QLatin1Char('"') || c == QLatin1Char('\\') ||
            c.isSurrogate())
            return true;
    }
    return false;
}

// The mode as a JSON string with its quotes. Escaped: a mode holding '"',
// '\' or a control character would otherwise end the string early or make
// the whole document unreadable. The modes in use come out unchanged.
QString quotedMode(const QString &mode)
{
    if (!needsEscaping(mode))
        return QLatin1Char('"') + mode + QLatin1Char('"');
    const QByteArray array = QJsonDocument(QJsonArray{mode}).toJson(QJsonDocument::Compact);
    // "[" + the string + "]"
    return QString::fromUtf8(array.mid(1, array.size() - 2));
}

// Day runs of a frame as (Left, Right): only a day exactly one more than the
// one before extends a run. Kept in 64 bits so that saturated day numbers at
// the ends of int still give their neighbours without overflow.
std::vector<std::pair<qint64, qint64>> dayRuns(const QVariant &days)
{
    std::vector<std::pair<qint64, qint64>> runs;
    for (const QVariant &entry : atLeastOne(days)) {
        const qint64 day = dayNumber(entry.toMap().value(TimecardKey::AttrBegin));
        if (!runs.empty() && day == runs.back().second + 1)
            runs.back().second = day;
        else
            runs.emplace_back(day - 1, day);
    }
    return runs;
}

// The trigger elements as keys of a time card's map, made once: a document
// of many event frames would otherwise make them again for every frame.
const std::array<QString, Triggers::Rows.size()> &elementKeys()
{
    static const auto keys = [] {
        std::array<QString, Triggers::Rows.size()> made;
        for (std::size_t i = 0; i < made.size(); ++i)
            made[i] = Triggers::Rows[i].element;
        return made;
    }();
    return keys;
}

// The (Top, Bottom) texts of a frame's intervals, in hours.
std::vector<std::pair<QString, QString>> intervals(const QVariant &entries)
{
    std::vector<std::pair<QString, QString>> texts;
    for (const QVariant &interval : atLeastOne(entries)) {
        const QVariantMap bounds = interval.toMap();
        texts.emplace_back(hoursText(number(bounds.value(TimecardKey::AttrBegin))),
                           hoursText(number(bounds.value(TimecardKey::AttrEnd))));
    }
    return texts;
}

// One rectangle per day run and interval, each followed by a comma. Appended
// in place and grown ahead, doubling: a document of many event frames runs
// to tens of megabytes, and growing it rectangle by rectangle spends the
// time copying it.
void appendRectangles(QString &document, const std::vector<std::pair<qint64, qint64>> &runs,
                      const std::vector<std::pair<QString, QString>> &intervals,
                      const QString &mode, const QString &triggers)
{
    const qsizetype perRectangle = 96 + mode.size() + triggers.size();
    const qsizetype needed =
        document.size() + qsizetype(runs.size() * intervals.size()) * perRectangle;
    if (needed > document.capacity())
        document.reserve(std::max(needed, 2 * document.capacity()));
    for (const auto &[left, right] : runs) {
        const QString leftText = QString::number(left);
        const QString rightText = QString::number(right);
        for (const auto &[top, bottom] : intervals) {
            document += QLatin1String("{\"Bottom\":");
            document += bottom;
            document += QLatin1String(",\"Left\":");
            document += leftText;
            document += QLatin1String(",\"RecordingMode\":");
            document += mode;
            document += QLatin1String(",\"Right\":");
            document += rightText;
            document += QLatin1String(",\"Top\":");
            document += top;
            document += triggers;
            document += QLatin1String("},");
        }
    }
}

} // namespace

QString PluginRecordingScheduleSettingSrv::ParseSchedule(const QList<QVariant> &mappings) const
{
    QString document = QStringLiteral("{\"Rectangles\":[");
    for (const QVariant &entry : mappings) {
        const QVariantMap mapping = entry.toMap();
        const QString modeText = text(mapping.value(TimecardKey::RecMode));
        const QString mode = quotedMode(modeText);
        const QVariantMap frame = mapping.value(TimecardKey::Frame).toMap();
        if (text(frame.value(TimecardKey::RepeatMod)) != TimecardKey::Weekly) {
            document += QLatin1String("{\"Bottom\":-1,\"Left\":-1,\"RecordingMode\":") + mode +
                        QLatin1String(",\"Right\":-1,\"Top\":-1},");
            continue;
        }
        appendRectangles(
            document, dayRuns(frame.value(TimecardKey::DayList).toMap().value(TimecardKey::Ele)),
            intervals(frame.value(TimecardKey::Intervals).toMap().value(TimecardKey::Ele)), mode,
            modeText == RecordingMode::Event ? ParseTriggerEvents(mapping) : QString());
    }
    if (document.endsWith(QLatin1Char(',')))
        document.chop(1);
    document += QLatin1String("]}");
    return document;
}

QString PluginRecordingScheduleSettingSrv::ParseTriggerEvents(const QVariantMap &mapping) const
{
    const int digitalInput = integer(mapping.value(TimecardKey::DigiInput));
    const bool falling = flag(mapping.value(TimecardKey::StopUntilDIFalling));
    const bool rising = flag(mapping.value(TimecardKey::StopUntilDIRising));

    QString triggers = QStringLiteral(",\"triggerEvents\":{");
    // The rows of one kind in table order; an optional one only when the time
    // card has its element: a server that does not know an analytic leaves
    // it out, and so does the document.
    const auto writeRows = [&](Triggers::Row::Kind kind) {
        for (std::size_t i = 0; i < Triggers::Rows.size(); ++i) {
            const Triggers::Row &row = Triggers::Rows[i];
            if (row.kind != kind)
                continue;
            const auto found = mapping.constFind(elementKeys()[i]);
            if (kind == Triggers::Row::OptionalFlag && found == mapping.constEnd())
                continue;
            if (!triggers.endsWith(QLatin1Char('{')))
                triggers += QLatin1Char(',');
            triggers += QLatin1Char('"');
            triggers += row.key;
            triggers += QLatin1String("\":");
            triggers += boolText(found != mapping.constEnd() && flag(*found));
        }
    };
    writeRows(Triggers::Row::Flag);
    writeRows(Triggers::Row::OptionalFlag);
    triggers += QLatin1String(",\"di\":");
    triggers += boolText(digitalInput >= 1 || falling || rising);
    triggers += ParseDITraditionalRec(digitalInput);
    writeRows(Triggers::Row::StopFlag);
    triggers += QLatin1Char('}');
    return triggers;
}

QString PluginRecordingScheduleSettingSrv::ParseDITraditionalRec(int mode) const
{
    return QLatin1String(",\"traditional\":") + boolText(mode >= 1) +
           QLatin1String(",\"recordingStateTrigger\":") + boolText(mode == 1 || mode == 3) +
           QLatin1String(",\"recordingStateNormal\":") + boolText(mode == 2 || mode == 3);
}

QString PluginRecordingScheduleSettingSrv::GetCustomizeSchedule(const QVariantMap &timecard) const
{
    return ParseSchedule(
        atLeastOne(timecard.value(TimecardKey::Mapping).toMap().value(TimecardKey::Ele)));
}

QVariantMap
PluginRecordingScheduleSettingSrv::ParseScheduleTimecard(const QList<QVariant> &timecards,
                                                         const QList<int> &timecardIds) const
{
    RecordingScheduleType type = Other;
    QString content;
    if (timecardIds.isEmpty()) {
        type = NoSchedule;
    } else if (timecardIds.size() == 1) {
        const int wanted = timecardIds.constFirst();
        for (const QVariant &entry : timecards) {
            const QVariantMap timecard = entry.toMap();
            if (integer(timecard.value(TimecardKey::TmcardID)) != wanted)
                continue;
            if (const FixedSchedule *fixed =
                    FixedSchedule::byTimecardName(text(timecard.value(TimecardKey::Name)))) {
                type = fixed->inForce;
                if (type == Customized)
                    content = GetCustomizeSchedule(timecard);
            }
            break;
        }
    }
    return {{PayloadKey::RecScheduleType, QVariant(static_cast<int>(type))},
            {PayloadKey::CustomizeContent, QVariant(content)}};
}

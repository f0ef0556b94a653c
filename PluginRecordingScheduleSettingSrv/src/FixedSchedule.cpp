#include "FixedSchedule.h"

#include "RecordingScheduleSettingConstants.h"

#include <array>

using namespace PluginRecordingScheduleSettingCommon;

namespace {

using Control = IRecordingSettingControl;
using Cameras = QList<QVariant>;
using Done = ControlResultCallback;
using Summary = FixedSchedule::Summary;

const QString None;
// Addition entries of "UpdateCamRecSchedule" that stand for the default time cards.
const QString DefaultEventEntry = QStringLiteral("-2");
const QString DefaultContinuousEntry = QStringLiteral("-3");

const std::array<FixedSchedule, 4> &rows()
{
    static const std::array<FixedSchedule, 4> rows{{
        {ScheduleTypeWord::Continous, TimecardName::DefaultContinuous,
         Template::DefaultContinuousMapping, DefaultContinuousEntry, DefaultContinuous,
         &Control::GetDefaultContinousTimecardInfo,
         [](Control &c, const QString &, const Cameras &k, Done d) {
             return c.CreateDefaultContinuousTimecard(k, std::move(d));
         },
         [](Control &c, const Summary &s, const QString &, const Cameras &k, Done d) {
             return c.UpdateDefaultContinuousTimecard(s, k, std::move(d));
         }},
        {ScheduleTypeWord::Event, TimecardName::DefaultEvent, Template::DefaultEventMapping,
         DefaultEventEntry, DefaultEvent, &Control::GetDefaultEventTimecardInfo,
         [](Control &c, const QString &, const Cameras &k, Done d) {
             return c.CreateDefaultEventTimecard(k, std::move(d));
         },
         [](Control &c, const Summary &s, const QString &, const Cameras &k, Done d) {
             return c.UpdateDefaultEventTimecard(s, k, std::move(d));
         }},
        {ScheduleTypeWord::Customize, TimecardName::Customize, None, None, Customized,
         &Control::GetCustomizeTimecardInfo,
         [](Control &c, const QString &content, const Cameras &k, Done d) {
             return c.CreateCustomizeTimecard(content, k, std::move(d));
         },
         [](Control &c, const Summary &s, const QString &content, const Cameras &k, Done d) {
             return c.UpdateCustomizeTimecard(s, content, k, std::move(d));
         }},
        {ScheduleTypeWord::NotRecording, None, None, None, NoSchedule, nullptr, nullptr, nullptr},
    }};
    return rows;
}

template <typename Matches> const FixedSchedule *findRow(Matches matches)
{
    for (const FixedSchedule &row : rows()) {
        if (matches(row))
            return &row;
    }
    return nullptr;
}

} // namespace

FixedSchedule::Summary FixedSchedule::summaryIn(IRecordingSettingControl &control,
                                                const QList<QVariant> &timecards) const
{
    return hasTimecard() ? (control.*find)(timecards) : Summary();
}

bool FixedSchedule::put(IRecordingSettingControl &control, const Summary &summary,
                        const QString &content, const QList<QVariant> &cameras,
                        ControlResultCallback done) const
{
    if (!hasTimecard())
        return false;
    return summary.isEmpty() ? create(control, content, cameras, std::move(done))
                             : update(control, summary, content, cameras, std::move(done));
}

const FixedSchedule &FixedSchedule::continuous()
{
    return rows()[0];
}

const FixedSchedule &FixedSchedule::event()
{
    return rows()[1];
}

const FixedSchedule &FixedSchedule::customize()
{
    return rows()[2];
}

const FixedSchedule *FixedSchedule::byWord(const QString &word)
{
    return findRow([&](const FixedSchedule &row) { return row.word == word; });
}

const FixedSchedule *FixedSchedule::byTimecardName(const QString &name)
{
    return findRow(
        [&](const FixedSchedule &row) { return row.hasTimecard() && row.timecardName == name; });
}

const FixedSchedule *FixedSchedule::byAdditionEntry(const QString &scheduleId)
{
    return findRow([&](const FixedSchedule &row) {
        return !row.additionEntry.isEmpty() && row.additionEntry == scheduleId;
    });
}

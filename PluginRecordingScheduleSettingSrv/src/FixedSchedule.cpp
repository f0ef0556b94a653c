#include "FixedSchedule.h"

#include "RecordingScheduleSettingConstants.h"

#include <array>

using namespace PluginRecordingScheduleSettingCommon;

namespace {

using Control = IRecordingSettingControl;

const QString None;
// Addition entries of "UpdateCamRecSchedule" that stand for the default time cards.
const QString DefaultEventEntry = QStringLiteral("-2");
const QString DefaultContinuousEntry = QStringLiteral("-3");

template <typename Matches> const FixedSchedule *findRow(Matches matches)
{
    for (const FixedSchedule &row : FixedSchedule::all()) {
        if (matches(row))
            return &row;
    }
    return nullptr;
}

} // namespace

const std::array<FixedSchedule, 4> &FixedSchedule::all()
{
    static const std::array<FixedSchedule, 4> rows{{
        {ScheduleTypeWord::Continous, TimecardName::DefaultContinuous,
         Template::DefaultContinuousMapping, DefaultContinuousEntry, DefaultContinuous,
         &Control::GetDefaultContinousTimecardInfo, &Control::CreateDefaultContinuousTimecard,
         &Control::UpdateDefaultContinuousTimecard},
        {ScheduleTypeWord::Event, TimecardName::DefaultEvent, Template::DefaultEventMapping,
         DefaultEventEntry, DefaultEvent, &Control::GetDefaultEventTimecardInfo,
         &Control::CreateDefaultEventTimecard, &Control::UpdateDefaultEventTimecard},
        {ScheduleTypeWord::Customize, TimecardName::Customize, None, None, Customized,
         &Control::GetCustomizeTimecardInfo, nullptr, nullptr},
        {ScheduleTypeWord::NotRecording, None, None, None, NoSchedule, nullptr, nullptr, nullptr},
    }};
    return rows;
}

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
    const bool missing = summary.isEmpty();
    if (!mapping.isEmpty())
        return missing ? (control.*create)(cameras, std::move(done))
                       : (control.*update)(summary, cameras, std::move(done));
    return missing ? control.CreateCustomizeTimecard(content, cameras, std::move(done))
                   : control.UpdateCustomizeTimecard(summary, content, cameras, std::move(done));
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

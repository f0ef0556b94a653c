#pragma once

#include "IRecordingSettingControl.h"
#include "RecordingScheduleType.h"

#include <array>

// What each schedule type word that the dispatcher binds stands for: the
// plug-in's fixed time card of that kind, its mapping, and how the control
// finds, creates and updates it. "NotRecording" has no time card: its chain
// ends in the reply once the cameras are off every time card.
struct FixedSchedule
{
    using Summary = QMap<QString, QVariant>;

    const QString &word;
    const QString &timecardName;  // empty for "NotRecording"
    const QString &mapping;       // empty where the client's document gives the time frames
    const QString &additionEntry; // the "scheduleID" that names it in "UpdateCamRecSchedule"
    // What the queries report when its time card is the one in force.
    PluginRecordingScheduleSettingCommon::RecordingScheduleType inForce;
    // The control's operations on the default time cards; the customised
    // one is written from the client's document by operations of its own.
    Summary (IRecordingSettingControl::*find)(const QList<QVariant> &timecards);
    bool (IRecordingSettingControl::*create)(const QList<QVariant> &cameras,
                                             ControlResultCallback done);
    bool (IRecordingSettingControl::*update)(const Summary &, const QList<QVariant> &cameras,
                                             ControlResultCallback done);

    bool hasTimecard() const { return find != nullptr; }
    // The summary of its time card among the time cards read; empty when the
    // server has none yet, and for "NotRecording".
    Summary summaryIn(IRecordingSettingControl &control, const QList<QVariant> &timecards) const;
    // Creates the time card when the summary is empty (the server has none
    // yet), updates it otherwise; false when the control refused to send.
    bool put(IRecordingSettingControl &control, const Summary &summary, const QString &content,
             const QList<QVariant> &cameras, ControlResultCallback done) const;

    // "Continous", "Event", "Customize", "NotRecording", in that order.
    static const std::array<FixedSchedule, 4> &all();
    static const FixedSchedule &continuous() { return all()[0]; }
    static const FixedSchedule &event() { return all()[1]; }
    static const FixedSchedule &customize() { return all()[2]; }
    // Null when no row has the word, the name or the entry.
    static const FixedSchedule *byWord(const QString &word);
    static const FixedSchedule *byTimecardName(const QString &name);
    static const FixedSchedule *byAdditionEntry(const QString &scheduleId);
};

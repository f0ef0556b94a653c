#pragma once

#include "IRecordingSettingControl.h"

// A control that hands its time cards to every read at once and refuses every
// change: the translation is measured without the XML converter or a tunnel.
class AnsweringControl final : public IRecordingSettingControl
{
public:
    explicit AnsweringControl(QList<QVariant> timecards) : m_timecards(std::move(timecards)) {}

    bool GetAllScheduleTimecardInfo(TimecardListCallback done) override
    {
        done(true, false, m_timecards, QString());
        return true;
    }
    bool GetScheduleTimecardInfoById(int, TimecardListCallback) override { return false; }
    bool RemoveTimecardCameraList(int, const QList<QVariant> &, ControlResultCallback) override
    {
        return false;
    }
    bool CreateDefaultContinuousTimecard(const QList<QVariant> &, ControlResultCallback) override
    {
        return false;
    }
    bool UpdateDefaultContinuousTimecard(const QMap<QString, QVariant> &, const QList<QVariant> &,
                                         ControlResultCallback) override
    {
        return false;
    }
    bool CreateDefaultEventTimecard(const QList<QVariant> &, ControlResultCallback) override
    {
        return false;
    }
    bool UpdateDefaultEventTimecard(const QMap<QString, QVariant> &, const QList<QVariant> &,
                                    ControlResultCallback) override
    {
        return false;
    }
    bool CreateCustomizeTimecard(const QString &, const QList<QVariant> &,
                                 ControlResultCallback) override
    {
        return false;
    }
    bool UpdateCustomizeTimecard(const QMap<QString, QVariant> &, const QString &,
                                 const QList<QVariant> &, ControlResultCallback) override
    {
        return false;
    }
    bool AddSchedule(const QString &, const QString &, TimecardIdCallback) override { return false; }
    bool UpdateSchedule(const QString &, const QString &, const QString &, const QString &,
                        const QList<QVariant> &, ControlResultCallback) override
    {
        return false;
    }
    bool DeleteSchedule(const QMap<QString, QVariant> &, ControlResultCallback) override
    {
        return false;
    }
    bool UpdateTimecardCameraList(const QString &, const QList<QVariant> &, ControlResultCallback,
                                  int) override
    {
        return false;
    }
    QMap<QString, QVariant> GetDefaultContinousTimecardInfo(const QList<QVariant> &) override
    {
        return {};
    }
    QMap<QString, QVariant> GetDefaultEventTimecardInfo(const QList<QVariant> &) override
    {
        return {};
    }
    QMap<QString, QVariant> GetCustomizeTimecardInfo(const QList<QVariant> &) override { return {}; }
    void SetClientID(void *const) override {}

private:
    QList<QVariant> m_timecards;
};

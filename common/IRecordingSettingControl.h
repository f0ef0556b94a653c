#pragma once

#include <QList>
#include <QMap>
#include <QString>
#include <QVariant>

#include <functional>

// Completion functions of the time card control. ok is true only when the
// tunnel succeeded, the server answered "0" and the answer could be read;
// flag is the tunnel's last answer value, handed on unchanged.
using ControlResultCallback = std::function<void(bool ok, bool flag)>;
using TimecardListCallback = std::function<void(bool ok, bool flag,
                                                const QList<QVariant> &timecards,
                                                const QString &answer)>;
using TimecardIdCallback = std::function<void(bool ok, bool flag, const QString &timecardId)>;

// The recording server's time cards as the plug-in reads and changes them.
// Every sending operation returns true when the tunnel took the request; its
// completion is then called exactly once, later, on the tunnel's thread.
// False: nothing was sent and the completion is never called.
class IRecordingSettingControl
{
public:
    virtual ~IRecordingSettingControl() = default;

    virtual bool GetAllScheduleTimecardInfo(TimecardListCallback done) = 0;
    virtual bool GetScheduleTimecardInfoById(int timecardId, TimecardListCallback done) = 0;
    virtual bool RemoveTimecardCameraList(int timecardId, const QList<QVariant> &cameras,
                                          ControlResultCallback done) = 0;
    // The three Create operations make a fixed time card the server does not
    // hold yet. When another request created it meanwhile (the insert refused
    // with code 9), the cameras go onto that time card instead: read again,
    // then updated once; the completion hears the outcome of that update.
    virtual bool CreateDefaultContinuousTimecard(const QList<QVariant> &cameras,
                                                 ControlResultCallback done) = 0;
    virtual bool UpdateDefaultContinuousTimecard(const QMap<QString, QVariant> &summary,
                                                 const QList<QVariant> &cameras,
                                                 ControlResultCallback done) = 0;
    virtual bool CreateDefaultEventTimecard(const QList<QVariant> &cameras,
                                            ControlResultCallback done) = 0;
    virtual bool UpdateDefaultEventTimecard(const QMap<QString, QVariant> &summary,
                                            const QList<QVariant> &cameras,
                                            ControlResultCallback done) = 0;
    virtual bool CreateCustomizeTimecard(const QString &content, const QList<QVariant> &cameras,
                                         ControlResultCallback done) = 0;
    virtual bool UpdateCustomizeTimecard(const QMap<QString, QVariant> &summary,
                                         const QString &content, const QList<QVariant> &cameras,
                                         ControlResultCallback done) = 0;
    virtual bool AddSchedule(const QString &name, const QString &content,
                             TimecardIdCallback done) = 0;
    virtual bool UpdateSchedule(const QString &revision, const QString &timecardId,
                                const QString &name, const QString &content,
                                const QList<QVariant> &cameras, ControlResultCallback done) = 0;
    virtual bool DeleteSchedule(const QMap<QString, QVariant> &timecard,
                                ControlResultCallback done) = 0;
    virtual bool UpdateTimecardCameraList(const QString &answer, const QList<QVariant> &cameras,
                                          ControlResultCallback done, int timeoutMs) = 0;
    virtual QMap<QString, QVariant> GetDefaultContinousTimecardInfo(const QList<QVariant> &timecards) = 0;
    virtual QMap<QString, QVariant> GetDefaultEventTimecardInfo(const QList<QVariant> &timecards) = 0;
    virtual QMap<QString, QVariant> GetCustomizeTimecardInfo(const QList<QVariant> &timecards) = 0;
    virtual void SetClientID(void *const clientId) = 0;
};

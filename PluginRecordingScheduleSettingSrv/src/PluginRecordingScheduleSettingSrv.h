#pragma once

#include "IPluginObjectBase.h"
#include "IRecordingSettingControl.h"
#include "LifetimeGuard.h"

#include <QList>
#include <QMap>
#include <QSharedPointer>
#include <QString>
#include <QVariant>

#include <memory>

// The recording schedule plug-in: the host's door to the recording server's
// time cards. Request() runs on the host's thread; completions run on the
// tunnel's. The object keeps no schedule data between commands.
//
// Completions that arrive after the object is deleted are answered with
// (true, "-1") and go no further: every request still gets exactly one reply,
// and nothing touches the deleted object.
class PluginRecordingScheduleSettingSrv final : public IPluginObjectBase
{
    Q_OBJECT
    Q_PLUGIN_METADATA(IID PLUGIN_SERVER_INTERFACE_IID FILE "PluginRecordingScheduleSettingSrv.json")
    Q_INTERFACES(IPluginObjectBase)

public:
    PluginRecordingScheduleSettingSrv();
    ~PluginRecordingScheduleSettingSrv() override;

    bool InitialPluginBase(IFrameworkTools *tools) override;
    void Request(const QString &command, const QVariant &payload, const RequestSenderInfo &sender,
                 ResponseCallback reply) override;
    void RequestBlock(const QString &command, const QVariant &payload,
                      const RequestSenderInfo &sender, IResponser &responser) override;
    void SubscribeEventBlock(const QString &event, const QString &filter, const QVariant &payload,
                             const RequestSenderInfo &sender, IResponser &responser) override;
    void UnsubscribeEventBlock(const QString &event, const QVariant &payload,
                               IResponser &responser) override;

    void SetRecordingSettingControl(QSharedPointer<IRecordingSettingControl> control);

private:
    // Schedule queries.
    void ParseScheduleTimecardAndRequestCallback(bool ok, bool flag,
                                                 const QList<QVariant> &timecards,
                                                 ResponseCallback reply);
    void ParseCurrentScheduleTimecardAndRequestCallback(bool ok, bool flag,
                                                        const QList<QVariant> &timecards,
                                                        ResponseCallback reply);
    void ParseAllScheduleTimecardAndRequestCallback(bool ok, bool flag,
                                                    const QList<QVariant> &timecards,
                                                    ResponseCallback reply);
    void getAllScheduleRecInfo(ResponseCallback reply);

    // Translation of time cards into the client's schedule document.
    QString ParseSchedule(const QList<QVariant> &mappings) const;
    QString ParseTriggerEvents(const QVariantMap &mapping) const;
    QString ParseDITraditionalRec(int mode) const;
    QString GetCustomizeSchedule(const QVariantMap &timecard) const;
    QVariantMap ParseScheduleTimecard(const QList<QVariant> &timecards,
                                      const QList<int> &timecardIds) const;

    // Camera lookups over time card entries.
    QList<int> TimecardIDThatHasCameraList(const QList<QVariant> &timecards) const;
    QList<int>
    TimecardIDThatHasCameraListExceptDefaultSchedule(const QList<QVariant> &timecards) const;
    QList<int> TimecardIDThatNeedsToRemoveCameraList(const QList<QVariant> &timecards) const;
    QList<QVariant> GetCameraList(const QVariantMap &timecard) const;

    // Schedule add, update and delete.
    void HandleAddSchedule(const QVariant &payload, ResponseCallback reply);
    void HandleUpdateSchedule(const QVariant &payload, ResponseCallback reply);
    void HandleDeleteSchedule(bool ok, bool flag, const QList<QVariant> &timecards,
                              QString timecardId, ResponseCallback reply);
    void HdlrAddScheduleCallback(bool ok, bool flag, const QString &timecardId,
                                 ResponseCallback reply);
    void HdlrReqCallback(bool ok, bool flag, ResponseCallback reply);

    // Camera schedule assignment.
    void HandleUpdateCameraRecordingSchedule(const QVariant &payload, ResponseCallback reply);
    bool RemoveCamerasFromSchedule(const QVariant &payload, ResponseCallback reply);
    bool AddCamerasToSchedule(const QVariant &payload, ResponseCallback reply);
    void HandleUpdateCameraRecordingScheduleCallback(bool ok, bool flag, const QVariant &remaining,
                                                     ResponseCallback reply);

    // Default schedule assignment.
    void UpdateTimecardCamList(bool ok, bool flag, const QList<QVariant> &timecards,
                               const QString &type, const QString &content,
                               const QList<QVariant> &cameras, ResponseCallback reply);
    void HandleGetAllTimecardRes(bool ok, bool flag, const QList<QVariant> &timecards,
                                 const QString &answer, const QString &type, const QString &content,
                                 const QList<QVariant> &cameras, ResponseCallback reply);
    QVariantMap GetTimecardInfo(const QList<QVariant> &timecards, const QString &type);
    void HandleRemoveTimecardCamListRes(bool ok, bool flag, QString type, const QString &content,
                                        QList<QVariant> cameras, QList<int> timecardIds,
                                        ResponseCallback reply);

    // The control, and the count of completions the destructor waits for.
    LifetimeGuard m_lifetime;
};

#pragma once

#include "IPluginObjectBase.h"
#include "IRecordingSettingControl.h"
#include "PluginLifetime.h"

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
    friend class PluginRecordingScheduleSettingSrvTest;

    using VariantMap = QMap<QString, QVariant>;

    // The control as it is now (null when there is none).
    QSharedPointer<IRecordingSettingControl> Control();

    // Completions bound to this object: they run fn while the object lives,
    // and otherwise answer the reply with (true, "-1") themselves.
    ControlResultCallback Guard(const ResponseCallback &reply,
                                std::function<void(bool, bool)> fn) const;
    TimecardListCallback
    Guard(const ResponseCallback &reply,
          std::function<void(bool, bool, const QList<QVariant> &, const QString &)> fn) const;
    TimecardIdCallback Guard(const ResponseCallback &reply,
                             std::function<void(bool, bool, const QString &)> fn) const;

    // Answers (true, "-1", "", invalid): the reply of a request that the
    // plug-in ends on its own.
    static void ReplyFailure(const ResponseCallback &reply);

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
    QString ParseTriggerEvents(const VariantMap &mapping) const;
    QString ParseDITraditionalRec(int mode) const;
    QString GetCustomizeSchedule(const VariantMap &timecard) const;
    VariantMap ParseScheduleTimecard(const QList<QVariant> &timecards,
                                     const QList<int> &timecardIds) const;

    // Camera lookups over time card entries.
    QList<int> TimecardIDThatHasCameraList(const QList<QVariant> &timecards) const;
    QList<int> TimecardIDThatHasCameraListExceptDefaultSchedule(const QList<QVariant> &timecards) const;
    QList<int> TimecardIDThatNeedsToRemoveCameraList(const QList<QVariant> &timecards) const;
    QList<QVariant> GetCameraList(const VariantMap &timecard) const;

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
    void HandleUpdateCameraRecordingScheduleCallback(bool ok, bool flag,
                                                     const QVariant &remaining,
                                                     ResponseCallback reply);

    // Default schedule assignment.
    void UpdateTimecardCamList(bool ok, bool flag, const QList<QVariant> &timecards,
                               const QString &type, const QString &content,
                               const QList<QVariant> &cameras, ResponseCallback reply);
    void HandleGetAllTimecardRes(bool ok, bool flag, const QList<QVariant> &timecards,
                                 const QString &answer, const QString &type,
                                 const QString &content, const QList<QVariant> &cameras,
                                 ResponseCallback reply);
    VariantMap GetTimecardInfo(const QList<QVariant> &timecards, const QString &type);
    void HandleRemoveTimecardCamListRes(bool ok, bool flag, QString type, const QString &content,
                                        QList<QVariant> cameras, QList<int> timecardIds,
                                        ResponseCallback reply);

    // Steps the workflows share.
    static bool ReadTimecardId(const QString &text, int *timecardId);
    static bool TimeframesReadable(const QString &content);
    ControlResultCallback ReplyCompletion(const ResponseCallback &reply);
    ControlResultCallback CameraStepCompletion(const VariantMap &remaining,
                                               const ResponseCallback &reply);
    TimecardListCallback ChangeCamerasAfterRead(bool removing, const QList<QVariant> &cameras,
                                                const VariantMap &remaining,
                                                const ResponseCallback &reply);
    void AddCamerasToFixedTimecard(bool ok, const QList<QVariant> &timecards,
                                   const QString &type, const QList<QVariant> &cameras,
                                   const VariantMap &remaining, ResponseCallback reply);
    QList<int> TimecardIDThatHoldsAnyCamera(const QList<QVariant> &timecards,
                                            const QList<QVariant> &cameras,
                                            const VariantMap &except) const;
    void RemoveCamerasFromTimecards(QList<int> timecardIds, const QString &type,
                                    const QString &content, const QList<QVariant> &cameras,
                                    ResponseCallback reply);
    void PutCamerasOnFixedTimecard(const VariantMap &summary, const QString &type,
                                   const QString &content, const QList<QVariant> &cameras,
                                   ResponseCallback reply);

    // Guards m_control and every completion; see PluginLifetime.
    std::shared_ptr<PluginLifetime> m_lifetime;
    QSharedPointer<IRecordingSettingControl> m_control;
};

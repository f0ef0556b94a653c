#pragma once

#include "IKoltTunnelClient.h"
#include "IRecordingSettingControl.h"
#include "XML2Json.h"

#include <QEnableSharedFromThis>
#include <QSet>

#include <atomic>

#include <optional>

// The server-facing half of the plug-in: composes the time card messages,
// sends them through the tunnel and reads the answers. Operations run on the
// caller's thread; answer handlers and completions on the tunnel's.
//
// Each request in flight holds a strong reference to its control (when the
// control is owned by a QSharedPointer), so a control that its owner replaces
// or releases stays alive until every answer to it has been handled.
struct FixedSchedule;

class RecordingSettingControl final : public IRecordingSettingControl,
                                      public QEnableSharedFromThis<RecordingSettingControl>
{
public:
    explicit RecordingSettingControl(IKoltTunnelClient *tunnel);
    RecordingSettingControl(const RecordingSettingControl &other);
    RecordingSettingControl &operator=(const RecordingSettingControl &other);
    ~RecordingSettingControl() override;

    bool GetAllScheduleTimecardInfo(TimecardListCallback done) override;
    bool GetScheduleTimecardInfoById(int timecardId, TimecardListCallback done) override;
    bool RemoveTimecardCameraList(int timecardId, const QList<QVariant> &cameras,
                                  ControlResultCallback done) override;
    bool CreateDefaultContinuousTimecard(const QList<QVariant> &cameras,
                                         ControlResultCallback done) override;
    bool UpdateDefaultContinuousTimecard(const QMap<QString, QVariant> &summary,
                                         const QList<QVariant> &cameras,
                                         ControlResultCallback done) override;
    bool CreateDefaultEventTimecard(const QList<QVariant> &cameras,
                                    ControlResultCallback done) override;
    bool UpdateDefaultEventTimecard(const QMap<QString, QVariant> &summary,
                                    const QList<QVariant> &cameras,
                                    ControlResultCallback done) override;
    bool CreateCustomizeTimecard(const QString &content, const QList<QVariant> &cameras,
                                 ControlResultCallback done) override;
    bool UpdateCustomizeTimecard(const QMap<QString, QVariant> &summary, const QString &content,
                                 const QList<QVariant> &cameras,
                                 ControlResultCallback done) override;
    bool AddSchedule(const QString &name, const QString &content, TimecardIdCallback done) override;
    bool UpdateSchedule(const QString &revision, const QString &timecardId, const QString &name,
                        const QString &content, const QList<QVariant> &cameras,
                        ControlResultCallback done) override;
    bool DeleteSchedule(const QMap<QString, QVariant> &timecard,
                        ControlResultCallback done) override;
    bool UpdateTimecardCameraList(const QString &answer, const QList<QVariant> &cameras,
                                  ControlResultCallback done, int timeoutMs) override;
    QMap<QString, QVariant>
    GetDefaultContinousTimecardInfo(const QList<QVariant> &timecards) override;
    QMap<QString, QVariant> GetDefaultEventTimecardInfo(const QList<QVariant> &timecards) override;
    QMap<QString, QVariant> GetCustomizeTimecardInfo(const QList<QVariant> &timecards) override;
    void SetClientID(void *const clientId) override;

private:
    // Benchmarks and fuzz targets reach the camera removal handler directly.
    friend class RecordingSettingControlTest;

    // Whose identity a send carries: the tunnel's own, or the last requester's.
    enum class Identity { Tunnel, Requester };

    // The common send path: one request with the given body and answer handler.
    bool Send(const QString &command, const QString &body, int timeoutMs, Identity identity,
              TunnelResponseHandler handler);
    // The answer handlers bound to this control and to the caller's completion.
    TunnelResponseHandler BindResult(ControlResultCallback done);
    TunnelResponseHandler BindTimecardList(TimecardListCallback done);
    TunnelResponseHandler BindTimecardId(TimecardIdCallback done);

    // Answer handlers (the six tunnel values, then the caller's completion).
    void HdlrTunnelReqCallback(bool ok, const QString &status, const QString &detail,
                               const QString &responseCode, const QString &content, bool flag,
                               ControlResultCallback done);
    void HdlrTunnelReqGetRecTimecard(bool ok, const QString &status, const QString &detail,
                                     const QString &responseCode, const QString &content, bool flag,
                                     TimecardListCallback done);
    void HdlrAddScheduleCallback(bool ok, const QString &status, const QString &detail,
                                 const QString &responseCode, const QString &content, bool flag,
                                 TimecardIdCallback done);
    void HdlrRmvDefTimecardCameraList(bool ok, bool flag, const QList<QVariant> &timecards,
                                      const QList<QVariant> &removal, const QString &answer,
                                      ControlResultCallback done);

    static QList<QVariant> TransContentAsList(const QVariant &content);

    // Composition of time card fragments from client input.
    QString ComposeScheRecTimeframeMsg(const QString &content) const;
    QString ComposeTriggerEventsMsg(const QMap<QString, QVariant> &triggers) const;
    QString GetDITraditionalRecMode(const QMap<QString, QVariant> &triggers) const;
    QString ComposeDayListMsg(int first, int last) const;
    QString ComposeIntervalMsg(double beginHours, double endHours) const;
    QString ComposeCamRecGrpListMsg(const QList<QVariant> &cameras) const;

    // The fixed time cards: the mapping is the fixed one, or composed from
    // the client's document for the customised time card.
    QString MappingOf(const FixedSchedule &fixed, const QString &content) const;
    // Created with each camera once; the time-out grows with the cameras
    // when perCamera is set.
    bool InsertFixedTimecard(const FixedSchedule &fixed, const QString &content,
                             const QList<QVariant> &cameras, bool perCamera,
                             ControlResultCallback done);
    // After the server refused the insert because another request created
    // the fixed time card first: all time cards read again and the cameras
    // put on the one that won, once. done hears the outcome of that update.
    void JoinFixedTimecard(const FixedSchedule &fixed, const QString &content,
                           const QList<QVariant> &cameras, bool flag, ControlResultCallback done);
    // Updated with the given cameras first, then the time card's own, each
    // camera once.
    bool UpdateFixedTimecard(const FixedSchedule &fixed, const QMap<QString, QVariant> &summary,
                             const QString &content, const QList<QVariant> &cameras,
                             ControlResultCallback done);
    QMap<QString, QVariant> GetTimecardInfoByName(const QList<QVariant> &timecards,
                                                  const QString &name) const;
    // The kept cameras of a "<CamList>" element, written for an update; empty
    // when none is kept; nothing when the list cannot be read.
    std::optional<QString> RemoveCamera(const QString &cameraListText,
                                        const QSet<QString> &removal) const;

    IKoltTunnelClient *m_tunnel;
    XML2Json m_converter;
    // Written by the host's thread on every request, read by sends made from
    // the tunnel's thread: the last writer wins.
    std::atomic<void *> m_clientId{nullptr};
};

#include "RecordingSettingControl.h"

#include "RecordingScheduleSettingConstants.h"
#include "TimecardReadings.h"
#include "TimecardTemplate.h"
#include "TraceLog.h"

using namespace PluginRecordingScheduleSettingCommon;

namespace {

constexpr int RequestKind = 1;

bool accepted(bool ok, const QString &responseCode)
{
    return ok && responseCode == ResultCode::Success;
}

// Whether the server accepted a request; otherwise the error record of the
// answer handler named handler.
bool acceptedOrLogged(bool ok, const QString &code, const char *handler)
{
    if (accepted(ok, code))
        return true;
    TRACE_ERROR("RecordingSettingControl::%s, %s failed: success:%d, reqRespCode:%s", handler,
                handler, ok ? 1 : 0, code.toLocal8Bit().constData());
    return false;
}

// The tree of an accepted answer; nothing, after the handler's error record,
// for a refused request or content that does not parse.
std::optional<QVariant> answerTree(const XML2Json &converter, bool ok, const QString &code,
                                   const QString &content, const char *handler,
                                   const char *unreadable)
{
    if (!acceptedOrLogged(ok, code, handler))
        return std::nullopt;
    QVariant tree = converter.parse(content);
    if (tree.isValid() && !tree.isNull())
        return tree;
    TRACE_ERROR("RecordingSettingControl::%s, %s", handler, unreadable);
    return std::nullopt;
}

} // namespace

RecordingSettingControl::RecordingSettingControl(IKoltTunnelClient *tunnel) : m_tunnel(tunnel)
{}

RecordingSettingControl::RecordingSettingControl(const RecordingSettingControl &other)
    : IRecordingSettingControl(other)
    , QEnableSharedFromThis<RecordingSettingControl>(other)
    , m_tunnel(other.m_tunnel)
    , m_clientId(other.m_clientId.load())
{}

RecordingSettingControl &RecordingSettingControl::operator=(const RecordingSettingControl &other)
{
    if (this != &other) {
        m_tunnel = other.m_tunnel;
        m_clientId.store(other.m_clientId.load());
    }
    return *this;
}

RecordingSettingControl::~RecordingSettingControl() = default;

void RecordingSettingControl::SetClientID(void *const clientId)
{
    m_clientId.store(clientId);
}

bool RecordingSettingControl::Send(const QString &command, const QString &body, int timeoutMs,
                                   Identity identity, TunnelResponseHandler handler)
{
    if (!m_tunnel)
        return false;
    TunnelRequest request;
    request.flag = false;
    request.timeoutMs = timeoutMs;
    request.body = body;
    // The request holds its control: an owner that replaces or releases the
    // control while answers are on their way would otherwise leave the
    // handler with a dangling control.
    request.onResponse = [keepAlive = sharedFromThis(), handler = std::move(handler)](
                             bool ok, const QString &status, const QString &detail,
                             const QString &responseCode, const QString &content, bool flag) {
        handler(ok, status, detail, responseCode, content, flag);
    };
    void *const clientId =
        identity == Identity::Requester ? m_clientId.load() : m_tunnel->GetClientID();
    return m_tunnel->SendRequest(PluginId, clientId, RequestKind, command, request);
}

TunnelResponseHandler RecordingSettingControl::BindResult(ControlResultCallback done)
{
    return [this, done = std::move(done)](bool ok, const QString &status, const QString &detail,
                                          const QString &code, const QString &content, bool flag) {
        HdlrTunnelReqCallback(ok, status, detail, code, content, flag, done);
    };
}

TunnelResponseHandler RecordingSettingControl::BindTimecardList(TimecardListCallback done)
{
    return [this, done = std::move(done)](bool ok, const QString &status, const QString &detail,
                                          const QString &code, const QString &content, bool flag) {
        HdlrTunnelReqGetRecTimecard(ok, status, detail, code, content, flag, done);
    };
}

TunnelResponseHandler RecordingSettingControl::BindTimecardId(TimecardIdCallback done)
{
    return [this, done = std::move(done)](bool ok, const QString &status, const QString &detail,
                                          const QString &code, const QString &content, bool flag) {
        HdlrAddScheduleCallback(ok, status, detail, code, content, flag, done);
    };
}

bool RecordingSettingControl::GetAllScheduleTimecardInfo(TimecardListCallback done)
{
    return Send(TunnelCommand::GetRecTmcard, Template::GetAllTimecards, Timeout::Minimum,
                Identity::Tunnel, BindTimecardList(std::move(done)));
}

bool RecordingSettingControl::GetScheduleTimecardInfoById(int timecardId, TimecardListCallback done)
{
    const QString body =
        TimecardTemplate::filled(Template::GetTimecardById, {QString::number(timecardId)});
    return Send(TunnelCommand::GetRecTmcard, body, Timeout::Minimum, Identity::Tunnel,
                BindTimecardList(std::move(done)));
}

void RecordingSettingControl::HdlrTunnelReqGetRecTimecard(bool ok, const QString &, const QString &,
                                                          const QString &responseCode,
                                                          const QString &content, bool flag,
                                                          TimecardListCallback done)
{
    if (!done)
        return;
    const std::optional<QVariant> tree =
        answerTree(m_converter, ok, responseCode, content, "HdlrTunnelReqGetRecTimecard",
                   "parse Get Recording Timecard failed.");
    if (!tree)
        return done(false, flag, {}, QString());
    const QVariant timecards =
        tree->toMap().value(TimecardKey::GetRecTmcardRes).toMap().value(TimecardKey::Tmcard);
    done(true, flag, TransContentAsList(timecards), content);
}

void RecordingSettingControl::HdlrAddScheduleCallback(bool ok, const QString &, const QString &,
                                                      const QString &responseCode,
                                                      const QString &content, bool flag,
                                                      TimecardIdCallback done)
{
    if (!done)
        return;
    const std::optional<QVariant> tree =
        answerTree(m_converter, ok, responseCode, content, "HdlrAddScheduleCallback",
                   "parse InsRecTmcardRes failed.");
    // An answer without the identifier still counts as success.
    const QVariant created = tree ? tree->toMap().value(TimecardKey::InsRecTmcardRes) : QVariant();
    done(tree.has_value(), flag, created.toMap().value(TimecardKey::TmcardID).toString());
}

void RecordingSettingControl::HdlrTunnelReqCallback(bool ok, const QString &, const QString &,
                                                    const QString &responseCode, const QString &,
                                                    bool flag, ControlResultCallback done)
{
    if (done)
        done(acceptedOrLogged(ok, responseCode, "HdlrTunnelReqCallback"), flag);
}

QList<QVariant> RecordingSettingControl::TransContentAsList(const QVariant &content)
{
    return TimecardReadings::asList(content);
}

// Any answer to "GetRecTmcard" → "GetAllScheduleRecInfo" and
// "GetScheduleRecInfo": the plug-in must not crash, must answer exactly once,
// and every schedule content document it writes must parse as JSON.

#include "IFrameworkTools.h"
#include "IKoltTunnelClient.h"
#include "PluginRecordingScheduleSettingSrv.h"
#include "RequestSenderInfo.h"

#include <QJsonDocument>
#include <QJsonObject>

#include <cstdint>
#include <cstdio>
#include <cstdlib>

namespace {

// Answers every send at once, inside SendRequest, with the fuzz input.
class AnsweringTunnel final : public IKoltTunnelClient, public IFrameworkTools
{
public:
    QString answer;

    bool IsConnected() const override { return true; }
    void *GetClientID() override { return this; }
    QString GetServerAddress() const override { return QString(); }
    bool SendRequest(const QString &, void *, int, const QString &,
                     TunnelRequest &request) override
    {
        if (request.onResponse)
            request.onResponse(true, QString(), QString(), QStringLiteral("0"), answer, false);
        return true;
    }
    IKoltTunnelClient *GetTunnelClient() override { return this; }
};

void require(bool condition, const char *what, const QString &document = QString())
{
    if (condition)
        return;
    std::fprintf(stderr, "%s\n%s\n", what, document.toUtf8().constData());
    std::abort();
}

void requireDocument(const QString &document)
{
    QJsonParseError error{};
    const QJsonDocument json = QJsonDocument::fromJson(document.toUtf8(), &error);
    require(error.error == QJsonParseError::NoError && json.isObject() &&
                json.object().value(QLatin1String("Rectangles")).isArray(),
            "document is not JSON", document);
}

struct Reply
{
    int calls = 0;
    QString code;
    QVariant data;
};

Reply ask(PluginRecordingScheduleSettingSrv &plugin, const QString &command)
{
    Reply reply;
    plugin.Request(command, QVariant(), RequestSenderInfo{},
                   [&reply](bool, const QString &code, const QString &, const QVariant &data) {
                       ++reply.calls;
                       reply.code = code;
                       reply.data = data;
                   });
    require(reply.calls == 1, "not exactly one reply");
    return reply;
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t *data, std::size_t size)
{
    static AnsweringTunnel tunnel;
    static PluginRecordingScheduleSettingSrv plugin;
    static const bool initialised = plugin.InitialPluginBase(&tunnel);
    require(initialised, "initialisation failed");

    tunnel.answer = QString::fromUtf8(reinterpret_cast<const char *>(data),
                                      static_cast<qsizetype>(size));

    const Reply all = ask(plugin, QStringLiteral("GetAllScheduleRecInfo"));
    if (all.code == QLatin1String("0")) {
        for (const QVariant &entry : all.data.toList())
            requireDocument(entry.toMap().value(QStringLiteral("CustomizeContent")).toString());
    } else {
        require(all.code == QLatin1String("-1"), "unknown result code");
    }

    const Reply summary = ask(plugin, QStringLiteral("GetScheduleRecInfo"));
    if (summary.code == QLatin1String("0")) {
        const QString content =
            summary.data.toMap().value(QStringLiteral("CustomizeContent")).toString();
        if (!content.isEmpty())
            requireDocument(content);
    }
    return 0;
}

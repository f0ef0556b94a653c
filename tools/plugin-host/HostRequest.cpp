#include "HostRequest.h"

#include "JsonValues.h"

#include <QJsonObject>

#include <cmath>

namespace {

constexpr double MaxClient = 9007199254740992.0; // 2^53

const QString CommandKey = QStringLiteral("command");
const QString PayloadKey = QStringLiteral("payload");
const QString ClientKey = QStringLiteral("client");

HostResult<HostRequest> readLine(const QByteArray &line)
{
    const HostResult<QJsonValue> value = JsonValues::parse(line);
    if (!value)
        return Failure{value.error()};
    if (!value->isObject())
        return Failure{QStringLiteral("a request is a JSON object")};
    const QJsonObject object = value->toObject();
    for (auto it = object.begin(); it != object.end(); ++it) {
        // A misspelt key would otherwise send the request without what it
        // was meant to carry.
        if (it.key() != CommandKey && it.key() != PayloadKey && it.key() != ClientKey)
            return Failure{QStringLiteral("unknown key \"%1\"").arg(it.key())};
    }
    HostRequest request;
    const QJsonValue command = object.value(CommandKey);
    if (!command.isString())
        return Failure{QStringLiteral("\"command\" must be a string")};
    request.command = command.toString();
    if (object.contains(PayloadKey))
        request.payload = object.value(PayloadKey).toVariant();
    if (object.contains(ClientKey)) {
        const QJsonValue client = object.value(ClientKey);
        request.client = client.isDouble() ? clientNumber(client.toDouble()) : std::nullopt;
        if (!request.client)
            return Failure{QStringLiteral("\"client\" must be a whole number from 0 to 2^53")};
    }
    return request;
}

} // namespace

std::optional<qint64> clientNumber(double value)
{
    if (!(value >= 0 && value <= MaxClient) || std::floor(value) != value)
        return std::nullopt;
    return static_cast<qint64>(value);
}

std::optional<qint64> clientNumber(const QString &text)
{
    bool ok = false;
    const qint64 value = text.toLongLong(&ok);
    if (!ok || value < 0 || value > static_cast<qint64>(MaxClient))
        return std::nullopt;
    return value;
}

HostResult<std::vector<HostRequest>> readSession(const QByteArray &text)
{
    std::vector<HostRequest> requests;
    QByteArray body = text;
    if (body.startsWith("\xEF\xBB\xBF"))
        body.remove(0, 3);
    const QList<QByteArray> lines = body.split('\n');
    for (int i = 0; i < lines.size(); ++i) {
        const QByteArray line = lines.at(i).trimmed();
        if (line.isEmpty())
            continue;
        HostResult<HostRequest> request = readLine(line);
        if (!request)
            return Failure{QStringLiteral("line %1: %2").arg(i + 1).arg(request.error())};
        requests.push_back(std::move(*request));
    }
    return requests;
}

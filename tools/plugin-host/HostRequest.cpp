#include "HostRequest.h"

#include "JsonValues.h"

#include <QJsonObject>

#include <cmath>

namespace {

constexpr double MaxClient = 9007199254740992.0; // 2^53

const QString CommandKey = QStringLiteral("command");
const QString PayloadKey = QStringLiteral("payload");
const QString ClientKey = QStringLiteral("client");

std::optional<HostRequest> readLine(const QByteArray &line, QString *error)
{
    const std::optional<QJsonValue> value = JsonValues::parse(line, error);
    if (!value)
        return std::nullopt;
    if (!value->isObject()) {
        *error = QStringLiteral("a request is a JSON object");
        return std::nullopt;
    }
    const QJsonObject object = value->toObject();
    for (auto it = object.begin(); it != object.end(); ++it) {
        // A misspelt key would otherwise send the request without what it
        // was meant to carry.
        if (it.key() != CommandKey && it.key() != PayloadKey && it.key() != ClientKey) {
            *error = QStringLiteral("unknown key \"%1\"").arg(it.key());
            return std::nullopt;
        }
    }
    HostRequest request;
    const QJsonValue command = object.value(CommandKey);
    if (!command.isString()) {
        *error = QStringLiteral("\"command\" must be a string");
        return std::nullopt;
    }
    request.command = command.toString();
    if (object.contains(PayloadKey))
        request.payload = object.value(PayloadKey).toVariant();
    if (object.contains(ClientKey)) {
        const QJsonValue client = object.value(ClientKey);
        request.client = client.isDouble() ? clientNumber(client.toDouble()) : std::nullopt;
        if (!request.client) {
            *error = QStringLiteral("\"client\" must be a whole number from 0 to 2^53");
            return std::nullopt;
        }
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

std::optional<std::vector<HostRequest>> readSession(const QByteArray &text, QString *error)
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
        QString reason;
        std::optional<HostRequest> request = readLine(line, &reason);
        if (!request) {
            *error = QStringLiteral("line %1: %2").arg(i + 1).arg(reason);
            return std::nullopt;
        }
        requests.push_back(std::move(*request));
    }
    return requests;
}

#include "HostRequest.h"

#include "JsonValues.h"

#include <QJsonObject>

namespace {

constexpr qint64 MaxClient = qint64(1) << 53;

const QString CommandKey = QStringLiteral("command");
const QString PayloadKey = QStringLiteral("payload");
const QString ClientKey = QStringLiteral("client");

// One member of an object's JSON text: its key decoded, its value as written.
struct Member
{
    QString key;
    QByteArray value;
};

// The members at the top level of an object's JSON text, in the order
// written, each key as often as it is given; the text is known to parse.
std::vector<Member> membersOf(const QByteArray &object)
{
    std::vector<Member> members;
    int depth = 0;
    qsizetype keyStart = -1;
    qsizetype keyEnd = -1;
    qsizetype valueStart = -1;
    for (qsizetype i = 0; i < object.size(); ++i) {
        const char c = object.at(i);
        if (c == '"') {
            const qsizetype start = i;
            for (++i; object.at(i) != '"'; ++i) {
                if (object.at(i) == '\\')
                    ++i; // the escaped character
            }
            if (depth == 1 && keyStart < 0) {
                keyStart = start;
                keyEnd = i + 1;
            }
        } else if (c == ':' && depth == 1) {
            valueStart = i + 1;
        } else if (c == '{' || c == '[') {
            ++depth;
        } else if (c == ',' || c == '}' || c == ']') {
            if (depth == 1 && valueStart >= 0) {
                members.push_back(
                    {JsonValues::parse(object.mid(keyStart, keyEnd - keyStart))->toString(),
                     object.mid(valueStart, i - valueStart).trimmed()});
                keyStart = valueStart = -1;
            }
            depth -= c == ',' ? 0 : 1;
        }
    }
    return members;
}

HostResult<HostRequest> readLine(const QByteArray &line)
{
    const HostResult<QJsonValue> value = JsonValues::parse(line);
    if (!value)
        return Failure{value.error()};
    if (!value->isObject())
        return Failure{QStringLiteral("a request is a JSON object")};
    const QJsonObject object = value->toObject();
    // The object keeps the last of keys given twice; a second "command"
    // would otherwise replace the first without a word.
    const std::vector<Member> members = membersOf(line);
    std::optional<QByteArray> clientText;
    for (std::size_t i = 0; i < members.size(); ++i) {
        for (std::size_t j = 0; j < i; ++j) {
            if (members[j].key == members[i].key)
                return Failure{QStringLiteral("key \"%1\" given twice").arg(members[i].key)};
        }
        const QString &key = members[i].key;
        // A misspelt key would otherwise send the request without what it
        // was meant to carry.
        if (key != CommandKey && key != PayloadKey && key != ClientKey)
            return Failure{QStringLiteral("unknown key \"%1\"").arg(key)};
        if (key == ClientKey)
            clientText = members[i].value;
    }
    HostRequest request;
    const QJsonValue command = object.value(CommandKey);
    if (!command.isString())
        return Failure{QStringLiteral("\"command\" must be a string")};
    request.command = command.toString();
    if (object.contains(PayloadKey))
        request.payload = object.value(PayloadKey).toVariant();
    if (clientText) {
        // Read as written, as --client is: as a double, 2^53 + 1 would be
        // rounded to 2^53.
        request.client = clientNumber(QString::fromUtf8(*clientText));
        if (!request.client)
            return Failure{QStringLiteral("\"client\" must be a whole number from 0 to 2^53")};
    }
    return request;
}

} // namespace

std::optional<qint64> clientNumber(const QString &text)
{
    bool ok = false;
    const qint64 value = text.toLongLong(&ok);
    if (!ok || value < 0 || value > MaxClient)
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

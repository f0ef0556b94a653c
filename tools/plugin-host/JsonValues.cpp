#include "JsonValues.h"

#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>
#include <QJsonParseError>

namespace JsonValues {

HostResult<QJsonValue> parse(const QByteArray &text)
{
    // QJsonDocument takes only objects and arrays; a scalar is read inside
    // an array of one.
    QJsonParseError parseError{};
    const QJsonDocument document = QJsonDocument::fromJson(
        QByteArrayLiteral("[") + text + QByteArrayLiteral("]"), &parseError);
    if (parseError.error != QJsonParseError::NoError)
        return Failure{QStringLiteral("%1 at character %2")
                           .arg(parseError.errorString())
                           .arg(qMax(0, parseError.offset - 1))};
    const QJsonArray values = document.array();
    if (values.isEmpty())
        return Failure{QStringLiteral("no JSON value")};
    if (values.size() > 1)
        return Failure{QStringLiteral("more than one JSON value")};
    return values.first();
}

QJsonValue fromReplyData(const QVariant &data)
{
    if (!data.isValid())
        return QJsonValue(QJsonValue::Null);
    return QJsonValue::fromVariant(data);
}

QByteArray compact(const QJsonValue &value)
{
    if (value.isObject())
        return QJsonDocument(value.toObject()).toJson(QJsonDocument::Compact);
    if (value.isArray())
        return QJsonDocument(value.toArray()).toJson(QJsonDocument::Compact);
    // A scalar is written as the one element of an array, without the brackets.
    const QByteArray wrapped = QJsonDocument(QJsonArray{value}).toJson(QJsonDocument::Compact);
    return wrapped.mid(1, wrapped.size() - 2);
}

} // namespace JsonValues

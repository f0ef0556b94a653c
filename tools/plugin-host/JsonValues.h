#pragma once

#include <QByteArray>
#include <QJsonValue>
#include <QString>
#include <QVariant>

#include <optional>

// JSON as plugin-host reads and prints it: any JSON value, scalars included,
// in and out.
namespace JsonValues {

// Parses one JSON value; nothing, with the reason in *error, when the text
// is not exactly one JSON value.
std::optional<QJsonValue> parse(const QByteArray &text, QString *error);

// A reply's data as JSON: an invalid variant is null.
QJsonValue fromReplyData(const QVariant &data);

// One line of compact JSON text for any value.
QByteArray compact(const QJsonValue &value);

} // namespace JsonValues

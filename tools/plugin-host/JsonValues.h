#pragma once

#include "HostResult.h"

#include <QByteArray>
#include <QJsonValue>
#include <QString>
#include <QVariant>

// JSON as plugin-host reads and prints it: any JSON value, scalars included,
// in and out.
namespace JsonValues {

// Parses one JSON value; the reason when the text is not exactly one JSON
// value.
HostResult<QJsonValue> parse(const QByteArray &text);

// A reply's data as JSON: an invalid variant is null.
QJsonValue fromReplyData(const QVariant &data);

// One line of compact JSON text for any value.
QByteArray compact(const QJsonValue &value);

} // namespace JsonValues

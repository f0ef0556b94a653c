#pragma once

#include <QJsonObject>
#include <QString>

#include <optional>

// Reading what a client sends, where a wrong reading would change the wrong
// time card or wipe its time frames.
namespace ClientInput {

// A time card identifier: decimal digits with an optional leading minus, in
// int range; nothing for any other text, which would otherwise read as time
// card 0.
std::optional<int> timecardId(const QString &text);

// A schedule content document: a JSON object. Anything else is written to the
// error log ("Time frames parse error. ...") and gives nothing.
std::optional<QJsonObject> timeframes(const QString &content);

} // namespace ClientInput

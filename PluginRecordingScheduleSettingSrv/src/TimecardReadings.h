#pragma once

// How the plug-in reads values of a time card's variant tree, as the
// converter delivers it: text where the server wrote text, a map for an
// element with children, a list for a tag that repeats among its siblings.
// Nothing here fails: missing or malformed values read as empty, 0 or false.

#include <QList>
#include <QString>
#include <QVariant>

namespace TimecardReadings {

// Whether the converter made a list of the value (a tag that repeats).
bool isList(const QVariant &value);

// An element that may repeat, as a list: the list when the tag repeats, no
// entry for a missing value, otherwise the lone value as the only entry.
QList<QVariant> asList(const QVariant &value);

QString text(const QVariant &value);
// 0 for a text that is no number, and for one that reads as infinite or NaN:
// such a value would otherwise reach a client's JSON as "inf" or "nan".
double number(const QVariant &value);
// A day number: the number truncated toward zero, saturated at the ends of
// int, so that no text makes the conversion undefined.
int dayNumber(const QVariant &value);
// False for a missing value, an empty text, "0" or "false" in any letter
// case; true for any other text.
bool flag(const QVariant &value);
// 0 for a missing value and for a text that is no integer or does not fit in
// an int (rather than the wrapped value a plain conversion gives).
int integer(const QVariant &value);

} // namespace TimecardReadings

#pragma once

#include <QString>
#include <QStringView>

#include <initializer_list>

// Filling the time card message templates. Markers %1 to %9 are replaced in
// one pass, so a marker inside an inserted text is never filled again.
// Inserted texts go in as given: what is not XML already must pass through
// escaped() first.
namespace TimecardTemplate {

void appendFilled(QString &out, QStringView pattern, std::initializer_list<QStringView> args);
QString filled(QStringView pattern, std::initializer_list<QStringView> args);

// Text as it may stand in element content or in an attribute value.
void appendEscaped(QString &out, QStringView text);
QString escaped(QStringView text);

} // namespace TimecardTemplate

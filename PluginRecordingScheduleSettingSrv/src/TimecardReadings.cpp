#include "TimecardReadings.h"

#include <cmath>
#include <limits>

namespace TimecardReadings {

bool isList(const QVariant &value)
{
    // Only a real list counts: a text would otherwise read as a list of its
    // characters.
    const int type = value.typeId();
    return type == QMetaType::QVariantList || type == QMetaType::QStringList;
}

QList<QVariant> asList(const QVariant &value)
{
    if (!value.isValid() || value.isNull())
        return {};
    if (isList(value))
        return value.toList();
    return {value};
}

QString text(const QVariant &value)
{
    return value.toString();
}

double number(const QVariant &value)
{
    bool ok = false;
    const double result = value.toDouble(&ok);
    return ok && std::isfinite(result) ? result : 0.0;
}

int dayNumber(const QVariant &value)
{
    const double day = number(value);
    if (day >= static_cast<double>(std::numeric_limits<int>::max()))
        return std::numeric_limits<int>::max();
    if (day <= static_cast<double>(std::numeric_limits<int>::min()))
        return std::numeric_limits<int>::min();
    return static_cast<int>(day);
}

bool flag(const QVariant &value)
{
    return value.toBool();
}

int integer(const QVariant &value)
{
    bool ok = false;
    const int result =
        value.typeId() == QMetaType::QString ? value.toString().toInt(&ok) : value.toInt(&ok);
    return ok ? result : 0;
}

} // namespace TimecardReadings

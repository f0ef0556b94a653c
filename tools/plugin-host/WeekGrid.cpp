#include "WeekGrid.h"

#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>

#include <algorithm>
#include <array>
#include <bitset>
#include <cmath>
#include <map>

namespace {

constexpr int Days = 7;
constexpr int Hours = 24;
constexpr int MinutesPerHour = 60;
constexpr int MinutesPerDay = Hours * MinutesPerHour;

// Which minutes of each day one mode records in.
using WeekMinutes = std::array<std::bitset<MinutesPerDay>, Days>;

QChar modeLetter(const QString &mode)
{
    return mode.isEmpty() ? QLatin1Char('?') : mode.at(0).toUpper();
}

int toMinute(double hours)
{
    return std::clamp(static_cast<int>(std::lround(hours * MinutesPerHour)), 0, MinutesPerDay);
}

QChar cell(const std::map<QString, WeekMinutes> &modes, int day, int hour)
{
    QChar mark = QLatin1Char('.');
    int found = 0;
    for (const auto &[mode, week] : modes) {
        int covered = 0;
        for (int minute = hour * MinutesPerHour; minute < (hour + 1) * MinutesPerHour; ++minute)
            covered += week[day].test(minute) ? 1 : 0;
        if (covered == 0)
            continue;
        ++found;
        mark = covered == MinutesPerHour ? modeLetter(mode) : modeLetter(mode).toLower();
    }
    return found > 1 ? QLatin1Char('*') : mark;
}

// The minutes each mode records in, and a line for each frame that does
// not repeat weekly.
struct Week
{
    std::map<QString, WeekMinutes> modes;
    QStringList notWeekly;
};

Week readWeek(const QJsonArray &rectangles)
{
    Week week;
    for (const auto &value : rectangles) {
        const QJsonObject rectangle = value.toObject();
        const QString mode = rectangle.value(QStringLiteral("RecordingMode")).toString();
        const int left = rectangle.value(QStringLiteral("Left")).toInt(-1);
        const int right = rectangle.value(QStringLiteral("Right")).toInt(-1);
        const double top = rectangle.value(QStringLiteral("Top")).toDouble(-1);
        const double bottom = rectangle.value(QStringLiteral("Bottom")).toDouble(-1);
        if (left < 0 || right < 0 || top < 0 || bottom < 0) {
            week.notWeekly
                << QStringLiteral("not weekly: %1").arg(mode.isEmpty() ? "(no mode)" : mode);
            continue;
        }
        WeekMinutes &minutes = week.modes[mode];
        for (int day = std::max(left, 0); day < std::min(right, Days); ++day) {
            for (int minute = toMinute(top); minute < toMinute(bottom); ++minute)
                minutes[day].set(minute);
        }
    }
    return week;
}

} // namespace

QStringList weekGrid(const QString &content)
{
    const QJsonDocument document = QJsonDocument::fromJson(content.toUtf8());
    if (!document.isObject() || !document.object().value(QStringLiteral("Rectangles")).isArray())
        return {QStringLiteral("(no schedule content)")};
    const Week week = readWeek(document.object().value(QStringLiteral("Rectangles")).toArray());

    QStringList lines;
    QString header = QStringLiteral("       ");
    for (int day = 1; day <= Days; ++day)
        header += QStringLiteral("  %1").arg(day);
    lines << header;
    for (int hour = 0; hour < Hours; ++hour) {
        QString line = QStringLiteral("%1:00  ").arg(hour, 2, 10, QLatin1Char('0'));
        for (int day = 0; day < Days; ++day)
            line += QStringLiteral("  ") + cell(week.modes, day, hour);
        lines << line;
    }
    lines << week.notWeekly;
    return lines;
}

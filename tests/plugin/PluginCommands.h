#pragma once

#include <QString>
#include <QStringList>
#include <QVariant>
#include <QVariantMap>

// "CustomizeSchedule" answers at once, before any read, when its schedule
// document is missing or unreadable; the other commands ignore the key.
inline const QVariant ReadablePayload =
    QVariantMap{{QStringLiteral("timeframes"), QStringLiteral("{\"Rectangles\":[]}")}};

// Commands that read the time cards before anything else.
inline const QStringList ReadFirstCommands{
    QStringLiteral("DefaultContinousSchedule"),    QStringLiteral("DefaultEventSchedule"),
    QStringLiteral("DefaultNotRecordingSchedule"), QStringLiteral("CustomizeSchedule"),
    QStringLiteral("GetScheduleRecInfo"),          QStringLiteral("GetCurrentScheduleInfo"),
    QStringLiteral("GetAllScheduleRecInfo"),       QStringLiteral("DelSchedule"),
};

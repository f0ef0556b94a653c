#pragma once

// Time card entries built by hand in the shape the converter gives them:
// texts for element text, "@X" for attributes, a lone child as the map
// itself and repeated children as a list.

#include <QList>
#include <QMap>
#include <QString>
#include <QStringList>
#include <QVariant>

namespace TimecardTrees {

using Map = QMap<QString, QVariant>;

// A repeated element: the lone map itself for one entry, a list otherwise.
inline QVariant repeated(const QList<QVariant> &entries)
{
    return entries.size() == 1 ? entries.constFirst() : QVariant(entries);
}

inline QVariant days(const QStringList &numbers)
{
    QList<QVariant> entries;
    for (const QString &number : numbers)
        entries << Map{{QStringLiteral("@B"), number}};
    return repeated(entries);
}

struct Interval
{
    QString begin;
    QString end;
};

inline QVariant intervals(const QList<Interval> &spans)
{
    QList<QVariant> entries;
    for (const Interval &span : spans)
        entries << Map{{QStringLiteral("@B"), span.begin}, {QStringLiteral("@E"), span.end}};
    return repeated(entries);
}

inline Map frame(const QVariant &dayEntries, const QVariant &intervalEntries,
                 const QString &repeat = QStringLiteral("Weekly"))
{
    return Map{{QStringLiteral("Name"), QStringLiteral("Customize time frame")},
               {QStringLiteral("DLMod"), QStringLiteral("SingleDay")},
               {QStringLiteral("RepeatMod"), repeat},
               {QStringLiteral("DayList"), Map{{QStringLiteral("Ele"), dayEntries}}},
               {QStringLiteral("Intervals"), Map{{QStringLiteral("Ele"), intervalEntries}}}};
}

// One Mapping element: a frame, its mode and its trigger elements.
inline Map mapping(const Map &frameMap, const QString &mode, const Map &triggers = {})
{
    Map result = triggers;
    result.insert(QStringLiteral("Frame"), frameMap);
    result.insert(QStringLiteral("RecMode"), mode);
    return result;
}

// The trigger elements of the default mappings.
inline Map defaultTriggers()
{
    return Map{{QStringLiteral("AllEvent"), QStringLiteral("true")},
               {QStringLiteral("Motion"), QStringLiteral("true")},
               {QStringLiteral("ContMotNum"), QStringLiteral("1")},
               {QStringLiteral("DigiInput"), QStringLiteral("3")}};
}

// The one Mapping element of the default mappings, as a server returns it.
inline Map defaultMapping(const QString &mode)
{
    const QStringList week{QStringLiteral("1.0"), QStringLiteral("2.0"), QStringLiteral("3.0"),
                           QStringLiteral("4.0"), QStringLiteral("5.0"), QStringLiteral("6.0"),
                           QStringLiteral("7.0")};
    Map frameMap = frame(days(week), intervals({{QStringLiteral("0"), QStringLiteral("86400")}}));
    frameMap.insert(QStringLiteral("Name"), QStringLiteral("Always"));
    return mapping(frameMap, mode, defaultTriggers());
}

// A time card entry whose "Mapping" holds the given "Ele" value.
inline Map timecard(const QString &id, const QString &name, const QVariant &mappingEle,
                    const QVariant &cameras = QVariant())
{
    Map result{{QStringLiteral("Revision"), QStringLiteral("3")},
               {QStringLiteral("TmcardID"), id},
               {QStringLiteral("Name"), name},
               {QStringLiteral("Mapping"), Map{{QStringLiteral("Ele"), mappingEle}}}};
    if (cameras.isValid())
        result.insert(QStringLiteral("CamList"), cameras);
    return result;
}

inline Map camera(const QString &name, const QString &group)
{
    return Map{{QStringLiteral("Name"), name}, {QStringLiteral("GrpID"), group}};
}

inline QVariant cameraList(const QList<QVariant> &cams)
{
    return Map{{QStringLiteral("Cam"), repeated(cams)}};
}

} // namespace TimecardTrees

#pragma once

// "GetRecTmcardRes" answers as a recording server writes them.

#include <QString>
#include <QStringList>

namespace TimecardXml {

inline QString timecard(const QString &id, const QString &name, const QString &mapping,
                        const QString &cameras = QString(), const QString &revision = "1")
{
    return QStringLiteral("<Tmcard><Revision>%1</Revision><TmcardID>%2</TmcardID><Name>%3</Name>"
                          "<Mapping>%4</Mapping>%5</Tmcard>")
        .arg(revision, id, name, mapping, cameras);
}

inline QString cameras(const QStringList &namesAndGroups)
{
    QString result;
    for (int i = 0; i + 1 < namesAndGroups.size(); i += 2)
        result += QStringLiteral("<Cam><Name>%1</Name><GrpID>%2</GrpID></Cam>")
                      .arg(namesAndGroups[i], namesAndGroups[i + 1]);
    return QStringLiteral("<CamList>%1</CamList>").arg(result);
}

inline QString answer(const QStringList &timecards)
{
    return QStringLiteral("<GetRecTmcardRes>") + timecards.join(QString()) +
           QStringLiteral("</GetRecTmcardRes>");
}

} // namespace TimecardXml

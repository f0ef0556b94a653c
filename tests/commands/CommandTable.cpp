#include "CommandTable.h"

#include "RunSql.h"

#include <QDebug>
#include <QRegularExpression>

#include <map>

namespace {

// The whole week in one weekly time frame, as the default time cards hold it.
QString wholeWeek(const QString &mode)
{
    return QStringLiteral(
               R"(<Ele><Frame><Name>Always</Name><Holiday>false</Holiday><RepeatMod>Weekly</RepeatMod>)"
               R"(<DLMod>SingleDay</DLMod><Intervals><Ele B="0" E="86400"/></Intervals><DayList>)"
               R"(<Ele B="1.0"/><Ele B="2.0"/><Ele B="3.0"/><Ele B="4.0"/><Ele B="5.0"/>)"
               R"(<Ele B="6.0"/><Ele B="7.0"/></DayList><Range><Period><TmS>2016-03-29 00:00:00.000)"
               R"(</TmS><TmE>2035-01-01 00:00:00.000</TmE></Period><End>false</End></Range>)"
               R"(<RepeatFreq>1</RepeatFreq></Frame><RecMode>%1</RecMode><AllEvent>true</AllEvent>)"
               R"(<Motion>true</Motion><ContMotNum>1</ContMotNum><DigiInput>3</DigiInput></Ele>)")
        .arg(mode);
}

// Mapping texts by the short names the rows use.
const std::map<QString, QString> &mappingAliases()
{
    static const std::map<QString, QString> aliases{
        {QStringLiteral("continuous week"), wholeWeek(QStringLiteral("Continuous"))},
        {QStringLiteral("event week"), wholeWeek(QStringLiteral("Event"))},
        // Monday to Friday, 08:00 to 18:00, continuous, as the plug-in composes it.
        {QStringLiteral("lobby"),
         QStringLiteral(
             R"(<Ele><Frame><Name>Customize time frame</Name><DLMod>SingleDay</DLMod><RepeatMod>Weekly</RepeatMod>)"
             R"(<DayList><Ele B="1.0"/><Ele B="2.0"/><Ele B="3.0"/><Ele B="4.0"/><Ele B="5.0"/></DayList>)"
             R"(<Intervals><Ele B="28800" E="64800"/></Intervals><Holiday>false</Holiday><Range><Period>)"
             R"(<TmS>2016-03-29 00:00:00.000</TmS><TmE>2035-01-01 00:00:00.000</TmE></Period><End>false</End>)"
             R"(</Range><RepeatFreq>1</RepeatFreq></Frame><RecMode>Continuous</RecMode></Ele>)")}};
    return aliases;
}

// The types show: QVariant(QString, "12") is not QVariant(int, 12).
std::string shown(const QVariant &data)
{
    QString text;
    QDebug(&text) << data;
    return text.toStdString();
}

} // namespace

QString seedDocument(const QString &timecards)
{
    static const QRegularExpression part(
        QStringLiteral(R"(^#(\d+) (.*?)(?: \{(.*)\})?(?: \[(.*)\])?$)"));
    QString xml = QStringLiteral("<GetRecTmcardRes>");
    for (const QString &text : timecards.split(QStringLiteral(" | "), Qt::SkipEmptyParts)) {
        const QRegularExpressionMatch m = part.match(text);
        EXPECT_TRUE(m.hasMatch()) << text.toStdString();
        const auto alias = mappingAliases().find(m.captured(3));
        QString cams;
        for (const QString &cam : m.captured(4).split(QLatin1Char(' '), Qt::SkipEmptyParts))
            cams += QStringLiteral("<Cam><Name>%1</Name><GrpID>%2</GrpID></Cam>")
                        .arg(cam.section(QLatin1Char('/'), 0, 0), cam.section(QLatin1Char('/'), 1));
        xml += QStringLiteral("<Tmcard><Revision>1</Revision><TmcardID>%1</TmcardID><Name>%2</Name>"
                              "<Mapping>%3</Mapping>%4</Tmcard>")
                   .arg(m.captured(1), m.captured(2),
                        alias == mappingAliases().end() ? m.captured(3) : alias->second,
                        cams.isEmpty() ? QString()
                                       : QStringLiteral("<CamList>%1</CamList>").arg(cams));
    }
    return xml + QStringLiteral("</GetRecTmcardRes>");
}

namespace {

QString timecardsOf(const QString &getRecTmcardRes)
{
    static const QRegularExpression card(QStringLiteral(
        "<TmcardID>(\\d+)</TmcardID><Name>(.*?)</Name><Mapping>(.*?)</Mapping>(.*?)</Tmcard>"));
    static const QRegularExpression cam(
        QStringLiteral("<Cam><Name>(.*?)</Name><GrpID>(.*?)</GrpID></Cam>"));
    QStringList parts;
    for (const QRegularExpressionMatch &m : card.globalMatch(getRecTmcardRes)) {
        QString text = QStringLiteral("#%1 %2").arg(m.captured(1), m.captured(2));
        QString mapping = m.captured(3);
        for (const auto &[alias, xml] : mappingAliases())
            mapping = mapping == xml ? alias : mapping;
        if (!mapping.isEmpty())
            text += QStringLiteral(" {%1}").arg(mapping);
        QStringList cams;
        for (const QRegularExpressionMatch &c : cam.globalMatch(m.captured(4)))
            cams << c.captured(1) + QLatin1Char('/') + c.captured(2);
        if (!cams.isEmpty())
            text += QStringLiteral(" [%1]").arg(cams.join(QLatin1Char(' ')));
        parts << text;
    }
    return parts.join(QStringLiteral(" | "));
}

// An insert names time card 0: it gets no identifier.
QString messagesOf(const QList<LivePlugin::Sent> &sent)
{
    static const QRegularExpression id(QStringLiteral("<TmcardID>([1-9]\\d*)</TmcardID>"));
    QStringList result;
    for (const LivePlugin::Sent &s : sent) {
        const QString target = s.body.contains(QLatin1String("<TmcardAll>"))
                                   ? QStringLiteral("all")
                                   : id.match(s.body).captured(1);
        result << (target.isEmpty() ? s.command : QStringLiteral("%1(%2)").arg(s.command, target));
    }
    return result.join(QStringLiteral(", "));
}

} // namespace

QVariantList cameras(const QString &namesAndGroups)
{
    QVariantList result;
    for (const QString &cam : namesAndGroups.split(QLatin1Char(' '), Qt::SkipEmptyParts))
        result << QVariantMap{{QStringLiteral("Name"), cam.section(QLatin1Char('/'), 0, 0)},
                              {QStringLiteral("GrpID"), cam.section(QLatin1Char('/'), 1)}};
    return result;
}

TEST_P(Commands, Answer)
{
    const CommandRow &row = GetParam();
    LivePlugin live;
    if (!row.seed.isEmpty())
        live.seed(seedDocument(row.seed));
    runSql(live.databasePath(), row.alter);
    const QString before = timecardsOf(live.dump());
    const ReplyCollector::Reply reply = live.request(row.command, row.payload);
    EXPECT_EQ(messagesOf(live.sent()).toStdString(), row.messages.toStdString());
    EXPECT_EQ(timecardsOf(live.dump()).toStdString(),
              (row.after.isEmpty() ? before : row.after).toStdString());
    EXPECT_EQ(reply.flag, row.flag);
    EXPECT_EQ(reply.code.toStdString(), row.code.toStdString());
    EXPECT_TRUE(reply.text.isEmpty());
    EXPECT_TRUE(reply.data == row.data) << shown(reply.data) << "\nwanted " << shown(row.data);
}

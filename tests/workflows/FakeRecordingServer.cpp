#include "FakeRecordingServer.h"

#include <QStringList>
#include <QXmlStreamReader>

namespace {

// The text between the first open tag and the close tag after it, if any.
std::optional<QString> between(const QString &text, const QString &open, const QString &close)
{
    const qsizetype start = text.indexOf(open);
    if (start < 0)
        return std::nullopt;
    const qsizetype from = start + open.size();
    const qsizetype end = text.indexOf(close, from);
    if (end < 0)
        return std::nullopt;
    return text.mid(from, end - from);
}

std::optional<int> number(const std::optional<QString> &text)
{
    bool ok = false;
    const int value = text ? text->toInt(&ok) : 0;
    return ok ? std::optional<int>(value) : std::nullopt;
}

// The one time card of an insert or update request, as the server reads it:
// cameras must be written with "RecGrpID".
std::optional<FakeRecordingServer::Timecard> parseTimecard(const QString &body)
{
    FakeRecordingServer::Timecard card;
    bool hasId = false;
    bool hasRevision = false;
    FakeRecordingServer::Camera camera;
    bool cameraHasGroup = false;

    QXmlStreamReader xml(body);
    QStringList path;
    while (!xml.atEnd()) {
        xml.readNext();
        if (xml.isStartElement()) {
            path << xml.name().toString();
            if (path.endsWith(QStringLiteral("Cam"))) {
                camera = {};
                cameraHasGroup = false;
            }
        } else if (xml.isEndElement()) {
            if (path.size() == 4 && path.at(2) == QStringLiteral("CamList") &&
                path.at(3) == QStringLiteral("Cam")) {
                if (!cameraHasGroup || camera.name.isEmpty())
                    return std::nullopt;
                card.cameras << camera;
            }
            path.removeLast();
        } else if (xml.isCharacters() && path.size() >= 3 &&
                   path.at(1) == QStringLiteral("Tmcard")) {
            const QString leaf = path.mid(2).join(QLatin1Char('/'));
            const QString text = xml.text().toString();
            if (leaf == QStringLiteral("Revision")) {
                card.revision = text.toInt(&hasRevision);
            } else if (leaf == QStringLiteral("TmcardID")) {
                card.id = text.toInt(&hasId);
            } else if (leaf == QStringLiteral("Name")) {
                card.name = text;
            } else if (leaf == QStringLiteral("CamList/Cam/Name")) {
                camera.name = text;
            } else if (leaf == QStringLiteral("CamList/Cam/RecGrpID")) {
                camera.group = text;
                cameraHasGroup = true;
            }
        }
    }
    if (xml.hasError() || !hasId || !hasRevision)
        return std::nullopt;
    const qsizetype open = body.indexOf(QStringLiteral("<Mapping>"));
    const qsizetype close = body.lastIndexOf(QStringLiteral("</Mapping>"));
    if (open >= 0 && close > open)
        card.mapping = body.mid(open + 9, close - open - 9);
    return card;
}

} // namespace

void FakeRecordingServer::put(const Timecard &timecard)
{
    const std::lock_guard<std::mutex> lock(m_mutex);
    m_timecards[timecard.id] = timecard;
}

std::optional<FakeRecordingServer::Timecard> FakeRecordingServer::find(int id) const
{
    const std::lock_guard<std::mutex> lock(m_mutex);
    const auto it = m_timecards.find(id);
    return it == m_timecards.end() ? std::nullopt : std::optional<Timecard>(it->second);
}

QList<FakeRecordingServer::Timecard> FakeRecordingServer::timecards() const
{
    const std::lock_guard<std::mutex> lock(m_mutex);
    QList<Timecard> result;
    for (const auto &entry : m_timecards)
        result << entry.second;
    return result;
}

void FakeRecordingServer::setAnswerFlag(bool flag)
{
    const std::lock_guard<std::mutex> lock(m_mutex);
    m_flag = flag;
}

QString FakeRecordingServer::timecardXml(const Timecard &timecard, const QString &groupTag)
{
    QString cameras;
    for (const Camera &camera : timecard.cameras) {
        cameras += QStringLiteral("<Cam><Name>%1</Name><%2>%3</%2></Cam>")
                       .arg(camera.name, groupTag, camera.group);
    }
    if (!cameras.isEmpty())
        cameras = QStringLiteral("<CamList>") + cameras + QStringLiteral("</CamList>");
    return QStringLiteral("<Tmcard><Revision>%1</Revision><TmcardID>%2</TmcardID><Name>")
               .arg(timecard.revision)
               .arg(timecard.id) +
           timecard.name + QStringLiteral("</Name><Mapping>") + timecard.mapping +
           QStringLiteral("</Mapping>") + cameras + QStringLiteral("</Tmcard>");
}

TestTunnel::Answer FakeRecordingServer::answer(const TestTunnel::Sent &sent)
{
    const std::lock_guard<std::mutex> lock(m_mutex);
    if (sent.command == QStringLiteral("GetRecTmcard"))
        return read(sent.body);
    if (sent.command == QStringLiteral("InsRecTmcard"))
        return insert(sent.body);
    if (sent.command == QStringLiteral("UpdRecTmcard"))
        return update(sent.body);
    if (sent.command == QStringLiteral("DelTmcard"))
        return remove(sent.body);
    return failure();
}

TestTunnel::Answer FakeRecordingServer::read(const QString &body) const
{
    QString cards;
    if (body == QStringLiteral("<GetRecTmcard><TmcardAll>true</TmcardAll></GetRecTmcard>")) {
        for (const auto &entry : m_timecards)
            cards += timecardXml(entry.second);
    } else {
        const std::optional<int> id =
            number(between(body, QStringLiteral("<TmcardID>"), QStringLiteral("</TmcardID>")));
        if (!id)
            return failure();
        const auto it = m_timecards.find(*id);
        if (it != m_timecards.end())
            cards = timecardXml(it->second);
    }
    return success(QStringLiteral("<GetRecTmcardRes>") + cards +
                   QStringLiteral("</GetRecTmcardRes>"));
}

TestTunnel::Answer FakeRecordingServer::insert(const QString &body)
{
    std::optional<Timecard> card = parseTimecard(body);
    if (!card || card->id != 0 || card->revision != 0)
        return failure();
    card->id = m_nextId++;
    card->revision = 1;
    m_timecards[card->id] = *card;
    return success(
        QStringLiteral("<InsRecTmcardRes><TmcardID>%1</TmcardID></InsRecTmcardRes>").arg(card->id));
}

TestTunnel::Answer FakeRecordingServer::update(const QString &body)
{
    std::optional<Timecard> card = parseTimecard(body);
    if (!card)
        return failure();
    const auto it = m_timecards.find(card->id);
    if (it == m_timecards.end() || it->second.revision != card->revision)
        return failure();
    card->revision += 1;
    it->second = *card;
    return success();
}

TestTunnel::Answer FakeRecordingServer::remove(const QString &body)
{
    const std::optional<int> revision =
        number(between(body, QStringLiteral("<Revision>"), QStringLiteral("</Revision>")));
    const std::optional<int> id =
        number(between(body, QStringLiteral("<TmcardID>"), QStringLiteral("</TmcardID>")));
    const auto it = id ? m_timecards.find(*id) : m_timecards.end();
    if (!revision || it == m_timecards.end() || it->second.revision != *revision)
        return failure();
    m_timecards.erase(it);
    return success();
}

TestTunnel::Answer FakeRecordingServer::success(const QString &content) const
{
    return TestTunnel::Answer{true, QStringLiteral("0"), content, m_flag};
}

TestTunnel::Answer FakeRecordingServer::failure() const
{
    return TestTunnel::Answer{true, QStringLiteral("-1"), QString(), m_flag};
}

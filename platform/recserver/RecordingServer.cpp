#include "RecordingServer.h"

#include "RequestParser.h"
#include "TimecardStore.h"
#include "XmlOut.h"

#include <QSqlDatabase>

#include <atomic>

namespace {

QString uniqueConnectionName()
{
    static std::atomic<quint64> counter{0};
    return QStringLiteral("recserver-%1").arg(++counter);
}

ServerAnswer refusalAnswer(const Refusal &refusal, AnswerLayout layout)
{
    QString content;
    XmlOut out(&content, layout);
    out.start(u"Error");
    out.leaf(u"Code", serverCodeText(refusal.code));
    out.leaf(u"Reason", refusal.reason);
    out.end(u"Error");
    out.finish();
    return {serverCodeText(refusal.code), content};
}

QString timecardsAnswer(const std::vector<Timecard> &cards, AnswerLayout layout)
{
    QString content;
    XmlOut out(&content, layout);
    // Always a start and an end tag: readers cut the answer at both.
    out.start(u"GetRecTmcardRes");
    for (const Timecard &card : cards) {
        out.start(u"Tmcard");
        out.leaf(u"Revision", QString::number(card.revision));
        out.leaf(u"TmcardID", QString::number(card.id));
        out.leaf(u"Name", card.name);
        out.start(u"Mapping");
        out.content(card.mapping);
        out.end(u"Mapping");
        if (!card.cameras.empty()) {
            out.start(u"CamList");
            for (const Camera &camera : card.cameras) {
                out.start(u"Cam");
                out.leaf(u"Name", camera.name);
                out.leaf(u"GrpID", QString::number(camera.group));
                out.end(u"Cam");
            }
            out.end(u"CamList");
        }
        out.end(u"Tmcard");
    }
    out.end(u"GetRecTmcardRes");
    out.finish();
    return content;
}

QString fieldsAnswer(QStringView root, std::initializer_list<std::pair<QStringView, qint64>> fields,
                     AnswerLayout layout)
{
    QString content;
    XmlOut out(&content, layout);
    out.start(root);
    for (const auto &field : fields)
        out.leaf(field.first, QString::number(field.second));
    out.end(root);
    out.finish();
    return content;
}

} // namespace

bool parseAnswerLayout(const QString &text, AnswerLayout *layout)
{
    const QString word = text.trimmed().toLower();
    if (word == QLatin1String("compact"))
        *layout = AnswerLayout::Compact;
    else if (word == QLatin1String("indented"))
        *layout = AnswerLayout::Indented;
    else if (word == QLatin1String("crlf"))
        *layout = AnswerLayout::Crlf;
    else
        return false;
    return true;
}

RecordingServer::RecordingServer(const QString &databasePath, AnswerLayout layout)
    : m_path(databasePath), m_connection(uniqueConnectionName()), m_layout(layout)
{}

RecordingServer::~RecordingServer()
{
    if (QSqlDatabase::contains(m_connection)) {
        QSqlDatabase::database(m_connection, false).close();
        QSqlDatabase::removeDatabase(m_connection);
    }
}

bool RecordingServer::open(QString *error)
{
    if (m_open)
        return true;
    TimecardStore store(m_connection, m_statementHook);
    QString reason;
    m_open = store.open(m_path, &reason);
    if (!m_open) {
        QSqlDatabase::removeDatabase(m_connection);
        if (error)
            *error = reason;
    }
    return m_open;
}

bool RecordingServer::isOpen() const
{
    return m_open;
}

ServerAnswer RecordingServer::handle(const QString &command, const QString &body)
{
    try {
        if (!m_open)
            return refusalAnswer({ServerCode::StorageFailure, QStringLiteral("database not open")},
                                 m_layout);
        TimecardStore store(m_connection, m_statementHook);
        if (command == QLatin1String("GetRecTmcard")) {
            ReadRequest request;
            Refusal refusal = parseReadRequest(body, &request);
            std::vector<Timecard> cards;
            if (!refusal.refused() && request.all) {
                refusal = store.readAll(&cards);
            } else if (!refusal.refused()) {
                // An identifier that is not held is an empty answer, not a refusal.
                std::optional<Timecard> card;
                refusal = store.readOne(request.id, &card);
                if (card)
                    cards.push_back(std::move(*card));
            }
            if (refusal.refused())
                return refusalAnswer(refusal, m_layout);
            return {serverCodeText(ServerCode::Ok), timecardsAnswer(cards, m_layout)};
        }
        if (command == QLatin1String("InsRecTmcard")) {
            Timecard card;
            Refusal refusal = parseInsertRequest(body, &card);
            qint64 id = 0;
            if (!refusal.refused())
                refusal = store.insert(card, &id);
            if (refusal.refused())
                return refusalAnswer(refusal, m_layout);
            return {serverCodeText(ServerCode::Ok),
                    fieldsAnswer(u"InsRecTmcardRes", {{u"TmcardID", id}}, m_layout)};
        }
        if (command == QLatin1String("UpdRecTmcard")) {
            Timecard card;
            Refusal refusal = parseUpdateRequest(body, &card);
            qint64 revision = 0;
            if (!refusal.refused())
                refusal = store.update(card, &revision);
            if (refusal.refused())
                return refusalAnswer(refusal, m_layout);
            return {serverCodeText(ServerCode::Ok),
                    fieldsAnswer(u"UpdRecTmcardRes",
                                 {{u"TmcardID", card.id}, {u"Revision", revision}}, m_layout)};
        }
        if (command == QLatin1String("DelTmcard")) {
            DeleteRequest request;
            Refusal refusal = parseDeleteRequest(body, &request);
            if (!refusal.refused())
                refusal = store.remove(request.id, request.revision);
            if (refusal.refused())
                return refusalAnswer(refusal, m_layout);
            return {serverCodeText(ServerCode::Ok),
                    fieldsAnswer(u"DelTmcardRes", {{u"TmcardID", request.id}}, m_layout)};
        }
        return refusalAnswer({ServerCode::UnknownCommand,
                              QStringLiteral("unknown command \"%1\"").arg(command.left(60))},
                             m_layout);
    } catch (...) {
        // Out of memory on a huge body: refused, the transaction rolled back.
        return refusalAnswer({ServerCode::StorageFailure, QStringLiteral("internal failure")},
                             m_layout);
    }
}

bool RecordingServer::seed(const QString &getRecTmcardResXml, QString *error)
{
    Refusal refusal{ServerCode::StorageFailure, QStringLiteral("database not open")};
    if (m_open) {
        std::vector<Timecard> cards;
        refusal = parseTimecardList(getRecTmcardResXml, &cards);
        if (!refusal.refused())
            refusal = TimecardStore(m_connection, m_statementHook).replaceAll(cards);
    }
    if (refusal.refused() && error)
        *error = QStringLiteral("code %1: %2").arg(serverCodeText(refusal.code), refusal.reason);
    return !refusal.refused();
}

QString RecordingServer::dump()
{
    return handle(QStringLiteral("GetRecTmcard"),
                  QStringLiteral("<GetRecTmcard><TmcardAll>true</TmcardAll></GetRecTmcard>"))
        .content;
}

void RecordingServer::setStatementHook(std::function<void(int)> hook)
{
    m_statementHook = std::move(hook);
}

QString RecordingServer::defaultTimecardName()
{
    return QStringLiteral("Default Schedule");
}

QString RecordingServer::defaultTimecardMapping()
{
    // One continuous time frame over the whole week.
    return QStringLiteral(
        "<Ele><Frame><Name>Always</Name><Holiday>false</Holiday><RepeatMod>Weekly</RepeatMod>"
        "<DLMod>SingleDay</DLMod><Intervals><Ele B=\"0\" E=\"86400\"/></Intervals><DayList>"
        "<Ele B=\"1.0\"/><Ele B=\"2.0\"/><Ele B=\"3.0\"/><Ele B=\"4.0\"/><Ele B=\"5.0\"/>"
        "<Ele B=\"6.0\"/><Ele B=\"7.0\"/></DayList><Range><Period><TmS>2016-03-29 "
        "00:00:00.000</TmS><TmE>2035-01-01 00:00:00.000</TmE></Period><End>false</End></Range>"
        "<RepeatFreq>1</RepeatFreq></Frame><RecMode>Continuous</RecMode><AllEvent>true</AllEvent>"
        "<Motion>true</Motion><ContMotNum>1</ContMotNum><DigiInput>3</DigiInput></Ele>");
}

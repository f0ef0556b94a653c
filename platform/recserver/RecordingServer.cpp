#include "RecordingServer.h"

#include "Answers.h"
#include "RequestParser.h"
#include "TimecardStore.h"

#include <QSqlDatabase>

#include <atomic>

namespace {

QString uniqueConnectionName()
{
    static std::atomic<quint64> counter{0};
    return QStringLiteral("recserver-%1").arg(++counter);
}

const Refusal kNotOpen{ServerCode::StorageFailure, QStringLiteral("database not open")};

// The answer to a request: the first refusal on the way, or the text that
// write makes of the request and of what the store returned for it.
template <typename Request, typename CarryOut, typename Write>
ServerAnswer answer(const Result<Request> &request, AnswerLayout layout, CarryOut carryOut,
                    Write write)
{
    if (request.refused())
        return refusalAnswer(request.refusal(), layout);
    const auto outcome = carryOut(*request);
    if (outcome.refused())
        return refusalAnswer(outcome.refusal(), layout);
    return {serverCodeText(ServerCode::Ok), write(*request, *outcome)};
}

ServerAnswer answerRead(TimecardStore &store, const QString &body, AnswerLayout layout)
{
    return answer(
        parseReadRequest(body), layout,
        // An identifier that is not held is an empty answer, not a refusal.
        [&](const ReadRequest &request) {
            return store.read(request.all ? std::nullopt : std::optional<qint64>(request.id));
        },
        [&](const ReadRequest &, const std::vector<Timecard> &cards) {
            return timecardsAnswer(cards, layout);
        });
}

ServerAnswer answerInsert(TimecardStore &store, const QString &body, AnswerLayout layout)
{
    return answer(
        parseInsertRequest(body), layout, [&](const Timecard &card) { return store.insert(card); },
        [&](const Timecard &, qint64 id) {
            return fieldsAnswer(u"InsRecTmcardRes", {{u"TmcardID", id}}, layout);
        });
}

ServerAnswer answerUpdate(TimecardStore &store, const QString &body, AnswerLayout layout)
{
    return answer(
        parseUpdateRequest(body), layout, [&](const Timecard &card) { return store.update(card); },
        [&](const Timecard &card, qint64 revision) {
            return fieldsAnswer(u"UpdRecTmcardRes",
                                {{u"TmcardID", card.id}, {u"Revision", revision}}, layout);
        });
}

ServerAnswer answerDelete(TimecardStore &store, const QString &body, AnswerLayout layout)
{
    return answer(
        parseDeleteRequest(body), layout,
        [&](const DeleteRequest &request) { return store.remove(request.id, request.revision); },
        [&](const DeleteRequest &request, qint64) {
            return fieldsAnswer(u"DelTmcardRes", {{u"TmcardID", request.id}}, layout);
        });
}

using CommandHandler = ServerAnswer (*)(TimecardStore &, const QString &body, AnswerLayout);

const std::pair<QLatin1String, CommandHandler> kCommands[] = {
    {QLatin1String("GetRecTmcard"), &answerRead},
    {QLatin1String("InsRecTmcard"), &answerInsert},
    {QLatin1String("UpdRecTmcard"), &answerUpdate},
    {QLatin1String("DelTmcard"), &answerDelete},
};

} // namespace

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

Refusal RecordingServer::open()
{
    if (m_open)
        return {};
    Refusal refusal = TimecardStore(m_connection, m_statementHook).open(m_path);
    m_open = !refusal.refused();
    if (!m_open)
        QSqlDatabase::removeDatabase(m_connection);
    return refusal;
}

bool RecordingServer::isOpen() const
{
    return m_open;
}

ServerAnswer RecordingServer::handle(const QString &command, const QString &body)
{
    try {
        if (!m_open)
            return refusalAnswer(kNotOpen, m_layout);
        TimecardStore store(m_connection, m_statementHook);
        for (const auto &[name, answer] : kCommands) {
            if (command == name)
                return answer(store, body, m_layout);
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

Refusal RecordingServer::seed(const QString &getRecTmcardResXml)
{
    if (!m_open)
        return kNotOpen;
    const Result<std::vector<Timecard>> cards = parseTimecardList(getRecTmcardResXml);
    if (cards.refused())
        return cards.refusal();
    return TimecardStore(m_connection, m_statementHook).replaceAll(*cards);
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

#include "TimecardStore.h"

#include "RecordingServer.h"

#include <QSqlDatabase>
#include <QSqlError>
#include <QSqlQuery>
#include <QVariant>

#include <limits>

namespace {

// A null QString binds as SQL NULL; an empty text is still a text.
QString text(const QString &value)
{
    return value.isNull() ? QStringLiteral("") : value;
}

Refusal storageFailure(const QString &what, const QSqlError &error)
{
    return {ServerCode::StorageFailure, QStringLiteral("%1: %2").arg(what, error.text())};
}

const char *const kSchema[] = {
    "CREATE TABLE tmcard ("
    " id INTEGER PRIMARY KEY AUTOINCREMENT,"
    " revision INTEGER NOT NULL,"
    " name TEXT NOT NULL,"
    " mapping TEXT NOT NULL)",
    "CREATE TABLE cam ("
    " tmcard_id INTEGER NOT NULL REFERENCES tmcard(id) ON DELETE CASCADE,"
    " position INTEGER NOT NULL,"
    " name TEXT NOT NULL,"
    " grp_id INTEGER NOT NULL,"
    " PRIMARY KEY (tmcard_id, position)) WITHOUT ROWID",
};

} // namespace

// One transaction on the store's connection; rolled back unless committed.
// Write transactions take the write lock at once (BEGIN IMMEDIATE), so a
// second connection never has to upgrade a read lock halfway.
class TimecardStore::Transaction
{
public:
    Transaction(const QSqlDatabase &database, const std::function<void(int)> &hook, bool write)
        : m_database(database), m_hook(write ? &hook : nullptr)
    {
        QSqlQuery begin(m_database);
        m_active = begin.exec(write ? QStringLiteral("BEGIN IMMEDIATE") : QStringLiteral("BEGIN"));
        if (!m_active)
            m_failure = storageFailure(QStringLiteral("begin"), begin.lastError());
    }

    ~Transaction()
    {
        if (m_active)
            QSqlQuery(m_database).exec(QStringLiteral("ROLLBACK"));
    }

    Transaction(const Transaction &) = delete;
    Transaction &operator=(const Transaction &) = delete;

    bool active() const { return m_active; }
    const Refusal &failure() const { return m_failure; }

    QSqlQuery prepare(const QString &sql)
    {
        QSqlQuery query(m_database);
        query.setForwardOnly(true);
        if (!query.prepare(sql))
            m_failure = storageFailure(QStringLiteral("prepare"), query.lastError());
        return query;
    }

    bool exec(QSqlQuery &query)
    {
        if (m_failure.refused())
            return false;
        if (!query.exec()) {
            m_failure = storageFailure(QStringLiteral("statement"), query.lastError());
            return false;
        }
        if (m_hook && *m_hook)
            (*m_hook)(++m_statements);
        return true;
    }

    Refusal commit()
    {
        if (m_failure.refused())
            return m_failure;
        QSqlQuery commit(m_database);
        if (!commit.exec(QStringLiteral("COMMIT")))
            return storageFailure(QStringLiteral("commit"), commit.lastError());
        m_active = false;
        return {};
    }

private:
    QSqlDatabase m_database;
    const std::function<void(int)> *m_hook;
    bool m_active = false;
    int m_statements = 0;
    Refusal m_failure;
};

TimecardStore::TimecardStore(const QString &connectionName,
                             const std::function<void(int)> &statementHook)
    : m_connection(connectionName), m_statementHook(statementHook)
{}

QSqlDatabase TimecardStore::database() const
{
    return QSqlDatabase::database(m_connection, false);
}

bool TimecardStore::open(const QString &path, QString *error)
{
    QSqlDatabase db = QSqlDatabase::addDatabase(QStringLiteral("QSQLITE"), m_connection);
    db.setDatabaseName(path);
    // Another connection to the same file (a second server, a seeding tool)
    // may hold the write lock for a moment.
    db.setConnectOptions(QStringLiteral("QSQLITE_BUSY_TIMEOUT=5000"));
    const auto fail = [&](const QString &what, const QSqlError &sqlError) {
        if (error)
            *error = QStringLiteral("%1: %2: %3").arg(path, what, sqlError.text());
        db.close();
        return false;
    };
    if (!db.open())
        return fail(QStringLiteral("cannot open"), db.lastError());

    QSqlQuery pragma(db);
    // WAL: readers on other connections never block the writer. NORMAL
    // synchronisation keeps every committed write across a process crash.
    if (!pragma.exec(QStringLiteral("PRAGMA journal_mode=WAL")))
        return fail(QStringLiteral("not a database"), pragma.lastError());
    if (!pragma.exec(QStringLiteral("PRAGMA synchronous=NORMAL")) ||
        !pragma.exec(QStringLiteral("PRAGMA foreign_keys=ON")))
        return fail(QStringLiteral("settings"), pragma.lastError());

    static const std::function<void(int)> noHook;
    Transaction transaction(db, noHook, true);
    if (!transaction.active())
        return fail(QStringLiteral("begin"), db.lastError());
    QSqlQuery version = transaction.prepare(QStringLiteral("PRAGMA user_version"));
    if (!transaction.exec(version) || !version.next())
        return fail(QStringLiteral("schema version"), version.lastError());
    const int found = version.value(0).toInt();
    version.finish();
    if (found == kSchemaVersion)
        return transaction.commit().refused() ? fail(QStringLiteral("commit"), db.lastError())
                                              : true;
    if (found != 0) {
        if (error)
            *error = QStringLiteral("%1: schema version %2, this server knows %3")
                         .arg(path)
                         .arg(found)
                         .arg(kSchemaVersion);
        db.close();
        return false;
    }
    for (const char *statement : kSchema) {
        QSqlQuery create = transaction.prepare(QString::fromLatin1(statement));
        if (!transaction.exec(create))
            return fail(QStringLiteral("create schema"), create.lastError());
    }
    Timecard defaultCard;
    defaultCard.id = 1;
    defaultCard.revision = 1;
    defaultCard.name = RecordingServer::defaultTimecardName();
    defaultCard.mapping = RecordingServer::defaultTimecardMapping();
    qint64 id = 0;
    QSqlQuery setVersion =
        transaction.prepare(QStringLiteral("PRAGMA user_version=%1").arg(kSchemaVersion));
    if (insertCard(transaction, defaultCard, true, &id).refused() ||
        !transaction.exec(setVersion) || transaction.commit().refused())
        return fail(QStringLiteral("create schema"), db.lastError());
    return true;
}

void TimecardStore::close()
{
    QSqlDatabase db = database();
    db.close();
}

Refusal TimecardStore::readCards(const QString &where, qint64 id, std::vector<Timecard> *cards)
{
    // Both statements read one snapshot: a writer on another connection
    // cannot slip between the time cards and their cameras.
    Transaction transaction(database(), m_statementHook, false);
    if (!transaction.active())
        return transaction.failure();
    QSqlQuery cardQuery = transaction.prepare(
        QStringLiteral("SELECT id, revision, name, mapping FROM tmcard %1 ORDER BY id").arg(where));
    if (!where.isEmpty())
        cardQuery.addBindValue(id);
    if (!transaction.exec(cardQuery))
        return transaction.failure();
    while (cardQuery.next()) {
        Timecard card;
        card.id = cardQuery.value(0).toLongLong();
        card.revision = cardQuery.value(1).toLongLong();
        card.name = cardQuery.value(2).toString();
        card.mapping = cardQuery.value(3).toString();
        cards->push_back(std::move(card));
    }
    cardQuery.finish();
    if (cards->empty())
        return transaction.commit();

    QSqlQuery camQuery = transaction.prepare(
        QStringLiteral("SELECT tmcard_id, name, grp_id FROM cam %1 ORDER BY tmcard_id, position")
            .arg(where.isEmpty() ? QString() : QStringLiteral("WHERE tmcard_id = ?")));
    if (!where.isEmpty())
        camQuery.addBindValue(id);
    if (!transaction.exec(camQuery))
        return transaction.failure();
    auto card = cards->begin();
    while (camQuery.next()) {
        const qint64 owner = camQuery.value(0).toLongLong();
        while (card != cards->end() && card->id < owner)
            ++card;
        if (card == cards->end())
            break;
        if (card->id == owner)
            card->cameras.push_back({camQuery.value(1).toString(), camQuery.value(2).toLongLong()});
    }
    camQuery.finish();
    return transaction.commit();
}

Refusal TimecardStore::readAll(std::vector<Timecard> *cards)
{
    return readCards(QString(), 0, cards);
}

Refusal TimecardStore::readOne(qint64 id, std::optional<Timecard> *card)
{
    std::vector<Timecard> cards;
    const Refusal refusal = readCards(QStringLiteral("WHERE id = ?"), id, &cards);
    if (!refusal.refused() && !cards.empty())
        *card = std::move(cards.front());
    return refusal;
}

Refusal TimecardStore::insertCameras(Transaction &transaction, qint64 id,
                                     const std::vector<Camera> &cameras)
{
    QSqlQuery query = transaction.prepare(
        QStringLiteral("INSERT INTO cam (tmcard_id, position, name, grp_id) VALUES (?, ?, ?, ?)"));
    qint64 position = 0;
    for (const Camera &camera : cameras) {
        query.bindValue(0, id);
        query.bindValue(1, position++);
        query.bindValue(2, text(camera.name));
        query.bindValue(3, camera.group);
        if (!transaction.exec(query))
            return transaction.failure();
    }
    return transaction.failure();
}

Refusal TimecardStore::insertCard(Transaction &transaction, const Timecard &card, bool keepId,
                                  qint64 *id)
{
    QSqlQuery query = transaction.prepare(
        keepId
            ? QStringLiteral("INSERT INTO tmcard (id, revision, name, mapping) VALUES (?, ?, ?, ?)")
            : QStringLiteral("INSERT INTO tmcard (revision, name, mapping) VALUES (?, ?, ?)"));
    if (keepId)
        query.addBindValue(card.id);
    query.addBindValue(card.revision);
    query.addBindValue(text(card.name));
    query.addBindValue(text(card.mapping));
    if (!transaction.exec(query))
        return transaction.failure();
    *id = keepId ? card.id : query.lastInsertId().toLongLong();
    return insertCameras(transaction, *id, card.cameras);
}

Refusal TimecardStore::insert(const Timecard &card, qint64 *newId)
{
    Transaction transaction(database(), m_statementHook, true);
    if (!transaction.active())
        return transaction.failure();
    Timecard stored = card;
    stored.revision = 1;
    const Refusal refusal = insertCard(transaction, stored, false, newId);
    return refusal.refused() ? refusal : transaction.commit();
}

Refusal TimecardStore::checkRevision(Transaction &transaction, qint64 id, qint64 revision)
{
    QSqlQuery query =
        transaction.prepare(QStringLiteral("SELECT revision FROM tmcard WHERE id = ?"));
    query.addBindValue(id);
    if (!transaction.exec(query))
        return transaction.failure();
    if (!query.next())
        return {ServerCode::UnknownTimecard, QStringLiteral("no time card %1").arg(id)};
    const qint64 stored = query.value(0).toLongLong();
    query.finish();
    if (stored != revision)
        return {ServerCode::StaleRevision, QStringLiteral("time card %1 is at revision %2, not %3")
                                               .arg(id)
                                               .arg(stored)
                                               .arg(revision)};
    return {};
}

Refusal TimecardStore::update(const Timecard &card, qint64 *newRevision)
{
    Transaction transaction(database(), m_statementHook, true);
    if (!transaction.active())
        return transaction.failure();
    Refusal refusal = checkRevision(transaction, card.id, card.revision);
    if (refusal.refused())
        return refusal;
    if (card.revision == std::numeric_limits<qint64>::max())
        return {ServerCode::BadValue, QStringLiteral("revision cannot be raised further")};

    QSqlQuery query = transaction.prepare(
        QStringLiteral("UPDATE tmcard SET revision = ?, name = ?, mapping = ? WHERE id = ?"));
    query.addBindValue(card.revision + 1);
    query.addBindValue(text(card.name));
    query.addBindValue(text(card.mapping));
    query.addBindValue(card.id);
    QSqlQuery clear = transaction.prepare(QStringLiteral("DELETE FROM cam WHERE tmcard_id = ?"));
    clear.addBindValue(card.id);
    if (!transaction.exec(query) || !transaction.exec(clear))
        return transaction.failure();
    refusal = insertCameras(transaction, card.id, card.cameras);
    if (refusal.refused())
        return refusal;
    *newRevision = card.revision + 1;
    return transaction.commit();
}

Refusal TimecardStore::remove(qint64 id, qint64 revision)
{
    Transaction transaction(database(), m_statementHook, true);
    if (!transaction.active())
        return transaction.failure();
    const Refusal refusal = checkRevision(transaction, id, revision);
    if (refusal.refused())
        return refusal;
    QSqlQuery cameras = transaction.prepare(QStringLiteral("DELETE FROM cam WHERE tmcard_id = ?"));
    cameras.addBindValue(id);
    QSqlQuery card = transaction.prepare(QStringLiteral("DELETE FROM tmcard WHERE id = ?"));
    card.addBindValue(id);
    if (!transaction.exec(cameras) || !transaction.exec(card))
        return transaction.failure();
    return transaction.commit();
}

Refusal TimecardStore::replaceAll(const std::vector<Timecard> &cards)
{
    Transaction transaction(database(), m_statementHook, true);
    if (!transaction.active())
        return transaction.failure();
    QSqlQuery cameras = transaction.prepare(QStringLiteral("DELETE FROM cam"));
    QSqlQuery all = transaction.prepare(QStringLiteral("DELETE FROM tmcard"));
    // New identifiers continue after the seeded ones, not after what was there.
    QSqlQuery sequence =
        transaction.prepare(QStringLiteral("DELETE FROM sqlite_sequence WHERE name = 'tmcard'"));
    if (!transaction.exec(cameras) || !transaction.exec(all) || !transaction.exec(sequence))
        return transaction.failure();
    for (const Timecard &card : cards) {
        qint64 id = 0;
        const Refusal refusal = insertCard(transaction, card, true, &id);
        if (refusal.refused())
            return refusal;
    }
    return transaction.commit();
}

#include "TimecardStore.h"

#include <QFileInfo>
#include <QSqlDatabase>
#include <QSqlError>
#include <QSqlQuery>
#include <QVariant>

#include <algorithm>
#include <iterator>
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

Refusal openFailure(const QString &path, const QString &what, const QSqlError &error)
{
    return {ServerCode::StorageFailure, QStringLiteral("%1: %2: %3").arg(path, what, error.text())};
}

// Names the plug-in looks time cards up by: there may be one of each, or the
// plug-in would put cameras on whichever it found first.
const QLatin1String kFixedNames[] = {
    QLatin1String("KOLT2 Default Continuous Recording"),
    QLatin1String("KOLT2 Default Event Recording"),
    QLatin1String("KOLT2 Customize Recording"),
};

bool isFixedName(const QString &name)
{
    return std::find(std::begin(kFixedNames), std::end(kFixedNames), name) != std::end(kFixedNames);
}

// Decides from reads alone whether the file is ours, new or neither, so that
// a file that is not ours is left byte for byte as it was.
// A file whose schema version this server does not know; checked before the
// file is touched, and again inside the transaction that sets the schema up.
Refusal unknownVersion(const QString &path, int found, int knownVersion)
{
    return {ServerCode::StorageFailure,
            QStringLiteral("%1: schema version %2, this server knows %3")
                .arg(path)
                .arg(found)
                .arg(knownVersion)};
}

Refusal inspect(const QSqlDatabase &db, const QString &path, int knownVersion)
{
    QSqlQuery query(db);
    if (!query.exec(QStringLiteral("SELECT count(*) FROM sqlite_master")) || !query.next())
        return openFailure(path, QStringLiteral("not a database"), query.lastError());
    const bool hasTables = query.value(0).toLongLong() != 0;
    if (!query.exec(QStringLiteral("PRAGMA user_version")) || !query.next())
        return openFailure(path, QStringLiteral("not a database"), query.lastError());
    const int version = query.value(0).toInt();
    if (version != 0 && version != knownVersion)
        return unknownVersion(path, version, knownVersion);
    if (version == 0 && hasTables)
        return {ServerCode::StorageFailure,
                QStringLiteral("%1: not a time card database: it holds tables of another kind")
                    .arg(path)};
    return {};
}

// WAL: readers on other connections never block the writer. NORMAL
// synchronisation keeps every committed write across a process crash.
Refusal configure(const QSqlDatabase &db, const QString &path)
{
    QSqlQuery pragma(db);
    if (!pragma.exec(QStringLiteral("PRAGMA journal_mode=WAL")))
        return openFailure(path, QStringLiteral("not a database"), pragma.lastError());
    if (!pragma.exec(QStringLiteral("PRAGMA synchronous=NORMAL")) ||
        !pragma.exec(QStringLiteral("PRAGMA foreign_keys=ON")))
        return openFailure(path, QStringLiteral("settings"), pragma.lastError());
    return {};
}

// The time card a fresh database holds: one continuous time frame over the
// whole week.
Timecard defaultTimecard()
{
    Timecard card;
    card.id = 1;
    card.revision = 1;
    card.name = QStringLiteral("Default Schedule");
    card.mapping = QStringLiteral(
        "<Ele><Frame><Name>Always</Name><Holiday>false</Holiday><RepeatMod>Weekly</RepeatMod>"
        "<DLMod>SingleDay</DLMod><Intervals><Ele B=\"0\" E=\"86400\"/></Intervals><DayList>"
        "<Ele B=\"1.0\"/><Ele B=\"2.0\"/><Ele B=\"3.0\"/><Ele B=\"4.0\"/><Ele B=\"5.0\"/>"
        "<Ele B=\"6.0\"/><Ele B=\"7.0\"/></DayList><Range><Period><TmS>2016-03-29 "
        "00:00:00.000</TmS><TmE>2035-01-01 00:00:00.000</TmE></Period><End>false</End></Range>"
        "<RepeatFreq>1</RepeatFreq></Frame><RecMode>Continuous</RecMode><AllEvent>true</AllEvent>"
        "<Motion>true</Motion><ContMotNum>1</ContMotNum><DigiInput>3</DigiInput></Ele>");
    return card;
}

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

    // Runs a query whose %1 stands for "WHERE <column> = ?" with the
    // identifier bound, or for nothing when there is none.
    std::optional<QSqlQuery> select(const QString &sql, QLatin1String column,
                                    std::optional<qint64> id)
    {
        QSqlQuery query =
            prepare(sql.arg(id ? QStringLiteral("WHERE %1 = ?").arg(column) : QString()));
        if (id)
            query.addBindValue(*id);
        if (!exec(query))
            return std::nullopt;
        return query;
    }

    // The value once the transaction has committed, or why it did not.
    template <typename T> Result<T> commit(Result<T> value)
    {
        if (value.refused())
            return value;
        const Refusal refusal = commit();
        if (refusal.refused())
            return refusal;
        return value;
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

Refusal TimecardStore::open(const QString &path)
{
    QSqlDatabase db = QSqlDatabase::addDatabase(QStringLiteral("QSQLITE"), m_connection);
    db.setDatabaseName(path);
    // Another connection to the same file (a second server, a seeding tool)
    // may hold the write lock for a moment.
    db.setConnectOptions(QStringLiteral("QSQLITE_BUSY_TIMEOUT=5000"));
    // Said plainly: SQLite would open it for reading and fail at the first write.
    if (const QFileInfo file(path); file.exists() && !file.isWritable())
        return {ServerCode::StorageFailure,
                QStringLiteral("%1: the file is read-only, and the server writes to it").arg(path)};
    Refusal refusal = db.open() ? inspect(db, path, kSchemaVersion)
                                : openFailure(path, QStringLiteral("cannot open"), db.lastError());
    if (!refusal.refused())
        refusal = configure(db, path);
    if (!refusal.refused())
        refusal = prepareSchema(db, path);
    if (refusal.refused())
        db.close();
    return refusal;
}

Refusal TimecardStore::prepareSchema(const QSqlDatabase &db, const QString &path)
{
    static const std::function<void(int)> noHook;
    Transaction transaction(db, noHook, true);
    if (!transaction.active())
        return openFailure(path, QStringLiteral("begin"), db.lastError());
    QSqlQuery version = transaction.prepare(QStringLiteral("PRAGMA user_version"));
    if (!transaction.exec(version) || !version.next())
        return openFailure(path, QStringLiteral("schema version"), version.lastError());
    const int found = version.value(0).toInt();
    version.finish();
    if (found != 0 && found != kSchemaVersion)
        return unknownVersion(path, found, kSchemaVersion);
    if (found == 0) {
        const QSqlError error = createSchema(transaction);
        if (error.isValid())
            return openFailure(path, QStringLiteral("create schema"), error);
    }
    if (transaction.commit().refused())
        return openFailure(path,
                           found == 0 ? QStringLiteral("create schema") : QStringLiteral("commit"),
                           db.lastError());
    return {};
}

QSqlError TimecardStore::createSchema(Transaction &transaction)
{
    for (const char *statement : kSchema) {
        QSqlQuery create = transaction.prepare(QString::fromLatin1(statement));
        if (!transaction.exec(create))
            return create.lastError();
    }
    QSqlQuery setVersion =
        transaction.prepare(QStringLiteral("PRAGMA user_version=%1").arg(kSchemaVersion));
    if (insertCard(transaction, defaultTimecard(), true).refused() || !transaction.exec(setVersion))
        return database().lastError();
    return {};
}

Result<std::vector<Timecard>> TimecardStore::read(std::optional<qint64> id)
{
    // Both statements read one snapshot: a writer on another connection
    // cannot slip between the time cards and their cameras.
    Transaction transaction(database(), m_statementHook, false);
    if (!transaction.active())
        return transaction.failure();
    Result<std::vector<Timecard>> cards = readCards(transaction, id);
    if (!cards.refused() && !(*cards).empty()) {
        const Refusal refusal = readCameras(transaction, id, *cards);
        if (refusal.refused())
            return refusal;
    }
    return transaction.commit(std::move(cards));
}

Result<std::vector<Timecard>> TimecardStore::readCards(Transaction &transaction,
                                                       std::optional<qint64> id)
{
    std::optional<QSqlQuery> query = transaction.select(
        QStringLiteral("SELECT id, revision, name, mapping FROM tmcard %1 ORDER BY id"),
        QLatin1String("id"), id);
    if (!query)
        return transaction.failure();
    std::vector<Timecard> cards;
    while (query->next()) {
        Timecard card;
        card.id = query->value(0).toLongLong();
        card.revision = query->value(1).toLongLong();
        card.name = query->value(2).toString();
        card.mapping = query->value(3).toString();
        cards.push_back(std::move(card));
    }
    return cards;
}

// Puts each camera on its time card; cards are in identifier order.
Refusal TimecardStore::readCameras(Transaction &transaction, std::optional<qint64> id,
                                   std::vector<Timecard> &cards)
{
    std::optional<QSqlQuery> query = transaction.select(
        QStringLiteral("SELECT tmcard_id, name, grp_id FROM cam %1 ORDER BY tmcard_id, position"),
        QLatin1String("tmcard_id"), id);
    if (!query)
        return transaction.failure();
    auto card = cards.begin();
    while (query->next()) {
        const qint64 owner = query->value(0).toLongLong();
        while (card != cards.end() && card->id < owner)
            ++card;
        if (card == cards.end())
            break;
        if (card->id == owner)
            card->cameras.push_back({query->value(1).toString(), query->value(2).toLongLong()});
    }
    return {};
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

Result<qint64> TimecardStore::insertCard(Transaction &transaction, const Timecard &card,
                                         bool keepId)
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
    const qint64 id = keepId ? card.id : query.lastInsertId().toLongLong();
    const Refusal refusal = insertCameras(transaction, id, card.cameras);
    if (refusal.refused())
        return refusal;
    return id;
}

// Checked in the write's own transaction, so two writers cannot both pass.
Refusal TimecardStore::checkFixedName(Transaction &transaction, const QString &name,
                                      qint64 exceptId)
{
    if (!isFixedName(name))
        return {};
    QSqlQuery query = transaction.prepare(
        QStringLiteral("SELECT id FROM tmcard WHERE name = ? AND id <> ? ORDER BY id LIMIT 1"));
    query.addBindValue(name);
    query.addBindValue(exceptId);
    if (!transaction.exec(query))
        return transaction.failure();
    if (!query.next())
        return {};
    return {ServerCode::FixedNameTaken, QStringLiteral("time card %1 is named \"%2\" already")
                                            .arg(query.value(0).toLongLong())
                                            .arg(name)};
}

// AUTOINCREMENT takes one past the highest identifier ever used.
Refusal TimecardStore::checkIdentifierLeft(Transaction &transaction)
{
    QSqlQuery query = transaction.prepare(QStringLiteral(
        "SELECT max(ifnull((SELECT seq FROM sqlite_sequence WHERE name = 'tmcard'), 0),"
        " ifnull((SELECT max(id) FROM tmcard), 0))"));
    if (!transaction.exec(query) || !query.next())
        return transaction.failure();
    if (query.value(0).toLongLong() >= kMaxTimecardId)
        return {ServerCode::NoIdentifierLeft,
                QStringLiteral("no time card identifier left up to %1").arg(kMaxTimecardId)};
    return {};
}

Result<qint64> TimecardStore::insert(const Timecard &card)
{
    Transaction transaction(database(), m_statementHook, true);
    if (!transaction.active())
        return transaction.failure();
    Refusal refusal = checkFixedName(transaction, card.name, 0);
    if (!refusal.refused())
        refusal = checkIdentifierLeft(transaction);
    if (refusal.refused())
        return refusal;
    Timecard stored = card;
    stored.revision = 1;
    return transaction.commit(insertCard(transaction, stored, false));
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

Result<qint64> TimecardStore::update(const Timecard &card)
{
    Transaction transaction(database(), m_statementHook, true);
    if (!transaction.active())
        return transaction.failure();
    Refusal refusal = checkRevision(transaction, card.id, card.revision);
    if (refusal.refused())
        return refusal;
    if (card.revision == std::numeric_limits<qint64>::max())
        return Refusal{ServerCode::BadValue, QStringLiteral("revision cannot be raised further")};
    refusal = checkFixedName(transaction, card.name, card.id);
    if (refusal.refused())
        return refusal;

    const qint64 revision = card.revision + 1;
    QSqlQuery query = transaction.prepare(
        QStringLiteral("UPDATE tmcard SET revision = ?, name = ?, mapping = ? WHERE id = ?"));
    query.addBindValue(revision);
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
    return transaction.commit(Result<qint64>(revision));
}

Result<qint64> TimecardStore::remove(qint64 id, qint64 revision)
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
    return transaction.commit(Result<qint64>(id));
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
        const Result<qint64> id = insertCard(transaction, card, true);
        if (id.refused())
            return id.refusal();
    }
    return transaction.commit();
}

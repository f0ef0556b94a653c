#pragma once

#include "Timecard.h"

#include <QString>

#include <functional>
#include <optional>
#include <vector>

class QSqlDatabase;

// The time cards in SQLite: tables "tmcard" and "cam", schema version in
// PRAGMA user_version. Each write is one BEGIN IMMEDIATE transaction that is
// rolled back on any refusal or failure. Used on one thread only, through
// the connection the owner named.
class TimecardStore
{
public:
    static constexpr int kSchemaVersion = 1;

    TimecardStore(const QString &connectionName, const std::function<void(int)> &statementHook);

    // Opens (creating on first use) the schema and the default time card.
    bool open(const QString &path, QString *error);
    void close();

    Refusal readAll(std::vector<Timecard> *cards);
    Refusal readOne(qint64 id, std::optional<Timecard> *card);
    Refusal insert(const Timecard &card, qint64 *newId);
    Refusal update(const Timecard &card, qint64 *newRevision);
    Refusal remove(qint64 id, qint64 revision);
    Refusal replaceAll(const std::vector<Timecard> &cards);

private:
    class Transaction;

    QSqlDatabase database() const;
    Refusal readCards(const QString &where, qint64 id, std::vector<Timecard> *cards);
    Refusal checkRevision(Transaction &transaction, qint64 id, qint64 revision);
    Refusal insertCameras(Transaction &transaction, qint64 id, const std::vector<Camera> &cameras);
    Refusal insertCard(Transaction &transaction, const Timecard &card, bool keepId, qint64 *id);

    QString m_connection;
    const std::function<void(int)> &m_statementHook;
};

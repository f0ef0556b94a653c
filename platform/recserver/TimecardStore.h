#pragma once

#include "Refusal.h"
#include "Timecard.h"

#include <QString>

#include <functional>
#include <optional>
#include <vector>

class QSqlDatabase;
class QSqlError;

// The time cards in SQLite: tables "tmcard" and "cam", schema version in
// PRAGMA user_version. Each write is one BEGIN IMMEDIATE transaction that is
// rolled back on any refusal or failure. Used on one thread only, through
// the connection the owner named.
class TimecardStore
{
public:
    static constexpr int kSchemaVersion = 1;

    TimecardStore(const QString &connectionName, const std::function<void(int)> &statementHook);

    // Opens the file, creating the schema and the default time card on
    // first use: identifier 1, "Default Schedule", continuous all week. A
    // file that is read-only, of a newer version or of another program (tables
    // but no version) is refused before anything is written to it.
    Refusal open(const QString &path);

    // Every time card, or the one with this identifier (none when it is not
    // held), in identifier order.
    Result<std::vector<Timecard>> read(std::optional<qint64> id);
    // The new time card's identifier, from 1 to kMaxTimecardId; refused
    // when another time card holds the fixed name it carries.
    Result<qint64> insert(const Timecard &card);
    // The time card's new revision.
    Result<qint64> update(const Timecard &card);
    // The removed time card's identifier.
    Result<qint64> remove(qint64 id, qint64 revision);
    Refusal replaceAll(const std::vector<Timecard> &cards);

private:
    class Transaction;

    QSqlDatabase database() const;
    Refusal prepareSchema(const QSqlDatabase &db, const QString &path);
    QSqlError createSchema(Transaction &transaction);
    Result<std::vector<Timecard>> readCards(Transaction &transaction, std::optional<qint64> id);
    Refusal readCameras(Transaction &transaction, std::optional<qint64> id,
                        std::vector<Timecard> &cards);
    Refusal checkRevision(Transaction &transaction, qint64 id, qint64 revision);
    // Refused when a time card other than exceptId holds this fixed name.
    Refusal checkFixedName(Transaction &transaction, const QString &name, qint64 exceptId);
    Refusal checkIdentifierLeft(Transaction &transaction);
    Refusal insertCameras(Transaction &transaction, qint64 id, const std::vector<Camera> &cameras);
    Result<qint64> insertCard(Transaction &transaction, const Timecard &card, bool keepId);

    QString m_connection;
    const std::function<void(int)> &m_statementHook;
};

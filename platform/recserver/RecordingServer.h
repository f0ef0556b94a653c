#pragma once

#include "AnswerLayout.h"
#include "Refusal.h"
#include "ServerCode.h"

#include <QString>

#include <functional>

// The simulated recording server: answers "GetRecTmcard", "InsRecTmcard",
// "UpdRecTmcard" and "DelTmcard" over one SQLite database file (WAL).
//
// Threading: an instance owns its own database connection (a connection name
// unique to the instance) and must be created, used and destroyed on one
// thread. Several instances, on several threads or processes, may open the
// same file: each write is one immediate transaction, so they serialise.
class RecordingServer final
{
public:
    explicit RecordingServer(const QString &databasePath,
                             AnswerLayout layout = AnswerLayout::Compact);
    ~RecordingServer();
    RecordingServer(const RecordingServer &) = delete;
    RecordingServer &operator=(const RecordingServer &) = delete;

    // Opens the database, creating the schema and the default time card on a
    // fresh file. Refused, with the reason, when the file cannot be opened or
    // holds a schema this server does not know.
    Refusal open();
    bool isOpen() const;

    // One request. Never throws; every failure is a non-zero code, and a
    // request that is refused leaves the database exactly as it was.
    ServerAnswer handle(const QString &command, const QString &body);

    // Replaces every time card with those of a "GetRecTmcardRes" document,
    // identifiers and revisions kept. When refused nothing changes.
    Refusal seed(const QString &getRecTmcardResXml);
    // The "GetRecTmcardRes" answer to a read of all time cards.
    QString dump();

    AnswerLayout layout() const { return m_layout; }
    void setLayout(AnswerLayout layout) { m_layout = layout; }
    QString databasePath() const { return m_path; }

    // Called after each statement of a write transaction, before the commit,
    // with the statement's number (from 1). Tests use it to kill the process
    // in the middle of a write.
    void setStatementHook(std::function<void(int statement)> hook);

private:
    QString m_path;
    QString m_connection;
    AnswerLayout m_layout;
    std::function<void(int)> m_statementHook;
    bool m_open = false;
};

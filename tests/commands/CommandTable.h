#pragma once

// A client command as a table row, against the real plug-in and recording server.
// Time cards are written compactly, parts separated by " | ":
//   #5 Lobby {lobby} [C_1/1 C_2/2]
// identifier, name, mapping (an alias of CommandTable.cpp or the XML itself)
// and cameras (name/group); mapping and cameras left out when there are none.

#include "LivePlugin.h"
#include "RowName.h"

#include <gtest/gtest.h>

struct CommandRow
{
    const char *name;
    QString seed; // empty: the fresh server's default time card; seeded revisions are 1
    QString command;
    QVariant payload;
    QString messages; // the commands sent, each with its time card: "GetRecTmcard(all)"
    QString after;    // the time cards afterwards; empty: as seeded
    bool flag;
    QString code;
    QVariant data = QVariant();
    QStringList alter = {}; // SQL run on the server's file after the seed
    friend void PrintTo(const CommandRow &row, std::ostream *os) { *os << row.name; }
};

// A "GetRecTmcardRes" text holding the time cards written compactly.
QString seedDocument(const QString &timecards);
// Camera entries as clients send them, from "C_1/1 C_2/2".
QVariantList cameras(const QString &namesAndGroups);

// Each row: seed, send, check what was sent, the time cards after and the reply.
class Commands : public ::testing::TestWithParam<CommandRow>
{};

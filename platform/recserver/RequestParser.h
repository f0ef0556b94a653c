#pragma once

#include "Timecard.h"

#include <QString>

#include <vector>

// Readers of the four request bodies and of a "GetRecTmcardRes" document.
// Each checks the whole body before anything is stored: the root must be the
// command's, required elements present once, numbers decimal integers.

struct ReadRequest
{
    bool all = false;
    qint64 id = 0;
};

struct DeleteRequest
{
    qint64 revision = 0;
    qint64 id = 0;
};

Refusal parseReadRequest(const QString &body, ReadRequest *request);
// Revision and identifier are optional in an insert and ignored.
Refusal parseInsertRequest(const QString &body, Timecard *card);
// A camera's group may come as "RecGrpID" (composed updates) or "GrpID"
// (a time card text taken from a read answer).
Refusal parseUpdateRequest(const QString &body, Timecard *card);
Refusal parseDeleteRequest(const QString &body, DeleteRequest *request);
// Identifiers must be unique within the document.
Refusal parseTimecardList(const QString &document, std::vector<Timecard> *cards);

#pragma once

#include "Refusal.h"
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

Result<ReadRequest> parseReadRequest(const QString &body);
// Revision and identifier are optional in an insert and ignored.
Result<Timecard> parseInsertRequest(const QString &body);
// A camera's group may come as "RecGrpID" (composed updates) or "GrpID"
// (a time card text taken from a read answer).
Result<Timecard> parseUpdateRequest(const QString &body);
Result<DeleteRequest> parseDeleteRequest(const QString &body);
// Identifiers must be unique within the document, from 1 to kMaxTimecardId.
Result<std::vector<Timecard>> parseTimecardList(const QString &document);

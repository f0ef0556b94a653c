#pragma once

#include <QString>

// The response codes of the simulated recording server. "0" is the only code
// the plug-in treats as success; every other code means the request changed
// nothing. The numbers are part of the server's wire behaviour: keep them.
enum class ServerCode : int {
    Ok = 0,
    MalformedXml = 1,      // not well-formed, empty, a DTD, or content after the root
    UnknownCommand = 2,    // a command the server does not speak
    WrongRoot = 3,         // the body's root element is not the command's
    BadStructure = 4,      // a required element missing, repeated, or one not expected;
                           // elements nested deeper than XmlCursor::kMaxDepth
    BadValue = 5,          // a number that is not a decimal integer in range, an empty
                           // camera name, "TmcardAll" other than true
    UnknownTimecard = 6,   // update or delete of an identifier the server does not hold
    StaleRevision = 7,     // update or delete with a revision other than the stored one
    StorageFailure = 8,    // the database refused or failed the statement
    FixedNameTaken = 9,    // another time card holds the fixed name inserted or given
    NoIdentifierLeft = 10, // every identifier clients can read (31 bits) has been used
};

inline QString serverCodeText(ServerCode code)
{
    return QString::number(static_cast<int>(code));
}

// One answer of the server.
struct ServerAnswer
{
    QString code;    // "0" when the request was carried out; see ServerCode
    QString content; // the XML answer; for a refusal an <Error> element
};

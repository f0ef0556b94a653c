#pragma once

#include <QString>
#include <QStringView>

#include <optional>

// The raw text of a one-card "GetRecTmcardRes" answer, edited in place so
// that the time card goes back to the server exactly as it was read, with
// only its camera list replaced.
namespace TimecardAnswerText {

// The "Tmcard" element inside the answer's "<GetRecTmcardRes>" frame (white
// space and an XML declaration before it skipped); nothing when the answer
// is not framed so.
std::optional<QString> timecardOf(const QString &answer);

// Where a camera list goes in a time card text.
struct CameraListPlace
{
    enum Kind {
        Replace,    // the span [start, start + length) is the whole "CamList" element
        Insert,     // no camera list: a new one goes at start, before "</Tmcard>"
        Unchanged,  // no place for a camera list: the text goes back as it is
        Unreadable, // a camera list that is never closed inside the time card
    };
    Kind kind = Unchanged;
    qsizetype start = 0;
    qsizetype length = 0;
};
CameraListPlace cameraListIn(QStringView timecard);

// Whether a request body is one well-formed XML element: the server must
// never get a half-edited answer.
bool isWellFormed(const QString &body);

} // namespace TimecardAnswerText

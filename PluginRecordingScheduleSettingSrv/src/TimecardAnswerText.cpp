#include "TimecardAnswerText.h"

#include <QXmlStreamReader>

namespace TimecardAnswerText {
namespace {

const QString AnswerOpen = QStringLiteral("<GetRecTmcardRes>");
const QString AnswerClose = QStringLiteral("</GetRecTmcardRes>");
const QString DeclarationOpen = QStringLiteral("<?xml");
const QString DeclarationClose = QStringLiteral("?>");
const QString CameraListOpen = QStringLiteral("<CamList>");
const QString CameraListEmpty = QStringLiteral("<CamList/>");
const QString CameraListClose = QStringLiteral("</CamList>");
const QString TimecardClose = QStringLiteral("</Tmcard>");

} // namespace

std::optional<QString> timecardOf(const QString &answer)
{
    QStringView text = QStringView(answer).trimmed();
    if (text.startsWith(DeclarationOpen)) {
        const qsizetype end = text.indexOf(DeclarationClose);
        if (end < 0)
            return std::nullopt;
        text = text.mid(end + DeclarationClose.size()).trimmed();
    }
    // Checked, not cut blindly: any other answer would lose its first and
    // last characters and go back to the server garbled.
    if (text.size() < AnswerOpen.size() + AnswerClose.size() || !text.startsWith(AnswerOpen) ||
        !text.endsWith(AnswerClose))
        return std::nullopt;
    return text.mid(AnswerOpen.size(), text.size() - AnswerOpen.size() - AnswerClose.size())
        .toString();
}

CameraListPlace cameraListIn(QStringView timecard)
{
    const qsizetype end = timecard.indexOf(TimecardClose);
    const qsizetype open = timecard.indexOf(CameraListOpen);
    if (open < 0) {
        const qsizetype empty = timecard.indexOf(CameraListEmpty);
        if (empty > 0 && empty < end)
            return {CameraListPlace::Replace, empty, CameraListEmpty.size()};
        if (end > 0)
            return {CameraListPlace::Insert, end, 0};
        return {};
    }
    if (open < 1 || end < 1 || end < open)
        return {};
    // Through "</CamList>" only: what follows the camera list inside the
    // time card would otherwise be dropped.
    const qsizetype close = timecard.indexOf(CameraListClose, open);
    if (close < 0 || close > end)
        return {CameraListPlace::Unreadable, 0, 0};
    return {CameraListPlace::Replace, open, close + CameraListClose.size() - open};
}

bool isWellFormed(const QString &body)
{
    QXmlStreamReader reader(body);
    while (!reader.atEnd())
        reader.readNext();
    return !reader.hasError();
}

} // namespace TimecardAnswerText

#include "ClientInput.h"

#include "TraceLog.h"

#include <QJsonDocument>

namespace ClientInput {

std::optional<int> timecardId(const QString &text)
{
    const int first = text.startsWith(QLatin1Char('-')) ? 1 : 0;
    if (text.size() == first)
        return std::nullopt;
    for (qsizetype i = first; i < text.size(); ++i) {
        const char16_t c = text.at(i).unicode();
        if (c < u'0' || c > u'9')
            return std::nullopt;
    }
    bool inRange = false;
    const int value = text.toInt(&inRange, 10);
    return inRange ? std::optional<int>(value) : std::nullopt;
}

std::optional<QJsonObject> timeframes(const QString &content)
{
    const QJsonDocument document = QJsonDocument::fromJson(content.toUtf8());
    if (document.isObject())
        return document.object();
    TRACE_ERROR("Time frames parse error. %s", content.toLocal8Bit().constData());
    return std::nullopt;
}

} // namespace ClientInput

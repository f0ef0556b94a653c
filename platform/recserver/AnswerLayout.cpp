#include "AnswerLayout.h"

std::optional<AnswerLayout> parseAnswerLayout(const QString &text)
{
    const QString word = text.trimmed().toLower();
    if (word == QLatin1String("compact"))
        return AnswerLayout::Compact;
    if (word == QLatin1String("indented"))
        return AnswerLayout::Indented;
    if (word == QLatin1String("crlf"))
        return AnswerLayout::Crlf;
    return std::nullopt;
}

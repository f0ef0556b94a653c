#include "TimecardTemplate.h"

namespace TimecardTemplate {

void appendFilled(QString &out, QStringView pattern, std::initializer_list<QStringView> args)
{
    const auto count = static_cast<int>(args.size());
    qsizetype copied = 0;
    for (qsizetype i = 0; i + 1 < pattern.size(); ++i) {
        if (pattern[i] != u'%')
            continue;
        const int marker = pattern[i + 1].digitValue();
        if (marker < 1 || marker > count)
            continue;
        out.append(pattern.mid(copied, i - copied));
        out.append(args.begin()[marker - 1]);
        copied = i + 2;
        ++i;
    }
    out.append(pattern.mid(copied));
}

QString filled(QStringView pattern, std::initializer_list<QStringView> args)
{
    // One allocation: a body may carry megabytes of mapping content.
    qsizetype size = pattern.size();
    for (const QStringView arg : args)
        size += arg.size();
    QString out;
    out.reserve(size);
    appendFilled(out, pattern, args);
    return out;
}

namespace {

// Characters XML 1.0 cannot carry at all, not even as a reference.
bool isXmlChar(char32_t c)
{
    return c == 0x9 || c == 0xA || c == 0xD || (c >= 0x20 && c <= 0xD7FF) ||
           (c >= 0xE000 && c <= 0xFFFD) || (c >= 0x10000 && c <= 0x10FFFF);
}

} // namespace

void appendEscaped(QString &out, QStringView text)
{
    qsizetype copied = 0;
    const auto flush = [&](qsizetype upTo) { out.append(text.mid(copied, upTo - copied)); };
    for (qsizetype i = 0; i < text.size(); ++i) {
        const QChar c = text[i];
        const char16_t u = c.unicode();
        QStringView replacement;
        qsizetype width = 1;
        switch (u) {
        case u'&':
            replacement = u"&amp;";
            break;
        case u'<':
            replacement = u"&lt;";
            break;
        case u'>':
            replacement = u"&gt;";
            break;
        case u'"':
            replacement = u"&quot;";
            break;
        case u'\'':
            replacement = u"&apos;";
            break;
        // A reader would turn a bare carriage return into a line feed.
        case u'\r':
            replacement = u"&#13;";
            break;
        default:
            if (c.isHighSurrogate() && i + 1 < text.size() && text[i + 1].isLowSurrogate())
                width = 2;
            else if (c.isSurrogate() || !isXmlChar(u))
                replacement = u"\uFFFD";
        }
        if (!replacement.isNull()) {
            flush(i);
            out.append(replacement);
            copied = i + 1;
        }
        i += width - 1;
    }
    flush(text.size());
}

QString escaped(QStringView text)
{
    QString out;
    out.reserve(text.size());
    appendEscaped(out, text);
    return out;
}

} // namespace TimecardTemplate

#include "XmlOut.h"

#include <QXmlStreamReader>

#include <algorithm>
#include <iterator>

XmlOut::XmlOut(QString *out, AnswerLayout layout) : m_out(out), m_layout(layout)
{}

namespace {

struct Entity
{
    char16_t character;
    QLatin1String text;
};

// A raw CR would be folded into a line end by every reader.
const Entity kEntities[] = {
    {u'&', QLatin1String("&amp;")},   {u'<', QLatin1String("&lt;")},
    {u'>', QLatin1String("&gt;")},    {u'"', QLatin1String("&quot;")},
    {u'\'', QLatin1String("&apos;")}, {u'\r', QLatin1String("&#13;")},
};

} // namespace

QString XmlOut::escaped(QStringView text)
{
    QString result;
    result.reserve(text.size());
    for (qsizetype i = 0; i < text.size(); ++i) {
        const QChar c = text[i];
        // Most characters lie above every one that needs care.
        if (c.unicode() > u'>' && c.unicode() < 0xD800) {
            result += c;
            continue;
        }
        const auto entity = std::find_if(std::begin(kEntities), std::end(kEntities),
                                         [c](const Entity &e) { return e.character == c; });
        if (entity != std::end(kEntities)) {
            result += entity->text;
        } else if (c.isHighSurrogate() && i + 1 < text.size() && text[i + 1].isLowSurrogate()) {
            result += c;
            result += text[++i];
        } else if ((c.unicode() < 0x20 && c != u'\t' && c != u'\n') || c.isSurrogate() ||
                   c.unicode() >= 0xFFFE) {
            // Not a character XML can carry (a reason may quote raw input).
            result += QChar(QChar::ReplacementCharacter);
        } else {
            result += c;
        }
    }
    return result;
}

static QString escapedAttribute(QStringView text)
{
    QString result = XmlOut::escaped(text);
    // Attribute values are normalised by readers: keep these as written.
    result.replace(QLatin1Char('\n'), QLatin1String("&#10;"));
    result.replace(QLatin1Char('\t'), QLatin1String("&#9;"));
    return result;
}

void XmlOut::lineBreak(std::size_t depth)
{
    if (m_layout == AnswerLayout::Compact)
        return;
    if (m_layout == AnswerLayout::Crlf) {
        *m_out += QLatin1String("\r\n");
        return;
    }
    *m_out += QLatin1Char('\n');
    *m_out += QString(static_cast<qsizetype>(depth * 2), QLatin1Char(' '));
}

void XmlOut::openTag(QStringView name, const QXmlStreamAttributes &attributes, bool isEmpty)
{
    if (!m_levels.empty()) {
        Level &parent = m_levels.back();
        if (!parent.hasText)
            lineBreak(m_levels.size());
        parent.hasChildren = true;
    }
    *m_out += QLatin1Char('<');
    *m_out += name;
    for (const QXmlStreamAttribute &attribute : attributes) {
        *m_out += QLatin1Char(' ');
        *m_out += attribute.qualifiedName();
        *m_out += QLatin1String("=\"");
        *m_out += escapedAttribute(attribute.value());
        *m_out += QLatin1Char('"');
    }
    *m_out += isEmpty ? QLatin1String("/>") : QLatin1String(">");
}

void XmlOut::start(QStringView name, const QXmlStreamAttributes &attributes)
{
    openTag(name, attributes, false);
    m_levels.push_back({});
}

void XmlOut::empty(QStringView name, const QXmlStreamAttributes &attributes)
{
    openTag(name, attributes, true);
}

void XmlOut::text(QStringView text)
{
    if (!m_levels.empty())
        m_levels.back().hasText = true;
    *m_out += escaped(text);
}

void XmlOut::end(QStringView name)
{
    const Level level = m_levels.back();
    m_levels.pop_back();
    if (level.hasChildren && !level.hasText)
        lineBreak(m_levels.size());
    *m_out += QLatin1String("</");
    *m_out += name;
    *m_out += QLatin1Char('>');
}

void XmlOut::leaf(QStringView name, QStringView text)
{
    start(name);
    this->text(text);
    end(name);
}

void XmlOut::content(const QString &compactXml)
{
    if (compactXml.isEmpty())
        return;
    if (m_layout == AnswerLayout::Compact) {
        if (!m_levels.empty())
            m_levels.back().hasChildren = true;
        *m_out += compactXml;
        return;
    }
    // Laid out again element by element; the stored text is well-formed
    // because the server wrote it, the wrapper only gives it a single root.
    QXmlStreamReader reader(QLatin1String("<c>") + compactXml + QLatin1String("</c>"));
    reader.setNamespaceProcessing(false);
    int depth = 0;
    QString pendingName;
    QXmlStreamAttributes pendingAttributes;
    qint64 pendingOffset = -1;
    const auto flushPending = [&] {
        if (pendingOffset < 0)
            return;
        start(pendingName, pendingAttributes);
        pendingOffset = -1;
    };
    while (!reader.atEnd()) {
        switch (reader.readNext()) {
        case QXmlStreamReader::StartElement:
            flushPending();
            if (depth++ == 0)
                break;
            pendingName = reader.qualifiedName().toString();
            pendingAttributes = reader.attributes();
            pendingOffset = reader.characterOffset();
            break;
        case QXmlStreamReader::EndElement:
            if (--depth == 0)
                break;
            if (pendingOffset >= 0 && pendingOffset == reader.characterOffset()) {
                empty(pendingName, pendingAttributes);
                pendingOffset = -1;
            } else {
                flushPending();
                end(reader.qualifiedName());
            }
            break;
        case QXmlStreamReader::Characters:
            flushPending();
            if (depth > 0)
                text(reader.text());
            break;
        default:
            break;
        }
    }
}

void XmlOut::finish()
{
    if (m_layout == AnswerLayout::Compact)
        return;
    *m_out += m_layout == AnswerLayout::Crlf ? QLatin1String("\r\n") : QLatin1String("\n");
}

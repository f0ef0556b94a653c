#include "XmlCursor.h"

#include "XmlOut.h"

namespace {

bool isWhiteSpace(QStringView text)
{
    for (const QChar c : text) {
        if (!c.isSpace())
            return false;
    }
    return true;
}

} // namespace

XmlCursor::XmlCursor(const QString &text) : m_reader(text)
{
    m_reader.setNamespaceProcessing(false);
}

bool XmlCursor::refuse(ServerCode code, const QString &reason)
{
    if (!m_refusal.refused())
        m_refusal = {code, reason};
    return false;
}

bool XmlCursor::xmlError()
{
    // A malformed body outranks whatever was found wrong in it before.
    m_refusal = {ServerCode::MalformedXml, m_reader.errorString().isEmpty()
                                               ? QStringLiteral("not well-formed XML")
                                               : m_reader.errorString()};
    return false;
}

QXmlStreamReader::TokenType XmlCursor::nextToken()
{
    if (m_reader.atEnd()) {
        xmlError();
        return QXmlStreamReader::NoToken;
    }
    const QXmlStreamReader::TokenType token = m_reader.readNext();
    switch (token) {
    case QXmlStreamReader::Invalid:
        xmlError();
        return QXmlStreamReader::NoToken;
    case QXmlStreamReader::EntityReference:
    case QXmlStreamReader::DTD:
        refuse(ServerCode::MalformedXml, QStringLiteral("unexpected markup"));
        return QXmlStreamReader::NoToken;
    case QXmlStreamReader::StartElement:
        if (++m_depth > kMaxDepth) {
            refuse(ServerCode::BadStructure,
                   QStringLiteral("nested deeper than %1 levels").arg(kMaxDepth));
            return QXmlStreamReader::NoToken;
        }
        return token;
    case QXmlStreamReader::EndElement:
        --m_depth;
        return token;
    default:
        return token;
    }
}

bool XmlCursor::enterRoot()
{
    while (!m_reader.atEnd()) {
        switch (m_reader.readNext()) {
        case QXmlStreamReader::StartElement:
            m_depth = 1;
            return true;
        case QXmlStreamReader::DTD:
            m_refusal = {ServerCode::MalformedXml, QStringLiteral("a DTD is not accepted")};
            return false;
        case QXmlStreamReader::Characters:
            if (!m_reader.isWhitespace())
                return xmlError();
            break;
        case QXmlStreamReader::Invalid:
            return xmlError();
        default:
            break;
        }
    }
    return xmlError();
}

bool XmlCursor::nextChild()
{
    if (refused())
        return false;
    for (;;) {
        switch (nextToken()) {
        case QXmlStreamReader::NoToken:
            return false;
        case QXmlStreamReader::StartElement:
            return true;
        case QXmlStreamReader::EndElement:
            return false;
        case QXmlStreamReader::Characters:
            if (!isWhiteSpace(m_reader.text()))
                return refuse(ServerCode::BadStructure,
                              QStringLiteral("unexpected text \"%1\"")
                                  .arg(m_reader.text().left(40).toString()));
            break;
        default:
            break;
        }
    }
}

std::optional<QString> XmlCursor::readText()
{
    QString text;
    const QString element = name();
    for (;;) {
        switch (nextToken()) {
        case QXmlStreamReader::NoToken:
            return std::nullopt;
        case QXmlStreamReader::Characters:
            text += m_reader.text();
            break;
        case QXmlStreamReader::EndElement:
            return text;
        case QXmlStreamReader::StartElement:
            refuse(ServerCode::BadStructure,
                   QStringLiteral("<%1> inside <%2>").arg(name(), element));
            return std::nullopt;
        default:
            break;
        }
    }
}

std::optional<qint64> XmlCursor::readInteger()
{
    const QString element = name();
    const std::optional<QString> text = readText();
    if (!text)
        return std::nullopt;
    const QString trimmed = text->trimmed();
    bool ok = false;
    const qint64 number = trimmed.toLongLong(&ok, 10);
    if (!ok || trimmed.startsWith(QLatin1Char('+'))) {
        refuse(
            ServerCode::BadValue,
            QStringLiteral("<%1> is not a decimal integer: \"%2\"").arg(element, text->left(40)));
        return std::nullopt;
    }
    return number;
}

std::optional<QString> XmlCursor::copyContent()
{
    QString xml;
    XmlOut out(&xml, AnswerLayout::Compact);
    // Elements open below the copied one, each with whether it has children
    // yet; white space is kept only as the whole text of a leaf element.
    std::vector<bool> hasChildren{false};
    std::vector<QString> open;
    QString pendingName;
    QXmlStreamAttributes pendingAttributes;
    qint64 pendingOffset = -1;
    QString pendingText;

    const auto flushStart = [&] {
        if (pendingOffset < 0)
            return;
        out.start(pendingName, pendingAttributes);
        open.push_back(pendingName);
        hasChildren.push_back(false);
        pendingOffset = -1;
    };
    const auto flushText = [&](bool atLeafEnd) {
        if (pendingText.isEmpty())
            return;
        if (!isWhiteSpace(pendingText) || atLeafEnd)
            out.text(pendingText);
        pendingText.clear();
    };

    for (;;) {
        switch (nextToken()) {
        case QXmlStreamReader::NoToken:
            return std::nullopt;
        case QXmlStreamReader::StartElement:
            flushStart();
            flushText(false);
            hasChildren.back() = true;
            pendingName = m_reader.qualifiedName().toString();
            pendingAttributes = m_reader.attributes();
            pendingOffset = m_reader.characterOffset();
            break;
        case QXmlStreamReader::EndElement:
            if (pendingOffset >= 0 && pendingOffset == m_reader.characterOffset()) {
                out.empty(pendingName, pendingAttributes);
                pendingOffset = -1;
                break;
            }
            flushStart();
            flushText(!hasChildren.back() && !open.empty());
            if (open.empty())
                return xml;
            out.end(open.back());
            open.pop_back();
            hasChildren.pop_back();
            break;
        case QXmlStreamReader::Characters:
            flushStart();
            pendingText += m_reader.text();
            break;
        default:
            break;
        }
    }
}

Refusal XmlCursor::finish()
{
    // Drain to the end even after a refusal: a later syntax error decides.
    while (!m_reader.atEnd()) {
        if (m_reader.readNext() == QXmlStreamReader::Invalid) {
            xmlError();
            break;
        }
    }
    if (m_reader.hasError() && m_refusal.code != ServerCode::MalformedXml)
        xmlError();
    return m_refusal;
}

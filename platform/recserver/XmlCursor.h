#pragma once

#include "Refusal.h"

#include <QString>
#include <QStringView>
#include <QXmlStreamReader>

#include <optional>

// Walks a request body element by element and records the first reason to
// refuse it. White space between elements, comments and processing
// instructions are skipped; a DTD is refused (no entity expansion from
// clients), and so are elements nested deeper than kMaxDepth. Once a
// structural refusal is recorded, finish() still reads to
// the end so that a body that is not well-formed is reported as such.
class XmlCursor
{
public:
    // Levels of elements, the root counted as one. A real time card nests
    // about 8; a deeper one is refused before it is stored, since reading it
    // back costs its readers with the square of the depth.
    static constexpr int kMaxDepth = 64;

    explicit XmlCursor(const QString &text);

    // Moves to the root element; false when there is none.
    bool enterRoot();
    // Moves to the next child element of the current one; false at the end
    // of the current element or after a refusal.
    bool nextChild();
    QString name() const { return m_reader.qualifiedName().toString(); }
    // The text of a leaf element, up to its end tag; none when refused.
    std::optional<QString> readText();
    // The element's content as canonical compact XML, up to its end tag:
    // white space between elements, comments and processing instructions
    // dropped, texts and attributes escaped again, empty-element tags kept.
    std::optional<QString> copyContent();
    // Reads the rest of the document; returns the first refusal, if any.
    Refusal finish();

    bool refuse(ServerCode code, const QString &reason);
    bool refused() const { return m_refusal.refused(); }

    // A leaf element's text as a decimal integer; none when refused.
    std::optional<qint64> readInteger();

private:
    bool xmlError();
    // The next token below the root; NoToken, with the refusal recorded, at
    // the end of the body, on a syntax error or on entity and DTD markup.
    QXmlStreamReader::TokenType nextToken();

    QXmlStreamReader m_reader;
    Refusal m_refusal;
    int m_depth = 0; // elements open, the root included
};

#pragma once

#include "AnswerLayout.h"

#include <QString>
#include <QStringView>
#include <QXmlStreamAttributes>

#include <vector>

// Writes XML into a string in one of the answer layouts. Texts are escaped
// (& < > " ' and carriage return), so whatever a client stored reads back the
// same, and every CRLF in a Crlf answer is a line end of the layout.
class XmlOut
{
public:
    XmlOut(QString *out, AnswerLayout layout);

    void start(QStringView name, const QXmlStreamAttributes &attributes = {});
    void empty(QStringView name, const QXmlStreamAttributes &attributes = {});
    void text(QStringView text);
    void end(QStringView name);
    void leaf(QStringView name, QStringView text);
    // Content that is already canonical compact XML, such as a stored mapping.
    void content(const QString &compactXml);
    // Ends the document: the line layouts close with a line end.
    void finish();

    static QString escaped(QStringView text);

private:
    struct Level
    {
        bool hasChildren = false;
        bool hasText = false;
    };

    void openTag(QStringView name, const QXmlStreamAttributes &attributes, bool isEmpty);
    void lineBreak(std::size_t depth);

    QString *m_out;
    AnswerLayout m_layout;
    std::vector<Level> m_levels;
};

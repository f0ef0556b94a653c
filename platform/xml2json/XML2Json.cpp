#include "XML2Json.h"

#include "VariantTreeBuilder.h"

#include <QXmlStreamReader>

namespace {

// Answers come from another process: a DTD could declare entities that
// expand without bound or point outside, so any DTD makes the answer invalid.
// Entity references other than the predefined ones and character references
// are undeclared without a DTD, which the reader reports as an error.
QVariant read(QXmlStreamReader &reader)
{
    VariantTreeBuilder builder;
    while (!reader.atEnd()) {
        switch (reader.readNext()) {
        case QXmlStreamReader::StartElement:
            if (!builder.startElement(reader.qualifiedName(), reader.attributes()))
                return {};
            break;
        case QXmlStreamReader::EndElement:
            builder.endElement();
            break;
        case QXmlStreamReader::Characters:
            builder.characters(reader.text(), reader.isWhitespace());
            break;
        case QXmlStreamReader::DTD:
        case QXmlStreamReader::EntityReference:
        case QXmlStreamReader::Invalid:
            return {};
        case QXmlStreamReader::NoToken:
        case QXmlStreamReader::StartDocument:
        case QXmlStreamReader::EndDocument:
        case QXmlStreamReader::Comment:
        case QXmlStreamReader::ProcessingInstruction:
            break;
        }
    }
    if (reader.hasError())
        return {};
    return builder.takeResult();
}

} // namespace

QVariant XML2Json::parse(const QString &xml) const
{
    QXmlStreamReader reader(xml);
    // Keys are the tags as written ("ns:Tag"); an xmlns declaration is an
    // ordinary attribute.
    reader.setNamespaceProcessing(false);
    return read(reader);
}

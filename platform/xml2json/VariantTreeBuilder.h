#pragma once

#include <QStringView>
#include <QVariant>

#include <vector>

class QXmlStreamAttributes;

// Builds the variant tree of one document from the reader's events. Open
// elements live on an explicit stack, so nothing recurses on the document's
// depth while it is read; depth is capped because the finished tree is freed
// by Qt's own recursive destructors.
class VariantTreeBuilder
{
public:
    // Deeper documents are refused: a real answer is about ten levels deep.
    static constexpr int MaxDepth = 1000;

    VariantTreeBuilder();
    ~VariantTreeBuilder();
    VariantTreeBuilder(const VariantTreeBuilder &) = delete;
    VariantTreeBuilder &operator=(const VariantTreeBuilder &) = delete;

    // False when the element would lie deeper than MaxDepth.
    bool startElement(QStringView name, const QXmlStreamAttributes &attributes);
    void endElement();
    void characters(QStringView text, bool whitespace);

    // The root element as the single key of a map; invalid before it closed.
    QVariant takeResult();

private:
    struct Frame;
    // Index 0 stands for the document; frames above the depth are kept for
    // reuse by later siblings.
    std::vector<Frame> m_frames;
    std::size_t m_depth = 0;
};

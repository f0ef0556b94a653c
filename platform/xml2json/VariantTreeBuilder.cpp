#include "VariantTreeBuilder.h"

#include <QHash>
#include <QString>
#include <QXmlStreamAttributes>

namespace {

// More distinct child tags than this are looked up through a hash.
constexpr std::size_t LinearLookupLimit = 8;

const QString TextKey = QStringLiteral("#text");

struct Group
{
    QString name;
    // Values gather here and become one QVariantList when their parent
    // closes: appending to a QVariantList held in a variant would copy it.
    std::vector<QVariant> values;
};

QVariant takeGroupValue(Group &group)
{
    if (group.values.size() == 1)
        return std::move(group.values.front());
    QVariantList list;
    list.reserve(static_cast<qsizetype>(group.values.size()));
    for (QVariant &value : group.values)
        list.append(std::move(value));
    return list;
}

} // namespace

struct VariantTreeBuilder::Frame
{
    QVariantMap attributes;
    QString text;
    bool hasContentText = false;
    std::vector<Group> children;
    QHash<QString, std::size_t> childIndex;
    // Where this element's value goes in its parent.
    std::size_t groupInParent = 0;

    std::size_t groupFor(QStringView name)
    {
        if (!children.empty() && children.back().name == name)
            return children.size() - 1;
        if (children.size() <= LinearLookupLimit) {
            for (std::size_t i = 0; i < children.size(); ++i) {
                if (children[i].name == name)
                    return i;
            }
        } else {
            const auto found = childIndex.constFind(name.toString());
            if (found != childIndex.constEnd())
                return found.value();
        }
        children.push_back(Group{name.toString(), {}});
        const std::size_t index = children.size() - 1;
        if (children.size() > LinearLookupLimit) {
            if (childIndex.isEmpty()) {
                for (std::size_t i = 0; i < children.size(); ++i)
                    childIndex.insert(children[i].name, i);
            } else {
                childIndex.insert(children.back().name, index);
            }
        }
        return index;
    }

    // Leaves the frame empty for reuse.
    QVariant takeValue()
    {
        QVariant value;
        if (children.empty() && attributes.isEmpty()) {
            // Empty element: an empty, non-null string.
            value = text.isNull() ? QStringLiteral("") : std::move(text);
        } else {
            QVariantMap map = std::move(attributes);
            for (Group &group : children)
                map.insert(group.name, takeGroupValue(group));
            // White space between child elements is layout, not content.
            if (hasContentText)
                map.insert(TextKey, text);
            value = map; // shared, not copied
        }
        attributes = QVariantMap();
        text = QString();
        hasContentText = false;
        children.clear();
        childIndex.clear();
        return value;
    }
};

VariantTreeBuilder::VariantTreeBuilder() : m_frames(1)
{}

VariantTreeBuilder::~VariantTreeBuilder() = default;

bool VariantTreeBuilder::startElement(QStringView name, const QXmlStreamAttributes &attributes)
{
    if (m_depth >= static_cast<std::size_t>(MaxDepth))
        return false;
    const std::size_t group = m_frames[m_depth].groupFor(name);
    ++m_depth;
    if (m_frames.size() <= m_depth)
        m_frames.emplace_back();
    Frame &frame = m_frames[m_depth];
    frame.groupInParent = group;
    for (const QXmlStreamAttribute &attribute : attributes)
        frame.attributes.insert(QLatin1Char('@') + attribute.qualifiedName().toString(),
                                attribute.value().toString());
    return true;
}

void VariantTreeBuilder::endElement()
{
    if (m_depth == 0)
        return;
    Frame &frame = m_frames[m_depth];
    const std::size_t group = frame.groupInParent;
    QVariant value = frame.takeValue();
    --m_depth;
    m_frames[m_depth].children[group].values.push_back(std::move(value));
}

void VariantTreeBuilder::characters(QStringView text, bool whitespace)
{
    if (m_depth == 0)
        return;
    Frame &frame = m_frames[m_depth];
    frame.text.append(text);
    if (!whitespace)
        frame.hasContentText = true;
}

QVariant VariantTreeBuilder::takeResult()
{
    Frame &document = m_frames.front();
    if (m_depth != 0 || document.children.size() != 1 ||
        document.children.front().values.size() != 1)
        return {};
    QVariantMap root;
    root.insert(document.children.front().name, document.children.front().values.front());
    document.children.clear();
    return root;
}

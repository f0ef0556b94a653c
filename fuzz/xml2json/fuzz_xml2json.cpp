// Arbitrary answer text into the converter: it must never crash, hang or
// leak, and whatever it accepts must be a one-key map at most 1,000 levels
// deep (a deeper tree would overflow the stack when Qt frees it).

#include "XML2Json.h"

#include <QString>

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <utility>
#include <vector>

namespace {

// Maps along the deepest path: the root's map and one per element that has
// children or attributes; lists hold the values of one level.
int mapDepth(const QVariant &tree)
{
    int deepest = 0;
    std::vector<std::pair<QVariant, int>> open{{tree, 0}};
    while (!open.empty()) {
        const auto [value, depth] = open.back();
        open.pop_back();
        const bool isMap = value.typeId() == QMetaType::QVariantMap;
        if (!isMap && value.typeId() != QMetaType::QVariantList)
            continue;
        deepest = std::max(deepest, depth + isMap);
        for (const QVariant &child : isMap ? value.toMap().values() : value.toList())
            open.emplace_back(child, depth + isMap);
    }
    return deepest;
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t *data, std::size_t size)
{
    const QString xml =
        QString::fromUtf8(reinterpret_cast<const char *>(data), static_cast<qsizetype>(size));
    const QVariant tree = XML2Json().parse(xml);
    if (tree.isValid() && (tree.typeId() != QMetaType::QVariantMap || tree.toMap().size() != 1))
        std::abort();
    if (tree.isValid() && mapDepth(tree) > 1001)
        std::abort();
    return 0;
}

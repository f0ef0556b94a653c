// Arbitrary answer text into the converter: it must never crash, hang or
// leak, and whatever it accepts must be a one-key map.

#include "XML2Json.h"

#include <QString>

#include <cstddef>
#include <cstdint>
#include <cstdlib>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t *data, std::size_t size)
{
    const QString xml =
        QString::fromUtf8(reinterpret_cast<const char *>(data), static_cast<qsizetype>(size));
    const QVariant tree = XML2Json().parse(xml);
    if (tree.isValid() && (tree.typeId() != QMetaType::QVariantMap || tree.toMap().size() != 1))
        std::abort();
    return 0;
}

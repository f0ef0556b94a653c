#pragma once

#include <QString>
#include <QVariant>

// Turns an answer's XML text into a variant tree: each element a key of its
// parent's map named by its tag, an element with only text a string, a tag
// repeated among siblings a list in document order, a lone one the value
// itself, an attribute X the key "@X". Malformed or empty input gives an
// invalid QVariant, never a partial tree.
class XML2Json
{
public:
    QVariant parse(const QString &xml) const;
};

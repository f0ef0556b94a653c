#pragma once

#include <QString>

#include <ostream>

// Readable test names and failure messages for Qt texts.
inline void PrintTo(const QString &text, std::ostream *os)
{
    *os << '"' << text.toStdString() << '"';
}

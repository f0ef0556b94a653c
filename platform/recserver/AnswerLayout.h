#pragma once

#include <QString>

#include <optional>

// How answers are laid out. Compact: no white space between elements.
// Indented: one element per line, two spaces per level, LF line ends.
// Crlf: one element per line, no indentation, CRLF line ends. The two line
// layouts end with a line end after the root.
enum class AnswerLayout { Compact, Indented, Crlf };

// Reads "compact", "indented" or "crlf" (any letter case); none for any other word.
std::optional<AnswerLayout> parseAnswerLayout(const QString &text);

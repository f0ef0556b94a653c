#pragma once

#include <QByteArray>
#include <QString>

#include <optional>

// Standard output carries one result per line and is flushed after each, so
// that a program reading it sees every reply as soon as it is printed;
// messages go to standard error as "plugin-host: MESSAGE".
void printLine(const QByteArray &line);
void printText(const QString &text);
void printError(const QString &message);

// Why a line could not be written to standard output (the first time it
// failed), or nothing: a reply that was lost must not end with status 0.
std::optional<QString> standardOutputFailure();

#pragma once

#include <QByteArray>
#include <QString>

// Standard output carries one result per line and is flushed after each, so
// that a program reading it sees every reply as soon as it is printed;
// messages go to standard error as "plugin-host: MESSAGE".
void printLine(const QByteArray &line);
void printText(const QString &text);
void printError(const QString &message);

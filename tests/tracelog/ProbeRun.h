#pragma once

#include <QMap>
#include <QString>
#include <QStringList>

// One run of qirnlog_probe in a child process with the given QIRNLOG_* and
// LD_LIBRARY_PATH values (an absent key is unset); none is inherited.
struct ProbeRun
{
    int exitCode = -1;
    QStringList out;
    QString err;

    static ProbeRun start(const QStringList &arguments, const QMap<QString, QString> &environment);
};

// Lines of a file, or none when it does not exist.
QStringList fileLines(const QString &path);

#define RECORD_LINE_PATTERN                                                                        \
    "^\\d{4}-\\d\\d-\\d\\dT\\d\\d:\\d\\d:\\d\\d\\.\\d{3}Z (\\S+) (\\d+) (\\S+):(\\d+) (.*)$"

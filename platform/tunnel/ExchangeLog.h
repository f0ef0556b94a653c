#pragma once

#include <QString>

#include <cstdio>
#include <mutex>
#include <optional>

// One exchange as the log records it.
struct ExchangeRecord
{
    quint64 seq = 0;
    QString outcome; // answered, timeout, failed, code, dropped, shutdown, refused, late
    QString command;
    QString pluginId;
    int kind = 0;
    const void *identity = nullptr;
    bool ownIdentity = false;
    qint32 timeoutMs = 0;
    bool flag = false;
    QString body;
    bool ok = false;
    QString code;
    QString content;
    QString faults;
    qint64 elapsedMs = 0;
};

// Appends one JSON object per line to a file; safe to call from any thread.
class ExchangeLog
{
public:
    ExchangeLog() = default;
    ~ExchangeLog();
    ExchangeLog(const ExchangeLog &) = delete;
    ExchangeLog &operator=(const ExchangeLog &) = delete;

    // Opens the file for appending; why it does not open, or nothing.
    std::optional<QString> open(const QString &path);
    void write(const ExchangeRecord &record);
    // Why a record could not be written (the first time it failed), or
    // nothing: a log missing exchanges must not pass for a complete one.
    std::optional<QString> writeFailure() const;

private:
    mutable std::mutex m_mutex;
    std::FILE *m_file = nullptr;
    QString m_path;
    std::optional<QString> m_writeFailure;
};

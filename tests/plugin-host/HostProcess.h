#pragma once

#include <QByteArray>
#include <QJsonObject>
#include <QList>
#include <QProcessEnvironment>
#include <QString>
#include <QStringList>
#include <QTemporaryDir>

#include <gtest/gtest.h>

#include <ostream>

// Readable failure messages for the Qt texts the tests compare.
inline void PrintTo(const QString &text, std::ostream *os)
{
    *os << '"' << text.toStdString() << '"';
}
inline void PrintTo(const QByteArray &bytes, std::ostream *os)
{
    *os << '"' << bytes.toStdString() << '"';
}
inline void PrintTo(const QStringList &texts, std::ostream *os)
{
    *os << "{\n";
    for (const QString &text : texts)
        *os << "  \"" << text.toStdString() << "\"\n";
    *os << '}';
}

// Runs the built plugin-host as a process of its own, against a server
// database and an exchange log in a folder of the test's own.
class HostProcess : public testing::Test
{
protected:
    struct Run
    {
        int status = -1;
        QByteArray out;
        QByteArray err;
        QList<QByteArray> lines() const;
    };

    void SetUp() override;

    QString path(const QString &name) const { return m_dir.filePath(name); }
    QString database() const { return path(QStringLiteral("server.sqlite")); }
    QString exchangesFile() const { return path(QStringLiteral("exchanges.jsonl")); }
    static QString dataFile(const QString &name);

    // plugin-host with the test's --db and --exchanges before the arguments.
    Run host(const QStringList &arguments, const QByteArray &input = {});
    // plugin-host with exactly these arguments.
    Run bare(const QStringList &arguments, const QByteArray &input = {});

    // Seeds the server with data/seed.xml.
    void seed();
    QString dump();
    // The time cards of a dump, one line each: "ID rREV NAME [C_1/1 C_2/1]".
    QStringList cards();
    QList<QJsonObject> exchanges() const;
    // The command of each exchange, in order.
    QStringList exchangeCommands() const;

    QProcessEnvironment environment;

private:
    QTemporaryDir m_dir;
};

// The time cards of a GetRecTmcardRes text as HostProcess::cards() gives them.
QStringList cardLines(const QString &xml);

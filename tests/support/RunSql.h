#pragma once

#include <QSqlDatabase>
#include <QSqlQuery>
#include <QStringList>

#include <gtest/gtest.h>

// Runs statements on a database file through a connection of the test's own:
// the file as another program, or an older server, left it.
inline void runSql(const QString &path, const QStringList &statements)
{
    {
        QSqlDatabase db = QSqlDatabase::addDatabase(QStringLiteral("QSQLITE"), path);
        db.setDatabaseName(path);
        ASSERT_TRUE(db.open());
        for (const QString &statement : statements)
            ASSERT_TRUE(QSqlQuery(db).exec(statement)) << statement.toStdString();
    }
    QSqlDatabase::removeDatabase(path);
}

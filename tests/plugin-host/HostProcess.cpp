#include "HostProcess.h"

#include <QDir>
#include <QFile>
#include <QJsonDocument>
#include <QProcess>
#include <QXmlStreamReader>

QList<QByteArray> HostProcess::Run::lines() const
{
    QList<QByteArray> result = out.split('\n');
    if (!result.isEmpty() && result.last().isEmpty())
        result.removeLast();
    return result;
}

void HostProcess::SetUp()
{
    ASSERT_TRUE(m_dir.isValid());
    environment = QProcessEnvironment::systemEnvironment();
    // Never the user's own data location, and no trace unless a test asks.
    environment.insert(QStringLiteral("XDG_DATA_HOME"), path(QStringLiteral("data-home")));
    environment.remove(QStringLiteral("QIRNLOG_FILE"));
    environment.remove(QStringLiteral("QIRNLOG_LEVEL"));
}

QString HostProcess::dataFile(const QString &name)
{
    return QDir(QStringLiteral(TEST_DATA_DIR)).filePath(name);
}

HostProcess::Run HostProcess::bare(const QStringList &arguments, const QByteArray &input)
{
    QProcess process;
    process.setProcessEnvironment(environment);
    process.start(QStringLiteral(PLUGIN_HOST_FILE), arguments);
    Run run;
    if (!process.waitForStarted(30000)) {
        ADD_FAILURE() << "plugin-host did not start";
        return run;
    }
    process.write(input);
    process.closeWriteChannel();
    if (!process.waitForFinished(120000)) {
        process.kill();
        process.waitForFinished();
        ADD_FAILURE() << "plugin-host did not finish";
    }
    run.out = process.readAllStandardOutput();
    run.err = process.readAllStandardError();
    run.status = process.exitStatus() == QProcess::NormalExit ? process.exitCode() : -1;
    return run;
}

HostProcess::Run HostProcess::host(const QStringList &arguments, const QByteArray &input)
{
    return bare(QStringList{QStringLiteral("--db"), database(), QStringLiteral("--exchanges"),
                            exchangesFile()} +
                    arguments,
                input);
}

void HostProcess::seed()
{
    const Run run = host({QStringLiteral("seed"), dataFile(QStringLiteral("seed.xml"))});
    ASSERT_EQ(run.status, 0) << run.err.toStdString();
}

QString HostProcess::dump()
{
    const Run run = host({QStringLiteral("dump")});
    EXPECT_EQ(run.status, 0) << run.err.toStdString();
    return QString::fromUtf8(run.out);
}

QStringList HostProcess::cards()
{
    return cardLines(dump());
}

QList<QJsonObject> HostProcess::exchanges() const
{
    QFile file(exchangesFile());
    QList<QJsonObject> records;
    if (!file.open(QIODevice::ReadOnly))
        return records;
    for (const QByteArray &line : file.readAll().split('\n')) {
        if (!line.isEmpty())
            records << QJsonDocument::fromJson(line).object();
    }
    return records;
}

QStringList HostProcess::exchangeCommands() const
{
    QStringList commands;
    for (const QJsonObject &record : exchanges())
        commands << record.value(QStringLiteral("command")).toString();
    return commands;
}

QStringList cardLines(const QString &xml)
{
    QStringList lines;
    QXmlStreamReader reader(xml);
    QString id, revision, name, cameraName;
    QStringList cameras;
    QStringList path;
    while (!reader.atEnd()) {
        reader.readNext();
        if (reader.isStartElement()) {
            path << reader.name().toString();
            if (path.size() == 2 && path.last() == QLatin1String("Tmcard")) {
                id.clear(), revision.clear(), name.clear(), cameras.clear();
            }
        } else if (reader.isCharacters() && !reader.isWhitespace()) {
            const QString field = path.join(QLatin1Char('/'));
            const QString text = reader.text().toString();
            if (field == QLatin1String("GetRecTmcardRes/Tmcard/TmcardID"))
                id = text;
            else if (field == QLatin1String("GetRecTmcardRes/Tmcard/Revision"))
                revision = text;
            else if (field == QLatin1String("GetRecTmcardRes/Tmcard/Name"))
                name = text;
            else if (field == QLatin1String("GetRecTmcardRes/Tmcard/CamList/Cam/Name"))
                cameraName = text;
            else if (field == QLatin1String("GetRecTmcardRes/Tmcard/CamList/Cam/GrpID"))
                cameras << cameraName + QLatin1Char('/') + text;
        } else if (reader.isEndElement()) {
            if (path.size() == 2 && path.last() == QLatin1String("Tmcard"))
                lines << QStringLiteral("%1 r%2 %3 [%4]")
                             .arg(id, revision, name, cameras.join(QLatin1Char(' ')));
            path.removeLast();
        }
    }
    if (reader.hasError())
        lines << QStringLiteral("(unreadable dump: %1)").arg(reader.errorString());
    return lines;
}

// plugin-host driven as a process, as tools drive it: each case of the
// transcript files under data/ (their format: data/README.md) must print
// exactly what the file shows.

#include <QDir>
#include <QFile>
#include <QJsonDocument>
#include <QJsonObject>
#include <QProcess>
#include <QRegularExpression>
#include <QTemporaryDir>

#include <gtest/gtest.h>

using namespace Qt::StringLiterals;

namespace {

QString readText(const QString &fileName)
{
    QFile file(fileName);
    EXPECT_TRUE(file.open(QIODevice::ReadOnly)) << fileName.toStdString();
    return QString::fromUtf8(file.readAll());
}

// A step's arguments: words split at spaces, but a word that begins with
// "{", "[", "<" or "'" takes the rest of the line, single quotes removed.
QStringList words(const QString &line)
{
    static const QRegularExpression word(u"['{\\[<].*|[^ ]+"_s);
    QStringList result;
    for (auto it = word.globalMatch(line); it.hasNext();) {
        const QString found = it.next().captured();
        result << (found.startsWith(u'\'') ? found.mid(1, found.size() - 2) : found);
    }
    return result;
}

// Paths that differ from build to build, written by name in the transcripts.
const std::vector<std::pair<QString, QString>> Places = {
    {u"$MISBEHAVING"_s, QStringLiteral(MISBEHAVING_PLUGIN_FILE)},
    {u"$OTHER_LIBRARY"_s, QStringLiteral(OTHER_LIBRARY_FILE)},
    {u"$HOST"_s, QStringLiteral(PLUGIN_HOST_FILE)},
    {u"$DATA"_s, QStringLiteral(TEST_DATA_DIR)},
};

// Arguments pass through QProcess as text, so bytes that are not UTF-8 are
// written \xNN and made by bash's printf.
const QRegularExpression EscapedByte(uR"(\\x[0-9A-Fa-f]{2})"_s);
const char *const ShellBytes =
    R"sh(p=$1; shift; n=$#; for w; do set -- "$@" "$(printf '%b' "$w")"; done; shift $n; exec "$p" "$@")sh";

class HostRun
{
public:
    // Runs one step and gives its part of the transcript.
    QString step(QString arguments, const QString &input)
    {
        for (const auto &[name, place] : Places)
            arguments.replace(name, place);
        arguments.replace(u"$TMP"_s, m_dir.path());
        QProcess process;
        QProcessEnvironment environment = QProcessEnvironment::systemEnvironment();
        environment.insert(u"XDG_DATA_HOME"_s, m_dir.path());
        environment.remove(u"QIRNLOG_FILE"_s);
        process.setProcessEnvironment(environment);
        QStringList given = words(arguments);
        if (!given.isEmpty() && given.first().startsWith(u'>'))
            process.setStandardOutputFile(given.takeFirst().mid(1));
        const QStringList all =
            QStringList{u"--db"_s, m_dir.filePath(u"server.sqlite"_s), u"--exchanges"_s,
                        m_dir.filePath(u"exchanges.jsonl"_s)} +
            given;
        if (arguments.contains(EscapedByte))
            process.start(u"/bin/bash"_s, QStringList{u"-c"_s, QString::fromUtf8(ShellBytes),
                                                      u"sh"_s, QStringLiteral(PLUGIN_HOST_FILE)} +
                                              all);
        else
            process.start(QStringLiteral(PLUGIN_HOST_FILE), all);
        process.write(input.toUtf8());
        process.closeWriteChannel();
        EXPECT_TRUE(process.waitForFinished(120000)) << arguments.toStdString();
        QString text = QString::fromUtf8(process.readAllStandardOutput());
        for (const QString &line : QString::fromUtf8(process.readAllStandardError()).split(u'\n'))
            text += line.isEmpty() ? QString() : "! "_L1 + line + u'\n';
        text += exchanges();
        const int status = process.exitStatus() == QProcess::NormalExit ? process.exitCode() : -1;
        text += status == 0 ? QString() : u"= %1\n"_s.arg(status);
        text.replace(m_dir.path(), u"$TMP"_s);
        for (const auto &[name, place] : Places)
            text.replace(place, name);
        return text;
    }

    // Copies data/NAME into the run's folder, where a run may change it.
    void copy(const QString &name)
    {
        EXPECT_TRUE(QFile::copy(QStringLiteral(TEST_DATA_DIR "/") + name, m_dir.filePath(name)))
            << name.toStdString();
    }

private:
    QString exchanges()
    {
        QFile file(m_dir.filePath(u"exchanges.jsonl"_s));
        QString text;
        if (!file.open(QIODevice::ReadOnly))
            return text;
        for (const QByteArray &line : file.readAll().split('\n')) {
            const QJsonObject e = QJsonDocument::fromJson(line).object();
            if (!e.isEmpty())
                text += u">> %1 %2 %3\n<< %4%5\n"_s.arg(
                    e["ownIdentity"_L1].toBool() ? u"own"_s : e["identity"_L1].toString(),
                    e["command"_L1].toString(), e["body"_L1].toString(), e["outcome"_L1].toString(),
                    e["code"_L1].toString().isEmpty() ? QString()
                                                      : u" "_s + e["code"_L1].toString());
        }
        file.remove();
        return text;
    }

    QTemporaryDir m_dir;
};

struct Case
{
    std::string name;
    QString text;
};

// The cases of one transcript file, each after a "## name" line.
std::vector<Case> casesOf(const char *fileName)
{
    std::vector<Case> cases;
    const QString text =
        readText(QDir(QStringLiteral(TEST_DATA_DIR)).filePath(QString::fromUtf8(fileName)));
    for (const QString &part : text.split(u"## "_s, Qt::SkipEmptyParts)) {
        const qsizetype end = part.indexOf(u'\n');
        cases.push_back({part.left(end).replace(u' ', u'_').toStdString(), part.mid(end + 1)});
    }
    return cases;
}

class Transcript : public testing::TestWithParam<Case>
{};

TEST_P(Transcript, PrintsExactlyWhatTheFileShows)
{
    HostRun run;
    QString actual;
    for (const QString &step : ('\n' + GetParam().text).split(u"\n$ "_s, Qt::SkipEmptyParts)) {
        if (step.startsWith("\n+ "_L1)) { // "+ NAME" lines before the first run
            for (const QString &line : step.mid(1).split(u'\n')) {
                actual += line + u'\n';
                run.copy(line.mid(2));
            }
            continue;
        }
        const QStringList lines = step.split(u'\n');
        actual += "$ "_L1 + lines.first() + u'\n';
        QString input;
        for (const QString &line : lines) {
            if (line.startsWith("| "_L1)) {
                actual += line + u'\n';
                input += line.mid(2) + u'\n';
            }
        }
        actual += run.step(lines.first(), input);
    }
    EXPECT_EQ(actual.toStdString(), GetParam().text.trimmed().append(u'\n').toStdString());
}

const auto caseName = [](const testing::TestParamInfo<Case> &info) { return info.param.name; };
#define TRANSCRIPTS(suite, file)                                                                   \
    INSTANTIATE_TEST_SUITE_P(suite, Transcript, testing::ValuesIn(casesOf(file)), caseName)
TRANSCRIPTS(WorkedExamples, "examples.txt");
TRANSCRIPTS(Commands, "commands.txt");
TRANSCRIPTS(Usage, "usage.txt");
TRANSCRIPTS(Failures, "failures.txt");

// The README's session example is the real one: the input file and what the
// transcript case of that name prints (exchanges aside) stand in the README.
TEST(Readme, SessionExampleMatchesTheRealOutput)
{
    const QString readme = readText(QStringLiteral(SOURCE_ROOT "/tools/plugin-host/README.md")) +
                           readText(QStringLiteral(SOURCE_ROOT "/README.md"));
    QString shown = readText(QStringLiteral(TEST_DATA_DIR "/session.jsonl"));
    for (const Case &c : casesOf("commands.txt"))
        shown += c.name == "README_session_example" ? c.text : QString();
    for (const QString &line : shown.split(u'\n')) {
        const bool notShown =
            line.isEmpty() || QStringList{u"$ "_s, u">>"_s, u"<<"_s}.contains(line.left(2));
        EXPECT_TRUE(notShown || readme.contains(line)) << line.toStdString();
    }
}

} // namespace

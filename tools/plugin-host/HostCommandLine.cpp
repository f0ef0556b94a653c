#include "HostCommandLine.h"

#include "HostRequest.h"

#include <QCommandLineParser>
#include <QCoreApplication>
#include <QDir>

#include <limits>
#include <map>

namespace {

// Each command word with the least and most arguments it takes.
struct Arity
{
    int least;
    int most;
    const char *usage;
};

const std::map<QString, Arity> &commands()
{
    static const std::map<QString, Arity> table{
        {QStringLiteral("request"), {1, 2, "request NAME [PAYLOAD]"}},
        {QStringLiteral("session"), {0, 1, "session [FILE]"}},
        {QStringLiteral("seed"), {1, 1, "seed FILE"}},
        {QStringLiteral("dump"), {0, 0, "dump"}},
        {QStringLiteral("raw"), {2, 2, "raw COMMAND BODY"}},
        {QStringLiteral("demo"), {0, 0, "demo"}},
    };
    return table;
}

const char *const Description = R"(Loads the recording schedule plug-in and runs requests against a
simulated recording server on this machine.

Commands:
  request NAME [PAYLOAD]  one request; PAYLOAD is JSON text (any JSON value;
                          absent means no payload)
  session [FILE]          JSON Lines from FILE or standard input, one request
                          per line: {"command": NAME, "payload": VALUE,
                          "client": N} ("payload" and "client" optional)
  seed FILE               replace the server's time cards with those of a
                          GetRecTmcardRes XML file
  dump                    print the server's time cards as the GetRecTmcardRes
                          answer to a read of all
  raw COMMAND BODY        send one XML message to the server through the
                          tunnel, bypassing the plug-in; prints
                          {"ok": B, "code": C, "content": XML}
  demo                    a short, explained session against a fresh,
                          temporary server (--db does not apply)

Each reply is one JSON line on standard output:
  {"command": NAME, "flag": B, "code": "0"|"-1", "text": T, "data": D}
Exit status: 0 when every request got exactly one reply, whatever its code;
3 when a request got no reply in time or more than one; 2 for usage errors,
unreadable files, JSON that does not parse and a plug-in that does not load.
Options go before the command.

Faults (--faults) are comma-separated, e.g. "latency=50ms,refuse=0.1,fail@3";
the local tunnel's README lists them all.)";

std::optional<qint64> wholeNumber(const QString &text, qint64 least, qint64 most)
{
    bool ok = false;
    const qint64 value = text.toLongLong(&ok);
    if (!ok || value < least || value > most)
        return std::nullopt;
    return value;
}

} // namespace

std::optional<HostOptions> parseHostCommandLine(const QCoreApplication &app, QString *error)
{
    QCommandLineParser parser;
    parser.setApplicationDescription(QString::fromUtf8(Description));
    // Everything after the command word is its arguments: a payload such as
    // -1 is JSON, not an option.
    parser.setOptionsAfterPositionalArgumentsMode(QCommandLineParser::ParseAsPositionalArguments);
    const QCommandLineOption help = parser.addHelpOption();
    const QCommandLineOption version = parser.addVersionOption();

    const QCommandLineOption plugin(QStringLiteral("plugin"),
                                    QStringLiteral("Plug-in library (default: the one beside "
                                                   "the program)."),
                                    QStringLiteral("FILE"));
    const QCommandLineOption db(QStringLiteral("db"),
                                QStringLiteral("The server's database (default: a file in the "
                                               "user's data location, created on first use)."),
                                QStringLiteral("FILE"));
    const QCommandLineOption exchanges(QStringLiteral("exchanges"),
                                       QStringLiteral("Append every tunnel exchange as one JSON "
                                                      "line (command, identity, timeout, body, "
                                                      "ok, code, content)."),
                                       QStringLiteral("FILE"));
    const QCommandLineOption layout(QStringLiteral("answer-layout"),
                                    QStringLiteral("compact | indented | crlf (the server's "
                                                   "answer layout)."),
                                    QStringLiteral("L"), QStringLiteral("compact"));
    const QCommandLineOption faults(QStringLiteral("faults"),
                                    QStringLiteral("The tunnel's fault injection (see above)."),
                                    QStringLiteral("SPEC"));
    const QCommandLineOption seedFaults(QStringLiteral("seed-faults"),
                                        QStringLiteral("Seed of the fault injection's random "
                                                       "choices."),
                                        QStringLiteral("N"), QStringLiteral("1"));
    const QCommandLineOption replyTimeout(QStringLiteral("reply-timeout"),
                                          QStringLiteral("How long to wait for each reply, in "
                                                         "milliseconds."),
                                          QStringLiteral("MS"), QStringLiteral("60000"));
    const QCommandLineOption client(QStringLiteral("client"),
                                    QStringLiteral("Default requester client identity."),
                                    QStringLiteral("N"), QStringLiteral("1"));
    const QCommandLineOption traceLevel(QStringLiteral("trace-level"),
                                        QStringLiteral("Write the plug-in's trace records up to "
                                                       "level N to standard error."),
                                        QStringLiteral("N"));
    parser.addOptions(
        {plugin, db, exchanges, layout, faults, seedFaults, replyTimeout, client, traceLevel});
    parser.addPositionalArgument(QStringLiteral("command"),
                                 QStringLiteral("request, session, seed, dump, raw or demo."),
                                 QStringLiteral("<command> [args]"));

    if (!parser.parse(app.arguments())) {
        *error = parser.errorText();
        return std::nullopt;
    }
    if (parser.isSet(help))
        parser.showHelp(0);
    if (parser.isSet(version))
        parser.showVersion();

    HostOptions options;
    const QStringList positional = parser.positionalArguments();
    if (positional.isEmpty()) {
        *error = QStringLiteral("no command given; see --help");
        return std::nullopt;
    }
    options.command = positional.first();
    options.arguments = positional.mid(1);
    const auto found = commands().find(options.command);
    if (found == commands().end()) {
        *error = QStringLiteral("unknown command \"%1\"; see --help").arg(options.command);
        return std::nullopt;
    }
    for (const QString &argument : options.arguments) {
        if (argument.startsWith(QLatin1String("--")) && argument.size() > 2) {
            *error = QStringLiteral("options go before the command: %1").arg(argument);
            return std::nullopt;
        }
    }
    const Arity arity = found->second;
    if (options.arguments.size() < arity.least || options.arguments.size() > arity.most) {
        *error = QStringLiteral("usage: plugin-host [options] %1").arg(arity.usage);
        return std::nullopt;
    }

    options.pluginFile = parser.isSet(plugin)
                             ? parser.value(plugin)
                             : QDir(QCoreApplication::applicationDirPath())
                                   .filePath(QStringLiteral(PLUGIN_HOST_DEFAULT_PLUGIN));
    options.databaseFile = parser.value(db);
    options.exchangesFile = parser.value(exchanges);
    options.answerLayout = parser.value(layout);
    options.faults = parser.value(faults);

    const std::optional<qint64> seed =
        wholeNumber(parser.value(seedFaults), 0, std::numeric_limits<qint64>::max());
    if (!seed) {
        *error = QStringLiteral("--seed-faults takes a whole number of 0 or more");
        return std::nullopt;
    }
    options.faultSeed = static_cast<quint64>(*seed);
    const std::optional<qint64> timeout =
        wholeNumber(parser.value(replyTimeout), 1, std::numeric_limits<qint32>::max());
    if (!timeout) {
        *error = QStringLiteral("--reply-timeout takes a whole number of milliseconds, 1 or more");
        return std::nullopt;
    }
    options.replyTimeoutMs = static_cast<int>(*timeout);
    const std::optional<qint64> clientId = clientNumber(parser.value(client));
    if (!clientId) {
        *error = QStringLiteral("--client takes a whole number from 0 to 2^53");
        return std::nullopt;
    }
    options.client = *clientId;
    if (parser.isSet(traceLevel)) {
        const std::optional<qint64> level = wholeNumber(parser.value(traceLevel), 0, 255);
        if (!level) {
            *error = QStringLiteral("--trace-level takes a level from 0 to 255");
            return std::nullopt;
        }
        options.traceLevel = static_cast<int>(*level);
    }
    return options;
}

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
3 when a request got no reply in time or more than one, or output could not
be written; 2 for usage errors, unreadable files, JSON that does not parse, a
plug-in that does not load and a dump the server refuses.
Options go before the command.

Faults (--faults) are comma-separated, e.g. "latency=50ms,refuse=0.1,fail@3";
the local tunnel's README lists them all.)";

HostResult<qint64> wholeNumber(const QString &text, qint64 least, qint64 most, const char *mistake)
{
    bool ok = false;
    const qint64 value = text.toLongLong(&ok);
    if (!ok || value < least || value > most)
        return Failure{QString::fromUtf8(mistake)};
    return value;
}

// The options plugin-host takes, known to one parser.
struct HostParser
{
    HostParser();

    QCommandLineParser parser;
    const QCommandLineOption help = parser.addHelpOption();
    const QCommandLineOption version = parser.addVersionOption();
    const QCommandLineOption plugin{
        QStringLiteral("plugin"),
        QStringLiteral("Plug-in library (default: the one beside the program)."),
        QStringLiteral("FILE")};
    const QCommandLineOption db{QStringLiteral("db"),
                                QStringLiteral("The server's database (default: a file in the "
                                               "user's data location, created on first use)."),
                                QStringLiteral("FILE")};
    const QCommandLineOption exchanges{QStringLiteral("exchanges"),
                                       QStringLiteral("Append every tunnel exchange as one JSON "
                                                      "line (command, identity, timeout, body, "
                                                      "ok, code, content)."),
                                       QStringLiteral("FILE")};
    const QCommandLineOption layout{
        QStringLiteral("answer-layout"),
        QStringLiteral("compact | indented | crlf (the server's answer layout)."),
        QStringLiteral("L"), QStringLiteral("compact")};
    const QCommandLineOption faults{QStringLiteral("faults"),
                                    QStringLiteral("The tunnel's fault injection (see above)."),
                                    QStringLiteral("FAULTS")};
    const QCommandLineOption seedFaults{
        QStringLiteral("seed-faults"),
        QStringLiteral("Seed of the fault injection's random choices."), QStringLiteral("N"),
        QStringLiteral("1")};
    const QCommandLineOption replyTimeout{
        QStringLiteral("reply-timeout"),
        QStringLiteral("How long to wait for each reply, in milliseconds."), QStringLiteral("MS"),
        QStringLiteral("60000")};
    const QCommandLineOption client{QStringLiteral("client"),
                                    QStringLiteral("Default requester client identity."),
                                    QStringLiteral("N"), QStringLiteral("1")};
    const QCommandLineOption traceLevel{
        QStringLiteral("trace-level"),
        QStringLiteral("Write the plug-in's trace records up to level N to standard error."),
        QStringLiteral("N")};
};

HostParser::HostParser()
{
    parser.setApplicationDescription(QString::fromUtf8(Description));
    // Everything after the command word is its arguments: a payload such as
    // -1 is JSON, not an option.
    parser.setOptionsAfterPositionalArgumentsMode(QCommandLineParser::ParseAsPositionalArguments);
    parser.addOptions(
        {plugin, db, exchanges, layout, faults, seedFaults, replyTimeout, client, traceLevel});
    parser.addPositionalArgument(QStringLiteral("command"),
                                 QStringLiteral("request, session, seed, dump, raw or demo."),
                                 QStringLiteral("<command> [args]"));
}

// The command word and its arguments, checked against the table of commands.
HostResult<HostOptions> readCommand(const QStringList &positional)
{
    if (positional.isEmpty())
        return Failure{QStringLiteral("no command given; see --help")};
    HostOptions options;
    options.command = positional.first();
    options.arguments = positional.mid(1);
    const auto found = commands().find(options.command);
    if (found == commands().end())
        return Failure{QStringLiteral("unknown command \"%1\"; see --help").arg(options.command)};
    for (const QString &argument : options.arguments) {
        if (argument.startsWith(QLatin1String("--")) && argument.size() > 2)
            return Failure{QStringLiteral("options go before the command: %1").arg(argument)};
    }
    const Arity arity = found->second;
    if (options.arguments.size() < arity.least || options.arguments.size() > arity.most)
        return Failure{QStringLiteral("usage: plugin-host [options] %1").arg(arity.usage)};
    return options;
}

// The options' values, added to the command's.
HostResult<HostOptions> readOptions(const HostParser &host, HostOptions options)
{
    const QCommandLineParser &parser = host.parser;
    options.pluginFile = parser.isSet(host.plugin)
                             ? parser.value(host.plugin)
                             : QDir(QCoreApplication::applicationDirPath())
                                   .filePath(QStringLiteral(PLUGIN_HOST_DEFAULT_PLUGIN));
    options.databaseFile = parser.value(host.db);
    options.exchangesFile = parser.value(host.exchanges);
    options.answerLayout = parser.value(host.layout);
    options.faults = parser.value(host.faults);

    const std::optional<qint64> clientId = clientNumber(parser.value(host.client));
    const bool traced = parser.isSet(host.traceLevel);
    const HostResult<qint64> seed =
        wholeNumber(parser.value(host.seedFaults), 0, std::numeric_limits<qint64>::max(),
                    "--seed-faults takes a whole number of 0 or more");
    const HostResult<qint64> timeout =
        wholeNumber(parser.value(host.replyTimeout), 1, std::numeric_limits<qint32>::max(),
                    "--reply-timeout takes a whole number of milliseconds, 1 or more");
    const HostResult<qint64> client =
        clientId ? HostResult<qint64>(*clientId)
                 : Failure{QStringLiteral("--client takes a whole number from 0 to 2^53")};
    const HostResult<qint64> level = traced
                                         ? wholeNumber(parser.value(host.traceLevel), 0, 255,
                                                       "--trace-level takes a level from 0 to 255")
                                         : HostResult<qint64>(0);
    // In this order: the first mistake is the one reported.
    for (const HostResult<qint64> *number : {&seed, &timeout, &client, &level}) {
        if (!*number)
            return Failure{number->error()};
    }
    options.faultSeed = static_cast<quint64>(*seed);
    options.replyTimeoutMs = static_cast<int>(*timeout);
    options.client = *client;
    if (traced)
        options.traceLevel = static_cast<int>(*level);
    return options;
}

} // namespace

HostResult<HostOptions> parseHostCommandLine(const QCoreApplication &app,
                                             const QByteArrayList &rawArguments)
{
    HostParser host;
    if (!host.parser.parse(app.arguments()))
        return Failure{host.parser.errorText()};
    if (host.parser.isSet(host.help))
        host.parser.showHelp(0);
    if (host.parser.isSet(host.version))
        host.parser.showVersion();
    HostResult<HostOptions> command = readCommand(host.parser.positionalArguments());
    if (!command)
        return command;
    // Everything from the command word on is positional: the arguments are
    // the last ones given.
    command->rawArguments = rawArguments.mid(rawArguments.size() - command->arguments.size());
    return readOptions(host, std::move(*command));
}

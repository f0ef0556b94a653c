// plugin-host: loads the built recording schedule plug-in and runs requests
// end to end against a simulated recording server on this machine.

#include "HostCommandLine.h"
#include "HostCommands.h"
#include "HostExit.h"
#include "HostOutput.h"
#include "TraceOutput.h"

#include <QCoreApplication>

int main(int argc, char *argv[])
{
    QCoreApplication app(argc, argv);
    QCoreApplication::setApplicationName(QStringLiteral("plugin-host"));
    QCoreApplication::setApplicationVersion(QStringLiteral(PLUGIN_HOST_VERSION));

    const HostResult<HostOptions> options =
        parseHostCommandLine(app, QByteArrayList(argv, argv + argc));
    if (!options) {
        printError(options.error());
        return ExitUsage;
    }
    // Before the plug-in loads: it opens the trace-log library as it loads.
    if (options->traceLevel)
        sendTraceToStandardError(*options->traceLevel);
    const int status = runHostCommand(*options);
    // A reply that never reached the reader is not a success.
    if (const std::optional<QString> failure = standardOutputFailure()) {
        printError(QStringLiteral("standard output: %1").arg(*failure));
        return status == ExitOk ? ExitReplies : status;
    }
    return status;
}

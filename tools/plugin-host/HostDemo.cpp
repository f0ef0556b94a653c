#include "HostCommands.h"

#include "HostExit.h"

int runDemo(const HostOptions &)
{
    return ExitOk;
}

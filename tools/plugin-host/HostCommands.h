#pragma once

class HostPlatform;
struct HostOptions;

// Runs the command that the options name and gives the exit status.
int runHostCommand(const HostOptions &options);

// The commands one by one.
int runRequest(const HostOptions &options);
int runSession(const HostOptions &options);
int runSeed(const HostOptions &options);
int runDump(const HostOptions &options);
int runRaw(const HostOptions &options);
int runDemo(const HostOptions &options);

// Stops a platform that sent requests and gives the run's status: an
// exchange log that missed a record is reported and turns ExitOk into
// ExitReplies.
int stopPlatform(HostPlatform &platform, int status);

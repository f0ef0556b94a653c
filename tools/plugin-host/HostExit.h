#pragma once

// plugin-host's exit statuses; tools that drive it rely on them.
enum HostExit : int {
    // Every request got exactly one reply, whatever its result code.
    ExitOk = 0,
    // Usage error, unreadable file, JSON that does not parse, a plug-in or
    // database that does not open: nothing was sent.
    ExitUsage = 2,
    // A request got no reply in time, or more than one.
    ExitReplies = 3,
};

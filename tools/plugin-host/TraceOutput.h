#pragma once

// Makes the trace-log library write records up to the given level to
// standard error. It reads its settings when it loads, so this must run
// before the plug-in (which loads the library) is loaded.
void sendTraceToStandardError(int level);

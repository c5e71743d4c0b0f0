// WatchCommand: `vantorel-cli watch`: the monitor in the terminal view, refreshed on every display tick.
#pragma once

#include "cli/MonitorLauncher.h"

#include <QStringList>

namespace vantorel {

class WatchCommand {
public:
    static int run(const QStringList& args);
    // The terminal view on a source until Ctrl-C; `program` prefixes messages.
    // Needs a running QCoreApplication. Returns the exit code.
    static int runTerminal(const MonitorLauncher::Source& source, const char* program);
};

}  // namespace vantorel

// WatchCommand: `vantorel-cli watch`: the monitor in the terminal view, refreshed on every display tick.
#pragma once

#include <QStringList>

namespace vantorel {

class WatchCommand {
public:
    static int run(const QStringList& args);
};

}  // namespace vantorel

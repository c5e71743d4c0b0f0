// WatchCommand: `vantorel-cli watch` runs the monitor with the terminal view as its application object.
#include "cli/WatchCommand.h"

#include "Platform/SystemLog.h"
#include "Monitor/MonitorLauncher.h"
#include "Monitor/TerminalView.h"

#include <QCommandLineParser>

#include <cstdio>

namespace vantorel {

int WatchCommand::run(const QStringList& args) {
    QCommandLineParser parser;
    parser.setApplicationDescription(
        "Watch the monitor's display in the terminal, refreshed every 2 s when new data arrived.\n"
        "Without a source, the built-in modem emulator runs in-process (UTRAN); Ctrl-C ends.\n"
        "Keys in a terminal: arrows move, Enter opens, Backspace goes back, PgUp/PgDn scroll, q quits.");
    parser.addHelpOption();
    MonitorLauncher::addOptions(parser);
    parser.addOption({"verbose", "Mirror the system log to stderr."});
    parser.process(QStringList{"vantorel-cli watch"} + args);
    SystemLog::setMirrorToStderr(parser.isSet("verbose"));

    std::string error;
    auto source = MonitorLauncher::sourceFrom(parser, &error);
    if (!source) {
        std::fprintf(stderr, "vantorel-cli watch: %s\n", error.c_str());
        return 2;
    }
    return TerminalView::run(*source, "vantorel-cli watch");
}

}  // namespace vantorel

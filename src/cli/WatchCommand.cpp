// WatchCommand: `vantorel-cli watch` runs VantorelModel (Parts 2.1-2.3) with the terminal view as its application object.
#include "cli/WatchCommand.h"

#include "Platform/QuitOnSignal.h"
#include "Platform/SystemLog.h"
#include "cli/MonitorLauncher.h"
#include "cli/TerminalView.h"

#include <QCommandLineParser>
#include <QCoreApplication>

#include <cstdio>

namespace vantorel {

int WatchCommand::run(const QStringList& args) {
    QCommandLineParser parser;
    parser.setApplicationDescription(
        "Watch the monitor's display in the terminal, refreshed every 2 s when new data arrived.\n"
        "Without a source, the built-in modem emulator runs in-process (UTRAN). Ctrl-C ends.");
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
    return runTerminal(*source, "vantorel-cli watch");
}

int WatchCommand::runTerminal(const MonitorLauncher::Source& source, const char* program) {
    std::string error;
    TerminalView view;
    MonitorLauncher launcher;
    if (!launcher.start(source, &view, &error)) {
        std::fprintf(stderr, "%s: %s\n", program, error.c_str());
        return 1;
    }
    view.setModel(launcher.model());
    std::fprintf(stderr, "%s: %s; Ctrl-C ends\n", program, launcher.description().c_str());
    QuitOnSignal quit;
    return QCoreApplication::exec();
}

}  // namespace vantorel

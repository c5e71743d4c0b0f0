// vantorel-cli: headless decoding and inspection of recorded streams, and the monitor in the terminal.
#include "cli/DecodeCommand.h"
#include "cli/InfoCommand.h"
#include "cli/SnapshotCommand.h"
#include "cli/WatchCommand.h"

#include <QCoreApplication>

#include <cstdio>
#include <cstring>

namespace {

const char* const kUsage =
    "Usage: vantorel-cli COMMAND [options]\n"
    "\n"
    "Commands:\n"
    "  decode [--technology TECH] FILE...\n"
    "                                    decode recorded streams and print the display\n"
    "                                    (--format tree|json|plist|display;\n"
    "                                    --csv OUT: signal values per 2 s tick)\n"
    "  info FILE...                      format, technologies, message count, counts per\n"
    "                                    log code and bad frames of recorded streams\n"
    "  watch [--emulate TECH | --replay FILE | --service NAME]\n"
    "                                    the live display in the terminal\n"
    "                                    (--plot KEY sparklines, --csv OUT [--gps])\n"
    "  snapshot FILE [--dlf OUT]         a saved snapshot: its description, each display\n"
    "                                    as a tree (--format json); --dlf writes its DLF\n"
    "                                    binary log to OUT\n"
    "\n"
    "Recorded streams: QXDM DLF, QMDL / mi2log, and Vantorel captures (.vcap).\n"
    "TECH: ifx, gsm, cdma, lte, utran (or the full identifier); by default the\n"
    "technology the stream's serving-cell records name.\n"
    "'vantorel-cli COMMAND --help' tells more.\n";

}  // namespace

int main(int argc, char** argv) {
    QCoreApplication app(argc, argv);
    QCoreApplication::setApplicationName("vantorel-cli");
    QStringList args = QCoreApplication::arguments().mid(1);
    if (args.isEmpty() || args[0] == "--help" || args[0] == "-h" || args[0] == "help") {
        std::fputs(kUsage, args.isEmpty() ? stderr : stdout);
        return args.isEmpty() ? 2 : 0;
    }
    const QString command = args.takeFirst();
    if (command == "decode") return vantorel::DecodeCommand::run(args);
    if (command == "info") return vantorel::InfoCommand::run(args);
    if (command == "watch") return vantorel::WatchCommand::run(args);
    if (command == "snapshot") return vantorel::SnapshotCommand::run(args);
    std::fprintf(stderr, "vantorel-cli: unknown command '%s'\n\n%s", qPrintable(command), kUsage);
    return 2;
}

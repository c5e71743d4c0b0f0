// WatchCommand: `vantorel-cli watch` runs the monitor with the terminal view as its application object.
#include "cli/WatchCommand.h"

#include "cli/CommandOptions.h"

#include "Model/SignalCatalogue.h"
#include "Model/VantorelModel.h"
#include "Platform/SystemLog.h"
#include "Monitor/MonitorLauncher.h"
#include "Monitor/TerminalView.h"
#include "cli/SignalExport.h"

#include <QCommandLineParser>

#include <cstdio>

namespace vantorel {

int WatchCommand::run(const QStringList& args) {
    QCommandLineParser parser;
    parser.setApplicationDescription(
        "Watch the monitor's display in the terminal, refreshed every 2 s when new data arrived.\n"
        "Without a source, the built-in modem emulator runs in-process (UTRAN); Ctrl-C ends.\n"
        "Keys in a terminal: arrows move, Enter opens, Backspace goes back, PgUp/PgDn scroll, q quits.");
    const QCommandLineOption helpOption = parser.addHelpOption();
    MonitorLauncher::addOptions(parser);
    SignalExport::addOptions(parser, true);
    parser.addOption({"plot",
                      "Draw a sparkline of the value at this display path (the last 40 display ticks) "
                      "under the status line, with its latest value in its unit; repeat for several values. "
                      "A list entry by its cell, \"/Neighbours/Measured Neighbor Cells/[Physical Cell "
                      "ID=251]/Filtered RSRP\", by rank, \"[#2 Filtered RSRP]\", or by position, as in --csv-keys; "
                      "a CSV header with its unit is taken too.",
                      "KEY"});
    parser.addOption({"verbose", "Mirror the system log to stderr."});
    if (const auto exitCode = CommandOptions::parse(parser, helpOption, "vantorel-cli watch", args)) return *exitCode;
    SystemLog::setMirrorToStderr(parser.isSet("verbose"));

    std::string error;
    auto source = MonitorLauncher::sourceFrom(parser, &error);
    if (!source) {
        std::fprintf(stderr, "vantorel-cli watch: %s\n", error.c_str());
        return 2;
    }
    SignalExport csv;
    if (!csv.configure(parser, true, &error)) {
        std::fprintf(stderr, "vantorel-cli watch: %s\n", error.c_str());
        return 2;
    }
    std::vector<std::string> plots;
    // One key per --plot, commas in it included; a CSV column's header is its key and unit.
    for (const QString& key : parser.values("plot")) plots.push_back(SignalCatalogue::keyOfColumn(key.trimmed().toStdString()));

    const int code = TerminalView::run(*source, "vantorel-cli watch", plots, [&csv](VantorelModel& model) {
        if (!csv.enabled()) return;
        QObject::connect(&model, &VantorelModel::displayTicked, &model, [&csv, &model] {
            csv.tick(model.tickTimeMs(), model.sourceStatus().decoderTechnology, model.pathIndex());
        });
    });
    if (!csv.finish("", &error)) {
        std::fprintf(stderr, "vantorel-cli watch: %s\n", error.c_str());
        return code ? code : 1;
    }
    return code;
}

}  // namespace vantorel

// InfoCommand: `vantorel-cli info`, an account of every frame of recorded streams (RecordedStream's report).
#include "cli/InfoCommand.h"

#include "cli/CommandOptions.h"

#include "Platform/TechnologyNames.h"
#include "TelephonyService/Replay/RecordedStream.h"

#include <QCommandLineParser>

#include <cstdio>

namespace vantorel {

int InfoCommand::run(const QStringList& args) {
    QCommandLineParser parser;
    parser.setApplicationDescription("Describe recorded streams: format, the technologies their serving-cell\n"
                                     "records name, message count, time span (earliest to latest), counts per\n"
                                     "log code with its name and record versions (property lists for IFX), and\n"
                                     "every bad frame. A file in which no record is found is an error (exit 1).");
    const QCommandLineOption helpOption = parser.addHelpOption();
    parser.addPositionalArgument("FILE", "QXDM DLF, QMDL/mi2log or Vantorel capture files.", "FILE...");
    if (const auto exitCode = CommandOptions::parse(parser, helpOption, "vantorel-cli info", args)) return *exitCode;
    if (parser.positionalArguments().isEmpty()) {
        std::fprintf(stderr, "vantorel-cli info: no FILE given (see --help)\n");
        return 2;
    }
    int failures = 0;
    for (const QString& path : parser.positionalArguments()) {
        RecordedStream stream = RecordedStream::open(path.toStdString());
        if (!stream.ok()) {
            std::fprintf(stderr, "vantorel-cli info: %s\n", stream.error().c_str());
            ++failures;
            continue;
        }
        if (const std::string why = stream.unusable(false); !why.empty()) {
            std::fprintf(stderr, "vantorel-cli info: %s: %s\n", qPrintable(path), why.c_str());
            ++failures;
            continue;
        }
        std::printf("%s\n%s\n", qPrintable(path), stream.summary().c_str());
    }
    return failures ? 1 : 0;
}

}  // namespace vantorel

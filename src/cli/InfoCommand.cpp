// InfoCommand: `vantorel-cli info`, an account of every frame of recorded streams (RecordedStream's report).
#include "cli/InfoCommand.h"

#include "Platform/TechnologyNames.h"
#include "TelephonyService/Replay/RecordedStream.h"

#include <QCommandLineParser>

#include <cstdio>

namespace vantorel {

int InfoCommand::run(const QStringList& args) {
    QCommandLineParser parser;
    parser.setApplicationDescription("Describe recorded streams: format, technology if known, message count,\n"
                                     "time span, counts per log code with its name and record versions\n"
                                     "(property lists for IFX), and every bad frame. A file in which nothing\n"
                                     "is found is not a capture (exit 1).");
    parser.addHelpOption();
    parser.addPositionalArgument("FILE", "QXDM DLF, QMDL/mi2log or Vantorel capture files.", "FILE...");
    parser.process(QStringList{"vantorel-cli info"} + args);
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
        if (!stream.holdsRecords()) {
            std::fprintf(stderr, "vantorel-cli info: %s: not a capture (no capture header, DLF record or QMDL frame)\n",
                         qPrintable(path));
            ++failures;
            continue;
        }
        std::printf("%s\n%s\n", qPrintable(path), stream.summary().c_str());
    }
    return failures ? 1 : 0;
}

}  // namespace vantorel

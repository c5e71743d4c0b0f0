// DecodeCommand: `vantorel-cli decode --technology TECH FILE...`: every message to the decoder, then the display it builds.
#include "cli/DecodeCommand.h"

#include "LogGenerator/LogGenerator.h"
#include "Platform/SystemLog.h"
#include "Platform/TechnologyNames.h"
#include "PropertyList/Dictionary.h"
#include "TelephonyService/Replay/RecordedStream.h"
#include "cli/StdoutToStderr.h"
#include "Monitor/TreeFormatter.h"

#include <QCommandLineParser>

#include <cstdio>

namespace vantorel {

int DecodeCommand::run(const QStringList& args) {
    QCommandLineParser parser;
    parser.setApplicationDescription(
        "Decode recorded streams and print the display the monitor would show after them.\n"
        "Every message is handed to the decoder as the monitor does; records that the live\n"
        "modem would not have been asked for are decoded too (no log mask is applied).");
    parser.addHelpOption();
    parser.addOption({"technology", "Decoder to use (" + QString::fromStdString(TechnologyNames::listing()) +
                                        "); needed unless every FILE is a capture.", "TECH"});
    parser.addOption({"format",
                      "Output: tree (as the panes show it), json or plist (the tree's names in its order),\n"
                      "or display (the display dictionary as the decoder keeps it, as JSON).",
                      "FORMAT", "tree"});
    parser.addOption({"verbose", "Mirror the system log to stderr."});
    parser.addPositionalArgument("FILE", "QXDM DLF, QMDL/mi2log or Vantorel capture files, decoded in order.",
                                 "FILE...");
    parser.process(QStringList{"vantorel-cli decode"} + args);
    SystemLog::setMirrorToStderr(parser.isSet("verbose"));

    const auto format = TreeFormatter::parse(parser.value("format").toStdString());
    if (!format) {
        std::fprintf(stderr, "vantorel-cli decode: unknown --format '%s' (tree, json, plist or display)\n",
                     qPrintable(parser.value("format")));
        return 2;
    }
    if (parser.positionalArguments().isEmpty()) {
        std::fprintf(stderr, "vantorel-cli decode: no FILE given (see --help)\n");
        return 2;
    }
    std::string technology;
    if (parser.isSet("technology")) {
        auto id = TechnologyNames::identifierFor(parser.value("technology").toStdString());
        if (!id) {
            std::fprintf(stderr, "vantorel-cli decode: unknown technology '%s' (%s)\n",
                         qPrintable(parser.value("technology")), TechnologyNames::listing().c_str());
            return 2;
        }
        technology = *id;
    }

    std::unique_ptr<LogGenerator> decoder;
    std::string decoderTechnology;
    Dictionary state;
    uint64_t read = 0, skipped = 0, badFrames = 0;
    int failures = 0;
    for (const QString& path : parser.positionalArguments()) {
        RecordedStream stream = RecordedStream::open(path.toStdString(), technology);
        if (!stream.ok()) {
            std::fprintf(stderr, "vantorel-cli decode: %s\n", stream.error().c_str());
            ++failures;
            continue;
        }
        if (!technology.empty() && stream.technologyFromFile() && stream.technology() != technology) {
            std::fprintf(stderr, "vantorel-cli decode: %s is a %s capture: --technology %s contradicts it\n",
                         qPrintable(path), TechnologyNames::displayName(stream.technology()).c_str(),
                         qPrintable(parser.value("technology")));
            return 2;
        }
        const RecordedLog& report = stream.report();
        badFrames += report.badCrc + report.malformed + report.truncated;
        if (stream.technology().empty()) {
            std::fprintf(stderr, "vantorel-cli decode: %s is a %s file, which does not say its technology: add --technology (%s)\n",
                         qPrintable(path), stream.formatName(), TechnologyNames::listing().c_str());
            ++failures;
            continue;
        }
        if (!decoder) {
            decoder = LogGenerator::generatorFromTechnology(stream.technology());
            decoderTechnology = stream.technology();
            if (!decoder) {
                std::fprintf(stderr, "vantorel-cli decode: no decoder for %s\n",
                             TechnologyNames::displayName(stream.technology()).c_str());
                return 1;
            }
        } else if (stream.technology() != decoderTechnology) {
            std::fprintf(stderr, "vantorel-cli decode: %s is %s, the files before it %s: skipped\n", qPrintable(path),
                         TechnologyNames::displayName(stream.technology()).c_str(),
                         TechnologyNames::displayName(decoderTechnology).c_str());
            ++failures;
            continue;
        }
        for (const TimedMessage& m : stream.messages()) {
            ++read;
            // As the receive callback: only message id 0 reaches the decoder.
            if (m.messageId != 0) {
                ++skipped;
                continue;
            }
            decoder->updateState(state, m.data);
        }
    }
    if (!decoder) return failures ? 1 : 0;

    DictionaryRef display = decoder->generateLogUsingState(state);
    if (!display) display = decoder->generateLogUsingState(state);  // the call that builds it returns null
    const std::string text = TreeFormatter::format(*format, display ? Value(display) : Value());
    {
        StdoutToStderr teardown;  // "Deallocing ClassIndex" is not part of the output
        decoder.reset();
    }
    std::fwrite(text.data(), 1, text.size(), stdout);
    std::fprintf(stderr, "%llu messages read, %llu skipped (message id not 0), %llu bad frames\n",
                 static_cast<unsigned long long>(read), static_cast<unsigned long long>(skipped),
                 static_cast<unsigned long long>(badFrames));
    // The IFX decoder shows only messages that are whole displays: a file of log records
    // gives it none, which is said rather than printed as an empty screen.
    if (!display) {
        std::fprintf(stderr, "vantorel-cli decode: no display: the %s decoder could read none of these messages\n",
                     TechnologyNames::displayName(decoderTechnology).c_str());
        return 1;
    }
    return failures ? 1 : 0;
}

}  // namespace vantorel

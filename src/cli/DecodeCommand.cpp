// DecodeCommand: `vantorel-cli decode --technology TECH FILE...`: every message to the decoder, then the display it builds.
#include "cli/DecodeCommand.h"

#include "LogGenerator/LogGenerator.h"
#include "Model/MonitorClock.h"
#include "Platform/SystemLog.h"
#include "Platform/TechnologyNames.h"
#include "PropertyList/Dictionary.h"
#include "TelephonyService/Replay/DiagPacket.h"
#include "TelephonyService/Replay/RecordedStream.h"
#include "cli/SignalExport.h"
#include "cli/StdoutToStderr.h"
#include "Monitor/TreeFormatter.h"

#include <QCommandLineParser>

#include <cstdio>

namespace vantorel {

namespace {

// The display ticks of a replay, on the messages' recorded times: a tick every
// MonitorClock::kDisplayUpdateInterval that brought new messages (as the model only
// redraws after new data), stamped with its recorded time. A message without a time
// (a zero DIAG time stamp) joins the tick it arrives in; a stream in which no message
// has a time gives one row, at the end, with an empty time cell. The last messages'
// tick is at the 2 s mark after them, as a replay would show it.
class ReplayTicks {
public:
    explicit ReplayTicks(SignalExport& out) : out_(out) {}

    void beforeMessage(const TimedMessage& m, LogGenerator& decoder, Dictionary& state, const std::string& technology) {
        if (m.timeMicros == kNoTime) return;
        const int64_t ms = m.timeMicros / 1000;
        if (!next_) {
            next_ = ms + kInterval;
        } else if (ms >= *next_) {
            if (pending_) tick(*next_, decoder, state, technology);
            *next_ += ((ms - *next_) / kInterval + 1) * kInterval;  // the first mark after ms
        }
    }
    void afterMessage() { pending_ = true; }
    void atEnd(LogGenerator& decoder, Dictionary& state, const std::string& technology) {
        if (pending_) tick(next_, decoder, state, technology);
    }

private:
    static constexpr int64_t kInterval = MonitorClock::kDisplayUpdateInterval.count();
    static inline const int64_t kNoTime = DiagPacket::microsecondsSince1970(0);

    void tick(std::optional<int64_t> timeMs, LogGenerator& decoder, Dictionary& state, const std::string& technology) {
        DictionaryRef display = decoder.generateLogUsingState(state);
        if (!display) display = decoder.generateLogUsingState(state);  // the call that builds it returns null
        PathDictionary index;
        VantorelModelNode::makeTreeFromObject(display ? Value(display) : Value(), index);
        out_.tick(timeMs, technology, index);
        pending_ = false;
    }

    SignalExport& out_;
    std::optional<int64_t> next_;
    bool pending_ = false;
};

}  // namespace

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
    SignalExport::addOptions(parser, false);
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
    SignalExport csv;
    std::string csvError;
    if (!csv.configure(parser, false, &csvError)) {
        std::fprintf(stderr, "vantorel-cli decode: %s\n", csvError.c_str());
        return 2;
    }
    ReplayTicks ticks(csv);

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
            if (csv.enabled()) ticks.beforeMessage(m, *decoder, state, decoderTechnology);
            decoder->updateState(state, m.data);
            ticks.afterMessage();
        }
    }
    if (decoder && csv.enabled()) ticks.atEnd(*decoder, state, decoderTechnology);
    if (!csv.finish(decoderTechnology, &csvError)) {
        std::fprintf(stderr, "vantorel-cli decode: %s\n", csvError.c_str());
        ++failures;
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
    if (csv.enabled())
        std::fprintf(stderr, "%llu CSV rows written to %s\n", static_cast<unsigned long long>(csv.rows()),
                     qPrintable(parser.value("csv")));
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

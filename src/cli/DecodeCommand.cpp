// DecodeCommand: `vantorel-cli decode [--technology TECH] FILE...`: every message to the decoder, then the display it builds.
#include "cli/DecodeCommand.h"

#include "cli/CommandOptions.h"

#include "LogGenerator/LogGenerator.h"
#include "Platform/SystemLog.h"
#include "Platform/TechnologyNames.h"
#include "PropertyList/Dictionary.h"
#include "TelephonyService/LogMask.h"
#include "TelephonyService/Replay/RecordedStream.h"
#include "TelephonyService/Replay/RecordedTicks.h"
#include "cli/SignalExport.h"
#include "cli/StdoutToStderr.h"
#include "Monitor/TreeFormatter.h"

#include <QCommandLineParser>

#include <cstdio>

namespace vantorel {

namespace {

// The display ticks of a replay, on the messages' recorded times (RecordedTicks, as a
// replay marks them): each samples the display into the CSV. Each file has a grid of its
// own, from its first message.
class ReplayTicks {
public:
    explicit ReplayTicks(SignalExport& out) : out_(out) {}

    void beforeMessage(const TimedMessage& m, LogGenerator& decoder, Dictionary& state, const std::string& technology) {
        if (const auto due = ticks_.before(m.timeMicros)) tick(due->timeMs, decoder, state, technology);
    }
    void afterMessage() { ticks_.after(); }
    // The messages so far get their tick (a file ends) and the next message starts a new
    // grid: the next file's recorded time may lie before the last one's.
    void atEnd(LogGenerator& decoder, Dictionary& state, const std::string& technology) {
        if (const auto due = ticks_.end()) tick(due->timeMs, decoder, state, technology);
    }

private:
    void tick(std::optional<int64_t> timeMs, LogGenerator& decoder, Dictionary& state, const std::string& technology) {
        DictionaryRef display = decoder.generateLogUsingState(state);
        if (!display) display = decoder.generateLogUsingState(state);  // the call that builds it returns null
        PathDictionary index;
        VantorelModelNode::makeTreeFromObject(display ? Value(display) : Value(), index);
        out_.tick(timeMs, technology, index);
    }

    SignalExport& out_;
    RecordedTicks ticks_;
};

// The decoder of the technology in effect, and its log mask: a stream whose serving cell
// moves to another technology goes on in that technology's decoder, on the same state
// (the monitor does the same).
struct CurrentDecoder {
    std::unique_ptr<LogGenerator> decoder;
    std::string technology;
    LogMask mask;

    // False when there is no decoder for the technology.
    bool use(const std::string& wanted, Dictionary& state) {
        if (decoder && wanted == technology) return true;
        std::unique_ptr<LogGenerator> next = LogGenerator::generatorFromTechnology(wanted);
        if (!next) return false;
        if (decoder) {
            StdoutToStderr teardown;  // "Deallocing ClassIndex" is not part of the output
            decoder.reset();
        }
        LogGenerator::forgetDisplay(state);
        decoder = std::move(next);
        technology = wanted;
        const DictionaryRef start = decoder->getStartCommand();
        mask = start ? LogMask::fromStartCommand(*start) : LogMask::all();
        return true;
    }
    // A message this decoder reads: one of its log codes, or anything for a decoder
    // that asks for everything (IFX).
    bool reads(const TimedMessage& m) const {
        return m.messageId == 0 && (mask.forwardsAll() || (LogMask::classify(m.data) && mask.forwards(m.data)));
    }
};

}  // namespace

int DecodeCommand::run(const QStringList& args) {
    static constexpr const char* kPrefix = "vantorel-cli decode";
    QCommandLineParser parser;
    parser.setApplicationDescription(
        "Decode recorded streams and print the display the monitor would show after them.\n"
        "Every message is handed to the decoder as the monitor does; records that the live\n"
        "modem would not have been asked for are decoded too (no log mask is applied).\n"
        "The decoder follows the technology of the stream's serving-cell records.");
    const QCommandLineOption helpOption = parser.addHelpOption();
    parser.addOption({"technology", "Decoder to use (" + QString::fromStdString(TechnologyNames::listing()) +
                                        ") instead of the one the serving-cell records name.", "TECH"});
    parser.addOption({"format",
                      "Output: tree (as the panes show it), json or plist (the tree's names in its order),\n"
                      "or display (the display dictionary as the decoder keeps it, as JSON).",
                      "FORMAT", "tree"});
    SignalExport::addOptions(parser, false);
    parser.addOption({"verbose", "Mirror the system log to stderr."});
    parser.addPositionalArgument("FILE", "QXDM DLF, QMDL/mi2log or Vantorel capture files, decoded in order.",
                                 "FILE...");
    if (const auto exitCode = CommandOptions::parse(parser, helpOption, kPrefix, args)) return *exitCode;
    SystemLog::setMirrorToStderr(parser.isSet("verbose"));

    const auto format = TreeFormatter::parse(parser.value("format").toStdString());
    if (!format) {
        std::fprintf(stderr, "%s: unknown --format '%s' (tree, json, plist or display)\n", kPrefix,
                     qPrintable(parser.value("format")));
        return 2;
    }
    if (parser.positionalArguments().isEmpty()) {
        std::fprintf(stderr, "%s: no FILE given (see --help)\n", kPrefix);
        return 2;
    }
    std::string technology;
    if (parser.isSet("technology")) {
        auto id = TechnologyNames::identifierFor(parser.value("technology").toStdString());
        if (!id) {
            std::fprintf(stderr, "%s: unknown technology '%s' (%s)\n", kPrefix,
                         qPrintable(parser.value("technology")), TechnologyNames::listing().c_str());
            return 2;
        }
        technology = *id;
    }
    SignalExport csv;
    std::string csvError;
    if (!csv.configure(parser, false, &csvError)) {
        std::fprintf(stderr, "%s: %s\n", kPrefix, csvError.c_str());
        return 2;
    }
    ReplayTicks ticks(csv);

    CurrentDecoder current;
    Dictionary state;
    uint64_t read = 0, skipped = 0, badFrames = 0;
    int failures = 0;
    size_t filesDecoded = 0;  // files with a record for the decoder
    for (const QString& path : parser.positionalArguments()) {
        RecordedStream stream = RecordedStream::open(path.toStdString(), technology);
        if (!stream.ok()) {
            std::fprintf(stderr, "%s: %s\n", kPrefix, stream.error().c_str());
            ++failures;
            continue;
        }
        if (!technology.empty() && !stream.declaredTechnology().empty() && stream.declaredTechnology() != technology) {
            std::fprintf(stderr, "%s: %s is a %s capture: --technology %s contradicts it\n", kPrefix,
                         qPrintable(path), TechnologyNames::displayName(stream.declaredTechnology()).c_str(),
                         qPrintable(parser.value("technology")));
            return 2;
        }
        const RecordedLog& report = stream.report();
        badFrames += report.badCrc + report.malformed + report.truncated;
        // One line per file the decoders have nothing of, whatever the reason.
        if (const std::string why = stream.unusable(true); !why.empty()) {
            std::fprintf(stderr, "%s: %s: %s\n", kPrefix, qPrintable(path), why.c_str());
            ++failures;
            continue;
        }
        if (current.decoder && csv.enabled()) ticks.atEnd(*current.decoder, state, current.technology);
        size_t forDecoder = 0;
        const std::vector<TimedMessage>& messages = stream.messages();
        for (size_t i = 0; i < messages.size(); ++i) {
            const TimedMessage& m = messages[i];
            const std::string at = stream.technologyAt(i);
            if (at != current.technology) {
                // A tick this message closes is the last decoder's, as in a replay (one grid per file).
                if (current.decoder && csv.enabled()) ticks.beforeMessage(m, *current.decoder, state, current.technology);
                if (!current.use(at, state)) {
                    std::fprintf(stderr, "%s: no decoder for %s\n", kPrefix, TechnologyNames::displayName(at).c_str());
                    return 1;
                }
            }
            ++read;
            // As the receive callback: only message id 0 reaches the decoder.
            if (m.messageId != 0) {
                ++skipped;
                continue;
            }
            forDecoder += current.reads(m);
            if (csv.enabled()) ticks.beforeMessage(m, *current.decoder, state, current.technology);
            current.decoder->updateState(state, m.data);
            ticks.afterMessage();
        }
        if (forDecoder == 0) {
            std::fprintf(stderr, "%s: %s: no record for the %s decoder among its %zu messages\n", kPrefix,
                         qPrintable(path), TechnologyNames::displayName(current.technology).c_str(), messages.size());
            ++failures;
        } else {
            ++filesDecoded;
        }
    }
    if (current.decoder && csv.enabled()) ticks.atEnd(*current.decoder, state, current.technology);
    if (!csv.finish(current.technology, &csvError)) {
        std::fprintf(stderr, "%s: %s\n", kPrefix, csvError.c_str());
        ++failures;
    }
    // Nothing was read: the lines above said why; no empty screen is printed.
    if (!current.decoder || filesDecoded == 0) {
        StdoutToStderr teardown;  // "Deallocing ClassIndex" is not part of the output
        current.decoder.reset();
        return 1;
    }

    DictionaryRef display = current.decoder->generateLogUsingState(state);
    if (!display) display = current.decoder->generateLogUsingState(state);  // the call that builds it returns null
    const std::string text = TreeFormatter::format(*format, display ? Value(display) : Value());
    {
        StdoutToStderr teardown;  // "Deallocing ClassIndex" is not part of the output
        current.decoder.reset();
    }
    // The IFX decoder shows only messages that are whole displays: a file of log records
    // gives it none, which is said rather than printed as an empty screen.
    if (!display) {
        std::fprintf(stderr, "%s: no record for the %s decoder: it could read none of these messages\n", kPrefix,
                     TechnologyNames::displayName(current.technology).c_str());
        return 1;
    }
    std::fwrite(text.data(), 1, text.size(), stdout);
    std::fprintf(stderr, "%llu messages read, %llu skipped (message id not 0), %llu bad frames\n",
                 static_cast<unsigned long long>(read), static_cast<unsigned long long>(skipped),
                 static_cast<unsigned long long>(badFrames));
    if (csv.enabled())
        std::fprintf(stderr, "%llu CSV rows written to %s\n", static_cast<unsigned long long>(csv.rows()),
                     qPrintable(parser.value("csv")));
    return failures ? 1 : 0;
}

}  // namespace vantorel

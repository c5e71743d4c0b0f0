// RecordedStream: a recorded stream of any of our formats (capture, QXDM DLF, QMDL / mi2log), detected from the content, as timed messages for replay and inspection.
#pragma once

#include "PropertyList/Value.h"
#include "TelephonyService/Replay/CaptureReader.h"
#include "TelephonyService/Replay/RecordedLog.h"

#include <optional>
#include <string>
#include <utility>
#include <vector>

namespace vantorel {

// Detection, in this order:
//   - "VNTRLCAP" at the start: a capture (CaptureReader); its header names a technology.
//   - a chain of DLF records (DlfReader's layout): the first record's length is at least
//     12 and fits in the file, and either its code is LogCode::kDlfVersionReport (the version report the monitor's
//     writer puts first) or at least 2 records chain exactly to the end of the file.
//   - anything else: QMDL / mi2log (HDLC-framed DIAG, QmdlReader).
// QMDL and DLF records become Morvek records (type byte 1 + DLF record, message id 0)
// timed by their DIAG time stamps (DiagPacket::microsecondsSince1970).
//
// Technology: a modem logs its serving cell only on the radio it is on, so the stream's
// serving-cell records (ServingCellCodes, the rule of the live modem) say which decoder
// reads it, and when it moves: the technology of the first one holds from the first
// message on (a capture's header instead, up to its first serving-cell record of another
// technology), each later one of another technology starts a span of its own. A
// technology passed in (--technology) holds for the whole stream instead, unless a
// capture's header names another (decode refuses that contradiction; the service keeps
// the header's and says so).
class RecordedStream {
public:
    enum class Format { Capture, Dlf, Qmdl };

    // The part of the stream, from message `from` on, that one technology's decoder reads.
    struct TechnologySpan {
        size_t from = 0;
        std::string technology;
        bool operator==(const TechnologySpan&) const = default;
    };

    // Reads and parses the whole file. technology: an identifier that overrides what the
    // stream's records say (may be empty). On failure ok() is false and error() says why.
    static RecordedStream open(const std::string& path, const std::string& technology = {});
    static RecordedStream fromBytes(ByteView data, const std::string& technology = {});

    static Format detect(ByteView data);
    // "capture", "DLF", "QMDL".
    static const char* formatName(Format format);

    bool ok() const { return report_.ok(); }
    const std::string& error() const { return report_.error; }
    Format format() const { return format_; }
    const char* formatName() const { return formatName(format_); }
    // The technology at the first message; empty when neither the override, nor a
    // capture's header, nor a serving-cell record names one.
    std::string technology() const { return spans_.empty() ? std::string() : spans_.front().technology; }
    // The technology in effect at message `index` (the last span starting at or before it).
    std::string technologyAt(size_t index) const;
    // The spans in message order, the first from message 0; one for an override; none when
    // no technology is known.
    const std::vector<TechnologySpan>& technologySpans() const { return spans_; }
    // Every technology of the spans, in the order they first appear.
    std::vector<std::string> technologies() const;
    // A capture's header technology (empty for DLF and QMDL, which carry none).
    const std::string& declaredTechnology() const { return declared_; }
    // Why no decoder can be given this stream, in one line for the user ("no record in it
    // (read as QMDL; 3 bad frames)", "no serving-cell record tells its technology: add
    // --technology (...)"); empty when it can. The technology only when `needTechnology`.
    std::string unusable(bool needTechnology) const;
    const std::vector<TimedMessage>& messages() const { return messages_; }
    // Counts per log code and bad frames (RecordedLog's counters; its entries are empty,
    // their records are in messages()).
    const RecordedLog& report() const { return report_; }

    // False when no message came out: an empty file, random bytes, a capture header
    // alone, a QMDL file of text and event packets only.
    bool holdsRecords() const { return !messages_.empty(); }
    // The earliest and the latest time of the messages that carry one, microseconds
    // since 1970 (arrival times in a capture, DIAG time stamps in DLF and QMDL; recorded
    // time may go back, between files or after a modem's clock reset); empty when none does.
    std::optional<std::pair<int64_t, int64_t>> timeSpan() const { return timeSpan_; }

    // "<format>, technology <name>, <n> messages" ("technologies <a>, <b>" when the modem
    // moved, "technology unknown" when no serving-cell record tells), then the report's
    // summary (for the IFX channel, whose messages are property lists, the count of those
    // that parse instead), then "time span <earliest> to <latest> UTC (<s> s)" when
    // messages carry times.
    std::string summary() const;

private:
    std::string timeSpanText() const;

    void findTechnologies(const std::string& override);

    Format format_ = Format::Qmdl;
    std::string declared_;
    std::vector<TechnologySpan> spans_;
    std::vector<TimedMessage> messages_;
    RecordedLog report_;
    std::optional<std::pair<int64_t, int64_t>> timeSpan_;
};

}  // namespace vantorel

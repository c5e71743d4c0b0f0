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
//   - "VNTRLCAP" at the start: a capture (CaptureReader); its technology is the file's.
//   - a chain of DLF records (DlfReader's layout): the first record's length is at least
//     12 and fits in the file, and either its code is LogCode::kDlfVersionReport (the version report the monitor's
//     writer puts first) or at least 2 records chain exactly to the end of the file.
//   - anything else: QMDL / mi2log (HDLC-framed DIAG, QmdlReader).
// QMDL and DLF records become Morvek records (type byte 1 + DLF record, message id 0)
// timed by their DIAG time stamps (DiagPacket::microsecondsSince1970); they carry no
// technology, so the one passed in (from --technology) is used.
class RecordedStream {
public:
    enum class Format { Capture, Dlf, Qmdl };

    // Reads and parses the whole file. technology: the identifier to use when the file
    // does not carry one (may be empty). On failure ok() is false and error() says why.
    static RecordedStream open(const std::string& path, const std::string& technology = {});
    static RecordedStream fromBytes(ByteView data, const std::string& technology = {});

    static Format detect(ByteView data);
    // "capture", "DLF", "QMDL".
    static const char* formatName(Format format);

    bool ok() const { return report_.ok(); }
    const std::string& error() const { return report_.error; }
    Format format() const { return format_; }
    const char* formatName() const { return formatName(format_); }
    // The capture's technology, else the one passed in; empty when neither is known.
    const std::string& technology() const { return technology_; }
    // True when the technology came from the file itself (a capture).
    bool technologyFromFile() const { return technologyFromFile_; }
    const std::vector<TimedMessage>& messages() const { return messages_; }
    // Counts per log code and bad frames (RecordedLog's counters; its entries are empty,
    // their records are in messages()).
    const RecordedLog& report() const { return report_; }

    // False for content in which no reader found anything: an empty file, random bytes
    // (neither a capture header, nor a DLF record, nor a good QMDL frame).
    bool holdsRecords() const;
    // The times of the first and last message that carries one, microseconds since 1970
    // (arrival times in a capture, DIAG time stamps in DLF and QMDL); empty when none does.
    std::optional<std::pair<int64_t, int64_t>> timeSpan() const { return timeSpan_; }

    // "<format>, technology <name>, <n> messages", then the report's summary (for the
    // IFX channel, whose messages are property lists, the count of those that parse
    // instead), then "time span <first> to <last> UTC (<s> s)" when messages carry times.
    std::string summary() const;

private:
    std::string timeSpanText() const;

    Format format_ = Format::Qmdl;
    std::string technology_;
    bool technologyFromFile_ = false;
    std::vector<TimedMessage> messages_;
    RecordedLog report_;
    std::optional<std::pair<int64_t, int64_t>> timeSpan_;
};

}  // namespace vantorel

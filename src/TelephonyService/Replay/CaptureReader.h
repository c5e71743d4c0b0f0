// CaptureReader: reads a Vantorel capture file back into its technology and its messages with their arrival times (docs/capture-format.md).
#pragma once

#include "PropertyList/Value.h"
#include "TelephonyService/Replay/RecordedLog.h"

#include <cstdint>
#include <string>
#include <vector>

namespace vantorel {

// One message of a recorded stream with the time it arrived (or, for QMDL and DLF
// records, the modem's time stamp converted by DiagPacket::microsecondsSince1970).
struct TimedMessage {
    int64_t timeMicros = 0;  // since 1970-01-01 00:00:00 UTC
    int32_t messageId = 0;   // stored in a capture as the u32 of the same bits
    Bytes data;
    bool operator==(const TimedMessage&) const = default;
};

// What a capture file holds. The report uses RecordedLog's counters and problem texts:
// logPackets / codeCounts count the ordinary Morvek records (type 1, by 16-bit code,
// after the optional 0x81 prefix), otherPackets every other message (extra records,
// IFX messages, junk); a truncated last message is counted in `truncated`, described
// in `problems` and not returned. A file that is not a capture (bad magic, another
// version, a header cut short) sets `report.error` and holds no messages.
struct Capture {
    uint32_t version = 0;
    std::string technology;
    std::vector<TimedMessage> messages;
    RecordedLog report;

    bool ok() const { return report.ok(); }
};

class CaptureReader {
public:
    // A file that cannot be read gives a capture with report.error "<path>: <reason>".
    static Capture readFile(const std::string& path);
    static Capture readBytes(ByteView data);
    // True when data starts with the magic "VNTRLCAP".
    static bool hasMagic(ByteView data);
};

}  // namespace vantorel

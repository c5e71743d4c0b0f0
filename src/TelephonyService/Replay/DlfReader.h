// DlfReader: reads a QXDM DLF file into the Morvek records it holds.
#pragma once

#include "PropertyList/Value.h"
#include "TelephonyService/Replay/RecordedLog.h"

#include <string>

namespace vantorel {

// A DLF file is a raw concatenation of records, no file header or trailer:
//   0..1 len u16 LE (12 + payload length) | 2..3 code u16 LE | 4..11 time stamp u64 LE | 12.. payload
// The monitor's own DLF writer leads with a 161-byte version record (LogCode::kDlfVersionReport); it is
// read like any other record. After it come the messages each display entry kept: an
// entry's first record without its type byte, then whole messages
//   [0x81 0x00] (optional prefix) | type u8 (1 ordinary, 255 extra) | record
// so in a file led by that version report, at a record boundary such a header is
// skipped when the record behind it is well formed and chains on (see recordStart).
// Each record becomes the Morvek record type byte 1 + the record (255 + the record for
// an extra record behind its header). Records carry no sync marks, so at the first
// record with len < 12 (malformed) or running past the end of the file (truncated)
// reading stops; the records before it are kept.
class DlfReader {
public:
    static constexpr size_t kRecordHeaderLength = 12;
    // The length the monitor's DLF writer gives the version report it leads with.
    static constexpr uint16_t kOwnVersionReportLength = 161;

    // A file that cannot be read gives a log with `error` set ("<path>: <reason>").
    static RecordedLog readFile(const std::string& path);
    static RecordedLog readBytes(ByteView data);
};

}  // namespace vantorel

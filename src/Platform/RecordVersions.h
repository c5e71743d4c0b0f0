// RecordVersions: the layout versions the decoders can read for the LTE records whose layout changed between modem generations.
#pragma once

#include "PropertyList/Value.h"

#include <cstdint>
#include <map>
#include <optional>
#include <utility>

namespace vantorel {

// Byte 13 of these records (the first payload byte) is the layout version. The decoders
// read every version up to the newest they have a layout for (the original layout and
// the newer ones of docs/record-versions.md); a later version would fill the display
// with garbage, so such a record is skipped, counted, and said once in the log
// ("0xB0C2 version 7: layout unknown, record skipped").
class RecordVersions {
public:
    // The newest layout version known for an ordinary record's code; empty for a code
    // whose layout does not vary.
    static std::optional<uint8_t> newestKnown(int32_t code);
    // The version byte of a record of a versioned code; empty for other codes, extra
    // records and records cut before byte 13.
    static std::optional<uint8_t> versionOf(ByteView record, int32_t code);
    // False for a record of a version newer than any known layout: it is counted and,
    // the first time for its code and version, logged at warning priority.
    static bool readable(ByteView record, int32_t code);
    // Records skipped so far in this process, by code and version.
    static std::map<std::pair<int32_t, uint8_t>, uint64_t> skipped();
};

}  // namespace vantorel

// LogMask: the log mask a channel's start command sets, forwarding only subscribed log codes like a modem.
#pragma once

#include "Platform/LogCodes.h"
#include "PropertyList/Dictionary.h"
#include "PropertyList/Value.h"

#include <cstdint>
#include <optional>
#include <set>
#include <string>

namespace vantorel {

// A message is classified the way the decoders frame it:
//   [0x81 xx]  optional two-byte prefix, removed first
//   0          type: 1 ordinary record, 255 extra record
//   1..2       length (not read)
//   3..4       log code u16 LE; an extra record's effective code is 0xFF0000 | code
// Ordinary codes are matched against "SetMorvekLogCodes", extra codes (without the
// 0xFF0000) against "SetTsExtraCodes". A message that cannot be classified (fewer than
// 5 bytes after the prefix, or another type byte) is forwarded whatever the mask says,
// so the decoders meet the modem's junk as they would on a real link.
class LogMask {
public:
    static constexpr uint8_t kPrefixByte = 0x81;
    static constexpr size_t kPrefixLength = 2;

    struct Classification {
        uint8_t type = 0;   // LogCode::kOrdinaryType or LogCode::kExtraType
        uint16_t code = 0;  // the 16-bit code of bytes 3..4
        bool isOrdinary() const { return type == LogCode::kOrdinaryType; }
        // LogCode::kExtraBase | code for an extra record, code for an ordinary one.
        int32_t effectiveCode() const { return isOrdinary() ? code : (LogCode::kExtraBase | code); }
    };
    // Empty when the message cannot be classified (see above).
    static std::optional<Classification> classify(ByteView message);

    // Subscribes to nothing: only unclassifiable messages pass.
    LogMask() = default;
    // Forwards every message ({"SetState": "Streaming"} with no code lists, the IFX start command).
    static LogMask all();
    // The mask of a start command: with neither "SetMorvekLogCodes" nor "SetTsExtraCodes",
    // everything; otherwise exactly the listed codes (a missing list subscribes to none of
    // its kind). Entries that are not numbers in 0..0xFFFF are skipped; *problem (when
    // given) then says which.
    static LogMask fromStartCommand(const Dictionary& command, std::string* problem = nullptr);


    bool forwards(ByteView message) const;
    // Every message (no code lists), or exactly the ordinary codes listed.
    bool forwardsAll() const { return all_; }
    const std::set<uint16_t>& ordinaryCodes() const { return ordinary_; }
    // "all codes" or "<n> log codes, <m> extra codes", for status lines.
    std::string description() const;

private:
    bool all_ = false;
    std::set<uint16_t> ordinary_;
    std::set<uint16_t> extra_;
};

}  // namespace vantorel

// DiagCommand: the DIAG requests the service sends a modem, their HDLC framing, and how a reply is recognised among the modem's other traffic.
#pragma once

#include "PropertyList/Value.h"

#include <array>
#include <cstddef>
#include <cstdint>
#include <map>
#include <optional>
#include <set>
#include <string>
#include <vector>

namespace vantorel {

// Opcodes (the first byte of a DIAG body).
namespace DiagOpcode {
inline constexpr uint8_t kVersion = 0x00;          // version information; every DIAG port answers it
inline constexpr uint8_t kLog = 0x10;              // a log packet (unsolicited)
inline constexpr uint8_t kBadCommand = 0x13;       // error replies: 13/14/15/18 followed by the request
inline constexpr uint8_t kBadParameter = 0x14;
inline constexpr uint8_t kBadLength = 0x15;
inline constexpr uint8_t kBadMode = 0x18;
inline constexpr uint8_t kEventReport = 0x60;      // event reporting on/off; also the events themselves
inline constexpr uint8_t kLogConfig = 0x73;        // log mask: 73 00 00 00 <op u32> ...
inline constexpr uint8_t kMessage = 0x79;          // debug message (unsolicited)
inline constexpr uint8_t kBuildId = 0x7C;          // build identifier string
inline constexpr uint8_t kExtMessageConfig = 0x7D; // debug-message levels
inline constexpr uint8_t kExtMessage = 0x92;       // extended debug message (unsolicited)
inline constexpr uint8_t kMultiSim = 0x98;         // dual-SIM wrapper around another body
}  // namespace DiagOpcode

// Log-configuration operations (the u32 after 73 00 00 00).
namespace DiagLogConfigOp {
inline constexpr uint32_t kDisable = 0;         // every equipment's mask cleared
inline constexpr uint32_t kRetrieveRanges = 1;  // reply: status u32, then 16 item counts u32
inline constexpr uint32_t kSetMask = 3;         // equipment u32, item count N u32, ceil(N/8) mask bytes
}  // namespace DiagLogConfigOp

// A log code is equipment (high 4 bits) and item (low 12 bits): 0xB0C2 is item 0x0C2 of
// equipment 0xB, bit 2 of byte 24 of that equipment's mask.
struct DiagLogItem {
    uint32_t equipment = 0;
    uint32_t item = 0;
    static DiagLogItem of(uint16_t code) { return {static_cast<uint32_t>(code >> 12), static_cast<uint32_t>(code & 0x0FFF)}; }
    uint16_t code() const { return static_cast<uint16_t>((equipment << 12) | item); }
};

class DiagCommand {
public:
    static constexpr size_t kEquipmentCount = 16;
    using ItemCounts = std::array<uint32_t, kEquipmentCount>;
    // A set-mask request per equipment; codes whose item lies at or beyond the modem's
    // count for its equipment cannot be asked for and are listed in `skipped`.
    struct MaskPlan {
        std::map<uint32_t, Bytes> requests;  // equipment -> request body (unframed)
        std::vector<uint16_t> skipped;
    };

    // HDLC frame of a request: body, CRC-16/X.25 low byte first, 7D/7E escaped (the CRC
    // bytes too), closing 7E; no leading flag. "01 02 03 04" -> "01 02 03 04 91 39 7E".
    // A non-zero crcXor spoils the CRC on purpose (a modem's bad frame, played by a fake one).
    static Bytes frame(ByteView body, uint16_t crcXor = 0);

    // Request bodies (unframed).
    static Bytes eventReportsOff();      // 60 00
    static Bytes logConfig(uint32_t op); // 73 00 00 00 <op u32>: disable (0), retrieve ranges (1)
    static Bytes messageLevelsOff();     // 7D 05 00 00 00 00 00 00: every debug-message level 0
    static Bytes version();              // 00
    static Bytes buildId();              // 7C
    // 73 00 00 00 03 00 00 00 <equipment u32> <N u32> <ceil(N/8) bytes, item i at byte i/8 bit i%8>
    static Bytes setMask(uint32_t equipment, uint32_t itemCount, const std::set<uint32_t>& items);
    // One setMask per equipment with a code in `codes` (equipments with none are left out:
    // the disable before has cleared them).
    static MaskPlan planMasks(const std::set<uint16_t>& codes, const ItemCounts& counts);

    // The clearing sequence, in order: event reports off, log masks cleared, debug messages off.
    static std::vector<Bytes> clearingSequence();

    // Whether `reply` answers `request`: the same opcode (and for 73 the same op, for 7D the
    // same subcommand), or an error reply (13/14/15/18) that echoes the request's opcode.
    static bool answers(ByteView reply, ByteView request);
    // "bad command" / "bad parameter" / "bad length" / "bad mode" for an error reply; empty otherwise.
    static std::string errorName(ByteView reply);
    // The status u32 of a log-configuration reply (0: success); empty when too short.
    static std::optional<uint32_t> logConfigStatus(ByteView reply);
    // The 16 item counts of a retrieve-ranges reply; empty when too short or status not 0.
    static std::optional<ItemCounts> itemCounts(ByteView reply);
    // The build ID string of a build-ID reply: 7C <version u8> <reserved u16> <MSM revision u32>
    // <model u32> <build ID, NUL> <model name, NUL>; printable characters only, at most
    // kMaxBuildIdLength; empty for an error reply or one cut before the string.
    static std::string buildIdOf(ByteView reply);
    static constexpr size_t kMaxBuildIdLength = 80;
    // "73 op 3", "60", "7C": how a request is named in messages.
    static std::string describe(ByteView request);
};

}  // namespace vantorel

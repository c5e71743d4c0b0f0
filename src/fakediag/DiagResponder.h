// DiagResponder: the command side of a DIAG modem in software: answers version, build-ID, log-configuration and debug-message requests and keeps the log mask they set.
#pragma once

#include "PropertyList/Value.h"
#include "TelephonyService/Device/DiagCommand.h"

#include <array>
#include <cstdint>
#include <string>

namespace vantorel {

// Replies, as a modem gives them (bodies, unframed):
//   00                 00 <compile date 11> <compile time 8> <release date 11> <release time 8>
//                      <version directory 8> <SCM, CAI revision, model u8> <firmware u16> <slot cycle u8> <vocoder u16>
//   7C                 7C 00 00 00 <MSM revision u32> <model u32> <build ID, NUL> <model name, NUL>
//   60 xx              60 00 (event reports switched on or off)
//   7D 05 ...          the request itself (debug-message levels)
//   73 00 00 00 op     op 0: every mask cleared; op 1: <status 0> <16 item counts u32>;
//                      op 3: <status> <equipment u32> <item count u32> <the mask as kept>
// Errors echo the request behind their opcode: 13 for an unknown opcode, 14 for an unknown
// log-configuration op, 15 for a request of the wrong length.
// A set-mask replaces the equipment's whole mask; items at or beyond the modem's count for
// that equipment are dropped (the reply shows the mask as kept), and an equipment with no
// items at all answers status 2.
class DiagResponder {
public:
    using ItemCounts = DiagCommand::ItemCounts;

    // A modem of our time: the equipments whose codes the decoders read.
    static ItemCounts defaultItemCounts();

    explicit DiagResponder(ItemCounts counts = defaultItemCounts(), std::string buildId = "VANTOREL.FAKEDIAG.1.0");

    Bytes answer(ByteView request);

    // Whether the mask lets log packets of `code` out.
    bool enabled(uint16_t code) const;
    // True while any equipment's mask has a bit set.
    bool logging() const;
    // "0xB: 12 items, 0x4: 3 items" (or "none"), for status lines.
    std::string maskSummary() const;
    const ItemCounts& itemCounts() const { return counts_; }

private:
    Bytes logConfig(ByteView request);

    ItemCounts counts_;
    std::string buildId_;
    std::array<Bytes, DiagCommand::kEquipmentCount> masks_;  // ceil(count / 8) bytes each, item i at bit i % 8 of byte i / 8
};

}  // namespace vantorel

// CCTRCHSIRMeasurement: the "CCTRCH SIR" section: one dictionary per CCTRCH entry of record 0xD00C, with its six SIR values.
#include "LogGenerator/UTRAN/CCTRCHSIRMeasurement.h"

#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"

namespace vantorel {

namespace {

// Record 0xD00C (offsets from the record's first byte; at least 17 bytes):
//   14..15              u16 LE; bits 6-11: TRCH count t
//   15                  bits 4-7: CCTRCH count c
//   289 + 34*t + 8*j    CCTRCH entry j (j < c), 8 bytes:
//     0                 "CCTRCH ID"
//     1                 "TSNUM"
//     2..7              six SIR values, "SIR" in this order
// The 34 bytes per TRCH (where a TRCH entry takes 2) are deliberate: the emulator
// and recorded streams place the CCTRCH entries there.
constexpr size_t kMinLength = 17;
constexpr size_t kTRCHCountOffset = 14;
constexpr size_t kCCTRCHCountOffset = 15;
constexpr size_t kCCTRCHBase = 289;
constexpr size_t kPerTRCH = 34;
constexpr size_t kEntrySize = 8;
constexpr size_t kSIRCount = 6;

}  // namespace

std::string CCTRCHSIRMeasurement::getSectionName() const { return "CCTRCH SIR"; }

std::vector<int32_t> CCTRCHSIRMeasurement::getLogCodeArray() const { return {LogCode::kUTRANBLERAndSIR}; }

void CCTRCHSIRMeasurement::updateWithData(ByteView data, int32_t logCode) {
    SystemLog::log(SystemLog::kWarning, "%s", "CCTRCH SIR Measurement");
    if (logCode != LogCode::kUTRANBLERAndSIR) return;

    rebuildList(data, kMinLength, true, [](const ByteReader& r) {
        const unsigned trchCount = (r.u16(kTRCHCountOffset).value_or(0) >> 6) & 0x3F;
        const unsigned cctrchCount = r.u8(kCCTRCHCountOffset).value_or(0) >> 4;
        const size_t first = kCCTRCHBase + kPerTRCH * trchCount;
        return readEntries(r, first, kEntrySize, kEntrySize, cctrchCount, [](const ByteReader& e) {
            auto sir = Array::create();
            for (size_t k = 0; k < kSIRCount; ++k)
                sir->append(Value(StringFormat::format("%d", e.u8(2 + k).value_or(0))));
            auto entry = Dictionary::create();
            entry->set("CCTRCH ID", Value(StringFormat::format("%d", e.u8(0).value_or(0))));
            entry->set("TSNUM", Value(StringFormat::format("%d", e.u8(1).value_or(0))));
            entry->set("SIR", Value(sir));
            return Value(entry);
        });
    });
}

}  // namespace vantorel

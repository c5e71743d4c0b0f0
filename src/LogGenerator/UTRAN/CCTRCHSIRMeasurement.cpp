// CCTRCHSIRMeasurement: Part 7.2's "CCTRCH SIR" section: one dictionary per CCTRCH entry of record 0xD00C, with its six SIR values.
#include "LogGenerator/UTRAN/CCTRCHSIRMeasurement.h"

#include "Platform/ByteReader.h"
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
// The factor 34 per TRCH (not the 2 bytes a TRCH entry takes) is required as stated.
constexpr size_t kMinLength = 17;
constexpr size_t kTRCHCountOffset = 14;
constexpr size_t kCCTRCHCountOffset = 15;
constexpr size_t kCCTRCHBase = 289;
constexpr size_t kPerTRCH = 34;
constexpr size_t kEntrySize = 8;
constexpr size_t kSIRCount = 6;

}  // namespace

std::string CCTRCHSIRMeasurement::getSectionName() const { return "CCTRCH SIR"; }

std::vector<int32_t> CCTRCHSIRMeasurement::getLogCodeArray() const { return {kLogCode}; }

void CCTRCHSIRMeasurement::updateWithData(ByteView data, int32_t logCode) {
    SystemLog::log(SystemLog::kWarning, "%s", "CCTRCH SIR Measurement");
    if (logCode != kLogCode) return;

    const ByteReader reader(data);
    if (reader.size() < kMinLength) return;

    clearSectionArray();

    const unsigned trchCount = (reader.u16(kTRCHCountOffset).value_or(0) >> 6) & 0x3F;
    const unsigned cctrchCount = reader.u8(kCCTRCHCountOffset).value_or(0) >> 4;
    auto list = Array::create();
    for (unsigned j = 0; j < cctrchCount; ++j) {
        const size_t offset = kCCTRCHBase + kPerTRCH * trchCount + kEntrySize * j;
        if (!reader.has(offset, kEntrySize)) break;  // stop at the record's end
        auto sir = Array::create();
        for (size_t k = 0; k < kSIRCount; ++k)
            sir->append(Value(StringFormat::format("%d", reader.u8(offset + 2 + k).value_or(0))));

        auto entry = Dictionary::create();
        entry->set("CCTRCH ID", Value(StringFormat::format("%d", reader.u8(offset).value_or(0))));
        entry->set("TSNUM", Value(StringFormat::format("%d", reader.u8(offset + 1).value_or(0))));
        entry->set("SIR", Value(sir));
        list->append(Value(entry));
    }

    replaceSectionArray(*list);
}

}  // namespace vantorel

// TRCHBLERMeasurement: Part 7.2's "TRCH BLER" section: one dictionary per transport-channel entry of record 0xD00C.
#include "LogGenerator/UTRAN/TRCHBLERMeasurement.h"

#include "Platform/ByteReader.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"

namespace vantorel {

namespace {

// Record 0xD00C (offsets from the record's first byte; at least 17 bytes):
//   14..15        u16 LE; bits 6-11: TRCH count t
//   17 + 2*i      TRCH entry i (i < t): byte 0 "TRCH ID", byte 1 "TRCH BLER Measurement"
// (The CCTRCH entries further on are CCTRCHSIRMeasurement's.)
constexpr size_t kMinLength = 17;
constexpr size_t kCountOffset = 14;
constexpr size_t kFirstEntry = 17;
constexpr size_t kEntrySize = 2;

}  // namespace

std::string TRCHBLERMeasurement::getSectionName() const { return "TRCH BLER"; }

std::vector<int32_t> TRCHBLERMeasurement::getLogCodeArray() const { return {kLogCode}; }

void TRCHBLERMeasurement::updateWithData(ByteView data, int32_t logCode) {
    SystemLog::log(SystemLog::kNotice, "%s", "TRCH BLER Measurement");
    if (logCode != kLogCode) return;

    const ByteReader reader(data);
    if (reader.size() < kMinLength) return;

    clearSectionArray();

    const unsigned trchCount = (reader.u16(kCountOffset).value_or(0) >> 6) & 0x3F;
    auto list = Array::create();
    for (unsigned i = 0; i < trchCount; ++i) {
        const size_t offset = kFirstEntry + kEntrySize * i;
        if (!reader.has(offset, kEntrySize)) break;  // stop at the record's end
        auto entry = Dictionary::create();
        entry->set("TRCH ID", Value(StringFormat::format("%d", reader.u8(offset).value_or(0))));
        entry->set("TRCH BLER Measurement", Value(StringFormat::format("%d", reader.u8(offset + 1).value_or(0))));
        list->append(Value(entry));
    }

    replaceSectionArray(*list);
}

}  // namespace vantorel

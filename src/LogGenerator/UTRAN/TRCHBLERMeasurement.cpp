// TRCHBLERMeasurement: the "TRCH BLER" section: one dictionary per transport-channel entry of record 0xD00C.
#include "LogGenerator/UTRAN/TRCHBLERMeasurement.h"

#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"
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

std::vector<int32_t> TRCHBLERMeasurement::getLogCodeArray() const { return {LogCode::kUTRANBLERAndSIR}; }

void TRCHBLERMeasurement::updateWithData(ByteView data, int32_t logCode) {
    SystemLog::log(SystemLog::kNotice, "%s", "TRCH BLER Measurement");
    if (logCode != LogCode::kUTRANBLERAndSIR) return;

    rebuildList(data, kMinLength, true, [](const ByteReader& r) {
        const unsigned trchCount = (r.u16(kCountOffset).value_or(0) >> 6) & 0x3F;
        return readEntries(r, kFirstEntry, kEntrySize, kEntrySize, trchCount, [](const ByteReader& e) {
            auto entry = Dictionary::create();
            entry->set("TRCH ID", Value(StringFormat::format("%d", e.u8(0).value_or(0))));
            entry->set("TRCH BLER Measurement", Value(StringFormat::format("%d", e.u8(1).value_or(0))));
            return Value(entry);
        });
    });
}

}  // namespace vantorel

// UTRANNeighbhorMeasurements: the "Neighbor Cell List" section: one dictionary per UARFCN / cell-parameter entry of record 0xD00A.
#include "LogGenerator/UTRAN/UTRANNeighbhorMeasurements.h"

#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"
#include "PropertyList/Dictionary.h"

namespace vantorel {

namespace {

// Record 0xD00A (offsets from the record's first byte; at least 21 bytes):
//   16                 bits 1-7: entry count n (byte 16 >> 1)
//   168 + 16*i         entry i, 16 bytes, i = 0 .. n-1
// Entry, its first four bytes read as one little-endian 32-bit word w (the fields
// run on from byte to byte, so each field is one run of the word's bits):
//   w bits  0-13  byte 0, byte 1 bits 0-5 (high)   "UARFCN", unsigned
//   w bits 14-20  byte 1 bits 6-7 (low), byte 2 bits 0-4 (high)  "Cell ID", 7 bits
//   w bits 21-28  byte 2 bits 5-7 (low), byte 3 bits 0-4 (high)  "Filter RSCP", 8 bits
//   w bits 29-30  byte 3 bits 5-6                   "Status": 0 ASET, 1 MSET, 2 DSET, 3 no key
//   w bit  31     byte 3 bit 7                      "inJDCS": "TRUE" / "FALSE"
constexpr size_t kMinLength = 21;
constexpr size_t kCountOffset = 16;
constexpr size_t kFirstEntry = 168;
constexpr size_t kEntrySize = 16;
constexpr double kRSCPStep = 0.00390625;  // 1/256

static const char* const kStatus[] = {
    "ASET",  // 0
    "MSET",  // 1
    "DSET",  // 2
};

}  // namespace

std::string UTRANNeighbhorMeasurements::getSectionName() const { return "Neighbor Cell List"; }

std::vector<int32_t> UTRANNeighbhorMeasurements::getLogCodeArray() const { return {LogCode::kUTRANNeighbourList}; }

void UTRANNeighbhorMeasurements::updateWithData(ByteView data, int32_t logCode) {
    SystemLog::log(SystemLog::kWarning, "%s", "NeighbhorMeasurements List");
    if (logCode != LogCode::kUTRANNeighbourList) return;

    rebuildList(data, kMinLength, true, [](const ByteReader& r) {
        const unsigned count = r.u8(kCountOffset).value_or(0) >> 1;
        return readEntries(r, kFirstEntry, kEntrySize, kEntrySize, count, [](const ByteReader& e) {
            const uint32_t w = e.u32(0).value_or(0);
            const unsigned uarfcn = w & 0x3FFF;
            const unsigned cellId = (w >> 14) & 0x7F;
            const unsigned rscp = (w >> 21) & 0xFF;
            const unsigned status = (w >> 29) & 0x03;
            const bool inJDCS = (w >> 31) & 0x01;

            auto entry = Dictionary::create();
            entry->set("UARFCN", Value(StringFormat::format("%d", static_cast<int>(uarfcn))));
            entry->set("Cell ID", Value(StringFormat::format("%d", static_cast<int>(cellId))));
            entry->set("Filter RSCP", Value(StringFormat::format("%f", rscp * kRSCPStep)));
            // Status 3 has no name: the entry then has no "Status" key at all.
            if (const char* text = tableText(kStatus, status, nullptr)) entry->set("Status", Value(text));
            entry->set("inJDCS", Value(inJDCS ? "TRUE" : "FALSE"));
            return Value(entry);
        });
    });
}

}  // namespace vantorel

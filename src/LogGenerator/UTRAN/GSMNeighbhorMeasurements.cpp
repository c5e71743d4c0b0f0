// GSMNeighbhorMeasurements: the "GSM Neighbor Cell List" section: decodes record 0xD00E but, on purpose, only clears its list.
#include "LogGenerator/UTRAN/GSMNeighbhorMeasurements.h"

#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"
#include "PropertyList/Dictionary.h"

namespace vantorel {

namespace {

// Record 0xD00E (offsets from the record's first byte; at least 17 bytes):
//   16            entry count n
//   17 + 8*i      entry i, 8 bytes:
//     0           "Cell ID" bits 0-7
//     1           bits 0-5 "Cell ID" bits 8-13; bit 6 "Band Indicator"; bit 7 "BSIC Valid"
//     2           "NCC"
//     3           "BCC"
//     4..5        "ARFCN", u16 LE
//     6..7        "RSSI", s16 LE
constexpr size_t kMinLength = 17;
constexpr size_t kCountOffset = 16;
constexpr size_t kFirstEntry = 17;
constexpr size_t kEntrySize = 8;

std::string decimal(int v) { return StringFormat::format("%d", v); }

}  // namespace

std::string GSMNeighbhorMeasurements::getSectionName() const { return "GSM Neighbor Cell List"; }

std::vector<int32_t> GSMNeighbhorMeasurements::getLogCodeArray() const { return {LogCode::kUTRANGSMNeighbourList}; }

void GSMNeighbhorMeasurements::updateWithData(ByteView data, int32_t logCode) {
    SystemLog::log(SystemLog::kWarning, "%s", "GSM Neighbor Cell List");
    if (logCode != LogCode::kUTRANGSMNeighbourList) return;

    rebuildList(data, kMinLength, true, [](const ByteReader& r) {
        const unsigned count = r.u8(kCountOffset).value_or(0);
        readEntries(r, kFirstEntry, kEntrySize, kEntrySize, count, [](const ByteReader& e) {
            const uint8_t b0 = e.u8(0).value_or(0);
            const uint8_t b1 = e.u8(1).value_or(0);
            auto entry = Dictionary::create();
            entry->set("Cell ID", Value(decimal(b0 | ((b1 & 0x3F) << 8))));
            entry->set("Band Indicator", Value(decimal((b1 >> 6) & 0x01)));
            entry->set("BSIC Valid", Value(decimal((b1 >> 7) & 0x01)));
            entry->set("NCC", Value(decimal(e.u8(2).value_or(0))));
            entry->set("BCC", Value(decimal(e.u8(3).value_or(0))));
            entry->set("ARFCN", Value(decimal(e.u16(4).value_or(0))));
            entry->set("RSSI", Value(decimal(e.s16(6).value_or(0))));
            return Value(entry);
        });
        // Deliberate: the rows are decoded (and their bounds checked) but never shown,
        // so after the first record the list stays empty.
        return ArrayRef();
    });
}

}  // namespace vantorel

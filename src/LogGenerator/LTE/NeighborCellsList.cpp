// NeighborCellsList: the "Neighbor Cells List" section: one row per idle-mode neighbour cell of record 0xB180.
#include "LogGenerator/LTE/NeighborCellsList.h"

#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"
#include "PropertyList/Dictionary.h"

namespace vantorel {

namespace {

// Record 0xB180 (offsets from the record's first byte; at least 21 bytes, shorter
// records leave the list as it is):
//   19..20       u16 LE, bits 6-10: number of neighbour cells minus one (1 to 32 cells)
//   21 + 20*i    neighbour entry i, 20 bytes
constexpr size_t kMinLength = 21;
constexpr size_t kCountOffset = 19;
constexpr size_t kFirstEntry = 21;
constexpr size_t kEntrySize = 20;

// Versions 4 and 5 (today's phones) count the cells as they are, in bits 6-15 of the u16
// at 19 (version 4) or bits 6-31 of the u32 at 21 (version 5, whose E-ARFCN is a u32),
// and give each cell 32 bytes from 21 (version 4) or 25 (version 5), levels in 1/16 dB.
// Cells past the record's end are not read, whatever the count claims.
struct SixteenthLayout {
    size_t minLength, countWidth, countOffset, firstEntry;
};
constexpr SixteenthLayout kLayoutV4 = {21, 2, 19, 21};
constexpr SixteenthLayout kLayoutV5 = {25, 4, 21, 25};
constexpr size_t kSixteenthEntrySize = 32;

enum class Scale {
    Identity,  // "%d", and logged
    Decimal,   // "%d"
    Power,     // x * 0.5 - 140, "%4.2f dBm": half-dB steps, unlike the serving cell's quarter-dB RSRP
    Quality,   // x * 0.25 - 30, "%4.2f dB"
    Srxlev,    // x - 30, "%d dBm"
    RSSI16,    // x / 16 - 110, "%4.2f dBm"
    RSRP16,    // x / 16 - 180, "%4.2f dBm"
    RSRQ16,    // x / 16 - 30, "%4.2f dB"
};

// A bit field of an entry: bits [shift, shift + bits) of the little-endian 32-bit word
// at offset (offsets within the entry).
struct Field {
    const char* key;
    size_t offset;
    unsigned shift;
    unsigned bits;
    Scale scale;
};

// The entry, in display order. The antenna 1 offsets are read from the same bits as
// antenna 0's (bytes 16-19 of the entry are never read), so both antennas always show
// the same values; this is deliberate and kept.
const Field kEntryFields[] = {
    {"Physical Cell ID", 0, 0, 9, Scale::Identity},
    {"Measured RSSI", 0, 9, 8, Scale::Power},
    {"Measured RSRP", 0, 17, 9, Scale::Power},
    {"Average RSRP", 4, 0, 9, Scale::Power},
    {"Measured RSRQ", 4, 9, 7, Scale::Quality},
    {"Average RSRQ", 4, 16, 7, Scale::Quality},
    {"Srxlev", 4, 23, 7, Scale::Srxlev},
    {"Frequency Offset", 8, 0, 16, Scale::Decimal},
    {"Ant 0 Frame Offset", 12, 0, 11, Scale::Decimal},
    {"Ant 0 Sample Offset", 12, 11, 19, Scale::Decimal},
    {"Ant 1 Frame Offset", 12, 0, 11, Scale::Decimal},
    {"Ant 1 Sample Offset", 12, 11, 19, Scale::Decimal},
};

// The 32-byte cell of versions 4 and 5; it carries no frequency or timing offsets.
const Field kSixteenthEntryFields[] = {
    {"Physical Cell ID", 0, 0, 9, Scale::Identity},
    {"Measured RSSI", 0, 9, 11, Scale::RSSI16},
    {"Measured RSRP", 0, 20, 12, Scale::RSRP16},
    {"Average RSRP", 4, 12, 12, Scale::RSRP16},
    {"Measured RSRQ", 8, 12, 10, Scale::RSRQ16},
    {"Average RSRQ", 12, 0, 10, Scale::RSRQ16},
    {"Srxlev", 12, 20, 6, Scale::Srxlev},
};

// One row; the identity and every decibel value are also logged. Each decibel line
// carries the "Measured RSSI" label whatever it measures; the one label is deliberate.
template <size_t N>
Value neighbourRow(const ByteReader& entry, const Field (&fields)[N]) {
    auto row = Dictionary::create();
    for (const Field& f : fields) {
        const int x = static_cast<int>((entry.u32(f.offset).value_or(0) >> f.shift) & ((1u << f.bits) - 1));
        std::string text;
        double db = 0;
        switch (f.scale) {
            case Scale::Identity:
            case Scale::Decimal: text = StringFormat::format("%d", x); break;
            case Scale::Power:
                db = x * 0.5 - 140;
                text = StringFormat::format("%4.2f dBm", db);
                break;
            case Scale::Quality:
                db = x * 0.25 - 30;
                text = StringFormat::format("%4.2f dB", db);
                break;
            case Scale::Srxlev: text = StringFormat::format("%d dBm", x - 30); break;
            case Scale::RSSI16:
            case Scale::RSRP16:
                db = x / 16.0 - (f.scale == Scale::RSSI16 ? 110 : 180);
                text = StringFormat::format("%4.2f dBm", db);
                break;
            case Scale::RSRQ16:
                db = x / 16.0 - 30;
                text = StringFormat::format("%4.2f dB", db);
                break;
        }
        row->set(f.key, Value(text));
        if (f.scale != Scale::Identity && f.scale != Scale::Decimal && f.scale != Scale::Srxlev)
            SystemLog::log(SystemLog::kWarning, "Measured RSSI: %lf\n", db);
        else if (f.scale == Scale::Identity)
            SystemLog::log(SystemLog::kWarning, "Physical Cell ID: %d\n", x);
    }
    return Value(row);
}

}  // namespace

std::string NeighborCellsList::getSectionName() const { return "Neighbor Cells List"; }

std::vector<int32_t> NeighborCellsList::getLogCodeArray() const { return {LogCode::kLTEIdleNeighbourMeasurements}; }

void NeighborCellsList::updateWithData(ByteView data, int32_t logCode) {
    SystemLog::log(SystemLog::kWarning, "%s", "Neighbor Cells List");
    if (logCode != LogCode::kLTEIdleNeighbourMeasurements) {
        logUnknownCode(logCode);
        return;
    }
    const auto version = ByteReader(data).u8(13);
    if (version == 4 || version == 5) {
        const SixteenthLayout& at = version == 4 ? kLayoutV4 : kLayoutV5;
        rebuildList(data, at.minLength, true, [&at](const ByteReader& r) {
            const uint32_t field =
                at.countWidth == 4 ? r.u32(at.countOffset).value_or(0) : r.u16(at.countOffset).value_or(0);
            const unsigned count = field >> 6;
            SystemLog::log(SystemLog::kWarning, "Number of neighboring cells being reported: %u\n", count);
            return readEntries(r, at.firstEntry, kSixteenthEntrySize, kSixteenthEntrySize, count,
                               [](const ByteReader& entry) { return neighbourRow(entry, kSixteenthEntryFields); });
        });
        return;
    }
    rebuildList(data, kMinLength, true, [](const ByteReader& r) {
        const unsigned count = ((r.u16(kCountOffset).value_or(0) >> 6) & 0x1F) + 1;
        SystemLog::log(SystemLog::kWarning, "Number of neighboring cells being reported: %d\n",
                       static_cast<int>(count));
        // A count past the record's end stops at the last whole entry.
        return readEntries(r, kFirstEntry, kEntrySize, kEntrySize, count,
                           [](const ByteReader& entry) { return neighbourRow(entry, kEntryFields); });
    });
}

}  // namespace vantorel

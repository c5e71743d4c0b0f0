// UMTSSet: the "UMTS Set" section: the ranked UMTS cells of record 0x4005, or the UMTS neighbours of the cell monitor (0xFF0001).
#include "LogGenerator/MVK_GSM/UMTSSet.h"

#include "LogGenerator/CellMonitor.h"
#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"
#include "Platform/TelephonyIdentifiers.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"

namespace vantorel {

namespace {

// Reselection-ranking record 0x4005 (at least 15 bytes):
//   13  u8  UMTS cell count U
//   14  u8  GSM cell count (read by "GSM Set", whose entries start at 15 as well)
//   15  U UMTS entries of 10 bytes:
//       0 u16 downlink UARFCN   2 u16 scrambling code   4 s8 RSCP (raw, 21 dB above the shown value)
//       5 s16 rank cell RSCP    7 s8 Ec/No in half dB   8 s16 ranking value
constexpr size_t kMinLength = 15;
constexpr size_t kFirstEntry = 15;
constexpr size_t kEntrySize = 10;

// The cell monitor marks a value it has not measured with this number.
constexpr int32_t kNotMeasured = 32767;

int8_t signedByte(const ByteReader& r, size_t offset) { return static_cast<int8_t>(r.u8(offset).value_or(0)); }

}  // namespace

std::string UMTSSet::getSectionName() const { return "UMTS Set"; }

std::vector<int32_t> UMTSSet::getLogCodeArray() const {
    return {LogCode::kUMTSReselectionRanking, LogCode::kCellMonitor};
}

void UMTSSet::updateWithData(ByteView data, int32_t logCode) {
    SystemLog::log(SystemLog::kWarning, "%s", "UMTSSet");
    switch (logCode) {
        case LogCode::kUMTSReselectionRanking: updateFromRanking(data); break;
        case LogCode::kCellMonitor: updateFromCellMonitor(data); break;
        default: logUnknownCode(logCode); break;
    }
}

void UMTSSet::updateFromRanking(ByteView data) const {
    rebuildList(data, kMinLength, true, [](const ByteReader& r) -> ArrayRef {
        const unsigned count = r.u8(13).value_or(0);
        if (count == 0) return nullptr;
        return readEntries(r, kFirstEntry, kEntrySize, kEntrySize, count, [](const ByteReader& e) {
            const auto rscp = static_cast<int16_t>(signedByte(e, 4) - 21);
            auto row = Dictionary::create();
            row->set("Scrambling Code", Value(StringFormat::format("%d", e.u16(2).value_or(0))));
            row->set("RSCP", Value(StringFormat::format("%d dB", rscp)));
            row->set("Energy Per Chip", Value(StringFormat::format("%f dB", signedByte(e, 7) * 0.5)));
            row->set("Downlink Frequency", Value(StringFormat::format("%d", e.u16(0).value_or(0))));
            row->set("Ranking Value", Value(StringFormat::format("%d", e.s16(8).value_or(0))));
            row->set("Rank Cell RSCP", Value(StringFormat::format("%d dB", e.s16(5).value_or(0))));
            return Value(row);
        });
    });
}

// Every UMTS neighbour of the array becomes a row, also one whose numbers are missing
// (each missing number is logged and its key left out).
void UMTSSet::updateFromCellMonitor(ByteView data) const {
    struct Field {
        const char* cellKey;
        const char* displayKey;
        const char* unit;  // after the number; a measured value (with a unit) may be unmeasured
        const char* failure;
    };
    static const Field kFields[] = {
        {kTSCellMonitorUARFCN, "UARFCN", "", "UMTSSet: Failed to retrieve UARFCN\n"},
        {kTSCellMonitorSCN, "Scrambling Code", "", "UMTSSet: Failed to retrieve Scrambling Code\n"},
        {kTSCellMonitorRSCP, "RSCP", " dBm", "UMTSSet: Failed to retrieve RSCP\n"},
        {kTSCellMonitorECN0, "Energy Per Chip", " dB", "UMTSSet: Failed to retrieve Energy Per Chip\n"},
    };
    clearSectionArray();
    auto rows = Array::create();
    const auto outcome = CellMonitor::forEachCell(
        data, {kTSCellMonitorRadioAccessTechnologyUMTS}, kTSCellMonitorCellTypeNeighbor, [&rows](const Value& cell) {
            auto row = Dictionary::create();
            for (const Field& field : kFields) {
                const auto v = CellMonitor::number(cell, field.cellKey);
                if (!v) {
                    SystemLog::log(SystemLog::kError, "%s", field.failure);
                    continue;
                }
                const bool blank = *v == kNotMeasured && *field.unit;
                row->set(field.displayKey, Value(blank ? std::string() : StringFormat::format("%d%s", *v, field.unit)));
            }
            rows->append(Value(row));
            return true;
        });
    // A payload without a list of cells leaves the list empty.
    if (CellMonitor::logMissingList(outcome)) return;
    replaceSectionArray(*rows);
}

}  // namespace vantorel

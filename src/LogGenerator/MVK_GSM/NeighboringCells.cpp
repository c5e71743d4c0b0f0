// NeighboringCells: the "Neighboring Cells" list section: GSM neighbours from the serving measurement or the cell monitor, with BSICs from the BSIC report.
#include "LogGenerator/MVK_GSM/NeighboringCells.h"

#include "LogGenerator/CellMonitor.h"
#include "LogGenerator/MVK_GSM/RecordFields.h"
#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"
#include "Platform/TelephonyIdentifiers.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"

namespace vantorel {

namespace {

using F = RecordFields;

// 0x5137 neighbour entry, 14 bytes from 29 + 14 * i (i below the count at 28): u16 ARFCN
// at 0, received level at 2, u32 C1 at 3; the other bytes are not shown.
const RecordFields::Field kNeighbour[] = {
    F::number("ARFCN", 0, 2),
    F::number("RSSI", 2),
    F::number("C1 Value", 3, 4),
};

// The cell monitor's "no measurement" RSSI, shown as an empty text.
constexpr int16_t kNoRSSI = 32767;

}  // namespace

std::string NeighboringCells::getSectionName() const { return "Neighboring Cells"; }

std::vector<int32_t> NeighboringCells::getLogCodeArray() const {
    return {LogCode::kGSMServingMeasurement, LogCode::kGSMBSICReport, LogCode::kCellMonitor};
}

void NeighboringCells::updateWithData(ByteView data, int32_t logCode) {
    SystemLog::log(SystemLog::kWarning, "%s", "NeighboringCells");
    switch (logCode) {
        case LogCode::kGSMServingMeasurement: updateFromMeasurement(data); break;
        case LogCode::kGSMBSICReport: updateBSICs(data); break;
        case LogCode::kCellMonitor: updateFromCellMonitor(data); break;
        default: logUnknownCode(logCode); break;
    }
}

// 0x5137 (at least 29 bytes): the list is emptied, then holds one row per neighbour; a
// neighbour shows a BSIC only when the last BSIC report named its ARFCN.
void NeighboringCells::updateFromMeasurement(ByteView data) const {
    rebuildList(data, 29, true, [this](const ByteReader& r) {
        return readEntries(r, 29, 14, 14, r.u8(28).value_or(0), [this](const ByteReader& entry) {
            Value row = F::dictionary(entry, kNeighbour);
            const auto bsic = arfcnToBsic_.find(StringFormat::format("%d", entry.u16(0).value_or(0)));
            if (bsic != arfcnToBsic_.end()) row.asDictionary()->set("BSIC", Value(bsic->second));
            return row;
        });
    });
}

// 0x51FF (at least 15 bytes): count at 14, then 4-byte entries from 15: u16 ARFCN at 0,
// BSIC at 2 (byte 3 unused). Replaces every earlier pairing; shows nothing itself.
void NeighboringCells::updateBSICs(ByteView data) {
    const ByteReader r(data);
    if (r.size() < 15) return;
    std::unordered_map<std::string, std::string> pairs;
    // The rows are not shown: each entry only adds its pairing.
    readEntries(r, 15, 4, 4, r.u8(14).value_or(0), [&pairs](const ByteReader& entry) {
        pairs[StringFormat::format("%d", entry.u16(0).value_or(0))] = StringFormat::format("%d", entry.u8(2).value_or(0));
        return Value();
    });
    arfcnToBsic_ = std::move(pairs);
}

// 0xFF0001: the list is emptied, then holds one row per GSM neighbour of the cell
// monitor. A cell lacking a number logs it and its row lacks that key.
void NeighboringCells::updateFromCellMonitor(ByteView data) const {
    rebuildList(data, 0, true, [](const ByteReader& r) -> ArrayRef {
        auto rows = Array::create();
        const auto outcome = CellMonitor::forEachCell(
            r.bytes(), {kTSCellMonitorRadioAccessTechnologyGSM}, kTSCellMonitorCellTypeNeighbor, [&rows](const Value& cell) {
                auto row = Dictionary::create();
                if (const auto arfcn = CellMonitor::number(cell, kTSCellMonitorARFCN))
                    row->set("ARFCN", Value(StringFormat::format("%d", *arfcn & 0xFFFF)));
                else
                    SystemLog::log(SystemLog::kError, "%s", "NeighboringCells: Failed to retrieve ARFCN\n");
                if (const auto rssi = CellMonitor::number(cell, kTSCellMonitorRSSI)) {
                    const auto level = static_cast<int16_t>(*rssi);
                    row->set("RSSI", Value(level == kNoRSSI ? std::string() : StringFormat::format("%d dBm", level * 2)));
                } else {
                    SystemLog::log(SystemLog::kError, "%s", "NeighboringCells: Failed to retrieve RSSI\n");
                }
                rows->append(Value(row));
                return true;
            });
        if (outcome == CellMonitor::Outcome::Read) return rows;
        SystemLog::log(SystemLog::kError, "%s", "Failed to get Cell Array\n");
        return nullptr;
    });
}

}  // namespace vantorel

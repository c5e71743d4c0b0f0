// GSMServingCell: the "GSM Serving Cell" section: identity (0x5134), level and C1/C2 (0x5137), dedicated ARFCN (0x5076) and the cell monitor's serving GSM cell (0xFF0001).
#include "LogGenerator/MVK_GSM/GSMServingCell.h"

#include "LogGenerator/CellMonitor.h"
#include "LogGenerator/MVK_GSM/RecordFields.h"
#include "Platform/LogCodes.h"
#include "Platform/SystemLog.h"
#include "Platform/TelephonyIdentifiers.h"

namespace vantorel {

namespace {

using F = RecordFields;

// 0x5134, at least 26 bytes: 13 ARFCN, 15 BSIC, 17 cell ID, each u16.
const RecordFields::Field kIdentity[] = {
    F::number("Cell ID", 17, 2),
    F::number("ARFCN", 13, 2),
    F::number("BSIC", 15, 2),
};
// 0x5137, at least 29 bytes: 15 received level, 16 and 20 u32 words whose low 16 bits
// are C1 and C2 (the RR section reads the same words as quality).
const RecordFields::Field kServingMeasurement[] = {
    F::number("RSSI", 15, 1, " dBm"),
    F::number("C1 Value", 16, 4).bits(0, 16),
    F::number("C2 Value", 20, 4).bits(0, 16),
};
// 0x5076, at least 17 bytes: the u16 ARFCN at 13, of which only the low byte is shown
// (an ARFCN above 255 shows modulo 256), as the modem's own tools show it.
const RecordFields::Field kDedicatedAllocation[] = {
    F::number("MA Dedicated ARFCN", 13, 2).bits(0, 8),
};

const RecordFields::Record kRecords[] = {
    {LogCode::kGSMServingCellIdentity, 26, kIdentity},
    {LogCode::kGSMServingMeasurement, 29, kServingMeasurement},
    {LogCode::kGSMDedicatedAllocation, 17, kDedicatedAllocation},
};

const CellMonitor::Field kCellMonitorFields[] = {
    {kTSCellMonitorCellId, "Cell ID", nullptr, "GSMServingCell: Failed to retrieve Cell ID\n"},
    {kTSCellMonitorARFCN, "ARFCN", nullptr, "GSMServingCell: Failed to retrieve ARFCN\n"},
};

}  // namespace

std::string GSMServingCell::getSectionName() const { return "GSM Serving Cell"; }

std::vector<int32_t> GSMServingCell::getLogCodeArray() const {
    std::vector<int32_t> codes = RecordFields::codes(kRecords);
    codes.push_back(LogCode::kCellMonitor);
    return codes;
}

void GSMServingCell::updateWithData(ByteView data, int32_t logCode) {
    SystemLog::log(SystemLog::kWarning, "%s", "GSMServingCell");
    const auto set = [this](const std::string& key, const std::string& text) { setValue(key, text); };
    if (logCode == LogCode::kCellMonitor) {
        // The first serving GSM cell of the array; a payload without an array of cells,
        // unparsable or not, says only this.
        const auto outcome = CellMonitor::showServingCell(data, {kTSCellMonitorRadioAccessTechnologyGSM},
                                                          CellMonitor::Pick::FirstCell, kCellMonitorFields, set);
        if (outcome != CellMonitor::Outcome::Read) SystemLog::log(SystemLog::kError, "%s", "Failed to get Cell Array\n");
        return;
    }
    if (!RecordFields::showRecord(data, logCode, kRecords, set)) logUnknownCode(logCode);
}

}  // namespace vantorel

// UTRANServingCellInfo: the "Serving Cell Info" section: the serving cell from record 0xD0E2 and from the cell monitor (extra 0xFF0001).
#include "LogGenerator/UTRAN/UTRANServingCellInfo.h"

#include "LogGenerator/CellMonitor.h"
#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"
#include "Platform/TelephonyIdentifiers.h"

namespace vantorel {

namespace {

// Record 0xD0E2 (offsets from the record's first byte; at least 26 bytes, shorter
// records are ignored):
//   14     u8       "Cell Access Restrictions"
//   15     u8       "URA ID"
//   17..18 u16 LE   "Uplink UARFCN"
//   19..20 u16 LE   "Downlink UARFCN"
//   21..24 s32 LE   "Cell ID"
//   25     bit 0    "Allowed Access": set "Emergency Calls Only", clear "All Calls"
constexpr size_t kServingCellMinLength = 26;

// The cell monitor gives one UARFCN, shown for both directions.
const CellMonitor::Field kCellMonitorFields[] = {
    {kTSCellMonitorLAC, "Local Area Code", nullptr, "Serving Cell Info: Failed to retrieve LAC\n"},
    {kTSCellMonitorCellId, "Cell ID", nullptr, "Serving Cell Info: Failed to retrieve Cell ID\n"},
    {kTSCellMonitorBandInfo, "Freq Band Indicator", nullptr,
     "Serving Cell Info: Failed to retrieve Freq Band Indicator\n"},
    {kTSCellMonitorSCN, "Cell Scrambling Code", nullptr, "Serving Cell Info: Failed to retrieve Cell Scrambling Code\n"},
    {kTSCellMonitorUARFCN, "Uplink UARFCN", "Downlink UARFCN", "Serving Cell Info: Failed to retrieve UARFCN\n"},
};

}  // namespace

std::string UTRANServingCellInfo::getSectionName() const { return "Serving Cell Info"; }

std::vector<int32_t> UTRANServingCellInfo::getLogCodeArray() const {
    return {LogCode::kUTRANServingCell, LogCode::kCellMonitor};
}

void UTRANServingCellInfo::updateWithData(ByteView data, int32_t logCode) {
    SystemLog::log(SystemLog::kWarning, "%s", "Serving Cell Info");

    if (logCode == LogCode::kUTRANServingCell) {
        const ByteReader r(data);
        if (r.size() < kServingCellMinLength) return;
        setValue("Cell Access Restrictions", StringFormat::format("%d", r.u8(14).value_or(0)));
        setValue("Cell ID", StringFormat::format("%d", r.s32(21).value_or(0)));
        setValue("Downlink UARFCN", StringFormat::format("%d", r.u16(19).value_or(0)));
        setValue("Uplink UARFCN", StringFormat::format("%d", r.u16(17).value_or(0)));
        setValue("URA ID", StringFormat::format("%d", r.u8(15).value_or(0)));
        setValue("Allowed Access", (r.u8(25).value_or(0) & 0x01) ? "Emergency Calls Only" : "All Calls");
        return;
    }

    if (logCode != LogCode::kCellMonitor) return;
    // Every serving UTRAN cell overwrites the same keys: the last one wins.
    const auto outcome = CellMonitor::showServingCell(
        data, {kTSCellMonitorRadioAccessTechnologyUTRAN2}, CellMonitor::Pick::LastCell, kCellMonitorFields,
        [this](const std::string& key, const std::string& text) { setValue(key, text); });
    if (outcome == CellMonitor::Outcome::NotParsed)
        SystemLog::log(SystemLog::kError, "%s", "Cell Info Array data could not be constructed");
}

}  // namespace vantorel

// UTRANServingCellInfo: Part 7.2's "Serving Cell Info" section: the serving cell from record 0xD0E2 and from the cell monitor (extra 0xFF0001).
#include "LogGenerator/UTRAN/UTRANServingCellInfo.h"

#include "LogGenerator/CellMonitor.h"
#include "Platform/ByteReader.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"
#include "Platform/TelephonyIdentifiers.h"
#include "PropertyList/Array.h"

namespace vantorel {

namespace {

// Record 0xD0E2 (offsets from the record's first byte; at least 26 bytes):
//   14     u8       "Cell Access Restrictions"
//   15     u8       "URA ID"
//   17..18 u16 LE   "Uplink UARFCN"
//   19..20 u16 LE   "Downlink UARFCN"
//   21..24 s32 LE   "Cell ID"
//   25     bit 0    "Allowed Access": set "Emergency Calls Only", clear "All Calls"
constexpr size_t kServingCellMinLength = 26;

}  // namespace

std::string UTRANServingCellInfo::getSectionName() const { return "Serving Cell Info"; }

std::vector<int32_t> UTRANServingCellInfo::getLogCodeArray() const { return {kLogCode, kCellMonitorCode}; }

void UTRANServingCellInfo::updateWithData(ByteView data, int32_t logCode) {
    SystemLog::log(SystemLog::kWarning, "%s", "Serving Cell Info");

    if (logCode == kLogCode) {
        const ByteReader reader(data);
        if (reader.size() < kServingCellMinLength) return;  // ignored silently
        // The length test guarantees every field; value_or never applies.
        setValue("Cell Access Restrictions", StringFormat::format("%d", reader.u8(14).value_or(0)));
        setValue("Cell ID", StringFormat::format("%d", reader.s32(21).value_or(0)));
        setValue("Downlink UARFCN", StringFormat::format("%d", reader.u16(19).value_or(0)));
        setValue("Uplink UARFCN", StringFormat::format("%d", reader.u16(17).value_or(0)));
        setValue("URA ID", StringFormat::format("%d", reader.u8(15).value_or(0)));
        setValue("Allowed Access", (reader.u8(25).value_or(0) & 0x01) ? "Emergency Calls Only" : "All Calls");
        return;
    }

    if (logCode != kCellMonitorCode) return;

    const PropertyListResult parsed = parseExtraPayload(data);
    if (!parsed) {
        SystemLog::log(SystemLog::kError, "%s", "Cell Info Array data could not be constructed");
        return;
    }
    // A root that is not an array holds no cells: nothing changes.
    const ArrayRef cells = parsed.value->asArray();
    if (!cells) return;

    for (const Value& cell : *cells) {
        if (!CellMonitor::matches(cell, {kTSCellMonitorRadioAccessTechnologyUTRAN2}, kTSCellMonitorCellTypeServing))
            continue;
        // Every matching cell overwrites the same keys: the last one wins. A missing
        // value is logged and the others are still read.
        if (auto lac = CellMonitor::int32(cell, kTSCellMonitorLAC))
            setValue("Local Area Code", StringFormat::format("%d", *lac));
        else
            SystemLog::log(SystemLog::kError, "%s", "Serving Cell Info: Failed to retrieve LAC\n");
        if (auto cellId = CellMonitor::int32(cell, kTSCellMonitorCellId))
            setValue("Cell ID", StringFormat::format("%d", *cellId));
        else
            SystemLog::log(SystemLog::kError, "%s", "Serving Cell Info: Failed to retrieve Cell ID\n");
        if (auto band = CellMonitor::int32(cell, kTSCellMonitorBandInfo))
            setValue("Freq Band Indicator", StringFormat::format("%d", *band));
        else
            SystemLog::log(SystemLog::kError, "%s", "Serving Cell Info: Failed to retrieve Freq Band Indicator\n");
        if (auto scn = CellMonitor::int32(cell, kTSCellMonitorSCN))
            setValue("Cell Scrambling Code", StringFormat::format("%d", *scn));
        else
            SystemLog::log(SystemLog::kError, "%s", "Serving Cell Info: Failed to retrieve Cell Scrambling Code\n");
        if (auto uarfcn = CellMonitor::int32(cell, kTSCellMonitorUARFCN)) {
            // One UARFCN for both directions, as the cell monitor gives only one.
            const std::string text = StringFormat::format("%d", *uarfcn);
            setValue("Uplink UARFCN", text);
            setValue("Downlink UARFCN", text);
        } else {
            SystemLog::log(SystemLog::kError, "%s", "Serving Cell Info: Failed to retrieve UARFCN\n");
        }
    }
}

}  // namespace vantorel

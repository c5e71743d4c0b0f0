// LTEServingCellInfo: the "Serving Cell Info" section: the serving cell's identity from records 0xB0C2 and 0xB0C1 and from the cell monitor (extra 0xFF0001).
#include "LogGenerator/LTE/LTEServingCellInfo.h"

#include "LogGenerator/CellMonitor.h"
#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"
#include "Platform/TelephonyIdentifiers.h"
#include "PropertyList/Dictionary.h"

namespace vantorel {

namespace {

// Record 0xB0C2, serving cell configuration (offsets from the record's first byte; at
// least 38 bytes, shorter records are ignored):
//   14..15  u16 LE  "Physical Cell ID"
//   16..17  u16 LE  "Download Frequency", the downlink E-ARFCN as it stands
//   18..19  u16 LE  "Upload Frequency", the uplink E-ARFCN
//   20      u8      "Download Bandwidth", resource blocks (kBandwidths)
//   21      u8      "Upload Bandwidth", resource blocks
//   22..25  s32 LE  "Cell Identity"
//   26..27  u16 LE  "Tracking Area Code"
//   28..31  s32 LE  "Freq Band Indicator"
constexpr size_t kServingCellMinLength = 38;

// Record 0xB0C1, antenna configuration (at least 22 bytes):
//   20      u8      "Num Tx Antennas"
constexpr size_t kAntennaMinLength = 22;

// Channel bandwidth by its number of resource blocks; any other count is "Unknown".
struct Bandwidth {
    unsigned resourceBlocks;
    const char* text;
};
constexpr Bandwidth kBandwidths[] = {
    {6, "1.4 MHz"}, {15, "3 MHz"}, {25, "5 MHz"}, {50, "10 MHz"}, {75, "15 MHz"}, {100, "20 MHz"},
};

const char* bandwidthText(unsigned resourceBlocks) {
    for (const Bandwidth& b : kBandwidths)
        if (b.resourceBlocks == resourceBlocks) return b.text;
    return "Unknown";
}

const CellMonitor::Field kCellMonitorFields[] = {
    {kTSCellMonitorTAC, "Tracking Area Code", nullptr, "Serving Cell Info: Failed to retrieve TAC\n"},
    {kTSCellMonitorCellId, "Cell Identity", nullptr, "Serving Cell Info: Failed to retrieve Cell ID\n"},
    {kTSCellMonitorPID, "Physical Cell ID", nullptr, "Serving Cell Info: Failed to retrieve Physical Cell ID\n"},
    {kTSCellMonitorBandInfo, "Freq Band Indicator", nullptr,
     "Serving Cell Info: Failed to retrieve Freq Band Indicator\n"},
    {kTSCellMonitorUARFCN, "UARFCN", nullptr, "Serving Cell Info: Failed to retrieve UARFCN\n"},
};

}  // namespace

std::string LTEServingCellInfo::getSectionName() const { return "Serving Cell Info"; }

std::vector<int32_t> LTEServingCellInfo::getLogCodeArray() const {
    return {LogCode::kLTEServingCellInfo, LogCode::kLTEMasterInfoBlock, LogCode::kCellMonitor};
}

void LTEServingCellInfo::updateWithData(ByteView data, int32_t logCode) {
    SystemLog::log(SystemLog::kWarning, "%s", "LTE Serving Cell Info");
    const ByteReader r(data);

    switch (logCode) {
        case LogCode::kLTEServingCellInfo:
            if (r.size() < kServingCellMinLength) return;
            setValue("Physical Cell ID", StringFormat::format("%d", r.u16(14).value_or(0)));
            setValue("Download Frequency", StringFormat::format("%d", r.u16(16).value_or(0)));
            setValue("Upload Frequency", StringFormat::format("%d", r.u16(18).value_or(0)));
            // "UARFCN" comes only from the cell monitor: once the modem's own record
            // names the serving cell, it would describe an older one.
            if (auto d = sectionDictionary()) d->remove("UARFCN");
            setValue("Download Bandwidth", bandwidthText(r.u8(20).value_or(0)));
            setValue("Upload Bandwidth", bandwidthText(r.u8(21).value_or(0)));
            setValue("Cell Identity", StringFormat::format("%d", r.s32(22).value_or(0)));
            setValue("Tracking Area Code", StringFormat::format("%d", r.u16(26).value_or(0)));
            setValue("Freq Band Indicator", StringFormat::format("%d", r.s32(28).value_or(0)));
            return;

        case LogCode::kLTEMasterInfoBlock:
            if (r.size() < kAntennaMinLength) return;
            setValue("Num Tx Antennas", StringFormat::format("%d", r.u8(20).value_or(0)));
            // Every accepted antenna record is also logged as an unknown code: a
            // long-standing quirk of this log, kept so that logs compare line for line.
            logUnknownCode(logCode);
            return;

        case LogCode::kCellMonitor: {
            // Unlike the UTRAN section, the first serving LTE cell of the array wins.
            const bool parsed = CellMonitor::showServingCell(
                data, {kTSCellMonitorRadioAccessTechnologyLTE}, CellMonitor::Pick::FirstCell, kCellMonitorFields,
                [this](const std::string& key, const std::string& text) { setValue(key, text); });
            if (!parsed) SystemLog::log(SystemLog::kError, "%s", "Failed to get Cell Array\n");
            return;
        }

        default:
            logUnknownCode(logCode);
    }
}

}  // namespace vantorel

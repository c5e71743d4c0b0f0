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

// Record 0xB0C2, serving cell configuration. Byte 13 is the record's layout version;
// version 3 (today's phones) widens the E-ARFCNs to 32 bits, every other version keeps
// the original layout. Offsets from the record's first byte, little-endian:
//                         original  version 3
//   "Physical Cell ID"     u16 14    u16 14
//   "Download Frequency"   u16 16    u32 16   the downlink E-ARFCN as it stands
//   "Upload Frequency"     u16 18    u32 20   the uplink E-ARFCN
//   "Download Bandwidth"   u8  20    u8  24   resource blocks (kBandwidths)
//   "Upload Bandwidth"     u8  21    u8  25
//   "Cell Identity"        s32 22    s32 26
//   "Tracking Area Code"   u16 26    u16 30
//   "Freq Band Indicator"  s32 28    s32 32
//   (version 3 goes on with MCC u16 36, MNC digits u8 38, MNC u16 39: 42 bytes)
// A record shorter than its layout's minimum is ignored.
struct ServingCellLayout {
    size_t minLength, pci, downlink, uplink, earfcnWidth, downlinkBandwidth, uplinkBandwidth, cellIdentity, tac, band;
};
constexpr ServingCellLayout kServingCellLayout = {38, 14, 16, 18, 2, 20, 21, 22, 26, 28};
constexpr ServingCellLayout kServingCellLayoutV3 = {42, 14, 16, 20, 4, 24, 25, 26, 30, 32};

// Record 0xB0C1, antenna configuration: "Num Tx Antennas" is the u8 at 20 (at least 22
// bytes); version 2 puts PCI u16 14, E-ARFCN u32 16 and the system frame number u16 20
// first, and the antennas at 22 (at least 24 bytes).
struct AntennaLayout {
    size_t minLength, antennas;
};
constexpr AntennaLayout kAntennaLayout = {22, 20};
constexpr AntennaLayout kAntennaLayoutV2 = {24, 22};

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
        case LogCode::kLTEServingCellInfo: {
            const ServingCellLayout& at = r.u8(13) == 3 ? kServingCellLayoutV3 : kServingCellLayout;
            if (r.size() < at.minLength) return;
            const auto earfcn = [&](size_t offset) {
                return at.earfcnWidth == 4 ? r.u32(offset).value_or(0) : r.u16(offset).value_or(0);
            };
            setValue("Physical Cell ID", StringFormat::format("%d", r.u16(at.pci).value_or(0)));
            setValue("Download Frequency", StringFormat::format("%u", earfcn(at.downlink)));
            setValue("Upload Frequency", StringFormat::format("%u", earfcn(at.uplink)));
            // "UARFCN" comes only from the cell monitor: once the modem's own record
            // names the serving cell, it would describe an older one.
            if (auto d = sectionDictionary()) d->remove("UARFCN");
            setValue("Download Bandwidth", bandwidthText(r.u8(at.downlinkBandwidth).value_or(0)));
            setValue("Upload Bandwidth", bandwidthText(r.u8(at.uplinkBandwidth).value_or(0)));
            setValue("Cell Identity", StringFormat::format("%d", r.s32(at.cellIdentity).value_or(0)));
            setValue("Tracking Area Code", StringFormat::format("%d", r.u16(at.tac).value_or(0)));
            setValue("Freq Band Indicator", StringFormat::format("%d", r.s32(at.band).value_or(0)));
            return;
        }

        case LogCode::kLTEMasterInfoBlock: {
            const AntennaLayout& at = r.u8(13) == 2 ? kAntennaLayoutV2 : kAntennaLayout;
            if (r.size() < at.minLength) return;
            setValue("Num Tx Antennas", StringFormat::format("%d", r.u8(at.antennas).value_or(0)));
            // Every accepted antenna record is also logged as an unknown code: a
            // long-standing quirk of this log, kept so that logs compare line for line.
            logUnknownCode(logCode);
            return;
        }

        case LogCode::kCellMonitor: {
            // Unlike the UTRAN section, the first serving LTE cell of the array wins.
            // Any payload without an array of cells, unparsable or not, says the same.
            const auto outcome = CellMonitor::showServingCell(
                data, {kTSCellMonitorRadioAccessTechnologyLTE}, CellMonitor::Pick::FirstCell, kCellMonitorFields,
                [this](const std::string& key, const std::string& text) { setValue(key, text); });
            if (outcome != CellMonitor::Outcome::Read) SystemLog::log(SystemLog::kError, "%s", "Failed to get Cell Array\n");
            return;
        }

        default:
            logUnknownCode(logCode);
    }
}

}  // namespace vantorel

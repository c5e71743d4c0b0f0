// UMTSRRInfo: the "UMTS RR Info" section: RRC state, transmit power, frequencies and cell identity, ciphering, cell-monitor serving cell.
#include "LogGenerator/MVK_GSM/UMTSRRInfo.h"

#include "LogGenerator/CellMonitor.h"
#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"
#include "Platform/TelephonyIdentifiers.h"
#include "PropertyList/Dictionary.h"

#include <limits>

namespace vantorel {

namespace {

const char* const kRRCState[] = {"Disconnected", "Connecting", "CELL_FACH", "CELL_DCH", "CELL_PCH", "URA_PCH"};

// Shortest record of each code that is shown; shorter ones are ignored.
constexpr size_t kRRCStateLength = 14;      // 13 u8 RRC state
constexpr size_t kCellIdentityLength = 29;  // see updateCellIdentity
constexpr size_t kCipheringLength = 19;     // 13 u8 ciphering flag
constexpr size_t kTransmitPowerLength = 16;  // see updateTransmitPower

}  // namespace

std::string UMTSRRInfo::getSectionName() const { return "UMTS RR Info"; }

std::vector<int32_t> UMTSRRInfo::getLogCodeArray() const {
    return {LogCode::kUMTSRRCState, LogCode::kUMTSTransmitPower, LogCode::kUMTSCellIdentity, LogCode::kUMTSCiphering,
            LogCode::kCellMonitor};
}

void UMTSRRInfo::updateWithData(ByteView data, int32_t logCode) {
    SystemLog::log(SystemLog::kWarning, "%s", "UMTSRRInfo");
    const ByteReader r(data);
    switch (logCode) {
        case LogCode::kUMTSRRCState:
            if (r.size() >= kRRCStateLength) setValue("RRC State", tableText(kRRCState, r.u8(13).value_or(0)));
            break;
        case LogCode::kUMTSCellIdentity:
            if (r.size() >= kCellIdentityLength) updateCellIdentity(r);
            break;
        case LogCode::kUMTSCiphering:
            if (r.size() >= kCipheringLength) setValue("Ciphering", r.u8(13).value_or(0) ? "Enabled" : "Disabled");
            break;
        case LogCode::kUMTSTransmitPower:
            if (r.size() >= kTransmitPowerLength) updateTransmitPower(r);
            break;
        case LogCode::kCellMonitor: updateFromCellMonitor(data); break;
        default: logUnknownCode(logCode); break;
    }
}

// 0x4127: 13 u32 uplink UARFCN, 17 u32 downlink UARFCN, 21 u32 cell ID, 25 u16 URA ID.
void UMTSRRInfo::updateCellIdentity(const ByteReader& r) const {
    const auto shown = [&r](size_t offset) {
        return StringFormat::format("%d", static_cast<int32_t>(r.u32(offset).value_or(0)));
    };
    setValue("Cell ID", shown(21));
    setValue("Downlink Frequency", shown(17));
    setValue("Uplink Frequency", shown(13));
    // The cell monitor's "UARFCN" may describe an older cell than these frequencies.
    if (auto d = sectionDictionary()) d->remove("UARFCN");
    setValue("URA ID", StringFormat::format("%d", r.u16(25).value_or(0)));
}

// 0x4031: 14 u8 sample count M; sample i is 14 bytes at 16 + 14 i, its s16 at 4 the raw
// transmit value (0 = no sample). Shown is the mean of (raw + 512) / 10 - 70 dBm over the
// non-zero samples, each truncated toward zero; with none the mean is not a number.
void UMTSRRInfo::updateTransmitPower(const ByteReader& r) const {
    constexpr size_t kFirstSample = 16, kSampleSize = 14;
    const unsigned count = r.u8(14).value_or(0);
    int sum = 0, samples = 0;
    for (unsigned i = 0; i < count; ++i) {
        const auto sample = r.slice(kFirstSample + kSampleSize * i, kSampleSize);
        if (!sample) break;
        const int raw = ByteReader(*sample).s16(4).value_or(0);
        if (raw == 0) continue;
        sum += (raw + 512) / 10 - 70;
        ++samples;
    }
    const double power = samples ? static_cast<double>(sum) / samples : std::numeric_limits<double>::quiet_NaN();
    setValue("Transmit Power", StringFormat::format("%4.2lf dBm", power));
}

// 0xFF0001: the first serving UMTS cell of the array.
void UMTSRRInfo::updateFromCellMonitor(ByteView data) const {
    static const CellMonitor::Field kFields[] = {
        {kTSCellMonitorCellId, "Cell ID", nullptr, "UMTSRRInfo: Failed to retrieve Cell ID\n"},
        {kTSCellMonitorUARFCN, "UARFCN", nullptr, "UMTSRRInfo: Failed to retrieve UARFCN\n"},
        {kTSCellMonitorSCN, "Scrambling Code", nullptr, "UMTSRRInfo: Failed to retrieve Scrambling Code\n"},
    };
    const auto outcome = CellMonitor::showServingCell(
        data, {kTSCellMonitorRadioAccessTechnologyUMTS}, CellMonitor::Pick::FirstCell, kFields,
        [this](const std::string& key, const std::string& text) { setValue(key, text); });
    if (outcome != CellMonitor::Outcome::Read) SystemLog::log(SystemLog::kError, "%s", "Failed to get Cell Array\n");
}

}  // namespace vantorel

// ServingPLMN: the "Serving PLMN" section: selection mode (0x7132), BCD PLMN, LAC, RAC and service type (0x7135), serving-cell numbers (0xFF0001).
#include "LogGenerator/MVK_GSM/ServingPLMN.h"

#include "LogGenerator/CellMonitor.h"
#include "LogGenerator/MVK_GSM/BCDPLMN.h"
#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"
#include "Platform/TelephonyIdentifiers.h"

namespace vantorel {

namespace {

const char* const kPLMNSelectionMode[] = {
    "Automatic", "Manual", "Limited", "LIMITED_ROUTINE_ACQ", "LIMITED_MANUAL_ACQ",
};

const char* const kServiceType[] = {
    "NO_SERVICE", "CS_ONLY", "PS_ONLY", "CS_PS_SERVICE", "LIMITED_SERVICE",
};

}  // namespace

std::string ServingPLMN::getSectionName() const { return "Serving PLMN"; }

std::vector<int32_t> ServingPLMN::getLogCodeArray() const {
    return {LogCode::kServingPLMNAndArea, LogCode::kRegistrationState, LogCode::kCellMonitor};
}

void ServingPLMN::updateWithData(ByteView data, int32_t logCode) {
    SystemLog::log(SystemLog::kWarning, "%s", "Serving PLMN");
    switch (logCode) {
        case LogCode::kRegistrationState: updateRegistrationState(data); break;
        case LogCode::kServingPLMNAndArea: updateServingPLMN(data); break;
        case LogCode::kCellMonitor: updateFromCellMonitor(data); break;
        default: logUnknownCode(logCode); break;
    }
}

// 0x7132 registration state report (at least 16 bytes): byte 14 = PLMN selection mode.
void ServingPLMN::updateRegistrationState(ByteView data) const {
    const ByteReader r(data);
    if (r.size() < 16) return;
    setValue("PLMN Sel Mod", tableText(kPLMNSelectionMode, r.u8(14).value_or(0)));
}

// 0x7135 serving PLMN and area (at least 28 bytes):
//   14     service type
//   15..17 PLMN in 3GPP BCD: 15 = MCC2|MCC1, 16 = MNC3|MCC3, 17 = MNC2|MNC1 (high|low nibble)
//   18..19 LAC, big-endian
//   20     RAC
// Keys are written MCC, MNC, LAC, RAC, service type (the order a fresh dictionary keeps).
void ServingPLMN::updateServingPLMN(ByteView data) const {
    const ByteReader r(data);
    if (r.size() < 28) return;
    // A two-digit MNC keeps the blank of its filler ("10 "), as this display always showed it.
    const BCDPLMN plmn = BCDPLMN::read(r.u8(15).value_or(0), r.u8(16).value_or(0), r.u8(17).value_or(0),
                                       BCDPLMN::Filler::Blank);
    setValue("Mobile Country Code", plmn.mcc);
    setValue("Mobile Network Code", plmn.mnc);
    setValue("Location Area Code", StringFormat::format("%d", static_cast<int>(r.u16be(18).value_or(0))));
    setValue("Routing Area Code", StringFormat::format("%d", static_cast<int>(r.u8(20).value_or(0))));
    setValue("Service Type", tableText(kServiceType, r.u8(14).value_or(0)));
}

// 0xFF0001 cell-monitor array: the first serving GSM or UMTS cell gives MCC, MNC and LAC
// as plain numbers (so "10", not the BCD "10 ").
void ServingPLMN::updateFromCellMonitor(ByteView data) const {
    static const CellMonitor::Field kFields[] = {
        {kTSCellMonitorMCC, "Mobile Country Code", nullptr, "ServingPLMN: Failed to retrieve MCC\n"},
        {kTSCellMonitorMNC, "Mobile Network Code", nullptr, "ServingPLMN: Failed to retrieve MNC\n"},
        {kTSCellMonitorLAC, "Location Area Code", nullptr, "ServingPLMN: Failed to retrieve LAC\n"},
    };
    const auto outcome = CellMonitor::showServingCell(
        data, {kTSCellMonitorRadioAccessTechnologyUMTS, kTSCellMonitorRadioAccessTechnologyGSM},
        CellMonitor::Pick::FirstCell, kFields, [this](const std::string& key, const std::string& text) { setValue(key, text); });
    // A payload without a list of cells says why, in the lines UMTS Set uses too.
    CellMonitor::logMissingList(outcome);
}

}  // namespace vantorel

// ServingPLMN: Part 5.2's "Serving PLMN" section: selection mode (0x7132), BCD PLMN, LAC, RAC and service type (0x7135), serving-cell numbers (0xFF0001).
#include "LogGenerator/MVK_GSM/ServingPLMN.h"

#include "LogGenerator/CellMonitor.h"
#include "Platform/ByteReader.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"
#include "Platform/TelephonyIdentifiers.h"
#include "PropertyList/Array.h"

namespace vantorel {

namespace {

constexpr int32_t kRegistrationState = 0x7132;
constexpr int32_t kServingPLMNAndArea = 0x7135;
constexpr int32_t kCellMonitor = 0xFF0001;

const char* const kPLMNSelectionMode[] = {
    "Automatic", "Manual", "Limited", "LIMITED_ROUTINE_ACQ", "LIMITED_MANUAL_ACQ",
};

const char* const kServiceType[] = {
    "NO_SERVICE", "CS_ONLY", "PS_ONLY", "CS_PS_SERVICE", "LIMITED_SERVICE",
};

// BCD digit characters; a nibble above 9 (the 0xF filler) shows as a blank. The
// low nibble is tested on itself, the high nibble on the whole byte (< 0xA0), as
// Part 5.2 states it (equivalent to the nibble being below 10).
char lowDigit(uint8_t byte) {
    const uint8_t nibble = byte & 0x0F;
    return nibble < 10 ? static_cast<char>('0' + nibble) : ' ';
}

char highDigit(uint8_t byte) {
    return byte < 0xA0 ? static_cast<char>('0' + (byte >> 4)) : ' ';
}

}  // namespace

std::string ServingPLMN::getSectionName() const { return "Serving PLMN"; }

std::vector<int32_t> ServingPLMN::getLogCodeArray() const {
    return {kServingPLMNAndArea, kRegistrationState, kCellMonitor};
}

void ServingPLMN::updateWithData(ByteView data, int32_t logCode) {
    SystemLog::log(SystemLog::kWarning, "%s", "Serving PLMN");
    switch (logCode) {
        case kRegistrationState: updateRegistrationState(data); break;
        case kServingPLMNAndArea: updateServingPLMN(data); break;
        case kCellMonitor: updateFromCellMonitor(data); break;
        default: logUnknownCode(logCode); break;
    }
}

// 0x7132 registration state report: byte 14 = PLMN selection mode.
void ServingPLMN::updateRegistrationState(ByteView data) const {
    const ByteReader r(data);
    if (r.size() < 16) return;
    setValue("PLMN Sel Mod", tableText(kPLMNSelectionMode, *r.u8(14)));
}

// 0x7135 serving PLMN and area:
//   14     service type
//   15..17 PLMN in 3GPP BCD: 15 = MCC2|MCC1, 16 = MNC3|MCC3, 17 = MNC2|MNC1 (high|low nibble)
//   18..19 LAC, big-endian
//   20     RAC
// Keys are written MCC, MNC, LAC, RAC, service type (the order a fresh dictionary keeps).
void ServingPLMN::updateServingPLMN(ByteView data) const {
    const ByteReader r(data);
    if (r.size() < 28) return;
    const uint8_t b15 = *r.u8(15);
    const uint8_t b16 = *r.u8(16);
    const uint8_t b17 = *r.u8(17);
    setValue("Mobile Country Code", StringFormat::format("%c%c%c", lowDigit(b15), highDigit(b15), lowDigit(b16)));
    setValue("Mobile Network Code", StringFormat::format("%c%c%c", lowDigit(b17), highDigit(b17), highDigit(b16)));
    setValue("Location Area Code", StringFormat::format("%d", static_cast<int>(*r.u16be(18))));
    setValue("Routing Area Code", StringFormat::format("%d", static_cast<int>(*r.u8(20))));
    setValue("Service Type", tableText(kServiceType, *r.u8(14)));
}

// 0xFF0001 cell-monitor list: the first serving GSM or UMTS cell gives MCC, MNC and LAC
// as plain numbers (so "10", not the BCD "10 ").
void ServingPLMN::updateFromCellMonitor(ByteView data) const {
    const PropertyListResult parsed = parseExtraPayload(data);
    if (!parsed) {
        SystemLog::log(SystemLog::kError, "%s", "Cell Info Array data could not be constructed");
        SystemLog::log(SystemLog::kError, "%s", "Failed to get Cell Array\n");
        return;
    }
    // A root that is not an array is treated as an empty list.
    const ArrayRef cells = parsed.value->asArray();
    if (!cells || cells->size() < 1) return;

    const Value* serving = nullptr;
    for (const Value& cell : *cells) {
        if (CellMonitor::matches(cell,
                                 {kTSCellMonitorRadioAccessTechnologyUMTS, kTSCellMonitorRadioAccessTechnologyGSM},
                                 kTSCellMonitorCellTypeServing)) {
            serving = &cell;
            break;
        }
    }
    if (!serving) return;

    struct Field {
        const char* cellKey;
        const char* displayKey;
        const char* failure;
    };
    static const Field kFields[] = {
        {kTSCellMonitorMCC, "Mobile Country Code", "ServingPLMN: Failed to retrieve MCC\n"},
        {kTSCellMonitorMNC, "Mobile Network Code", "ServingPLMN: Failed to retrieve MNC\n"},
        {kTSCellMonitorLAC, "Location Area Code", "ServingPLMN: Failed to retrieve LAC\n"},
    };
    for (const Field& field : kFields) {
        if (const auto v = CellMonitor::int32(*serving, field.cellKey))
            setValue(field.displayKey, StringFormat::format("%d", *v));
        else
            SystemLog::log(SystemLog::kError, "%s", field.failure);
    }
}

}  // namespace vantorel

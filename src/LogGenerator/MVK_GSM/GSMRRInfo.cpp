// GSMRRInfo: the "GSM RR Info" section: RR state (0x512C), serving level and quality (0x5137), DRX (0x51F6) and DTX (0x5072).
#include "LogGenerator/MVK_GSM/GSMRRInfo.h"

#include "LogGenerator/MVK_GSM/RecordFields.h"
#include "Platform/LogCodes.h"
#include "Platform/SystemLog.h"

namespace vantorel {

namespace {

using F = RecordFields;

// The blanks inside three of the texts are the modem's own spelling.
const char* const kRRState[] = {
    "RR_INACTIVE",
    "RR_GOING_ACTIVE",
    "RR_GOING_INACTIVE",
    "RR_CELL_SELECTION",
    "RR_PLMN_LIST_CONSTRUCTION",
    "RR_IDLE",
    "RR_CELL_RESELECTION",
    "RR_CONNECTION_PENDING",
    "RR_CHOOSE_CELL",
    "RR_DATA_TRANSFER",
    "RR_NO_CHANNELS",
    "RR_CONNECTION_RELEASE",
    "RR_EARLY_CAMPED_WAIT_FOR_SI",
    "RR_W2G_INTERRAT_HANDOVER_ PROGRESS",
    "RR_W2G_INTERRAT_RESELECTION_PROGRESS",
    "RR_WAIT_FOR_EARLY_PSCAN",
    "GRR51",
    "GRR52",
    "RR_G2W_INTERRAT_RESELECTION_PROGRESS",
    "RR_G2W_INTERRAT_HANDOVER_ PROGRESS",
    "RR_CELL_REEST",
    "RR_W2G_INTERRAT_CC_ORDER_ PROGRESS",
};

const RecordFields::Field kRRStateFields[] = {  // 0x512C, at least 17 bytes
    F::text("RR State", 13, kRRState),
    F::number("RR Sub State", 14),
    F::number("RR Status", 15),
    F::flag("RR Mode", 16, "Voice", "Data"),
};
// 0x5137, at least 29 bytes: 15 received level, 16 and 20 the u32 full and sub quality
// (the same bytes the serving-cell section reads as C1 and C2).
const RecordFields::Field kServingMeasurement[] = {
    F::number("Serving Rx Level", 15),
    F::number("Rx Quality Full", 16, 4),
    F::number("Rx Quality Sub", 20, 4),
};
// 0x51F6, at least 24 bytes: the DRX timer byte, in seconds.
const RecordFields::Field kGeneralParameters[] = {F::number("DRX Used", 16, 1, " sec")};
// 0x5072, at least 20 bytes.
const RecordFields::Field kChannelParameters[] = {F::flag("DTX Used", 19, "OFF", "ON")};

// In the order the section subscribes to them.
const RecordFields::Record kRecords[] = {
    {LogCode::kGSMRRState, 17, kRRStateFields},
    {LogCode::kGSMServingMeasurement, 29, kServingMeasurement},
    {LogCode::kGSMChannelParameters, 20, kChannelParameters},
    {LogCode::kGPRSGeneralParameters, 24, kGeneralParameters},
};

}  // namespace

std::string GSMRRInfo::getSectionName() const { return "GSM RR Info"; }

std::vector<int32_t> GSMRRInfo::getLogCodeArray() const { return RecordFields::codes(kRecords); }

void GSMRRInfo::updateWithData(ByteView data, int32_t logCode) {
    SystemLog::log(SystemLog::kWarning, "%s", "GSMRRInfo");
    if (!RecordFields::showRecord(data, logCode, kRecords,
                                  [this](const std::string& key, const std::string& text) { setValue(key, text); }))
        logUnknownCode(logCode);
}

}  // namespace vantorel

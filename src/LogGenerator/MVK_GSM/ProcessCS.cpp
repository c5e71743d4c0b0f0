// ProcessCS: the "Process CS" section: MM state, sub-state and update status (0x7131), MM service state (0x7132); owns the MM tables.
#include "LogGenerator/MVK_GSM/ProcessCS.h"

#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/SystemLog.h"

namespace vantorel {

namespace {

// Range 0 to 25; the gaps (1, 2, 4, 11, 12, 16, 24) show "Unknown". The blanks inside
// rows 20 and 21 are part of the texts.
const char* const kMMStateTable[] = {
    "MM_NULL",                                         // 0
    nullptr,                                           // 1
    nullptr,                                           // 2
    "MM_LOCATION_UPDATE_INITIATED",                    // 3
    nullptr,                                           // 4
    "MM_WAIT_FOR_OUTGOING_MM_CONNECTION",              // 5
    "MM_CONNECTION_ACTIVE",                            // 6
    "MM_IMSI_DETACH_INITIATED",                        // 7
    "MM_PROCESS_CM_SERVICE_PROMPT",                    // 8
    "MM_WAIT_FOR_NETWORK_COMMAND",                     // 9
    "MM_LOCATION_UPDATE_REJECTED",                     // 10
    nullptr,                                           // 11
    nullptr,                                           // 12
    "MM_WAIT_FOR_RR_CONNECTION_LU",                    // 13
    "MM_WAIT_FOR_RR_CONNECTION_MM",                    // 14
    "MM_WAIT_FOR_RR_CONNECTION_IMSI_DETACH",           // 15
    nullptr,                                           // 16
    "MM_REESTABLISHMENT_INITIATED",                    // 17
    "MM_WAIT_FOR_RR_ACTIVE",                           // 18
    "MM_IDLE",                                         // 19
    "MM_WAIT_FOR_ADDITIONAL_OUTGOING_MM_ CONNECTION",  // 20
    "MM_WAIT_FOR_RR_CONNECTION_ REESTABLISHMENT",      // 21
    "MM_WAIT_FOR_REESTABLISH_DECISION",                // 22
    "MM_LOCATION_UPDATING_PENDING",                    // 23
    nullptr,                                           // 24
    "MM_RR_CONNECTION_RELEASE_NOT_ALLOWED",            // 25
};

const char* const kMMSubStateTable[] = {
    "MM_NULL_SUBSTATE",       "MM_NO_IMSI",           "MM_PLMN_SEARCH",
    "MM_LIMITED_SERVICE",     "MM_ATTEMPTING_TO_UPDATE", "MM_LOCATION_UPDATE_NEEDED",
    "MM_NO_CELL_AVAILABLE",   "MM_PLMN_SEARCH_NORMAL_SERVICE", "MM_NORMAL_SERVICE",
};

// Shown under "LU Reject Cause".
const char* const kUpdateStatusTable[] = {
    "UPDATED", "NOT_UPDATED", "ROAMING_NOT_ALLOWED", "LOCATION_AREA_NOT_ALLOWED",
};

const char* const kServiceStateTable[] = {
    "REG_STATE_INACTIVE",      "REG_STATE_IDLE",           "REG_STATE_REGISTERING",
    "REG_STATE_DEREGISTERING", "REG_STATE_MANUAL_SEARCH",  "REG_STATE_AUTOMATIC_SEARCH",
    "REG_STATE_OFFLINE",
};

}  // namespace

const char* ProcessCS::mmStateText(unsigned value) { return tableText(kMMStateTable, value); }
const char* ProcessCS::serviceStateText(unsigned value) { return tableText(kServiceStateTable, value); }

std::string ProcessCS::getSectionName() const { return "Process CS"; }

std::vector<int32_t> ProcessCS::getLogCodeArray() const { return {LogCode::kMMState, LogCode::kRegistrationState}; }

void ProcessCS::updateWithData(ByteView data, int32_t logCode) {
    SystemLog::log(SystemLog::kWarning, "%s", "ProcessCS");
    const ByteReader r(data);
    switch (logCode) {
        case LogCode::kMMState:
            // 13 MM state, 14 MM sub-state, 15 update status; keys in this order.
            if (r.size() < 16) return;
            setValue("MM State", mmStateText(r.u8(13).value_or(0)));
            setValue("MM Sub State", tableText(kMMSubStateTable, r.u8(14).value_or(0)));
            setValue("LU Reject Cause", tableText(kUpdateStatusTable, r.u8(15).value_or(0)));
            break;
        case LogCode::kRegistrationState:
            // 13 MM service state.
            if (r.size() < 16) return;
            setValue("MM Service State", serviceStateText(r.u8(13).value_or(0)));
            break;
        default:
            logUnknownCode(logCode);
            break;
    }
}

}  // namespace vantorel

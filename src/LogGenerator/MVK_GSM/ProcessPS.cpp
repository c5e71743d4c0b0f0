// ProcessPS: the "Process PS" section: GMM state, sub-state and update status (0x7130), MM service state (0x7132).
#include "LogGenerator/MVK_GSM/ProcessPS.h"

#include "LogGenerator/MVK_GSM/ProcessCS.h"
#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/SystemLog.h"

namespace vantorel {

namespace {

const char* const kGMMStateTable[] = {
    "GMM_NULL",
    "GMM_DEREGISTERED",
    "GMM_REGISTERED_INITIATED",
    "GMM_REGISTERED",
    "GMM_DEREGISTERED_INITIATED",
    "GMM_ROUTING_AREA_UPDATE_INITIATED",
    "GMM_SERVICE_REQUEST_INITIATED",
};

// Row 9 is spelled "ATTEMPING" on purpose: saved snapshots and log filters use that text.
const char* const kGMMSubStateTable[] = {
    "GMM_NORMAL_SERVICE",        // 0
    "GMM_LIMITED_SERVICE",       // 1
    "GMM_ATTACH_NEEDED",         // 2
    "GMM_ATTEMPTING_TO_ATTACH",  // 3
    "GMM_NO_IMSI",               // 4
    "GMM_NO_CELL_AVAILABLE",     // 5
    "GMM_PLMN_SEARCH",           // 6
    "GMM_SUSPENDED",             // 7
    "GMM_UPDATE_NEEDED",         // 8
    "GMM_ATTEMPING_TO_UPDATE",   // 9
    "GMM_ATTEMPTING_TO_UPDATE_MM",  // 10
    "GMM_IMSI_DETACH_INITIATED",    // 11
    "GMM_NULL_SUBSTATE",            // 12
};

// Shown under "Attach Reject Cause".
const char* const kGMMUpdateStatusTable[] = {
    "GMM_GU1_UPDATED",
    "GMM_GU2_NOT_UPDATED",
    "GMM_GU3_PLMN_NOT_ALLOWED",
    "GMM_GU3_ROUTING_AREA_NOT_ALLOWED",
};

}  // namespace

std::string ProcessPS::getSectionName() const { return "Process PS"; }

std::vector<int32_t> ProcessPS::getLogCodeArray() const { return {LogCode::kGMMState, LogCode::kRegistrationState}; }

void ProcessPS::updateWithData(ByteView data, int32_t logCode) {
    SystemLog::log(SystemLog::kWarning, "%s", "ProcessPS");
    const ByteReader r(data);
    switch (logCode) {
        case LogCode::kGMMState:
            // 13 GMM state, 14 GMM sub-state, 15 GMM update status; keys in this order.
            if (r.size() < 16) return;
            setValue("MM State", tableText(kGMMStateTable, r.u8(13).value_or(0)));
            setValue("MM Sub State", tableText(kGMMSubStateTable, r.u8(14).value_or(0)));
            setValue("Attach Reject Cause", tableText(kGMMUpdateStatusTable, r.u8(15).value_or(0)));
            break;
        case LogCode::kRegistrationState:
            // 13 MM service state.
            if (r.size() < 16) return;
            setValue("MM Service State", ProcessCS::serviceStateText(r.u8(13).value_or(0)));
            break;
        default:
            logUnknownCode(logCode);
            break;
    }
}

}  // namespace vantorel

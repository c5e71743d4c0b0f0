// ProcessCO: the "Process CO" section: MM state only (0x7131) and MM service state (0x7132), with Process CS's tables.
#include "LogGenerator/MVK_GSM/ProcessCO.h"

#include "LogGenerator/MVK_GSM/ProcessCS.h"
#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/SystemLog.h"

namespace vantorel {

std::string ProcessCO::getSectionName() const { return "Process CO"; }

std::vector<int32_t> ProcessCO::getLogCodeArray() const { return {LogCode::kMMState, LogCode::kRegistrationState}; }

void ProcessCO::updateWithData(ByteView data, int32_t logCode) {
    // Deliberate: Process CO logs the same entry text as Process CS, so a log
    // filtered on "ProcessCS" shows both sections' records.
    SystemLog::log(SystemLog::kWarning, "%s", "ProcessCS");
    const ByteReader r(data);
    switch (logCode) {
        case LogCode::kMMState:
            // 13 MM state; the sub-state and update status bytes are not shown here.
            if (r.size() < 16) return;
            setValue("MM State", ProcessCS::mmStateText(r.u8(13).value_or(0)));
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

// UMTSRRMeasurement: the "UMTS RR Measurement" section: it owns its display key but subscribes to no record.
#include "LogGenerator/MVK_GSM/UMTSRRMeasurement.h"

#include "Platform/SystemLog.h"

namespace vantorel {

std::string UMTSRRMeasurement::getSectionName() const { return "UMTS RR Measurement"; }

std::vector<int32_t> UMTSRRMeasurement::getLogCodeArray() const { return {}; }

// Nothing is routed here; a direct call only logs the class name.
void UMTSRRMeasurement::updateWithData(ByteView /*data*/, int32_t /*logCode*/) {
    SystemLog::log(SystemLog::kWarning, "%s", "UMTSRRMeasurement");
}

}  // namespace vantorel

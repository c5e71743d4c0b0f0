// NonRankedGSMSet: the "Non-Ranked GSM Set" section: it owns its display key but subscribes to no record.
#include "LogGenerator/MVK_GSM/NonRankedGSMSet.h"

#include "Platform/SystemLog.h"

namespace vantorel {

std::string NonRankedGSMSet::getSectionName() const { return "Non-Ranked GSM Set"; }

std::vector<int32_t> NonRankedGSMSet::getLogCodeArray() const { return {}; }

// Nothing is routed here; a direct call only logs the class name.
void NonRankedGSMSet::updateWithData(ByteView /*data*/, int32_t /*logCode*/) {
    SystemLog::log(SystemLog::kWarning, "%s", "NonRankedGSMSet");
}

}  // namespace vantorel

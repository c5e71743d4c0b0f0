// NonRankedUMTSSet: the "Non-Ranked UMTS Set" section: it owns its display key but subscribes to no record.
#include "LogGenerator/MVK_GSM/NonRankedUMTSSet.h"

#include "Platform/SystemLog.h"

namespace vantorel {

std::string NonRankedUMTSSet::getSectionName() const { return "Non-Ranked UMTS Set"; }

std::vector<int32_t> NonRankedUMTSSet::getLogCodeArray() const { return {}; }

// Nothing is routed here; a direct call only logs the class name.
void NonRankedUMTSSet::updateWithData(ByteView /*data*/, int32_t /*logCode*/) {
    SystemLog::log(SystemLog::kWarning, "%s", "NonRankedUMTSSet");
}

}  // namespace vantorel

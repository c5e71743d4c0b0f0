// CellChangeCounters: the "Cell Change Counters" section: no log codes; it only gives the template key a section owner.
#include "LogGenerator/MVK_GSM/CellChangeCounters.h"

#include "Platform/SystemLog.h"

namespace vantorel {

std::string CellChangeCounters::getSectionName() const { return "Cell Change Counters"; }

std::vector<int32_t> CellChangeCounters::getLogCodeArray() const { return {}; }

// Nothing is routed here; a direct call only logs the entry line.
void CellChangeCounters::updateWithData(ByteView /*data*/, int32_t /*logCode*/) {
    SystemLog::log(SystemLog::kWarning, "%s", "CellChangeCounters");
}

}  // namespace vantorel

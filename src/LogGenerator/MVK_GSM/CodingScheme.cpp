// CodingScheme: the "Coding Scheme" section: no log codes; it only gives the template key a section owner.
#include "LogGenerator/MVK_GSM/CodingScheme.h"

#include "Platform/SystemLog.h"

namespace vantorel {

std::string CodingScheme::getSectionName() const { return "Coding Scheme"; }

std::vector<int32_t> CodingScheme::getLogCodeArray() const { return {}; }

// Nothing is routed here; a direct call only logs the entry line, which is
// deliberately the same text as Cell Change Counters' (one log filter finds both).
void CodingScheme::updateWithData(ByteView /*data*/, int32_t /*logCode*/) {
    SystemLog::log(SystemLog::kWarning, "%s", "CellChangeCounters");
}

}  // namespace vantorel

// VirtualActiveSet: the "Virtual Active Set" section: each searcher record 0x417A empties it; the modem's virtual active-set cells are not listed.
#include "LogGenerator/MVK_GSM/VirtualActiveSet.h"

#include "LogGenerator/MVK_GSM/ActiveSet.h"
#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/SystemLog.h"

namespace vantorel {

std::string VirtualActiveSet::getSectionName() const { return "Virtual Active Set"; }

std::vector<int32_t> VirtualActiveSet::getLogCodeArray() const { return {LogCode::kUMTSSearcher}; }

void VirtualActiveSet::updateWithData(ByteView data, int32_t logCode) {
    SystemLog::log(SystemLog::kWarning, "%s", "VirtualActiveSet");
    if (logCode != LogCode::kUMTSSearcher) return logUnknownCode(logCode);
    rebuildList(data, ActiveSet::kSearcherMinLength, true,
                [](const ByteReader& r) { return ActiveSet::searcherCells(r, ActiveSet::keepNoCell); });
}

}  // namespace vantorel

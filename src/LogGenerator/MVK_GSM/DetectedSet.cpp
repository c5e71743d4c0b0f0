// DetectedSet: the "Detected Set" section: each searcher record 0x417A empties it; the modem's detected cells are not listed.
#include "LogGenerator/MVK_GSM/DetectedSet.h"

#include "LogGenerator/MVK_GSM/ActiveSet.h"
#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/SystemLog.h"

namespace vantorel {

std::string DetectedSet::getSectionName() const { return "Detected Set"; }

std::vector<int32_t> DetectedSet::getLogCodeArray() const { return {LogCode::kUMTSSearcher}; }

void DetectedSet::updateWithData(ByteView data, int32_t logCode) {
    SystemLog::log(SystemLog::kWarning, "%s", "DetectedSet");
    if (logCode != LogCode::kUMTSSearcher) return logUnknownCode(logCode);
    rebuildList(data, ActiveSet::kSearcherMinLength, true,
                [](const ByteReader& r) { return ActiveSet::searcherCells(r, ActiveSet::keepNoCell); });
}

}  // namespace vantorel

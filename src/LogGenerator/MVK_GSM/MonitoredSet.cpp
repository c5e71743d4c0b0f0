// MonitoredSet: the "Monitored Set" section: each searcher record 0x417A empties it; the modem's monitored cells are not listed.
#include "LogGenerator/MVK_GSM/MonitoredSet.h"

#include "LogGenerator/MVK_GSM/ActiveSet.h"
#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/SystemLog.h"

namespace vantorel {

std::string MonitoredSet::getSectionName() const { return "Monitored Set"; }

std::vector<int32_t> MonitoredSet::getLogCodeArray() const { return {LogCode::kUMTSSearcher}; }

void MonitoredSet::updateWithData(ByteView data, int32_t logCode) {
    SystemLog::log(SystemLog::kWarning, "%s", "MonitoredSet");
    if (logCode != LogCode::kUMTSSearcher) return logUnknownCode(logCode);
    rebuildList(data, ActiveSet::kSearcherMinLength, true,
                [](const ByteReader& r) { return ActiveSet::searcherCells(r, ActiveSet::keepNoCell); });
}

}  // namespace vantorel

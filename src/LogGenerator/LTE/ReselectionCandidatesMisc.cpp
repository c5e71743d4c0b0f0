// ReselectionCandidatesMisc: the "Reselection Candidates" section: the reselection record's version and serving cell.
#include "LogGenerator/LTE/ReselectionCandidatesMisc.h"

#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"

namespace vantorel {

namespace {

// Record 0xB186 (offsets from the record's first byte; at least 21 bytes, shorter
// records are ignored):
//   13      u8       "Version"
//   15..16  u16 LE   "Serving EARFCN"
//   17..18  u16 LE   "Serving Cell ID"
//   (the candidate count at 19 and the candidates from 21: ReselectionCandidatesList)
constexpr size_t kMinLength = 21;
constexpr size_t kVersionOffset = 13;
constexpr size_t kServingEARFCNOffset = 15;
constexpr size_t kServingCellIdOffset = 17;

}  // namespace

std::string ReselectionCandidatesMisc::getSectionName() const { return "Reselection Candidates"; }

std::vector<int32_t> ReselectionCandidatesMisc::getLogCodeArray() const { return {LogCode::kLTEReselectionCandidates}; }

void ReselectionCandidatesMisc::updateWithData(ByteView data, int32_t logCode) {
    SystemLog::log(SystemLog::kWarning, "%s", "Reselection Candidates");
    if (logCode != LogCode::kLTEReselectionCandidates) {
        logUnknownCode(logCode);
        return;
    }
    const ByteReader r(data);
    if (r.size() < kMinLength) return;

    setValue("Version", StringFormat::format("%d", r.u8(kVersionOffset).value_or(0)));
    setValue("Serving EARFCN", StringFormat::format("%d", r.u16(kServingEARFCNOffset).value_or(0)));
    setValue("Serving Cell ID", StringFormat::format("%d", r.u16(kServingCellIdOffset).value_or(0)));
}

}  // namespace vantorel

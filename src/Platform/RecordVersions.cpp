// RecordVersions: the newest readable layout of each versioned LTE record, and the records of later versions skipped.
#include "Platform/RecordVersions.h"

#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/SystemLog.h"

#include <mutex>

namespace vantorel {

namespace {

struct Newest {
    int32_t code;
    uint8_t version;
};
// The newest version each record has a layout for (docs/record-versions.md).
constexpr Newest kNewest[] = {
    {LogCode::kLTEMasterInfoBlock, 2},         {LogCode::kLTEServingCellInfo, 3},
    {LogCode::kLTEIntraFreqMeasurement, 4},    {LogCode::kLTEServingCellMeasurement, 5},
    {LogCode::kLTEIdleNeighbourMeasurements, 5},
};

constexpr size_t kVersionOffset = 13;

std::mutex gMutex;
std::map<std::pair<int32_t, uint8_t>, uint64_t> gSkipped;

}  // namespace

std::optional<uint8_t> RecordVersions::newestKnown(int32_t code) {
    for (const Newest& n : kNewest)
        if (n.code == code) return n.version;
    return std::nullopt;
}

std::optional<uint8_t> RecordVersions::versionOf(ByteView record, int32_t code) {
    if (!newestKnown(code)) return std::nullopt;
    return ByteReader(record).u8(kVersionOffset);
}

bool RecordVersions::readable(ByteView record, int32_t code) {
    const std::optional<uint8_t> version = versionOf(record, code);
    if (!version || *version <= *newestKnown(code)) return true;
    std::lock_guard<std::mutex> lock(gMutex);
    if (gSkipped[{code, *version}]++ == 0)
        SystemLog::log(SystemLog::kWarning, "0x%04X version %u: layout unknown, record skipped",
                       static_cast<unsigned>(code), static_cast<unsigned>(*version));
    return false;
}

std::map<std::pair<int32_t, uint8_t>, uint64_t> RecordVersions::skipped() {
    std::lock_guard<std::mutex> lock(gMutex);
    return gSkipped;
}

}  // namespace vantorel

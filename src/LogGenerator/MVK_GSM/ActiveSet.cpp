// ActiveSet: the "Active Set" section: scrambling code, RSCP and Ec/Io of each active-set cell of the searcher record 0x417A.
#include "LogGenerator/MVK_GSM/ActiveSet.h"

#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"

namespace vantorel {

namespace {

// Searcher record 0x417A (little-endian, offsets from the record start):
//   13                   s16  receive AGC, one value for every cell
//   15                   u8   cell count N
//   16 + 15 i            15   cell entry i
//   16 + 15 N + 44 i     44   measurement entry i
// Cell entry:        7 = scrambling code bits 0-7; 8 = bits 0-4 scrambling code bits 8-12,
//                    bits 5-7 set type. Other bytes unused.
// Measurement entry: 32, 36, 40 = u32 Ec/Io energies; the first non-zero one counts.
constexpr size_t kCellSize = 15;
constexpr size_t kMeasurementSize = 44;
constexpr size_t kFirstCell = 16;

bool keepActive(unsigned setType) { return setType == 0; }

uint32_t firstEnergy(const ByteReader& measurement) {
    for (size_t offset : {32, 36, 40})
        if (const uint32_t energy = measurement.u32(offset).value_or(0)) return energy;
    return 0;
}

}  // namespace

std::string ActiveSet::getSectionName() const { return "Active Set"; }

std::vector<int32_t> ActiveSet::getLogCodeArray() const { return {LogCode::kUMTSSearcher}; }

void ActiveSet::updateWithData(ByteView data, int32_t logCode) {
    SystemLog::log(SystemLog::kWarning, "%s", "ActiveSet");
    if (logCode != LogCode::kUMTSSearcher) return logUnknownCode(logCode);
    rebuildList(data, kSearcherMinLength, true, [](const ByteReader& r) { return searcherCells(r, keepActive); });
}

ArrayRef ActiveSet::searcherCells(const ByteReader& record, KeepCell keep) {
    const unsigned count = record.u8(15).value_or(0);
    if (count == 0) return nullptr;
    // Integer division truncates toward zero, also for an AGC below -512.
    const int rssi = (record.s16(13).value_or(0) + 512) / 10 - 106;
    const size_t firstMeasurement = kFirstCell + kCellSize * count;
    auto rows = Array::create();
    for (unsigned i = 0; i < count; ++i) {
        const auto cellBytes = record.slice(kFirstCell + kCellSize * i, kCellSize);
        const auto measurementBytes = record.slice(firstMeasurement + kMeasurementSize * i, kMeasurementSize);
        if (!cellBytes || !measurementBytes) break;
        const ByteReader cell(*cellBytes);
        const uint8_t high = cell.u8(8).value_or(0);
        if (!keep(high >> 5)) continue;
        const int scramblingCode = ((high & 0x1F) << 8) | cell.u8(7).value_or(0);
        const int ecio = lookUpECNO(firstEnergy(ByteReader(*measurementBytes)));
        auto row = Dictionary::create();
        row->set("Scrambling Code", Value(StringFormat::format("%d", scramblingCode)));
        row->set("RSCP", Value(StringFormat::format("%d dB", rssi + ecio)));
        row->set("Energy Per Chip", Value(StringFormat::format("%d dB", ecio)));
        rows->append(Value(row));
    }
    return rows;
}

}  // namespace vantorel

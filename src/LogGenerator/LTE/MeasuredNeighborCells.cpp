// MeasuredNeighborCells: the "Measured Neighbor Cells" section: one row per measured neighbour entry of record 0xB179.
#include "LogGenerator/LTE/MeasuredNeighborCells.h"

#include "LogGenerator/LTE/ConnectedModeMeasurementMisc.h"
#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"
#include "PropertyList/Dictionary.h"

namespace vantorel {

namespace {

using Layout = ConnectedModeMeasurementMisc;  // the 0xB179 layout is described there

// Neighbour entry (offsets from the entry's first byte):
//   0..1  u16 LE  "Physical Cell ID"
//   2..3  u16 LE  "Filtered RSRP"
//   4..5  u16 LE  "Filtered RSRQ"

}  // namespace

std::string MeasuredNeighborCells::getSectionName() const { return "Measured Neighbor Cells"; }

std::vector<int32_t> MeasuredNeighborCells::getLogCodeArray() const { return {LogCode::kLTEIntraFreqMeasurement}; }

void MeasuredNeighborCells::updateWithData(ByteView data, int32_t logCode) {
    SystemLog::log(SystemLog::kWarning, "%s", "Measured Neighbor Cells");
    if (logCode != LogCode::kLTEIntraFreqMeasurement) {
        logUnknownCode(logCode);
        return;
    }
    // Every record empties the list first; with no neighbours it stays empty.
    rebuildList(data, Layout::kMinLength, true, [](const ByteReader& r) -> ArrayRef {
        const unsigned count = r.u8(Layout::kNeighbourCount).value_or(0);
        if (count == 0) return nullptr;
        return readEntries(r, Layout::kFirstEntry, Layout::kNeighbourEntrySize, Layout::kNeighbourEntrySize, count,
                           [](const ByteReader& e) {
                               auto row = Dictionary::create();
                               row->set("Physical Cell ID", Value(StringFormat::format("%d", e.u16(0).value_or(0))));
                               row->set("Filtered RSRP", Value(Layout::rsrpText(e.u16(2).value_or(0))));
                               row->set("Filtered RSRQ", Value(Layout::rsrqText(e.u16(4).value_or(0))));
                               return Value(row);
                           });
    });
}

}  // namespace vantorel

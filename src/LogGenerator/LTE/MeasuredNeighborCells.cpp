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

using Misc = ConnectedModeMeasurementMisc;  // the 0xB179 layouts are described there

// Neighbour entry: "Physical Cell ID" u16 at its first byte, then "Filtered RSRP" and
// "Filtered RSRQ" where the record's layout puts them.

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
    const Misc::Layout& at = Misc::layoutOf(ByteReader(data));
    rebuildList(data, at.minLength, true, [&at](const ByteReader& r) -> ArrayRef {
        const unsigned count = r.u8(at.neighbourCount).value_or(0);
        if (count == 0) return nullptr;
        return readEntries(r, at.firstEntry, at.neighbourSize, at.neighbourSize, count, [&at](const ByteReader& e) {
            auto row = Dictionary::create();
            row->set("Physical Cell ID", Value(StringFormat::format("%d", e.u16(0).value_or(0))));
            row->set("Filtered RSRP", Value(at.rsrpAt(e, at.neighbourRsrp)));
            row->set("Filtered RSRQ", Value(at.rsrqAt(e, at.neighbourRsrq)));
            return Value(row);
        });
    });
}

}  // namespace vantorel

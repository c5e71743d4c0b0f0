// DetectedCells: the "Detected Cells" section: one row per detected-cell entry of record 0xB179.
#include "LogGenerator/LTE/DetectedCells.h"

#include "LogGenerator/LTE/ConnectedModeMeasurementMisc.h"
#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"
#include "PropertyList/Dictionary.h"

namespace vantorel {

namespace {

using Misc = ConnectedModeMeasurementMisc;  // the 0xB179 layouts are described there

// Detected-cell entry: "Physical Cell ID" u16 at its first byte.

}  // namespace

std::string DetectedCells::getSectionName() const { return "Detected Cells"; }

std::vector<int32_t> DetectedCells::getLogCodeArray() const { return {LogCode::kLTEIntraFreqMeasurement}; }

void DetectedCells::updateWithData(ByteView data, int32_t logCode) {
    SystemLog::log(SystemLog::kWarning, "%s", "Detected Cells");
    if (logCode != LogCode::kLTEIntraFreqMeasurement) {
        logUnknownCode(logCode);
        return;
    }
    const Misc::Layout& at = Misc::layoutOf(ByteReader(data));
    rebuildList(data, at.minLength, true, [&at](const ByteReader& r) -> ArrayRef {
        const unsigned count = r.u8(at.detectedCount).value_or(0);
        if (count == 0) return nullptr;
        // The detected cells follow all n neighbour entries the record announces.
        const unsigned neighbours = r.u8(at.neighbourCount).value_or(0);
        const size_t first = at.firstEntry + at.neighbourSize * neighbours;
        return readEntries(r, first, at.detectedSize, at.detectedSize, count, [](const ByteReader& e) {
            auto row = Dictionary::create();
            row->set("Physical Cell ID", Value(StringFormat::format("%d", e.u16(0).value_or(0))));
            return Value(row);
        });
    });
}

}  // namespace vantorel

// NeighborMeasurementMisc: the "Neighbor Measurements" section: version, E-ARFCN and Qrxlevmin of record 0xB180.
#include "LogGenerator/LTE/NeighborMeasurementMisc.h"

#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"

namespace vantorel {

namespace {

// Record 0xB180 (offsets from the record's first byte; at least 21 bytes, shorter
// records are ignored):
//   13      u8       "Version"
//   17..18  u16 LE   "E-ARFCN"
//   19      bits 0-5 "Qrxlevmin", in 2 dB steps from -140 dBm
//   (bits 6-10 of the u16 at 19 and the entries from 21: NeighborCellsList)
constexpr size_t kMinLength = 21;
constexpr size_t kVersionOffset = 13;
constexpr size_t kEARFCNOffset = 17;
constexpr size_t kQrxlevminOffset = 19;

}  // namespace

std::string NeighborMeasurementMisc::getSectionName() const { return "Neighbor Measurements"; }

std::vector<int32_t> NeighborMeasurementMisc::getLogCodeArray() const {
    return {LogCode::kLTEIdleNeighbourMeasurements};
}

void NeighborMeasurementMisc::updateWithData(ByteView data, int32_t logCode) {
    SystemLog::log(SystemLog::kWarning, "%s", "Neighbor Measurements");
    if (logCode != LogCode::kLTEIdleNeighbourMeasurements) {
        logUnknownCode(logCode);
        return;
    }
    const ByteReader r(data);
    if (r.size() < kMinLength) return;

    const int qrxlevmin = r.u8(kQrxlevminOffset).value_or(0) & 0x3F;
    setValue("Version", StringFormat::format("%d", r.u8(kVersionOffset).value_or(0)));
    setValue("E-ARFCN", StringFormat::format("%d", r.u16(kEARFCNOffset).value_or(0)));
    setValue("Qrxlevmin", StringFormat::format("%d dBm", 2 * qrxlevmin - 140));
}

}  // namespace vantorel

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
// Version 4 keeps these offsets; version 5 widens the E-ARFCN to a u32 at 17 and puts
// Qrxlevmin in bits 0-5 of the u32 at 21 (at least 25 bytes).
struct Layout {
    size_t minLength, earfcnWidth, qrxlevmin;
};
constexpr Layout kLayout = {21, 2, 19};
constexpr Layout kLayoutV5 = {25, 4, 21};
constexpr size_t kVersionOffset = 13;
constexpr size_t kEARFCNOffset = 17;

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
    const Layout& at = r.u8(kVersionOffset) == 5 ? kLayoutV5 : kLayout;
    if (r.size() < at.minLength) return;

    const int qrxlevmin = r.u8(at.qrxlevmin).value_or(0) & 0x3F;
    const uint32_t earfcn = at.earfcnWidth == 4 ? r.u32(kEARFCNOffset).value_or(0) : r.u16(kEARFCNOffset).value_or(0);
    setValue("Version", StringFormat::format("%d", r.u8(kVersionOffset).value_or(0)));
    setValue("E-ARFCN", StringFormat::format("%u", earfcn));
    setValue("Qrxlevmin", StringFormat::format("%d dBm", 2 * qrxlevmin - 140));
}

}  // namespace vantorel

// ConnectedModeMeasurementMisc: the "Connected mode LTE Intra-frequency Measurement" section: E-ARFCN, serving cell, subframe and filtered RSRP/RSRQ of record 0xB179.
#include "LogGenerator/LTE/ConnectedModeMeasurementMisc.h"

#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"

namespace vantorel {

namespace {

std::string originalRsrp(const ByteReader& r, size_t offset) {
    return ConnectedModeMeasurementMisc::rsrpText(r.u16(offset).value_or(0));
}
std::string originalRsrq(const ByteReader& r, size_t offset) {
    return ConnectedModeMeasurementMisc::rsrqText(r.u16(offset).value_or(0));
}
// Version 4 words carry sixteenths of a dB: RSRP in bits 0-11 above -180 dBm, RSRQ in bits
// 0-9 above -30 dB (the upper halves of the words repeat the values in the real records).
std::string sixteenthsRsrp(const ByteReader& r, size_t offset) {
    return StringFormat::format("%4.2f dBm", (r.u32(offset).value_or(0) & 0xFFF) / 16.0 - 180);
}
std::string sixteenthsRsrq(const ByteReader& r, size_t offset) {
    return StringFormat::format("%4.2f dB", (r.u32(offset).value_or(0) & 0x3FF) / 16.0 - 30);
}

constexpr ConnectedModeMeasurementMisc::Layout kLayout = {29, 17, 2, 19, 21, 23, 25, 27, 28, 29,
                                                          6,  2,  4, 2,  originalRsrp, originalRsrq};
constexpr ConnectedModeMeasurementMisc::Layout kLayoutV4 = {41, 21, 4, 25, 27, 29, 33, 37, 38, 41,
                                                            12, 2,  6, 16, sixteenthsRsrp, sixteenthsRsrq};

}  // namespace

const ConnectedModeMeasurementMisc::Layout& ConnectedModeMeasurementMisc::layoutOf(const ByteReader& record) {
    return record.u8(13) == 4 ? kLayoutV4 : kLayout;
}

std::string ConnectedModeMeasurementMisc::rsrpText(unsigned raw) {
    return StringFormat::format("%4.2f dBm", raw * 0.25 - 140);
}

std::string ConnectedModeMeasurementMisc::rsrqText(unsigned raw) {
    return StringFormat::format("%4.2f dB", raw * 0.125 - 20);
}

std::string ConnectedModeMeasurementMisc::getSectionName() const {
    return "Connected mode LTE Intra-frequency Measurement";
}

std::vector<int32_t> ConnectedModeMeasurementMisc::getLogCodeArray() const {
    return {LogCode::kLTEIntraFreqMeasurement};
}

void ConnectedModeMeasurementMisc::updateWithData(ByteView data, int32_t logCode) {
    SystemLog::log(SystemLog::kWarning, "%s", "Connected mode LTE Intra-frequency Measurement");
    if (logCode != LogCode::kLTEIntraFreqMeasurement) {
        logUnknownCode(logCode);
        return;
    }
    const ByteReader r(data);
    const Layout& at = layoutOf(r);
    if (r.size() < at.minLength) return;
    const unsigned earfcn = at.earfcnWidth == 4 ? r.u32(at.earfcn).value_or(0) : r.u16(at.earfcn).value_or(0);
    setValue("E-ARFCN", StringFormat::format("%u", earfcn));
    setValue("Serving Physical Cell ID", StringFormat::format("%d", r.u16(at.pci).value_or(0)));
    setValue("Subframe Number", StringFormat::format("%d", r.u16(at.subframe).value_or(0)));
    setValue("Serving Filtered RSRP", at.rsrpAt(r, at.rsrp));
    setValue("Serving Filtered RSRQ", at.rsrqAt(r, at.rsrq));
}

}  // namespace vantorel

// ConnectedModeMeasurementMisc: the "Connected mode LTE Intra-frequency Measurement" section: E-ARFCN, serving cell, subframe and filtered RSRP/RSRQ of record 0xB179.
#include "LogGenerator/LTE/ConnectedModeMeasurementMisc.h"

#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"

namespace vantorel {

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
    if (r.size() < kMinLength) return;
    setValue("E-ARFCN", StringFormat::format("%d", r.u16(17).value_or(0)));
    setValue("Serving Physical Cell ID", StringFormat::format("%d", r.u16(19).value_or(0)));
    setValue("Subframe Number", StringFormat::format("%d", r.u16(21).value_or(0)));
    setValue("Serving Filtered RSRP", rsrpText(r.u16(23).value_or(0)));
    setValue("Serving Filtered RSRQ", rsrqText(r.u16(25).value_or(0)));
}

}  // namespace vantorel

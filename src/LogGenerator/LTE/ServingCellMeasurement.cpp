// ServingCellMeasurement: the "Serving Cell Measurements" section: the idle-mode serving cell's measurements and cell-selection parameters of record 0xB17F.
#include "LogGenerator/LTE/ServingCellMeasurement.h"

#include "LogGenerator/LTE/ConnectedModeMeasurementMisc.h"
#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"

#include <utility>
#include <vector>

namespace vantorel {

namespace {

// Record 0xB17F (offsets from the record's first byte; at least 33 bytes, shorter
// records are ignored). "w19 bits 0-8" is bits 0 to 8 of the little-endian 32-bit
// word at offset 19:
//   13               u8      "Version"
//   17..18           u16 LE  "E-ARFCN"
//   w19 bits  0-8            "Physical Cell ID"
//   w19 bits  9-12           "Serving Layer Priority"
//   w21 bits  0-8            "Measured RSRP", quarter dB above -140 dBm
//   w21 bits  9-17           "Average RSRP"
//   w21 bits 18-24           "Measured RSRQ", quarter dB above -30 dB
//   w21 bits 25-31           "Average RSRQ"
//   w25 bits  0-8            "Measured RSSI", half dB above -140 dBm
//   w25 bits  9-14           "Qrxlevmin", 2 dB steps above -140 dBm
//   w25 bits 15-21           "P_Max", dB above -30 dBm; 64 not present
//   w25 bits 22-27           "Max UE Tx Power", dB above -30 dBm
//   w29 bits  0-6            "Srxlev", dB above -30
//   w29 bits  7-12           "Num of Consecutive DRX Cycles of S < 0"
//   w29 bits 13-18           "S Intra Search", 2 dB steps; 32 not present
//   w29 bits 19-24           "S Non Intra Search", 2 dB steps; 32 not present
//   w29 bit  25              "Measurement Rules Updated"
//   w29 bits 26-29           "Measurement Rules"
constexpr size_t kMinLength = 33;

// Versions 4 and 5 (today's phones) carry only the measurements, in 1/16 dB steps, and
// the display shows no selection parameters for them (offsets as above):
//                                       version 4  version 5
//   "E-ARFCN"                           u16 17     u32 17
//   u16 bits 0-8 PCI, 9-15 priority     19         21 (then 2 pad bytes)
//   u32 bits 0-11 "Measured RSRP"       21         25   x/16 - 180 dBm
//   u32 bits 0-11 "Average RSRP"        25         29
//   u32 bits 0-9 "Measured RSRQ",       29         33   x/16 - 30 dB
//       bits 20-29 "Average RSRQ"
//   u32 bits 10-20 "Measured RSSI"      33         37   x/16 - 110 dBm
// A record ending inside its layout is ignored.
struct SixteenthLayout {
    size_t minLength, earfcn, earfcnWidth, cell, rsrp, averageRsrp, rsrq, rssi;
};
constexpr SixteenthLayout kLayoutV4 = {37, 17, 2, 19, 21, 25, 29, 33};
constexpr SixteenthLayout kLayoutV5 = {41, 17, 4, 21, 25, 29, 33, 37};
constexpr unsigned kPowerNotPresent = 64;
constexpr unsigned kSearchNotPresent = 32;

unsigned bits(uint32_t word, unsigned first, unsigned last) {
    return (word >> first) & ((1u << (last - first + 1)) - 1);
}

// "Not Present" when the field holds its marker, else the value's text.
std::string presentOr(unsigned field, unsigned notPresent, std::string text) {
    return field == notPresent ? "Not Present" : text;
}

std::string sixteenths(uint32_t raw, int offset, const char* unit) {
    return StringFormat::format("%4.2f %s", raw / 16.0 + offset, unit);
}

// The display values of a version-4 or -5 record, in display order.
std::vector<std::pair<const char*, std::string>> sixteenthLayoutValues(const ByteReader& r, const SixteenthLayout& at) {
    const uint32_t earfcn = at.earfcnWidth == 4 ? r.u32(at.earfcn).value_or(0) : r.u16(at.earfcn).value_or(0);
    const uint32_t cell = r.u16(at.cell).value_or(0);
    const uint32_t rsrq = r.u32(at.rsrq).value_or(0);
    return {
        {"Version", StringFormat::format("%d", r.u8(13).value_or(0))},
        {"E-ARFCN", StringFormat::format("%u", earfcn)},
        {"Physical Cell ID", StringFormat::format("%u", bits(cell, 0, 8))},
        {"Serving Layer Priority", StringFormat::format("%u", bits(cell, 9, 15))},
        {"Measured RSRP", sixteenths(bits(r.u32(at.rsrp).value_or(0), 0, 11), -180, "dBm")},
        {"Average RSRP", sixteenths(bits(r.u32(at.averageRsrp).value_or(0), 0, 11), -180, "dBm")},
        {"Measured RSRQ", sixteenths(bits(rsrq, 0, 9), -30, "dB")},
        {"Average RSRQ", sixteenths(bits(rsrq, 20, 29), -30, "dB")},
        {"Measured RSSI", sixteenths(bits(r.u32(at.rssi).value_or(0), 10, 20), -110, "dBm")},
    };
}

}  // namespace

std::string ServingCellMeasurement::getSectionName() const { return "Serving Cell Measurements"; }

std::vector<int32_t> ServingCellMeasurement::getLogCodeArray() const { return {LogCode::kLTEServingCellMeasurement}; }

void ServingCellMeasurement::updateWithData(ByteView data, int32_t logCode) {
    SystemLog::log(SystemLog::kWarning, "%s", "Serving Cell Measurements");
    if (logCode != LogCode::kLTEServingCellMeasurement) {
        logUnknownCode(logCode);
        return;
    }
    const ByteReader r(data);
    const auto version = r.u8(13);
    if (version == 4 || version == 5) {
        const SixteenthLayout& at = version == 4 ? kLayoutV4 : kLayoutV5;
        if (r.size() < at.minLength) return;
        for (const auto& [key, text] : sixteenthLayoutValues(r, at)) setValue(key, text);
        return;
    }
    if (r.size() < kMinLength) return;
    const uint32_t cell = r.u32(19).value_or(0);
    const uint32_t quality = r.u32(21).value_or(0);
    const uint32_t power = r.u32(25).value_or(0);
    const uint32_t selection = r.u32(29).value_or(0);

    setValue("Version", StringFormat::format("%d", r.u8(13).value_or(0)));
    setValue("E-ARFCN", StringFormat::format("%d", r.u16(17).value_or(0)));
    setValue("Physical Cell ID", StringFormat::format("%u", bits(cell, 0, 8)));
    setValue("Serving Layer Priority", StringFormat::format("%u", bits(cell, 9, 12)));
    setValue("Measured RSRP", ConnectedModeMeasurementMisc::rsrpText(bits(quality, 0, 8)));
    setValue("Average RSRP", ConnectedModeMeasurementMisc::rsrpText(bits(quality, 9, 17)));
    setValue("Measured RSRQ", StringFormat::format("%4.2f dB", bits(quality, 18, 24) * 0.25 - 30));
    setValue("Average RSRQ", StringFormat::format("%4.2f dB", bits(quality, 25, 31) * 0.25 - 30));
    setValue("Measured RSSI", StringFormat::format("%4.2f dBm", bits(power, 0, 8) * 0.5 - 140));
    setValue("Qrxlevmin", StringFormat::format("%d dBm", 2 * int(bits(power, 9, 14)) - 140));
    const unsigned pMax = bits(power, 15, 21);
    setValue("P_Max", presentOr(pMax, kPowerNotPresent, StringFormat::format("%d dBm", int(pMax) - 30)));
    // The field is 6 bits wide and never holds 64, so this is always a number; the
    // comparison is kept as the monitor has always made it.
    const unsigned maxTx = bits(power, 22, 27);
    setValue("Max UE Tx Power", presentOr(maxTx, kPowerNotPresent, StringFormat::format("%d dBm", int(maxTx) - 30)));
    setValue("Srxlev", StringFormat::format("%d dBm", int(bits(selection, 0, 6)) - 30));
    setValue("Num of Consecutive DRX Cycles of S < 0", StringFormat::format("%u", bits(selection, 7, 12)));
    const unsigned intra = bits(selection, 13, 18);
    setValue("S Intra Search", presentOr(intra, kSearchNotPresent, StringFormat::format("%d dB", 2 * int(intra))));
    // Labelled in dBm unlike the intra-frequency threshold, as the monitor always showed it.
    const unsigned nonIntra = bits(selection, 19, 24);
    setValue("S Non Intra Search",
             presentOr(nonIntra, kSearchNotPresent, StringFormat::format("%d dBm", 2 * int(nonIntra))));
    setValue("Measurement Rules Updated", bits(selection, 25, 25) ? "True" : "False");
    setValue("Measurement Rules", StringFormat::format("%u", bits(selection, 26, 29)));
}

}  // namespace vantorel

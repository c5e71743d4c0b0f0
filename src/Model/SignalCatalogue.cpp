// SignalCatalogue: one constant table of every technology's signal quantities, and the lookup of a display path in it.
#include "Model/SignalCatalogue.h"

#include "Model/SignalValue.h"
#include "Platform/StringFormat.h"
#include "Platform/TelephonyIdentifiers.h"

#include <algorithm>
#include <cmath>
#include <iterator>

namespace vantorel {

namespace {

constexpr const char* kPower = "received power";
constexpr const char* kTransmit = "transmit power";
constexpr const char* kQuality = "signal quality";
constexpr const char* kLevel = "level";
constexpr const char* kMargin = "margin";
constexpr const char* kThreshold = "threshold";
constexpr const char* kErrorRate = "error rate";
constexpr const char* kRate = "rate";

constexpr const char* LTE = kTSLogChannelTechnology_Morvek_LTE;
constexpr const char* UTRAN = kTSLogChannelTechnology_Morvek_UTRAN2;
constexpr const char* GSM = kTSLogChannelTechnology_Morvek_GSM;
constexpr const char* CDMA = kTSLogChannelTechnology_Morvek_CDMA;
constexpr const char* IFX = kTSLogChannelTechnology_IFX;

// {technology, path, shown unit, short name, quantity, unit, scale, offset}
constexpr SignalCatalogue::Entry kCatalogue[] = {
    // LTE. Srxlev (Qrxlevmeas above Qrxlevmin, 36.304) is a margin in dB, and the search
    // thresholds compared with it are dB too, whatever unit word their strings carry.
    {LTE, "/Serving Cell/Serving Cell Measurements/Measured RSRP", nullptr, "RSRP", kPower, "dBm", 1, 0},
    {LTE, "/Serving Cell/Serving Cell Measurements/Average RSRP", nullptr, "average RSRP", kPower, "dBm", 1, 0},
    {LTE, "/Serving Cell/Serving Cell Measurements/Measured RSRQ", nullptr, "RSRQ", kQuality, "dB", 1, 0},
    {LTE, "/Serving Cell/Serving Cell Measurements/Average RSRQ", nullptr, "average RSRQ", kQuality, "dB", 1, 0},
    {LTE, "/Serving Cell/Serving Cell Measurements/Measured RSSI", nullptr, "RSSI", kPower, "dBm", 1, 0},
    {LTE, "/Serving Cell/Serving Cell Measurements/Srxlev", nullptr, "Srxlev", kMargin, "dB", 1, 0},
    {LTE, "/Serving Cell/Serving Cell Measurements/Qrxlevmin", nullptr, "Qrxlevmin", kThreshold, "dBm", 1, 0},
    {LTE, "/Serving Cell/Serving Cell Measurements/S Intra Search", nullptr, "S intra search", kThreshold, "dB", 1, 0},
    {LTE, "/Serving Cell/Serving Cell Measurements/S Non Intra Search", nullptr, "S non-intra search", kThreshold, "dB", 1, 0},
    {LTE, "/Serving Cell/Serving Cell Measurements/P_Max", nullptr, "P-Max", kTransmit, "dBm", 1, 0},
    {LTE, "/Serving Cell/Serving Cell Measurements/Max UE Tx Power", nullptr, "max UE Tx power", kTransmit, "dBm", 1, 0},
    {LTE, "/Serving Cell/Connected mode LTE Intra-frequency Measurement/Serving Filtered RSRP", nullptr, "filtered RSRP", kPower, "dBm", 1, 0},
    {LTE, "/Serving Cell/Connected mode LTE Intra-frequency Measurement/Serving Filtered RSRQ", nullptr, "filtered RSRQ", kQuality, "dB", 1, 0},
    {LTE, "/Neighbours/Measured Neighbor Cells/*/Filtered RSRP", nullptr, "RSRP", kPower, "dBm", 1, 0},
    {LTE, "/Neighbours/Measured Neighbor Cells/*/Filtered RSRQ", nullptr, "RSRQ", kQuality, "dB", 1, 0},
    {LTE, "/Neighbours/Neighbor Cells List/*/Measured RSSI", nullptr, "RSSI", kPower, "dBm", 1, 0},
    {LTE, "/Neighbours/Neighbor Cells List/*/Measured RSRP", nullptr, "RSRP", kPower, "dBm", 1, 0},
    {LTE, "/Neighbours/Neighbor Cells List/*/Average RSRP", nullptr, "average RSRP", kPower, "dBm", 1, 0},
    {LTE, "/Neighbours/Neighbor Cells List/*/Measured RSRQ", nullptr, "RSRQ", kQuality, "dB", 1, 0},
    {LTE, "/Neighbours/Neighbor Cells List/*/Average RSRQ", nullptr, "average RSRQ", kQuality, "dB", 1, 0},
    {LTE, "/Neighbours/Neighbor Cells List/*/Srxlev", nullptr, "Srxlev", kMargin, "dB", 1, 0},
    {LTE, "/Neighbours/Neighbor Measurements/Qrxlevmin", nullptr, "Qrxlevmin", kThreshold, "dBm", 1, 0},

    // UTRAN (TD-SCDMA). "Filter RSCP" shows the 8-bit P-CCPCH RSCP report (25.123
    // PCCPCH_RSCP_LEV, dBm + 116) divided by 256: back to dBm it is × 256 − 116.
    {UTRAN, "/Neighbours/Neighbor Cell List/*/Filter RSCP", nullptr, "RSCP", kPower, "dBm", 256, -116},
    {UTRAN, "/Neighbours/GSM Neighbor Cell List/*/RSSI", nullptr, "RSSI", kPower, "dBm", 1, 0},
    {UTRAN, "/Link Quality/CCTRCH SIR/*/SIR/*", nullptr, "SIR", kQuality, "dB", 1, 0},
    {UTRAN, "/Link Quality/TRCH BLER/*/TRCH BLER Measurement", nullptr, "BLER", kErrorRate, "%", 1, 0},

    // GSM/UMTS. Record 0x5137's received level is RxLev (0..63: 0 below -110 dBm, n for
    // n - 111 <= dBm < n - 110, 63 from -48 dBm), shown as "RSSI ... dBm" in the serving cell
    // and bare in the neighbours; the cell monitor fills the same neighbour list in dBm,
    // taken back to RxLev by + 111 (and held to 0..63).
    // UMTS RSCP (RSSI + Ec/Io) is a power whichever unit word it shows.
    {GSM, "/Serving Cell/GSM Serving Cell/RSSI", nullptr, "RxLev", kLevel, "", 1, 0},
    {GSM, "/Serving Cell/GSM Serving Cell/C1 Value", nullptr, "C1", kMargin, "dB", 1, 0},
    {GSM, "/Serving Cell/GSM Serving Cell/C2 Value", nullptr, "C2", kMargin, "dB", 1, 0},
    {GSM, "/Serving Cell/UMTS RR Info/Transmit Power", nullptr, "Tx power", kTransmit, "dBm", 1, 0},
    {GSM, "/Radio Resources/GSM RR Info/Serving Rx Level", nullptr, "RxLev", kLevel, "", 1, 0},
    {GSM, "/Cell Sets/*/*/RSCP", nullptr, "RSCP", kPower, "dBm", 1, 0},
    {GSM, "/Cell Sets/*/*/Rank Cell RSCP", nullptr, "ranking RSCP", kPower, "dBm", 1, 0},
    {GSM, "/Cell Sets/*/*/Energy Per Chip", nullptr, "Ec/Io", kQuality, "dB", 1, 0},
    {GSM, "/Cell Sets/*/*/RSSI", nullptr, "RSSI", kPower, "dBm", 1, 0},
    {GSM, "/GSM Neighbours/Neighboring Cells/*/RSSI", "dBm", "RxLev", kLevel, "", 1, 111},
    {GSM, "/GSM Neighbours/Neighboring Cells/*/RSSI", nullptr, "RxLev", kLevel, "", 1, 0},
    {GSM, "/GSM Neighbours/Neighboring Cells/*/C1 Value", nullptr, "C1", kMargin, "dB", 1, 0},
    {GSM, "/Link Quality/BLER/Transport Channels/*/BLER %", nullptr, "BLER", kErrorRate, "%", 1, 0},

    // CDMA2000.
    {CDMA, "/1x/Rx AGC 0", nullptr, "Rx AGC 0", kPower, "dBm", 1, 0},
    {CDMA, "/1x/Rx AGC 1", nullptr, "Rx AGC 1", kPower, "dBm", 1, 0},
    {CDMA, "/1x/Tx AGC", nullptr, "Tx AGC", kTransmit, "dBm", 1, 0},
    {CDMA, "/1x/Active Set/*", nullptr, "pilot Ec/Io", kQuality, "dB", 1, 0},
    {CDMA, "/1x/Frame Error Rate", nullptr, "FER", kErrorRate, "%", 1, 0},
    {CDMA, "/Overview/Frame Error Rate", nullptr, "FER", kErrorRate, "%", 1, 0},
    {CDMA, "/EV-DO/Rx AGC 0", nullptr, "EV-DO Rx AGC 0", kPower, "dBm", 1, 0},
    {CDMA, "/EV-DO/Rx AGC 1", nullptr, "EV-DO Rx AGC 1", kPower, "dBm", 1, 0},
    {CDMA, "/EV-DO/Tx AGC", nullptr, "EV-DO Tx AGC", kTransmit, "dBm", 1, 0},
    {CDMA, "/Data Rates/Forward Link", nullptr, "forward rate", kRate, "kbit/s", 1, 0},
    {CDMA, "/Data Rates/Reverse Link", nullptr, "reverse rate", kRate, "kbit/s", 1, 0},
    {CDMA, "/Overview/Forward Data Rate", nullptr, "forward rate", kRate, "kbit/s", 1, 0},
    {CDMA, "/Overview/Reverse Data Rate", nullptr, "reverse rate", kRate, "kbit/s", 1, 0},

    // GSM (IFX): the modem's own display, RxLev and RxQual as bare indices.
    {IFX, "/Serving Cell/Measurement/RxLev", nullptr, "RxLev", kLevel, "", 1, 0},
    {IFX, "/Serving Cell/Measurement/RxQual", nullptr, "RxQual", "quality class", "", 1, 0},
    {IFX, "/Serving Cell/Measurement/C1", nullptr, "C1", kMargin, "dB", 1, 0},
    {IFX, "/Serving Cell/Measurement/C2", nullptr, "C2", kMargin, "dB", 1, 0},
    {IFX, "/Neighbours/*/RxLev", nullptr, "RxLev", kLevel, "", 1, 0},
};

// The table's paths split into components once.
const std::vector<std::vector<std::string>>& patterns() {
    static const std::vector<std::vector<std::string>> split = [] {
        std::vector<std::vector<std::string>> all;
        for (const SignalCatalogue::Entry& entry : kCatalogue) all.push_back(SignalCatalogue::components(entry.path));
        return all;
    }();
    return split;
}

bool matches(const std::vector<std::string>& pattern, const std::vector<std::string>& key) {
    if (pattern.size() != key.size()) return false;
    for (size_t i = 0; i < key.size(); ++i)
        if (pattern[i] != "*" && pattern[i] != key[i]) return false;
    return true;
}

}  // namespace

double SignalQuantity::convert(double shown) const {
    double value = shown * scale + offset;
    if (quantity == kLevel) value = std::clamp(value, 0.0, 63.0);  // RxLev has no other values
    return scale == 1 ? value : std::round(value * 1000) / 1000;
}

std::string SignalQuantity::unitLabel() const { return unit.empty() ? quantity : unit; }

std::string SignalQuantity::reading(double value) const {
    const std::string number = StringFormat::format("%.5g", value);
    if (!unit.empty()) return number + " " + unit;
    return quantity.empty() ? number : number + " (" + quantity + ")";
}

std::vector<std::string> SignalCatalogue::components(const std::string& path) {
    std::vector<std::string> parts;
    std::string part;
    int depth = 0;
    for (const char c : path) {
        if (c == '/' && depth == 0) {
            if (!part.empty()) parts.push_back(part);
            part.clear();
            continue;
        }
        depth += c == '[' ? 1 : c == ']' && depth > 0 ? -1 : 0;
        part += c;
    }
    if (!part.empty()) parts.push_back(part);
    return parts;
}

std::vector<SignalCatalogue::Entry> SignalCatalogue::entries(const std::string& technology) {
    std::vector<Entry> rows;
    for (const Entry& entry : kCatalogue)
        if (technology == entry.technology) rows.push_back(entry);
    return rows;
}

std::optional<SignalQuantity> SignalCatalogue::find(const std::string& technology, const std::string& key,
                                                    const std::string* shown) {
    const std::vector<std::string> parts = components(key);
    const std::string shownUnit = shown ? SignalValue::unit(*shown) : std::string();
    for (size_t i = 0; i < std::size(kCatalogue); ++i) {
        const Entry& entry = kCatalogue[i];
        if ((!technology.empty() && technology != entry.technology) || (shown && entry.shownUnit && shownUnit != entry.shownUnit) ||
            !matches(patterns()[i], parts))
            continue;
        return SignalQuantity{entry.name, entry.quantity, entry.unit, entry.scale, entry.offset};
    }
    return std::nullopt;
}

std::string SignalCatalogue::columnTitle(const std::string& key, const std::optional<SignalQuantity>& quantity) {
    return quantity && quantity->catalogued() ? key + " (" + quantity->unitLabel() + ")" : key;
}

std::string SignalCatalogue::keyOfColumn(const std::string& title) {
    if (title.empty() || title.back() != ')') return title;
    const size_t open = title.rfind(" (");
    if (open == std::string::npos) return title;
    const std::string label = title.substr(open + 2, title.size() - open - 3);
    for (const Entry& entry : kCatalogue)
        if (label == (*entry.unit ? entry.unit : entry.quantity)) return title.substr(0, open);
    return title;
}

}  // namespace vantorel

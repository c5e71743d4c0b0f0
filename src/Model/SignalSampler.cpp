// SignalSampler: reads the plotted leaves of the display tree once per display tick and notes technology changes and handovers.
#include "Model/SignalSampler.h"

#include "Model/DisplayPath.h"
#include "Model/SignalValue.h"
#include "Platform/TechnologyNames.h"
#include "Platform/TelephonyIdentifiers.h"

#include <algorithm>
#include <set>

namespace vantorel {

namespace {

// A neighbour list whose strongest cells the plot follows, by the number at `leaf`, among
// the entries `conditions` keep (DisplayPath's selector conditions).
struct CellList {
    const char* list;
    const char* leaf;
    const char* conditions;
};

std::vector<CellList> cellListsOf(const std::string& technology) {
    if (technology == kTSLogChannelTechnology_Morvek_LTE) return {{"/Neighbours/Measured Neighbor Cells", "Filtered RSRP", ""}};
    // The neighbour list holds the serving cell too, as its active-set entry.
    if (technology == kTSLogChannelTechnology_Morvek_UTRAN2)
        return {{"/Neighbours/Neighbor Cell List", "Filter RSCP", "Status!=ASET"}};
    if (technology == kTSLogChannelTechnology_Morvek_GSM)
        return {{"/GSM Neighbours/Neighboring Cells", "RSSI", ""}, {"/Cell Sets/Monitored Set", "RSCP", ""}};
    if (technology == kTSLogChannelTechnology_IFX) return {{"/Neighbours", "RxLev", ""}};
    return {};
}

// "<list>/[#n <leaf>,<conditions>]": the entry with the n-th highest number at leaf.
std::string ranked(const CellList& cells, int n) {
    std::string selector = "#" + std::to_string(n) + " " + cells.leaf;
    if (*cells.conditions) selector += std::string(",") + cells.conditions;
    return std::string(cells.list) + "/[" + selector + "]";
}

// The strongest cells' identity and value leaves, as CSV columns.
std::vector<std::string> strongestKeys(const CellList& cells, const char* identity) {
    std::vector<std::string> keys;
    for (int n = 1; n <= SignalSampler::kStrongestCells; ++n) {
        keys.push_back(ranked(cells, n) + "/" + identity);
        keys.push_back(ranked(cells, n) + "/" + cells.leaf);
    }
    return keys;
}

std::vector<std::string> concat(std::vector<std::string> a, const std::vector<std::string>& b) {
    a.insert(a.end(), b.begin(), b.end());
    return a;
}

std::string lastComponent(const std::string& path) {
    const size_t slash = path.rfind('/');
    return slash == std::string::npos ? path : path.substr(slash + 1);
}

// Leaves a decoder does not show but its siblings give: UMTS transport-channel BLER as a
// percentage of the CRC counts of the same window.
constexpr const char* kBlerPercent = "BLER %";

}  // namespace

std::vector<std::string> SignalSampler::defaultKeys(const std::string& technology) {
    // The serving cell's identity first, so that a CSV row says which cell its values are of.
    return concat(identityKeys(technology), valueKeys(technology));
}

std::vector<std::string> SignalSampler::valueKeys(const std::string& technology) {
    const std::vector<CellList> cells = cellListsOf(technology);
    if (technology == kTSLogChannelTechnology_Morvek_LTE)
        return concat({"/Serving Cell/Serving Cell Measurements/Measured RSRP",
                       "/Serving Cell/Serving Cell Measurements/Measured RSRQ",
                       "/Serving Cell/Serving Cell Measurements/Measured RSSI",
                       "/Serving Cell/Connected mode LTE Intra-frequency Measurement/Serving Filtered RSRP"},
                      strongestKeys(cells[0], "Physical Cell ID"));
    // Of UTRAN's first CCTRCH its first time slot's SIR.
    if (technology == kTSLogChannelTechnology_Morvek_UTRAN2)
        return concat(concat({"/Neighbours/Neighbor Cell List/[Status=ASET]/Filter RSCP"}, strongestKeys(cells[0], "Cell ID")),
                      {"/Link Quality/CCTRCH SIR/0/SIR/0", "/Link Quality/TRCH BLER/0/TRCH BLER Measurement"});
    if (technology == kTSLogChannelTechnology_Morvek_GSM)
        return concat({"/Cell Sets/Active Set/0/RSCP", "/Cell Sets/Active Set/0/Energy Per Chip",
                       "/Radio Resources/GSM RR Info/Serving Rx Level", "/Serving Cell/GSM Serving Cell/RSSI",
                       std::string("/Link Quality/BLER/Transport Channels/0/") + kBlerPercent},
                      strongestKeys(cells[0], "ARFCN"));
    if (technology == kTSLogChannelTechnology_Morvek_CDMA)
        return {"/1x/Rx AGC 0", "/1x/Frame Error Rate", "/EV-DO/Rx AGC 0", "/Data Rates/Forward Link",
                "/Data Rates/Reverse Link"};
    if (technology == kTSLogChannelTechnology_IFX)
        return concat({"/Serving Cell/Measurement/RxLev", "/Serving Cell/Measurement/RxQual"},
                      strongestKeys(cells[0], "ARFCN"));
    return {};
}

std::vector<std::string> SignalSampler::identityKeys(const std::string& technology) {
    if (technology == kTSLogChannelTechnology_Morvek_LTE)
        return {"/Serving Cell/Serving Cell Info/Physical Cell ID", "/Serving Cell/Serving Cell Info/Download Frequency"};
    if (technology == kTSLogChannelTechnology_Morvek_UTRAN2)
        return {"/Serving Cell/Serving Cell Info/Cell Scrambling Code", "/Serving Cell/Serving Cell Info/Downlink UARFCN"};
    if (technology == kTSLogChannelTechnology_Morvek_GSM)
        return {"/Serving Cell/GSM Serving Cell/ARFCN", "/Serving Cell/GSM Serving Cell/BSIC",
                "/Serving Cell/UMTS RR Info/Scrambling Code", "/Serving Cell/UMTS RR Info/Downlink Frequency"};
    if (technology == kTSLogChannelTechnology_Morvek_CDMA)
        return {"/System/Base ID", "/1x/Channel", "/EV-DO/Serving PN Offset"};
    if (technology == kTSLogChannelTechnology_IFX)
        return {"/Serving Cell/Identity/Cell ID", "/Serving Cell/Identity/ARFCN", "/Serving Cell/Identity/BSIC"};
    return {};
}

void SignalSampler::setKeys(std::vector<std::string> keys) {
    keys_.clear();
    keysChosen_ = true;
    for (std::string& key : keys) addKey(key);
}

void SignalSampler::addKey(const std::string& key) {
    if (std::find(keys_.begin(), keys_.end(), key) == keys_.end()) keys_.push_back(key);
}

std::optional<double> SignalSampler::valueAt(const std::string& key, const PathDictionary& nodes) {
    if (lastComponent(key) == kBlerPercent) {
        const std::string channel = key.substr(0, key.size() - std::string(kBlerPercent).size());
        const std::string *errors = DisplayPath::leafText(channel + "CRC Received in Error", nodes),
                          *received = DisplayPath::leafText(channel + "CRC Received", nodes);
        const std::optional<double> e = errors ? SignalValue::parse(*errors) : std::nullopt,
                                    r = received ? SignalValue::parse(*received) : std::nullopt;
        if (!e || !r || *r <= 0) return std::nullopt;
        return 100.0 * *e / *r;
    }
    const std::string* text = DisplayPath::leafText(key, nodes);
    return text ? SignalValue::parse(*text) : std::nullopt;
}

std::optional<double> SignalSampler::readingAt(const std::string& technology, const std::string& key,
                                               const PathDictionary& nodes) {
    const std::optional<double> shown = valueAt(key, nodes);
    if (!shown) return std::nullopt;
    // The display string picks the form of a leaf some records show with a unit and others without.
    const std::string* text = lastComponent(key) == kBlerPercent ? nullptr : DisplayPath::leafText(key, nodes);
    const std::optional<SignalQuantity> quantity = SignalCatalogue::find(technology, key, text);
    return quantity ? quantity->convert(*shown) : *shown;
}

std::optional<SignalQuantity> SignalSampler::quantityAt(const std::string& technology, const std::string& key,
                                                        const PathDictionary& nodes) {
    if (std::optional<SignalQuantity> quantity = SignalCatalogue::find(technology, key)) return quantity;
    if (lastComponent(key) == kBlerPercent) return SignalQuantity{"BLER", "", "%"};
    const std::string* text = DisplayPath::leafText(key, nodes);
    if (!text || !SignalValue::parse(*text)) return std::nullopt;
    return SignalQuantity{lastComponent(key), "", SignalValue::unit(*text)};
}

std::optional<SignalQuantity> SignalSampler::quantity(const std::string& key) const {
    const auto it = quantities_.find(key);
    return it == quantities_.end() ? std::nullopt : std::optional<SignalQuantity>(it->second);
}

std::string SignalSampler::columnTitle(const std::string& key) const {
    return SignalCatalogue::columnTitle(key, quantity(key));
}

std::vector<std::string> SignalSampler::plotKeys() const {
    // The serving cell's identity is shown by the handover marks, a ranked entry by its cell's line.
    const std::vector<std::string> identity = identityKeys(technology_);
    std::vector<std::string> shown;
    for (const std::string& key : keys_)
        if (!DisplayPath::isRanked(key) &&
            !(defaults_.count(key) && std::find(identity.begin(), identity.end(), key) != identity.end()))
            shown.push_back(key);
    shown.insert(shown.end(), cellKeys_.begin(), cellKeys_.end());
    return shown;
}

void SignalSampler::sampleCells(int64_t timeMs, const PathDictionary& nodes) {
    std::set<std::string> strongest;
    for (const CellList& cells : cellListsOf(technology_)) {
        for (int n = 1; n <= kStrongestCells; ++n) {
            const NodeRef entry = DisplayPath::resolve(ranked(cells, n), nodes);
            const std::string identity = DisplayPath::identitySelector(entry);
            if (identity.empty()) continue;
            const std::string key = std::string(cells.list) + "/" + identity + "/" + cells.leaf;
            strongest.insert(key);
            if (!cellSeen_.count(key)) cellKeys_.push_back(key);
            cellSeen_[key] = timeMs;
        }
    }
    // Cells out of the strongest show a gap; beyond the budget the longest unseen go.
    while (cellKeys_.size() > kMaxCellLines) {
        auto oldest = std::min_element(cellKeys_.begin(), cellKeys_.end(),
                                       [&](const std::string& a, const std::string& b) { return cellSeen_[a] < cellSeen_[b]; });
        series_.remove(*oldest);
        cellSeen_.erase(*oldest);
        quantities_.erase(*oldest);
        cellKeys_.erase(oldest);
    }
    for (const std::string& key : cellKeys_) {
        const std::optional<double> value = strongest.count(key) ? readingAt(technology_, key, nodes) : std::nullopt;
        series_.add(key, timeMs, value);
        if (value && !quantities_.count(key))
            if (std::optional<SignalQuantity> quantity = quantityAt(technology_, key, nodes)) quantities_[key] = *quantity;
    }
}

void SignalSampler::sample(int64_t timeMs, const std::string& technology, const PathDictionary& nodes) {
    if (technology != technology_) {
        // The first technology starts the plot; a later one is marked, and the serving
        // cell of the old one is no handover's origin.
        if (!technology_.empty())
            series_.addMark({timeMs, SignalSeries::Mark::Kind::TechnologyChange,
                             TechnologyNames::displayName(technology_) + " → " + TechnologyNames::displayName(technology)});
        technology_ = technology;
        identity_.clear();
        if (!keysChosen_)
            for (const std::string& key : defaultKeys(technology))
                if (std::find(keys_.begin(), keys_.end(), key) == keys_.end()) {
                    keys_.push_back(key);
                    defaults_.insert(key);
                }
    }

    series_.addTick(timeMs);
    lastRow_.assign(keys_.size(), std::nullopt);
    for (size_t i = 0; i < keys_.size(); ++i) {
        lastRow_[i] = readingAt(technology, keys_[i], nodes);
        series_.add(keys_[i], timeMs, lastRow_[i]);
        // A catalogued key is known before its first value (a CSV header names its unit).
        if (!quantities_.count(keys_[i]))
            if (std::optional<SignalQuantity> quantity = quantityAt(technology, keys_[i], nodes)) quantities_[keys_[i]] = *quantity;
    }
    sampleCells(timeMs, nodes);

    // The serving cell's identity: every identity leaf must be in the tree; one that
    // shows nothing yet ("-", "") is part of it as text (GSM/UMTS shows one RAT's cell
    // at a time), but an identity that shows nothing at all is none.
    const std::vector<std::string> identityPaths = identityKeys(technology);
    std::vector<std::string> identity;
    bool shown = false;
    for (const std::string& path : identityPaths) {
        const std::string* text = DisplayPath::leafText(path, nodes);
        if (!text) return;
        shown = shown || (!text->empty() && *text != "-");
        identity.push_back(*text);
    }
    if (!shown) return;
    if (!identity_.empty() && identity != identity_) {
        std::string text;
        for (size_t i = 0; i < identity.size(); ++i) {
            if (identity[i] == identity_[i]) continue;
            if (!text.empty()) text += ", ";
            text += lastComponent(identityPaths[i]) + " " + identity_[i] + " → " + identity[i];
        }
        series_.addMark({timeMs, SignalSeries::Mark::Kind::Handover, std::move(text)});
    }
    identity_ = std::move(identity);
}

}  // namespace vantorel

// SignalSampler: reads the plotted leaves of the display tree once per display tick and notes technology changes and handovers.
#include "Model/SignalSampler.h"

#include "Model/SignalValue.h"
#include "Platform/TechnologyNames.h"
#include "Platform/TelephonyIdentifiers.h"

#include <algorithm>

namespace vantorel {

namespace {

// Neighbour lists are arrays shown as "0", "1", ... children in the decoder's order;
// the LTE decoder lists measured neighbours strongest first, so the first entries are
// the strongest ones.
constexpr int kNeighbourEntries = 3;

std::vector<std::string> neighbourKeys(const std::string& list, const std::string& leaf) {
    std::vector<std::string> keys;
    for (int i = 0; i < kNeighbourEntries; ++i) keys.push_back(list + "/" + std::to_string(i) + "/" + leaf);
    return keys;
}

std::vector<std::string> concat(std::vector<std::string> a, const std::vector<std::string>& b) {
    a.insert(a.end(), b.begin(), b.end());
    return a;
}

const std::string* leafText(const PathDictionary& nodes, const std::string& path) {
    auto it = nodes.find(path);
    return it == nodes.end() || !it->second ? nullptr : it->second->value();
}

std::string lastComponent(const std::string& path) {
    const size_t slash = path.rfind('/');
    return slash == std::string::npos ? path : path.substr(slash + 1);
}

}  // namespace

// Neighbour and cell-set lists take their first kNeighbourEntries entries (LTE's
// connected-mode neighbours, UTRAN's neighbour list, whose first entry is the serving
// cell), and of UTRAN's first CCTRCH its first time slot's SIR. GSM/UMTS shows no BLER ratio: its first transport channel's CRC error count
// stands for it. The IFX decoder shows the modem's own display; these are the keys
// of the IFX modem's serving cell and neighbour list.
std::vector<std::string> SignalSampler::defaultKeys(const std::string& technology) {
    if (technology == kTSLogChannelTechnology_Morvek_LTE)
        return concat({"/Serving Cell/Serving Cell Measurements/Measured RSRP",
                       "/Serving Cell/Serving Cell Measurements/Measured RSRQ",
                       "/Serving Cell/Serving Cell Measurements/Measured RSSI",
                       "/Serving Cell/Connected mode LTE Intra-frequency Measurement/Serving Filtered RSRP"},
                      neighbourKeys("/Neighbours/Measured Neighbor Cells", "Filtered RSRP"));
    if (technology == kTSLogChannelTechnology_Morvek_UTRAN2)
        return concat(neighbourKeys("/Neighbours/Neighbor Cell List", "Filter RSCP"),
                      {"/Link Quality/CCTRCH SIR/0/SIR/0", "/Link Quality/TRCH BLER/0/TRCH BLER Measurement"});
    if (technology == kTSLogChannelTechnology_Morvek_GSM)
        return {"/Cell Sets/Active Set/0/RSCP", "/Cell Sets/Active Set/0/Energy Per Chip",
                "/Radio Resources/GSM RR Info/Serving Rx Level", "/Serving Cell/GSM Serving Cell/RSSI",
                "/Link Quality/BLER/Transport Channels/0/CRC Received in Error"};
    if (technology == kTSLogChannelTechnology_Morvek_CDMA)
        return {"/1x/Rx AGC 0", "/1x/Frame Error Rate", "/EV-DO/Rx AGC 0", "/Data Rates/Forward Link",
                "/Data Rates/Reverse Link"};
    if (technology == kTSLogChannelTechnology_IFX)
        return concat({"/Serving Cell/Measurement/RxLev", "/Serving Cell/Measurement/RxQual"},
                      neighbourKeys("/Neighbours", "RxLev"));
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
            for (const std::string& key : defaultKeys(technology)) addKey(key);
    }

    lastRow_.assign(keys_.size(), std::nullopt);
    for (size_t i = 0; i < keys_.size(); ++i) {
        if (const std::string* text = leafText(nodes, keys_[i])) lastRow_[i] = SignalValue::parse(*text);
        series_.add(keys_[i], timeMs, lastRow_[i]);
    }

    // The serving cell's identity: every identity leaf must be in the tree; one that
    // shows nothing yet ("-", "") is part of it as text (GSM/UMTS shows one RAT's cell
    // at a time), but an identity that shows nothing at all is none.
    const std::vector<std::string> identityPaths = identityKeys(technology);
    std::vector<std::string> identity;
    bool shown = false;
    for (const std::string& path : identityPaths) {
        const std::string* text = leafText(nodes, path);
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

// SignalSampler: takes the plotted values from the display tree at every display tick and marks technology changes and handovers.
#pragma once

#include "Model/SignalSeries.h"
#include "Model/VantorelModelNode.h"

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace vantorel {

// The keys are display-tree paths. Each tick reads the leaf at each key (SignalValue::parse of
// its display string; a missing leaf or a text without a number is a gap), and compares the
// technology and the serving cell's identity with the previous tick: a change of technology
// adds a TechnologyChange mark, a changed identity (the identity leaves of
// identityKeys(technology), all read as text, none missing) a Handover mark. A leaf that
// shows nothing yet ("-") is text like any other; an identity showing nothing is none.
class SignalSampler {
public:
    // The values that matter per technology (identifier as "GetTechnology" answers):
    // LTE serving RSRP, RSRQ, RSSI and the strongest neighbours' RSRP; UTRAN serving and
    // neighbour RSCP and SIR; GSM/UMTS RSCP, Ec/No, RxLev and BLER; CDMA Rx AGC, FER and
    // data rates. Paths exist in that decoder's template.
    static std::vector<std::string> defaultKeys(const std::string& technology);
    // The leaves naming the serving cell (PCI + EARFCN, PSC + UARFCN, ARFCN + BSIC, Cell ID ...).
    static std::vector<std::string> identityKeys(const std::string& technology);

    // Starts with defaultKeys of the first technology seen, unless keys were set.
    SignalSampler() = default;

    void setKeys(std::vector<std::string> keys);  // replaces the plotted keys (CSV --csv-keys)
    void addKey(const std::string& key);          // "Plot this value"; no-op when present
    const std::vector<std::string>& keys() const { return keys_; }

    // One display tick: `nodes` is the tree's path index (VantorelModel::nodeAtPath's).
    void sample(int64_t timeMs, const std::string& technology, const PathDictionary& nodes);

    const SignalSeries& series() const { return series_; }
    // The values of the last tick, one per key (for CSV rows and sparklines).
    const std::vector<std::optional<double>>& lastRow() const { return lastRow_; }

private:
    std::vector<std::string> keys_;
    bool keysChosen_ = false;  // setKeys/addKey: the defaults no longer apply
    SignalSeries series_;
    std::vector<std::optional<double>> lastRow_;
    std::string technology_;
    std::vector<std::string> identity_;  // empty until a tick showed all identity leaves
};

}  // namespace vantorel

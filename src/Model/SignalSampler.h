// SignalSampler: takes the plotted values from the display tree at every display tick and marks technology changes and handovers.
#pragma once

#include "Model/SignalCatalogue.h"
#include "Model/SignalSeries.h"
#include "Model/VantorelModelNode.h"

#include <cstdint>
#include <map>
#include <set>
#include <optional>
#include <string>
#include <vector>

namespace vantorel {

// The keys are display-tree paths, list selectors included (DisplayPath): the CSV columns and
// sparklines. Each tick reads the leaf at each key (SignalValue::parse of its display string;
// a missing leaf or a text without a number is a gap); a key ending in a derived leaf
// ("BLER %") is computed from its siblings. What the number is comes from SignalCatalogue,
// which also converts it (TD-SCDMA RSCP to dBm); a key the catalogue does not hold keeps
// the number as shown, in the unit word its first value showed. Besides the keys, the strongest cells of the
// technology's neighbour lists get a line each, keyed by the cell's identity
// ("/Neighbours/Measured Neighbor Cells/[Physical Cell ID=251]/Filtered RSRP"), so a plot
// shows a neighbour appear, rise and take over; a cell out of the strongest is a gap in its
// line. At most kMaxCellLines such lines are kept, the cells seen longest ago dropped first.
// Each tick also compares the technology and the serving cell's identity with the previous
// tick: a change of technology adds a TechnologyChange mark, a changed identity (the
// identity leaves of identityKeys(technology), all read as text, none missing) a Handover
// mark. A leaf that shows nothing yet ("-") is text like any other; an identity showing
// nothing is none.
class SignalSampler {
public:
    static constexpr int kStrongestCells = 3;
    static constexpr size_t kMaxCellLines = 32;

    // The values that matter per technology (identifier as "GetTechnology" answers):
    // LTE serving RSRP, RSRQ, RSSI and the strongest neighbours' PCI and RSRP; UTRAN serving
    // RSCP, the strongest other cells' identity and RSCP, SIR and BLER; GSM/UMTS RSCP, Ec/Io,
    // RxLev, RSSI and BLER; CDMA Rx AGC, FER and data rates; IFX RxLev, RxQual and the
    // strongest neighbours. Paths exist in that decoder's template.
    static std::vector<std::string> defaultKeys(const std::string& technology);
    // The same without the serving cell's identity (identityKeys) in front.
    static std::vector<std::string> valueKeys(const std::string& technology);
    // The leaves naming the serving cell (PCI + EARFCN, PSC + UARFCN, ARFCN + BSIC, Cell ID ...).
    static std::vector<std::string> identityKeys(const std::string& technology);

    // Starts with defaultKeys of the first technology seen, unless keys were set.
    SignalSampler() = default;

    void setKeys(std::vector<std::string> keys);  // replaces the plotted keys (CSV --csv-keys)
    void addKey(const std::string& key);          // "Plot this value"; no-op when present
    const std::vector<std::string>& keys() const { return keys_; }
    // What a plot draws: the keys but those ranking a list (the cell lines show those cells)
    // and the default serving-cell identity (the handover marks show it), then the cell lines,
    // in the order they first appeared.
    std::vector<std::string> plotKeys() const;

    // One display tick: `nodes` is the tree's path index (VantorelModel::nodeAtPath's).
    void sample(int64_t timeMs, const std::string& technology, const PathDictionary& nodes);
    // The number a key shows in the tree now (derived leaves computed), or none.
    static std::optional<double> valueAt(const std::string& key, const PathDictionary& nodes);
    // The value of a key on a technology's display: valueAt converted as the catalogue says.
    static std::optional<double> readingAt(const std::string& technology, const std::string& key,
                                           const PathDictionary& nodes);
    // What a key's value is: the catalogue's entry, or for a key it does not hold the unit
    // word of the display string ("dBm", "%", "" for a bare number); none while such a key
    // shows no number, so that a plot can wait to put it on an axis.
    static std::optional<SignalQuantity> quantityAt(const std::string& technology, const std::string& key,
                                                    const PathDictionary& nodes);

    const SignalSeries& series() const { return series_; }
    // What a key's values are, known from the first tick that told (quantityAt).
    std::optional<SignalQuantity> quantity(const std::string& key) const;
    // The CSV header of a key's column: with its unit when the catalogue knows it.
    std::string columnTitle(const std::string& key) const;
    // The values of the last tick, one per key (for CSV rows and sparklines).
    const std::vector<std::optional<double>>& lastRow() const { return lastRow_; }

private:
    void sampleCells(int64_t timeMs, const PathDictionary& nodes);

    std::vector<std::string> keys_;
    bool keysChosen_ = false;  // setKeys/addKey: the defaults no longer apply
    SignalSeries series_;
    std::vector<std::optional<double>> lastRow_;
    std::string technology_;
    std::vector<std::string> identity_;  // empty until a tick showed all identity leaves
    std::vector<std::string> cellKeys_;  // the cell lines, first seen first
    std::map<std::string, int64_t> cellSeen_;  // cell line -> the last tick it was among the strongest
    std::map<std::string, SignalQuantity> quantities_;  // key -> what its values are
    std::set<std::string> defaults_;            // keys that came with a technology, not chosen
};

}  // namespace vantorel

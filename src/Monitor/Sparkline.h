// Sparkline: one display value over the last display ticks as a line of block characters, for the terminal view.
#pragma once

#include "Model/SignalCatalogue.h"
#include "Model/VantorelModelNode.h"

#include <deque>
#include <optional>
#include <string>

namespace vantorel {

// Each tick reads the value at `key` (a display-tree path, list selectors included, as
// --csv-keys takes it) as the signal sampler does: converted and named by SignalCatalogue.
// The line is the key's name (the catalogue's short name, and the cell a selector picks:
// "RSRP (PCI 251)", "RSRP (2nd strongest: PCI 78)"), one bar per tick (▁ to █, scaled
// between the lowest and highest value shown; a space for a tick without a value) and the
// latest value in the catalogue's unit; a key the catalogue does not hold shows its latest
// display string as the decoder wrote it.
class Sparkline {
public:
    static constexpr size_t kTicks = 40;

    explicit Sparkline(std::string key);

    const std::string& key() const { return key_; }
    // One display tick of the decoder for `technology` (empty: the catalogue rows of any).
    void sample(const PathDictionary& nodes, const std::string& technology = {});
    // The line, cut to `width` columns.
    std::string line(int width) const;
    // The name the line starts with.
    const std::string& label() const { return label_; }

    // The bars of `values`, oldest first.
    static std::string bars(const std::deque<std::optional<double>>& values);

private:
    std::string key_;
    std::string label_;
    std::deque<std::optional<double>> values_;
    std::optional<SignalQuantity> quantity_;
    std::optional<std::string> latest_;  // empty while the leaf is not in the tree
};

}  // namespace vantorel

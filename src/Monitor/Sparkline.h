// Sparkline: one display value over the last display ticks as a line of block characters, for the terminal view.
#pragma once

#include "Model/VantorelModelNode.h"

#include <deque>
#include <optional>
#include <string>

namespace vantorel {

// Each tick reads the leaf at `key` (a display-tree path) as SignalValue does. The line
// is the key's short name, one bar per tick (▁ to █, scaled between the lowest and
// highest value shown; a space for a tick without a value) and the latest display
// string as the decoder wrote it.
class Sparkline {
public:
    static constexpr size_t kTicks = 40;

    explicit Sparkline(std::string key);

    const std::string& key() const { return key_; }
    void sample(const PathDictionary& nodes);
    // The line, cut to `width` columns.
    std::string line(int width) const;

    // The bars of `values`, oldest first.
    static std::string bars(const std::deque<std::optional<double>>& values);

private:
    std::string key_;
    std::string label_;
    std::deque<std::optional<double>> values_;
    std::optional<std::string> latest_;  // empty while the leaf is not in the tree
};

}  // namespace vantorel

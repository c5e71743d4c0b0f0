// SignalValue: the number a display string shows ("-95.50 dBm" -> -95.5), for plots and exports.
#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace vantorel {

// The display strings every decoder writes are the only input: the number before the unit
// is taken, so any numeric leaf of any pane can be plotted without decoder code.
class SignalValue {
public:
    // The leading number of a display string: optional spaces, an optional sign, digits with
    // an optional '.' fraction (never a locale's comma), then anything (a unit, " (old)");
    // a hexadecimal "0x.." is not a measurement. Empty for texts without one ("Not Present",
    // "Unknown", "N/A", "", "nan dBm").
    static std::optional<double> parse(std::string_view display);
    // The word after a display string's number ("-95.50 dBm" -> "dBm", "40 %" -> "%"), ""
    // without one or without a number ("12 (old)" -> "").
    static std::string unit(std::string_view display);
};

}  // namespace vantorel

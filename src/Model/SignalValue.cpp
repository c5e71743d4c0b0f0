// SignalValue: reads the leading number of a display string without the process locale.
#include "Model/SignalValue.h"

#include <charconv>
#include <cmath>

namespace vantorel {

std::optional<double> SignalValue::parse(std::string_view display) {
    size_t i = 0;
    while (i < display.size() && (display[i] == ' ' || display[i] == '\t')) ++i;
    bool negative = false;
    if (i < display.size() && (display[i] == '-' || display[i] == '+')) {
        negative = display[i] == '-';
        ++i;
    }
    const size_t start = i;
    auto isDigit = [&](size_t k) { return k < display.size() && display[k] >= '0' && display[k] <= '9'; };
    size_t digits = 0;
    while (isDigit(i)) ++i, ++digits;
    // "0x1A" is an identifier or a raw field, never a measurement.
    if (digits == 1 && display[start] == '0' && i < display.size() && (display[i] == 'x' || display[i] == 'X'))
        return std::nullopt;
    if (i < display.size() && display[i] == '.' && isDigit(i + 1)) {
        ++i;
        while (isDigit(i)) ++i, ++digits;
    }
    if (digits == 0) return std::nullopt;  // "-", "Unknown", "nan dBm", ".dBm"
    // from_chars reads the "C" format whatever the locale; without an exponent form,
    // the only failure left is a value out of a double's range.
    double value = 0;
    const auto [end, error] = std::from_chars(display.data() + start, display.data() + i, value,
                                              std::chars_format::fixed);
    if (error != std::errc() || !std::isfinite(value)) return std::nullopt;
    return negative ? -value : value;
}

std::string SignalValue::unit(std::string_view display) {
    if (!parse(display)) return {};
    size_t i = display.find_first_not_of(" \t");
    if (display[i] == '-' || display[i] == '+') ++i;
    i = display.find_first_not_of("0123456789.", i);
    const size_t from = i == std::string_view::npos ? i : display.find_first_not_of(" \t", i);
    if (from == std::string_view::npos || display[from] == '(') return {};
    return std::string(display.substr(from, display.find(' ', from) - from));
}

}  // namespace vantorel

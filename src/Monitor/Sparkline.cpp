// Sparkline: the last ticks' values of one display leaf drawn with the eight block characters.
#include "Monitor/Sparkline.h"

#include "Model/SignalValue.h"
#include "Monitor/TerminalNavigator.h"
#include "Platform/TerminalText.h"

#include <algorithm>
#include <cmath>

namespace vantorel {

namespace {

const char* const kBars[] = {"▁", "▂", "▃", "▄", "▅", "▆", "▇", "█"};

// "Measured RSRP"; below a list, the entry's index too ("0/Filtered RSRP").
std::string shortName(const std::string& key) {
    const size_t last = key.rfind('/');
    if (last == std::string::npos || last == 0) return key.substr(last == 0 ? 1 : 0);
    const size_t before = key.rfind('/', last - 1);
    const std::string parent = key.substr(before == std::string::npos ? 0 : before + 1, last - before - 1);
    const bool index = !parent.empty() && std::all_of(parent.begin(), parent.end(), [](char c) { return c >= '0' && c <= '9'; });
    return key.substr(index ? before + 1 : last + 1);
}

}  // namespace

Sparkline::Sparkline(std::string key) : key_(std::move(key)), label_(shortName(key_)) {}

void Sparkline::sample(const PathDictionary& nodes) {
    auto it = nodes.find(key_);
    const std::string* text = it == nodes.end() || !it->second ? nullptr : it->second->value();
    latest_ = text ? std::optional(*text) : std::nullopt;
    values_.push_back(text ? SignalValue::parse(*text) : std::nullopt);
    if (values_.size() > kTicks) values_.pop_front();
}

std::string Sparkline::bars(const std::deque<std::optional<double>>& values) {
    double low = INFINITY, high = -INFINITY;
    for (const auto& v : values)
        if (v) low = std::min(low, *v), high = std::max(high, *v);
    std::string out;
    for (const auto& v : values) {
        if (!v) {
            out += ' ';
            continue;
        }
        // A flat line sits in the middle; otherwise the range fills all eight heights
        // (halved first, so that a range wider than a double's still scales).
        double share = 3.0 / 7;
        if (high > low) share = (*v / 2 - low / 2) / (high / 2 - low / 2);
        if (!std::isfinite(share)) share = 3.0 / 7;
        out += kBars[std::clamp(static_cast<int>(std::lround(std::clamp(share, 0.0, 1.0) * 7)), 0, 7)];
    }
    return out;
}

std::string Sparkline::line(int width) const {
    const std::string latest = latest_ ? TerminalText::visible(*latest_) : "(not in the display)";
    return TerminalNavigator::cut(TerminalText::visible(label_) + " " + bars(values_) + " " + latest, width);
}

}  // namespace vantorel

// Sparkline: the last ticks' values of one display leaf drawn with the eight block characters.
#include "Monitor/Sparkline.h"

#include "Model/DisplayPath.h"
#include "Model/SignalSampler.h"
#include "Monitor/TerminalNavigator.h"
#include "Platform/TerminalText.h"

#include <algorithm>
#include <cmath>

namespace vantorel {

namespace {

const char* const kBars[] = {"▁", "▂", "▃", "▄", "▅", "▆", "▇", "█"};

// "Measured RSRP"; below a list, the entry's index too ("0/Filtered RSRP"), or what its
// selector says ("Filtered RSRP (PCI 251)", "Filtered RSRP (2nd strongest)").
std::string shortName(const std::string& key) {
    if (key.find("/[") != std::string::npos) return DisplayPath::label(key);
    const size_t last = key.rfind('/');
    if (last == std::string::npos || last == 0) return key.substr(last == 0 ? 1 : 0);
    const size_t before = key.rfind('/', last - 1);
    const std::string parent = key.substr(before == std::string::npos ? 0 : before + 1, last - before - 1);
    const bool index = !parent.empty() && std::all_of(parent.begin(), parent.end(), [](char c) { return c >= '0' && c <= '9'; });
    return key.substr(index ? before + 1 : last + 1);
}

}  // namespace

Sparkline::Sparkline(std::string key) : key_(std::move(key)), label_(shortName(key_)) {}

void Sparkline::sample(const PathDictionary& nodes, const std::string& technology) {
    const std::string* text = DisplayPath::leafText(key_, nodes);
    latest_ = text ? std::optional(*text) : std::nullopt;
    values_.push_back(SignalSampler::readingAt(technology, key_, nodes));
    if (values_.size() > kTicks) values_.pop_front();
    if (!quantity_ || !quantity_->catalogued()) quantity_ = SignalSampler::quantityAt(technology, key_, nodes);

    // The leaf's name as the catalogue has it; a ranked entry also names the cell it is now.
    std::string label = shortName(key_);
    const std::string leaf = key_.substr(key_.rfind('/') + 1);
    if (quantity_ && quantity_->catalogued()) {
        const size_t at = key_.find("/[") != std::string::npos ? 0 : label.size() - std::min(label.size(), leaf.size());
        if (label.compare(at, leaf.size(), leaf) == 0) label.replace(at, leaf.size(), quantity_->name);
    }
    // An entry by rank or by position also names the cell it is now ("RSRP (2nd strongest:
    // PCI 78)", "0/RSRP (PCI 236)"); one by its cell says so already.
    std::string cell;
    if (DisplayPath::isRanked(key_))
        cell = DisplayPath::cellOf(key_, nodes);
    else if (key_.find("/[") == std::string::npos)
        if (const std::string followed = DisplayPath::following(key_, nodes); followed != key_)
            cell = DisplayPath::cellOf(followed, nodes);
    if (!cell.empty())
        label = label.back() == ')' ? label.substr(0, label.size() - 1) + ": " + cell + ")" : label + " (" + cell + ")";
    label_ = label;
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
    std::string latest = latest_ ? TerminalText::visible(*latest_) : "(not in the display)";
    // The catalogue's unit, not the display string's ("36 (level)" for a GSM "36 dBm").
    if (quantity_ && quantity_->catalogued() && !values_.empty() && values_.back()) latest = quantity_->reading(*values_.back());
    return TerminalNavigator::cut(TerminalText::visible(label_) + " " + bars(values_) + " " + latest, width);
}

}  // namespace vantorel

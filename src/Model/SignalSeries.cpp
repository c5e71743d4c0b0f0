// SignalSeries: per-key points and marks, thinned from the oldest end so that a whole session fits a fixed budget.
#include "Model/SignalSeries.h"

namespace vantorel {

// Keeps the first item and every second one of the older half, then the newer half
// whole: a full deque shrinks to 3/4, so thinning runs once per kMax/4 additions
// (amortised O(1)), and the first point of the session survives every pass.
template <typename T>
void SignalSeries::thinOlderHalf(std::deque<T>& items) {
    const size_t half = items.size() / 2;
    std::deque<T> kept;
    for (size_t i = 0; i < half; i += 2) kept.push_back(std::move(items[i]));
    for (size_t i = half; i < items.size(); ++i) kept.push_back(std::move(items[i]));
    items.swap(kept);
}

void SignalSeries::add(const std::string& key, int64_t timeMs, std::optional<double> value) {
    auto [it, inserted] = tracks_.try_emplace(key);
    if (inserted) order_.push_back(key);
    Track& track = it->second;
    track.lastHadValue = value.has_value();
    if (!value) return;
    track.points.push_back({timeMs, *value});
    ++pointCount_;
    if (track.points.size() >= kMaxPoints) {
        const size_t before = track.points.size();
        thinOlderHalf(track.points);
        pointCount_ -= before - track.points.size();
    }
}

void SignalSeries::addMark(Mark mark) {
    marks_.push_back(std::move(mark));
    if (marks_.size() >= kMaxMarks) thinOlderHalf(marks_);
}

void SignalSeries::clear() {
    order_.clear();
    tracks_.clear();
    marks_.clear();
    pointCount_ = 0;
}

std::vector<std::string> SignalSeries::keys() const { return order_; }

const std::deque<SignalSeries::Point>& SignalSeries::points(const std::string& key) const {
    static const std::deque<Point> none;
    auto it = tracks_.find(key);
    return it == tracks_.end() ? none : it->second.points;
}

std::optional<double> SignalSeries::latest(const std::string& key) const {
    auto it = tracks_.find(key);
    if (it == tracks_.end() || !it->second.lastHadValue || it->second.points.empty()) return std::nullopt;
    return it->second.points.back().value;
}

size_t SignalSeries::pointCount() const { return pointCount_; }

}  // namespace vantorel

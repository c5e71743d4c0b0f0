// SignalSeries: per-key points and marks, thinned from the oldest end so that a whole session fits a fixed budget.
#include "Model/SignalSeries.h"

#include <algorithm>

namespace vantorel {

namespace {

bool alwaysKept(const SignalSeries::Point& point) { return SignalSeries::isGap(point); }
template <typename T>
bool alwaysKept(const T&) { return false; }

}  // namespace

// Keeps the first item and every second one of the older half (and every gap point, so a
// line stays broken where it was), then the newer half whole: a full deque shrinks to
// about 3/4, so thinning runs once per kMax/4 additions (amortised O(1)), and the first
// point of the session survives every pass. A key whose gaps are so many that this leaves
// it nearly full (a value every other tick) is thinned again without sparing them.
template <typename T>
void SignalSeries::thinOlderHalf(std::deque<T>& items) {
    for (const bool spareGaps : {true, false}) {
        const size_t full = items.size(), half = full / 2;
        std::deque<T> kept;
        for (size_t i = 0; i < half; ++i)
            if (i % 2 == 0 || (spareGaps && alwaysKept(items[i]))) kept.push_back(std::move(items[i]));
        for (size_t i = half; i < full; ++i) kept.push_back(std::move(items[i]));
        items.swap(kept);
        if (items.size() <= full - full / 8) return;
    }
}

void SignalSeries::add(const std::string& key, int64_t timeMs, std::optional<double> value) {
    auto [it, inserted] = tracks_.try_emplace(key);
    if (inserted) order_.push_back(key);
    Track& track = it->second;
    const bool gapStarts = !value && track.lastHadValue;
    track.lastHadValue = value.has_value();
    if (!value && !gapStarts) return;
    track.points.push_back({timeMs, value.value_or(std::nan(""))});
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

void SignalSeries::addTick(int64_t timeMs) {
    ticks_.push_back(timeMs);
    if (ticks_.size() >= kMaxPoints) thinOlderHalf(ticks_);
}

void SignalSeries::remove(const std::string& key) {
    const auto it = tracks_.find(key);
    if (it == tracks_.end()) return;
    pointCount_ -= it->second.points.size();
    tracks_.erase(it);
    order_.erase(std::find(order_.begin(), order_.end(), key));
}

void SignalSeries::clear() {
    order_.clear();
    tracks_.clear();
    marks_.clear();
    ticks_.clear();
    pointCount_ = 0;
}

bool SignalSeries::isGap(const Point& point) { return std::isnan(point.value); }

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

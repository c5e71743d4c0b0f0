// SignalSeries: the time series of plotted display values, one per key, kept for the whole session in bounded memory.
#pragma once

#include <cstddef>
#include <cmath>
#include <cstdint>
#include <deque>
#include <map>
#include <optional>
#include <string>
#include <vector>

namespace vantorel {

// A key is a display-tree path ("/Serving Cell/RSRP"), as VantorelModel::nodeAtPath takes it.
// Times are milliseconds since 1970 (the wall clock live, the recorded time for replays).
// A tick without a value is a gap: the first such tick after a value adds a gap point (a
// NaN value) at its time, so a plot breaks its line there and a CSV shows an empty cell.
// Memory: each key keeps at most kMaxPoints points. When a key reaches that, its older half
// is thinned (every second point of it dropped, gap points kept), so recent values stay at
// full resolution and the whole session stays visible, coarser the older it is. Marks and
// tick times are bounded alike.
class SignalSeries {
public:
    static constexpr size_t kMaxPoints = 8192;
    static constexpr size_t kMaxMarks = 1024;

    struct Point {
        int64_t timeMs = 0;
        double value = 0;
    };
    struct Mark {
        enum class Kind { TechnologyChange, Handover };
        int64_t timeMs = 0;
        Kind kind = Kind::Handover;
        std::string text;  // "LTE → UMTS", "PCI 301 → 17"
    };

    // A value at a tick; a missing value (nullopt) leaves a gap.
    void add(const std::string& key, int64_t timeMs, std::optional<double> value);
    void addMark(Mark mark);
    // The time of a display tick, whether or not any key had a value then.
    void addTick(int64_t timeMs);
    // Forgets a key and its points.
    void remove(const std::string& key);
    void clear();

    static bool isGap(const Point& point);

    std::vector<std::string> keys() const;  // in the order they were first added
    const std::deque<Point>& points(const std::string& key) const;  // empty for an unknown key
    const std::deque<Mark>& marks() const { return marks_; }
    const std::deque<int64_t>& ticks() const { return ticks_; }
    // The latest value of a key, if its last tick had one.
    std::optional<double> latest(const std::string& key) const;
    size_t pointCount() const;  // over all keys

private:
    struct Track {
        std::deque<Point> points;
        bool lastHadValue = false;
    };
    template <typename T>
    static void thinOlderHalf(std::deque<T>& items);

    std::vector<std::string> order_;
    std::map<std::string, Track> tracks_;
    std::deque<Mark> marks_;
    std::deque<int64_t> ticks_;
    size_t pointCount_ = 0;
};

}  // namespace vantorel

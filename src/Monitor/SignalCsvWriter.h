// SignalCsvWriter: the plotted values of every display tick as CSV (RFC 4180), with optional position columns, to a file or as text.
#pragma once

#include "Model/SignalSeries.h"

#include <cstdint>
#include <cstdio>
#include <optional>
#include <string>
#include <vector>

namespace vantorel {

// Columns: "time" (ISO 8601 UTC with milliseconds, "2015-08-01T02:11:40.985Z"), one per
// key named by its display-tree path (or the title given for it: the path with its unit,
// SignalSampler::columnTitle), then "latitude", "longitude", "speed" (degrees,
// degrees, metres per second) when asked for. Numbers are written in the "C" format
// whatever the locale; a gap is an empty cell. Lines end in CRLF; a field holding a
// comma, a quote or a line break is quoted, its quotes doubled.
class SignalCsvWriter {
public:
    struct Position {
        double latitude = 0;
        double longitude = 0;
        std::optional<double> speed;  // m/s
    };

    // `titles`: the header's names of the keys' columns, in their order; the keys themselves when missing.
    SignalCsvWriter(std::vector<std::string> keys, bool positionColumns, std::vector<std::string> titles = {});
    ~SignalCsvWriter();
    SignalCsvWriter(const SignalCsvWriter&) = delete;
    SignalCsvWriter& operator=(const SignalCsvWriter&) = delete;

    const std::vector<std::string>& keys() const { return keys_; }
    std::string header() const;
    // One row; `values` in the order of keys() (missing trailing values are gaps); a
    // row without a time (a stream whose messages carry none) has an empty time cell.
    std::string row(std::optional<int64_t> timeMs, const std::vector<std::optional<double>>& values,
                    const std::optional<Position>& position = std::nullopt) const;
    // The whole series as CSV: one row per time any key has a point, in time order.
    std::string fromSeries(const SignalSeries& series) const;

    // Writing to a file: open() creates it and writes the header; each writeRow is
    // flushed at once, so an interrupted session keeps every row written so far.
    bool open(const std::string& path, std::string* error);
    bool writeRow(std::optional<int64_t> timeMs, const std::vector<std::optional<double>>& values,
                  const std::optional<Position>& position = std::nullopt);
    bool close(std::string* error);
    uint64_t rowsWritten() const { return rows_; }

    static std::string isoTime(int64_t timeMs);
    static std::string number(double value);
    static std::string field(const std::string& text);

private:
    std::vector<std::string> keys_;
    std::vector<std::string> titles_;
    bool positionColumns_;
    std::FILE* file_ = nullptr;
    uint64_t rows_ = 0;
};

}  // namespace vantorel

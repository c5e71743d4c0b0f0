// SignalCsvWriter: formats ticks as CSV rows with std::to_chars (locale-free) and writes them line by line.
#include "Monitor/SignalCsvWriter.h"

#include <QDateTime>

#include <charconv>
#include <cerrno>
#include <cstring>
#include <map>

namespace vantorel {

SignalCsvWriter::SignalCsvWriter(std::vector<std::string> keys, bool positionColumns, std::vector<std::string> titles)
    : keys_(std::move(keys)), titles_(std::move(titles)), positionColumns_(positionColumns) {}

SignalCsvWriter::~SignalCsvWriter() {
    if (file_) std::fclose(file_);
}

std::string SignalCsvWriter::isoTime(int64_t timeMs) {
    return QDateTime::fromMSecsSinceEpoch(timeMs, Qt::UTC).toString("yyyy-MM-ddThh:mm:ss.zzzZ").toStdString();
}

std::string SignalCsvWriter::number(double value) {
    char buffer[32];
    const auto [end, error] = std::to_chars(buffer, buffer + sizeof buffer, value);
    return error == std::errc() ? std::string(buffer, end) : std::string();
}

std::string SignalCsvWriter::field(const std::string& text) {
    if (text.find_first_of(",\"\r\n") == std::string::npos) return text;
    std::string quoted = "\"";
    for (char c : text) quoted += c == '"' ? std::string("\"\"") : std::string(1, c);
    return quoted + "\"";
}

std::string SignalCsvWriter::header() const {
    std::string line = "time";
    for (size_t i = 0; i < keys_.size(); ++i) line += "," + field(i < titles_.size() ? titles_[i] : keys_[i]);
    if (positionColumns_) line += ",latitude,longitude,speed";
    return line + "\r\n";
}

std::string SignalCsvWriter::row(std::optional<int64_t> timeMs, const std::vector<std::optional<double>>& values,
                                 const std::optional<Position>& position) const {
    std::string line = timeMs ? isoTime(*timeMs) : std::string();
    for (size_t i = 0; i < keys_.size(); ++i) {
        line += ",";
        if (i < values.size() && values[i]) line += number(*values[i]);
    }
    if (positionColumns_) {
        if (position)
            line += "," + number(position->latitude) + "," + number(position->longitude) + "," +
                    (position->speed ? number(*position->speed) : std::string());
        else
            line += ",,,";
    }
    return line + "\r\n";
}

std::string SignalCsvWriter::fromSeries(const SignalSeries& series) const {
    // A row per display tick the series kept, as the command line writes one per tick (the
    // older ones thinned as the series thins them); a gap, or a key without a point at that
    // tick, is an empty cell.
    std::map<int64_t, std::vector<std::optional<double>>> rows;
    for (int64_t time : series.ticks()) rows[time].resize(keys_.size());
    for (size_t k = 0; k < keys_.size(); ++k)
        for (const SignalSeries::Point& p : series.points(keys_[k])) {
            auto& values = rows[p.timeMs];
            values.resize(keys_.size());
            if (!SignalSeries::isGap(p)) values[k] = p.value;
        }
    std::string text = header();
    for (const auto& [time, values] : rows) text += row(time, values);
    return text;
}

bool SignalCsvWriter::open(const std::string& path, std::string* error) {
    if (file_) std::fclose(file_);
    rows_ = 0;
    file_ = std::fopen(path.c_str(), "wb");
    if (!file_) {
        if (error) *error = path + ": " + std::strerror(errno);
        return false;
    }
    const std::string line = header();
    if (std::fwrite(line.data(), 1, line.size(), file_) != line.size() || std::fflush(file_) != 0) {
        if (error) *error = path + ": " + std::strerror(errno);
        return false;
    }
    return true;
}

bool SignalCsvWriter::writeRow(std::optional<int64_t> timeMs, const std::vector<std::optional<double>>& values,
                               const std::optional<Position>& position) {
    if (!file_) return false;
    const std::string line = row(timeMs, values, position);
    if (std::fwrite(line.data(), 1, line.size(), file_) != line.size() || std::fflush(file_) != 0) return false;
    ++rows_;
    return true;
}

bool SignalCsvWriter::close(std::string* error) {
    if (!file_) return true;
    const bool ok = std::fclose(file_) == 0;
    file_ = nullptr;
    if (!ok && error) *error = std::strerror(errno);
    return ok;
}

}  // namespace vantorel

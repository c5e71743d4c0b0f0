// SignalExport: samples the display tree at each tick and appends the row to the CSV file, with the gpsd position when asked.
#include "cli/SignalExport.h"

#include "Model/DisplayPath.h"
#include "Model/SignalCatalogue.h"
#include "Monitor/GpsPosition.h"

#include <QCommandLineParser>

#include <cerrno>
#include <cstdio>
#include <cstring>

namespace vantorel {

void SignalExport::addOptions(QCommandLineParser& parser, bool live) {
    parser.addOption({"csv",
                      live ? "Write the signal values to FILE as CSV, one row per display tick (wall-clock time; "
                             "for a replay, per tick of its recorded time at any --speed), each row flushed."
                           : "Write the signal values to FILE as CSV, one row per 2 s of recorded time that "
                             "brought messages, stamped with that recorded time.",
                      "FILE"});
    parser.addOption({"csv-keys",
                      "The CSV's columns: display paths separated by commas (\"/Serving Cell/Serving Cell "
                      "Measurements/Measured RSRP\"; a list entry by its cell, \"/Neighbours/Measured Neighbor "
                      "Cells/[Physical Cell ID=251]/Filtered RSRP\", or by rank, \"[#1 Filtered RSRP]\"); default: the "
                      "serving cell's identity and the signal values of the first technology seen.",
                      "KEYS"});
    if (live)
        parser.addOption({"gps", "Add latitude, longitude and speed (m/s) columns to the CSV from gpsd on "
                                 "localhost:2947; empty while there is no fix or no gpsd."});
}

std::vector<std::string> SignalExport::splitKeys(const QString& list) {
    // Commas inside a list selector ("[UARFCN=10055,Cell ID=11]") belong to the key.
    std::vector<std::string> keys;
    QString key;
    int depth = 0;
    // A column's CSV header names its key with the unit after it: the key is taken.
    auto flush = [&] {
        if (!key.trimmed().isEmpty()) keys.push_back(SignalCatalogue::keyOfColumn(key.trimmed().toStdString()));
        key.clear();
    };
    for (const QChar c : list) {
        if (c == ',' && depth == 0) {
            flush();
            continue;
        }
        depth += c == '[' ? 1 : c == ']' && depth > 0 ? -1 : 0;
        key += c;
    }
    flush();
    return keys;
}

SignalExport::SignalExport() = default;
SignalExport::~SignalExport() = default;

bool SignalExport::configure(const QCommandLineParser& parser, bool live, std::string* error) {
    const bool csv = parser.isSet("csv");
    if (!csv && parser.isSet("csv-keys")) return *error = "--csv-keys needs --csv FILE", false;
    if (live && !csv && parser.isSet("gps")) return *error = "--gps needs --csv FILE", false;
    if (!csv) return true;
    path_ = parser.value("csv").toStdString();
    if (path_.empty()) return *error = "--csv needs a file name", false;
    if (parser.isSet("csv-keys")) {
        chosenKeys_ = splitKeys(parser.value("csv-keys"));
        if (chosenKeys_.empty()) return *error = "--csv-keys names no key", false;
        sampler_.setKeys(chosenKeys_);
    }
    // Created now so that a bad path is said before any decoding; the header follows
    // at the first tick.
    std::FILE* file = std::fopen(path_.c_str(), "wb");
    if (!file) return *error = path_ + ": " + std::strerror(errno), false;
    std::fclose(file);
    gps_ = live && parser.isSet("gps");
    if (gps_) {
        position_ = std::make_unique<GpsPosition>();
        position_->start();
        if (!position_->isConnected())
            std::fprintf(stderr, "vantorel-cli: no gpsd on localhost:2947: the position columns stay empty until it runs\n");
    }
    return true;
}

bool SignalExport::openWriter(const std::string& technology) {
    if (writer_) return !failed_;
    std::vector<std::string> keys = chosenKeys_.empty() ? SignalSampler::defaultKeys(technology) : chosenKeys_;
    if (chosenKeys_.empty()) sampler_.setKeys(keys);  // the columns stay those of the first technology
    std::vector<std::string> titles;
    for (const std::string& key : keys) titles.push_back(SignalCatalogue::columnTitle(key, SignalCatalogue::find(technology, key)));
    writer_ = std::make_unique<SignalCsvWriter>(std::move(keys), gps_, std::move(titles));
    failed_ = !writer_->open(path_, &error_);
    return !failed_;
}

void SignalExport::tick(std::optional<int64_t> timeMs, const std::string& technology, const PathDictionary& nodes) {
    if (!enabled() || !openWriter(technology)) return;
    sampler_.sample(timeMs.value_or(0), technology, nodes);
    for (const std::string& key : chosenKeys_)
        if (!seen_.count(key) && (DisplayPath::resolve(key, nodes) || SignalSampler::valueAt(key, nodes))) seen_.insert(key);
    const auto position = position_ ? position_->position() : std::nullopt;
    if (!writer_->writeRow(timeMs, sampler_.lastRow(), position)) {
        failed_ = true;
        error_ = path_ + ": " + std::strerror(errno);
    }
}

bool SignalExport::finish(const std::string& technology, std::string* error) {
    if (!enabled()) return true;
    openWriter(technology);
    // Only keys the user named: a default key (a third neighbour) may well never show.
    std::string unseen;
    for (const std::string& key : chosenKeys_)
        if (!seen_.count(key)) unseen += "\n  " + key;
    if (!unseen.empty())
        std::fprintf(stderr, "vantorel-cli: no display tick held these --csv-keys (their columns are empty):%s\n",
                     unseen.c_str());
    if (!failed_ && !writer_->close(&error_)) failed_ = true;
    if (failed_) *error = error_;
    return !failed_;
}

}  // namespace vantorel

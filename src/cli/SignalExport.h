// SignalExport: the --csv, --csv-keys (and, live, --gps) options of vantorel-cli: a signal sampler writing one CSV row per display tick.
#pragma once

#include "Model/SignalSampler.h"
#include "Monitor/SignalCsvWriter.h"

#include <QString>

#include <cstdint>
#include <memory>
#include <optional>
#include <set>
#include <string>
#include <vector>

class QCommandLineParser;

namespace vantorel {

class GpsPosition;

class SignalExport {
public:
    // `live`: watch (wall-clock rows, --gps); otherwise decode (recorded time).
    static void addOptions(QCommandLineParser& parser, bool live);
    // "K1,K2" → the keys; empty parts are dropped, spaces inside a key are kept, and so are
    // commas inside a key's list selector ("[UARFCN=10055,Cell ID=11]"); a CSV header's
    // unit after a key ("... Measured RSRP (dBm)") is dropped.
    static std::vector<std::string> splitKeys(const QString& list);

    SignalExport();
    ~SignalExport();

    // Reads the options; false with *error on bad use (--csv-keys or --gps without
    // --csv, an empty --csv-keys) or when the file cannot be created.
    bool configure(const QCommandLineParser& parser, bool live, std::string* error);
    bool enabled() const { return !path_.empty(); }

    // One display tick: the row's time (none for a stream without times), the
    // decoder's technology and the tree's path index. The header is written at the
    // first tick, when the technology names the default keys.
    void tick(std::optional<int64_t> timeMs, const std::string& technology, const PathDictionary& nodes);
    // Ends the file (a header alone when no tick came) and warns on stderr about
    // --csv-keys that no tick's tree held. False with *error when writing failed.
    bool finish(const std::string& technology, std::string* error);

    uint64_t rows() const { return writer_ ? writer_->rowsWritten() : 0; }

private:
    bool openWriter(const std::string& technology);

    std::string path_;
    std::vector<std::string> chosenKeys_;  // --csv-keys; empty: the technology's defaults
    bool gps_ = false;
    std::unique_ptr<GpsPosition> position_;
    SignalSampler sampler_;
    std::unique_ptr<SignalCsvWriter> writer_;
    std::set<std::string> seen_;
    bool failed_ = false;
    std::string error_;
};

}  // namespace vantorel

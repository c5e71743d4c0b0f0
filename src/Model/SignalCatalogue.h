// SignalCatalogue: the signal quantities each technology's display shows, with the physical quantity, unit and scale of each, for plots, tables and CSV headers.
#pragma once

#include <optional>
#include <string>
#include <vector>

namespace vantorel {

// What a plotted number is. The display strings keep the texts the decoders write, and
// those do not always say what the number is: GSM shows RxLev (a 0..63 level index) as
// "36 dBm", LTE shows Srxlev (a margin in dB) as "12 dBm", UMTS shows RSCP (a power) as
// "-81 dB", TD-SCDMA shows its RSCP as a bare fraction of the reporting range. So the
// plot's axes, the legend, the tables' headers, the CSV headers and the sparklines take
// the quantity and unit from here, and the number from the display string converted by
// value = shown × scale + offset.
struct SignalQuantity {
    std::string name;      // short name: "RSRP", "RxLev", "Ec/Io"
    std::string quantity;  // "received power", "signal quality", "level", "margin", ...; "" when unknown
    std::string unit;      // "dBm", "dB", "%", "kbit/s"; "" for a level, a class or a bare number
    double scale = 1;
    double offset = 0;

    bool catalogued() const { return !quantity.empty(); }
    // The shown number in the unit; a scaled one rounded to a thousandth, as the display's
    // six decimals of a fraction carry no more ("0.183594" × 256 − 116 is −69).
    double convert(double shown) const;
    // What an axis or a column is measured in: the unit, else the quantity of a unitless
    // catalogued value ("level"), else "".
    std::string unitLabel() const;
    // A value as people read it: "-95.5 dBm", "36 (level)", "17".
    std::string reading(double value) const;
};

class SignalCatalogue {
public:
    // One row: the display path ("*" stands for any one component: a list entry by
    // position or selector, or one of several sibling sections), the unit word of the
    // display strings it reads (nullptr: any; a leaf some records write with a unit and
    // others without has a row per form), and what the number is.
    struct Entry {
        const char* technology;  // as "GetTechnology" answers
        const char* path;
        const char* shownUnit;
        const char* name;
        const char* quantity;
        const char* unit;
        double scale;
        double offset;
    };

    // The rows of a technology, in the table's order.
    static std::vector<Entry> entries(const std::string& technology);
    // The quantity of the value at `key` (a display path, list selectors included) on a
    // technology's display; `shown`, the display string, picks between a leaf's forms.
    // None for a key the catalogue does not hold. An empty technology looks in every
    // technology's rows (each decoder's template has paths of its own).
    static std::optional<SignalQuantity> find(const std::string& technology, const std::string& key,
                                              const std::string* shown = nullptr);
    // The CSV header of a column: "<key> (<unit label>)" for a catalogued key, the key alone otherwise.
    static std::string columnTitle(const std::string& key, const std::optional<SignalQuantity>& quantity);
    // A key as written on the command line, which may be a CSV header: without its
    // " (<unit label>)" suffix when it has one of the catalogue's.
    static std::string keyOfColumn(const std::string& title);
    // "/A/[B=1/2]/C" → {"A", "[B=1/2]", "C"}: a slash inside a list selector is the selector's.
    static std::vector<std::string> components(const std::string& path);
};

}  // namespace vantorel

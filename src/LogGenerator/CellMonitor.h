// CellMonitor: reads the serving cell from the telephony service's cell-monitor array (extra record 0xFF0001) for the serving-cell sections.
#pragma once

#include "PropertyList/Value.h"

#include <cstdint>
#include <functional>
#include <initializer_list>
#include <optional>
#include <span>
#include <string>

namespace vantorel {

// The 0xFF0001 payload (offset 13 to the end) is a property list whose root is an array
// of cell dictionaries, each with its radio access technology, its cell type (serving,
// neighbour, ...) and numbers such as MCC, LAC or UARFCN.
class CellMonitor {
public:
    // One number of the cell shown under up to two display keys; a cell lacking it logs
    // `failure` at error priority and leaves the display keys as they were.
    struct Field {
        const char* cellKey;
        const char* displayKey;
        const char* secondDisplayKey;  // or nullptr
        const char* failure;
    };
    // Which of several matching serving cells the display shows.
    enum class Pick { FirstCell, LastCell };
    using SetValue = std::function<void(const std::string& key, const std::string& text)>;
    // What showServingCell found; each section logs the failures in its own words.
    enum class Outcome { NotParsed, NoArray, Read };

    // Parses the record and shows the fields of its serving cells of one of
    // `technologies` through setValue, as decimal text. A payload that is not a
    // property list (NotParsed) or whose root is not an array (NoArray) changes nothing.
    static Outcome showServingCell(ByteView record, std::initializer_list<const char*> technologies, Pick pick,
                                std::span<const Field> fields, const SetValue& setValue);

    // Parses the record and hands each cell of one of `technologies` whose cell type is
    // `cellType` to visit, in list order, until visit returns false. NotParsed and
    // NoArray as for showServingCell; visit is then never called.
    using Visit = std::function<bool(const Value& cell)>;
    static Outcome forEachCell(ByteView record, std::initializer_list<const char*> technologies, const char* cellType,
                               const Visit& visit);

    // True when the outcome holds no cell list, after logging why at error priority: for
    // a payload that is not a property list "Cell Info Array data could not be
    // constructed" and then "Failed to get Cell Array\n", for a root that is not an array
    // the second line alone. Nothing is logged for Read.
    static bool logMissingList(Outcome outcome);

    // The cell's value under key as a signed 32-bit integer; empty when missing or
    // not a number.
    static std::optional<int32_t> number(const Value& cell, const char* key);

private:
    // True when the cell is a dictionary whose radio access technology is one of
    // `technologies` and whose cell type equals `cellType`; a cell lacking either key
    // (or not a dictionary) does not match.
    static bool matches(const Value& cell, std::initializer_list<const char*> technologies, const char* cellType);
};

}  // namespace vantorel

// CellMonitor: reading the telephony service's cell-monitor dictionaries of the 0xFF0001 extra record (Overview "Cell-monitor dictionaries"; Parts 5.2, 6.2, 7.2).
#pragma once

#include "PropertyList/Value.h"

#include <cstdint>
#include <initializer_list>
#include <optional>

namespace vantorel {

class CellMonitor {
public:
    // True when the cell is a dictionary whose radio access technology is one of
    // `technologies` and whose cell type equals `cellType`; a cell lacking either key
    // (or not a dictionary) does not match.
    static bool matches(const Value& cell, std::initializer_list<const char*> technologies, const char* cellType);
    // The cell's value under key as a signed 32-bit integer; empty when missing or
    // not a number.
    static std::optional<int32_t> int32(const Value& cell, const char* key);
};

}  // namespace vantorel

// HostilePlist: a real binary property list with a NUL character planted in one of its strings.
#pragma once

#include "PropertyList/PropertyListSerialization.h"

#include <algorithm>

namespace vantorel::testing {

// `value` serialised as a binary plist, in which the string "é-" (kept as UTF-16 for
// the é) has its '-' turned into U+0000: the string libplist 2.2 aborts on.
inline Bytes withNulCharacter(const Value& value) {
    Bytes bytes = *PropertyListSerialization::write(value, PropertyListSerialization::Format::Binary);
    const Bytes marker{0x00, 0xE9, 0x00, '-'};
    auto at = std::search(bytes.begin(), bytes.end(), marker.begin(), marker.end());
    if (at != bytes.end()) at[3] = 0;
    return bytes;
}

}  // namespace vantorel::testing

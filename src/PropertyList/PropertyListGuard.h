// PropertyListGuard: a static check of raw property-list bytes that refuses what libplist cannot take safely.
#pragma once

#include "PropertyList/Value.h"

#include <cstddef>
#include <cstdint>
#include <string>

namespace vantorel {

// libplist trusts its input more than bytes from outside deserve: a string holding
// U+0000 fails an assertion when its value is read, deep nesting overflows its
// recursive parser and free, a binary object shared by many references is copied
// once per reference (2^n nodes from n bytes), and a binary plist parses in time
// quadratic in its depth. The guard reads the bytes before libplist does, in time
// and memory linear in their size and without recursion, and refuses such input.
class PropertyListGuard {
public:
    // No value may sit deeper than this below the root (the root is at depth 0).
    static constexpr size_t kMaxDepth = 256;
    // An XML property list larger than this is refused before it is scanned.
    static constexpr size_t kMaxXMLBytes = 16u << 20;
    // A binary property list may hold at most this many objects, and may expand (every
    // reference to a shared object counted again) to at most this many values...
    static constexpr uint64_t kMaxValues = 1u << 20;
    // ...whose encoded sizes, counted the same way, add up to at most this many bytes.
    static constexpr uint64_t kMaxExpandedBytes = 64u << 20;

    // Empty when libplist may be given the bytes; otherwise why not. Binary input is
    // recognised by its "bplist00" magic, anything else is checked as XML.
    static std::string check(ByteView bytes);

    // The error text for a value deeper than kMaxDepth.
    static std::string tooDeep();

private:
    static std::string checkBinary(ByteView bytes);
    static std::string checkXML(ByteView bytes);
};

}  // namespace vantorel

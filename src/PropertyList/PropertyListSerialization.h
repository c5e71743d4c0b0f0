// PropertyListSerialization: reads and writes XML and binary property lists through libplist.
#pragma once

#include "PropertyList/Value.h"

#include <optional>
#include <string>

namespace vantorel {

// The outcome of reading a property list: a value, or an error text saying why not.
struct PropertyListResult {
    std::optional<Value> value;
    std::string error;
    explicit operator bool() const { return value.has_value(); }
};

class PropertyListSerialization {
public:
    enum class Format { XML, Binary };

    // Reads a property list in either format (detected from the bytes). Empty,
    // truncated, malformed or hostile input (see PropertyListGuard, which checks the
    // bytes before libplist parses them) gives an error result, never a crash.
    static PropertyListResult read(ByteView bytes);
    // The same, for callers that need a dictionary at the top (commands, replies,
    // snapshots): another root type is an error result.
    static PropertyListResult readDictionary(ByteView bytes);

    // Writes a value as a property list; empty on failure (a null value, or a
    // container holding one, cannot be written).
    static std::optional<Bytes> write(const Value& value, Format format);
    static std::optional<std::string> writeXML(const Value& value);
};

}  // namespace vantorel

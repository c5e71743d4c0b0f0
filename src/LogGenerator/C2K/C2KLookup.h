// C2KLookup: delivers a CDMA display value to every place of the display template bound to its lookup key, and builds the pilot lists those values can be.
#pragma once

#include "PropertyList/Value.h"

#include <string>

namespace vantorel {

// The lookup dictionary maps a lookup key ("kChannel", "kFLDataRate", ...) to an array of
// binding records {"key": display key, "dict": the display dictionary holding it}; one key
// may be bound to several places, and each receives the same value.
class C2KLookup {
public:
    // Stores value under every place bound to lookupKey, in binding order. A lookup that
    // is null or has no array for the key changes nothing; a binding record that is not a
    // dictionary with a dictionary "dict" and a string "key" ends the delivery there
    // (later places keep their old values).
    static void setLookupValue(const std::string& lookupKey, const Value& value, const DictionaryRef& lookup);

    // A pilot list value: a dictionary ordered by its "_sorted" marker (the tree shows it in
    // key order), one entry per pilot under "%d;%d" (index in the record, PN offset).
    class PilotList {
    public:
        PilotList();
        void add(int index, unsigned pnOffset, std::string text);
        bool empty() const { return count_ == 0; }
        // The dictionary; with `noneWhenEmpty` an empty list is the string "(none)".
        Value value(bool noneWhenEmpty) const;

    private:
        DictionaryRef pilots_;
        int count_ = 0;
    };
};

}  // namespace vantorel

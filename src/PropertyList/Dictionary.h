// Dictionary: an insertion-ordered property-list dictionary with string keys.
#pragma once

#include "PropertyList/Value.h"

#include <string>
#include <unordered_map>
#include <utility>
#include <vector>

namespace vantorel {

// Keys keep the order in which they were first set, so a template's order is the
// display order. Setting an existing key replaces its value in place.
class Dictionary {
public:
    using Entry = std::pair<std::string, Value>;

    static DictionaryRef create() { return std::make_shared<Dictionary>(); }

    size_t size() const { return entries_.size(); }
    bool empty() const { return entries_.empty(); }
    bool contains(const std::string& key) const { return index_.count(key) != 0; }

    // The value under key, or nullptr when absent.
    const Value* find(const std::string& key) const;
    Value* find(const std::string& key);
    // The value under key, or the null value when absent. The reference stays valid
    // until the dictionary is changed.
    const Value& get(const std::string& key) const;

    void set(const std::string& key, Value value);
    void remove(const std::string& key);
    void clear();

    std::vector<std::string> keys() const;
    std::vector<Entry>::const_iterator begin() const { return entries_.begin(); }
    std::vector<Entry>::const_iterator end() const { return entries_.end(); }

    DictionaryRef deepCopy() const;
    bool operator==(const Dictionary& other) const;

private:
    std::vector<Entry> entries_;
    std::unordered_map<std::string, size_t> index_;
};

}  // namespace vantorel

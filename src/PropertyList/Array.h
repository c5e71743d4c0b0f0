// Array: a property-list array of values, shared by reference so sections can fill the display's lists.
#pragma once

#include "PropertyList/Value.h"

#include <vector>

namespace vantorel {

class Array {
public:
    static ArrayRef create() { return std::make_shared<Array>(); }
    static ArrayRef of(std::vector<Value> values);

    size_t size() const { return items_.size(); }
    bool empty() const { return items_.empty(); }
    const Value& at(size_t i) const { return items_.at(i); }
    Value& at(size_t i) { return items_.at(i); }

    void append(Value v) { items_.push_back(std::move(v)); }
    void clear() { items_.clear(); }
    // Removes `length` elements from `start` (clipped to the array).
    void removeRange(size_t start, size_t length);

    std::vector<Value>::const_iterator begin() const { return items_.begin(); }
    std::vector<Value>::const_iterator end() const { return items_.end(); }

    ArrayRef deepCopy() const;
    bool operator==(const Array& other) const;

private:
    std::vector<Value> items_;
};

}  // namespace vantorel

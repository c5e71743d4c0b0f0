// Array: a property-list array of values, shared by reference so sections can fill the display's lists.
#include "PropertyList/Array.h"

#include <algorithm>

namespace vantorel {

ArrayRef Array::of(std::vector<Value> values) {
    auto a = create();
    a->items_ = std::move(values);
    return a;
}

void Array::removeRange(size_t start, size_t length) {
    if (start >= items_.size()) return;
    size_t stop = std::min(items_.size(), start + length);
    items_.erase(items_.begin() + static_cast<std::ptrdiff_t>(start),
                 items_.begin() + static_cast<std::ptrdiff_t>(stop));
}

ArrayRef Array::deepCopy() const {
    auto copy = create();
    copy->items_.reserve(items_.size());
    for (const auto& v : items_) copy->items_.push_back(v.deepCopy());
    return copy;
}

bool Array::operator==(const Array& other) const {
    return items_ == other.items_;
}

}  // namespace vantorel

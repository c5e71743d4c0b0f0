// Dictionary: an insertion-ordered property-list dictionary with string keys.
#include "PropertyList/Dictionary.h"

namespace vantorel {

const Value* Dictionary::find(const std::string& key) const {
    auto it = index_.find(key);
    return it == index_.end() ? nullptr : &entries_[it->second].second;
}

Value* Dictionary::find(const std::string& key) {
    auto it = index_.find(key);
    return it == index_.end() ? nullptr : &entries_[it->second].second;
}

const Value& Dictionary::get(const std::string& key) const {
    static const Value kNull;
    const Value* v = find(key);
    return v ? *v : kNull;
}

void Dictionary::set(const std::string& key, Value value) {
    auto it = index_.find(key);
    if (it != index_.end()) {
        entries_[it->second].second = std::move(value);
        return;
    }
    index_.emplace(key, entries_.size());
    entries_.emplace_back(key, std::move(value));
}

void Dictionary::remove(const std::string& key) {
    auto it = index_.find(key);
    if (it == index_.end()) return;
    size_t pos = it->second;
    entries_.erase(entries_.begin() + static_cast<std::ptrdiff_t>(pos));
    index_.erase(it);
    for (auto& [k, i] : index_)
        if (i > pos) --i;
}

void Dictionary::clear() {
    entries_.clear();
    index_.clear();
}

std::vector<std::string> Dictionary::keys() const {
    std::vector<std::string> out;
    out.reserve(entries_.size());
    for (const auto& e : entries_) out.push_back(e.first);
    return out;
}

DictionaryRef Dictionary::deepCopy() const {
    auto copy = create();
    for (const auto& [k, v] : entries_) copy->set(k, v.deepCopy());
    return copy;
}

bool Dictionary::operator==(const Dictionary& other) const {
    if (size() != other.size()) return false;
    for (const auto& [k, v] : entries_) {
        const Value* o = other.find(k);
        if (!o || !(*o == v)) return false;
    }
    return true;
}

}  // namespace vantorel

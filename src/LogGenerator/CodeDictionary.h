// CodeDictionary: log code (as a decimal string) to its subscribing sections, keys in registration order.
#pragma once

#include <string>
#include <unordered_map>
#include <vector>

namespace vantorel {

class Base;
using SectionList = std::vector<Base*>;
// `classDict`: section name to section (not owned: the class index's fields own them).
using ClassDictionary = std::unordered_map<std::string, Base*>;

// Keys keep the order in which they were first added, so `getAllLogCodes` (and the
// start command built from it) is stable: the order of section creation.
class CodeDictionary {
public:
    SectionList* find(const std::string& key) {
        auto it = map_.find(key);
        return it == map_.end() ? nullptr : &it->second;
    }
    const SectionList* find(const std::string& key) const {
        auto it = map_.find(key);
        return it == map_.end() ? nullptr : &it->second;
    }
    SectionList& add(const std::string& key) {
        auto [it, inserted] = map_.try_emplace(key);
        if (inserted) order_.push_back(key);
        return it->second;
    }
    const std::vector<std::string>& keys() const { return order_; }

private:
    std::unordered_map<std::string, SectionList> map_;
    std::vector<std::string> order_;
};

}  // namespace vantorel

// DisplayPath: resolving bracketed list selectors against the display tree's path index, and naming them for people.
#include "Model/DisplayPath.h"

#include "Model/SignalValue.h"

#include <algorithm>
#include <cctype>
#include <optional>

namespace vantorel {

namespace {

struct Condition {
    std::string key;
    std::string value;
    bool equal = true;
};

struct Selector {
    int rank = 0;  // 0: the first entry that meets the conditions
    std::string rankLeaf;
    std::vector<Condition> conditions;
};

// "#2 Filtered RSRP,Status!=ASET" -> rank 2 by "Filtered RSRP", Status not "ASET".
std::optional<Selector> parseSelector(const std::string& text) {
    Selector selector;
    size_t from = 0;
    while (from <= text.size()) {
        const size_t comma = std::min(text.find(',', from), text.size());
        const std::string part = text.substr(from, comma - from);
        from = comma + 1;
        if (part.empty()) return std::nullopt;
        if (part[0] == '#') {
            const size_t space = part.find(' ');
            if (selector.rank || space == std::string::npos || space < 2 || space + 1 == part.size()) return std::nullopt;
            const std::string digits = part.substr(1, space - 1);
            if (digits.size() > 4 || !std::all_of(digits.begin(), digits.end(), [](unsigned char c) { return std::isdigit(c); }))
                return std::nullopt;
            selector.rank = std::stoi(digits);
            selector.rankLeaf = part.substr(space + 1);
            if (selector.rank == 0) return std::nullopt;
            continue;
        }
        const size_t notEqual = part.find("!="), equal = part.find('=');
        if (equal == std::string::npos || equal == 0) return std::nullopt;
        const bool negated = notEqual != std::string::npos && notEqual + 1 == equal;
        selector.conditions.push_back({part.substr(0, negated ? notEqual : equal), part.substr(equal + 1), !negated});
    }
    return selector;
}

const std::string* leafOf(const NodeRef& entry, const std::string& key) {
    const std::vector<NodeRef>* leaves = entry ? entry->childNodes() : nullptr;
    if (!leaves) return nullptr;
    for (const NodeRef& leaf : *leaves)
        if (leaf->displayName() == key && leaf->value()) return leaf->value();
    return nullptr;
}

bool meets(const NodeRef& entry, const std::vector<Condition>& conditions) {
    return std::all_of(conditions.begin(), conditions.end(), [&](const Condition& c) {
        const std::string* value = leafOf(entry, c.key);
        return c.equal ? value && *value == c.value : !value || *value != c.value;
    });
}

NodeRef pick(const NodeRef& list, const Selector& selector) {
    const std::vector<NodeRef>* entries = list ? list->childNodes() : nullptr;
    if (!entries) return nullptr;
    std::vector<std::pair<double, NodeRef>> ranked;
    for (const NodeRef& entry : *entries) {
        if (!entry->childNodes() || !meets(entry, selector.conditions)) continue;
        if (!selector.rank) return entry;
        const std::string* text = leafOf(entry, selector.rankLeaf);
        if (const std::optional<double> value = text ? SignalValue::parse(*text) : std::nullopt)
            ranked.emplace_back(*value, entry);
    }
    if (!selector.rank) return nullptr;  // no entry meets the conditions
    // Equal values keep the list's order.
    std::stable_sort(ranked.begin(), ranked.end(), [](const auto& a, const auto& b) { return a.first > b.first; });
    return size_t(selector.rank) <= ranked.size() ? ranked[size_t(selector.rank) - 1].second : nullptr;
}

bool isIndex(const std::string& name) {
    return !name.empty() && name.size() < 10 &&
           std::all_of(name.begin(), name.end(), [](unsigned char c) { return std::isdigit(c); });
}

// A list shows its entries as "0", "1", ...
bool isList(const NodeRef& node) {
    const std::vector<NodeRef>* children = node ? node->childNodes() : nullptr;
    return children && !children->empty() &&
           std::all_of(children->begin(), children->end(), [](const NodeRef& c) { return isIndex(c->displayName()); });
}

// Shorter names of identity leaves for labels.
std::string shortName(const std::string& key) {
    static const std::vector<std::pair<std::string, std::string>> names = {
        {"Physical Cell ID", "PCI"}, {"Cell Scrambling Code", "PSC"}, {"Scrambling Code", "PSC"},
        {"Downlink UARFCN", "UARFCN"}, {"E ARFCN", "EARFCN"}, {"E-ARFCN", "EARFCN"}, {"U ARFCN", "UARFCN"}};
    for (const auto& [name, shorter] : names)
        if (key == name) return shorter;
    return key;
}

std::string ordinal(int n) {
    if (n == 1) return "strongest";
    const int tens = n % 100;
    const char* suffix = tens >= 11 && tens <= 13 ? "th" : n % 10 == 1 ? "st" : n % 10 == 2 ? "nd" : n % 10 == 3 ? "rd" : "th";
    return std::to_string(n) + suffix + " strongest";
}

}  // namespace

const std::vector<std::string>& DisplayPath::identityKeys() {
    static const std::vector<std::string> keys = {
        "Physical Cell ID", "PCI",     "PSC",          "Scrambling Code", "Cell Scrambling Code",
        "Cell Parameter ID", "Pilot PN", "PN",          "E-ARFCN",         "E ARFCN",
        "EARFCN",            "UARFCN",  "U ARFCN",     "Downlink UARFCN", "ARFCN",
        "BSIC",              "Cell ID", "Cell Identity", "NSAPI"};
    return keys;
}

NodeRef DisplayPath::resolve(const std::string& path, const PathDictionary& nodes) {
    const size_t open = path.find("/[");
    if (open == std::string::npos) {
        const auto it = nodes.find(path);
        return it == nodes.end() ? nullptr : it->second;
    }
    const size_t close = path.find(']', open);
    if (close == std::string::npos) return nullptr;
    const std::string listPath = open == 0 ? "/" : path.substr(0, open);
    const std::optional<Selector> selector = parseSelector(path.substr(open + 2, close - open - 2));
    const auto list = nodes.find(listPath);
    if (!selector || list == nodes.end()) return nullptr;
    const NodeRef entry = pick(list->second, *selector);
    if (!entry) return nullptr;
    const std::string rest = path.substr(close + 1);
    if (rest.empty()) return entry;
    return resolve(VantorelModelNode::childPath(listPath, entry->displayName()) + rest, nodes);
}

const std::string* DisplayPath::leafText(const std::string& path, const PathDictionary& nodes) {
    const NodeRef node = resolve(path, nodes);
    return node ? node->value() : nullptr;
}

std::string DisplayPath::identitySelector(const NodeRef& entry) {
    std::string conditions;
    for (const std::string& key : identityKeys()) {
        const std::string* value = leafOf(entry, key);
        // A value the bracket syntax cannot carry (none does in practice) leaves that leaf out.
        if (!value || value->find_first_of(",]") != std::string::npos) continue;
        conditions += (conditions.empty() ? "" : ",") + key + "=" + *value;
    }
    return conditions.empty() ? std::string() : "[" + conditions + "]";
}

std::string DisplayPath::following(const std::string& path, const PathDictionary& nodes) {
    std::string out, parent;
    size_t start = 1;
    for (size_t i = 1; i <= path.size(); ++i) {
        if (i < path.size() && path[i] != '/') continue;
        std::string component = path.substr(start, i - start);
        const std::string prefix = path.substr(0, i);
        const auto node = nodes.find(prefix);
        const auto above = nodes.find(parent.empty() ? "/" : parent);
        if (node != nodes.end() && isIndex(component) && above != nodes.end() && isList(above->second)) {
            const std::string selector = identitySelector(node->second);
            if (!selector.empty()) component = selector;
        }
        out += "/" + component;
        parent = prefix;
        start = i + 1;
    }
    return path.empty() ? path : out;
}

std::string DisplayPath::label(const std::string& path) {
    const size_t open = path.rfind("/[");
    const size_t close = open == std::string::npos ? std::string::npos : path.find(']', open);
    const std::string leaf = path.substr(path.rfind('/') + 1);
    if (close == std::string::npos || close + 1 >= path.size()) return leaf;
    const std::optional<Selector> selector = parseSelector(path.substr(open + 2, close - open - 2));
    if (!selector) return leaf;
    std::string said;
    if (selector->rank) said = ordinal(selector->rank);
    for (const Condition& c : selector->conditions)
        if (c.equal) said += (said.empty() ? "" : ", ") + shortName(c.key) + " " + c.value;
    return said.empty() ? leaf : leaf + " (" + said + ")";
}

std::string DisplayPath::cellOf(const std::string& path, const PathDictionary& nodes) {
    const size_t open = path.rfind("/[");
    const size_t close = open == std::string::npos ? std::string::npos : path.find(']', open);
    if (close == std::string::npos) return {};
    const NodeRef entry = resolve(path.substr(0, close + 1), nodes);
    std::string said;
    for (const std::string& key : identityKeys())
        if (const std::string* value = leafOf(entry, key)) said += (said.empty() ? "" : ", ") + shortName(key) + " " + *value;
    return said;
}

bool DisplayPath::isRanked(const std::string& path) { return path.find("/[#") != std::string::npos; }

}  // namespace vantorel

// SectionTesting: binds a section to a display container of its own and renders what it shows as one comparable text.
#pragma once

#include "LogGenerator/Base.h"
#include "Platform/RecordBuilder.h"
#include "Platform/SystemLog.h"
#include "Platform/SystemLogCapture.h"
#include "Platform/TelephonyIdentifiers.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"

#include <string>
#include <utility>
#include <vector>

namespace vantorel::sectiontest {

// Strings as they are, dictionaries as "{key=value, ...}" in key order, arrays as
// "[a, b]"; any other value by its type name.
inline std::string render(const Value& v) {
    if (const std::string* s = v.asString()) return *s;
    std::string out;
    if (DictionaryRef d = v.asDictionary()) {
        for (const auto& [key, item] : *d) out += (out.empty() ? "" : ", ") + key + "=" + render(item);
        return "{" + out + "}";
    }
    if (ArrayRef a = v.asArray()) {
        for (const Value& item : *a) out += (out.empty() ? "" : ", ") + render(item);
        return "[" + out + "]";
    }
    return std::string("<") + v.typeName() + ">";
}

// Every leaf of a display that still shows the template's "-", and every empty list, by path.
inline void unfilled(const Value& v, const std::string& path, std::vector<std::string>& out) {
    if (const std::string* s = v.asString()) {
        if (*s == "-") out.push_back(path);
    } else if (DictionaryRef d = v.asDictionary()) {
        for (const auto& [key, item] : *d) unfilled(item, path + "/" + key, out);
    } else if (ArrayRef a = v.asArray()) {
        if (a->empty()) out.push_back(path + " (empty)");
    }
}

// The display value at a path of keys ("1;Serving Cell", "GSM Serving Cell", "RSSI"), rendered;
// "<missing>" when a step is not there.
inline std::string at(const DictionaryRef& display, const std::vector<std::string>& path) {
    Value v(display);
    for (const std::string& key : path) {
        DictionaryRef d = v.asDictionary();
        if (!d || !d->find(key)) return "<missing>";
        v = *d->find(key);
    }
    return render(v);
}

// A section bound to a dictionary and an array of its own (it writes to the one its
// display kind needs; the other stays empty).
template <class Section>
struct Bound {
    Section section;
    DictionaryRef dict = Dictionary::create();
    ArrayRef list = Array::create();
    bool asList;
    explicit Bound(bool asList_ = false) : asList(asList_) {
        section.updateSectionRef(asList ? Value(list) : Value(dict));
    }
    Bound& feed(const Bytes& record, int32_t code) {
        section.updateWithData(record, code);
        return *this;
    }
    Bound& feed(const std::vector<Bytes>& records, int32_t code) {
        for (const Bytes& record : records) feed(record, code);
        return *this;
    }
    std::string shown() const { return asList ? render(Value(list)) : render(Value(dict)); }
};

// The lines logged at error priority, in order.
inline std::vector<std::string> errorLines(const SystemLogCapture& capture) {
    std::vector<std::string> out;
    for (const auto& line : capture.lines())
        if (line.priority == SystemLog::kError) out.push_back(line.text);
    return out;
}

// One cell-monitor dictionary: technology, cell type and integer fields.
inline Value cell(const char* rat, const char* type, std::initializer_list<std::pair<const char*, int>> ints) {
    auto d = Dictionary::create();
    if (rat) d->set(kTSCellMonitorCellRadioAccessTechnology, rat);
    if (type) d->set(kTSCellMonitorCellType, type);
    for (auto [key, value] : ints) d->set(key, Value::integer(value));
    return Value(d);
}

// Extra record 1 (0xFF0001) carrying the cells as a property list.
inline Bytes cellMonitor(std::vector<Value> cells, bool binary = false) {
    return RecordBuilder::extraPropertyList(1, Value(Array::of(std::move(cells))), binary);
}

}  // namespace vantorel::sectiontest

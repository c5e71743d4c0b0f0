// PropertyListSerialization: the libplist bridge of the value model; every plist read or written goes through it.
#include "PropertyList/PropertyListSerialization.h"

#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"
#include "PropertyList/Utf8.h"
#include "PropertyList/PropertyListGuard.h"

#include <plist/plist.h>

#include <algorithm>
#include <cmath>
#include <cstring>
#include <limits>
#include <memory>

namespace vantorel {

namespace {

// libplist dates count seconds from 2001-01-01 00:00:00 UTC.
constexpr double kSecondsFrom1970To2001 = 978307200.0;

struct PlistDeleter {
    void operator()(void* p) const { plist_free(static_cast<plist_t>(p)); }
};
using PlistPtr = std::unique_ptr<void, PlistDeleter>;

bool toValue(plist_t node, size_t depth, Value& out, std::string& error) {
    if (depth > PropertyListGuard::kMaxDepth) {
        error = PropertyListGuard::tooDeep();
        return false;
    }
    switch (plist_get_node_type(node)) {
    case PLIST_BOOLEAN: {
        uint8_t b = 0;
        plist_get_bool_val(node, &b);
        out = Value::boolean(b != 0);
        return true;
    }
    case PLIST_UINT: {
        // libplist keeps integers as 64 bits; negative values come back two's complement.
        uint64_t u = 0;
        plist_get_uint_val(node, &u);
        out = Value::integer(static_cast<int64_t>(u));
        return true;
    }
    case PLIST_UID: {
        uint64_t u = 0;
        plist_get_uid_val(node, &u);
        out = Value::integer(static_cast<int64_t>(u));
        return true;
    }
    case PLIST_REAL: {
        double d = 0;
        plist_get_real_val(node, &d);
        out = Value::real(d);
        return true;
    }
    case PLIST_STRING: {
        // Not plist_get_string_val: it asserts that the string holds no U+0000.
        uint64_t length = 0;
        const char* s = plist_get_string_ptr(node, &length);
        std::string text = s ? std::string(s, length) : std::string();
        if (text.find('\0') != std::string::npos) {
            error = "string holds a NUL character";
            return false;
        }
        // libplist passes the bytes of an ASCII-marked binary string or an XML text
        // through unchecked; the display, JSON and a written binary plist need UTF-8.
        if (!Utf8::isValid(text)) {
            error = "string is not valid UTF-8";
            return false;
        }
        out = Value(std::move(text));
        return true;
    }
    case PLIST_DATA: {
        char* d = nullptr;
        uint64_t len = 0;
        plist_get_data_val(node, &d, &len);
        Bytes bytes(reinterpret_cast<uint8_t*>(d), reinterpret_cast<uint8_t*>(d) + (d ? len : 0));
        free(d);
        out = Value::data(std::move(bytes));
        return true;
    }
    case PLIST_DATE: {
        int32_t sec = 0, usec = 0;
        plist_get_date_val(node, &sec, &usec);
        out = Value::date(Date{kSecondsFrom1970To2001 + sec + usec / 1e6});
        return true;
    }
    case PLIST_ARRAY: {
        // An iterator, not plist_array_get_item: on a parsed tree that walks the list
        // from the start every time, quadratic in the array's length.
        auto array = Array::create();
        plist_array_iter it = nullptr;
        plist_array_new_iter(node, &it);
        plist_t child = nullptr;
        for (plist_array_next_item(node, it, &child); child; plist_array_next_item(node, it, &child)) {
            Value item;
            if (!toValue(child, depth + 1, item, error)) break;
            array->append(std::move(item));
        }
        free(it);
        if (child) return false;
        out = Value(array);
        return true;
    }
    case PLIST_DICT: {
        auto dict = Dictionary::create();
        plist_dict_iter it = nullptr;
        plist_dict_new_iter(node, &it);
        while (true) {
            char* key = nullptr;
            plist_t item = nullptr;
            plist_dict_next_item(node, it, &key, &item);
            if (!item) {
                free(key);
                break;
            }
            Value v;
            bool ok = toValue(item, depth + 1, v, error);
            if (ok && key && !Utf8::isValid(key)) {
                error = "dictionary key is not valid UTF-8";
                ok = false;
            }
            if (ok) dict->set(key ? key : "", std::move(v));
            free(key);
            if (!ok) {
                free(it);
                return false;
            }
        }
        free(it);
        out = Value(dict);
        return true;
    }
    default:
        error = "property list holds a value of an unsupported type";
        return false;
    }
}

plist_t fromValue(const Value& value) {
    switch (value.type()) {
    case Value::Type::String: return plist_new_string(value.asString()->c_str());
    case Value::Type::Integer: return plist_new_uint(static_cast<uint64_t>(*value.asInteger()));
    case Value::Type::Real: return plist_new_real(*value.asReal());
    case Value::Type::Boolean: return plist_new_bool(*value.asBoolean() ? 1 : 0);
    case Value::Type::Data: {
        const Bytes& b = *value.asData();
        return plist_new_data(reinterpret_cast<const char*>(b.data()), b.size());
    }
    case Value::Type::Date: {
        // libplist holds a date as 32-bit whole seconds from 2001: a date beyond about
        // 68 years either side is written as the nearest one it can hold, not
        // converted out of range.
        double s = value.asDate()->secondsSince1970 - kSecondsFrom1970To2001;
        if (std::isnan(s)) s = 0;
        s = std::clamp(s, double{std::numeric_limits<int32_t>::min()}, double{std::numeric_limits<int32_t>::max()});
        const double whole = std::floor(s);
        return plist_new_date(static_cast<int32_t>(whole), static_cast<int32_t>((s - whole) * 1e6));
    }
    case Value::Type::Array: {
        plist_t a = plist_new_array();
        for (const Value& item : *value.asArray()) {
            plist_t child = fromValue(item);
            if (!child) {
                plist_free(a);
                return nullptr;
            }
            plist_array_append_item(a, child);
        }
        return a;
    }
    case Value::Type::Dictionary: {
        plist_t d = plist_new_dict();
        for (const auto& [key, item] : *value.asDictionary()) {
            plist_t child = fromValue(item);
            if (!child) {
                plist_free(d);
                return nullptr;
            }
            plist_dict_set_item(d, key.c_str(), child);
        }
        return d;
    }
    case Value::Type::Null: break;
    }
    return nullptr;
}

}  // namespace

PropertyListResult PropertyListSerialization::read(ByteView bytes) {
    PropertyListResult result;
    if (bytes.empty()) {
        result.error = "empty property list";
        return result;
    }
    if (bytes.size() > std::numeric_limits<uint32_t>::max()) {
        result.error = "property list larger than 4 GiB";
        return result;
    }
    // libplist aborts, overflows its stack or expands without bound on some input:
    // nothing reaches it unchecked.
    result.error = PropertyListGuard::check(bytes);
    if (!result.error.empty()) return result;
    plist_t root = nullptr;
    const char* data = reinterpret_cast<const char*>(bytes.data());
    auto length = static_cast<uint32_t>(bytes.size());
    if (plist_is_binary(data, length)) {
        plist_from_bin(data, length, &root);
    } else {
        // libplist's XML reader needs a text it can scan to the end: give it a
        // NUL-terminated copy so that nothing is read past the buffer.
        std::string text(data, length);
        plist_from_xml(text.c_str(), length, &root);
    }
    PlistPtr owner(root);
    if (!root) {
        result.error = "not a property list (malformed or truncated)";
        return result;
    }
    Value v;
    if (!toValue(root, 0, v, result.error)) return result;
    result.value = std::move(v);
    return result;
}

PropertyListResult PropertyListSerialization::readDictionary(ByteView bytes) {
    PropertyListResult result = read(bytes);
    if (result && !result.value->isDictionary()) {
        result.error = std::string("property list root is ") + result.value->typeName() + ", not a dictionary";
        result.value.reset();
    }
    return result;
}

std::optional<Bytes> PropertyListSerialization::write(const Value& value, Format format) {
    PlistPtr root(fromValue(value));
    if (!root) return std::nullopt;
    char* out = nullptr;
    uint32_t length = 0;
    if (format == Format::XML)
        plist_to_xml(root.get(), &out, &length);
    else
        plist_to_bin(root.get(), &out, &length);
    if (!out) return std::nullopt;
    Bytes bytes(reinterpret_cast<uint8_t*>(out), reinterpret_cast<uint8_t*>(out) + length);
    if (format == Format::XML)
        plist_to_xml_free(out);
    else
        plist_to_bin_free(out);
    return bytes;
}

std::optional<std::string> PropertyListSerialization::writeXML(const Value& value) {
    auto bytes = write(value, Format::XML);
    if (!bytes) return std::nullopt;
    return std::string(bytes->begin(), bytes->end());
}

}  // namespace vantorel

// Value: one property-list value (scalars by value, containers by shared reference).
#include "PropertyList/Value.h"

#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"

#include <cmath>
#include <limits>

namespace vantorel {

Value::Value(const char* s) : v_(std::string(s ? s : "")) {}
Value::Value(std::string s) : v_(std::move(s)) {}
Value::Value(DictionaryRef d) {
    if (d) v_ = std::move(d);
}
Value::Value(ArrayRef a) {
    if (a) v_ = std::move(a);
}

Value Value::integer(int64_t v) {
    Value r;
    r.v_ = v;
    return r;
}
Value Value::real(double v) {
    Value r;
    r.v_ = v;
    return r;
}
Value Value::boolean(bool v) {
    Value r;
    r.v_ = v;
    return r;
}
Value Value::data(Bytes bytes) {
    Value r;
    r.v_ = std::move(bytes);
    return r;
}
Value Value::date(Date d) {
    Value r;
    r.v_ = d;
    return r;
}

Value::Type Value::type() const {
    return static_cast<Type>(v_.index());
}

const char* Value::typeName() const {
    static const char* const names[] = {"null", "string", "integer", "real", "boolean",
                                        "data", "date", "dictionary", "array"};
    return names[v_.index()];
}

const std::string* Value::asString() const { return std::get_if<std::string>(&v_); }

std::optional<int64_t> Value::asInteger() const {
    if (auto p = std::get_if<int64_t>(&v_)) return *p;
    return std::nullopt;
}

std::optional<double> Value::asReal() const {
    if (auto p = std::get_if<double>(&v_)) return *p;
    return std::nullopt;
}

std::optional<bool> Value::asBoolean() const {
    if (auto p = std::get_if<bool>(&v_)) return *p;
    return std::nullopt;
}

const Bytes* Value::asData() const { return std::get_if<Bytes>(&v_); }

std::optional<Date> Value::asDate() const {
    if (auto p = std::get_if<Date>(&v_)) return *p;
    return std::nullopt;
}

DictionaryRef Value::asDictionary() const {
    if (auto p = std::get_if<DictionaryRef>(&v_)) return *p;
    return nullptr;
}

ArrayRef Value::asArray() const {
    if (auto p = std::get_if<ArrayRef>(&v_)) return *p;
    return nullptr;
}

std::optional<int32_t> Value::asInt32() const {
    // Like a number object's intValue: the low 32 bits of an integer, a real
    // truncated when it fits.
    if (auto p = std::get_if<int64_t>(&v_)) return static_cast<int32_t>(*p);
    if (auto p = std::get_if<double>(&v_)) {
        if (std::isfinite(*p) && *p >= std::numeric_limits<int32_t>::min() &&
            *p <= std::numeric_limits<int32_t>::max())
            return static_cast<int32_t>(*p);
    }
    return std::nullopt;
}

Value Value::deepCopy() const {
    if (auto d = asDictionary()) return Value(d->deepCopy());
    if (auto a = asArray()) return Value(a->deepCopy());
    return *this;
}

bool Value::operator==(const Value& other) const {
    if (v_.index() != other.v_.index()) return false;
    if (auto d = asDictionary()) return *d == *other.asDictionary();
    if (auto a = asArray()) return *a == *other.asArray();
    return v_ == other.v_;
}

}  // namespace vantorel

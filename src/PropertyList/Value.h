// Value: one property-list value (string, integer, real, boolean, data, date, dictionary, array).
#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <variant>
#include <vector>

namespace vantorel {

class Dictionary;
class Array;
using DictionaryRef = std::shared_ptr<Dictionary>;
using ArrayRef = std::shared_ptr<Array>;
using Bytes = std::vector<uint8_t>;
using ByteView = std::span<const uint8_t>;

// A property-list date: seconds since 1970-01-01 00:00:00 UTC (fractions allowed).
struct Date {
    double secondsSince1970 = 0;
    bool operator==(const Date&) const = default;
};

// A property-list value. Scalars are held by value; dictionaries and arrays are held
// by shared reference, so that a section can write into a container that the display
// dictionary owns.
class Value {
public:
    enum class Type { Null, String, Integer, Real, Boolean, Data, Date, Dictionary, Array };

    Value() = default;  // the null value
    Value(const char* s);
    Value(std::string s);
    Value(DictionaryRef d);
    Value(ArrayRef a);
    static Value integer(int64_t v);
    static Value real(double v);
    static Value boolean(bool v);
    static Value data(Bytes bytes);
    static Value date(Date d);

    Type type() const;
    const char* typeName() const;
    bool isNull() const { return type() == Type::Null; }
    bool isString() const { return type() == Type::String; }
    bool isDictionary() const { return type() == Type::Dictionary; }
    bool isArray() const { return type() == Type::Array; }
    bool isData() const { return type() == Type::Data; }

    // Typed access: null/empty when the value is of another type.
    const std::string* asString() const;
    std::optional<int64_t> asInteger() const;
    std::optional<double> asReal() const;
    std::optional<bool> asBoolean() const;
    const Bytes* asData() const;
    std::optional<Date> asDate() const;
    DictionaryRef asDictionary() const;
    ArrayRef asArray() const;

    // A number read as a signed 32-bit integer: an integer's low 32 bits, or a real
    // truncated toward zero (2.9 gives 2, -2.9 gives -2) when it lies within the
    // 32-bit range; empty for anything else (strings, non-finite or out-of-range reals).
    std::optional<int32_t> asInt32() const;

    // A copy that shares no container with this one, so later writes to either
    // never show in the other.
    Value deepCopy() const;

    // Structural equality (containers compared by content).
    bool operator==(const Value& other) const;

private:
    std::variant<std::monostate, std::string, int64_t, double, bool, Bytes, Date, DictionaryRef, ArrayRef> v_;
};

}  // namespace vantorel

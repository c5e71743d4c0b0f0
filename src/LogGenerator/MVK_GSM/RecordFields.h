// RecordFields: table-driven decoding of fixed-offset record fields (number or enumeration text) into display keys.
#pragma once

#include "PropertyList/Value.h"

#include <cstddef>
#include <cstdint>
#include <functional>
#include <span>
#include <string>
#include <vector>

namespace vantorel {

class ByteReader;

// Many GSM records are a handful of bytes at fixed offsets, each shown under one key
// either as a number or as the text of a small enumeration. The sections list those
// fields as constant tables and leave reading and formatting to this class.
class RecordFields {
public:
    enum class Kind {
        Signed,    // "%d" of the value taken as a signed 32-bit number, then the suffix
        Unsigned,  // "%u" of the value, then the suffix
        Text,      // `special` value -> specialText, else texts[value], else `other`
    };

    // One field: `width` little-endian bytes (1, 2 or 4) at `offset`, shifted right by
    // `shift` and masked with `mask` before it is shown.
    struct Field {
        const char* key;
        size_t offset;
        Kind kind;
        unsigned width = 1;
        uint32_t mask = 0xFFFFFFFF;
        unsigned shift = 0;
        const char* suffix = "";
        std::span<const char* const> texts = {};
        const char* other = "Unknown";
        uint32_t special = 0;
        const char* specialText = nullptr;

        // The same field read from bits [shift, shift + count) of its bytes.
        constexpr Field bits(unsigned from, unsigned count) const {
            Field f = *this;
            f.shift = from;
            f.mask = (1u << count) - 1;
            return f;
        }
    };

    static constexpr Field number(const char* key, size_t offset, unsigned width = 1, const char* suffix = "") {
        return {key, offset, Kind::Signed, width, 0xFFFFFFFF, 0, suffix};
    }
    static constexpr Field unsignedNumber(const char* key, size_t offset, unsigned width = 1) {
        return {key, offset, Kind::Unsigned, width};
    }
    // Enumeration by table; `notAvailable` (when given) is the text of the byte 255.
    static constexpr Field text(const char* key, size_t offset, std::span<const char* const> texts,
                                const char* other = "Unknown", const char* notAvailable = nullptr) {
        return {key, offset, Kind::Text, 1, 0xFFFFFFFF, 0, "", texts, other, 255, notAvailable};
    }
    // Zero and non-zero byte.
    static constexpr Field flag(const char* key, size_t offset, const char* zero, const char* nonZero) {
        return {key, offset, Kind::Text, 1, 0xFFFFFFFF, 0, "", {}, nonZero, 0, zero};
    }

    // The fields one log code carries and the length below which its record is ignored.
    struct Record {
        int32_t code;
        size_t minLength;
        std::span<const Field> fields;
    };

    using SetValue = std::function<void(const std::string& key, const std::string& text)>;

    // Shows the fields in table order. A field not wholly inside the reader shows 0.
    static void show(const ByteReader& reader, std::span<const Field> fields, const SetValue& setValue);
    // Shows the fields of the record row for `code` when the record is long enough.
    // False when no row has that code.
    static bool showRecord(ByteView record, int32_t code, std::span<const Record> records, const SetValue& setValue);
    // The codes of the rows, in row order.
    static std::vector<int32_t> codes(std::span<const Record> records);
    // The fields as a new dictionary (one row of a list).
    static Value dictionary(const ByteReader& entry, std::span<const Field> fields);

private:
    static std::string format(const ByteReader& reader, const Field& field);
};

}  // namespace vantorel

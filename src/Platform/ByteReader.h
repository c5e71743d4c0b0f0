// ByteReader: the one bounds-checked little-endian reader through which every record, frame and file is read.
#pragma once

#include "PropertyList/Value.h"

#include <cstdint>
#include <optional>

namespace vantorel {

// Every read names an absolute offset and returns nothing when any byte of it lies
// outside the buffer; nothing is ever read past the end.
class ByteReader {
public:
    explicit ByteReader(ByteView data) : data_(data) {}

    size_t size() const { return data_.size(); }
    ByteView bytes() const { return data_; }
    // True when [offset, offset + width) lies inside the buffer.
    bool has(size_t offset, size_t width) const {
        return offset <= data_.size() && width <= data_.size() - offset;
    }

    std::optional<uint8_t> u8(size_t offset) const;
    std::optional<uint16_t> u16(size_t offset) const;
    std::optional<int16_t> s16(size_t offset) const;
    std::optional<uint32_t> u32(size_t offset) const;
    std::optional<int32_t> s32(size_t offset) const;
    std::optional<uint64_t> u64(size_t offset) const;
    // Big-endian 16 bits (byte at offset is the high byte).
    std::optional<uint16_t> u16be(size_t offset) const;

    // The bytes from offset to the end (empty when offset is at or past the end).
    ByteView from(size_t offset) const;
    // Exactly length bytes at offset, or nothing when they do not all fit.
    std::optional<ByteView> slice(size_t offset, size_t length) const;

private:
    ByteView data_;
};

}  // namespace vantorel

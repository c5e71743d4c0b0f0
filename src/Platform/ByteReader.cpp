// ByteReader: bounds-checked little-endian reads that return nothing past the end of the buffer.
#include "Platform/ByteReader.h"

namespace vantorel {

std::optional<uint8_t> ByteReader::u8(size_t offset) const {
    if (!has(offset, 1)) return std::nullopt;
    return data_[offset];
}

std::optional<uint16_t> ByteReader::u16(size_t offset) const {
    if (!has(offset, 2)) return std::nullopt;
    return static_cast<uint16_t>(data_[offset] | (data_[offset + 1] << 8));
}

std::optional<int16_t> ByteReader::s16(size_t offset) const {
    auto v = u16(offset);
    if (!v) return std::nullopt;
    return static_cast<int16_t>(*v);
}

std::optional<uint32_t> ByteReader::u32(size_t offset) const {
    if (!has(offset, 4)) return std::nullopt;
    uint32_t v = 0;
    for (int i = 3; i >= 0; --i) v = (v << 8) | data_[offset + static_cast<size_t>(i)];
    return v;
}

std::optional<int32_t> ByteReader::s32(size_t offset) const {
    auto v = u32(offset);
    if (!v) return std::nullopt;
    return static_cast<int32_t>(*v);
}

std::optional<uint64_t> ByteReader::u64(size_t offset) const {
    if (!has(offset, 8)) return std::nullopt;
    uint64_t v = 0;
    for (int i = 7; i >= 0; --i) v = (v << 8) | data_[offset + static_cast<size_t>(i)];
    return v;
}

std::optional<uint16_t> ByteReader::u16be(size_t offset) const {
    if (!has(offset, 2)) return std::nullopt;
    return static_cast<uint16_t>((data_[offset] << 8) | data_[offset + 1]);
}

ByteView ByteReader::from(size_t offset) const {
    if (offset >= data_.size()) return {};
    return data_.subspan(offset);
}

std::optional<ByteView> ByteReader::slice(size_t offset, size_t length) const {
    if (!has(offset, length)) return std::nullopt;
    return data_.subspan(offset, length);
}

}  // namespace vantorel

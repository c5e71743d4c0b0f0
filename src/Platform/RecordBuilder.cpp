// RecordBuilder: Morvek-channel log records (type, DLF length, code, time stamp, payload) for tests and the emulator.
#include "Platform/RecordBuilder.h"

#include "Platform/LogCodes.h"
#include "PropertyList/PropertyListSerialization.h"

#include <algorithm>

namespace vantorel {

RecordBuilder::RecordBuilder(uint8_t type, int32_t code, size_t totalLength)
    : record_(std::max(totalLength, kHeaderLength), 0) {
    record_[0] = type;
    put(record_, 3, static_cast<uint16_t>(code & 0xFFFF), 2);
}

RecordBuilder RecordBuilder::ordinary(int32_t code, size_t totalLength) {
    return RecordBuilder(LogCode::kOrdinaryType, code, totalLength);
}

RecordBuilder RecordBuilder::extra(int32_t code, size_t totalLength) {
    return RecordBuilder(LogCode::kExtraType, code, totalLength);
}

Bytes RecordBuilder::extraPropertyList(int32_t code, const Value& value, bool binary) {
    auto payload = PropertyListSerialization::write(
        value, binary ? PropertyListSerialization::Format::Binary : PropertyListSerialization::Format::XML);
    RecordBuilder b = extra(code);
    if (payload) b.bytes(kHeaderLength, ByteView(*payload));
    return b.build();
}

void RecordBuilder::put(Bytes& buf, size_t offset, uint64_t v, size_t width) {
    if (buf.size() < offset + width) buf.resize(offset + width, 0);
    for (size_t i = 0; i < width; ++i) buf[offset + i] = static_cast<uint8_t>(v >> (8 * i));
}

RecordBuilder& RecordBuilder::u8(size_t offset, uint8_t v) {
    put(record_, offset, v, 1);
    return *this;
}
RecordBuilder& RecordBuilder::u16(size_t offset, uint16_t v) {
    put(record_, offset, v, 2);
    return *this;
}
RecordBuilder& RecordBuilder::u16be(size_t offset, uint16_t v) {
    put(record_, offset, static_cast<uint16_t>((v >> 8) | (v << 8)), 2);
    return *this;
}
RecordBuilder& RecordBuilder::u32(size_t offset, uint32_t v) {
    put(record_, offset, v, 4);
    return *this;
}
RecordBuilder& RecordBuilder::u64(size_t offset, uint64_t v) {
    put(record_, offset, v, 8);
    return *this;
}
RecordBuilder& RecordBuilder::bytes(size_t offset, std::initializer_list<uint8_t> values) {
    return bytes(offset, ByteView(values.begin(), values.size()));
}
RecordBuilder& RecordBuilder::bytes(size_t offset, ByteView values) {
    if (record_.size() < offset + values.size()) record_.resize(offset + values.size(), 0);
    std::copy(values.begin(), values.end(), record_.begin() + static_cast<std::ptrdiff_t>(offset));
    return *this;
}
RecordBuilder& RecordBuilder::resize(size_t totalLength) {
    record_.resize(totalLength, 0);
    return *this;
}

Bytes RecordBuilder::build() const {
    Bytes out = record_;
    // The DLF length (bytes 1..2) counts the record after the type byte; a record
    // cut below 3 bytes by resize() has no room for it and is returned as it is.
    if (out.size() >= 3) {
        size_t dlfLength = out.size() - 1;
        out[1] = static_cast<uint8_t>(dlfLength);
        out[2] = static_cast<uint8_t>(dlfLength >> 8);
    }
    return out;
}

Bytes RecordBuilder::buildWithPrefix() const {
    Bytes out{0x81, 0x00};
    Bytes r = build();
    out.insert(out.end(), r.begin(), r.end());
    return out;
}

}  // namespace vantorel

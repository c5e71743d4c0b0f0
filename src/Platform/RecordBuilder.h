// RecordBuilder: builds Morvek-channel log records for tests and the modem emulator alike.
#pragma once

#include "PropertyList/Value.h"

#include <cstdint>
#include <initializer_list>

namespace vantorel {

// Record layout (offsets count from the record start, as every decoder section does):
//   0      1 byte   record type: 1 ordinary, 255 extra
//   1..2   u16 LE   length of the DLF record that follows the type byte (12 + payload)
//   3..4   u16 LE   log code
//   5..12  u64 LE   time stamp (never read by the decoders)
//   13..   payload
// Fields are written at record offsets, growing the record as needed, so a test
// can copy a record's field table line for line: RecordBuilder::ordinary(0x7135, 28).u8(14, 3).
class RecordBuilder {
public:
    static constexpr size_t kHeaderLength = 13;

    // A record of the given type (LogCode::kOrdinaryType, kExtraType, or any byte for a
    // malformed record) and code, zero-filled to totalLength bytes (at least the header).
    // Codes are LogCode constants; only their low 16 bits are written, so an extra
    // record may be named by its effective code (LogCode::kCellMonitor) or by 1.
    RecordBuilder(uint8_t type, int32_t code, size_t totalLength = kHeaderLength);
    static RecordBuilder ordinary(int32_t code, size_t totalLength = kHeaderLength);
    static RecordBuilder extra(int32_t code, size_t totalLength = kHeaderLength);
    // An extra record whose payload (from offset 13) is the value serialised as a
    // property list (XML by default, as the telephony service sends it).
    static Bytes extraPropertyList(int32_t code, const Value& value, bool binary = false);

    RecordBuilder& u8(size_t offset, uint8_t v);
    RecordBuilder& u16(size_t offset, uint16_t v);
    RecordBuilder& u16be(size_t offset, uint16_t v);
    RecordBuilder& u32(size_t offset, uint32_t v);
    RecordBuilder& u64(size_t offset, uint64_t v);
    RecordBuilder& bytes(size_t offset, std::initializer_list<uint8_t> values);
    RecordBuilder& bytes(size_t offset, ByteView values);
    RecordBuilder& timestamp(uint64_t ts) { return u64(5, ts); }
    // Sets the record's total length (zero-filling or cutting).
    RecordBuilder& resize(size_t totalLength);

    // The record; with the DLF length field at 1..2 kept equal to size - 1.
    Bytes build() const;
    // The record behind the channel's optional two-byte prefix 0x81 0x00, which some modems send.
    Bytes buildWithPrefix() const;

    // Writes v little-endian (width bytes) into buf at offset, growing buf.
    static void put(Bytes& buf, size_t offset, uint64_t v, size_t width);

private:
    Bytes record_;
};

}  // namespace vantorel

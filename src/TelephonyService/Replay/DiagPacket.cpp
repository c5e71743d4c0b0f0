// DiagPacket: classifies one deframed DIAG body and splits a log packet into the DLF record the decoders read (DESIGN.md "The telephony service", Replay/).
#include "TelephonyService/Replay/DiagPacket.h"

#include "Platform/ByteReader.h"
#include "Platform/StringFormat.h"

namespace vantorel {

DiagPacket::DiagPacket(ByteView body) : inner_(body) {
    ByteReader outer(body);
    // Dual-SIM phones wrap a body in 98 01 00 00 <subscription id u32>. Only that exact
    // prefix is a wrapper; any other 0x98 body is some command response.
    if (outer.u8(0) == kMultiSimCommand && outer.u8(1) == 0x01 && outer.u8(2) == 0x00 && outer.u8(3) == 0x00) {
        auto id = outer.u32(4);
        if (!id) {
            kind_ = Kind::Malformed;
            error_ = StringFormat::format("dual-SIM wrapper cut short: %zu of %zu bytes", body.size(),
                                          kMultiSimWrapperLength);
            return;
        }
        subscriptionId_ = *id;
        inner_ = outer.from(kMultiSimWrapperLength);
    }
    if (ByteReader(inner_).u8(0) == kLogCommand) parseLogPacket();
}

void DiagPacket::parseLogPacket() {
    // Offsets in the inner body:
    //   0 cmd 0x10 | 1 more | 2..3 outer len | 4..5 inner len | 6..7 log code | 8..15 time stamp | 16.. payload
    ByteReader r(inner_);
    kind_ = Kind::Malformed;
    const auto outerLength = r.u16(2);
    const auto innerLength = r.u16(4);
    const auto code = r.u16(6);
    const auto stamp = r.u64(8);
    if (!outerLength || !innerLength || !code || !stamp) {
        error_ = StringFormat::format("log packet of %zu bytes, shorter than its %zu-byte header", inner_.size(),
                                      kCommandHeaderLength + kLogHeaderLength);
        return;
    }
    if (*outerLength != *innerLength) {
        error_ = StringFormat::format("log packet lengths differ: outer %u, inner %u", unsigned(*outerLength),
                                      unsigned(*innerLength));
        return;
    }
    if (*innerLength < kLogHeaderLength) {
        error_ = StringFormat::format("log packet length %u is below the %zu-byte log header", unsigned(*innerLength),
                                      kLogHeaderLength);
        return;
    }
    const size_t available = inner_.size() - kCommandHeaderLength;
    if (*innerLength > available) {
        error_ = StringFormat::format("log packet length %u runs past the body (%zu bytes after the command header)",
                                      unsigned(*innerLength), available);
        return;
    }
    if (*innerLength < available) {
        // A modem's log packet always ends with its record; extra bytes mean the body
        // is not what its header says.
        error_ = StringFormat::format("log packet length %u leaves %zu bytes over at the end of the body",
                                      unsigned(*innerLength), available - *innerLength);
        return;
    }
    kind_ = Kind::LogPacket;
    logCode_ = *code;
    timeStamp_ = *stamp;
    dlfRecord_ = r.from(kCommandHeaderLength);
    payload_ = r.from(kCommandHeaderLength + kLogHeaderLength);
}

std::optional<uint8_t> DiagPacket::command() const {
    return ByteReader(inner_).u8(0);
}

Bytes DiagPacket::morvekRecord() const {
    if (!isLogPacket()) return {};
    return morvekRecordFromDlf(dlfRecord_);
}

Bytes DiagPacket::morvekRecordFromDlf(ByteView dlfRecord) {
    Bytes record;
    record.reserve(1 + dlfRecord.size());
    record.push_back(kMorvekOrdinaryType);
    record.insert(record.end(), dlfRecord.begin(), dlfRecord.end());
    return record;
}

int64_t DiagPacket::microsecondsSince1970(uint64_t diagTimeStamp) {
    // 1 tick = 1.25 ms = 1250 us. 2^48 ticks * 1250 < 2^63, so nothing overflows.
    const int64_t ticks = static_cast<int64_t>(diagTimeStamp >> 16);
    const int64_t fraction = static_cast<int64_t>(diagTimeStamp & 0xFFFF);
    return kGpsEpochSeconds * 1000000 + ticks * 1250 + (fraction * 1250) / 65536;
}

}  // namespace vantorel

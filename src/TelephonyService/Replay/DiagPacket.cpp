// DiagPacket: classifies one deframed DIAG body and splits a log packet into the DLF record the decoders read.
#include "TelephonyService/Replay/DiagPacket.h"

#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/StringFormat.h"
#include "TelephonyService/LogMask.h"

namespace vantorel {

DiagPacket::DiagPacket(ByteView body) : inner_(body) {
    const ByteReader outer(body);
    // Dual-SIM phones wrap a body in 98 01 00 00 <subscription id u32>. Only that exact
    // prefix is a wrapper; any other 0x98 body is some command response.
    const bool wrapped = outer.has(0, 4) && outer.u32(0).value_or(0) == kMultiSimPrefix;
    if (wrapped) {
        if (!outer.has(0, kMultiSimWrapperLength)) {
            kind_ = Kind::Malformed;
            error_ = StringFormat::format("dual-SIM wrapper cut short: %zu of %zu bytes", body.size(),
                                          kMultiSimWrapperLength);
            return;
        }
        subscriptionId_ = outer.u32(4).value_or(0);
        inner_ = outer.from(kMultiSimWrapperLength);
    }
    if (command() == kLogCommand) parseLogPacket();
}

void DiagPacket::parseLogPacket() {
    // Offsets in the inner body:
    //   0 cmd 0x10 | 1 more | 2..3 outer len | 4..5 inner len | 6..7 log code | 8..15 time stamp | 16.. payload
    const ByteReader r(inner_);
    kind_ = Kind::Malformed;
    if (!r.has(0, kCommandHeaderLength + kLogHeaderLength)) {
        error_ = StringFormat::format("log packet of %zu bytes, shorter than its %zu-byte header", inner_.size(),
                                      kCommandHeaderLength + kLogHeaderLength);
        return;
    }
    const uint16_t outerLength = r.u16(2).value_or(0);
    const uint16_t innerLength = r.u16(4).value_or(0);
    if (outerLength != innerLength) {
        error_ = StringFormat::format("log packet lengths differ: outer %u, inner %u", unsigned(outerLength),
                                      unsigned(innerLength));
        return;
    }
    if (innerLength < kLogHeaderLength) {
        error_ = StringFormat::format("log packet length %u is below the %zu-byte log header", unsigned(innerLength),
                                      kLogHeaderLength);
        return;
    }
    const size_t available = inner_.size() - kCommandHeaderLength;
    if (innerLength > available) {
        error_ = StringFormat::format("log packet length %u runs past the body (%zu bytes after the command header)",
                                      unsigned(innerLength), available);
        return;
    }
    if (innerLength < available) {
        // A modem's log packet always ends with its record; extra bytes mean the body
        // is not what its header says.
        error_ = StringFormat::format("log packet length %u leaves %zu bytes over at the end of the body",
                                      unsigned(innerLength), available - innerLength);
        return;
    }
    kind_ = Kind::LogPacket;
    logCode_ = r.u16(6).value_or(0);
    timeStamp_ = r.u64(8).value_or(0);
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
    record.push_back(LogCode::kOrdinaryType);
    record.insert(record.end(), dlfRecord.begin(), dlfRecord.end());
    return record;
}

Bytes DiagPacket::logPacketFromRecord(ByteView morvekRecord) {
    const std::optional<LogMask::Classification> kind = LogMask::classify(morvekRecord);
    if (!kind || !kind->isOrdinary()) return {};
    const ByteReader whole(morvekRecord);
    const ByteView record = whole.u8(0) == LogMask::kPrefixByte ? whole.from(LogMask::kPrefixLength) : morvekRecord;
    const ByteView dlf = ByteReader(record).from(1);
    if (dlf.size() < kLogHeaderLength || dlf.size() > 0xFFFF) return {};
    Bytes body{kLogCommand, 0x00, static_cast<uint8_t>(dlf.size() & 0xFF), static_cast<uint8_t>(dlf.size() >> 8)};
    body.insert(body.end(), dlf.begin(), dlf.end());
    return body;
}

int64_t DiagPacket::microsecondsSince1970(uint64_t diagTimeStamp) {
    // 1 tick = 1.25 ms = 1250 us. 2^48 ticks * 1250 < 2^63, so nothing overflows.
    const int64_t ticks = static_cast<int64_t>(diagTimeStamp >> 16);
    const int64_t fraction = static_cast<int64_t>(diagTimeStamp & 0xFFFF);
    return kGpsEpochSeconds * 1000000 + ticks * 1250 + (fraction * 1250) / 65536;
}

}  // namespace vantorel

// DiagPacket: one deframed DIAG body, classified and, for a log packet, split into code, time stamp and payload.
#pragma once

#include "PropertyList/Value.h"

#include <cstdint>
#include <optional>
#include <string>

namespace vantorel {

// Body layouts (after HDLC deframing, CRC removed):
//   dual-SIM wrapper:  98 01 00 00 <subscription id u32 LE> <inner body>
//   log packet:        10 <more u8> <len u16 LE> <len u16 LE> <log code u16 LE> <time stamp u64 LE> <payload>
//                      both lengths = 12 + payload length = body length - 4
//                      bytes 4.. are a QXDM DLF record: <len> <code> <time stamp> <payload>
//   anything else (0x79/0x92 text messages, 0x60 events, command responses, EE EE
//   records of the recording tool) is not a log packet.
// The packet views the body it was made from: the body must outlive it.
class DiagPacket {
public:
    enum class Kind {
        LogPacket,     // a well-formed log packet
        NotLogPacket,  // some other DIAG body
        Malformed,     // a log packet whose lengths do not hold, or a cut dual-SIM wrapper (see error())
    };

    static constexpr uint8_t kLogCommand = 0x10;
    // The wrapper's first four bytes 98 01 00 00, read as a little-endian u32.
    static constexpr uint32_t kMultiSimPrefix = 0x00000198;
    static constexpr size_t kMultiSimWrapperLength = 8;
    static constexpr size_t kCommandHeaderLength = 4;  // 10 <more> <len>
    static constexpr size_t kLogHeaderLength = 12;     // <len> <code> <time stamp>

    explicit DiagPacket(ByteView body);
    // The packet keeps views into its body: a temporary buffer would dangle.
    explicit DiagPacket(Bytes&& body) = delete;

    Kind kind() const { return kind_; }
    bool isLogPacket() const { return kind_ == Kind::LogPacket; }
    // Why a Malformed body was rejected; empty for the other kinds.
    const std::string& error() const { return error_; }

    // The subscription id of a dual-SIM wrapper, when the body had one.
    std::optional<uint32_t> subscriptionId() const { return subscriptionId_; }
    // First byte of the inner body (the DIAG command code), empty for an empty body.
    std::optional<uint8_t> command() const;

    // Log-packet fields: zero / empty unless isLogPacket().
    uint16_t logCode() const { return logCode_; }
    uint64_t timeStamp() const { return timeStamp_; }
    ByteView payload() const { return payload_; }
    // The Morvek-channel record the decoders read: type byte 1 + the DLF record;
    // empty unless isLogPacket().
    Bytes morvekRecord() const;
    // Type byte 1 + a DLF record <len> <code> <time stamp> <payload>: the Morvek record of any DLF record (DlfReader uses it too).
    static Bytes morvekRecordFromDlf(ByteView dlfRecord);
    // The other way, as a modem sends it: the log packet body 10 00 <len u16> <DLF record>
    // of an ordinary Morvek record (after the optional 0x81 prefix); empty for any other
    // message (extra records, IFX messages, junk without a full log header).
    static Bytes logPacketFromRecord(ByteView morvekRecord);

    // A DIAG time stamp as microseconds since 1970-01-01 00:00:00 UTC: the upper 48 bits
    // count 1.25 ms ticks since 1980-01-06 00:00:00 UTC (the GPS epoch), the lower 16 bits
    // are a fraction of a tick in 1/65536 (rounded down to whole microseconds).
    static int64_t microsecondsSince1970(uint64_t diagTimeStamp);
    // 1980-01-06 00:00:00 UTC in seconds since 1970.
    static constexpr int64_t kGpsEpochSeconds = 315964800;

private:
    void parseLogPacket();

    Kind kind_ = Kind::NotLogPacket;
    std::string error_;
    std::optional<uint32_t> subscriptionId_;
    ByteView inner_;
    uint16_t logCode_ = 0;
    uint64_t timeStamp_ = 0;
    ByteView payload_;
    ByteView dlfRecord_;  // <len> <code> <time stamp> <payload>: the inner body after its first 4 bytes
};

}  // namespace vantorel

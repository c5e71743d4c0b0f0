// DiagTestFrames: test-side builders of HDLC frames and DIAG bodies (log packets, dual-SIM wrapper) for the Replay reader tests.
#pragma once

#include <algorithm>

#include "Platform/RecordBuilder.h"
#include "PropertyList/Value.h"

#include <cstdint>
#include <initializer_list>
#include <string>

namespace vantorel::testframes {

// Bit-by-bit CRC-16/X.25 (reflected poly 0x8408, init 0xFFFF, xorout 0xFFFF), written
// independently of HdlcDeframer's table so the two check each other.
inline uint16_t referenceCrc16(ByteView data) {
    uint16_t crc = 0xFFFF;
    for (uint8_t b : data) {
        crc ^= b;
        for (int bit = 0; bit < 8; ++bit) crc = (crc & 1) ? static_cast<uint16_t>((crc >> 1) ^ 0x8408) : static_cast<uint16_t>(crc >> 1);
    }
    return static_cast<uint16_t>(crc ^ 0xFFFF);
}

// escape(body + CRC16 LE) + 7E; crcXor spoils the CRC on purpose when non-zero.
inline Bytes hdlcFrame(ByteView body, uint16_t crcXor = 0) {
    Bytes raw(body.begin(), body.end());
    const uint16_t crc = static_cast<uint16_t>(referenceCrc16(body) ^ crcXor);
    raw.push_back(static_cast<uint8_t>(crc));
    raw.push_back(static_cast<uint8_t>(crc >> 8));
    Bytes out;
    for (uint8_t b : raw) {
        if (b == 0x7E || b == 0x7D) {
            out.push_back(0x7D);
            out.push_back(static_cast<uint8_t>(b ^ 0x20));
        } else {
            out.push_back(b);
        }
    }
    out.push_back(0x7E);
    return out;
}

inline Bytes hdlcFrame(std::initializer_list<uint8_t> body, uint16_t crcXor = 0) {
    return hdlcFrame(ByteView(body.begin(), body.size()), crcXor);
}

// A DIAG log packet: 10 00 <len> <len> <code> <time stamp> <payload>, len = 12 + payload.
// The record part is built by RecordBuilder (type byte 1 + DLF record), so the packet is
// 10 00 <len> followed by that record without its type byte.
inline Bytes logPacketBody(uint16_t code, uint64_t timeStamp, ByteView payload) {
    Bytes morvek = RecordBuilder::ordinary(code).timestamp(timeStamp).bytes(13, payload).build();
    const size_t length = morvek.size() - 1;
    Bytes body(4 + length, 0);
    body[0] = 0x10;
    RecordBuilder::put(body, 2, length, 2);
    std::copy(morvek.begin() + 1, morvek.end(), body.begin() + 4);
    return body;
}

inline Bytes logPacketBody(uint16_t code, uint64_t timeStamp, std::initializer_list<uint8_t> payload) {
    return logPacketBody(code, timeStamp, ByteView(payload.begin(), payload.size()));
}

// The Morvek record the readers should give for that log packet.
inline Bytes morvekRecord(uint16_t code, uint64_t timeStamp, std::initializer_list<uint8_t> payload) {
    return RecordBuilder::ordinary(code).timestamp(timeStamp).bytes(13, ByteView(payload.begin(), payload.size())).build();
}

// 98 01 00 00 <subscription id u32 LE> <inner body>
inline Bytes dualSimWrapped(uint32_t subscriptionId, ByteView inner) {
    Bytes body{0x98, 0x01, 0x00, 0x00};
    RecordBuilder::put(body, 4, subscriptionId, 4);
    body.insert(body.end(), inner.begin(), inner.end());
    return body;
}

inline void append(Bytes& out, ByteView more) { out.insert(out.end(), more.begin(), more.end()); }

}  // namespace vantorel::testframes

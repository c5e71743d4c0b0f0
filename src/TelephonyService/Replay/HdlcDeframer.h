// HdlcDeframer: streaming HDLC deframer with CRC-16/X.25 check for recorded DIAG streams (.qmdl / .mi2log framing).
#pragma once

#include "PropertyList/Value.h"

#include <cstddef>
#include <cstdint>
#include <functional>
#include <string>
#include <vector>

namespace vantorel {

// Wire format, as a modem's DIAG port and .qmdl/.mi2log files carry it:
//   frame = escape(body + CRC16 LE) 7E        (no leading 7E; empty frames 7E 7E are skipped)
//   escape: 7D -> 7D 5D, 7E -> 7D 5E          (after 7D, the next byte XOR 0x20)
//   CRC    = CRC-16/X.25 over the unescaped body (reflected poly 0x8408, init/xorout 0xFFFF)
// Bytes may arrive in chunks of any size; a frame may straddle any number of feed() calls.
// A bad frame (wrong CRC, a dangling 7D, shorter than 3 bytes, over kMaxFrameLength) is
// counted and skipped: the stream goes on at the next flag.
class HdlcDeframer {
public:
    static constexpr uint8_t kFlag = 0x7E;
    static constexpr uint8_t kEscape = 0x7D;
    static constexpr uint8_t kEscapeXor = 0x20;
    static constexpr size_t kCrcLength = 2;
    // Smallest unescaped frame: one body byte + the CRC.
    static constexpr size_t kMinFrameLength = 3;
    // Memory guard: a frame that grows past this many unescaped bytes without a flag is
    // dropped as malformed and the bytes up to the next flag are discarded.
    static constexpr size_t kMaxFrameLength = 1u << 20;

    enum class Problem { BadCrc, Malformed, Truncated };

    // body: the unescaped frame without its CRC; only valid during the call.
    // offset: stream offset of the frame's first (escaped) byte.
    using FrameHandler = std::function<void(ByteView body, uint64_t offset)>;
    // Told about every frame that is counted as bad, with a short reason.
    using ProblemHandler = std::function<void(Problem problem, uint64_t offset, const std::string& why)>;

    struct Counters {
        size_t frames = 0;     // good frames delivered
        size_t badCrc = 0;     // frames whose CRC did not match
        size_t malformed = 0;  // dangling 7D, shorter than 3 bytes, or over kMaxFrameLength
        size_t truncated = 0;  // bytes left without a closing flag at finish()
    };

    // Without a frame handler, good frames are collected; takeFrames() hands them over.
    HdlcDeframer() = default;
    explicit HdlcDeframer(FrameHandler onFrame, ProblemHandler onProblem = {});

    void feed(ByteView chunk);
    // Ends the stream: an unclosed frame is counted as truncated. The deframer can then
    // be fed again as a new stream (counters keep adding up).
    void finish();

    // Frames collected since the last call (only when constructed without a handler).
    std::vector<Bytes> takeFrames();
    const Counters& counters() const { return counters_; }

    // CRC-16/X.25 of data (check value: 01 02 03 04 -> 0x3991).
    static uint16_t crc16(ByteView data);

private:
    void endFrame();
    void reportProblem(Problem problem, const std::string& why);

    FrameHandler onFrame_;
    ProblemHandler onProblem_;
    Bytes frame_;                 // unescaped bytes of the frame being collected
    bool escaped_ = false;        // the previous byte was 7D
    bool discarding_ = false;     // an oversize frame is being skipped up to the next flag
    bool frameStarted_ = false;   // some byte of the current frame has been seen
    uint64_t offset_ = 0;         // stream offset of the next byte fed
    uint64_t frameOffset_ = 0;    // stream offset of the current frame's first byte
    Counters counters_;
    std::vector<Bytes> collected_;
};

}  // namespace vantorel

// HdlcDeframer: streaming HDLC deframer with CRC-16/X.25 check for recorded DIAG streams.
#include "TelephonyService/Replay/HdlcDeframer.h"

#include "Platform/ByteReader.h"
#include "Platform/StringFormat.h"

#include <algorithm>
#include <array>
#include <cstring>
#include <utility>

namespace vantorel {

namespace {

// Byte-wise table for the reflected polynomial 0x8408 (CRC-16/X.25, as DIAG uses it).
constexpr std::array<uint16_t, 256> makeCrcTable() {
    std::array<uint16_t, 256> table{};
    for (unsigned i = 0; i < 256; ++i) {
        uint16_t crc = static_cast<uint16_t>(i);
        for (int bit = 0; bit < 8; ++bit) crc = (crc & 1) ? static_cast<uint16_t>((crc >> 1) ^ 0x8408) : static_cast<uint16_t>(crc >> 1);
        table[i] = crc;
    }
    return table;
}

constexpr std::array<uint16_t, 256> kCrcTable = makeCrcTable();

}  // namespace

HdlcDeframer::HdlcDeframer(FrameHandler onFrame, ProblemHandler onProblem)
    : onFrame_(std::move(onFrame)), onProblem_(std::move(onProblem)) {}

uint16_t HdlcDeframer::crc16(ByteView data) {
    uint16_t crc = 0xFFFF;
    for (uint8_t b : data) crc = static_cast<uint16_t>((crc >> 8) ^ kCrcTable[(crc ^ b) & 0xFF]);
    return static_cast<uint16_t>(crc ^ 0xFFFF);
}

void HdlcDeframer::feed(ByteView chunk) {
    const uint8_t* const begin = chunk.data();
    const uint8_t* const end = begin + chunk.size();
    // Next flag / escape at or after a position, found with memchr and remembered, so
    // runs of ordinary bytes are copied whole instead of byte by byte.
    const uint8_t* nextFlag = nullptr;
    const uint8_t* nextEscape = nullptr;
    auto find = [end](const uint8_t* from, uint8_t value, const uint8_t*& cached) {
        if (cached == nullptr || cached < from) {
            const void* hit = std::memchr(from, value, static_cast<size_t>(end - from));
            cached = hit ? static_cast<const uint8_t*>(hit) : end;
        }
        return cached;
    };
    auto startFrame = [&](const uint8_t* at) {
        if (frameStarted_) return;
        frameStarted_ = true;
        frameOffset_ = offset_ + static_cast<uint64_t>(at - begin);
    };

    const uint8_t* p = begin;
    while (p < end) {
        if (discarding_) {
            // The rest of an oversize frame: skip to its flag.
            p = find(p, kFlag, nextFlag);
            if (p == end) break;
        }
        const uint8_t b = *p;
        if (b == kFlag) {
            endFrame();
            ++p;
            continue;
        }
        startFrame(p);
        if (escaped_) {
            frame_.push_back(static_cast<uint8_t>(b ^ kEscapeXor));
            escaped_ = false;
            ++p;
        } else if (b == kEscape) {
            escaped_ = true;
            ++p;
        } else {
            const uint8_t* stop = std::min(find(p, kFlag, nextFlag), find(p, kEscape, nextEscape));
            // Never hold more than one byte over the limit (frame_ is at most the limit here).
            const size_t room = kMaxFrameLength + 1 - frame_.size();
            if (static_cast<size_t>(stop - p) > room) stop = p + room;
            frame_.insert(frame_.end(), p, stop);
            p = stop;
        }
        if (frame_.size() > kMaxFrameLength) {
            reportProblem(Problem::Malformed,
                          StringFormat::format("frame longer than %zu bytes without a flag", kMaxFrameLength));
            discarding_ = true;
            escaped_ = false;
            Bytes().swap(frame_);  // give the memory back, not just the size
        }
    }
    offset_ += chunk.size();
}

void HdlcDeframer::finish() {
    // An oversize frame being discarded was counted already.
    if (frameStarted_ && !discarding_)
        reportProblem(Problem::Truncated,
                      StringFormat::format("%zu bytes at the end without a closing flag", frame_.size() + (escaped_ ? 1 : 0)));
    frame_.clear();
    escaped_ = false;
    discarding_ = false;
    frameStarted_ = false;
}

std::vector<Bytes> HdlcDeframer::takeFrames() {
    return std::exchange(collected_, {});
}

void HdlcDeframer::endFrame() {
    if (!frameStarted_) return;  // 7E 7E: an empty frame between flags, skipped silently
    if (discarding_) {
        // The rest of an oversize frame ends here; it was counted when it grew too long.
    } else if (escaped_) {
        reportProblem(Problem::Malformed, "escape byte 7D right before the flag");
    } else if (frame_.size() < kMinFrameLength) {
        reportProblem(Problem::Malformed,
                      StringFormat::format("frame of %zu bytes, shorter than %zu", frame_.size(), kMinFrameLength));
    } else {
        const size_t bodyLength = frame_.size() - kCrcLength;
        ByteReader reader(frame_);
        const ByteView body = reader.from(0).first(bodyLength);
        const uint16_t carried = reader.u16(bodyLength).value_or(0);  // the CRC, little-endian after the body
        const uint16_t computed = crc16(body);
        if (carried != computed) {
            reportProblem(Problem::BadCrc,
                          StringFormat::format("bad CRC: computed 0x%04X, frame carries 0x%04X", computed, carried));
        } else {
            ++counters_.frames;
            if (onFrame_)
                onFrame_(body, frameOffset_);
            else
                collected_.emplace_back(body.begin(), body.end());
        }
    }
    frame_.clear();
    escaped_ = false;
    discarding_ = false;
    frameStarted_ = false;
}

void HdlcDeframer::reportProblem(Problem problem, const std::string& why) {
    switch (problem) {
    case Problem::BadCrc: ++counters_.badCrc; break;
    case Problem::Malformed: ++counters_.malformed; break;
    case Problem::Truncated: ++counters_.truncated; break;
    }
    if (onProblem_) onProblem_(problem, frameOffset_, why);
}

}  // namespace vantorel

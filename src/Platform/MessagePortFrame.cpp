// MessagePortFrame: encoding and stream decoding of message-port frames, with the process-wide limit on what decoders hold (docs/protocol.md).
#include "Platform/MessagePortFrame.h"

#include <algorithm>
#include <atomic>

#include "Platform/ByteReader.h"
#include "Platform/StringFormat.h"

namespace vantorel {

namespace {

// Bytes every decoder of the process holds beyond its own kOwnBytes (ports live on
// several threads, hence atomic).
std::atomic<size_t> pooled{0};

// Takes up to `wanted` bytes from the pool; returns how many it got.
size_t takeFromPool(size_t wanted) {
    size_t now = pooled.load();
    while (true) {
        const size_t left = now < MessagePortFrameDecoder::kPoolBytes ? MessagePortFrameDecoder::kPoolBytes - now : 0;
        const size_t grant = std::min(wanted, left);
        if (grant == 0 || pooled.compare_exchange_weak(now, now + grant)) return grant;
    }
}

void putU32(Bytes& out, size_t offset, uint32_t v) {
    for (size_t i = 0; i < 4; ++i) out[offset + i] = static_cast<uint8_t>(v >> (8 * i));
}

}  // namespace

Bytes MessagePortFrame::encode() const {
    // Header layout in MessagePortFrame.h; the reserved u16 at 2-3 stays 0.
    Bytes out(kHeaderLength + data.size(), 0);
    out[0] = static_cast<uint8_t>(kind);
    out[1] = kVersion;
    putU32(out, 4, static_cast<uint32_t>(messageId));
    putU32(out, 8, static_cast<uint32_t>(data.size()));
    std::copy(data.begin(), data.end(), out.begin() + kHeaderLength);
    return out;
}

MessagePortFrameDecoder::~MessagePortFrameDecoder() { pooled -= pooled_; }

size_t MessagePortFrameDecoder::pooledBytes() { return pooled.load(); }

size_t MessagePortFrameDecoder::admit(size_t wanted) {
    const size_t held = buffered();
    wanted = std::min(wanted, MessagePortFrame::kMaxLength - std::min(held, MessagePortFrame::kMaxLength));
    const size_t beyond = held + wanted > kOwnBytes ? held + wanted - kOwnBytes : 0;
    if (beyond > pooled_) {
        pooled_ += takeFromPool(beyond - pooled_);
        wanted -= std::min(wanted, beyond - pooled_);  // what the pool could not lend
    }
    return wanted;
}

void MessagePortFrameDecoder::settle() {
    const size_t held = buffered();
    const size_t share = held > kOwnBytes ? held - kOwnBytes : 0;
    if (share > pooled_)
        pooled += share - pooled_;  // fed without admit(): counted all the same
    else
        pooled -= pooled_ - share;
    pooled_ = share;
}

bool MessagePortFrameDecoder::headerValid() {
    const ByteReader reader(header_);
    const uint8_t kind = reader.u8(0).value_or(0);
    const uint8_t version = reader.u8(1).value_or(0);
    length_ = reader.u32(8).value_or(0);
    if (kind > static_cast<uint8_t>(MessagePortFrame::Kind::Notification))
        error_ = StringFormat::format("unknown frame kind %u", static_cast<unsigned>(kind));
    else if (version != MessagePortFrame::kVersion)
        error_ = StringFormat::format("unsupported frame version %u", static_cast<unsigned>(version));
    else if (length_ > MessagePortFrame::kMaxDataLength)
        error_ = StringFormat::format("frame length %u over the limit of %u bytes", length_,
                                      MessagePortFrame::kMaxDataLength);
    return !failed();
}

std::vector<MessagePortFrame> MessagePortFrameDecoder::feed(ByteView bytes) {
    std::vector<MessagePortFrame> frames;
    while (!failed() && !bytes.empty()) {
        if (header_.size() < MessagePortFrame::kHeaderLength) {
            const size_t n = std::min(MessagePortFrame::kHeaderLength - header_.size(), bytes.size());
            header_.insert(header_.end(), bytes.begin(), bytes.begin() + static_cast<std::ptrdiff_t>(n));
            bytes = bytes.subspan(n);
            if (header_.size() < MessagePortFrame::kHeaderLength) break;
            if (!headerValid()) {
                // The stream cannot be resynchronised: drop everything still held.
                header_.clear();
                break;
            }
        } else {
            // Into the last block while it has room, else into a new one sized for
            // what is still to come (at most kBlockLength): no block ever reallocates.
            if (blocks_.empty() || blocks_.back().size() == blocks_.back().capacity()) {
                blocks_.emplace_back().reserve(std::min<size_t>(kBlockLength, length_ - dataHeld_));
            }
            Bytes& block = blocks_.back();
            const size_t n = std::min({bytes.size(), block.capacity() - block.size(), size_t(length_ - dataHeld_)});
            block.insert(block.end(), bytes.begin(), bytes.begin() + static_cast<std::ptrdiff_t>(n));
            bytes = bytes.subspan(n);
            dataHeld_ += n;
        }
        if (header_.size() == MessagePortFrame::kHeaderLength && dataHeld_ == length_) {
            const ByteReader reader(header_);
            MessagePortFrame frame;
            frame.kind = static_cast<MessagePortFrame::Kind>(reader.u8(0).value_or(0));
            frame.messageId = reader.s32(4).value_or(0);
            if (blocks_.size() == 1) {
                frame.data = std::move(blocks_.front());
            } else {
                frame.data.reserve(length_);
                for (Bytes& block : blocks_) {
                    frame.data.insert(frame.data.end(), block.begin(), block.end());
                    Bytes().swap(block);
                }
            }
            frames.push_back(std::move(frame));
            header_.clear();
            blocks_.clear();
            dataHeld_ = 0;
        }
    }
    if (failed()) {
        blocks_.clear();
        dataHeld_ = 0;
    }
    settle();
    return frames;
}

}  // namespace vantorel

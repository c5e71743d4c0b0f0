// MessagePortFrame: the wire format of Vantorel's message ports over local sockets (docs/protocol.md).
#pragma once

#include "PropertyList/Value.h"

#include <cstdint>
#include <string>
#include <vector>

namespace vantorel {

// One frame on a message-port connection. Header, 12 bytes, little-endian:
//   0  u8   kind (0 message, 1 request wanting a reply, 2 reply, 3 notification)
//   1  u8   version, 1
//   2  u16  reserved, 0
//   4  s32  message id
//   8  u32  length of the data that follows (at most kMaxDataLength)
//  12  data
struct MessagePortFrame {
    enum class Kind : uint8_t { Message = 0, Request = 1, Reply = 2, Notification = 3 };
    static constexpr size_t kHeaderLength = 12;
    static constexpr uint8_t kVersion = 1;
    static constexpr uint32_t kMaxDataLength = 16u << 20;
    static constexpr size_t kMaxLength = kHeaderLength + kMaxDataLength;

    Kind kind = Kind::Message;
    int32_t messageId = 0;
    Bytes data;

    Bytes encode() const;
};

// Splits a byte stream into frames. A header that is not a valid frame (unknown
// kind or version, length over the limit) makes the stream unusable: error() is set
// and nothing more is decoded (the connection is then closed by its owner).
//
// Memory follows the bytes that arrived, never the length a header announces: a
// frame's data is kept in blocks of at most kBlockLength as it comes. Each decoder
// may hold kOwnBytes on its own account (every request, command and record of normal
// traffic is smaller); what it holds beyond that is lent by one pool of kPoolBytes
// shared by every decoder of the process (all ports and connections). A reader asks
// admit() how much it may read before it feeds it.
class MessagePortFrameDecoder {
public:
    static constexpr size_t kOwnBytes = 64u << 10;
    static constexpr size_t kPoolBytes = 64u << 20;
    static constexpr size_t kBlockLength = 64u << 10;

    MessagePortFrameDecoder() = default;
    ~MessagePortFrameDecoder();  // gives its share of the pool back
    MessagePortFrameDecoder(const MessagePortFrameDecoder&) = delete;
    MessagePortFrameDecoder& operator=(const MessagePortFrameDecoder&) = delete;

    // How many of `wanted` more bytes may be fed now: never more than completes one
    // frame of kMaxLength, and what goes beyond kOwnBytes is taken from the pool (and
    // held until feed() frees it). 0 when the frame being read cannot grow now: the
    // pool is spent, the sender is over the limit.
    size_t admit(size_t wanted);
    // Appends bytes and returns the frames completed by them.
    std::vector<MessagePortFrame> feed(ByteView bytes);
    bool failed() const { return !error_.empty(); }
    const std::string& error() const { return error_; }
    size_t buffered() const { return header_.size() + dataHeld_; }
    // What all decoders of the process hold from the pool now.
    static size_t pooledBytes();

private:
    bool headerValid();
    void settle();  // the pool share becomes what is held beyond kOwnBytes

    Bytes header_;              // the first bytes of the frame being read, up to kHeaderLength
    std::vector<Bytes> blocks_;  // its data so far
    size_t dataHeld_ = 0;
    uint32_t length_ = 0;  // its announced data length, once the header is complete
    size_t pooled_ = 0;    // bytes lent by the pool
    std::string error_;
};

}  // namespace vantorel

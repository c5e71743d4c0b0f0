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

    Kind kind = Kind::Message;
    int32_t messageId = 0;
    Bytes data;

    Bytes encode() const;
};

// Splits a byte stream into frames. A header that is not a valid frame (unknown
// kind or version, length over the limit) makes the stream unusable: error() is set
// and nothing more is decoded (the connection is then closed by its owner).
class MessagePortFrameDecoder {
public:
    // Appends bytes and returns the frames completed by them.
    std::vector<MessagePortFrame> feed(ByteView bytes);
    bool failed() const { return !error_.empty(); }
    const std::string& error() const { return error_; }
    size_t buffered() const { return buffer_.size(); }

private:
    Bytes buffer_;
    std::string error_;
};

}  // namespace vantorel

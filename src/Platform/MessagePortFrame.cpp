// MessagePortFrame: encoding and stream decoding of message-port frames (docs/protocol.md).
#include "Platform/MessagePortFrame.h"

#include <algorithm>

#include "Platform/ByteReader.h"
#include "Platform/StringFormat.h"

namespace vantorel {

namespace {

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

std::vector<MessagePortFrame> MessagePortFrameDecoder::feed(ByteView bytes) {
    std::vector<MessagePortFrame> frames;
    if (failed()) return frames;
    buffer_.insert(buffer_.end(), bytes.begin(), bytes.end());

    // Frames are cut from the front, each read at offsets from its own start; the
    // consumed prefix is erased once at the end.
    const ByteReader stream(buffer_);
    size_t consumed = 0;
    while (true) {
        const ByteReader reader(stream.from(consumed));
        if (!reader.has(0, MessagePortFrame::kHeaderLength)) break;
        const uint8_t kind = reader.u8(0).value_or(0);
        const uint8_t version = reader.u8(1).value_or(0);
        const int32_t messageId = reader.s32(4).value_or(0);
        const uint32_t length = reader.u32(8).value_or(0);
        if (kind > static_cast<uint8_t>(MessagePortFrame::Kind::Notification)) {
            error_ = StringFormat::format("unknown frame kind %u", static_cast<unsigned>(kind));
        } else if (version != MessagePortFrame::kVersion) {
            error_ = StringFormat::format("unsupported frame version %u", static_cast<unsigned>(version));
        } else if (length > MessagePortFrame::kMaxDataLength) {
            error_ = StringFormat::format("frame length %u over the limit of %u bytes", length,
                                          MessagePortFrame::kMaxDataLength);
        }
        if (failed()) {
            // The stream cannot be resynchronised: drop everything still buffered.
            buffer_.clear();
            buffer_.shrink_to_fit();
            return frames;
        }
        if (!reader.has(MessagePortFrame::kHeaderLength, length)) break;  // wait for the rest of the data
        const ByteView payload = reader.slice(MessagePortFrame::kHeaderLength, length).value_or(ByteView{});
        MessagePortFrame frame;
        frame.kind = static_cast<MessagePortFrame::Kind>(kind);
        frame.messageId = messageId;
        frame.data.assign(payload.begin(), payload.end());
        frames.push_back(std::move(frame));
        consumed += MessagePortFrame::kHeaderLength + length;
    }
    buffer_.erase(buffer_.begin(), buffer_.begin() + static_cast<std::ptrdiff_t>(consumed));
    return frames;
}

}  // namespace vantorel

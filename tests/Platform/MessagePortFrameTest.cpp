// Tests for MessagePortFrame and MessagePortFrameDecoder: header layout, round trips, stream splitting and malformed headers (docs/protocol.md).
#include "Platform/MessagePortFrame.h"

#include <gtest/gtest.h>

using namespace vantorel;

namespace {

MessagePortFrame makeFrame(MessagePortFrame::Kind kind, int32_t id, Bytes data) {
    MessagePortFrame frame;
    frame.kind = kind;
    frame.messageId = id;
    frame.data = std::move(data);
    return frame;
}

void expectSame(const MessagePortFrame& a, const MessagePortFrame& b) {
    EXPECT_EQ(a.kind, b.kind);
    EXPECT_EQ(a.messageId, b.messageId);
    EXPECT_EQ(a.data, b.data);
}

// A 12-byte header with the given fields (layout in MessagePortFrame.h).
Bytes header(uint8_t kind, uint8_t version, uint32_t length, int32_t id = 0) {
    Bytes h = {kind, version, 0, 0};
    for (int i = 0; i < 4; ++i) h.push_back(static_cast<uint8_t>(static_cast<uint32_t>(id) >> (8 * i)));
    for (int i = 0; i < 4; ++i) h.push_back(static_cast<uint8_t>(length >> (8 * i)));
    return h;
}

Bytes concat(const std::vector<Bytes>& parts) {
    Bytes out;
    for (const auto& p : parts) out.insert(out.end(), p.begin(), p.end());
    return out;
}

}  // namespace

TEST(MessagePortFrame, EncodeWritesTheTwelveByteLittleEndianHeaderThenTheData) {
    Bytes encoded = makeFrame(MessagePortFrame::Kind::Request, -2, {0xAA, 0xBB, 0xCC}).encode();
    Bytes expected = {
        0x01,                    // 0: kind Request
        0x01,                    // 1: version 1
        0x00, 0x00,              // 2-3: reserved
        0xFE, 0xFF, 0xFF, 0xFF,  // 4-7: message id -2
        0x03, 0x00, 0x00, 0x00,  // 8-11: length 3
        0xAA, 0xBB, 0xCC,        // 12: data
    };
    EXPECT_EQ(encoded, expected);
}

TEST(MessagePortFrame, EveryKindRoundTripsWithAndWithoutData) {
    const MessagePortFrame::Kind kinds[] = {MessagePortFrame::Kind::Message, MessagePortFrame::Kind::Request,
                                            MessagePortFrame::Kind::Reply, MessagePortFrame::Kind::Notification};
    int32_t id = 0;
    for (auto kind : kinds) {
        for (Bytes data : {Bytes{}, Bytes{1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13, 14}}) {
            MessagePortFrame frame = makeFrame(kind, id++ * 1000003, data);
            MessagePortFrameDecoder decoder;
            auto frames = decoder.feed(frame.encode());
            ASSERT_EQ(frames.size(), 1u);
            expectSame(frames[0], frame);
            EXPECT_FALSE(decoder.failed());
            EXPECT_EQ(decoder.buffered(), 0u);
        }
    }
}

TEST(MessagePortFrame, AStreamSplitAtEveryByteBoundaryGivesTheSameFrames) {
    const std::vector<MessagePortFrame> sent = {
        makeFrame(MessagePortFrame::Kind::Message, 0, {0x10, 0x20, 0x30}),
        makeFrame(MessagePortFrame::Kind::Reply, 7, {}),
        makeFrame(MessagePortFrame::Kind::Notification, 3, Bytes(40, 0x5A)),
    };
    const Bytes stream = concat({sent[0].encode(), sent[1].encode(), sent[2].encode()});
    for (size_t split = 0; split <= stream.size(); ++split) {
        MessagePortFrameDecoder decoder;
        auto first = decoder.feed(ByteView(stream).first(split));
        auto second = decoder.feed(ByteView(stream).subspan(split));
        first.insert(first.end(), second.begin(), second.end());
        ASSERT_EQ(first.size(), sent.size()) << "split at " << split;
        for (size_t i = 0; i < sent.size(); ++i) expectSame(first[i], sent[i]);
        EXPECT_EQ(decoder.buffered(), 0u);
    }
    // And one byte at a time.
    MessagePortFrameDecoder decoder;
    std::vector<MessagePortFrame> got;
    for (uint8_t byte : stream) {
        auto frames = decoder.feed(ByteView(&byte, 1));
        got.insert(got.end(), frames.begin(), frames.end());
    }
    ASSERT_EQ(got.size(), sent.size());
    for (size_t i = 0; i < sent.size(); ++i) expectSame(got[i], sent[i]);
}

TEST(MessagePortFrame, SeveralFramesInOneChunkAreAllReturnedInOrder) {
    Bytes chunk;
    for (int32_t id = 0; id < 5; ++id) {
        Bytes f = makeFrame(MessagePortFrame::Kind::Message, id, Bytes(static_cast<size_t>(id), 0x11)).encode();
        chunk.insert(chunk.end(), f.begin(), f.end());
    }
    // Plus the first 5 bytes of a sixth frame, kept for the next feed.
    Bytes sixth = makeFrame(MessagePortFrame::Kind::Request, 99, {0xEE}).encode();
    chunk.insert(chunk.end(), sixth.begin(), sixth.begin() + 5);
    MessagePortFrameDecoder decoder;
    auto frames = decoder.feed(chunk);
    ASSERT_EQ(frames.size(), 5u);
    for (int32_t id = 0; id < 5; ++id) {
        EXPECT_EQ(frames[static_cast<size_t>(id)].messageId, id);
        EXPECT_EQ(frames[static_cast<size_t>(id)].data.size(), static_cast<size_t>(id));
    }
    EXPECT_EQ(decoder.buffered(), 5u);
    auto rest = decoder.feed(ByteView(sixth).subspan(5));
    ASSERT_EQ(rest.size(), 1u);
    EXPECT_EQ(rest[0].messageId, 99);
}

TEST(MessagePortFrame, AnUnknownKindFailsWithAReasonAndNoMoreFrames) {
    const Bytes good = makeFrame(MessagePortFrame::Kind::Message, 1, {0x01}).encode();
    MessagePortFrameDecoder decoder;
    // The frame before the bad header is still returned; nothing after it.
    auto frames = decoder.feed(concat({good, header(4, 1, 0), good}));
    ASSERT_EQ(frames.size(), 1u);
    EXPECT_TRUE(decoder.failed());
    EXPECT_EQ(decoder.error(), "unknown frame kind 4");
    EXPECT_EQ(decoder.buffered(), 0u);
    EXPECT_TRUE(decoder.feed(good).empty());
    EXPECT_TRUE(decoder.failed());
}

TEST(MessagePortFrame, AnUnsupportedVersionFailsWithAReasonAndNoMoreFrames) {
    MessagePortFrameDecoder decoder;
    EXPECT_TRUE(decoder.feed(header(0, 2, 1)).empty());
    EXPECT_TRUE(decoder.failed());
    EXPECT_EQ(decoder.error(), "unsupported frame version 2");
    EXPECT_TRUE(decoder.feed(makeFrame(MessagePortFrame::Kind::Message, 1, {}).encode()).empty());
}

TEST(MessagePortFrame, ALengthOverTheLimitFailsWithAReasonAndNoMoreFrames) {
    MessagePortFrameDecoder decoder;
    EXPECT_TRUE(decoder.feed(header(0, 1, MessagePortFrame::kMaxDataLength + 1)).empty());
    EXPECT_TRUE(decoder.failed());
    EXPECT_EQ(decoder.error(), "frame length 16777217 over the limit of 16777216 bytes");
    EXPECT_TRUE(decoder.feed(makeFrame(MessagePortFrame::Kind::Message, 1, {}).encode()).empty());
}

TEST(MessagePortFrame, ALengthAtTheLimitIsAcceptedAndWaitsForItsData) {
    MessagePortFrameDecoder decoder;
    EXPECT_TRUE(decoder.feed(header(2, 1, MessagePortFrame::kMaxDataLength)).empty());
    EXPECT_FALSE(decoder.failed());
    EXPECT_EQ(decoder.buffered(), MessagePortFrame::kHeaderLength);
}

TEST(MessagePortFrame, AnIncompleteHeaderIsNotJudgedYet) {
    // Only a whole header is checked: 11 bytes of a bad one are simply buffered.
    Bytes bad = header(9, 9, 0);
    MessagePortFrameDecoder decoder;
    EXPECT_TRUE(decoder.feed(ByteView(bad).first(11)).empty());
    EXPECT_FALSE(decoder.failed());
    EXPECT_TRUE(decoder.feed(ByteView(bad).subspan(11)).empty());
    EXPECT_EQ(decoder.error(), "unknown frame kind 9");
}

TEST(MessagePortFrame, TheReservedFieldIsIgnoredOnReading) {
    Bytes frame = makeFrame(MessagePortFrame::Kind::Message, 5, {0x42}).encode();
    frame[2] = 0x12;  // reserved, written as 0 by senders
    frame[3] = 0x34;
    MessagePortFrameDecoder decoder;
    auto frames = decoder.feed(frame);
    ASSERT_EQ(frames.size(), 1u);
    EXPECT_EQ(frames[0].messageId, 5);
    EXPECT_EQ(frames[0].data, Bytes{0x42});
}

// Tests HdlcDeframer: CRC-16/X.25, unescaping, chunked input and the counting of bad, short, truncated and oversize frames.
#include "TelephonyService/Replay/HdlcDeframer.h"

#include "Platform/StringFormat.h"
#include "TelephonyService/Replay/DiagTestFrames.h"
#include "TelephonyService/Replay/RecordedLog.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <string>
#include <utility>
#include <vector>

namespace vantorel {
namespace {

using testframes::append;
using testframes::hdlcFrame;

struct Problem {
    HdlcDeframer::Problem kind;
    uint64_t offset;
    std::string why;
};

// Runs the whole stream through a deframer that collects its frames.
std::vector<Bytes> deframe(ByteView stream, HdlcDeframer& d) {
    d.feed(stream);
    d.finish();
    return d.takeFrames();
}

TEST(HdlcDeframerTest, Crc16CheckValueOf01020304Is0x3991) {
    const Bytes body{0x01, 0x02, 0x03, 0x04};
    EXPECT_EQ(HdlcDeframer::crc16(body), 0x3991);
}

TEST(HdlcDeframerTest, Crc16MatchesBitwiseReference) {
    // Standard CRC-16/X.25 check value of "123456789".
    const std::string check = "123456789";
    EXPECT_EQ(HdlcDeframer::crc16(ByteView(reinterpret_cast<const uint8_t*>(check.data()), check.size())), 0x906E);
    EXPECT_EQ(HdlcDeframer::crc16(ByteView()), 0x0000);
    Bytes data;
    for (int i = 0; i < 300; ++i) {
        data.push_back(static_cast<uint8_t>(i * 37 + 11));
        ASSERT_EQ(HdlcDeframer::crc16(data), testframes::referenceCrc16(data)) << "length " << data.size();
    }
}

TEST(HdlcDeframerTest, EscapedFlagAndEscapeBytesRoundTrip) {
    const Bytes body{0x10, 0x7D, 0x00, 0x7E, 0x7E, 0x7D, 0x20, 0x5D, 0x5E};
    const Bytes frame = hdlcFrame(body);
    // 7D 5D stands for 7D, 7D 5E for 7E; the only raw 7E is the closing flag.
    const Bytes expectedStart{0x10, 0x7D, 0x5D, 0x00, 0x7D, 0x5E, 0x7D, 0x5E, 0x7D, 0x5D, 0x20, 0x5D, 0x5E};
    ASSERT_GE(frame.size(), expectedStart.size());
    EXPECT_EQ(Bytes(frame.begin(), frame.begin() + static_cast<std::ptrdiff_t>(expectedStart.size())), expectedStart);
    EXPECT_EQ(std::count(frame.begin(), frame.end(), 0x7E), 1);
    EXPECT_EQ(frame.back(), 0x7E);

    HdlcDeframer d;
    auto frames = deframe(frame, d);
    ASSERT_EQ(frames.size(), 1u);
    EXPECT_EQ(frames[0], body);
    EXPECT_EQ(d.counters().frames, 1u);
    EXPECT_EQ(d.counters().badCrc, 0u);
}

TEST(HdlcDeframerTest, CrcBytesThatNeedEscapingRoundTrip) {
    // Find bodies whose CRC holds a 7E or a 7D byte: the CRC is escaped like the body.
    Bytes withFlagInCrc, withEscapeInCrc;
    for (unsigned i = 0; i < 65536 && (withFlagInCrc.empty() || withEscapeInCrc.empty()); ++i) {
        Bytes body{0x4B, static_cast<uint8_t>(i), static_cast<uint8_t>(i >> 8)};
        const uint16_t crc = HdlcDeframer::crc16(body);
        const uint8_t lo = static_cast<uint8_t>(crc), hi = static_cast<uint8_t>(crc >> 8);
        if (withFlagInCrc.empty() && (lo == 0x7E || hi == 0x7E)) withFlagInCrc = body;
        if (withEscapeInCrc.empty() && (lo == 0x7D || hi == 0x7D)) withEscapeInCrc = body;
    }
    ASSERT_FALSE(withFlagInCrc.empty());
    ASSERT_FALSE(withEscapeInCrc.empty());
    Bytes stream = hdlcFrame(withFlagInCrc);
    append(stream, hdlcFrame(withEscapeInCrc));
    HdlcDeframer d;
    auto frames = deframe(stream, d);
    ASSERT_EQ(frames.size(), 2u);
    EXPECT_EQ(frames[0], withFlagInCrc);
    EXPECT_EQ(frames[1], withEscapeInCrc);
}

TEST(HdlcDeframerTest, FramesSplitAcrossChunksAreReassembled) {
    const Bytes a{0x01, 0x7E, 0x02};
    const Bytes b{0x7D, 0x7D, 0x03, 0x04, 0x05};
    Bytes stream = hdlcFrame(a);
    append(stream, hdlcFrame(b));
    // One byte per feed() call, so every escape pair and every CRC straddles a chunk.
    HdlcDeframer d;
    for (uint8_t byte : stream) d.feed(ByteView(&byte, 1));
    d.finish();
    auto frames = d.takeFrames();
    ASSERT_EQ(frames.size(), 2u);
    EXPECT_EQ(frames[0], a);
    EXPECT_EQ(frames[1], b);
    EXPECT_EQ(d.counters().truncated, 0u);
}

TEST(HdlcDeframerTest, ChunkSizeDoesNotChangeTheFramesOfARealCapture) {
    const std::string path = std::string(VANTOREL_CAPTURES_DIR) + "/qmdl_example.qmdl";
    std::string error;
    const auto data = RecordedLog::loadFile(path, &error);
    ASSERT_TRUE(data) << error;
    ASSERT_GT(std::count(data->begin(), data->end(), HdlcDeframer::kEscape), 0);  // escapes do occur

    HdlcDeframer whole;
    const auto expected = deframe(*data, whole);
    ASSERT_EQ(expected.size(), 345u);
    for (size_t chunkSize : {1u, 2u, 3u, 7u, 13u, 4096u}) {
        SCOPED_TRACE(chunkSize);
        HdlcDeframer d;
        const ByteView all(*data);
        for (size_t at = 0; at < all.size(); at += chunkSize)
            d.feed(all.subspan(at, std::min(chunkSize, all.size() - at)));
        d.finish();
        EXPECT_EQ(d.takeFrames(), expected);
        EXPECT_EQ(d.counters().badCrc + d.counters().malformed + d.counters().truncated, 0u);
    }
}

TEST(HdlcDeframerTest, BadCrcFrameIsSkippedAndCountedAndNextFrameIsRead) {
    const Bytes good1{0x10, 0x01}, bad{0x10, 0x02}, good2{0x10, 0x03};
    Bytes stream = hdlcFrame(good1);
    append(stream, hdlcFrame(bad, 0x0001));
    append(stream, hdlcFrame(good2));
    std::vector<Problem> problems;
    std::vector<std::pair<Bytes, uint64_t>> frames;
    HdlcDeframer d([&](ByteView body, uint64_t offset) { frames.emplace_back(Bytes(body.begin(), body.end()), offset); },
                   [&](HdlcDeframer::Problem p, uint64_t offset, const std::string& why) {
                       problems.push_back({p, offset, why});
                   });
    d.feed(stream);
    d.finish();
    ASSERT_EQ(frames.size(), 2u);
    EXPECT_EQ(frames[0].first, good1);
    EXPECT_EQ(frames[1].first, good2);
    // Each frame here is 2 body + 2 CRC + 1 flag = 5 bytes (no escapes).
    EXPECT_EQ(frames[0].second, 0u);
    EXPECT_EQ(frames[1].second, 10u);
    EXPECT_EQ(d.counters().frames, 2u);
    EXPECT_EQ(d.counters().badCrc, 1u);
    EXPECT_EQ(d.counters().malformed, 0u);
    ASSERT_EQ(problems.size(), 1u);
    EXPECT_EQ(problems[0].kind, HdlcDeframer::Problem::BadCrc);
    EXPECT_EQ(problems[0].offset, 5u);
    const uint16_t right = HdlcDeframer::crc16(bad);
    EXPECT_EQ(problems[0].why, StringFormat::format("bad CRC: computed 0x%04X, frame carries 0x%04X", right,
                                                    static_cast<unsigned>(right ^ 0x0001)));
}

TEST(HdlcDeframerTest, TruncatedTailIsCountedAtFinish) {
    const Bytes body{0x10, 0x00, 0x01, 0x02};
    Bytes stream = hdlcFrame(body);
    Bytes tail = hdlcFrame(body);
    tail.pop_back();  // no closing flag
    append(stream, tail);
    HdlcDeframer d;
    d.feed(stream);
    EXPECT_EQ(d.counters().truncated, 0u);  // not known before the stream ends
    d.finish();
    auto frames = d.takeFrames();
    ASSERT_EQ(frames.size(), 1u);
    EXPECT_EQ(frames[0], body);
    EXPECT_EQ(d.counters().truncated, 1u);
    EXPECT_EQ(d.counters().badCrc, 0u);
    EXPECT_EQ(d.counters().malformed, 0u);
}

TEST(HdlcDeframerTest, EmptyFramesBetweenFlagsAreSkippedSilently) {
    const Bytes body{0x79, 0x41, 0x42};
    Bytes stream{0x7E, 0x7E};  // a leading flag and an empty frame
    append(stream, hdlcFrame(body));
    append(stream, Bytes{0x7E, 0x7E, 0x7E});
    append(stream, hdlcFrame(body));
    HdlcDeframer d;
    auto frames = deframe(stream, d);
    EXPECT_EQ(frames.size(), 2u);
    EXPECT_EQ(d.counters().frames, 2u);
    EXPECT_EQ(d.counters().badCrc, 0u);
    EXPECT_EQ(d.counters().malformed, 0u);
    EXPECT_EQ(d.counters().truncated, 0u);
}

TEST(HdlcDeframerTest, EscapeRightBeforeFlagIsMalformed) {
    const Bytes body{0x10, 0x20, 0x30};
    Bytes stream{0x10, 0x20, 0x7D, 0x7E};
    append(stream, hdlcFrame(body));
    std::vector<Problem> problems;
    HdlcDeframer d({}, [&](HdlcDeframer::Problem p, uint64_t offset, const std::string& why) {
        problems.push_back({p, offset, why});
    });
    auto frames = deframe(stream, d);
    ASSERT_EQ(frames.size(), 1u);
    EXPECT_EQ(frames[0], body);
    EXPECT_EQ(d.counters().malformed, 1u);
    ASSERT_EQ(problems.size(), 1u);
    EXPECT_EQ(problems[0].kind, HdlcDeframer::Problem::Malformed);
    EXPECT_EQ(problems[0].offset, 0u);
    EXPECT_EQ(problems[0].why, "escape byte 7D right before the flag");
}

TEST(HdlcDeframerTest, EscapeAtEndOfStreamIsTruncated) {
    Bytes stream = hdlcFrame({0x10, 0x11});
    append(stream, Bytes{0x10, 0x7D});
    HdlcDeframer d;
    auto frames = deframe(stream, d);
    EXPECT_EQ(frames.size(), 1u);
    EXPECT_EQ(d.counters().truncated, 1u);
    EXPECT_EQ(d.counters().malformed, 0u);
}

TEST(HdlcDeframerTest, FrameShorterThanThreeBytesIsMalformed) {
    // Two bytes: room for a CRC but no body. One escaped byte: 7D 5E unescapes to one byte.
    Bytes stream{0xAB, 0xCD, 0x7E, 0x7D, 0x5E, 0x7E};
    append(stream, hdlcFrame({0x01}));  // the shortest good frame: 1 body byte + CRC
    HdlcDeframer d;
    auto frames = deframe(stream, d);
    ASSERT_EQ(frames.size(), 1u);
    EXPECT_EQ(frames[0], Bytes{0x01});
    EXPECT_EQ(d.counters().malformed, 2u);
    EXPECT_EQ(d.counters().badCrc, 0u);
}

TEST(HdlcDeframerTest, OversizeFrameWithoutFlagIsDroppedAsMalformed) {
    const Bytes good{0x10, 0x55, 0x66};
    HdlcDeframer d;
    // 1 MiB + 100 bytes without a flag, in 64 KiB chunks, then the flag and a good frame.
    const Bytes chunk(64 * 1024, 0x00);
    for (int i = 0; i < 16; ++i) d.feed(chunk);
    EXPECT_EQ(d.counters().malformed, 0u);  // exactly 1 MiB is still allowed
    d.feed(Bytes(100, 0x00));
    EXPECT_EQ(d.counters().malformed, 1u);  // counted as soon as it grows past 1 MiB
    d.feed(Bytes(5000, 0x11));              // the rest of that frame is discarded
    d.feed(Bytes{0x7E});
    d.feed(hdlcFrame(good));
    d.finish();
    auto frames = d.takeFrames();
    ASSERT_EQ(frames.size(), 1u);
    EXPECT_EQ(frames[0], good);
    EXPECT_EQ(d.counters().malformed, 1u);
    EXPECT_EQ(d.counters().truncated, 0u);
    EXPECT_EQ(d.counters().badCrc, 0u);
}

TEST(HdlcDeframerTest, OversizeFrameUnclosedAtFinishIsCountedOnce) {
    HdlcDeframer d;
    d.feed(Bytes(HdlcDeframer::kMaxFrameLength + 1, 0x22));
    d.finish();
    EXPECT_EQ(d.counters().malformed, 1u);
    EXPECT_EQ(d.counters().truncated, 0u);
    EXPECT_TRUE(d.takeFrames().empty());
}

TEST(HdlcDeframerTest, FinishStartsANewStream) {
    HdlcDeframer d;
    d.feed(Bytes{0x10, 0x20});
    d.finish();
    d.feed(hdlcFrame({0x10, 0x30}));
    d.finish();
    auto frames = d.takeFrames();
    ASSERT_EQ(frames.size(), 1u);
    EXPECT_EQ(frames[0], (Bytes{0x10, 0x30}));
    EXPECT_EQ(d.counters().truncated, 1u);
    EXPECT_EQ(d.counters().frames, 1u);
}

}  // namespace
}  // namespace vantorel

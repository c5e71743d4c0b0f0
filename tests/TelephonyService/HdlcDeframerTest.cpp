// Tests HdlcDeframer: escapes, CRC-16/X.25, bad and partial frames, each stream fed whole, split at every byte and byte by byte.
#include "TelephonyService/Replay/HdlcDeframer.h"

#include "TelephonyService/ServiceTestSupport.h"

#include <gtest/gtest.h>

#include <string>
#include <tuple>
#include <vector>

namespace vantorel {
namespace {

using servicetest::append;
using servicetest::hdlcFrame;

struct Result {
    std::vector<Bytes> frames;
    size_t badCrc = 0, malformed = 0, truncated = 0;
    bool operator==(const Result&) const = default;
};

Result deframe(const std::vector<ByteView>& chunks) {
    HdlcDeframer deframer;
    for (ByteView chunk : chunks) deframer.feed(chunk);
    deframer.finish();
    const auto& c = deframer.counters();
    Result r{deframer.takeFrames(), c.badCrc, c.malformed, c.truncated};
    EXPECT_EQ(c.frames, r.frames.size());
    return r;
}

Bytes concat(std::initializer_list<Bytes> parts) {
    Bytes out;
    for (const Bytes& p : parts) append(out, p);
    return out;
}

TEST(HdlcDeframer, StreamsGiveTheSameFramesHoweverTheyAreChunked) {
    const Bytes plain{0x10, 0x00, 0x41};
    const Bytes specials{0x7E, 0x7D, 0x20, 0x5E, 0x5D};  // flag and escape inside the body
    // A body whose CRC has a flag byte in it: the CRC bytes are escaped too.
    Bytes crcEscaped{0x10, 0x00, 0x00};
    for (unsigned i = 0; i < 0x10000 && HdlcDeframer::crc16(crcEscaped) != 0x7D7E; ++i) {
        crcEscaped[1] = static_cast<uint8_t>(i >> 8);
        crcEscaped[2] = static_cast<uint8_t>(i);
    }
    ASSERT_EQ(HdlcDeframer::crc16(crcEscaped), 0x7D7E);  // both CRC bytes escaped
    const std::vector<std::tuple<const char*, Bytes, Result>> rows = {
        {"plain frame", hdlcFrame(plain), {{plain}}},
        {"flag and escape bytes", hdlcFrame(specials), {{specials}}},
        {"escaped CRC byte", hdlcFrame(crcEscaped), {{crcEscaped}}},
        {"empty frames between flags", concat({{0x7E, 0x7E}, hdlcFrame(plain), {0x7E}}), {{plain}}},
        {"bad CRC skipped, next frame read", concat({hdlcFrame(plain, 0x0100), hdlcFrame(specials)}), {{specials}, 1}},
        {"escape right before the flag", concat({{0x10, 0x11, 0x12, 0x7D, 0x7E}, hdlcFrame(plain)}), {{plain}, 0, 1}},
        {"frame shorter than 3 bytes", concat({{0x10, 0x11, 0x7E}, hdlcFrame(plain)}), {{plain}, 0, 1}},
        {"unclosed tail", concat({hdlcFrame(plain), {0x10, 0x00}}), {{plain}, 0, 0, 1}},
        {"escape at the end of the stream", {0x10, 0x7D}, {{}, 0, 0, 1}},
        {"nothing", {}, {}},
    };
    for (const auto& [name, stream, expected] : rows) {
        SCOPED_TRACE(name);
        const ByteView all(stream);
        EXPECT_EQ(deframe({all}), expected);
        std::vector<ByteView> bytes;
        for (size_t cut = 1; cut < all.size(); ++cut) {
            ASSERT_EQ(deframe({all.first(cut), all.subspan(cut)}), expected) << "cut at " << cut;
            bytes.push_back(all.subspan(cut - 1, 1));
        }
        if (!all.empty()) bytes.push_back(all.last(1));
        EXPECT_EQ(deframe(bytes), expected);
    }
}

TEST(HdlcDeframer, OversizeFrameIsDroppedOnceAndTheStreamGoesOnAtTheNextFlag) {
    const Bytes plain{0x10, 0x00, 0x41};
    Bytes huge(HdlcDeframer::kMaxFrameLength + 10, 0x55);
    EXPECT_EQ(deframe({huge, concat({{0x7E}, hdlcFrame(plain)})}), (Result{{plain}, 0, 1, 0}));
    EXPECT_EQ(deframe({huge}), (Result{{}, 0, 1, 0}));  // unclosed: malformed, not again truncated
}

TEST(HdlcDeframer, FinishEndsOneStreamAndProblemsNameTheFrameOffset) {
    std::vector<std::string> problems;
    std::vector<uint64_t> offsets;
    HdlcDeframer deframer([&](ByteView, uint64_t offset) { offsets.push_back(offset); },
                          [&](HdlcDeframer::Problem, uint64_t offset, const std::string& why) {
                              problems.push_back(std::to_string(offset) + ": " + why);
                          });
    const Bytes good = hdlcFrame(Bytes{0x10, 0x00, 0x41});
    const Bytes bad = hdlcFrame(Bytes{0x10, 0x00, 0x42}, 1);
    const Bytes first = concat({good, bad, {0x10}});
    deframer.feed(first);
    deframer.finish();
    deframer.feed(good);  // a new stream: no leftover of the unclosed tail
    deframer.finish();
    EXPECT_EQ(offsets, (std::vector<uint64_t>{0, first.size()}));
    ASSERT_EQ(problems.size(), 2u);
    EXPECT_EQ(problems[0].rfind(std::to_string(good.size()) + ": bad CRC: computed 0x", 0), 0u) << problems[0];
    EXPECT_EQ(problems[1], std::to_string(good.size() + bad.size()) + ": 1 bytes at the end without a closing flag");
}

}  // namespace
}  // namespace vantorel

// C2KHDRDecodersTest: the EV-DO routines fed built records, their values read back through lookup bindings.
#include "LogGenerator/C2K/C2KHDRDecoders.h"
#include "LogGenerator/SectionTesting.h"

#include <gtest/gtest.h>

namespace vantorel {
namespace {

using namespace sectiontest;
using Routine = void (*)(ByteView, Dictionary&, const DictionaryRef&);

// Every lookup key bound to the display key of the same name in one display dictionary.
struct Bench {
    DictionaryRef display = Dictionary::create();
    DictionaryRef lookup = Dictionary::create();
    Dictionary state;
    explicit Bench(std::initializer_list<const char*> keys) {
        for (const char* key : keys) {
            auto binding = Dictionary::create();
            binding->set("key", key);
            binding->set("dict", Value(display));
            lookup->set(key, Value(Array::of({Value(binding)})));
            display->set(key, "-");
        }
    }
    std::string shown() const {
        std::string out;
        for (const auto& [key, value] : *display) out += (out.empty() ? "" : "|") + render(value);
        return out;
    }
};

// byte 14 = band << 3 | channel bits 8-10; Rx AGC 0/1, Tx AGC at 15-17; PN at 18;
// device and session state at 36, 37; UATI at 38; colour code at 41.
Bytes status(uint8_t byte14, uint16_t pn, uint8_t device, uint8_t session, size_t length = 50) {
    return RecordBuilder::ordinary(0x1183, 50).u8(13, 0x2C).u8(14, byte14).bytes(15, {0xAB, 0xA6, 0x0C})
        .u16(18, pn).u8(36, device).u8(37, session).bytes(38, {0x12, 0x34, 0x56}).u8(41, 7).resize(length).build();
}

TEST(C2KHDRDecoders, StatusShowsEveryFieldInItsFormAndHidesChain1AndTxBeforeAccess) {
    const char* untouched = "-|-|-|-|-|-|-|-|-|-";
    const struct { Bytes record; std::string shown, error; } rows[] = {
        {status(5 << 3 | 3, 12, 5, 4), "812|Connected [5]|450MHz band [5]|-85 dBm|-90 dBm|+12 dBm|12 × 64chips|Open [4]|0x563412|7", ""},
        {status(31 << 3, 65535, 3, 9), "44|Idle [3]|[Bad Value 31]|-85 dBm|N/A|N/A|Invalid Value|[Reserved 9]|0x563412|7", ""},
        {status(1 << 3 | 7, 0, 4, 0), "1836|Access [4]|1.8 to 2.0GHz PCS band [1]|-85 dBm|-90 dBm|+12 dBm|0 × 64chips|Closed [0]|0x563412|7", ""},
        {status(0, 0, 5, 4, 49), untouched, "Log code 0x1183 is 49 bytes long but should be 50 bytes."},
        {status(0, 0, 5, 4, 51), untouched, "Log code 0x1183 is 51 bytes long but should be 50 bytes."},
    };
    for (const auto& row : rows) {
        Bench bench({"kChannel", "k1xEVDODeviceState", "kBandClass", "kRxAGC0", "kRxAGC1", "kTxAGC",
                     "kServingPNOffset", "kSessionState", "kUATI24", "kColorCode"});
        SystemLogCapture log;
        C2KHDRDecoders::hdrStatus(row.record, bench.state, bench.lookup);
        EXPECT_EQ(bench.shown(), row.shown);
        EXPECT_EQ(errorLines(log), row.error.empty() ? std::vector<std::string>{} : std::vector{row.error});
    }
}

// Active set: count at 15, 12-byte pilots from 25 (PN, strength). Fingers: count at 22,
// 14-byte fingers from 23 (PN, C/I at +6). Strengths and C/I in 1/512.
Bytes pilots(int32_t code, size_t length, uint8_t count, std::vector<std::pair<uint16_t, uint16_t>> list) {
    const bool fingers = code == 0x108A;
    RecordBuilder b = RecordBuilder::ordinary(code, length).u8(fingers ? 22 : 15, count);
    for (size_t i = 0; i < list.size(); ++i)
        b.u16(fingers ? 23 + 14 * i : 25 + 12 * i, list[i].first)
            .u16(fingers ? 29 + 14 * i : 27 + 12 * i, list[i].second);
    return b.resize(length).build();
}

TEST(C2KHDRDecoders, PilotListsCheckTheirLengthsAndSkipUnassignedFingers) {
    const Routine kSet = C2KHDRDecoders::hdrActiveSet, kFingers = C2KHDRDecoders::fingerCI;
    const struct { Routine routine; Bytes record; std::string shown, error; } rows[] = {
        {kSet, pilots(0x12B6, 49, 2, {{100, 512}, {7, 1024}}), "{_sorted=_sorted, 0;100=+0.00 dB, 1;7=+3.01 dB}", ""},
        {kSet, pilots(0x12B6, 60, 1, {{9, 0}}), "{_sorted=_sorted, 0;9=-inf dB}", ""},
        {kSet, pilots(0x12B6, 25, 0, {}), "(none)", ""},
        {kSet, pilots(0x12B6, 48, 2, {}), "-", "Log code 0x12b6 is 48 bytes long, but has 2 substructs."},
        {kSet, pilots(0x12B6, 24, 0, {}), "-", "Log code 0x12b6 is 24 bytes long but must be at least 25 bytes."},
        {kFingers, pilots(0x108A, 51, 2, {{65535, 512}, {300, 256}}), "{_sorted=_sorted, 1;300=-3.01 dB}", ""},
        {kFingers, pilots(0x108A, 51, 2, {{65535, 512}, {65535, 256}}), "(none)", ""},
        {kFingers, pilots(0x108A, 23, 0, {}), "(none)", ""},
        {kFingers, pilots(0x108A, 52, 2, {}), "-", "Log code 0x108a has bad length of 52 bytes, but has 2 substructs (size=23)."},
        {kFingers, pilots(0x108A, 22, 0, {}), "-", "Log code 0x108a is 22 bytes long but must be at least 23 bytes."},
    };
    for (const auto& row : rows) {
        Bench bench({"kActiveSetPilots", "kFingerC2I"});
        SystemLogCapture log;
        row.routine(row.record, bench.state, bench.lookup);
        EXPECT_EQ(bench.shown(), row.routine == kFingers ? "-|" + row.shown : row.shown + "|-");
        EXPECT_EQ(errorLines(log), row.error.empty() ? std::vector<std::string>{} : std::vector{row.error});
    }
}

// Forward: sequence at 13; n in counters 3 (1024 bits), 4 (no payload) and 54 (5120): 6144 n bits.
// Reverse: sequence at 14; n in the first counter of rate 0 (128 bits) and the last of rate 11
// (12288): 12416 n bits. So the forward rate is 6 n / steps and the reverse 12.125 n / steps.
Bytes rateRecord(bool forward, uint32_t seq, uint32_t n, size_t length) {
    if (!length) length = forward ? 241 : 1750;
    if (forward) return RecordBuilder::ordinary(0x1192).u32(13, seq).u32(29, n).u32(33, n).u32(233, n).resize(length).build();
    return RecordBuilder::ordinary(0x127E).u8(13, 0x55).u32(14, seq).u32(18, n).u32(1734, n).resize(length).build();
}

TEST(C2KHDRDecoders, RatesPrimeOnTheFirstRecordAndAdvanceOnlyWithTheSequenceNumber) {
    struct Step { uint32_t seq, n; std::string shown; size_t length = 0; };
    // extra: the last and the previous accepted counters (sequence, bits) kept in "ExtraInfo".
    const struct { bool forward; std::vector<Step> steps; int64_t extra[4]; } rows[] = {
        {true, {{10, 0, ""}, {12, 100, "300.00 kbps"}, {12, 200, "300.00 kbps"}, {11, 300, "300.00 kbps"},
                {15, 340, "60.00 kbps"}, {16, 999, "60.00 kbps", 240}}, {15, 340 * 6144, 11, 300 * 6144}},
        {true, {{0xFFFFFFFE, 0, ""}, {1, 30, "60.00 kbps"}, {2, 99, "60.00 kbps", 240}, {3, 40, "30.00 kbps"}},
         {3, 40 * 6144, 1, 30 * 6144}},
        {false, {{5, 0, ""}, {7, 16, "97.00 kbps"}, {9, 99, "97.00 kbps", 1749}, {0x80000007, 99, "97.00 kbps"}},
         {-0x7FFFFFF9, 99 * 12416, 7, 16 * 12416}},
    };
    for (const auto& row : rows) {
        Bench bench({row.forward ? "kFLDataRate" : "kRLDataRate"});
        SystemLogCapture log;
        for (const Step& step : row.steps) {
            (row.forward ? C2KHDRDecoders::forwardDataRate : C2KHDRDecoders::reverseDataRate)(
                rateRecord(row.forward, step.seq, step.n, step.length), bench.state, bench.lookup);
            EXPECT_EQ(bench.shown(), step.shown) << step.seq;
        }
        const std::vector<std::string> expected{row.forward ? "Log code 0x1192 is 240 bytes long but must be at least 241 bytes."
                                                            : "Log code 0x127e is 1749 bytes long but must be at least 1750 bytes."};
        EXPECT_EQ(errorLines(log), expected);
        const DictionaryRef extra = bench.state.get("ExtraInfo").asDictionary();
        ASSERT_TRUE(extra);
        const std::string p = row.forward ? "FL" : "RL";  // the state and ExtraInfo key prefix
        EXPECT_EQ((std::vector{extra->get(p + "DataSeqNum1").asInteger(), extra->get(p + "DataSent1").asInteger(),
                               extra->get(p + "DataSeqNum2").asInteger(), extra->get(p + "DataSent2").asInteger()}),
                  (std::vector<std::optional<int64_t>>{row.extra[0], row.extra[1], row.extra[2], row.extra[3]}));
    }
}

TEST(C2KHDRDecoders, EveryPacketCounterCountsWithItsPacketSize) {
    // Every counter at 1000 after a record of zeros, one sequence step apart: forward 1000 x
    // 48,896 bits (the 56 sizes summed) / 1024; reverse 1000 x 24 counters x 40,064 bits / 1024.
    for (const bool forward : {true, false}) {
        Bench bench({forward ? "kFLDataRate" : "kRLDataRate"});
        const auto rates = forward ? C2KHDRDecoders::forwardDataRate : C2KHDRDecoders::reverseDataRate;
        RecordBuilder record = RecordBuilder::ordinary(forward ? 0x1192 : 0x127E, forward ? 241 : 1750);
        rates(record.u32(forward ? 13 : 14, 1).build(), bench.state, bench.lookup);
        for (size_t at = forward ? 17 : 18; at + 4 <= (forward ? 241u : 1750u); at += 4) record.u32(at, 1000);
        rates(record.u32(forward ? 13 : 14, 2).build(), bench.state, bench.lookup);
        EXPECT_EQ(bench.shown(), forward ? "47750.00 kbps" : "939000.00 kbps");
    }
}

}  // namespace
}  // namespace vantorel

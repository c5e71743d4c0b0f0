// Tests CDMAScenario: two hundred ticks that carry every C2K record, a 1x call, an EV-DO connection, the forward sequence wrap and the malformed records.
#include "TelephonyService/Emulator/CDMAScenario.h"

#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"

#include <gtest/gtest.h>

#include <set>

namespace vantorel {
namespace {

TEST(CDMAScenario, TwoHundredTicksCarryACallAConnectionASystemChangeAndFourKindsOfMalformedRecords) {
    for (uint64_t seed : {1, 7, 42}) {
        CDMAScenario scenario(seed);
        std::set<int32_t> codes;
        std::set<uint8_t> hdrStates, frameErrors, afterCall;
        std::set<uint16_t> sids;
        size_t malformed = 0, trafficTicks = 0, connectedTicks = 0, wraps = 0, softHandOffs = 0;
        std::optional<uint32_t> lastSeq;
        uint8_t last1x = 0;
        uint16_t lastReference = 0;
        for (uint64_t tick = 0; tick < 200; ++tick) {
            for (const Bytes& m : scenario.recordsForTick(tick)) {
                const ByteReader r(ByteView(m).subspan(m[0] == 0x81 ? 2 : 0));
                const int32_t code = *r.u16(3);
                const size_t size = r.size();
                const size_t fingers = code == LogCode::kC2KFingerCI ? *r.u8(22) : 0;
                const bool bad = (code == LogCode::kC2KHDRStatus && size != 50) ||
                                 (code == LogCode::kC2KFingerCI && size != 23 + 14 * fingers) ||
                                 (code == LogCode::kC2K1xStatus && *r.u16(19) == 0) ||
                                 (code == LogCode::kC2KSystemIdentity && (*r.u8(13) < 2 || size < 186)) ||
                                 (code == LogCode::kC2KHDRActiveSet && size != 25 + 12 * size_t{*r.u8(15)}) ||
                                 (code == LogCode::kC2KForwardDataRate && size < 241) ||
                                 (code == LogCode::kC2KReverseDataRate && size < 1750);
                malformed += bad;
                if (bad) continue;
                ASSERT_EQ(*r.u8(0), 1) << tick;
                codes.insert(code);
                if (code == LogCode::kC2KHDRStatus) hdrStates.insert(*r.u8(36)), connectedTicks += *r.u8(36) == 5;
                if (code == LogCode::kC2KTrafficFER) frameErrors.insert(*r.u8(41));
                if (code == LogCode::kC2KSystemIdentity) sids.insert(*r.u16(50));
                if (code == LogCode::kC2K1xStatus) {
                    const uint8_t state = *r.u8(21);
                    const uint16_t reference = *r.u16(51);  // the reference pilot of subpacket 3 (at 41)
                    if (last1x == 8) afterCall.insert(state), softHandOffs += state == 8 && reference != lastReference;
                    last1x = state, lastReference = reference, trafficTicks += state == 8;
                }
                if (code == LogCode::kC2KForwardDataRate) {
                    const uint32_t seq = *r.u32(13);
                    if (lastSeq) wraps += seq < *lastSeq;
                    lastSeq = seq;
                }
            }
        }
        EXPECT_EQ(codes, (std::set<int32_t>{0x108A, 0x1183, 0x1192, 0x119C, 0x119D, 0x127E, 0x12B6, 0x134F})) << seed;
        EXPECT_GE(trafficTicks, 25u) << seed;
        EXPECT_GE(connectedTicks, 30u) << seed;
        EXPECT_EQ(hdrStates, (std::set<uint8_t>{1, 2, 3, 4, 5})) << seed;
        EXPECT_EQ(frameErrors, (std::set<uint8_t>{0, 1})) << seed;
        EXPECT_EQ(afterCall, (std::set<uint8_t>{6, 8})) << seed;  // the call ends in Paging
        EXPECT_GT(softHandOffs, 0u) << seed;
        EXPECT_EQ(sids.size(), 2u) << seed;
        EXPECT_EQ(wraps, 1u) << seed;
        EXPECT_EQ(malformed, 200 / CDMAScenario::kMalformedPeriod) << seed;
    }
}

}  // namespace
}  // namespace vantorel

// Tests GSMScenario: two hundred ticks that carry every GSM/UMTS record, both radio technologies and the deliberately malformed records.
#include "TelephonyService/Emulator/GSMScenario.h"

#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "PropertyList/PropertyListSerialization.h"
#include "TelephonyService/LogMask.h"

#include <gtest/gtest.h>

#include <set>

namespace vantorel {
namespace {

TEST(GSMScenario, TwoHundredTicksCarryEveryRecordOnGSMAndOnUMTSAndEightMalformedRecords) {
    for (uint64_t seed : {1, 7, 42}) {
        GSMScenario scenario(seed);
        std::set<int32_t> codes;
        std::set<uint8_t> rrcStates;
        size_t malformed = 0, gsmTicks = 0, umtsTicks = 0, bothTicks = 0;
        for (uint64_t tick = 0; tick < 200; ++tick) {
            bool gsm = false, umts = false;
            for (const Bytes& m : scenario.recordsForTick(tick)) {
                const ByteReader r(m);
                const auto c = LogMask::classify(m);
                const int32_t code = c ? c->effectiveCode() : 0;
                const bool badType = r.u8(0) != LogCode::kOrdinaryType && r.u8(0) != LogCode::kExtraType;
                const bool badList = c && !c->isOrdinary() && !PropertyListSerialization::read(r.bytes().subspan(13)).value;
                const bool tooShort = code == LogCode::kGSMServingMeasurement && r.size() < 29;
                const bool overCount = code == LogCode::kEquivalentPLMNs && r.size() < 20 + 3 * size_t{*r.u8(16)};
                malformed += badType || badList || tooShort || overCount;
                if (badType || !c) continue;
                codes.insert(code);
                gsm |= code == LogCode::kGSMServingMeasurement && !tooShort;
                umts |= code == LogCode::kUMTSSearcher;
                if (code == LogCode::kUMTSRRCState) rrcStates.insert(*r.u8(13));
            }
            gsmTicks += gsm, umtsTicks += umts, bothTicks += gsm && umts;
        }
        EXPECT_EQ(codes, (std::set<int32_t>{0x4005, 0x4031, 0x4116, 0x4125, 0x4127, 0x4157, 0x417A, 0x4221, 0x5072,
                                            0x5076, 0x512C, 0x5134, 0x5137, 0x51F4, 0x51F5, 0x51F6, 0x51F8, 0x51FB,
                                            0x51FD, 0x51FF, 0x7130, 0x7131, 0x7132, 0x7135, 0x7150, LogCode::kSimFiles,
                                            LogCode::kCellMonitor, LogCode::kPDPContexts}))
            << seed;
        EXPECT_EQ(rrcStates.size(), 6u) << seed;  // every RRC state of the walk
        EXPECT_GE(gsmTicks, 40u) << seed;
        EXPECT_GE(umtsTicks, 60u) << seed;
        EXPECT_EQ(bothTicks, 0u) << seed;
        EXPECT_EQ(malformed, 200 / GSMScenario::kMalformedPeriod) << seed;
    }
}

}  // namespace
}  // namespace vantorel

// Tests LTEScenario: two hundred ticks that carry every LTE record, cell changes and the deliberately malformed records.
#include "TelephonyService/Emulator/LTEScenario.h"

#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "PropertyList/PropertyListSerialization.h"
#include "TelephonyService/LogMask.h"

#include <gtest/gtest.h>

#include <set>

namespace vantorel {
namespace {

TEST(LTEScenario, TwoHundredTicksCarryEveryRecordCellChangesAndEightMalformedRecords) {
    LTEScenario scenario(5);
    std::set<int32_t> codes;
    std::set<uint16_t> pcis, earfcns;
    size_t malformed = 0;
    for (uint64_t tick = 0; tick < 200; ++tick) {
        for (const Bytes& m : scenario.recordsForTick(tick)) {
            const ByteReader r(m[0] == LogMask::kPrefixByte ? ByteView(m).subspan(2) : ByteView(m));
            const auto c = LogMask::classify(m);
            const bool badType = r.u8(0) != LogCode::kOrdinaryType && r.u8(0) != LogCode::kExtraType;
            const bool badList = c && !c->isOrdinary() && !PropertyListSerialization::read(r.bytes().subspan(13)).value;
            const bool tooShort = c && c->effectiveCode() == 0xB179 && r.size() < 29;  // its minimum length
            malformed += badType || badList || tooShort;
            if (badType || !c) continue;
            codes.insert(c->effectiveCode());
            if (c->effectiveCode() == 0xB0C2) pcis.insert(*r.u16(14)), earfcns.insert(*r.u16(16));
        }
    }
    EXPECT_EQ(codes, (std::set<int32_t>{0xB0C1, 0xB0C2, 0xB179, 0xB17F, 0xB180, 0xB186, LogCode::kSimFiles,
                                        LogCode::kCellMonitor, LogCode::kPDPContexts}));
    EXPECT_GE(pcis.size(), 4u);     // five cell changes, each to a new PCI
    EXPECT_GE(earfcns.size(), 3u);  // three of them to the next carrier
    EXPECT_EQ(malformed, 200 / LTEScenario::kMalformedPeriod);
}

}  // namespace
}  // namespace vantorel

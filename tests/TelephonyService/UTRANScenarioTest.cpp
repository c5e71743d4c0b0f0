// Tests UTRANScenario: a hundred ticks that the UTRAN decoders take in without complaint except for the deliberately malformed records.
#include "TelephonyService/Emulator/UTRANScenario.h"

#include "LogGenerator/LogGenerator.h"
#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/SystemLogCapture.h"
#include "Platform/TelephonyIdentifiers.h"
#include "PropertyList/Dictionary.h"
#include "TelephonyService/LogMask.h"

#include <gtest/gtest.h>

#include <map>
#include <string>
#include <vector>

namespace vantorel {
namespace {

// The record as the decoders see it: the optional 0x81 xx prefix removed.
ByteReader withoutPrefix(const Bytes& m) {
    return ByteReader(m.size() >= 2 && m[0] == 0x81 ? ByteView(m).subspan(2) : ByteView(m));
}

TEST(UTRANScenario, TheDecodersAcceptEveryRecordButTheDeliberatelyMalformedOnes) {
    UTRANScenario scenario(3);
    auto generator = LogGenerator::generatorFromTechnology(scenario.technology());
    ASSERT_TRUE(generator && generator->isUsable());
    Dictionary state;
    generator->generateLogUsingState(state);  // builds the display

    std::map<int32_t, Bytes> latest;  // the last record of each code, prefix removed
    uint8_t mode = 0;                 // the RRC mode of the last valid 0xD0E0
    for (uint64_t tick = 0; tick < 100; ++tick) {
        SystemLogCapture capture;
        const std::vector<Bytes> records = scenario.recordsForTick(tick);
        if (tick == 0) {
            ASSERT_GE(records.size(), 3u);
            for (int i = 0; i < 3; ++i)  // the extras come first, so the display fills at once
                EXPECT_EQ(LogMask::classify(records[i])->effectiveCode(), LogCode::kSimFiles + i);
        }
        for (const Bytes& record : records) {
            generator->updateState(state, record);
            const auto c = LogMask::classify(record);
            if (!c) continue;
            const ByteReader r = withoutPrefix(record);
            latest[c->effectiveCode()] = Bytes(r.bytes().begin(), r.bytes().end());
            if (c->effectiveCode() == LogCode::kUTRANRRCState && r.u8(13).value_or(0) == 1) mode = r.u8(14).value_or(0);
            if (c->effectiveCode() != LogCode::kUTRANBLERAndSIR) continue;
            // Transport channels exist in Cell FACH (one FACH on the S-CCPCH in timeslot 0) and
            // Cell DCH (2 or 4 TRCHs, CCTRCHs in the downlink timeslots 4-6).
            const size_t trchs = (r.u16(14).value_or(0) >> 6) & 0x3F, cctrchs = r.u16(14).value_or(0) >> 12;
            ASSERT_TRUE(mode == UTRANScenario::kCellFach || mode == UTRANScenario::kCellDCH) << "tick " << tick;
            EXPECT_EQ(trchs, mode == UTRANScenario::kCellFach ? 1u : trchs == 4 ? 4u : 2u);
            ASSERT_TRUE(cctrchs >= 1 && r.has(0, 289 + 34 * trchs + 8 * cctrchs));
            for (size_t j = 0; j < cctrchs; ++j) {
                const uint8_t tsnum = r.u8(289 + 34 * trchs + 8 * j + 1).value_or(0xFF);
                EXPECT_TRUE(mode == UTRANScenario::kCellFach ? tsnum == 0 : tsnum >= 4 && tsnum <= 6) << int(tsnum);
            }
        }
        size_t complaints = 0;
        for (const SystemLogCapture::Line& line : capture.lines())
            if (line.text.find("dropped record") != std::string::npos || line.text.find("Invalid log type") != std::string::npos)
                ++complaints;
        // Ticks 12, 37, 62, 87 carry in turn a record cut inside its header (dropped silently),
        // one of type 2 and a SIM plist cut off in transfer.
        const bool complains = tick % 25 == 12 && (tick / 25) % 3 != 0;
        EXPECT_EQ(complaints, complains ? 1u : 0u) << "tick " << tick;
    }
    for (int32_t code : {LogCode::kUTRANNeighbourList, LogCode::kUTRANBLERAndSIR, LogCode::kUTRANGSMNeighbourList,
                         LogCode::kUTRANRRCState, LogCode::kUTRANServingCell, LogCode::kSimFiles, LogCode::kCellMonitor,
                         LogCode::kPDPContexts})
        EXPECT_TRUE(latest.count(code)) << std::hex << code << " never sent";

}

}  // namespace
}  // namespace vantorel

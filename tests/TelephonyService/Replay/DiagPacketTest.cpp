// Tests DiagPacket: log-packet checks, the dual-SIM wrapper, non-log bodies, the Morvek record and the time-stamp conversion.
#include "TelephonyService/Replay/DiagPacket.h"

#include "Platform/ByteReader.h"
#include "TelephonyService/Replay/DiagTestFrames.h"

#include <gtest/gtest.h>

namespace vantorel {
namespace {

using testframes::logPacketBody;

TEST(DiagPacketTest, LogPacketGivesCodeTimeStampPayloadAndMorvekRecord) {
    const Bytes body = logPacketBody(0xB0C1, 0x00D0B23E36510000ull, {0x01, 0xAA, 0xBB});
    DiagPacket p(body);
    ASSERT_EQ(p.kind(), DiagPacket::Kind::LogPacket);
    EXPECT_TRUE(p.isLogPacket());
    EXPECT_TRUE(p.error().empty());
    EXPECT_FALSE(p.subscriptionId());
    EXPECT_EQ(p.command(), 0x10);
    EXPECT_EQ(p.logCode(), 0xB0C1);
    EXPECT_EQ(p.timeStamp(), 0x00D0B23E36510000ull);
    EXPECT_EQ(Bytes(p.payload().begin(), p.payload().end()), (Bytes{0x01, 0xAA, 0xBB}));
    // The DLF record is the body after 10 00 <len>.
    EXPECT_EQ(Bytes(p.dlfRecord().begin(), p.dlfRecord().end()), Bytes(body.begin() + 4, body.end()));
    // The Morvek record is what the decoders frame (Part 3.2): type 1 at 0, DLF length at
    // 1..2 (12 + 3), code at 3..4, time stamp at 5..12, payload from 13.
    const Bytes record = p.morvekRecord();
    EXPECT_EQ(record, testframes::morvekRecord(0xB0C1, 0x00D0B23E36510000ull, {0x01, 0xAA, 0xBB}));
    ByteReader r(record);
    EXPECT_EQ(r.u8(0), 1);
    EXPECT_EQ(r.u16(1), 15);
    EXPECT_EQ(r.u16(3), 0xB0C1);
    EXPECT_EQ(r.u64(5), 0x00D0B23E36510000ull);
    EXPECT_EQ(r.u8(13), 0x01);
    EXPECT_EQ(record.size(), 16u);
}

TEST(DiagPacketTest, LogPacketWithEmptyPayloadIsValid) {
    const Bytes body = logPacketBody(0x7130, 7, {});
    DiagPacket p(body);
    ASSERT_TRUE(p.isLogPacket()) << p.error();
    EXPECT_TRUE(p.payload().empty());
    EXPECT_EQ(p.morvekRecord().size(), 13u);
}

TEST(DiagPacketTest, DualSimWrapperIsStripped) {
    const Bytes inner = logPacketBody(0x7131, 42, {0x05, 0x06});
    const Bytes body = testframes::dualSimWrapped(0x01020304, inner);
    DiagPacket p(body);
    ASSERT_TRUE(p.isLogPacket()) << p.error();
    EXPECT_EQ(p.subscriptionId(), 0x01020304u);
    EXPECT_EQ(Bytes(p.innerBody().begin(), p.innerBody().end()), inner);
    EXPECT_EQ(p.logCode(), 0x7131);
    EXPECT_EQ(p.timeStamp(), 42u);
    EXPECT_EQ(p.morvekRecord(), testframes::morvekRecord(0x7131, 42, {0x05, 0x06}));
}

TEST(DiagPacketTest, DualSimWrapperAroundOtherBodyIsNotALogPacket) {
    const Bytes inner{0x79, 0x00, 0x01};
    const Bytes body = testframes::dualSimWrapped(2, inner);
    DiagPacket p(body);
    EXPECT_EQ(p.kind(), DiagPacket::Kind::NotLogPacket);
    EXPECT_EQ(p.subscriptionId(), 2u);
    EXPECT_EQ(p.command(), 0x79);
    EXPECT_TRUE(p.morvekRecord().empty());
}

TEST(DiagPacketTest, CutDualSimWrapperIsMalformed) {
    const Bytes body{0x98, 0x01, 0x00, 0x00, 0x01, 0x00};
    DiagPacket p(body);
    EXPECT_EQ(p.kind(), DiagPacket::Kind::Malformed);
    EXPECT_EQ(p.error(), "dual-SIM wrapper cut short: 6 of 8 bytes");
}

TEST(DiagPacketTest, Other0x98BodyIsNotAWrapper) {
    const Bytes body{0x98, 0x02, 0x00, 0x00, 0x10, 0x00, 0x00, 0x00, 0x10, 0x00};
    DiagPacket p(body);
    EXPECT_EQ(p.kind(), DiagPacket::Kind::NotLogPacket);
    EXPECT_FALSE(p.subscriptionId());
    EXPECT_EQ(p.command(), 0x98);
}

TEST(DiagPacketTest, LogPacketWithUnequalLengthsIsRejected) {
    Bytes body = logPacketBody(0x7132, 1, {0x01, 0x02});
    body[2] = static_cast<uint8_t>(body[2] + 1);  // outer length 15, inner 14
    DiagPacket p(body);
    EXPECT_EQ(p.kind(), DiagPacket::Kind::Malformed);
    EXPECT_EQ(p.error(), "log packet lengths differ: outer 15, inner 14");
    EXPECT_TRUE(p.morvekRecord().empty());
    EXPECT_EQ(p.logCode(), 0);
}

TEST(DiagPacketTest, LogPacketLengthPastTheBodyIsRejected) {
    Bytes body = logPacketBody(0x7132, 1, {0x01, 0x02});
    body.pop_back();  // lengths say 14, 13 bytes follow the command header
    DiagPacket p(body);
    EXPECT_EQ(p.kind(), DiagPacket::Kind::Malformed);
    EXPECT_EQ(p.error(), "log packet length 14 runs past the body (13 bytes after the command header)");
}

TEST(DiagPacketTest, LogPacketWithBytesOverAfterItsRecordIsRejected) {
    Bytes body = logPacketBody(0x7132, 1, {0x01, 0x02});
    body.push_back(0xEE);
    DiagPacket p(body);
    EXPECT_EQ(p.kind(), DiagPacket::Kind::Malformed);
    EXPECT_EQ(p.error(), "log packet length 14 leaves 1 bytes over at the end of the body");
}

TEST(DiagPacketTest, LogPacketLengthBelowTheHeaderIsRejected) {
    Bytes body = logPacketBody(0x7132, 1, {0x01, 0x02});
    body[2] = body[4] = 11;
    DiagPacket p(body);
    EXPECT_EQ(p.kind(), DiagPacket::Kind::Malformed);
    EXPECT_EQ(p.error(), "log packet length 11 is below the 12-byte log header");
}

TEST(DiagPacketTest, LogPacketShorterThanItsHeaderIsRejected) {
    const Bytes full = logPacketBody(0x7132, 1, {});
    const Bytes body(full.begin(), full.begin() + 15);
    DiagPacket p(body);
    EXPECT_EQ(p.kind(), DiagPacket::Kind::Malformed);
    EXPECT_EQ(p.error(), "log packet of 15 bytes, shorter than its 16-byte header");
    const Bytes bareBody{0x10};
    DiagPacket bare(bareBody);
    EXPECT_EQ(bare.kind(), DiagPacket::Kind::Malformed);
}

TEST(DiagPacketTest, NonLogBodiesAreNotLogPackets) {
    const Bytes bodies[] = {
        {0x79, 0x00, 0x01, 0x02},        // extended text message
        {0x92, 0x00, 0x03, 0x00},        // QSR text message
        {0x60, 0x00, 0x10, 0x00},        // event report
        {0x4B, 0x12, 0x0F, 0x02},        // subsystem command response
        {0x1D, 0xCB, 0x9D, 0x2A},        // time stamp response
        {0xEE, 0xEE, 0x01, 0x02, 0x03},  // record of the recording tool
        {},
    };
    for (const Bytes& body : bodies) {
        DiagPacket p(body);
        EXPECT_EQ(p.kind(), DiagPacket::Kind::NotLogPacket);
        EXPECT_FALSE(p.isLogPacket());
        EXPECT_TRUE(p.error().empty());
        EXPECT_TRUE(p.morvekRecord().empty());
    }
    EXPECT_FALSE(DiagPacket(ByteView()).command());
}

TEST(DiagPacketTest, TimeStampOfGpsEpochPlusOneDayConverts) {
    // One day = 86400 s = 69,120,000 ticks of 1.25 ms, in the upper 48 bits.
    const uint64_t oneDay = 69120000ull << 16;
    EXPECT_EQ(DiagPacket::microsecondsSince1970(oneDay), (315964800ll + 86400) * 1000000);
    EXPECT_EQ(DiagPacket::microsecondsSince1970(0), 315964800ll * 1000000);
    // Lower 16 bits: half a tick = 625 us; 1/65536 tick rounds down to 0 us.
    EXPECT_EQ(DiagPacket::microsecondsSince1970(oneDay | 0x8000), (315964800ll + 86400) * 1000000 + 625);
    EXPECT_EQ(DiagPacket::microsecondsSince1970(oneDay | 0x0001), (315964800ll + 86400) * 1000000);
    // The largest time stamp does not overflow.
    EXPECT_GT(DiagPacket::microsecondsSince1970(~0ull), 0);
}

TEST(DiagPacketTest, TimeStampOfTheQmdlExampleIsIn2015) {
    // First log packet of captures/qmdl_example.qmdl: 2015-07-08 22:25:23.941250 UTC.
    EXPECT_EQ(DiagPacket::microsecondsSince1970(0x00D0B23E36510000ull), 1436394323941250ll);
}

}  // namespace
}  // namespace vantorel

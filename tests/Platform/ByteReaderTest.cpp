// Tests for ByteReader, the one bounds-checked little-endian reader (DESIGN.md "Decoding records safely").
#include "Platform/ByteReader.h"

#include <gtest/gtest.h>

using namespace vantorel;

TEST(ByteReader, ReadsLittleEndianAndBigEndianFields) {
    const Bytes b{0x01, 0x34, 0x12, 0x78, 0x56, 0x34, 0x12, 0xFF, 0xFE, 0, 0, 0, 0, 0, 0};
    ByteReader r(b);
    EXPECT_EQ(r.u8(0), 0x01);
    EXPECT_EQ(r.u16(1), 0x1234);
    EXPECT_EQ(r.u16be(1), 0x3412);
    EXPECT_EQ(r.u32(3), 0x12345678u);
    EXPECT_EQ(r.s16(7), static_cast<int16_t>(0xFEFF));
    EXPECT_EQ(r.s32(5), static_cast<int32_t>(0xFEFF1234));
    EXPECT_EQ(r.u64(7), 0xFEFFull);
}

TEST(ByteReader, NothingIsReadPastTheEnd) {
    const Bytes b{1, 2, 3};
    ByteReader r(b);
    EXPECT_EQ(r.u8(2), 3);
    EXPECT_FALSE(r.u8(3));
    EXPECT_FALSE(r.u16(2));
    EXPECT_FALSE(r.u32(0));
    EXPECT_FALSE(r.u64(0));
    EXPECT_FALSE(r.u16be(2));
    EXPECT_FALSE(r.u8(SIZE_MAX));
    EXPECT_FALSE(r.u32(SIZE_MAX - 1));  // no overflow in offset + width
    EXPECT_FALSE(r.has(SIZE_MAX, 2));
}

TEST(ByteReader, SlicesAreBounded) {
    const Bytes b{1, 2, 3, 4};
    ByteReader r(b);
    EXPECT_EQ(r.from(1).size(), 3u);
    EXPECT_TRUE(r.from(4).empty());
    EXPECT_TRUE(r.from(99).empty());
    EXPECT_EQ(r.slice(1, 3)->size(), 3u);
    EXPECT_FALSE(r.slice(1, 4));
    EXPECT_TRUE(r.slice(4, 0));
}

TEST(ByteReader, EmptyBufferReadsNothing) {
    ByteReader r{ByteView()};
    EXPECT_EQ(r.size(), 0u);
    EXPECT_FALSE(r.u8(0));
    EXPECT_TRUE(r.has(0, 0));
}

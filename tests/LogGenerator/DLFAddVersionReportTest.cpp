// Tests for DLFAddVersionReport (Part 3.4): the 161-byte version record checked field by field.
#include "LogGenerator/DLFAddVersionReport.h"

#include "Platform/ByteReader.h"

#include <gtest/gtest.h>

#include <cstring>
#include <string>
#include <vector>

using namespace vantorel;

namespace {
std::string textAt(const std::vector<uint8_t>& b, size_t offset, size_t width) {
    return std::string(reinterpret_cast<const char*>(&b[offset]), strnlen(reinterpret_cast<const char*>(&b[offset]), width));
}
}  // namespace

TEST(DLFAddVersionReport, HeaderFieldsAtTheirOffsets) {
    std::vector<uint8_t> buf(200, 0xAA);
    unsigned written = 99;
    int result = DLFAddVersionReport(buf.data(), 200, &written, 1, 1, "Vantorel 0.1.0", "EXECUTABLE_NAME",
                                     "Jun 28 2016 22:01:10", 0x12345678u, -210, 1);
    ASSERT_EQ(result, 0);
    EXPECT_EQ(written, 161u);
    ByteReader r(buf);
    EXPECT_EQ(r.u16(0), 161);         // record length
    EXPECT_EQ(r.u16(2), 0x1FFD);      // record code
    EXPECT_EQ(r.u64(4), 0u);          // time stamp left zero
    EXPECT_EQ(r.u16(12), 1);          // first version number
    EXPECT_EQ(r.u16(14), 1);          // second version number
    EXPECT_EQ(textAt(buf, 16, 7), "Vantor");  // 7-byte field keeps 6 characters
    EXPECT_EQ(buf[22], 0);
    EXPECT_EQ(textAt(buf, 23, 16), "EXECUTABLE_NAME");  // 15 characters fill it exactly
    EXPECT_EQ(buf[38], 0);
    for (size_t i = 39; i < 63; ++i) EXPECT_EQ(buf[i], 0) << i;
    EXPECT_EQ(textAt(buf, 63, 18), "Jun 28 2016 22:01");  // seconds lost to the field
    EXPECT_EQ(buf[80], 0);
    EXPECT_EQ(r.u32(81), 0x12345678u);
    EXPECT_EQ(r.s16(85), -210);
    EXPECT_EQ(r.u16(87), 1);
    for (size_t i = 89; i < 161; ++i) EXPECT_EQ(buf[i], 0) << i;
    EXPECT_EQ(buf[161], 0xAA);  // nothing past the record
}

TEST(DLFAddVersionReport, ShortTextsArePaddedWithZeros) {
    std::vector<uint8_t> buf(161, 0xAA);
    unsigned written = 0;
    ASSERT_EQ(DLFAddVersionReport(buf.data(), 161, &written, 1, 1, "(none)", "x", "", 0, 0, 0), 0);
    EXPECT_EQ(textAt(buf, 16, 7), "(none)");
    EXPECT_EQ(buf[22], 0);
    EXPECT_EQ(textAt(buf, 23, 16), "x");
    for (size_t i = 24; i < 39; ++i) EXPECT_EQ(buf[i], 0);
    EXPECT_EQ(buf[63], 0);
}

TEST(DLFAddVersionReport, ACapacityOf160GivesResult3Count0AndAnUntouchedBuffer) {
    std::vector<uint8_t> buf(161, 0xAA);
    unsigned written = 77;
    EXPECT_EQ(DLFAddVersionReport(buf.data(), 160, &written, 1, 1, "v", "e", "d", 1, 2, 0), 3);
    EXPECT_EQ(written, 0u);
    for (uint8_t b : buf) EXPECT_EQ(b, 0xAA);
}

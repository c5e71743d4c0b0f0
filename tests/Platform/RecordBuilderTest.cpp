// Tests for RecordBuilder: the Morvek record layout of Part 3.2 shared by tests and the emulator.
#include "Platform/RecordBuilder.h"

#include "Platform/ByteReader.h"
#include "PropertyList/Array.h"
#include "PropertyList/PropertyListSerialization.h"

#include <gtest/gtest.h>

using namespace vantorel;

TEST(RecordBuilder, HeaderHoldsTypeDlfLengthCodeAndTimeStamp) {
    Bytes r = RecordBuilder::ordinary(0xD0E0, 15).timestamp(0x1122334455667788ull).u8(14, 3).build();
    ByteReader reader(r);
    ASSERT_EQ(r.size(), 15u);
    EXPECT_EQ(reader.u8(0), 1);                       // type: ordinary
    EXPECT_EQ(reader.u16(1), 14);                     // DLF length = 12 + payload (2)
    EXPECT_EQ(reader.u16(3), 0xD0E0);                 // code
    EXPECT_EQ(reader.u64(5), 0x1122334455667788ull);  // time stamp
    EXPECT_EQ(reader.u8(14), 3);
}

TEST(RecordBuilder, FieldsGrowTheRecordAndBigEndianIsHighByteFirst) {
    Bytes r = RecordBuilder::ordinary(0x7135).u16be(18, 0x1234).build();
    ASSERT_EQ(r.size(), 20u);
    EXPECT_EQ(r[18], 0x12);
    EXPECT_EQ(r[19], 0x34);
    EXPECT_EQ(ByteReader(r).u16(1), 19);
}

TEST(RecordBuilder, ExtraRecordsCarryTypeFFAndASerialisedPropertyList) {
    Bytes r = RecordBuilder::extraPropertyList(2, Value(Array::of({"ctx"})), true);
    EXPECT_EQ(r[0], 0xFF);
    EXPECT_EQ(ByteReader(r).u16(3), 2);
    auto parsed = PropertyListSerialization::read(ByteView(r).subspan(13));
    ASSERT_TRUE(parsed);
    EXPECT_EQ(*parsed.value, Value(Array::of({"ctx"})));
}

TEST(RecordBuilder, PrefixIs0x81ThenTheRecord) {
    Bytes r = RecordBuilder::ordinary(0x1234).buildWithPrefix();
    ASSERT_EQ(r.size(), 15u);
    EXPECT_EQ(r[0], 0x81);
    EXPECT_EQ(r[2], 1);
    EXPECT_EQ(ByteReader(r).u16(5), 0x1234);
}

TEST(RecordBuilder, ResizeCutsBelowTheHeader) {
    EXPECT_EQ(RecordBuilder::ordinary(0x1234).resize(11).build().size(), 11u);
    EXPECT_EQ(RecordBuilder::ordinary(0x1234).resize(2).build(), (Bytes{1, 0}));
}

// TRCHBLERMeasurementTest: tests src/LogGenerator/UTRAN/TRCHBLERMeasurement.cpp, the "TRCH BLER" section of Part 7.2 (record 0xD00C).
#include "LogGenerator/UTRAN/TRCHBLERMeasurement.h"

#include "Platform/RecordBuilder.h"
#include "Platform/SystemLog.h"
#include "Platform/SystemLogCapture.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"

#include <gtest/gtest.h>

using namespace vantorel;

namespace {

// The 16-bit value at 14..15 with TRCH count t in bits 6-11 and CCTRCH count c in
// bits 12-15 (= bits 4-7 of byte 15).
uint16_t counts(unsigned t, unsigned c) { return static_cast<uint16_t>((t << 6) | (c << 12)); }

class TRCHBLERMeasurementTest : public ::testing::Test {
protected:
    void SetUp() override { section.updateSectionRef(Value(list)); }

    std::string text(size_t i, const std::string& key) const {
        if (i >= list->size()) return "<no entry>";
        auto d = list->at(i).asDictionary();
        if (!d) return "<not a dictionary>";
        const Value* v = d->find(key);
        if (!v) return "<absent>";
        const std::string* s = v->asString();
        return s ? *s : "<not a string>";
    }

    TRCHBLERMeasurement section;
    ArrayRef list = Array::create();
};

}  // namespace

TEST_F(TRCHBLERMeasurementTest, NameAndLogCode) {
    EXPECT_EQ(section.getSectionName(), "TRCH BLER");
    EXPECT_EQ(section.getLogCodeArray(), std::vector<int32_t>{0xD00C});
}

TEST_F(TRCHBLERMeasurementTest, OneDictionaryPerTRCHEntry) {
    const Bytes record = RecordBuilder::ordinary(0xD00C, 30)
                             .u16(14, counts(3, 0))     // t = 3
                             .bytes(17, {5, 200})      // TRCH entry 0 at 17: ID, BLER
                             .bytes(19, {6, 0})        // entry 1 at 19
                             .bytes(21, {31, 255})     // entry 2 at 21 (both bytes unsigned)
                             .bytes(23, {77, 77})      // beyond the count
                             .build();
    section.updateWithData(record, 0xD00C);
    ASSERT_EQ(list->size(), 3u);
    EXPECT_EQ(text(0, "TRCH ID"), "5");
    EXPECT_EQ(text(0, "TRCH BLER Measurement"), "200");
    EXPECT_EQ(text(1, "TRCH ID"), "6");
    EXPECT_EQ(text(1, "TRCH BLER Measurement"), "0");
    EXPECT_EQ(text(2, "TRCH ID"), "31");
    EXPECT_EQ(text(2, "TRCH BLER Measurement"), "255");
    EXPECT_EQ(list->at(0).asDictionary()->size(), 2u);
}

TEST_F(TRCHBLERMeasurementTest, TRCHCountIsBits6To11OfTheValueAt14) {
    // Bits 0-5 and 12-15 set around t = 2: they must not change the count.
    const Bytes record = RecordBuilder::ordinary(0xD00C, 40)
                             .u16(14, static_cast<uint16_t>(counts(2, 15) | 0x3F))
                             .bytes(17, {1, 10})
                             .bytes(19, {2, 20})
                             .bytes(21, {3, 30})
                             .build();
    section.updateWithData(record, 0xD00C);
    ASSERT_EQ(list->size(), 2u);
    EXPECT_EQ(text(1, "TRCH ID"), "2");
}

TEST_F(TRCHBLERMeasurementTest, SixtyThreeTRCHEntries) {
    RecordBuilder b = RecordBuilder::ordinary(0xD00C, 17 + 2 * 63);
    b.u16(14, counts(63, 0));  // t = 63, the largest count
    for (uint8_t i = 0; i < 63; ++i) b.bytes(17 + 2 * i, {i, static_cast<uint8_t>(100 + i)});
    section.updateWithData(b.build(), 0xD00C);
    ASSERT_EQ(list->size(), 63u);
    EXPECT_EQ(text(62, "TRCH ID"), "62");
    EXPECT_EQ(text(62, "TRCH BLER Measurement"), "162");
}

TEST_F(TRCHBLERMeasurementTest, CountLargerThanTheRecordHoldsStopsAtTheRecordsEnd) {
    // t = 63 in a 22-byte record: entries at 17 and 19 fit, the one at 21 (21..22) does not.
    const Bytes record = RecordBuilder::ordinary(0xD00C, 22)
                             .u16(14, counts(63, 0))
                             .bytes(17, {1, 11})
                             .bytes(19, {2, 22})
                             .u8(21, 3)
                             .build();
    ASSERT_EQ(record.size(), 22u);
    section.updateWithData(record, 0xD00C);
    ASSERT_EQ(list->size(), 2u);
    EXPECT_EQ(text(1, "TRCH BLER Measurement"), "22");
}

TEST_F(TRCHBLERMeasurementTest, ARecordShorterThan17BytesLeavesTheListAsItWas) {
    list->append(Value("old"));
    section.updateWithData(RecordBuilder::ordinary(0xD00C, 16).u16(14, counts(1, 0)).build(), 0xD00C);
    ASSERT_EQ(list->size(), 1u);
    EXPECT_TRUE(list->at(0).isString());
}

TEST_F(TRCHBLERMeasurementTest, ANewRecordReplacesThePreviousEntries) {
    list->append(Value("old"));
    section.updateWithData(RecordBuilder::ordinary(0xD00C, 17).build(), 0xD00C);  // t = 0
    EXPECT_TRUE(list->empty());
    section.updateWithData(RecordBuilder::ordinary(0xD00C, 19).u16(14, counts(1, 0)).bytes(17, {4, 8}).build(),
                           0xD00C);
    ASSERT_EQ(list->size(), 1u);
    EXPECT_EQ(text(0, "TRCH ID"), "4");
}

TEST_F(TRCHBLERMeasurementTest, LogsTRCHBLERMeasurementAtNoticeOnEveryCallEvenForAForeignCode) {
    list->append(Value("old"));
    SystemLogCapture cap;
    section.updateWithData(RecordBuilder::ordinary(0xD00C, 19).u16(14, counts(1, 0)).build(), 0xD00A);
    EXPECT_EQ(cap.count(SystemLog::kNotice, "TRCH BLER Measurement"), 1);
    EXPECT_EQ(cap.count(SystemLog::kWarning, "TRCH BLER Measurement"), 0);
    ASSERT_EQ(list->size(), 1u);
    EXPECT_TRUE(list->at(0).isString());
}

// CCTRCHSIRMeasurementTest: tests src/LogGenerator/UTRAN/CCTRCHSIRMeasurement.cpp, the "CCTRCH SIR" section of Part 7.2 (record 0xD00C).
#include "LogGenerator/UTRAN/CCTRCHSIRMeasurement.h"

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

class CCTRCHSIRMeasurementTest : public ::testing::Test {
protected:
    void SetUp() override { section.updateSectionRef(Value(list)); }

    DictionaryRef entry(size_t i) const { return i < list->size() ? list->at(i).asDictionary() : nullptr; }

    std::string text(size_t i, const std::string& key) const {
        auto d = entry(i);
        if (!d) return "<no entry>";
        const Value* v = d->find(key);
        if (!v) return "<absent>";
        const std::string* s = v->asString();
        return s ? *s : "<not a string>";
    }

    std::vector<std::string> sir(size_t i) const {
        std::vector<std::string> out;
        auto d = entry(i);
        if (!d || !d->find("SIR")) return out;
        auto a = d->find("SIR")->asArray();
        if (!a) return out;
        for (const Value& v : *a) out.push_back(v.asString() ? *v.asString() : "<not a string>");
        return out;
    }

    CCTRCHSIRMeasurement section;
    ArrayRef list = Array::create();
};

}  // namespace

TEST_F(CCTRCHSIRMeasurementTest, NameAndLogCode) {
    EXPECT_EQ(section.getSectionName(), "CCTRCH SIR");
    EXPECT_EQ(section.getLogCodeArray(), std::vector<int32_t>{0xD00C});
}

// Edge: "0xD00C with t = 2 and c = 1 puts the CCTRCH entry at 357" (289 + 34*2).
TEST_F(CCTRCHSIRMeasurementTest, D00CWithTEqual2AndCEqual1PutsTheCCTRCHEntryAt357) {
    const Bytes record = RecordBuilder::ordinary(0xD00C, 365)
                             .u16(14, counts(2, 1))                    // t = 2, c = 1
                             .bytes(17, {1, 10, 2, 20})                // the two TRCH entries
                             .bytes(293, {99, 99, 99, 99, 99, 99, 99, 99})  // 289 + 2*2: not an entry
                             .bytes(357, {4, 2, 10, 20, 30, 40, 50, 60})  // CCTRCH entry 0
                             .build();
    section.updateWithData(record, 0xD00C);
    ASSERT_EQ(list->size(), 1u);
    EXPECT_EQ(text(0, "CCTRCH ID"), "4");
    EXPECT_EQ(text(0, "TSNUM"), "2");
    EXPECT_EQ(sir(0), (std::vector<std::string>{"10", "20", "30", "40", "50", "60"}));
}

TEST_F(CCTRCHSIRMeasurementTest, SIRIsAnArrayOfSixDecimalStringsInByteOrder) {
    const Bytes record = RecordBuilder::ordinary(0xD00C, 305)
                             .u16(14, counts(0, 2))                           // t = 0, c = 2
                             .bytes(289, {7, 3, 0, 1, 127, 128, 254, 255})    // entry 0 at 289
                             .bytes(297, {8, 5, 6, 5, 4, 3, 2, 1})            // entry 1 at 297
                             .build();
    section.updateWithData(record, 0xD00C);
    ASSERT_EQ(list->size(), 2u);
    EXPECT_EQ(text(0, "CCTRCH ID"), "7");
    EXPECT_EQ(text(0, "TSNUM"), "3");
    EXPECT_EQ(sir(0), (std::vector<std::string>{"0", "1", "127", "128", "254", "255"}));
    EXPECT_EQ(text(1, "CCTRCH ID"), "8");
    EXPECT_EQ(text(1, "TSNUM"), "5");
    EXPECT_EQ(sir(1), (std::vector<std::string>{"6", "5", "4", "3", "2", "1"}));
    EXPECT_EQ(entry(0)->size(), 3u);
    ASSERT_NE(entry(0)->find("SIR"), nullptr);
    EXPECT_TRUE(entry(0)->find("SIR")->isArray());
}

TEST_F(CCTRCHSIRMeasurementTest, CCTRCHCountIsBits4To7OfByte15) {
    RecordBuilder b = RecordBuilder::ordinary(0xD00C, 289 + 8 * 16);
    b.u8(14, 0x00).u8(15, 0xF0);  // c = 15, t = 0 (byte 15 bits 0-3 are t's bits 2-5: clear)
    for (uint8_t j = 0; j < 16; ++j) b.u8(289 + 8 * j, j);
    section.updateWithData(b.build(), 0xD00C);
    ASSERT_EQ(list->size(), 15u);
    EXPECT_EQ(text(14, "CCTRCH ID"), "14");
}

TEST_F(CCTRCHSIRMeasurementTest, CountLargerThanTheRecordHoldsStopsAtTheRecordsEnd) {
    // c = 15 with t = 1: entries at 323, 331; the one at 339 is cut at the record's end.
    const Bytes record = RecordBuilder::ordinary(0xD00C, 342)
                             .u16(14, counts(1, 15))
                             .bytes(323, {1, 0, 0, 0, 0, 0, 0, 0})
                             .bytes(331, {2, 0, 0, 0, 0, 0, 0, 0})
                             .bytes(339, {3, 0, 0})
                             .build();
    ASSERT_EQ(record.size(), 342u);
    section.updateWithData(record, 0xD00C);
    ASSERT_EQ(list->size(), 2u);
    EXPECT_EQ(text(0, "CCTRCH ID"), "1");
    EXPECT_EQ(text(1, "CCTRCH ID"), "2");
}

TEST_F(CCTRCHSIRMeasurementTest, ManyTRCHsPushTheEntriesPastAShortRecord) {
    list->append(Value("old"));
    // t = 63: the first CCTRCH entry would be at 289 + 34*63 = 2431, far past 300 bytes.
    section.updateWithData(RecordBuilder::ordinary(0xD00C, 300).u16(14, counts(63, 15)).build(), 0xD00C);
    EXPECT_TRUE(list->empty());
}

TEST_F(CCTRCHSIRMeasurementTest, ARecordShorterThan17BytesLeavesTheListAsItWas) {
    list->append(Value("old"));
    section.updateWithData(RecordBuilder::ordinary(0xD00C, 16).u16(14, counts(0, 1)).build(), 0xD00C);
    ASSERT_EQ(list->size(), 1u);
    EXPECT_TRUE(list->at(0).isString());
}

TEST_F(CCTRCHSIRMeasurementTest, ANewRecordReplacesThePreviousEntries) {
    list->append(Value("old"));
    section.updateWithData(RecordBuilder::ordinary(0xD00C, 297).u16(14, counts(0, 1)).u8(289, 9).build(), 0xD00C);
    ASSERT_EQ(list->size(), 1u);
    EXPECT_EQ(text(0, "CCTRCH ID"), "9");
}

TEST_F(CCTRCHSIRMeasurementTest, LogsCCTRCHSIRMeasurementOnEveryCallEvenForAForeignCode) {
    list->append(Value("old"));
    SystemLogCapture cap;
    section.updateWithData(RecordBuilder::ordinary(0xD00C, 297).u16(14, counts(0, 1)).build(), 0xD0E0);
    EXPECT_EQ(cap.count(SystemLog::kWarning, "CCTRCH SIR Measurement"), 1);
    ASSERT_EQ(list->size(), 1u);
    EXPECT_TRUE(list->at(0).isString());
}

// UTRANNeighbhorMeasurementsTest: tests src/LogGenerator/UTRAN/UTRANNeighbhorMeasurements.cpp, the "Neighbor Cell List" section of Part 7.2 (record 0xD00A).
#include "LogGenerator/UTRAN/UTRANNeighbhorMeasurements.h"

#include "Platform/RecordBuilder.h"
#include "Platform/SystemLog.h"
#include "Platform/SystemLogCapture.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"

#include <gtest/gtest.h>

using namespace vantorel;

namespace {

// The first four bytes of a 0xD00A entry, packed by the spec's table:
//   byte 0            UARFCN bits 0-7
//   byte 1 bits 0-5   UARFCN bits 8-13;  bits 6-7  Cell ID bits 0-1
//   byte 2 bits 0-4   Cell ID bits 2-6;  bits 5-7  Filter RSCP bits 0-2
//   byte 3 bits 0-4   Filter RSCP bits 3-7; bits 5-6 Status; bit 7 inJDCS
struct Entry {
    uint8_t b[4];
};

Entry pack(unsigned uarfcn, unsigned cellId, unsigned rscp, unsigned status, bool inJDCS) {
    Entry e{};
    e.b[0] = static_cast<uint8_t>(uarfcn & 0xFF);
    e.b[1] = static_cast<uint8_t>(((uarfcn >> 8) & 0x3F) | ((cellId & 0x03) << 6));
    e.b[2] = static_cast<uint8_t>(((cellId >> 2) & 0x1F) | ((rscp & 0x07) << 5));
    e.b[3] = static_cast<uint8_t>(((rscp >> 3) & 0x1F) | ((status & 0x03) << 5) | (inJDCS ? 0x80 : 0));
    return e;
}

// A 0xD00A record of `length` bytes with byte 16 = countByte.
RecordBuilder neighbourRecord(uint8_t countByte, size_t length) {
    RecordBuilder b = RecordBuilder::ordinary(0xD00A, length);
    b.u8(16, countByte);  // bits 1-7: entry count
    return b;
}

// Writes entry i at 168 + 16*i.
void putEntry(RecordBuilder& b, size_t i, const Entry& e) {
    b.bytes(168 + 16 * i, {e.b[0], e.b[1], e.b[2], e.b[3]});
}

class UTRANNeighbhorMeasurementsTest : public ::testing::Test {
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

    UTRANNeighbhorMeasurements section;
    ArrayRef list = Array::create();
};

}  // namespace

TEST_F(UTRANNeighbhorMeasurementsTest, NameAndLogCode) {
    EXPECT_EQ(section.getSectionName(), "Neighbor Cell List");
    EXPECT_EQ(section.getLogCodeArray(), std::vector<int32_t>{0xD00A});
}

// Edge: "0xD00A with byte 16 = 0x05 yields two entries (count 2), read at 168 and 184."
TEST_F(UTRANNeighbhorMeasurementsTest, D00AWithByte16Equal0x05YieldsTwoEntriesReadAt168And184) {
    RecordBuilder b = neighbourRecord(0x05, 216);  // room for a third entry at 200
    putEntry(b, 0, pack(10700, 1, 0, 0, false));   // at 168
    putEntry(b, 1, pack(10713, 2, 0, 0, false));   // at 184
    putEntry(b, 2, pack(10738, 3, 0, 0, false));   // at 200: beyond the count
    section.updateWithData(b.build(), 0xD00A);
    ASSERT_EQ(list->size(), 2u);
    EXPECT_EQ(text(0, "UARFCN"), "10700");
    EXPECT_EQ(text(0, "Cell ID"), "1");
    EXPECT_EQ(text(1, "UARFCN"), "10713");
    EXPECT_EQ(text(1, "Cell ID"), "2");
}

// Edge: "An 0xD00A entry with bits 5-6 of byte 3 equal to 3 has no "Status" key."
TEST_F(UTRANNeighbhorMeasurementsTest, EntryWithBits5To6OfByte3Equal3HasNoStatusKey) {
    RecordBuilder b = neighbourRecord(0x02, 184);
    b.bytes(168, {0x00, 0x00, 0x00, 0x60});  // byte 3 = 0b0110'0000: Status bits = 3
    section.updateWithData(b.build(), 0xD00A);
    ASSERT_EQ(list->size(), 1u);
    EXPECT_EQ(text(0, "Status"), "<absent>");
    EXPECT_EQ(text(0, "inJDCS"), "FALSE");
    EXPECT_EQ(text(0, "Filter RSCP"), "0.000000");
}

// Edge: ""Filter RSCP" of raw 128 is shown as 0.500000."
TEST_F(UTRANNeighbhorMeasurementsTest, FilterRSCPOfRaw128IsShownAs0Point500000) {
    RecordBuilder b = neighbourRecord(0x02, 184);
    b.bytes(168, {0x00, 0x00, 0x00, 0x10});  // RSCP 128 = 0b1000'0000: bit 7 -> byte 3 bit 4
    section.updateWithData(b.build(), 0xD00A);
    ASSERT_EQ(list->size(), 1u);
    EXPECT_EQ(text(0, "Filter RSCP"), "0.500000");
    EXPECT_EQ(text(0, "UARFCN"), "0");
    EXPECT_EQ(text(0, "Cell ID"), "0");
}

TEST_F(UTRANNeighbhorMeasurementsTest, EveryBitFieldOfAnEntryWithDistinctiveValues) {
    RecordBuilder b = neighbourRecord(0x02, 184);
    // UARFCN 10054 = 0x2746, Cell ID 93 = 0b1011101, Filter RSCP 255, Status 1, inJDCS set:
    //   byte 0 = 0x46                       UARFCN low byte
    //   byte 1 = 0x27 | (93 & 3) << 6 = 0x67
    //   byte 2 = (93 >> 2) | (255 & 7) << 5 = 0x17 | 0xE0 = 0xF7
    //   byte 3 = (255 >> 3) | 1 << 5 | 0x80 = 0x1F | 0x20 | 0x80 = 0xBF
    b.bytes(168, {0x46, 0x67, 0xF7, 0xBF});
    section.updateWithData(b.build(), 0xD00A);
    ASSERT_EQ(list->size(), 1u);
    EXPECT_EQ(text(0, "UARFCN"), "10054");
    EXPECT_EQ(text(0, "Cell ID"), "93");
    EXPECT_EQ(text(0, "Filter RSCP"), "0.996094");  // 255 * 0.00390625 = 0.99609375
    EXPECT_EQ(text(0, "Status"), "MSET");
    EXPECT_EQ(text(0, "inJDCS"), "TRUE");
    EXPECT_EQ(list->at(0).asDictionary()->size(), 5u);
}

TEST_F(UTRANNeighbhorMeasurementsTest, EachFieldAtItsMaximumLeavesTheOthersAtZero) {
    RecordBuilder b = neighbourRecord(0x08, 232);  // 4 entries
    putEntry(b, 0, pack(16383, 0, 0, 0, false));   // UARFCN all 14 bits
    putEntry(b, 1, pack(0, 127, 0, 0, false));     // Cell ID all 7 bits
    putEntry(b, 2, pack(0, 0, 255, 0, false));     // Filter RSCP all 8 bits
    putEntry(b, 3, pack(0, 0, 0, 0, true));        // inJDCS only
    section.updateWithData(b.build(), 0xD00A);
    ASSERT_EQ(list->size(), 4u);
    EXPECT_EQ(text(0, "UARFCN"), "16383");
    EXPECT_EQ(text(0, "Cell ID"), "0");
    EXPECT_EQ(text(0, "Filter RSCP"), "0.000000");
    EXPECT_EQ(text(1, "UARFCN"), "0");
    EXPECT_EQ(text(1, "Cell ID"), "127");
    EXPECT_EQ(text(1, "Filter RSCP"), "0.000000");
    EXPECT_EQ(text(2, "Cell ID"), "0");
    EXPECT_EQ(text(2, "Filter RSCP"), "0.996094");
    EXPECT_EQ(text(2, "Status"), "ASET");
    EXPECT_EQ(text(2, "inJDCS"), "FALSE");
    EXPECT_EQ(text(3, "Filter RSCP"), "0.000000");
    EXPECT_EQ(text(3, "Status"), "ASET");
    EXPECT_EQ(text(3, "inJDCS"), "TRUE");
}

TEST_F(UTRANNeighbhorMeasurementsTest, EveryStatusValue) {
    RecordBuilder b = neighbourRecord(0x08, 232);  // 4 entries
    for (unsigned status = 0; status < 4; ++status) putEntry(b, status, pack(100 + status, 0, 0, status, false));
    section.updateWithData(b.build(), 0xD00A);
    ASSERT_EQ(list->size(), 4u);
    EXPECT_EQ(text(0, "Status"), "ASET");
    EXPECT_EQ(text(1, "Status"), "MSET");
    EXPECT_EQ(text(2, "Status"), "DSET");
    EXPECT_EQ(text(3, "Status"), "<absent>");
    EXPECT_EQ(text(3, "UARFCN"), "103");  // the entry itself is still there
}

TEST_F(UTRANNeighbhorMeasurementsTest, CountIsByte16ShiftedRightByOne) {
    RecordBuilder b = neighbourRecord(0x07, 232);  // 0b111 >> 1 = 3; bit 0 is not part of the count
    for (size_t i = 0; i < 4; ++i) putEntry(b, i, pack(200 + i, 0, 0, 0, false));
    section.updateWithData(b.build(), 0xD00A);
    ASSERT_EQ(list->size(), 3u);
    EXPECT_EQ(text(2, "UARFCN"), "202");
}

TEST_F(UTRANNeighbhorMeasurementsTest, CountLargerThanTheRecordHoldsStopsAtTheRecordsEnd) {
    // Count 127 (byte 16 = 0xFE) in a record that holds entries at 168 and 184 and
    // only part of one at 200.
    RecordBuilder b = neighbourRecord(0xFE, 210);
    putEntry(b, 0, pack(1, 0, 0, 0, false));
    putEntry(b, 1, pack(2, 0, 0, 0, false));
    putEntry(b, 2, pack(3, 0, 0, 0, false));  // 200..215 does not fit in 210 bytes
    b.resize(210);
    section.updateWithData(b.build(), 0xD00A);
    ASSERT_EQ(list->size(), 2u);
    EXPECT_EQ(text(0, "UARFCN"), "1");
    EXPECT_EQ(text(1, "UARFCN"), "2");
}

TEST_F(UTRANNeighbhorMeasurementsTest, ACountWithNoEntryInsideTheRecordGivesAnEmptyList) {
    list->append(Value("old"));
    section.updateWithData(neighbourRecord(0xFE, 21).build(), 0xD00A);  // 21 bytes: no entry fits
    EXPECT_TRUE(list->empty());
}

TEST_F(UTRANNeighbhorMeasurementsTest, ARecordShorterThan21BytesLeavesTheListAsItWas) {
    list->append(Value("old"));
    SystemLogCapture cap;
    section.updateWithData(neighbourRecord(0x02, 20).build(), 0xD00A);
    ASSERT_EQ(list->size(), 1u);
    EXPECT_EQ(*list->at(0).asString(), "old");
    EXPECT_EQ(cap.lines().size(), 1u);  // ignored silently after the per-call line
}

TEST_F(UTRANNeighbhorMeasurementsTest, ANewRecordReplacesThePreviousEntries) {
    RecordBuilder first = neighbourRecord(0x04, 200);
    putEntry(first, 0, pack(1, 0, 0, 0, false));
    putEntry(first, 1, pack(2, 0, 0, 0, false));
    section.updateWithData(first.build(), 0xD00A);
    ASSERT_EQ(list->size(), 2u);

    RecordBuilder second = neighbourRecord(0x02, 184);
    putEntry(second, 0, pack(9, 0, 0, 0, false));
    section.updateWithData(second.build(), 0xD00A);
    ASSERT_EQ(list->size(), 1u);
    EXPECT_EQ(text(0, "UARFCN"), "9");
}

TEST_F(UTRANNeighbhorMeasurementsTest, LogsNeighbhorMeasurementsListOnEveryCallEvenForAForeignCode) {
    list->append(Value("old"));
    RecordBuilder b = neighbourRecord(0x02, 184);
    putEntry(b, 0, pack(5, 0, 0, 0, false));
    SystemLogCapture cap;
    section.updateWithData(b.build(), 0xD00E);  // another section's code
    EXPECT_EQ(cap.count(SystemLog::kWarning, "NeighbhorMeasurements List"), 1);
    ASSERT_EQ(list->size(), 1u);
    EXPECT_TRUE(list->at(0).isString());
    section.updateWithData(b.build(), 0xD00A);
    EXPECT_EQ(cap.count(SystemLog::kWarning, "NeighbhorMeasurements List"), 2);
    EXPECT_EQ(text(0, "UARFCN"), "5");
}

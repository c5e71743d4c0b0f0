// GSMNeighbhorMeasurementsTest: tests src/LogGenerator/UTRAN/GSMNeighbhorMeasurements.cpp, the "GSM Neighbor Cell List" section of Part 7.2 (record 0xD00E).
#include "LogGenerator/UTRAN/GSMNeighbhorMeasurements.h"

#include "Platform/RecordBuilder.h"
#include "Platform/SystemLog.h"
#include "Platform/SystemLogCapture.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"

#include <gtest/gtest.h>

using namespace vantorel;

namespace {

// Record 0xD00E with two full entries: count at 16, 8-byte entries at 17 and 25
// (entry: 0..1 Cell ID and flag bits, 2 NCC, 3 BCC, 4..5 ARFCN, 6..7 RSSI).
Bytes twoEntryRecord() {
    return RecordBuilder::ordinary(0xD00E, 33)
        .u8(16, 2)                      // entry count
        .bytes(17, {0x34, 0xD2, 5, 3})  // entry 0: Cell ID 0x1234, band 1, BSIC valid 1, NCC 5, BCC 3
        .u16(21, 62)                    //          ARFCN 62
        .u16(23, 0xFFA6)                //          RSSI -90
        .bytes(25, {0x01, 0x00, 1, 2})  // entry 1: Cell ID 1, NCC 1, BCC 2
        .u16(29, 1)                     //          ARFCN 1
        .u16(31, 0xFFB0)                //          RSSI -80
        .build();
}

class GSMNeighbhorMeasurementsTest : public ::testing::Test {
protected:
    void SetUp() override {
        section.updateSectionRef(Value(list));
        list->append(Value("previous entry 1"));
        list->append(Value("previous entry 2"));
    }

    GSMNeighbhorMeasurements section;
    ArrayRef list = Array::create();
};

}  // namespace

TEST_F(GSMNeighbhorMeasurementsTest, NameAndLogCode) {
    EXPECT_EQ(section.getSectionName(), "GSM Neighbor Cell List");
    EXPECT_EQ(section.getLogCodeArray(), std::vector<int32_t>{0xD00E});
}

TEST_F(GSMNeighbhorMeasurementsTest, D00EClearsAPreviouslyFilledArrayAndLeavesItEmpty) {
    const Bytes record = twoEntryRecord();
    ASSERT_EQ(record.size(), 33u);
    section.updateWithData(record, 0xD00E);
    EXPECT_TRUE(list->empty());  // required: the built list is never stored
    section.updateWithData(record, 0xD00E);
    EXPECT_TRUE(list->empty());
}

TEST_F(GSMNeighbhorMeasurementsTest, ARecordOfExactly17BytesIsAccepted) {
    section.updateWithData(RecordBuilder::ordinary(0xD00E, 17).build(), 0xD00E);  // count 0 at 16
    EXPECT_TRUE(list->empty());
}

TEST_F(GSMNeighbhorMeasurementsTest, ARecordShorterThan17BytesLeavesTheListAsItWas) {
    SystemLogCapture cap;
    section.updateWithData(RecordBuilder::ordinary(0xD00E, 16).build(), 0xD00E);
    EXPECT_EQ(list->size(), 2u);
    EXPECT_EQ(cap.lines().size(), 1u);  // only the per-call line: ignored silently
}

TEST_F(GSMNeighbhorMeasurementsTest, CountLargerThanTheRecordHoldsStopsAtTheRecordsEnd) {
    // Count 255 at 16 with one whole entry (17..24) and a partial one (25..28).
    const Bytes record = RecordBuilder::ordinary(0xD00E, 29)
                             .u8(16, 255)                           // entry count
                             .bytes(17, {1, 2, 3, 4, 5, 6, 7, 8})  // entry 0
                             .bytes(25, {9, 9, 9, 9})              // part of entry 1
                             .build();
    section.updateWithData(record, 0xD00E);  // under ASan: no read past byte 28
    EXPECT_TRUE(list->empty());
}

TEST_F(GSMNeighbhorMeasurementsTest, LogsGSMNeighborCellListOnEveryCallEvenForAForeignCode) {
    SystemLogCapture cap;
    section.updateWithData(twoEntryRecord(), 0xD00A);  // another section's code
    EXPECT_EQ(cap.count(SystemLog::kWarning, "GSM Neighbor Cell List"), 1);
    EXPECT_EQ(list->size(), 2u);  // untouched
    section.updateWithData(twoEntryRecord(), 0xD00E);
    EXPECT_EQ(cap.count(SystemLog::kWarning, "GSM Neighbor Cell List"), 2);
    EXPECT_TRUE(list->empty());
}

TEST_F(GSMNeighbhorMeasurementsTest, AnUnboundSectionDecodesWithoutWritingAnywhere) {
    GSMNeighbhorMeasurements unbound;
    SystemLogCapture cap;
    unbound.updateWithData(twoEntryRecord(), 0xD00E);
    EXPECT_EQ(cap.count(SystemLog::kWarning, "GSM Neighbor Cell List"), 1);
    EXPECT_EQ(list->size(), 2u);  // another section's array is not touched
}

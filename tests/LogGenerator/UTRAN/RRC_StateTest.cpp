// RRC_StateTest: tests src/LogGenerator/UTRAN/RRC_State.cpp, the "RRC Info" section of Part 7.2 (record 0xD0E0).
#include "LogGenerator/UTRAN/RRC_State.h"

#include "Platform/RecordBuilder.h"
#include "Platform/SystemLog.h"
#include "Platform/SystemLogCapture.h"
#include "PropertyList/Dictionary.h"

#include <gtest/gtest.h>

using namespace vantorel;

namespace {

// Record 0xD0E0: byte 13 validity flag, byte 14 RRC mode; 15 bytes expected.
Bytes rrcRecord(uint8_t valid, uint8_t mode) {
    return RecordBuilder::ordinary(0xD0E0, 15)
        .u8(13, valid)  // validity flag
        .u8(14, mode)   // RRC mode
        .build();
}

class RRC_StateTest : public ::testing::Test {
protected:
    void SetUp() override { section.updateSectionRef(Value(dict)); }

    std::string state() const {
        const Value* v = dict->find("State");
        if (!v) return "<absent>";
        const std::string* s = v->asString();
        return s ? *s : "<not a string>";
    }

    RRC_State section;
    DictionaryRef dict = Dictionary::create();
};

}  // namespace

TEST_F(RRC_StateTest, NameAndLogCode) {
    EXPECT_EQ(section.getSectionName(), "RRC Info");
    EXPECT_EQ(section.getLogCodeArray(), std::vector<int32_t>{0xD0E0});
}

TEST_F(RRC_StateTest, RegistersUnderItsNameAndCode) {
    ClassDictionary classDict;
    CodeDictionary codeDict;
    EXPECT_EQ(section.initWithDict(classDict, codeDict), &section);
    EXPECT_EQ(classDict.at("RRC Info"), &section);
    ASSERT_NE(codeDict.find("53472"), nullptr);  // 0xD0E0 as a decimal string
    EXPECT_EQ(*codeDict.find("53472"), SectionList{&section});
}

// Edge: "0xD0E0 of 14 bytes logs the length message with 14 and 15 and then reads bytes
// 13 and 14 as they are." Byte 14 lies past the end of a 14-byte record; a missing byte
// 14 with byte 13 == 1 gives mode 255, "Unknown RRC Mode".
TEST_F(RRC_StateTest, D0E0Of14BytesLogsTheLengthMessageWith14And15AndThenReadsBytes13And14AsTheyAre) {
    SystemLogCapture cap;
    const Bytes record = RecordBuilder::ordinary(0xD0E0, 14)
                             .u8(13, 1)  // validity flag; byte 14 (mode) is missing
                             .build();
    ASSERT_EQ(record.size(), 14u);
    section.updateWithData(record, 0xD0E0);
    EXPECT_EQ(cap.count(SystemLog::kWarning, "LogCode_0xD0E0 is length is 14 expected size 15"), 1);
    EXPECT_EQ(state(), "Unknown RRC Mode");
    EXPECT_TRUE(cap.contains(SystemLog::kConsole,
                             "Display Dict = {State = Unknown RRC Mode}, rrc mode = 255 Unknown RRC Mode"));
}

// Edge: "0xD0E0 with byte 13 = 0 shows "Unknown RRC Mode"; with byte 13 = 1 and byte 14 =
// 2, "Cell Fach"."
TEST_F(RRC_StateTest, D0E0WithByte13Equal0ShowsUnknownRRCModeWithByte13Equal1AndByte14Equal2CellFach) {
    section.updateWithData(rrcRecord(0, 2), 0xD0E0);
    EXPECT_EQ(state(), "Unknown RRC Mode");
    section.updateWithData(rrcRecord(1, 2), 0xD0E0);
    EXPECT_EQ(state(), "Cell Fach");
}

TEST_F(RRC_StateTest, EveryModeTextOfTheTable) {
    const char* const expected[] = {"Disconnected", "Connecting", "Cell Fach", "Cell DCH", "Cell PCH", "Cell URA PCH"};
    for (uint8_t mode = 0; mode < 6; ++mode) {
        section.updateWithData(rrcRecord(1, mode), 0xD0E0);
        EXPECT_EQ(state(), expected[mode]) << "mode " << int(mode);
    }
}

TEST_F(RRC_StateTest, ModesOutsideTheTableAreUnknownRRCMode) {
    for (uint8_t mode : {6, 7, 100, 254, 255}) {
        section.updateWithData(rrcRecord(1, 3), 0xD0E0);
        ASSERT_EQ(state(), "Cell DCH");
        section.updateWithData(rrcRecord(1, mode), 0xD0E0);
        EXPECT_EQ(state(), "Unknown RRC Mode") << "mode " << int(mode);
    }
}

TEST_F(RRC_StateTest, AValidityFlagOtherThan1MeansMode255) {
    SystemLogCapture cap;
    section.updateWithData(rrcRecord(2, 1), 0xD0E0);  // flag 2: not valid, mode 1 ignored
    EXPECT_EQ(state(), "Unknown RRC Mode");
    EXPECT_TRUE(cap.contains(SystemLog::kConsole,
                             "Display Dict = {State = Unknown RRC Mode}, rrc mode = 255 Unknown RRC Mode"));
}

TEST_F(RRC_StateTest, WritesTheDisplayDictionaryModeAndTextToTheConsole) {
    SystemLogCapture cap;
    section.updateWithData(rrcRecord(1, 3), 0xD0E0);
    EXPECT_EQ(cap.count(SystemLog::kConsole, "Display Dict = {State = Cell DCH}, rrc mode = 3 Cell DCH"), 1);
}

TEST_F(RRC_StateTest, AFullLengthRecordLogsNoLengthMessage) {
    SystemLogCapture cap;
    section.updateWithData(rrcRecord(1, 4), 0xD0E0);
    EXPECT_EQ(state(), "Cell PCH");
    for (const auto& line : cap.lines()) EXPECT_EQ(line.text.find("LogCode_0xD0E0"), std::string::npos) << line.text;
}

TEST_F(RRC_StateTest, ALongerRecordIsDecodedWithoutLengthMessage) {
    SystemLogCapture cap;
    const Bytes record = RecordBuilder::ordinary(0xD0E0, 40)
                             .u8(13, 1)  // validity flag
                             .u8(14, 5)  // RRC mode: Cell URA PCH
                             .build();
    section.updateWithData(record, 0xD0E0);
    EXPECT_EQ(state(), "Cell URA PCH");
    EXPECT_FALSE(cap.containsText("LogCode_0xD0E0 is length is 40 expected size 15"));
}

// Bounds decision: a record without byte 13 counts as "not valid" (mode 255).
TEST_F(RRC_StateTest, A13ByteRecordWithoutTheValidityFlagGivesMode255) {
    SystemLogCapture cap;
    const Bytes record = RecordBuilder::ordinary(0xD0E0, 13).build();  // header only
    ASSERT_EQ(record.size(), 13u);
    section.updateWithData(record, 0xD0E0);
    EXPECT_EQ(cap.count(SystemLog::kWarning, "LogCode_0xD0E0 is length is 13 expected size 15"), 1);
    EXPECT_EQ(state(), "Unknown RRC Mode");
    EXPECT_TRUE(cap.contains(SystemLog::kConsole,
                             "Display Dict = {State = Unknown RRC Mode}, rrc mode = 255 Unknown RRC Mode"));
}

TEST_F(RRC_StateTest, AnEmptyRecordIsDecodedWithoutReadingOutsideIt) {
    SystemLogCapture cap;
    section.updateWithData(ByteView(), 0xD0E0);
    EXPECT_EQ(cap.count(SystemLog::kWarning, "LogCode_0xD0E0 is length is 0 expected size 15"), 1);
    EXPECT_EQ(state(), "Unknown RRC Mode");
}

TEST_F(RRC_StateTest, LogsRRCInfoOnEveryCallEvenForAForeignCode) {
    SystemLogCapture cap;
    section.updateWithData(rrcRecord(1, 2), 0xD0E2);  // another section's code
    EXPECT_EQ(cap.count(SystemLog::kWarning, "RRC Info"), 1);
    EXPECT_FALSE(dict->contains("State"));
    EXPECT_EQ(cap.lines().size(), 1u);  // nothing else: no console line, no length line

    section.updateWithData(rrcRecord(1, 2), 0xD0E0);
    EXPECT_EQ(cap.count(SystemLog::kWarning, "RRC Info"), 2);
    ASSERT_GE(cap.lines().size(), 2u);
    EXPECT_EQ(cap.lines()[1].text, "RRC Info");  // logged before anything else of the call
}

TEST_F(RRC_StateTest, StateKeepsItsLastValueWhenAForeignCodeArrives) {
    section.updateWithData(rrcRecord(1, 1), 0xD0E0);
    section.updateWithData(rrcRecord(1, 3), 0xD00A);
    EXPECT_EQ(state(), "Connecting");
}

TEST_F(RRC_StateTest, AnUnboundSectionStillLogsAndWritesNothing) {
    RRC_State unbound;
    SystemLogCapture cap;
    unbound.updateWithData(rrcRecord(1, 2), 0xD0E0);
    EXPECT_EQ(unbound.sectionDictionary(), nullptr);
    EXPECT_TRUE(cap.contains(SystemLog::kConsole, "Display Dict = (null), rrc mode = 2 Cell Fach"));
}

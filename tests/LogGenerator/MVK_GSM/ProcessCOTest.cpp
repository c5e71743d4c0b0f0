// ProcessCOTest: tests ProcessCO (Part 5.2 "Process CO": MM state only and MM service state, entry line "ProcessCS").
#include "LogGenerator/MVK_GSM/ProcessCO.h"

#include "Platform/RecordBuilder.h"
#include "Platform/SystemLog.h"
#include "Platform/SystemLogCapture.h"
#include "PropertyList/Dictionary.h"

#include <gtest/gtest.h>

namespace vantorel {
namespace {

constexpr int32_t kMMState = 0x7131;
constexpr int32_t kRegistrationState = 0x7132;

// 0x7131, minimum length 16: 13 MM state, 14 MM sub-state, 15 update status.
Bytes mmStateRecord(uint8_t state, uint8_t subState, uint8_t updateStatus, size_t length = 16) {
    return RecordBuilder::ordinary(0x7131, length)
        .u8(13, state)         // 13: MM state
        .u8(14, subState)      // 14: MM sub-state (not shown by Process CO)
        .u8(15, updateStatus)  // 15: update status (not shown by Process CO)
        .resize(length)
        .build();
}

// 0x7132, minimum length 16: 13 MM service state.
Bytes serviceStateRecord(uint8_t state, size_t length = 16) {
    return RecordBuilder::ordinary(0x7132, length).u8(13, state).resize(length).build();  // 13: service state
}

class ProcessCOTest : public ::testing::Test {
protected:
    void SetUp() override { section.updateSectionRef(Value(dict)); }

    std::string text(const std::string& key) const {
        const Value* v = dict->find(key);
        return v && v->asString() ? *v->asString() : std::string("<absent>");
    }

    DictionaryRef dict = Dictionary::create();
    ProcessCO section;
};

TEST_F(ProcessCOTest, NameAndLogCodesFollowTheSectionTable) {
    EXPECT_EQ(section.getSectionName(), "Process CO");
    EXPECT_EQ(section.getLogCodeArray(), (std::vector<int32_t>{0x7131, 0x7132}));
}

TEST_F(ProcessCOTest, EntryLineIsProcessCSByDesign) {
    SystemLogCapture cap;
    section.updateWithData(mmStateRecord(0, 0, 0), kMMState);
    const auto lines = cap.lines();
    ASSERT_EQ(lines.size(), 1u);
    EXPECT_EQ(lines[0].priority, SystemLog::kWarning);
    EXPECT_EQ(lines[0].text, "ProcessCS");
}

TEST_F(ProcessCOTest, UnknownCodeIsLoggedAndChangesNothing) {
    SystemLogCapture cap;
    section.updateWithData(mmStateRecord(0, 0, 0), 0x7130);
    EXPECT_TRUE(cap.contains(SystemLog::kError, "Received an unknown log message: 28976"));
    EXPECT_TRUE(dict->empty());
}

// Part 5.2's edge case on the MM state table, through Process CO's use of it.
TEST_F(ProcessCOTest, MMState4IsAGapShownUnknownAnd26IsUnknownToo) {
    section.updateWithData(mmStateRecord(4, 0, 0), kMMState);
    EXPECT_EQ(text("MM State"), "Unknown");
    section.updateWithData(mmStateRecord(26, 0, 0), kMMState);
    EXPECT_EQ(text("MM State"), "Unknown");
}

TEST_F(ProcessCOTest, MMStateRecordWritesOnlyMMState) {
    section.updateWithData(mmStateRecord(20, 8, 3), kMMState);
    EXPECT_EQ(dict->keys(), (std::vector<std::string>{"MM State"}));
    EXPECT_EQ(text("MM State"), "MM_WAIT_FOR_ADDITIONAL_OUTGOING_MM_ CONNECTION");
}

TEST_F(ProcessCOTest, MMStateTableBoundariesAndGaps) {
    const std::pair<uint8_t, const char*> rows[] = {
        {0, "MM_NULL"}, {1, "Unknown"}, {21, "MM_WAIT_FOR_RR_CONNECTION_ REESTABLISHMENT"}, {24, "Unknown"},
        {25, "MM_RR_CONNECTION_RELEASE_NOT_ALLOWED"}, {255, "Unknown"},
    };
    for (const auto& [value, expected] : rows) {
        section.updateWithData(mmStateRecord(value, 0, 0), kMMState);
        EXPECT_EQ(text("MM State"), expected) << "value " << int(value);
    }
}

TEST_F(ProcessCOTest, ServiceStateTable) {
    const std::pair<uint8_t, const char*> rows[] = {
        {0, "REG_STATE_INACTIVE"}, {4, "REG_STATE_MANUAL_SEARCH"}, {6, "REG_STATE_OFFLINE"}, {7, "Unknown"},
    };
    for (const auto& [value, expected] : rows) {
        section.updateWithData(serviceStateRecord(value), kRegistrationState);
        EXPECT_EQ(text("MM Service State"), expected) << "value " << int(value);
    }
    EXPECT_EQ(dict->keys(), (std::vector<std::string>{"MM Service State"}));
}

TEST_F(ProcessCOTest, RecordsShorterThan16AreIgnoredSilently) {
    dict->set("MM State", Value("MM_IDLE"));
    SystemLogCapture cap;
    section.updateWithData(mmStateRecord(3, 0, 0, 15), kMMState);
    section.updateWithData(serviceStateRecord(1, 15), kRegistrationState);
    EXPECT_EQ(dict->size(), 1u);
    EXPECT_EQ(text("MM State"), "MM_IDLE");
    EXPECT_EQ(cap.lines().size(), 2u);
    EXPECT_EQ(cap.count(SystemLog::kWarning, "ProcessCS"), 2);
}

}  // namespace
}  // namespace vantorel

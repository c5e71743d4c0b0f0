// ProcessCSTest: tests ProcessCS (Part 5.2 "Process CS": MM state, sub-state, update status and service state).
#include "LogGenerator/MVK_GSM/ProcessCS.h"

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
        .u8(14, subState)      // 14: MM sub-state
        .u8(15, updateStatus)  // 15: update status ("LU Reject Cause")
        .resize(length)
        .build();
}

// 0x7132, minimum length 16: 13 MM service state.
Bytes serviceStateRecord(uint8_t state, size_t length = 16) {
    return RecordBuilder::ordinary(0x7132, length).u8(13, state).resize(length).build();  // 13: service state
}

class ProcessCSTest : public ::testing::Test {
protected:
    void SetUp() override { section.updateSectionRef(Value(dict)); }

    std::string text(const std::string& key) const {
        const Value* v = dict->find(key);
        return v && v->asString() ? *v->asString() : std::string("<absent>");
    }

    std::string mmState(uint8_t value) {
        section.updateWithData(mmStateRecord(value, 0, 0), kMMState);
        return text("MM State");
    }

    DictionaryRef dict = Dictionary::create();
    ProcessCS section;
};

TEST_F(ProcessCSTest, NameAndLogCodesFollowTheSectionTable) {
    EXPECT_EQ(section.getSectionName(), "Process CS");
    EXPECT_EQ(section.getLogCodeArray(), (std::vector<int32_t>{0x7131, 0x7132}));
}

TEST_F(ProcessCSTest, EveryUpdateLogsProcessCSAtWarningPriority) {
    SystemLogCapture cap;
    section.updateWithData(mmStateRecord(0, 0, 0), kMMState);
    section.updateWithData(serviceStateRecord(0), kRegistrationState);
    EXPECT_EQ(cap.count(SystemLog::kWarning, "ProcessCS"), 2);
}

TEST_F(ProcessCSTest, UnknownCodeIsLoggedAndChangesNothing) {
    SystemLogCapture cap;
    section.updateWithData(mmStateRecord(0, 0, 0), 0x7130);
    EXPECT_TRUE(cap.contains(SystemLog::kError, "Received an unknown log message: 28976"));
    EXPECT_TRUE(dict->empty());
}

// --- Edge cases worth testing (Part 5.2) ------------------------------------------

TEST_F(ProcessCSTest, MMState4IsAGapShownUnknownAnd26IsUnknownToo) {
    EXPECT_EQ(mmState(4), "Unknown");
    EXPECT_EQ(mmState(26), "Unknown");
}

// --- Tables ---------------------------------------------------------------------------

TEST_F(ProcessCSTest, MMStateTableEveryRowCharacterForCharacter) {
    const std::pair<uint8_t, const char*> rows[] = {
        {0, "MM_NULL"},
        {3, "MM_LOCATION_UPDATE_INITIATED"},
        {5, "MM_WAIT_FOR_OUTGOING_MM_CONNECTION"},
        {6, "MM_CONNECTION_ACTIVE"},
        {7, "MM_IMSI_DETACH_INITIATED"},
        {8, "MM_PROCESS_CM_SERVICE_PROMPT"},
        {9, "MM_WAIT_FOR_NETWORK_COMMAND"},
        {10, "MM_LOCATION_UPDATE_REJECTED"},
        {13, "MM_WAIT_FOR_RR_CONNECTION_LU"},
        {14, "MM_WAIT_FOR_RR_CONNECTION_MM"},
        {15, "MM_WAIT_FOR_RR_CONNECTION_IMSI_DETACH"},
        {17, "MM_REESTABLISHMENT_INITIATED"},
        {18, "MM_WAIT_FOR_RR_ACTIVE"},
        {19, "MM_IDLE"},
        {20, "MM_WAIT_FOR_ADDITIONAL_OUTGOING_MM_ CONNECTION"},
        {21, "MM_WAIT_FOR_RR_CONNECTION_ REESTABLISHMENT"},
        {22, "MM_WAIT_FOR_REESTABLISH_DECISION"},
        {23, "MM_LOCATION_UPDATING_PENDING"},
        {25, "MM_RR_CONNECTION_RELEASE_NOT_ALLOWED"},
    };
    for (const auto& [value, expected] : rows) EXPECT_EQ(mmState(value), expected) << "value " << int(value);
}

TEST_F(ProcessCSTest, MMStateGapsAndValuesAbove25AreUnknown) {
    for (uint8_t value : {1, 2, 4, 11, 12, 16, 24, 26, 27, 100, 255})
        EXPECT_EQ(mmState(value), "Unknown") << "value " << int(value);
}

TEST_F(ProcessCSTest, MMSubStateTable) {
    const std::pair<uint8_t, const char*> rows[] = {
        {0, "MM_NULL_SUBSTATE"},          {1, "MM_NO_IMSI"},
        {2, "MM_PLMN_SEARCH"},            {3, "MM_LIMITED_SERVICE"},
        {4, "MM_ATTEMPTING_TO_UPDATE"},   {5, "MM_LOCATION_UPDATE_NEEDED"},
        {6, "MM_NO_CELL_AVAILABLE"},      {7, "MM_PLMN_SEARCH_NORMAL_SERVICE"},
        {8, "MM_NORMAL_SERVICE"},         {9, "Unknown"},
        {255, "Unknown"},
    };
    for (const auto& [value, expected] : rows) {
        section.updateWithData(mmStateRecord(0, value, 0), kMMState);
        EXPECT_EQ(text("MM Sub State"), expected) << "value " << int(value);
    }
}

TEST_F(ProcessCSTest, UpdateStatusTableShownUnderLURejectCause) {
    const std::pair<uint8_t, const char*> rows[] = {
        {0, "UPDATED"}, {1, "NOT_UPDATED"}, {2, "ROAMING_NOT_ALLOWED"}, {3, "LOCATION_AREA_NOT_ALLOWED"},
        {4, "Unknown"}, {255, "Unknown"},
    };
    for (const auto& [value, expected] : rows) {
        section.updateWithData(mmStateRecord(0, 0, value), kMMState);
        EXPECT_EQ(text("LU Reject Cause"), expected) << "value " << int(value);
    }
}

TEST_F(ProcessCSTest, ServiceStateTable) {
    const std::pair<uint8_t, const char*> rows[] = {
        {0, "REG_STATE_INACTIVE"},      {1, "REG_STATE_IDLE"},          {2, "REG_STATE_REGISTERING"},
        {3, "REG_STATE_DEREGISTERING"}, {4, "REG_STATE_MANUAL_SEARCH"}, {5, "REG_STATE_AUTOMATIC_SEARCH"},
        {6, "REG_STATE_OFFLINE"},       {7, "Unknown"},                 {255, "Unknown"},
    };
    for (const auto& [value, expected] : rows) {
        section.updateWithData(serviceStateRecord(value), kRegistrationState);
        EXPECT_EQ(text("MM Service State"), expected) << "value " << int(value);
    }
}

TEST_F(ProcessCSTest, SharedTableLookupsMatchTheSection) {
    EXPECT_STREQ(ProcessCS::mmStateText(19), "MM_IDLE");
    EXPECT_STREQ(ProcessCS::mmStateText(24), "Unknown");
    EXPECT_STREQ(ProcessCS::serviceStateText(6), "REG_STATE_OFFLINE");
    EXPECT_STREQ(ProcessCS::serviceStateText(7), "Unknown");
}

// --- Record handling ------------------------------------------------------------------

TEST_F(ProcessCSTest, MMStateRecordWritesThreeKeysInOrder) {
    section.updateWithData(mmStateRecord(19, 8, 0), kMMState);
    EXPECT_EQ(dict->keys(), (std::vector<std::string>{"MM State", "MM Sub State", "LU Reject Cause"}));
    EXPECT_EQ(text("MM State"), "MM_IDLE");
    EXPECT_EQ(text("MM Sub State"), "MM_NORMAL_SERVICE");
    EXPECT_EQ(text("LU Reject Cause"), "UPDATED");
}

TEST_F(ProcessCSTest, ServiceStateRecordWritesOnlyMMServiceState) {
    section.updateWithData(serviceStateRecord(1), kRegistrationState);
    EXPECT_EQ(dict->keys(), (std::vector<std::string>{"MM Service State"}));
    EXPECT_EQ(text("MM Service State"), "REG_STATE_IDLE");
}

TEST_F(ProcessCSTest, RecordsShorterThan16AreIgnoredSilently) {
    dict->set("MM State", Value("MM_IDLE"));
    SystemLogCapture cap;
    section.updateWithData(mmStateRecord(3, 1, 1, 15), kMMState);
    section.updateWithData(serviceStateRecord(1, 15), kRegistrationState);
    EXPECT_EQ(dict->size(), 1u);
    EXPECT_EQ(text("MM State"), "MM_IDLE");
    const auto lines = cap.lines();
    ASSERT_EQ(lines.size(), 2u);
    EXPECT_EQ(lines[0].text, "ProcessCS");
    EXPECT_EQ(lines[1].text, "ProcessCS");
}

TEST_F(ProcessCSTest, LongerRecordIsDecodedFromTheSameOffsets) {
    section.updateWithData(mmStateRecord(6, 2, 3, 40), kMMState);
    EXPECT_EQ(text("MM State"), "MM_CONNECTION_ACTIVE");
    EXPECT_EQ(text("MM Sub State"), "MM_PLMN_SEARCH");
    EXPECT_EQ(text("LU Reject Cause"), "LOCATION_AREA_NOT_ALLOWED");
}

}  // namespace
}  // namespace vantorel

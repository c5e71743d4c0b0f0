// ProcessPSTest: tests ProcessPS (Part 5.2 "Process PS": GMM state, sub-state, update status and service state).
#include "LogGenerator/MVK_GSM/ProcessPS.h"

#include "Platform/RecordBuilder.h"
#include "Platform/SystemLog.h"
#include "Platform/SystemLogCapture.h"
#include "PropertyList/Dictionary.h"

#include <gtest/gtest.h>

namespace vantorel {
namespace {

constexpr int32_t kGMMState = 0x7130;
constexpr int32_t kRegistrationState = 0x7132;

// 0x7130, minimum length 16: 13 GMM state, 14 GMM sub-state, 15 GMM update status.
Bytes gmmStateRecord(uint8_t state, uint8_t subState, uint8_t updateStatus, size_t length = 16) {
    return RecordBuilder::ordinary(0x7130, length)
        .u8(13, state)         // 13: GMM state
        .u8(14, subState)      // 14: GMM sub-state
        .u8(15, updateStatus)  // 15: GMM update status ("Attach Reject Cause")
        .resize(length)
        .build();
}

// 0x7132, minimum length 16: 13 MM service state.
Bytes serviceStateRecord(uint8_t state, size_t length = 16) {
    return RecordBuilder::ordinary(0x7132, length).u8(13, state).resize(length).build();  // 13: service state
}

class ProcessPSTest : public ::testing::Test {
protected:
    void SetUp() override { section.updateSectionRef(Value(dict)); }

    std::string text(const std::string& key) const {
        const Value* v = dict->find(key);
        return v && v->asString() ? *v->asString() : std::string("<absent>");
    }

    DictionaryRef dict = Dictionary::create();
    ProcessPS section;
};

TEST_F(ProcessPSTest, NameAndLogCodesFollowTheSectionTable) {
    EXPECT_EQ(section.getSectionName(), "Process PS");
    EXPECT_EQ(section.getLogCodeArray(), (std::vector<int32_t>{0x7130, 0x7132}));
}

TEST_F(ProcessPSTest, EveryUpdateLogsProcessPSAtWarningPriority) {
    SystemLogCapture cap;
    section.updateWithData(gmmStateRecord(0, 0, 0), kGMMState);
    section.updateWithData(serviceStateRecord(0), kRegistrationState);
    EXPECT_EQ(cap.count(SystemLog::kWarning, "ProcessPS"), 2);
}

TEST_F(ProcessPSTest, UnknownCodeIsLoggedAndChangesNothing) {
    SystemLogCapture cap;
    section.updateWithData(gmmStateRecord(0, 0, 0), 0x7131);
    EXPECT_TRUE(cap.contains(SystemLog::kError, "Received an unknown log message: 28977"));
    EXPECT_TRUE(dict->empty());
}

TEST_F(ProcessPSTest, GMMStateTable) {
    const std::pair<uint8_t, const char*> rows[] = {
        {0, "GMM_NULL"},
        {1, "GMM_DEREGISTERED"},
        {2, "GMM_REGISTERED_INITIATED"},
        {3, "GMM_REGISTERED"},
        {4, "GMM_DEREGISTERED_INITIATED"},
        {5, "GMM_ROUTING_AREA_UPDATE_INITIATED"},
        {6, "GMM_SERVICE_REQUEST_INITIATED"},
        {7, "Unknown"},
        {255, "Unknown"},
    };
    for (const auto& [value, expected] : rows) {
        section.updateWithData(gmmStateRecord(value, 0, 0), kGMMState);
        EXPECT_EQ(text("MM State"), expected) << "value " << int(value);
    }
}

TEST_F(ProcessPSTest, GMMSubStateTableKeepsTheAttempingSpelling) {
    const std::pair<uint8_t, const char*> rows[] = {
        {0, "GMM_NORMAL_SERVICE"},
        {1, "GMM_LIMITED_SERVICE"},
        {2, "GMM_ATTACH_NEEDED"},
        {3, "GMM_ATTEMPTING_TO_ATTACH"},
        {4, "GMM_NO_IMSI"},
        {5, "GMM_NO_CELL_AVAILABLE"},
        {6, "GMM_PLMN_SEARCH"},
        {7, "GMM_SUSPENDED"},
        {8, "GMM_UPDATE_NEEDED"},
        {9, "GMM_ATTEMPING_TO_UPDATE"},
        {10, "GMM_ATTEMPTING_TO_UPDATE_MM"},
        {11, "GMM_IMSI_DETACH_INITIATED"},
        {12, "GMM_NULL_SUBSTATE"},
        {13, "Unknown"},
        {255, "Unknown"},
    };
    for (const auto& [value, expected] : rows) {
        section.updateWithData(gmmStateRecord(0, value, 0), kGMMState);
        EXPECT_EQ(text("MM Sub State"), expected) << "value " << int(value);
    }
}

TEST_F(ProcessPSTest, GMMUpdateStatusTableShownUnderAttachRejectCause) {
    const std::pair<uint8_t, const char*> rows[] = {
        {0, "GMM_GU1_UPDATED"},          {1, "GMM_GU2_NOT_UPDATED"}, {2, "GMM_GU3_PLMN_NOT_ALLOWED"},
        {3, "GMM_GU3_ROUTING_AREA_NOT_ALLOWED"}, {4, "Unknown"}, {255, "Unknown"},
    };
    for (const auto& [value, expected] : rows) {
        section.updateWithData(gmmStateRecord(0, 0, value), kGMMState);
        EXPECT_EQ(text("Attach Reject Cause"), expected) << "value " << int(value);
    }
}

TEST_F(ProcessPSTest, GMMStateRecordWritesThreeKeysInOrder) {
    section.updateWithData(gmmStateRecord(3, 0, 0), kGMMState);
    EXPECT_EQ(dict->keys(), (std::vector<std::string>{"MM State", "MM Sub State", "Attach Reject Cause"}));
    EXPECT_EQ(text("MM State"), "GMM_REGISTERED");
    EXPECT_EQ(text("MM Sub State"), "GMM_NORMAL_SERVICE");
    EXPECT_EQ(text("Attach Reject Cause"), "GMM_GU1_UPDATED");
}

TEST_F(ProcessPSTest, ServiceStateRecordUsesTheServiceStateTable) {
    const std::pair<uint8_t, const char*> rows[] = {
        {0, "REG_STATE_INACTIVE"}, {2, "REG_STATE_REGISTERING"}, {6, "REG_STATE_OFFLINE"}, {7, "Unknown"},
    };
    for (const auto& [value, expected] : rows) {
        section.updateWithData(serviceStateRecord(value), kRegistrationState);
        EXPECT_EQ(text("MM Service State"), expected) << "value " << int(value);
    }
    EXPECT_EQ(dict->keys(), (std::vector<std::string>{"MM Service State"}));
}

TEST_F(ProcessPSTest, RecordsShorterThan16AreIgnoredSilently) {
    dict->set("MM State", Value("GMM_NULL"));
    SystemLogCapture cap;
    section.updateWithData(gmmStateRecord(3, 1, 1, 15), kGMMState);
    section.updateWithData(serviceStateRecord(1, 15), kRegistrationState);
    EXPECT_EQ(dict->size(), 1u);
    EXPECT_EQ(text("MM State"), "GMM_NULL");
    EXPECT_EQ(cap.lines().size(), 2u);
    EXPECT_EQ(cap.count(SystemLog::kWarning, "ProcessPS"), 2);
}

}  // namespace
}  // namespace vantorel

// EquivalentPLMNListTest: tests EquivalentPLMNList (Part 5.2 "Equivalent PLMN List": 0x7150 with its overlapping 3-byte stride).
#include "LogGenerator/MVK_GSM/EquivalentPLMNList.h"

#include "LogGenerator/ArrayLock.h"
#include "Platform/RecordBuilder.h"
#include "Platform/SystemLog.h"
#include "Platform/SystemLogCapture.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"

#include <gtest/gtest.h>

namespace vantorel {
namespace {

constexpr int32_t kEquivalentPLMNs = 0x7150;

struct PLMN {
    std::string mcc;
    std::string mnc;
    bool operator==(const PLMN&) const = default;
};

std::ostream& operator<<(std::ostream& os, const PLMN& p) { return os << "{" << p.mcc << "," << p.mnc << "}"; }

class EquivalentPLMNListTest : public ::testing::Test {
protected:
    void SetUp() override { section.updateSectionRef(Value(list)); }

    // The list as (MCC, MNC) pairs; also checks each entry's key order.
    std::vector<PLMN> plmns() const {
        std::vector<PLMN> out;
        for (const Value& v : *list) {
            auto d = v.asDictionary();
            EXPECT_TRUE(d);
            if (!d) continue;
            EXPECT_EQ(d->keys(), (std::vector<std::string>{"Mobile Country Code", "Mobile Network Code"}));
            out.push_back({*d->get("Mobile Country Code").asString(), *d->get("Mobile Network Code").asString()});
        }
        return out;
    }

    void seed() {
        auto d = Dictionary::create();
        d->set("Mobile Country Code", Value("999"));
        d->set("Mobile Network Code", Value("99"));
        list->append(Value(d));
    }

    ArrayRef list = Array::create();
    EquivalentPLMNList section;
};

TEST_F(EquivalentPLMNListTest, NameAndLogCodesFollowTheSectionTable) {
    EXPECT_EQ(section.getSectionName(), "Equivalent PLMN List");
    EXPECT_EQ(section.getLogCodeArray(), (std::vector<int32_t>{0x7150}));
}

TEST_F(EquivalentPLMNListTest, EveryUpdateLogsEquivalentPLMNListAtWarningPriority) {
    SystemLogCapture cap;
    section.updateWithData(RecordBuilder::ordinary(0x7150, 17).build(), kEquivalentPLMNs);
    const auto lines = cap.lines();
    ASSERT_EQ(lines.size(), 1u);
    EXPECT_EQ(lines[0].priority, SystemLog::kWarning);
    EXPECT_EQ(lines[0].text, "Equivalent PLMN List");
}

TEST_F(EquivalentPLMNListTest, UnknownCodeIsLoggedAndChangesNothing) {
    seed();
    SystemLogCapture cap;
    section.updateWithData(RecordBuilder::ordinary(0x7150, 17).build(), 0x7135);
    EXPECT_TRUE(cap.contains(SystemLog::kError, "Received an unknown log message: 28981"));
    EXPECT_EQ(plmns(), (std::vector<PLMN>{{"999", "99"}}));
}

// --- Edge cases worth testing (Part 5.2) ------------------------------------------

TEST_F(EquivalentPLMNListTest, Count0EmptiesTheList) {
    seed();
    section.updateWithData(RecordBuilder::ordinary(0x7150, 17).u8(16, 0).build(), kEquivalentPLMNs);  // 16: count 0
    EXPECT_TRUE(list->empty());
}

TEST_F(EquivalentPLMNListTest, Count2WithOverlappingEntriesYields310_100Then0_1) {
    const Bytes record = RecordBuilder::ordinary(0x7150, 26)
                             .u8(16, 2)                                    // 16: count
                             .bytes(17, {3, 1, 1, 0, 0, 0, 0, 0, 1})       // 17..25: entry 0 = 17..22, entry 1 = 20..25
                             .build();
    section.updateWithData(record, kEquivalentPLMNs);
    EXPECT_EQ(plmns(), (std::vector<PLMN>{{"310", "100"}, {"0", "1"}}));
}

// --- Algorithm ------------------------------------------------------------------------

TEST_F(EquivalentPLMNListTest, RecordShorterThan17IsIgnoredSilently) {
    seed();
    SystemLogCapture cap;
    section.updateWithData(RecordBuilder::ordinary(0x7150, 16).build(), kEquivalentPLMNs);
    EXPECT_EQ(plmns(), (std::vector<PLMN>{{"999", "99"}}));
    EXPECT_EQ(cap.lines().size(), 1u);  // only the entry line
}

TEST_F(EquivalentPLMNListTest, DigitsCombineAsHundredsTensUnitsWithoutLeadingZeros) {
    const Bytes record = RecordBuilder::ordinary(0x7150, 23)
                             .u8(16, 1)                        // 16: count
                             .bytes(17, {0, 0, 4, 0, 6, 1})    // 17..22: MCC 0,4,6  MNC 0,0,1
                             .build();
    section.updateWithData(record, kEquivalentPLMNs);
    EXPECT_EQ(plmns(), (std::vector<PLMN>{{"46", "1"}}));
}

TEST_F(EquivalentPLMNListTest, EachRecordReplacesTheWholeList) {
    seed();
    const Bytes record = RecordBuilder::ordinary(0x7150, 23)
                             .u8(16, 1)                        // 16: count
                             .bytes(17, {2, 0, 3, 1, 4, 5})    // 17..22: MCC 234, MNC 15
                             .build();
    section.updateWithData(record, kEquivalentPLMNs);
    section.updateWithData(record, kEquivalentPLMNs);
    EXPECT_EQ(plmns(), (std::vector<PLMN>{{"234", "15"}}));
}

TEST_F(EquivalentPLMNListTest, CountBeyondTheRecordStopsAtTheFirstEntryThatDoesNotFit) {
    // Count 5 but only 26 bytes: entries 0 (17..22) and 1 (20..25) fit; entry 2 (23..28) does not.
    const Bytes record = RecordBuilder::ordinary(0x7150, 26)
                             .u8(16, 5)                                  // 16: count
                             .bytes(17, {3, 1, 1, 0, 0, 0, 0, 0, 1})     // 17..25
                             .build();
    section.updateWithData(record, kEquivalentPLMNs);
    EXPECT_EQ(plmns(), (std::vector<PLMN>{{"310", "100"}, {"0", "1"}}));
}

TEST_F(EquivalentPLMNListTest, FirstEntryNotFittingLeavesTheListEmpty) {
    seed();
    // Count 1, 22 bytes: entry 0 needs 17..22, one byte short.
    section.updateWithData(RecordBuilder::ordinary(0x7150, 22).u8(16, 1).build(), kEquivalentPLMNs);
    EXPECT_TRUE(list->empty());
}

TEST_F(EquivalentPLMNListTest, Count255ReadsEveryEntryWithAnEightBitIndex) {
    // Entry 254 starts at 17 + 3 * 254 = 779 and ends at 784, so 785 bytes hold all 255.
    RecordBuilder builder = RecordBuilder::ordinary(0x7150, 785).u8(16, 255);  // 16: count
    for (size_t i = 0; i < 255; ++i) builder.u8(17 + 3 * i, static_cast<uint8_t>(i % 10));
    section.updateWithData(builder.build(), kEquivalentPLMNs);
    const auto got = plmns();
    ASSERT_EQ(got.size(), 255u);
    // Entry i reads e0 = byte(17+3i) = i%10, e3 = byte(17+3(i+1)) = (i+1)%10, others 0.
    EXPECT_EQ(got[0], (PLMN{"0", "10"}));
    EXPECT_EQ(got[254], (PLMN{"400", "0"}));  // e3 lies past the last written entry: 0
}

TEST_F(EquivalentPLMNListTest, ListRewriteLeavesArrayLockReleased) {
    const uint8_t before = ArrayLock::counter();
    section.updateWithData(RecordBuilder::ordinary(0x7150, 23).u8(16, 1).build(), kEquivalentPLMNs);
    EXPECT_EQ(ArrayLock::counter(), before);
    EXPECT_EQ(list->size(), 1u);
}

}  // namespace
}  // namespace vantorel

// Tests for ClassIndex and the section registration of Base (Part 3.3).
#include "LogGenerator/ClassIndex.h"

#include "Platform/SystemLog.h"
#include "Platform/SystemLogCapture.h"
#include "support/TestSections.h"

#include <gtest/gtest.h>

using namespace vantorel;
using namespace vantorel::testing;

namespace {

// A second section that also calls itself "Test Values" and listens to kValueCode.
class SameNameSection : public Base {
public:
    std::string getSectionName() const override { return "Test Values"; }
    std::vector<int32_t> getLogCodeArray() const override { return {kValueCode}; }
    void updateWithData(ByteView, int32_t) override {}
};

class DuplicateNameIndex : public ClassIndex {
public:
    DuplicateNameIndex() {
        first = createSection<TestValueSection>();
        second = createSection<SameNameSection>();
    }
    std::unique_ptr<TestValueSection> first;
    std::unique_ptr<SameNameSection> second;
};

}  // namespace

TEST(ClassIndex, SectionListingTwoLogCodesAppearsInBothSubscriberArrays) {
    TestClassIndex index;
    const SectionList* valueSubscribers = index.getSubscribers(kValueCode);
    const SectionList* sharedSubscribers = index.getSubscribers(kSharedCode);
    ASSERT_TRUE(valueSubscribers && sharedSubscribers);
    EXPECT_EQ(*valueSubscribers, SectionList{index.values.get()});
    EXPECT_EQ((*sharedSubscribers)[0], index.values.get());
}

TEST(ClassIndex, LogCodeListedByTwoSectionsIsDeliveredToBothInCreationOrder) {
    TestClassIndex index;
    const SectionList* shared = index.getSubscribers(kSharedCode);
    ASSERT_TRUE(shared);
    EXPECT_EQ(*shared, (SectionList{index.values.get(), index.list.get()}));
}

TEST(ClassIndex, GetSubscribersWith0xFF0001LooksUpTheKey16711681) {
    TestClassIndex index;
    const SectionList* extra = index.getSubscribers(0xFF0001);
    ASSERT_TRUE(extra);
    EXPECT_EQ(*extra, SectionList{index.list.get()});
    const auto codes = index.getAllLogCodes();
    EXPECT_NE(std::find(codes.begin(), codes.end(), "16711681"), codes.end());
}

TEST(ClassIndex, CodesAreDecimalStringsInRegistrationOrder) {
    TestClassIndex index;
    EXPECT_EQ(index.getAllLogCodes(), (std::vector<std::string>{"4660", "22136", "16711681"}));
}

TEST(ClassIndex, UnlistedCodeHasNoSubscribers) {
    TestClassIndex index;
    EXPECT_EQ(index.getSubscribers(0x4124), nullptr);
}

TEST(ClassIndex, GetClassFindsSectionsByName) {
    TestClassIndex index;
    EXPECT_EQ(index.getClass("Test Values"), index.values.get());
    EXPECT_EQ(index.getClass("Test List"), index.list.get());
    EXPECT_EQ(index.getClass("Nothing"), nullptr);
}

TEST(ClassIndex, TwoSectionsWithTheSameNameLaterWinsClassDictBothStaySubscribed) {
    DuplicateNameIndex index;
    EXPECT_EQ(index.getClass("Test Values"), index.second.get());
    EXPECT_EQ(*index.getSubscribers(kValueCode), (SectionList{index.first.get(), index.second.get()}));
}

TEST(ClassIndex, RegistrationLogsArrayCountPerSection) {
    SystemLogCapture capture;
    TestClassIndex index;
    EXPECT_EQ(capture.count(SystemLog::kWarning, "Array Count: 2"), 2);
}

TEST(ClassIndex, StatusLogsDictionaryOneAndStringZero) {
    TestClassIndex index;
    SystemLogCapture capture;
    index.status();
    auto lines = capture.lines();
    ASSERT_EQ(lines.size(), 2u);
    EXPECT_EQ(lines[0].text, "Dictionary = 1");
    EXPECT_EQ(lines[1].text, "String = 0");
    EXPECT_EQ(lines[0].priority, SystemLog::kWarning);
}

TEST(ClassIndex, DestructionWritesDeallocingClassIndexToStandardOutput) {
    SystemLogCapture capture;
    ::testing::internal::CaptureStdout();
    { TestClassIndex index; }
    EXPECT_EQ(::testing::internal::GetCapturedStdout(), "Deallocing ClassIndex\n");
    EXPECT_FALSE(capture.containsText("Deallocing ClassIndex"));
}

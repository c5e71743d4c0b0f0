// Tests for Base (Part 3.3): binding, the array rewrites, the abstract operations and lookUpECNO:.
#include "LogGenerator/Base.h"

#include "Platform/RecordBuilder.h"
#include "Platform/SystemLog.h"
#include "Platform/SystemLogCapture.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"
#include "support/TestSections.h"

#include <gtest/gtest.h>

using namespace vantorel;
using namespace vantorel::testing;

TEST(Base, LookUpECNOBoundaries) {
    EXPECT_EQ(Base::lookUpECNO(417648), -1);
    EXPECT_EQ(Base::lookUpECNO(417647), -2);
    EXPECT_EQ(Base::lookUpECNO(706), -31);
    EXPECT_EQ(Base::lookUpECNO(705), 0);
    EXPECT_EQ(Base::lookUpECNO(524288), 0);
    EXPECT_EQ(Base::lookUpECNO(524287), -1);
}

TEST(Base, LookUpECNOUsesTheIrregularThresholdsAsListed) {
    EXPECT_EQ(Base::lookUpECNO(331809), -2);
    EXPECT_EQ(Base::lookUpECNO(331808), -3);
    EXPECT_EQ(Base::lookUpECNO(26622), -13);
    EXPECT_EQ(Base::lookUpECNO(2241), -24);
    EXPECT_EQ(Base::lookUpECNO(2240), -25);
    EXPECT_EQ(Base::lookUpECNO(1950), -25);
    EXPECT_EQ(Base::lookUpECNO(1949), -26);
    EXPECT_EQ(Base::lookUpECNO(0), 0);
    EXPECT_EQ(Base::lookUpECNO(0xFFFFFFFFu), 0);
}

TEST(Base, UpdateSectionRefBindsWithoutOwningAndLogsTheName) {
    TestValueSection section;
    auto dict = Dictionary::create();
    SystemLogCapture capture;
    section.updateSectionRef(Value(dict));
    EXPECT_TRUE(capture.contains(SystemLog::kWarning, "Test Values"));
    EXPECT_EQ(section.sectionDictionary().get(), dict.get());
    EXPECT_EQ(dict.use_count(), 1);  // not owned by the section
    dict.reset();
    EXPECT_EQ(section.sectionDictionary(), nullptr);  // writes then go nowhere
    section.updateWithData(RecordBuilder::ordinary(kValueCode, 14).u8(13, 7).build(), kValueCode);
}

TEST(Base, UnboundSectionWritesGoNowhere) {
    TestValueSection section;
    section.updateWithData(RecordBuilder::ordinary(kValueCode, 14).u8(13, 7).build(), kValueCode);
    EXPECT_EQ(section.sectionDictionary(), nullptr);
    EXPECT_EQ(section.calls.size(), 1u);
}

TEST(Base, ReplaceArrayRefillsInPlaceAndClearEmpties) {
    auto target = Array::of({"old"});
    auto source = Array::of({"a", "b"});
    Base::replaceArray(*target, *source);
    EXPECT_EQ(*target, *source);
    Base::replaceArray(*target, *target);
    EXPECT_EQ(target->size(), 2u);
    Base::clearElementsInArray(*target);
    EXPECT_TRUE(target->empty());
}

using BaseDeathTest = ::testing::Test;

TEST_F(BaseDeathTest, AbstractOperationsReportAnUnimplementedOperation) {
    Base base;
    EXPECT_DEATH(base.getSectionName(), "unrecognised operation getSectionName");
    EXPECT_DEATH(base.getLogCodeArray(), "unrecognised operation getLogCodeArray");
    EXPECT_DEATH(base.updateWithData(ByteView(), 1), "unrecognised operation updateWithData:logCode:");
}

// CellChangeCountersTest: tests CellChangeCounters (Part 5.2 "Cell Change Counters": no log codes, entry line only).
#include "LogGenerator/MVK_GSM/CellChangeCounters.h"

#include "LogGenerator/CodeDictionary.h"
#include "Platform/RecordBuilder.h"
#include "Platform/SystemLog.h"
#include "Platform/SystemLogCapture.h"
#include "PropertyList/Dictionary.h"

#include <gtest/gtest.h>

namespace vantorel {
namespace {

TEST(CellChangeCountersTest, NameIsCellChangeCountersAndThereAreNoLogCodes) {
    CellChangeCounters section;
    EXPECT_EQ(section.getSectionName(), "Cell Change Counters");
    EXPECT_TRUE(section.getLogCodeArray().empty());
}

TEST(CellChangeCountersTest, RegistrationSubscribesToNothing) {
    CellChangeCounters section;
    ClassDictionary classDict;
    CodeDictionary codeDict;
    SystemLogCapture cap;
    EXPECT_EQ(section.initWithDict(classDict, codeDict), &section);
    EXPECT_EQ(classDict["Cell Change Counters"], &section);
    EXPECT_TRUE(codeDict.keys().empty());
    EXPECT_TRUE(cap.contains(SystemLog::kWarning, "Array Count: 0"));
}

TEST(CellChangeCountersTest, UpdateOnlyLogsCellChangeCounters) {
    CellChangeCounters section;
    auto dict = Dictionary::create();
    dict->set("Cell Reselections", Value("3"));
    section.updateSectionRef(Value(dict));
    SystemLogCapture cap;
    section.updateWithData(RecordBuilder::ordinary(0x7135, 28).u8(15, 0x13).build(), 0x7135);
    const auto lines = cap.lines();
    ASSERT_EQ(lines.size(), 1u);
    EXPECT_EQ(lines[0].priority, SystemLog::kWarning);
    EXPECT_EQ(lines[0].text, "CellChangeCounters");
    EXPECT_EQ(dict->keys(), (std::vector<std::string>{"Cell Reselections"}));
    EXPECT_EQ(*dict->get("Cell Reselections").asString(), "3");
}

}  // namespace
}  // namespace vantorel

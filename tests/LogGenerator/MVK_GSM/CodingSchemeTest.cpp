// CodingSchemeTest: tests CodingScheme (Part 5.2 "Coding Scheme": no log codes, entry line "CellChangeCounters" by design).
#include "LogGenerator/MVK_GSM/CodingScheme.h"

#include "LogGenerator/CodeDictionary.h"
#include "Platform/RecordBuilder.h"
#include "Platform/SystemLog.h"
#include "Platform/SystemLogCapture.h"
#include "PropertyList/Dictionary.h"

#include <gtest/gtest.h>

namespace vantorel {
namespace {

TEST(CodingSchemeTest, NameIsCodingSchemeAndThereAreNoLogCodes) {
    CodingScheme section;
    EXPECT_EQ(section.getSectionName(), "Coding Scheme");
    EXPECT_TRUE(section.getLogCodeArray().empty());
}

TEST(CodingSchemeTest, RegistrationSubscribesToNothing) {
    CodingScheme section;
    ClassDictionary classDict;
    CodeDictionary codeDict;
    SystemLogCapture cap;
    EXPECT_EQ(section.initWithDict(classDict, codeDict), &section);
    EXPECT_EQ(classDict["Coding Scheme"], &section);
    EXPECT_TRUE(codeDict.keys().empty());
    EXPECT_TRUE(cap.contains(SystemLog::kWarning, "Array Count: 0"));
}

TEST(CodingSchemeTest, UpdateOnlyLogsCellChangeCountersByDesign) {
    CodingScheme section;
    auto dict = Dictionary::create();
    dict->set("CS1", Value("3"));
    section.updateSectionRef(Value(dict));
    SystemLogCapture cap;
    section.updateWithData(RecordBuilder::ordinary(0x7135, 28).u8(15, 0x13).build(), 0x7135);
    const auto lines = cap.lines();
    ASSERT_EQ(lines.size(), 1u);
    EXPECT_EQ(lines[0].priority, SystemLog::kWarning);
    EXPECT_EQ(lines[0].text, "CellChangeCounters");
    EXPECT_EQ(dict->keys(), (std::vector<std::string>{"CS1"}));
    EXPECT_EQ(*dict->get("CS1").asString(), "3");
}

}  // namespace
}  // namespace vantorel

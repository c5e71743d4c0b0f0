// Tests for MVKLogGenerator2 (Part 3.2): framing, routing, display binding, history hand-over and the start command, on the test-only class index.
#include "LogGenerator/MVKLogGenerator2.h"

#include "Model/VantorelModelNode.h"
#include "Platform/RecordBuilder.h"
#include "Platform/ResourceBundle.h"
#include "Platform/SystemLog.h"
#include "Platform/SystemLogCapture.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"
#include "support/TestSections.h"

#include <QFile>
#include <QTemporaryDir>
#include <gtest/gtest.h>

using namespace vantorel;
using namespace vantorel::testing;

namespace {

class MVKLogGenerator2Test : public ::testing::Test {
protected:
    TestTemplates templates;
    TestLogGenerator generator;
    Dictionary state;

    // Builds the display (first call returns null) and returns it.
    DictionaryRef display() {
        generator.getDisplayFromState(state);
        return generator.getDisplayFromState(state);
    }
    DictionaryRef testValues() {
        return display()->get("1;Status").asDictionary()->get("Test Values").asDictionary();
    }
    ArrayRef testList() { return display()->get("2;Lists").asDictionary()->get("Test List").asArray(); }
};

// Sections for the start-command edge case: one ordinary code 0xD0E0, one extra 0xFF0001.
class RrcLikeSection : public Base {
public:
    std::string getSectionName() const override { return "RRC-like"; }
    std::vector<int32_t> getLogCodeArray() const override { return {0xD0E0}; }
    void updateWithData(ByteView, int32_t) override {}
};
class CellLikeSection : public Base {
public:
    std::string getSectionName() const override { return "Cell-like"; }
    std::vector<int32_t> getLogCodeArray() const override { return {0xFF0001}; }
    void updateWithData(ByteView, int32_t) override {}
};
class StartCommandIndex : public ClassIndex {
public:
    StartCommandIndex() {
        rrc = createSection<RrcLikeSection>();
        cell = createSection<CellLikeSection>();
    }
    std::unique_ptr<RrcLikeSection> rrc;
    std::unique_ptr<CellLikeSection> cell;
};

}  // namespace

TEST_F(MVKLogGenerator2Test, AThirteenByteBufferWithThePrefixIsRoutedOnAnElevenByteRecord) {
    // 0x81 0x00, then an 11-byte record: type 1, length, code 0x1234 at 3..4, 6 bytes of time stamp.
    Bytes buffer = RecordBuilder::ordinary(kValueCode).resize(11).buildWithPrefix();
    ASSERT_EQ(buffer.size(), 13u);
    display();
    generator.updateWithData(buffer);
    ASSERT_EQ(generator.index().values->lengths, std::vector<size_t>{11});
    // The section rejects it by its own length check: "Counter" keeps its template text.
    EXPECT_EQ(*testValues()->get("Counter").asString(), "none yet");
}

TEST_F(MVKLogGenerator2Test, BuffersShorterThanThirteenBytesAreDroppedSilently) {
    SystemLogCapture capture;
    generator.updateWithData(RecordBuilder::ordinary(kValueCode).resize(12).build());
    EXPECT_TRUE(generator.index().values->calls.empty());
    EXPECT_TRUE(capture.lines().empty());
}

TEST_F(MVKLogGenerator2Test, TypeByte255WithCode1IsRoutedToTheSubscribersOf0xFF0001) {
    generator.updateWithData(RecordBuilder::extra(0x0001, 14).build());
    EXPECT_EQ(generator.index().list->calls, std::vector<int32_t>{0xFF0001});
    EXPECT_TRUE(generator.index().values->calls.empty());
}

TEST_F(MVKLogGenerator2Test, TypeByte2IsDroppedWithTheInvalidLogTypeMessage) {
    SystemLogCapture capture;
    generator.updateWithData(RecordBuilder(2, kValueCode, 14).build());
    EXPECT_TRUE(capture.contains(SystemLog::kError, "Invalid log type: 2. Dropping."));
    EXPECT_TRUE(generator.index().values->calls.empty());
}

TEST_F(MVKLogGenerator2Test, TheFirstGenerateLogOnAFreshStateReturnsNullAndStoresTheDisplayTheSecondReturnsIt) {
    EXPECT_EQ(generator.generateLogUsingState(state), nullptr);
    DictionaryRef stored = state.get("Display").asDictionary();
    ASSERT_TRUE(stored);
    EXPECT_TRUE(state.get("ExtraInfo").asDictionary());
    EXPECT_TRUE(state.get("Template").asDictionary());
    EXPECT_EQ(generator.generateLogUsingState(state).get(), stored.get());
}

TEST_F(MVKLogGenerator2Test, AClassIndexWithTheCodeStrings53472And16711681YieldsTheStartCommand) {
    MVKLogGenerator2 g("TestTemplate", std::make_unique<StartCommandIndex>());
    DictionaryRef command = g.getStartCommand();
    EXPECT_EQ(command->keys(), (std::vector<std::string>{"SetState", "SetMorvekLogCodes", "SetTsExtraCodes"}));
    EXPECT_EQ(*command->get("SetState").asString(), "Streaming");
    EXPECT_EQ(*command->get("SetMorvekLogCodes").asArray(), *Array::of({Value::integer(53472)}));
    EXPECT_EQ(*command->get("SetTsExtraCodes").asArray(), *Array::of({Value::integer(1)}));
}

TEST_F(MVKLogGenerator2Test, ATemplateKeyThatNamesNoSectionIsCopiedAsItStands) {
    DictionaryRef status = display()->get("1;Status").asDictionary();
    EXPECT_EQ(*status->get("Label").asString(), "fixed text");
    EXPECT_TRUE(display()->get("_sorted").isString());
}

TEST_F(MVKLogGenerator2Test, ASectionWhoseNameIsNotInTheTemplateNeverGetsAContainer) {
    MVKLogGenerator2 g("TestTemplate", std::make_unique<StartCommandIndex>());
    auto& index = *static_cast<StartCommandIndex*>(g.classIndex());
    Dictionary s;
    g.getDisplayFromState(s);
    EXPECT_TRUE(s.get("Display").asDictionary());
    EXPECT_EQ(index.rrc->sectionDictionary(), nullptr);
    EXPECT_EQ(index.rrc->sectionArray(), nullptr);
}

TEST_F(MVKLogGenerator2Test, SectionsAreBoundToTheirContainersInTheDisplay) {
    DictionaryRef values = testValues();
    EXPECT_EQ(generator.index().values->sectionDictionary().get(), values.get());
    EXPECT_EQ(generator.index().list->sectionArray().get(), testList().get());
    // The display is a copy: the template keeps its text when a section writes.
    generator.updateState(state, RecordBuilder::ordinary(kValueCode, 14).u8(13, 42).build());
    EXPECT_EQ(*values->get("Counter").asString(), "42");
    EXPECT_EQ(*state.get("Template").asDictionary()->get("1;Status").asDictionary()->get("Test Values")
                   .asDictionary()->get("Counter").asString(),
              "none yet");
}

TEST_F(MVKLogGenerator2Test, ACodeSharedByTwoSectionsReachesBothInCreationOrder) {
    display();
    // Shared code 0x5678, payload bytes 13..15 = 7, 8, 9.
    generator.updateState(state, RecordBuilder::ordinary(kSharedCode).bytes(13, {7, 8, 9}).build());
    EXPECT_EQ(*testValues()->get("Counter").asString(), "7");
    EXPECT_EQ(*testList(), *Array::of({"7", "8", "9"}));
}

TEST_F(MVKLogGenerator2Test, RawRecordsAreKeptPrefixIncludedAlsoWhenDroppedAndHandedOverPerGeneration) {
    Bytes ok = RecordBuilder::ordinary(kValueCode, 14).u8(13, 1).buildWithPrefix();
    Bytes bad = RecordBuilder(7, kValueCode, 14).build();
    generator.updateState(state, ok);
    generator.updateState(state, bad);
    generator.generateLogUsingState(state);
    Bytes expected = ok;
    expected.insert(expected.end(), bad.begin(), bad.end());
    EXPECT_EQ(*state.get("DisplayState").asData(), expected);

    generator.generateLogUsingState(state);
    EXPECT_TRUE(state.get("DisplayState").asData()->empty());
    EXPECT_EQ(state.get("History").asArray()->size(), 2u);
}

TEST_F(MVKLogGenerator2Test, ASectionsRaisedErrorIsCaughtLoggedAndTheStreamGoesOn) {
    display();
    SystemLogCapture capture;
    // Extra code 1 with payload byte 13 = 0xEE: TestListSection raises SectionError.
    EXPECT_NO_THROW(generator.updateState(state, RecordBuilder::extra(0x0001, 14).u8(13, 0xEE).build()));
    EXPECT_TRUE(capture.contains(SystemLog::kError,
                                 " ***** Section \"Test List\" dropped record 0xFF0001: payload byte 13 is 0xEE"));
    generator.updateState(state, RecordBuilder::ordinary(kValueCode, 14).u8(13, 5).build());
    EXPECT_EQ(*testValues()->get("Counter").asString(), "5");
}

TEST_F(MVKLogGenerator2Test, BuildingTheDisplayLogsTheClassIndexAndItsStatus) {
    SystemLogCapture capture;
    generator.getDisplayFromState(state);
    char expected[128];
    std::snprintf(expected, sizeof expected, "Initialized class index: %p, Self: %p",
                  static_cast<void*>(generator.classIndex()), static_cast<void*>(&generator));
    EXPECT_TRUE(capture.contains(SystemLog::kWarning, expected));
    EXPECT_TRUE(capture.contains(SystemLog::kWarning, "Dictionary = 1"));
    EXPECT_TRUE(capture.contains(SystemLog::kWarning, "Test Values"));  // updateSectionRef
    EXPECT_TRUE(capture.contains(SystemLog::kWarning, "Test List"));
}

TEST(MVKLogGenerator2, CreationAndDestructionLogTheirLines) {
    TestTemplates templates;
    SystemLogCapture capture;
    char destructed[64];
    {
        TestLogGenerator generator;
        std::snprintf(destructed, sizeof destructed, "MVK_GSMLogGenerator is destructed %p",
                      static_cast<void*>(&generator));
        EXPECT_TRUE(capture.contains(SystemLog::kError, "Class Index: 1"));
        char expected[96];
        std::snprintf(expected, sizeof expected, "Creating MVKLogGenerator2 object with %p",
                      static_cast<void*>(generator.classIndex()));
        EXPECT_TRUE(capture.contains(SystemLog::kError, expected));
        ::testing::internal::CaptureStdout();
    }
    EXPECT_EQ(::testing::internal::GetCapturedStdout(), "Deallocing ClassIndex\n");
    EXPECT_TRUE(capture.contains(SystemLog::kWarning, destructed));
}

TEST(MVKLogGenerator2, AMissingTemplateLogsAndGivesNoDisplayButRecordsAreStillRoutedAndCollected) {
    TestTemplates templates;
    MVKLogGenerator2 generator("NoSuchTemplate", std::make_unique<TestClassIndex>());
    auto& index = *static_cast<TestClassIndex*>(generator.classIndex());
    Dictionary state;
    SystemLogCapture capture;
    Bytes record = RecordBuilder::ordinary(kValueCode, 14).u8(13, 3).build();
    generator.updateState(state, record);
    EXPECT_TRUE(capture.contains(SystemLog::kError, "Cannot load template for display"));
    EXPECT_EQ(index.values->calls.size(), 1u);
    EXPECT_EQ(generator.generateLogUsingState(state), nullptr);
    EXPECT_EQ(generator.generateLogUsingState(state), nullptr);
    EXPECT_FALSE(state.contains("Display"));
    EXPECT_EQ(*state.get("History").asArray()->at(0).asDictionary()->get("DisplayState").asData(), record);
}

TEST(MVKLogGenerator2, TemplateValuesOfAnotherTypeAreLoggedAndLeftOut) {
    QTemporaryDir dir;
    ASSERT_TRUE(dir.isValid());
    auto tmpl = Dictionary::create();
    tmpl->set("Number", Value::integer(5));
    tmpl->set("Test Values", Value(Dictionary::create()));
    auto xml = PropertyListSerialization::write(Value(tmpl), PropertyListSerialization::Format::XML);
    QFile file(dir.filePath("Odd.plist"));
    ASSERT_TRUE(file.open(QIODevice::WriteOnly));
    file.write(reinterpret_cast<const char*>(xml->data()), static_cast<qint64>(xml->size()));
    file.close();
    ResourceBundle::setDirectory(dir.path().toStdString());

    MVKLogGenerator2 generator("Odd", std::make_unique<TestClassIndex>());
    Dictionary state;
    SystemLogCapture capture;
    generator.getDisplayFromState(state);
    ResourceBundle::setDirectory("");
    EXPECT_TRUE(capture.contains(SystemLog::kError, "Received an object of unknown type"));
    EXPECT_TRUE(capture.contains(SystemLog::kWarning, "Processing the template"));
    DictionaryRef display = state.get("Display").asDictionary();
    ASSERT_TRUE(display);
    EXPECT_FALSE(display->contains("Number"));
    EXPECT_TRUE(display->get("Test Values").asDictionary());
}

TEST(MVKLogGenerator2, PrintDictLogsOnlyForValuesThatAreNotStringsOrContainers) {
    TestTemplates templates;
    TestLogGenerator generator;
    auto dict = Dictionary::create();
    dict->set("a", "text");
    dict->set("b", Value(Array::of({"x", Value::integer(1), Value(Dictionary::create())})));
    SystemLogCapture capture;
    generator.printDict(Value(dict));
    EXPECT_EQ(capture.count(SystemLog::kError, "Received an object of unknown type"), 1);
    EXPECT_EQ(capture.lines().size(), 1u);
}

TEST_F(MVKLogGenerator2Test, BuiltRecordsInDisplayTreeOutEndToEnd) {
    // Framing (prefix, type, code), routing (shared code), binding (template) and the tree.
    generator.generateLogUsingState(state);  // builds the display (null on this tick)
    generator.updateState(state, RecordBuilder::ordinary(kValueCode, 14).u8(13, 9).buildWithPrefix());
    generator.updateState(state, RecordBuilder::ordinary(kSharedCode).bytes(13, {4, 5}).build());
    generator.updateState(state, RecordBuilder::ordinary(0x4124, 20).build());  // not subscribed
    DictionaryRef shown = generator.generateLogUsingState(state);
    ASSERT_TRUE(shown);

    PathDictionary paths;
    NodeRef root = VantorelModelNode::makeTreeFromObject(Value(shown), paths);
    ASSERT_TRUE(root->childNodes());
    ASSERT_EQ(root->childNodes()->size(), 2u);
    EXPECT_EQ((*root->childNodes())[0]->displayName(), "Status");
    EXPECT_EQ(*paths.at("/Status/Test Values/Counter")->value(), "4");
    EXPECT_EQ(*paths.at("/Status/Label")->value(), "fixed text");
    EXPECT_EQ(*paths.at("/Lists/Test List/0")->value(), "4");
    EXPECT_EQ(*paths.at("/Lists/Test List/1")->value(), "5");
    EXPECT_EQ(paths.count("/Lists/Test List/2"), 0u);
}

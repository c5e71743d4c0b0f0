// Tests for LogGenerator (Part 3.1): the bounded history, the truncating entry builder, abstract operations and generatorFromTechnology:.
#include "LogGenerator/LogGenerator.h"

#include "Platform/SystemLog.h"
#include "Platform/SystemLogCapture.h"
#include "Platform/TelephonyIdentifiers.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"

#include <gtest/gtest.h>

#include <regex>

using namespace vantorel;

namespace {

// A decoder that overrides none of the four abstract operations.
class BareGenerator : public LogGenerator {};

void setDisplayState(Dictionary& state, uint8_t marker) {
    state.set("DisplayState", Value::data({marker}));
    state.set("Display", Value(Dictionary::create()));
    state.set("ExtraInfo", Value(Dictionary::create()));
}

}  // namespace

TEST(LogGenerator, AfterSevenDisplayGenerationsHistoryHoldsTheFiveNewestOldestFirst) {
    Dictionary state;
    for (uint8_t i = 1; i <= 7; ++i) {
        setDisplayState(state, i);
        LogGenerator::updateHistoryInState(state);
    }
    ArrayRef history = state.get("History").asArray();
    ASSERT_TRUE(history);
    ASSERT_EQ(history->size(), 5u);
    for (size_t i = 0; i < 5; ++i) {
        const Bytes* b = history->at(i).asDictionary()->get("DisplayState").asData();
        ASSERT_TRUE(b);
        EXPECT_EQ((*b)[0], i + 3) << "entry " << i;
    }
}

TEST(LogGenerator, StateWithoutDisplayStateStillGainsAHistoryEntryButItIsEmpty) {
    Dictionary state;
    state.set("Display", Value(Dictionary::create()));
    state.set("ExtraInfo", Value(Dictionary::create()));
    LogGenerator::updateHistoryInState(state);
    ArrayRef history = state.get("History").asArray();
    ASSERT_TRUE(history);
    ASSERT_EQ(history->size(), 1u);
    EXPECT_TRUE(history->at(0).asDictionary()->empty());
}

TEST(LogGenerator, StateWithDisplayStateAndDisplayButNoExtraInfoGainsEntryWithOnlyThoseTwoKeys) {
    Dictionary state;
    state.set("DisplayState", Value::data({1, 2}));
    state.set("Display", Value(Dictionary::create()));
    LogGenerator::updateHistoryInState(state);
    DictionaryRef entry = state.get("History").asArray()->at(0).asDictionary();
    EXPECT_EQ(entry->keys(), (std::vector<std::string>{"DisplayState", "Display"}));
}

TEST(LogGenerator, FullEntryHoldsImmutableCopiesThenDateAndDescriptionInOrder) {
    Dictionary state;
    auto display = Dictionary::create();
    display->set("Cell", "1");
    state.set("DisplayState", Value::data({9}));
    state.set("Display", Value(display));
    state.set("ExtraInfo", Value(Dictionary::create()));
    LogGenerator::updateHistoryInState(state);
    display->set("Cell", "2");  // later changes must not reach the snapshot

    DictionaryRef entry = state.get("History").asArray()->at(0).asDictionary();
    EXPECT_EQ(entry->keys(), (std::vector<std::string>{"DisplayState", "Display", "ExtraInfo", "Date", "Description"}));
    EXPECT_EQ(*entry->get("Display").asDictionary()->get("Cell").asString(), "1");
    const std::string date = *entry->get("Date").asString();
    EXPECT_TRUE(std::regex_match(date, std::regex(R"(\d{4}-\d{2}-\d{2} \d{2}:\d{2}:\d{2} [+-]\d{4})"))) << date;
    EXPECT_TRUE(std::regex_match(*entry->get("Description").asString(),
                                 std::regex(R"(Snapshot \(\d{4}-\d{2}-\d{2} \d{2}:\d{2}:\d{2} [+-]\d{4}\))")));
}

TEST(LogGenerator, HistoryOfMoreThanFiveIsCutToFourBeforeTheAppend) {
    Dictionary state;
    auto history = Array::create();
    for (int i = 0; i < 9; ++i) history->append(Value::integer(i));
    state.set("History", Value(history));
    setDisplayState(state, 1);
    LogGenerator::updateHistoryInState(state);
    ASSERT_EQ(history->size(), 5u);  // the same array, edited in place
    EXPECT_EQ(history->at(0).asInteger(), 5);
    EXPECT_TRUE(history->at(4).asDictionary());
}

TEST(LogGenerator, InitLogsCreatingLogObjectAtWarningPriority) {
    SystemLogCapture capture;
    BareGenerator generator;
    char expected[64];
    std::snprintf(expected, sizeof expected, "Creating Log object: %p", static_cast<void*>(&generator));
    EXPECT_TRUE(capture.contains(SystemLog::kWarning, expected));
}

using LogGeneratorDeathTest = ::testing::Test;

TEST_F(LogGeneratorDeathTest, AbstractUpdateStateFailsLoudly) {
    BareGenerator generator;
    Dictionary state;
    EXPECT_DEATH(generator.updateState(state, ByteView()), "unrecognised operation updateState:withData:");
}

TEST_F(LogGeneratorDeathTest, AbstractGenerateLogFailsLoudly) {
    BareGenerator generator;
    Dictionary state;
    EXPECT_DEATH(generator.generateLogUsingState(state), "unrecognised operation generateLogUsingState:");
}

TEST_F(LogGeneratorDeathTest, AbstractStartCommandFailsLoudly) {
    BareGenerator generator;
    EXPECT_DEATH(generator.getStartCommand(), "unrecognised operation getStartCommand");
}

TEST_F(LogGeneratorDeathTest, AbstractSaveContentsFailsLoudly) {
    BareGenerator generator;
    Dictionary state;
    EXPECT_DEATH(generator.getSaveContentsFromState(state), "unrecognised operation getSaveContentsFromState:");
}

TEST(LogGenerator, UnknownTechnologyIdentifierYieldsNoDecoder) {
    EXPECT_EQ(LogGenerator::generatorFromTechnology("kTSLogChannelTechnology_Morvek_WiMAX"), nullptr);
    EXPECT_EQ(LogGenerator::generatorFromTechnology(""), nullptr);
}

TEST(LogGenerator, TechnologiesWithoutTheirDecoderYetYieldNone) {
    // IFX (Part 8.1), Morvek GSM (5.1), CDMA (4.1) and LTE (6.1) have no decoder class yet.
    EXPECT_EQ(LogGenerator::generatorFromTechnology(kTSLogChannelTechnology_IFX), nullptr);
    EXPECT_EQ(LogGenerator::generatorFromTechnology(kTSLogChannelTechnology_Morvek_GSM), nullptr);
    EXPECT_EQ(LogGenerator::generatorFromTechnology(kTSLogChannelTechnology_Morvek_CDMA), nullptr);
    EXPECT_EQ(LogGenerator::generatorFromTechnology(kTSLogChannelTechnology_Morvek_LTE), nullptr);
}

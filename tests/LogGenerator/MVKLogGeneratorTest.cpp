// Tests for MVKLogGenerator (Part 3.4): generateDlfFromState: and getSaveContentsFromState:.
#include "LogGenerator/MVKLogGenerator.h"

#include "Platform/ByteReader.h"
#include "Platform/SystemLog.h"
#include "Platform/SystemLogCapture.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <ctime>

using namespace vantorel;

namespace {

// MVKLogGenerator is abstract in three operations; its Part 3.4 half is what we test.
class SnapshotOnlyGenerator : public MVKLogGenerator {};

void addHistoryEntry(Dictionary& state, Value displayState) {
    ArrayRef history = state.get("History").asArray();
    if (!history) {
        history = Array::create();
        state.set("History", Value(history));
    }
    auto entry = Dictionary::create();
    if (!displayState.isNull()) entry->set("DisplayState", displayState);
    history->append(Value(entry));
}

// Sets TZ for one test and restores it.
class ScopedTimeZone {
public:
    explicit ScopedTimeZone(const char* tz) {
        const char* old = std::getenv("TZ");
        hadOld_ = old != nullptr;
        if (old) old_ = old;
        setenv("TZ", tz, 1);
        tzset();
    }
    ~ScopedTimeZone() {
        if (hadOld_)
            setenv("TZ", old_.c_str(), 1);
        else
            unsetenv("TZ");
        tzset();
    }

private:
    bool hadOld_ = false;
    std::string old_;
};

}  // namespace

TEST(MVKLogGenerator, EmptyHistoryYieldsADlfOfExactly161BytesAndTheLastEntryDescribesIt) {
    SnapshotOnlyGenerator generator;
    Dictionary state;
    auto dlf = generator.generateDlfFromState(state);
    ASSERT_TRUE(dlf);
    EXPECT_EQ(dlf->size(), 161u);

    ArrayRef contents = generator.getSaveContentsFromState(state).asArray();
    ASSERT_TRUE(contents);
    ASSERT_EQ(contents->size(), 1u);
    DictionaryRef last = contents->at(0).asDictionary();
    EXPECT_EQ(*last->get("Description").asString(), "DLF binary (161 bytes)");
    EXPECT_EQ(last->get("DLF").asData()->size(), 161u);
    EXPECT_EQ(last->keys(), (std::vector<std::string>{"Description", "DLF"}));
}

TEST(MVKLogGenerator, HistoryEntryWithOneByteDisplayStateAddsNothingWithFourteenAddsThirteen) {
    SnapshotOnlyGenerator generator;
    Dictionary state;
    addHistoryEntry(state, Value::data({0x01}));
    EXPECT_EQ(generator.generateDlfFromState(state)->size(), 161u);

    Bytes fourteen(14);
    for (size_t i = 0; i < fourteen.size(); ++i) fourteen[i] = static_cast<uint8_t>(i + 1);
    addHistoryEntry(state, Value::data(fourteen));
    auto dlf = generator.generateDlfFromState(state);
    ASSERT_EQ(dlf->size(), 161u + 13u);
    EXPECT_EQ((*dlf)[161], 2);  // the first byte of the buffer is dropped
    EXPECT_EQ(dlf->back(), 14);
}

TEST(MVKLogGenerator, OnlyTheFirstByteOfEachEntryIsDroppedAndEntriesWithoutDisplayStateAreSkipped) {
    SnapshotOnlyGenerator generator;
    Dictionary state;
    addHistoryEntry(state, Value::data({1, 10, 11, 1, 12}));  // two records: only byte 0 dropped
    addHistoryEntry(state, Value());
    addHistoryEntry(state, Value::data({}));
    addHistoryEntry(state, Value::data({1, 20}));
    auto dlf = generator.generateDlfFromState(state);
    ASSERT_TRUE(dlf);
    EXPECT_EQ(Bytes(dlf->begin() + 161, dlf->end()), (Bytes{10, 11, 1, 12, 20}));
}

TEST(MVKLogGenerator, ATimeZoneOffsetOfMinus12600SecondsIsWrittenAsMinus210Minutes) {
    ScopedTimeZone tz("NST3:30");  // POSIX: UTC-03:30, no daylight-saving time
    SnapshotOnlyGenerator generator;
    Dictionary state;
    auto dlf = generator.generateDlfFromState(state);
    ASSERT_TRUE(dlf);
    EXPECT_EQ((*dlf)[85], 0x2E);
    EXPECT_EQ((*dlf)[86], 0xFF);
    EXPECT_EQ(ByteReader(*dlf).u16(87), 0);
}

TEST(MVKLogGenerator, VersionRecordCarriesNowTheVersionTextAndBuildDate) {
    SnapshotOnlyGenerator generator;
    Dictionary state;
    const auto before = static_cast<uint32_t>(std::time(nullptr));
    auto dlf = generator.generateDlfFromState(state);
    const auto after = static_cast<uint32_t>(std::time(nullptr));
    ByteReader r(*dlf);
    EXPECT_GE(*r.u32(81), before);
    EXPECT_LE(*r.u32(81), after);
    // "Vantorel %@" cut to its first six characters by the 7-byte field.
    EXPECT_EQ(std::string(reinterpret_cast<const char*>(&(*dlf)[16])), "Vantor");
    EXPECT_EQ(std::string(reinterpret_cast<const char*>(&(*dlf)[23])), "EXECUTABLE_NAME");
    EXPECT_EQ(std::string(reinterpret_cast<const char*>(&(*dlf)[63])),
              std::string(MVKLogGenerator::buildDateText()).substr(0, 17));
}

TEST(MVKLogGenerator, DisplayStateThatIsNotBytesAbortsTheDlfAndTheSnapshotHoldsTheHistoryAlone) {
    SnapshotOnlyGenerator generator;
    Dictionary state;
    addHistoryEntry(state, Value::data({1, 2, 3}));
    addHistoryEntry(state, Value("not bytes"));
    SystemLogCapture capture;
    EXPECT_FALSE(generator.generateDlfFromState(state));
    EXPECT_TRUE(capture.contains(SystemLog::kDlf,
                                 "Got wrong class writing history to DLF; aborting writing the DLF file"));
    ArrayRef contents = generator.getSaveContentsFromState(state).asArray();
    ASSERT_EQ(contents->size(), 2u);
    EXPECT_FALSE(contents->at(1).asDictionary()->contains("DLF"));
}

TEST(MVKLogGenerator, SaveContentsListTheHistoryThenTheDlfEntry) {
    SnapshotOnlyGenerator generator;
    Dictionary state;
    addHistoryEntry(state, Value::data({1, 5, 6}));
    ArrayRef contents = generator.getSaveContentsFromState(state).asArray();
    ASSERT_EQ(contents->size(), 2u);
    EXPECT_EQ(contents->at(0), state.get("History").asArray()->at(0));
    EXPECT_EQ(*contents->at(1).asDictionary()->get("Description").asString(), "DLF binary (163 bytes)");
}

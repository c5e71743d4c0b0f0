// FrameworkTest: record framing and routing, template binding, start command, snapshot history and the DLF file.
#include "LogGenerator/DLFAddVersionReport.h"
#include "LogGenerator/MVKLogGenerator2.h"
#include "LogGenerator/SectionTesting.h"
#include "LogGenerator/UTRAN/UTRANClassIndex.h"
#include "Platform/ByteReader.h"
#include "support/TestSections.h"

#include <gtest/gtest.h>

#include <cstring>
#include <memory>
#include <stdexcept>

namespace vantorel {
namespace {

using namespace vantorel::testing;
using sectiontest::render;

class RoutingTest : public ::testing::Test {
protected:
    TestTemplates templates;
    TestLogGenerator generator;
    Dictionary state;

    DictionaryRef display() {
        generator.getDisplayFromState(state);
        return generator.getDisplayFromState(state);
    }
    std::string counter() {
        return render(display()->get("1;Status").asDictionary()->get("Test Values").asDictionary()->get("Counter"));
    }
};

TEST_F(RoutingTest, RecordsAreFramedByPrefixTypeAndCodeBeforeTheyReachTheirSections) {
    display();
    struct Row {
        const char* what;
        Bytes buffer;
        std::vector<int32_t> valueCalls;
        std::vector<int32_t> listCalls;
        const char* errorLine;
    };
    const Row rows[] = {
        {"ordinary record", RecordBuilder::ordinary(kValueCode, 14).build(), {kValueCode}, {}, nullptr},
        {"behind the 0x81 prefix, an 11-byte record still has its code",
         RecordBuilder::ordinary(kValueCode).resize(11).buildWithPrefix(), {kValueCode}, {}, nullptr},
        {"12 bytes are dropped silently", RecordBuilder::ordinary(kValueCode).resize(12).build(), {}, {}, nullptr},
        {"type 2 is invalid", RecordBuilder(2, kValueCode, 14).build(), {}, {}, "Invalid log type: 2. Dropping."},
        {"a shared code reaches both, in creation order", RecordBuilder::ordinary(kSharedCode, 14).build(),
         {kSharedCode}, {kSharedCode}, nullptr},
        {"a code nobody subscribes to", RecordBuilder::ordinary(0x4321, 14).build(), {}, {}, nullptr},
        {"type 255 with code 1 is extra 0xFF0001; a section's own error is logged and the stream goes on",
         RecordBuilder::extra(1, 14).u8(13, 0xEE).build(), {},
         {0xFF0001}, " ***** Section \"Test List\" dropped record 0xFF0001: payload byte 13 is 0xEE"},
    };
    for (const Row& row : rows) {
        generator.index().values->calls.clear();
        generator.index().list->calls.clear();
        SystemLogCapture capture;
        EXPECT_NO_THROW(generator.updateState(state, row.buffer)) << row.what;
        EXPECT_EQ(generator.index().values->calls, row.valueCalls) << row.what;
        EXPECT_EQ(generator.index().list->calls, row.listCalls) << row.what;
        EXPECT_EQ(sectiontest::errorLines(capture),
                  row.errorLine ? std::vector<std::string>{row.errorLine} : std::vector<std::string>{})
            << row.what;
    }
    EXPECT_EQ(generator.index().values->lengths.back(), 14u);
    generator.updateState(state, RecordBuilder::ordinary(kSharedCode).bytes(13, {7, 8, 9}).build());
    EXPECT_EQ(counter(), "7");
    EXPECT_EQ(render(display()->get("2;Lists").asDictionary()->get("Test List")), "[7, 8, 9]");
}

// A programming fault in a section is not the section's decoding error: it is not swallowed.
struct FaultySection : Base {
    std::string getSectionName() const override { return "Faulty"; }
    std::vector<int32_t> getLogCodeArray() const override { return {0x1111}; }
    void updateWithData(ByteView, int32_t) override { throw std::logic_error("bug"); }
};
struct FaultyIndex : ClassIndex {
    std::unique_ptr<FaultySection> faulty = createSection<FaultySection>();
};

TEST(Routing, OtherExceptionsAreNotTakenForTheSectionsError) {
    MVKLogGenerator2 g("none", std::make_unique<FaultyIndex>());
    EXPECT_THROW(g.updateWithData(RecordBuilder::ordinary(0x1111, 14).build()), std::logic_error);
}

TEST_F(RoutingTest, TheDisplayIsACopyOfTheTemplateBoundToTheSectionsUntilForgotten) {
    EXPECT_EQ(generator.generateLogUsingState(state), nullptr);  // the first call builds it
    const DictionaryRef built = state.get("Display").asDictionary();
    ASSERT_TRUE(built);
    EXPECT_EQ(generator.generateLogUsingState(state).get(), built.get());  // the second returns it
    EXPECT_EQ(render(Value(built)),
              "{_sorted=_sorted, 1;Status={Test Values={Counter=none yet}, Label=fixed text}, 2;Lists={Test List=[]}}");
    generator.updateState(state, RecordBuilder::ordinary(kValueCode, 14).u8(13, 42).build());
    EXPECT_EQ(counter(), "42");
    EXPECT_EQ(render(state.get("Template").asDictionary()->get("1;Status")), "{Test Values={Counter=none yet}, Label=fixed text}");

    // Forgetting the display rebinds the sections to a new one and keeps the history.
    LogGenerator::forgetDisplay(state);
    EXPECT_FALSE(state.contains("Display") || state.contains("Template") || state.contains("ExtraInfo"));
    EXPECT_EQ(state.get("History").asArray()->size(), 2u);
    generator.updateState(state, RecordBuilder::ordinary(kValueCode, 14).u8(13, 9).build());
    EXPECT_EQ(counter(), "9");
    EXPECT_NE(display().get(), built.get());
}

TEST_F(RoutingTest, RawRecordsAreKeptEvenWhenDroppedAndHandedToTheHistoryPerGeneration) {
    const Bytes ok = RecordBuilder::ordinary(kValueCode, 14).u8(13, 1).buildWithPrefix();
    const Bytes bad = RecordBuilder(7, kValueCode, 14).build();
    generator.updateState(state, ok);
    generator.updateState(state, bad);
    generator.generateLogUsingState(state);
    Bytes expected = ok;
    expected.insert(expected.end(), bad.begin(), bad.end());
    EXPECT_EQ(*state.get("DisplayState").asData(), expected);
    generator.generateLogUsingState(state);
    EXPECT_TRUE(state.get("DisplayState").asData()->empty());
}

TEST(StartCommand, OrdinaryCodesAndExtraCodesOfEverySubscribedSection) {
    MVKLogGenerator2 g("UTRAN", std::make_unique<UTRANClassIndex>());
    const DictionaryRef command = g.getStartCommand();
    EXPECT_EQ(render(command->get("SetState")), "Streaming");
    std::vector<int64_t> ordinary, extra;
    for (const Value& v : *command->get("SetMorvekLogCodes").asArray()) ordinary.push_back(*v.asInteger());
    for (const Value& v : *command->get("SetTsExtraCodes").asArray()) extra.push_back(*v.asInteger());
    EXPECT_EQ(ordinary, (std::vector<int64_t>{0xD0E0, 0xD0E2, 0xD00A, 0xD00E, 0xD00C}));
    EXPECT_EQ(extra, (std::vector<int64_t>{1, 2, 0}));
}

TEST(LookUpECNO, LinearEcNoMapsToWholeDecibelsAtTheThresholds) {
    const std::pair<uint32_t, int32_t> rows[] = {
        {0xFFFFFFFF, 0}, {524288, 0}, {524287, -1}, {417648, -1}, {417647, -2}, {331809, -2},
        {331808, -3},    {2241, -24}, {2240, -25},  {706, -31},   {705, 0},     {0, 0},
    };
    for (auto [linear, db] : rows) EXPECT_EQ(Base::lookUpECNO(linear), db) << linear;
}

TEST(History, HoldsTheFiveNewestEntriesEachCutAtTheFirstAbsentValue) {
    Dictionary state;
    for (uint8_t i = 1; i <= 7; ++i) {
        state.set("DisplayState", Value::data({i}));
        state.set("Display", Value(Dictionary::create()));
        state.set("ExtraInfo", Value(Dictionary::create()));
        LogGenerator::updateHistoryInState(state);
    }
    const ArrayRef history = state.get("History").asArray();
    ASSERT_EQ(history->size(), 5u);
    EXPECT_EQ(*history->at(0).asDictionary()->get("DisplayState").asData(), Bytes{3});
    EXPECT_EQ(*history->at(4).asDictionary()->get("DisplayState").asData(), Bytes{7});
    EXPECT_EQ(history->at(4).asDictionary()->keys(),
              (std::vector<std::string>{"DisplayState", "Display", "ExtraInfo", "Date", "Description"}));

    // No "ExtraInfo": the entry stops before it; no "DisplayState": an empty entry.
    state.remove("ExtraInfo");
    LogGenerator::updateHistoryInState(state);
    EXPECT_EQ(history->at(4).asDictionary()->keys(), (std::vector<std::string>{"DisplayState", "Display"}));
    state.remove("DisplayState");
    LogGenerator::updateHistoryInState(state);
    EXPECT_TRUE(history->at(4).asDictionary()->empty());
    EXPECT_EQ(history->size(), 5u);
}

std::string textAt(const Bytes& b, size_t offset, size_t width) {
    return std::string(reinterpret_cast<const char*>(&b[offset]), strnlen(reinterpret_cast<const char*>(&b[offset]), width));
}

TEST(DLF, TheVersionReportHasEveryFieldAtItsOffsetAndTextsCutToTheirFields) {
    Bytes buf(200, 0xAA);
    unsigned written = 99;
    ASSERT_EQ(DLFAddVersionReport(buf.data(), 200, &written, 1, 2, "Vantorel 0.1.0", "EXECUTABLE_NAME",
                                  "Jun 28 2016 22:01:10", 0x12345678u, -210, 1),
              0);
    EXPECT_EQ(written, 161u);
    const ByteReader r(buf);
    EXPECT_EQ(r.u16(0), 161);
    EXPECT_EQ(r.u16(2), 0x1FFD);
    EXPECT_EQ(r.u64(4), 0u);  // time stamp
    EXPECT_EQ(r.u16(12), 1);
    EXPECT_EQ(r.u16(14), 2);
    EXPECT_EQ(textAt(buf, 16, 7), "Vantor");  // cut to the field, NUL-terminated
    EXPECT_EQ(textAt(buf, 23, 16), "EXECUTABLE_NAME");
    EXPECT_EQ(textAt(buf, 63, 18), "Jun 28 2016 22:01");
    EXPECT_EQ(r.u32(81), 0x12345678u);
    EXPECT_EQ(r.s16(85), -210);
    EXPECT_EQ(r.u16(87), 1);
    for (size_t i : {22u, 38u, 39u, 62u, 80u, 89u, 160u}) EXPECT_EQ(buf[i], 0) << i;
    EXPECT_EQ(buf[161], 0xAA);

    Bytes small(161, 0xAA);
    EXPECT_EQ(DLFAddVersionReport(small.data(), 160, &written, 1, 1, "v", "e", "d", 1, 2, 0), 3);
    EXPECT_EQ(written, 0u);
    EXPECT_EQ(small, Bytes(161, 0xAA));
}

// A history entry holding the display state, or nothing for a null value.
Value historyEntry(Value displayState) {
    auto entry = Dictionary::create();
    if (!displayState.isNull()) entry->set("DisplayState", displayState);
    return Value(entry);
}

class SnapshotGenerator : public MVKLogGenerator {};

TEST(DLF, TheFileIsTheVersionReportThenEachSnapshotsRecordsWithoutTheirFirstByteUnlessOneIsNotBytes) {
    SnapshotGenerator generator;
    Dictionary state;
    const ArrayRef history = Array::of({historyEntry(Value::data({1, 10, 11, 1, 12})),  // two records: only byte 0 dropped
                                        historyEntry(Value()), historyEntry(Value::data({})),
                                        historyEntry(Value::data({1})), historyEntry(Value::data({1, 20}))});
    state.set("History", Value(history));
    const auto dlf = generator.generateDlfFromState(state);
    ASSERT_TRUE(dlf);
    EXPECT_EQ(ByteReader(*dlf).u16(2), 0x1FFD);
    EXPECT_EQ(Bytes(dlf->begin() + 161, dlf->end()), (Bytes{10, 11, 1, 12, 20}));

    const ArrayRef contents = generator.getSaveContentsFromState(state).asArray();
    ASSERT_EQ(contents->size(), 6u);
    EXPECT_EQ(render(contents->at(5)), "{Description=DLF binary (166 bytes), DLF=<data>}");

    // A display state that is not bytes aborts the file; the snapshot then holds the history alone.
    history->append(historyEntry(Value("not bytes")));
    SystemLogCapture capture;
    EXPECT_FALSE(generator.generateDlfFromState(state));
    EXPECT_TRUE(capture.contains(SystemLog::kDlf, "Got wrong class writing history to DLF; aborting writing the DLF file"));
    EXPECT_EQ(generator.getSaveContentsFromState(state).asArray()->size(), 6u);
}

}  // namespace
}  // namespace vantorel

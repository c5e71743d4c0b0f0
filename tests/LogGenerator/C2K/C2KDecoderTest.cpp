// Tests the CDMA decoder end to end: template binding, record framing and dispatch, the start command, the emulator's stream and the real captures.
#include "LogGenerator/C2K/C2KLogGenerator.h"
#include "LogGenerator/C2K/C2KLookup.h"
#include "LogGenerator/SectionTesting.h"
#include "Platform/LogCodes.h"
#include "TelephonyService/Emulator/CDMAScenario.h"
#include "TelephonyService/Replay/RecordedStream.h"

#include <gtest/gtest.h>

#include <set>

namespace vantorel {
namespace {

using sectiontest::at;
using sectiontest::render;

TEST(C2KDecoder, TemplateLeavesAreBoundToTheirLookupKeysAndOtherValuesLeaveNoKey) {
    auto group = Dictionary::create();
    group->set("_sorted", "_sorted");
    group->set("1;SID", "kSystemId");
    group->set("Count", Value::integer(3));
    group->set("List", Value(Array::of({"kSystemId"})));
    Dictionary templ;
    templ.set("Overview", "kSystemId");
    templ.set("System", Value(group));
    templ.set("Rate", "kFLDataRate");
    auto display = Dictionary::create();
    Dictionary lookup;
    C2KLogGenerator::processTemplate(templ, display, lookup);
    EXPECT_EQ(render(Value(display)), "{Overview=, System={_sorted=_sorted, 1;SID=}, Rate=}");

    auto shared = std::make_shared<Dictionary>(lookup);
    C2KLookup::setLookupValue("kSystemId", Value("4145"), shared);
    C2KLookup::setLookupValue("kUnbound", Value("x"), shared);
    EXPECT_EQ(render(Value(display)), "{Overview=4145, System={_sorted=_sorted, 1;SID=4145}, Rate=}");
    // A binding record of the wrong shape ends the delivery of that value there.
    lookup.get("kSystemId").asArray()->at(0).asDictionary()->set("key", Value::integer(1));
    C2KLookup::setLookupValue("kSystemId", Value("99"), std::make_shared<Dictionary>(lookup));
    EXPECT_EQ(render(Value(display)), "{Overview=4145, System={_sorted=_sorted, 1;SID=4145}, Rate=}");
}

TEST(C2KDecoder, FramingDecidesWhatIsDecodedAndWhatIsKeptForTheLog) {
    const Bytes status = RecordBuilder::ordinary(0x1183, 50).u16(13, 0x0801 + 283 - 1).u8(36, 5).build();
    Bytes typeTwo = status;
    typeTwo[0] = 2;
    Bytes wide = status;
    wide[0] = 0xFF;
    // 13 bytes with the 0x81 0x00 prefix: an 11-byte record reaches the routine.
    Bytes prefixedShort = RecordBuilder::ordinary(0x1183).buildWithPrefix();
    prefixedShort.resize(13);
    struct Row {
        Bytes record;
        std::string channel;  // "kChannel" afterwards
        size_t kept;          // bytes kept for the DLF
        std::vector<std::string> errors;
    };
    const Row rows[] = {
        {status, "283", 50, {}},
        {typeTwo, "283", 50, {"Invalid log type: 2. Dropping."}},
        {wide, "", 0, {"Invalid log type: ff. Dropping."}},
        {prefixedShort, "", 11, {"Log code 0x1183 is 11 bytes long but should be 50 bytes."}},
        {Bytes(status.begin(), status.begin() + 12), "", 0, {}},
        {RecordBuilder::ordinary(0x1184, 50).build(), "", 0, {}},
    };
    for (const Row& row : rows) {
        auto g = C2KLogGenerator::generator();
        Dictionary state;
        SystemLogCapture log;
        g->updateState(state, row.record);
        const DictionaryRef display = g->generateLogUsingState(state);
        EXPECT_EQ(at(display, {"3;EV-DO", "05;Channel"}), row.channel);
        EXPECT_EQ(state.get("DisplayState").asData()->size(), row.kept);
        EXPECT_EQ(sectiontest::errorLines(log), row.errors);
    }
}

TEST(C2KDecoder, TheStartCommandAsksForTheEightCodesInOrder) {
    std::vector<int64_t> codes;
    const DictionaryRef command = C2KLogGenerator::generator()->getStartCommand();
    for (const Value& v : *command->get("SetMorvekLogCodes").asArray())
        codes.push_back(*v.asInteger());
    EXPECT_EQ(codes, (std::vector<int64_t>{0x108a, 0x1183, 0x1192, 0x12b6, 0x119c, 0x119d, 0x127e, 0x134f}));
}

TEST(C2KDecoder, TheEmulatorsStreamGivesEveryBoundValueAndMovingRates) {
    auto g = LogGenerator::generatorFromTechnology(kTSLogChannelTechnology_Morvek_CDMA);
    ASSERT_TRUE(g);
    CDMAScenario scenario(2);
    Dictionary state;
    std::set<std::string> never, rates;
    for (uint64_t tick = 0; tick < 200; ++tick) {
        for (const Bytes& record : scenario.recordsForTick(tick)) g->updateState(state, record);
        const DictionaryRef display = g->generateLogUsingState(state);
        ASSERT_TRUE(display);
        std::set<std::string> blank;
        for (const auto& [key, places] : *state.get("Lookup").asDictionary())
            for (const Value& place : *places.asArray()) {
                const DictionaryRef binding = place.asDictionary();
                const Value& v = binding->get("dict").asDictionary()->get(*binding->get("key").asString());
                if (v.asString() && v.asString()->empty()) blank.insert(key);
            }
        if (tick == 0) never = blank;
        std::erase_if(never, [&](const std::string& k) { return !blank.count(k); });
        rates.insert(at(display, {"4;Data Rates", "1;Forward Link"}));
    }
    EXPECT_TRUE(never.empty()) << ::testing::PrintToString(never);
    EXPECT_GE(rates.size(), 10u);
}

TEST(C2KDecoder, EveryRealCaptureDecodesAndTheSystemIdentityRecordsReachTheirRoutine) {
    for (const char* file : {"qmdl_example.qmdl", "offline_log_example.mi2log", "cmcc.mi2log", "sprint.mi2log"}) {
        const RecordedStream stream = RecordedStream::open(std::string(VANTOREL_CAPTURES_DIR) + "/" + file,
                                                           kTSLogChannelTechnology_Morvek_CDMA);
        ASSERT_TRUE(stream.ok()) << stream.error();
        auto g = LogGenerator::generatorFromTechnology(kTSLogChannelTechnology_Morvek_CDMA);
        Dictionary state;
        for (const TimedMessage& m : stream.messages()) g->updateState(state, m.data);
        const DictionaryRef display = g->generateLogUsingState(state);
        ASSERT_TRUE(display);
        if (std::string(file) == "offline_log_example.mi2log") {
            // Its five 0x134F records (2,620 bytes, version 8) say system type 1, so the routine
            // shows no SID or NID; the last one: ERI 0, packet zone 0, revision 0, base ID 0.
            EXPECT_EQ(at(display, {"2;System", "1;Roaming Indicator"}), "OFF [0]");
            EXPECT_EQ(at(display, {"2;System", "2;SID"}), "(unknown system type 1)");
            EXPECT_EQ(at(display, {"0;Overview", "3;System ID"}), "(unknown system type 1)");
            EXPECT_EQ(at(display, {"2;System", "4;Base ID"}), "0");
            EXPECT_EQ(state.get("DisplayState").asData()->size(), 5u * 2620);
        }
    }
}

}  // namespace
}  // namespace vantorel

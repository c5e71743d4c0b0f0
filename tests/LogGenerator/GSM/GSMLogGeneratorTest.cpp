// Tests the IFX GSM decoder: message objects to displays, refused messages, start command and save contents.
#include "LogGenerator/GSM/GSMLogGenerator.h"
#include "LogGenerator/SectionTesting.h"
#include "Platform/TelephonyIdentifiers.h"
#include "PropertyList/PropertyListSerialization.h"
#include "TelephonyService/Emulator/IFXScenario.h"

#include <gtest/gtest.h>

#include <set>

namespace vantorel {
namespace {

using sectiontest::render;

Bytes plist(const std::string& body) {
    const std::string text = "<?xml version=\"1.0\" encoding=\"UTF-8\"?><plist version=\"1.0\">" + body + "</plist>";
    return Bytes(text.begin(), text.end());
}
std::string dict(const std::string& entries) { return "<dict>" + entries + "</dict>"; }
std::string entry(const char* key, const std::string& value) { return "<key>" + std::string(key) + "</key>" + value; }
std::string str(const char* s) { return "<string>" + std::string(s) + "</string>"; }

TEST(GSMLogGenerator, MessageObjectsAreSimplifiedIntoTheirDisplay) {
    const std::string three = dict(entry("x", str("1")) + entry("y", str("2")) + entry("z", str("3")));
    const struct { std::string body; const char* shown; } rows[] = {
        {dict(entry("k", dict(entry("a", three)))), "{k={x=1, y=2, z=3}}"},
        {dict(entry("a", str("s"))), "{a=s}"},
        {dict(entry("a", dict(entry("b", str("s"))))), "{a=s}"},
        {dict(entry("l", "<array>" + str("h") + str("a") + str("b") + "</array>") +
              entry("e", "<array>" + str("h") + "</array>") + entry("d", "<dict/>")),
         "{l=[a, b], e=[], d={}}"},
        {"<array>" + dict(entry("h", str("h"))) + dict(entry("x", str("v"))) + three + "</array>", "[v, {x=1, y=2, z=3}]"},
        {"<array><integer>3</integer>" + str("a") + "</array>", "[a]"},
        {str("plain"), "plain"},
    };
    for (const auto& row : rows) {
        PropertyListResult object = PropertyListSerialization::read(plist(row.body));
        ASSERT_TRUE(object) << row.body;
        EXPECT_EQ(render(GSMLogGenerator::processObject(*object.value)), row.shown) << row.body;
    }
}

TEST(GSMLogGenerator, RefusedMessagesAreLoggedAndDroppedWhileTheLastGoodDisplayStays) {
    std::unique_ptr<LogGenerator> g = LogGenerator::generatorFromTechnology(kTSLogChannelTechnology_IFX);
    ASSERT_TRUE(dynamic_cast<GSMLogGenerator*>(g.get()));
    Dictionary state;
    EXPECT_FALSE(g->generateLogUsingState(state));
    g->updateState(state, plist(dict(entry("Cell", dict(entry("a", str("1")) + entry("b", str("2")))))));
    const Value shownState = state.get("DisplayState"), extra = state.get("ExtraInfo");
    const struct { Bytes message; std::string line; } rows[] = {
        {Bytes{'n', 'o', 't'}, "Could not deserialize the object (3 bytes)"},
        {plist(""), "Could not deserialize the object"},
        {plist(dict(entry("a", "<array>" + str("h") + dict(entry("n", "<integer>7</integer>")) + "</array>"))),
         "Unknown object of type integer encountered"},
        {plist(dict(entry("b", "<true/>"))), "Unknown object of type boolean encountered"},
        {plist(dict(entry("d", "<data>AAE=</data>"))), "Unknown object of type data encountered"},
    };
    for (const auto& row : rows) {
        SystemLogCapture capture;
        g->updateState(state, row.message);
        const std::string line = row.line.back() == ')' ? row.line : row.line + " (" + std::to_string(row.message.size()) + " bytes)";
        EXPECT_EQ(sectiontest::errorLines(capture), std::vector<std::string>{line});
        EXPECT_EQ(render(Value(g->generateLogUsingState(state))), "{Cell={a=1, b=2}}") << line;
        EXPECT_EQ(state.get("DisplayState"), shownState);
        EXPECT_EQ(state.get("ExtraInfo").asDictionary(), extra.asDictionary());
    }
    auto next = Dictionary::create();
    next->set("Next", Value(Array::of({"h", "shown"})));
    g->updateState(state, *PropertyListSerialization::write(Value(next), PropertyListSerialization::Format::Binary));
    EXPECT_EQ(render(Value(g->generateLogUsingState(state))), "{Next=[shown]}");
    EXPECT_NE(state.get("ExtraInfo").asDictionary(), extra.asDictionary());
    EXPECT_EQ(render(state.get("ExtraInfo")), "{}");
}

TEST(GSMLogGenerator, StartsStreamingAndSavesTheHistoryWithoutADlf) {
    std::unique_ptr<LogGenerator> g = GSMLogGenerator::generator();
    EXPECT_EQ(render(Value(g->getStartCommand())), "{SetState=Streaming}");
    Dictionary state;
    for (const char* v : {"1", "2"}) {
        g->updateState(state, plist(dict(entry("v", str(v)))));
        g->generateLogUsingState(state);
    }
    const Value contents = g->getSaveContentsFromState(state);
    EXPECT_EQ(contents, state.get("History"));
    ASSERT_EQ(contents.asArray()->size(), 2u);
    EXPECT_EQ(render(contents.asArray()->at(1).asDictionary()->get("Display")), "{v=2}");
}

TEST(GSMLogGenerator, TheEmulatorsStreamShowsEveryGroupAndRefusesOnlyItsBrokenMessages) {
    std::unique_ptr<LogGenerator> g = LogGenerator::generatorFromTechnology(kTSLogChannelTechnology_IFX);
    ASSERT_TRUE(g);
    IFXScenario scenario(4);
    Dictionary state;
    SystemLogCapture log;
    std::set<std::string> servingCells;
    for (uint64_t tick = 0; tick < 120; ++tick) {
        for (const Bytes& message : scenario.recordsForTick(tick)) g->updateState(state, message);
        const DictionaryRef display = g->generateLogUsingState(state);
        ASSERT_TRUE(display);
        servingCells.insert(sectiontest::at(display, {"Serving Cell", "Identity", "Cell ID"}));
        std::vector<std::string> empty;
        sectiontest::unfilled(Value(display), "", empty);
        EXPECT_TRUE(empty.empty()) << tick << ": " << ::testing::PrintToString(empty);
        for (const char* group : {"Serving Cell", "Neighbours", "Radio Resource", "Registration"})
            EXPECT_NE(sectiontest::at(display, {group}), "<missing>") << tick;
    }
    EXPECT_EQ(sectiontest::errorLines(log).size(), 120 / IFXScenario::kRefusedPeriod);
    EXPECT_GE(servingCells.size(), 3u);
}

}  // namespace
}  // namespace vantorel

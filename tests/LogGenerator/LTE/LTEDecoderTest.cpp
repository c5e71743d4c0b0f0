// Tests the LTE decoder end to end: its start command, the emulator's stream filling every pane, and the real captures decoded without a fault.
#include "LogGenerator/LogGenerator.h"
#include "LogGenerator/SectionTesting.h"
#include "Platform/LogCodes.h"
#include "Platform/RecordVersions.h"
#include "TelephonyService/Emulator/LTEScenario.h"
#include "TelephonyService/Replay/RecordedStream.h"

#include <gtest/gtest.h>

namespace vantorel {
namespace {

using sectiontest::render;

std::vector<int64_t> integers(const Value& list) {
    std::vector<int64_t> out;
    for (const Value& v : *list.asArray()) out.push_back(*v.asInteger());
    return out;
}

TEST(LTEDecoder, TheStartCommandAsksForTheLTERecordsTheSimThePdpContextsAndTheCellMonitor) {
    auto g = LogGenerator::generatorFromTechnology(kTSLogChannelTechnology_Morvek_LTE);
    ASSERT_TRUE(g);
    const DictionaryRef command = g->getStartCommand();
    EXPECT_EQ(render(command->get("SetState")), "Streaming");
    EXPECT_EQ(integers(command->get("SetMorvekLogCodes")),
              (std::vector<int64_t>{0xB0C2, 0xB0C1, 0xB179, 0xB17F, 0xB180, 0xB186}));
    EXPECT_EQ(integers(command->get("SetTsExtraCodes")), (std::vector<int64_t>{1, 0, 2}));
}

TEST(LTEDecoder, TheEmulatorsStreamFillsEveryPane) {
    auto g = LogGenerator::generatorFromTechnology(kTSLogChannelTechnology_Morvek_LTE);
    ASSERT_TRUE(g);
    LTEScenario scenario(3);
    Dictionary state;
    EXPECT_EQ(g->generateLogUsingState(state), nullptr);  // the first call builds the display
    for (uint64_t tick = 0; tick < 200; ++tick)
        for (const Bytes& record : scenario.recordsForTick(tick)) g->updateState(state, record);
    const DictionaryRef display = g->generateLogUsingState(state);
    ASSERT_TRUE(display);
    std::vector<std::string> missing;
    sectiontest::unfilled(Value(display), "", missing);
    EXPECT_TRUE(missing.empty()) << ::testing::PrintToString(missing);
}

TEST(LTEDecoder, ARecordOfALayoutVersionNewerThanAnyKnownIsSkippedCountedAndSaidOnce) {
    auto g = LogGenerator::generatorFromTechnology(kTSLogChannelTechnology_Morvek_LTE);
    Dictionary state;
    g->generateLogUsingState(state);
    SystemLogCapture log;
    for (uint8_t version : {3, 7, 7, 0}) {  // 0 and 3 have layouts (the original one and 3)
        g->updateState(state, RecordBuilder::ordinary(0xB0C2, 42).u8(13, version).u16(14, 70 + version).build());
        const DictionaryRef display = g->generateLogUsingState(state);
        EXPECT_EQ(sectiontest::render(display->get("1;Serving Cell").asDictionary()->get("Serving Cell Info")
                                          .asDictionary()->get("Physical Cell ID")),
                  std::to_string(version == 7 ? 73 : 70 + version));
    }
    EXPECT_EQ(log.count(SystemLog::kWarning, "0xB0C2 version 7: layout unknown, record skipped"), 1);
    EXPECT_EQ((RecordVersions::skipped()[{0xB0C2, 7}]), 2u);
}

TEST(LTEDecoder, EveryRealCaptureDecodesWithoutAFault) {
    for (const char* file : {"qmdl_example.qmdl", "offline_log_example.mi2log", "cmcc.mi2log", "sprint.mi2log"}) {
        const RecordedStream stream = RecordedStream::open(std::string(VANTOREL_CAPTURES_DIR) + "/" + file,
                                                           kTSLogChannelTechnology_Morvek_LTE);
        ASSERT_TRUE(stream.ok()) << stream.error();
        auto g = LogGenerator::generatorFromTechnology(kTSLogChannelTechnology_Morvek_LTE);
        Dictionary state;
        g->generateLogUsingState(state);
        for (const TimedMessage& m : stream.messages()) g->updateState(state, m.data);
        EXPECT_TRUE(g->generateLogUsingState(state)) << file;
    }
}

}  // namespace
}  // namespace vantorel

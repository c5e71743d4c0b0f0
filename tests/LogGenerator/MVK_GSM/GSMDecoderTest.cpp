// Tests the GSM/UMTS decoder end to end: its start command, the routing of shared codes, records to display paths, the emulator's stream and the real captures.
#include "LogGenerator/LogGenerator.h"
#include "LogGenerator/SectionTesting.h"
#include "Platform/LogCodes.h"
#include "TelephonyService/Emulator/GSMScenario.h"
#include "TelephonyService/Replay/RecordedStream.h"

#include <gtest/gtest.h>

#include <set>

namespace vantorel {
namespace {

using sectiontest::at;

struct Decoder {
    std::unique_ptr<LogGenerator> g = LogGenerator::generatorFromTechnology(kTSLogChannelTechnology_Morvek_GSM);
    Dictionary state;
    Decoder() { g->generateLogUsingState(state); }  // the first call builds the display
    Decoder& feed(const Bytes& record) {
        g->updateState(state, record);
        return *this;
    }
    DictionaryRef display() { return g->generateLogUsingState(state); }
};

std::set<int64_t> integers(const Value& list) {
    std::set<int64_t> out;
    for (const Value& v : *list.asArray()) out.insert(*v.asInteger());
    return out;
}

TEST(GSMDecoder, TheStartCommandAsksForEachOrdinaryCodeOnceAndTheThreeExtras) {
    Decoder d;
    const DictionaryRef command = d.g->getStartCommand();
    const std::set<int64_t> expected = {0x4005, 0x4031, 0x4116, 0x4125, 0x4127, 0x4157, 0x417A, 0x4221, 0x5072,
                                        0x5076, 0x512C, 0x5134, 0x5137, 0x51F4, 0x51F5, 0x51F6, 0x51F8, 0x51FB,
                                        0x51FD, 0x51FF, 0x7130, 0x7131, 0x7132, 0x7135, 0x7150};
    EXPECT_EQ(integers(command->get("SetMorvekLogCodes")), expected);
    EXPECT_EQ(command->get("SetMorvekLogCodes").asArray()->size(), expected.size());
    EXPECT_EQ(integers(command->get("SetTsExtraCodes")), (std::set<int64_t>{0, 1, 2}));
    EXPECT_EQ(command->get("SetTsExtraCodes").asArray()->size(), 3u);
}

TEST(GSMDecoder, SharedCodesReachTheirSectionsInOrderAndOthersNone) {
    struct Row {
        Bytes record;
        std::vector<std::string> entered;  // the sections' entry lines, in call order
    };
    const Row rows[] = {
        {RecordBuilder::ordinary(0x5137, 29).build(),
         {"GPRSInformation", "GSMServingCell", "NeighboringCells", "GSMRRInfo"}},
        // Process CO says "ProcessCS" on entry, as Process CS does.
        {RecordBuilder::ordinary(0x7132, 16).build(), {"ProcessPS", "ProcessCS", "Serving PLMN", "ProcessCS"}},
        {RecordBuilder::ordinary(0x417A, 16).build(), {"ActiveSet", "DetectedSet", "MonitoredSet", "VirtualActiveSet"}},
        {RecordBuilder::ordinary(0x4005, 15).build(), {"GSMSet", "UMTSSet"}},
        {RecordBuilder::ordinary(0x4124, 40).u8(13, 7).build(), {}},
    };
    for (const Row& row : rows) {
        Decoder d;
        const std::string before = sectiontest::render(Value(d.display()));
        SystemLogCapture log;
        d.feed(row.record);
        std::vector<std::string> entered;
        for (const auto& line : log.lines())
            if (line.priority == SystemLog::kWarning) entered.push_back(line.text);
        EXPECT_EQ(entered, row.entered);
        if (row.entered.empty()) {
            EXPECT_EQ(sectiontest::render(Value(d.display())), before);
        }
    }
}

TEST(GSMDecoder, RecordsShowUnderTheirDisplayPaths) {
    Decoder d;
    d.feed(RecordBuilder::ordinary(0x5134, 26).u16(13, 62).u16(15, 33).u16(17, 4660).build())
        .feed(RecordBuilder::ordinary(0x5137, 29).u8(15, 40).u32(16, 0x10010).build())
        .feed(RecordBuilder::ordinary(0x4116, 25).u8(13, 1).u16(14, 200).u8(16, 7).u32(17, 99).u32(21, 3).build())
        .feed(RecordBuilder::ordinary(0x4125, 14).u8(13, 3).build())
        .feed(RecordBuilder::ordinary(0x7135, 28).bytes(14, {3, 0x32, 0xF4, 0x51, 0x12, 0x34, 5}).build());
    const DictionaryRef shown = d.display();
    EXPECT_EQ(at(shown, {"1;Serving Cell", "GSM Serving Cell", "Cell ID"}), "4660");
    EXPECT_EQ(at(shown, {"1;Serving Cell", "GSM Serving Cell", "RSSI"}), "40 dBm");
    EXPECT_EQ(at(shown, {"1;Serving Cell", "Serving PLMN", "Mobile Country Code"}), "234");
    EXPECT_EQ(at(shown, {"1;Serving Cell", "UMTS RR Info", "RRC State"}), "CELL_DCH");
    EXPECT_EQ(at(shown, {"2;Radio Resources", "GSM RR Info", "Rx Quality Full"}), "65552");
    EXPECT_EQ(at(shown, {"5;Link Quality", "BLER", "Transport Channels"}),
              "[{Transport Channel ID=7, CRC Received=99, CRC Received in Error=3}]");
}

TEST(GSMDecoder, TheEmulatorsStreamFillsEveryPaneThatARecordCanFill) {
    Decoder d;
    GSMScenario scenario(3);
    std::vector<std::string> start;
    sectiontest::unfilled(Value(d.display()), "", start);
    std::set<std::string> neverFilled(start.begin(), start.end());
    for (uint64_t tick = 0; tick < 200; ++tick) {
        for (const Bytes& record : scenario.recordsForTick(tick)) d.feed(record);
        std::vector<std::string> now;
        sectiontest::unfilled(Value(d.display()), "", now);
        std::erase_if(neverFilled, [&](const std::string& p) { return std::find(now.begin(), now.end(), p) == now.end(); });
    }
    // The searcher record empties these three sets and lists its cells in the Active Set;
    // the non-ranked sets take no record.
    EXPECT_EQ(neverFilled, (std::set<std::string>{
                               "/3;Cell Sets/Detected Set (empty)", "/3;Cell Sets/Monitored Set (empty)",
                               "/3;Cell Sets/Virtual Active Set (empty)", "/3;Cell Sets/Non-Ranked UMTS Set (empty)",
                               "/3;Cell Sets/Non-Ranked GSM Set (empty)"}));
}

TEST(GSMDecoder, EveryRealCaptureDecodesAndItsBlockErrorAndPLMNRecordsShow) {
    // Every 0x4116 of sprint and offline_log_example is 00 C8 00: no transport channel,
    // window 200. cmcc's last 0x7135 carries PLMN 64 F0 00 (460-00) and LAC 0x11D6.
    struct Row {
        const char* file;
        std::vector<std::pair<std::vector<std::string>, std::string>> shown;
    };
    const Row rows[] = {
        {"sprint.mi2log",
         {{{"5;Link Quality", "BLER", "Window Size"}, "200"}, {{"5;Link Quality", "BLER", "Transport Channels"}, "[]"}}},
        {"offline_log_example.mi2log", {{{"5;Link Quality", "BLER", "Window Size"}, "200"}}},
        {"cmcc.mi2log",
         {{{"1;Serving Cell", "Serving PLMN", "Mobile Country Code"}, "460"},
          {{"1;Serving Cell", "Serving PLMN", "Location Area Code"}, "4566"}}},
        {"qmdl_example.qmdl", {{{"6;Mobility Management", "Process PS", "MM State"}, "GMM_REGISTERED"}}},
    };
    for (const Row& row : rows) {
        const RecordedStream stream = RecordedStream::open(std::string(VANTOREL_CAPTURES_DIR) + "/" + row.file,
                                                           kTSLogChannelTechnology_Morvek_GSM);
        ASSERT_TRUE(stream.ok()) << stream.error();
        Decoder d;
        for (const TimedMessage& m : stream.messages()) d.feed(m.data);
        const DictionaryRef shown = d.display();
        for (const auto& [path, text] : row.shown) EXPECT_EQ(at(shown, path), text) << row.file;
    }
}

}  // namespace
}  // namespace vantorel

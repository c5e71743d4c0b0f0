// UMTSSectionsTest: the UMTS cell-set and radio-resource sections, each fed built records and checked by what it shows.
#include "LogGenerator/MVK_GSM/ActiveSet.h"
#include "LogGenerator/MVK_GSM/DetectedSet.h"
#include "LogGenerator/MVK_GSM/GSMSet.h"
#include "LogGenerator/MVK_GSM/MonitoredSet.h"
#include "LogGenerator/MVK_GSM/ServingPLMN.h"
#include "LogGenerator/MVK_GSM/UMTSRRInfo.h"
#include "LogGenerator/MVK_GSM/UMTSSet.h"
#include "LogGenerator/MVK_GSM/VirtualActiveSet.h"
#include "LogGenerator/SectionTesting.h"

#include <gtest/gtest.h>

#include <tuple>

namespace vantorel {
namespace {

using namespace sectiontest;

const char* const kUMTS = kTSCellMonitorRadioAccessTechnologyUMTS;
const char* const kServing = kTSCellMonitorCellTypeServing;
const char* const kNeighbour = kTSCellMonitorCellTypeNeighbor;

struct SearcherCell { uint16_t scramblingCode; uint8_t setType; uint32_t energies[3]; };

// 0x417A: 13 s16 AGC, 15 count, cells of 15 bytes from 16, then measurements of 44 bytes.
Bytes searcher(int16_t agc, std::vector<SearcherCell> cells, int count = -1) {
    const size_t n = cells.size();
    RecordBuilder b = RecordBuilder::ordinary(0x417A, 16 + 59 * n);
    b.u16(13, static_cast<uint16_t>(agc)).u8(15, static_cast<uint8_t>(count < 0 ? n : count));
    for (size_t i = 0; i < n; ++i) {
        const SearcherCell& c = cells[i];
        b.u8(16 + 15 * i + 7, c.scramblingCode & 0xFF).u8(16 + 15 * i + 8, (c.scramblingCode >> 8) | c.setType << 5);
        for (size_t k = 0; k < 3; ++k) b.u32(16 + 15 * n + 44 * i + 32 + 4 * k, c.energies[k]);
    }
    return b.build();
}

TEST(SearcherSets, ActiveSetListsActiveCellsWithRSCPFromTheSharedAGC) {
    const Bytes shortRecord = RecordBuilder::ordinary(0x417A, 15).build();
    const Bytes one = searcher(0, {{1, 0, {0, 0, 0}}});
    const std::pair<std::vector<Bytes>, const char*> rows[] = {
        // The code spans byte 7 and the low bits of byte 8; set type 1 is not active.
        {{searcher(-512, {{0x1ABC, 0, {0, 52831, 417648}}, {0x1FFF, 1, {1, 1, 1}}})},
         "[{Scrambling Code=6844, RSCP=-116 dB, Energy Per Chip=-10 dB}]"},
        // (-527 + 512) / 10 truncates to -1; all-zero energies look up 0.
        {{searcher(-527, {{7, 0, {0, 0, 0}}, {8, 0, {0, 0, 417648}}})},
         "[{Scrambling Code=7, RSCP=-107 dB, Energy Per Chip=0 dB}, "
         "{Scrambling Code=8, RSCP=-108 dB, Energy Per Chip=-1 dB}]"},
        {{one, shortRecord}, "[{Scrambling Code=1, RSCP=-55 dB, Energy Per Chip=0 dB}]"},
        {{one, searcher(0, {})}, "[]"},
        // 255 announced cells in a record holding one: the measurements lie past its end.
        {{one, searcher(0, {{1, 0, {0, 0, 0}}}, 255)}, "[]"},
    };
    for (const auto& [records, expected] : rows)
        EXPECT_EQ(Bound<ActiveSet>(true).feed(records, 0x417A).shown(), expected) << expected;
}

template <class Section>
std::string afterOldRow(const Bytes& record) {
    Bound<Section> b(true);
    b.list->append(Value("old"));
    return b.feed(record, 0x417A).shown();
}

TEST(SearcherSets, DetectedMonitoredAndVirtualSetsAreEmptiedByEveryRecord) {
    const Bytes record = searcher(0, {{1, 0, {1, 1, 1}}, {2, 1, {1, 1, 1}}, {3, 2, {1, 1, 1}}});
    const Bytes shortRecord = RecordBuilder::ordinary(0x417A, 15).build();
    for (auto show : {afterOldRow<DetectedSet>, afterOldRow<MonitoredSet>, afterOldRow<VirtualActiveSet>}) {
        EXPECT_EQ(show(record), "[]");
        EXPECT_EQ(show(shortRecord), "[old]");
    }
}

// 0x4005: 13 UMTS count, 14 GSM count, both entry arrays from 15.
Bytes ranking(uint8_t umts, uint8_t gsm, size_t length = 25) {
    return RecordBuilder::ordinary(0x4005, 25)
        .u8(13, umts).u8(14, gsm).bytes(15, {0x34, 0x12, 0x78, 0x56, 0x9C, 0xFE, 0xFF, 0xF1, 0x05, 0x00})
        .resize(length).build();
}

TEST(RankingSets, UMTSAndGSMSetsDecodeTheSameBytesTheirOwnWay) {
    const std::string u = "[{Scrambling Code=22136, RSCP=-121 dB, Energy Per Chip=-7.500000 dB, "
                          "Downlink Frequency=4660, Ranking Value=5, Rank Cell RSCP=-2 dB}]";
    const std::string g = "[{ARFCN=4660, BSIC=22136, RSSI=-100 dBm, Ranking Value=-2}]";
    const std::tuple<std::vector<Bytes>, std::string, std::string> rows[] = {
        {{ranking(1, 1)}, u, g},
        {{ranking(0, 1)}, "[]", g},
        {{ranking(1, 1), ranking(0, 1)}, "[]", g},  // a count of 0 empties the list
        {{ranking(1, 1), ranking(9, 2)}, u, g},  // counts beyond the record: only whole entries
        {{ranking(1, 1), ranking(0, 0, 14)}, u, g},
        {{ranking(1, 1), ranking(1, 0, 15)}, "[]", "[]"},
    };
    for (const auto& [records, umts, gsm] : rows) {
        EXPECT_EQ(Bound<UMTSSet>(true).feed(records, 0x4005).shown(), umts);
        EXPECT_EQ(Bound<GSMSet>(true).feed(records, 0x4005).shown(), gsm);
    }
}

TEST(RankingSets, UMTSSetListsCellMonitorNeighboursAndNamesWhatIsMissing) {
    SystemLogCapture log;
    Bound<UMTSSet> b(true);
    b.feed(cellMonitor({cell(kUMTS, kNeighbour, {{kTSCellMonitorUARFCN, 10663}, {kTSCellMonitorSCN, 12},
                                                  {kTSCellMonitorRSCP, 32767}, {kTSCellMonitorECN0, -9}}),
                        cell(kUMTS, kServing, {{kTSCellMonitorSCN, 1}}),
                        cell(kTSCellMonitorRadioAccessTechnologyGSM, kNeighbour, {{kTSCellMonitorSCN, 2}}),
                        cell(kUMTS, kNeighbour, {{kTSCellMonitorSCN, 32767}, {kTSCellMonitorECN0, 32767}})}),
           0xFF0001);
    EXPECT_EQ(b.shown(), "[{UARFCN=10663, Scrambling Code=12, RSCP=, Energy Per Chip=-9 dB}, "
                         "{Scrambling Code=32767, Energy Per Chip=}]");
    EXPECT_EQ(errorLines(log), (std::vector<std::string>{"UMTSSet: Failed to retrieve UARFCN\n",
                                                          "UMTSSet: Failed to retrieve RSCP\n"}));
    log.clear();
    b.feed(RecordBuilder::extraPropertyList(1, Value(Dictionary::create())), 0xFF0001);
    EXPECT_EQ(b.shown(), "[]");
    EXPECT_EQ(errorLines(log), std::vector<std::string>{"Failed to get Cell Array\n"});
}

template <class Section>
std::vector<std::string> linesForCellMonitor(const Bytes& record, bool asList) {
    SystemLogCapture log;
    Bound<Section>(asList).feed(record, 0xFF0001);
    return errorLines(log);
}

TEST(RankingSets, UMTSSetAndServingPLMNSayAlikeWhyACellMonitorPayloadHoldsNoCells) {
    const std::string constructed = "Cell Info Array data could not be constructed";
    const std::string noArray = "Failed to get Cell Array\n";
    const std::pair<Bytes, std::vector<std::string>> rows[] = {
        {RecordBuilder::extra(1, 20).bytes(13, {'n', 'o', 't', ' ', 'a', 'n', 'y'}).build(), {constructed, noArray}},
        {RecordBuilder::extra(1, 13).build(), {constructed, noArray}},
        {RecordBuilder::extraPropertyList(1, Value(Dictionary::create())), {noArray}},
        {cellMonitor({}), {}},
    };
    for (const auto& [record, lines] : rows) {
        EXPECT_EQ(linesForCellMonitor<UMTSSet>(record, true), lines);
        EXPECT_EQ(linesForCellMonitor<ServingPLMN>(record, false), lines);
    }
    // The list is emptied all the same.
    Bound<UMTSSet> b(true);
    b.feed(cellMonitor({cell(kUMTS, kNeighbour, {{kTSCellMonitorSCN, 12}})}), 0xFF0001);
    EXPECT_EQ(b.feed(rows[0].first, 0xFF0001).shown(), "[]");
}

// 0x4031: 14 count, samples of 14 bytes from 16 with the s16 raw value at 4.
Bytes transmit(std::vector<int16_t> raws, size_t length = 0) {
    RecordBuilder b = RecordBuilder::ordinary(0x4031, 16 + 14 * raws.size());
    b.u8(14, static_cast<uint8_t>(raws.size()));
    for (size_t i = 0; i < raws.size(); ++i) b.u16(16 + 14 * i + 4, static_cast<uint16_t>(raws[i]));
    return (length ? b.resize(length) : b).build();
}

// An RR record of the given length with byte 13 set.
Bytes rr(int32_t code, size_t length, uint8_t b13 = 0) {
    return RecordBuilder::ordinary(code, length).u8(13, b13).resize(length).build();
}

TEST(UMTSRRInfoSection, RecordsShowStateIdentityCipheringAndMeanTransmitPower) {
    const std::pair<std::vector<std::pair<Bytes, int32_t>>, const char*> rows[] = {
        {{{transmit({0, -12}), 0x4031}}, "{Transmit Power=-20.00 dBm}"},
        // Each sample truncates toward zero: (-520 + 512) / 10 is 0, not -1.
        {{{transmit({-13, -12, -520}), 0x4031}}, "{Transmit Power=-37.00 dBm}"},
        {{{transmit({0}), 0x4031}}, "{Transmit Power= nan dBm}"},
        {{{rr(0x4125, 14, 5), 0x4125}, {rr(0x4157, 19, 2), 0x4157}}, "{RRC State=URA_PCH, Ciphering=Enabled}"},
        {{{rr(0x4125, 14, 6), 0x4125}, {rr(0x4157, 19), 0x4157}}, "{RRC State=Unknown, Ciphering=Disabled}"},
        {{{rr(0x4125, 13, 1), 0x4125}, {rr(0x4157, 18, 1), 0x4157}, {rr(0x4127, 28), 0x4127},
          {transmit({-12}, 15), 0x4031}},
         "{}"},
        // The record's frequencies replace the cell monitor's UARFCN.
        {{{cellMonitor({cell(kUMTS, kServing,
                             {{kTSCellMonitorCellId, 9}, {kTSCellMonitorUARFCN, 10700}, {kTSCellMonitorSCN, 3}})}),
           0xFF0001},
          {RecordBuilder::ordinary(0x4127, 29).u32(13, 9750).u32(17, 10700).u32(21, 0xFFFFFFFF).u16(25, 65535).build(),
           0x4127}},
         "{Cell ID=-1, Scrambling Code=3, Downlink Frequency=10700, Uplink Frequency=9750, URA ID=65535}"},
        // Missing numbers and a payload without cells are logged; the rest stays.
        {{{cellMonitor({cell(kUMTS, kServing, {{kTSCellMonitorSCN, 3}})}), 0xFF0001},
          {RecordBuilder::extra(1, 20).bytes(13, {'n', 'o'}).build(), 0xFF0001}},
         "{Scrambling Code=3}"},
    };
    SystemLogCapture log;
    for (const auto& [records, expected] : rows) {
        Bound<UMTSRRInfo> b;
        for (const auto& [record, code] : records) b.feed(record, code);
        EXPECT_EQ(b.shown(), expected);
    }
    EXPECT_EQ(errorLines(log), (std::vector<std::string>{"UMTSRRInfo: Failed to retrieve Cell ID\n",
                                                          "UMTSRRInfo: Failed to retrieve UARFCN\n",
                                                          "Failed to get Cell Array\n"}));
}

}  // namespace
}  // namespace vantorel

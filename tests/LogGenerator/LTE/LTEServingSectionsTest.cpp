// LTEServingSectionsTest: the LTE serving-cell and measurement sections fed built and captured records.
#include "LogGenerator/LTE/ConnectedModeMeasurementMisc.h"
#include "LogGenerator/LTE/DetectedCells.h"
#include "LogGenerator/LTE/LTEServingCellInfo.h"
#include "LogGenerator/LTE/MeasuredNeighborCells.h"
#include "LogGenerator/LTE/ServingCellMeasurement.h"
#include "LogGenerator/SectionTesting.h"
#include "TelephonyService/Replay/QmdlReader.h"

#include <gtest/gtest.h>

#include <string>

namespace vantorel {
namespace {

using namespace sectiontest;

// 0xB0C2: 14 PCI, 16 downlink / 18 uplink E-ARFCN, 20 / 21 bandwidths in resource blocks,
// 22 cell identity (signed 32), 26 TAC, 28 band; 38 bytes.
Bytes servingCell(uint8_t downRB, uint8_t upRB, size_t length = 38) {
    return RecordBuilder::ordinary(0xB0C2, 38).u16(14, 503).u16(16, 65535).u16(18, 0).u8(20, downRB).u8(21, upRB)
        .u32(22, 0xFFFFFFFF).u16(26, 34624).u32(28, 17).resize(length).build();
}

TEST(LTEServingCellInfoSection, ConfigurationBandwidthsAntennasAndShortRecords) {
    const std::pair<uint8_t, const char*> bandwidths[] = {{6, "1.4 MHz"}, {15, "3 MHz"},  {25, "5 MHz"}, {75, "15 MHz"},
                                                         {100, "20 MHz"}, {0, "Unknown"}, {255, "Unknown"}};
    for (const auto& [rb, text] : bandwidths)
        EXPECT_EQ(render(Bound<LTEServingCellInfo>().feed(servingCell(rb, 50), 0xB0C2).dict->get("Download Bandwidth")),
                  text);
    SystemLogCapture capture;
    Bound<LTEServingCellInfo> info;
    info.feed(servingCell(50, 50, 37), 0xB0C2).feed(RecordBuilder::ordinary(0xB0C1, 21).u8(20, 4).build(), 0xB0C1);
    EXPECT_EQ(info.shown(), "{}");
    info.feed(RecordBuilder::ordinary(0xB0C1, 22).u8(20, 4).build(), 0xB0C1).feed(servingCell(50, 50), 0xB179);
    EXPECT_EQ(info.shown(), "{Num Tx Antennas=4}");
    // An accepted antenna record is reported as unknown too; then the foreign code.
    EXPECT_EQ(errorLines(capture), (std::vector<std::string>{"Received an unknown log message: 45249",
                                                              "Received an unknown log message: 45433"}));
}

TEST(LTEServingCellInfoSection, TheFirstServingLTECellWinsAndTheNextConfigurationRecordDropsItsUARFCN) {
    const char *const lte = kTSCellMonitorRadioAccessTechnologyLTE, *const serving = kTSCellMonitorCellTypeServing;
    auto full = [](const char* rat, const char* type, int tac) {
        return cell(rat, type, {{kTSCellMonitorTAC, tac}, {kTSCellMonitorCellId, 2}, {kTSCellMonitorPID, 3},
                                {kTSCellMonitorBandInfo, 7}, {kTSCellMonitorUARFCN, 1300}});
    };
    SystemLogCapture capture;
    Bound<LTEServingCellInfo> info;
    const char *const umts = kTSCellMonitorRadioAccessTechnologyUMTS, *const neighbour = kTSCellMonitorCellTypeNeighbor;
    info.feed(cellMonitor({full(lte, nullptr, 9), full(nullptr, serving, 9), full(lte, neighbour, 9),
                           full(umts, serving, 9), full(lte, serving, 1), full(lte, serving, 2)}), 0xFF0001);
    EXPECT_EQ(info.shown(),
              "{Tracking Area Code=1, Cell Identity=2, Physical Cell ID=3, Freq Band Indicator=7, UARFCN=1300}");
    const std::string configured =
        "{Tracking Area Code=34624, Cell Identity=-1, Physical Cell ID=503, Freq Band Indicator=17, "
        "Download Frequency=65535, Upload Frequency=0, Download Bandwidth=10 MHz, Upload Bandwidth=Unknown";
    EXPECT_EQ(info.feed(servingCell(50, 7), 0xB0C2).shown(), configured + "}");
    // A serving cell lacking values keeps the earlier ones; no cells, no array or no property
    // list change nothing, the last two saying there is no array.
    info.feed(cellMonitor({cell(lte, serving, {{kTSCellMonitorUARFCN, 8}}), full(lte, serving, 3)}), 0xFF0001)
        .feed(cellMonitor({}), 0xFF0001)
        .feed(RecordBuilder::extraPropertyList(1, cell(lte, serving, {{kTSCellMonitorPID, 9}})), 0xFF0001)
        .feed(RecordBuilder::extra(1, 20).bytes(13, {'n', 'o', 't'}).build(), 0xFF0001);
    EXPECT_EQ(info.shown(), configured + ", UARFCN=8}");
    const std::string failed = "Serving Cell Info: Failed to retrieve ";
    const std::vector<std::string> expected = {
        failed + "TAC\n", failed + "Cell ID\n", failed + "Physical Cell ID\n", failed + "Freq Band Indicator\n",
        "Failed to get Cell Array\n", "Failed to get Cell Array\n"};
    EXPECT_EQ(errorLines(capture), expected);
}

// 0xB179: 17 E-ARFCN, 19 serving PCI, 21 subframe, 23 RSRP, 25 RSRQ, 27 n, 28 d; n 6-byte
// neighbour entries (PCI, RSRP, RSRQ) from 29, then d 2-byte detected-cell PCIs.
Bytes intraFreq(uint8_t n, uint8_t d, std::initializer_list<uint16_t> entries, size_t length) {
    RecordBuilder b = RecordBuilder::ordinary(0xB179, length).u16(17, 1300).u16(19, 101).u16(21, 9).u16(25, 160);
    size_t offset = 29;
    for (uint16_t v : entries) b.u16(std::exchange(offset, offset + 2), v);
    return b.u8(27, n).u8(28, d).resize(length).build();
}

TEST(LTEIntraFrequencySections, OneRecordFeedsAllThreeAndEntriesStopAtTheRecordsEnd) {
    const Bytes two = intraFreq(2, 1, {11, 0, 0, 12, 560, 65535, 13}, 43);
    const char* const twoNeighbours = "[{Physical Cell ID=11, Filtered RSRP=-140.00 dBm, Filtered RSRQ=-20.00 dB}, "
                                      "{Physical Cell ID=12, Filtered RSRP=0.00 dBm, Filtered RSRQ=8171.88 dB}]";
    struct Row { std::vector<Bytes> records; const char *neighbours, *detected; };
    const Row rows[] = {
        {{two}, twoNeighbours, "[{Physical Cell ID=13}]"},
        {{two, intraFreq(0, 2, {21, 22}, 33)}, "[]", "[{Physical Cell ID=21}, {Physical Cell ID=22}]"},
        {{intraFreq(3, 1, {31, 65535, 160, 32}, 37)},  // 3 claimed, 1 fits; no detected cell after 3 entries
         "[{Physical Cell ID=31, Filtered RSRP=16243.75 dBm, Filtered RSRQ=0.00 dB}]", "[]"},
        {{intraFreq(1, 5, {41, 0, 0, 42, 43}, 40)},  // 5 claimed, 2 fit
         "[{Physical Cell ID=41, Filtered RSRP=-140.00 dBm, Filtered RSRQ=-20.00 dB}]",
         "[{Physical Cell ID=42}, {Physical Cell ID=43}]"},
        {{two, intraFreq(0, 0, {51, 52, 53}, 35)}, "[]", "[]"},
        {{intraFreq(0, 0, {}, 29)}, "[]", "[]"},  // the shortest record taken
        {{two, RecordBuilder::ordinary(0xB179, 28).u16(19, 999).build()}, twoNeighbours, "[{Physical Cell ID=13}]"},
    };
    for (const Row& row : rows) {
        EXPECT_EQ(Bound<ConnectedModeMeasurementMisc>().feed(row.records, 0xB179).shown(),
                  "{E-ARFCN=1300, Serving Physical Cell ID=101, Subframe Number=9, "
                  "Serving Filtered RSRP=-140.00 dBm, Serving Filtered RSRQ=0.00 dB}");
        EXPECT_EQ(Bound<MeasuredNeighborCells>(true).feed(row.records, 0xB179).shown(), row.neighbours);
        EXPECT_EQ(Bound<DetectedCells>(true).feed(row.records, 0xB179).shown(), row.detected);
    }
}

// Version 4 (byte 13 = 4): E-ARFCN u32 21, PCI 25, subframe 27, RSRP bits 0-11 of u32 29 (x/16 - 180),
// RSRQ bits 0-9 of u32 33 (x/16 - 30), n 37, d 38; 12-byte neighbours (PCI, RSRP u32 2, RSRQ u32 6)
// from 41, then 16-byte detected cells. The real row is the 4th of the 11 0xB179 records of
// offline_log_example, from offset 13: 04 | 00 x7 | 94 16 00 00 | 95 01 | FF 16 | 46 05 46 05 |
// 2A 01 2A 01 | 02 | 01 | 00 00 | 9A 00 30 04 30 04 46 00 46 00 00 00 | EE 01 03 04 03 04 00 x6 |
// EE 01 ...: E-ARFCN 0x1694 = 5780, PCI 0x195 = 405, subframe 0x16FF = 5887, RSRP 0x546 = 1350 ->
// 84.375 - 180 = -95.625, RSRQ 0x12A = 298 -> 18.625 - 30 = -11.375; neighbour 0x9A = 154: 0x430 =
// 1072 -> -113, 0x46 = 70 -> -25.625; neighbour 0x1EE = 494: 0x403 = 1027 -> -115.8125, 0 -> -30;
// detected 494.
TEST(LTEIntraFrequencySections, Version4RecordsFromACaptureAndBuilt) {
    const RecordedLog log = QmdlReader::readFile(std::string(VANTOREL_CAPTURES_DIR) + "/offline_log_example.mi2log");
    ASSERT_TRUE(log.ok()) << log.error;
    std::vector<Bytes> real;
    for (const RecordedEntry& e : log.entries)
        if (e.logCode == 0xB179) real.push_back(e.record);
    ASSERT_EQ(real.size(), 11u);
    // Built: E-ARFCN 66486, RSRP 0x700 -> -68 and RSRQ 0x1A0 -> -4 under set upper bits; neighbours
    // 0x640 -> -80 / 0xF0 -> -15 and 0x500 -> -100 / 0xA0 -> -20; three detected claimed, one fits.
    auto built = [](size_t length) {
        return RecordBuilder::ordinary(0xB179, 81).u8(13, 4).u32(21, 66486).u16(25, 503).u16(27, 10239)
            .u32(29, 0xABCF700).u32(33, 0xFFFFFDA0).u8(37, 2).u8(38, 3).u16(41, 7).u32(43, 0x640).u32(47, 0xF0)
            .u16(53, 8).u32(55, 0x500).u32(59, 0xA0).u16(65, 9).resize(length).build();
    };
    const char* const builtServing = "{E-ARFCN=66486, Serving Physical Cell ID=503, Subframe Number=10239, "
                                     "Serving Filtered RSRP=-68.00 dBm, Serving Filtered RSRQ=-4.00 dB}";
    const char* const seven = "{Physical Cell ID=7, Filtered RSRP=-80.00 dBm, Filtered RSRQ=-15.00 dB}";
    struct Row { Bytes record; std::string serving, neighbours, detected; };
    const Row rows[] = {
        {real[3], "{E-ARFCN=5780, Serving Physical Cell ID=405, Subframe Number=5887, "
                  "Serving Filtered RSRP=-95.62 dBm, Serving Filtered RSRQ=-11.38 dB}",
         "[{Physical Cell ID=154, Filtered RSRP=-113.00 dBm, Filtered RSRQ=-25.62 dB}, "
         "{Physical Cell ID=494, Filtered RSRP=-115.81 dBm, Filtered RSRQ=-30.00 dB}]", "[{Physical Cell ID=494}]"},
        {built(81), builtServing,
         std::string("[") + seven + ", {Physical Cell ID=8, Filtered RSRP=-100.00 dBm, Filtered RSRQ=-20.00 dB}]",
         "[{Physical Cell ID=9}]"},
        {built(64), builtServing, std::string("[") + seven + "]", "[]"},  // the second neighbour is cut off
        {built(40), "{}", "[]", "[]"},                                    // shorter than the first entry's offset
    };
    for (const Row& row : rows) {
        EXPECT_EQ(Bound<ConnectedModeMeasurementMisc>().feed(row.record, 0xB179).shown(), row.serving);
        EXPECT_EQ(Bound<MeasuredNeighborCells>(true).feed(row.record, 0xB179).shown(), row.neighbours);
        EXPECT_EQ(Bound<DetectedCells>(true).feed(row.record, 0xB179).shown(), row.detected);
    }
}

// One little-endian word from (value, first bit) pairs.
uint32_t word(std::initializer_list<std::pair<uint32_t, unsigned>> fields) {
    uint32_t w = 0;
    for (auto [value, bit] : fields) w |= value << bit;
    return w;
}

// Versions 4 and 5: PCI 300 and priority 7, then RSRP 1600 / average 1604 (-80, -79.75 dBm), RSRQ
// 200 / average 184 (-17.5, -18.5 dB) and RSSI 800 (-60 dBm) in 1/16 dB, with every other bit set.
Bytes sixteenths(uint8_t version, size_t length) {
    const size_t v5 = version == 5 ? 4 : 0;  // the u32 E-ARFCN moves PCI 2 bytes on, the rest 4
    RecordBuilder b = RecordBuilder::ordinary(0xB17F, length).u8(13, version);
    (v5 ? b.u32(17, 66486) : b.u16(17, 6300)).u16(19 + v5 / 2, 300 | 7 << 9)
        .u32(21 + v5, 0xFFFFF000 | 1600).u32(25 + v5, 0xFFFFF000 | 1604)
        .u32(29 + v5, word({{200, 0}, {0x3FF, 10}, {184, 20}, {3, 30}}))
        .u32(33 + v5, word({{0x3FF, 0}, {800, 10}, {0x7FF, 21}}));
    return b.resize(length).build();
}

// The only 0xB17F of offline_log_example.mi2log (version 5), from offset 13: 05 01 00 00 |
// 94 16 00 00 | 95 01 | 00 00 | 37 75 53 00 | 37 75 53 00 | 27 9D 74 12 | 27 81 0A 00 | ...: E-ARFCN
// 0x1694 = 5780, 0x195 = PCI 405 and priority 0, RSRP and average 0x537 = 1335: 1335/16 - 180 =
// -96.5625 dBm, RSRQ 0x127 = 295 (bits 0-9 and 20-29 of 0x12749D27): 295/16 - 30 = -11.5625 dB,
// RSSI bits 10-20 of 0x000A8127 = 0x2A0 = 672: 672/16 - 110 = -68 dBm (RSRP + 10 log 600 REs).
TEST(LTEServingCellMeasurementSection, EachLayoutsBitFieldsTheirConversionAndTheNotPresentMarkers) {
    const RecordedLog log = QmdlReader::readFile(std::string(VANTOREL_CAPTURES_DIR) + "/offline_log_example.mi2log");
    ASSERT_TRUE(log.ok()) << log.error;
    Bytes captured;
    for (const RecordedEntry& e : log.entries)
        if (e.logCode == 0xB17F) captured = e.record;
    const char* const built = ", Physical Cell ID=300, Serving Layer Priority=7, Measured RSRP=-80.00 dBm, "
                              "Average RSRP=-79.75 dBm, Measured RSRQ=-17.50 dB, Average RSRQ=-18.50 dB, "
                              "Measured RSSI=-60.00 dBm}";
    const std::pair<Bytes, std::string> rows[] = {
        {captured, "{Version=5, E-ARFCN=5780, Physical Cell ID=405, Serving Layer Priority=0, "
                   "Measured RSRP=-96.56 dBm, Average RSRP=-96.56 dBm, Measured RSRQ=-11.56 dB, "
                   "Average RSRQ=-11.56 dB, Measured RSSI=-68.00 dBm}"},
        {sixteenths(4, 37), std::string("{Version=4, E-ARFCN=6300") + built},
        {sixteenths(5, 41), std::string("{Version=5, E-ARFCN=66486") + built},
        {sixteenths(4, 36), "{}"},
        {sixteenths(5, 40), "{}"},
        {RecordBuilder::ordinary(0xB17F, 33).u8(13, 1).u16(17, 6300)
             .u32(19, word({{300, 0}, {9, 9}}))
             .u32(21, word({{400, 0}, {401, 9}, {100, 18}, {101, 25}}))
             .u32(25, word({{300, 0}, {33, 9}, {23, 15}, {63, 22}, {0xF, 28}}))
             .u32(29, word({{127, 0}, {45, 7}, {31, 13}, {32, 19}, {1, 25}, {11, 26}, {3, 30}})).build(),
         "{Version=1, E-ARFCN=6300, Physical Cell ID=300, Serving Layer Priority=9, Measured RSRP=-40.00 dBm, "
         "Average RSRP=-39.75 dBm, Measured RSRQ=-5.00 dB, Average RSRQ=-4.75 dB, Measured RSSI=10.00 dBm, "
         "Qrxlevmin=-74 dBm, P_Max=-7 dBm, Max UE Tx Power=33 dBm, Srxlev=97 dBm, "
         "Num of Consecutive DRX Cycles of S < 0=45, S Intra Search=62 dB, S Non Intra Search=Not Present, "
         "Measurement Rules Updated=True, Measurement Rules=11}"},
        {RecordBuilder::ordinary(0xB17F, 40).u32(25, word({{64, 15}})).u32(29, word({{32, 13}, {5, 19}})).build(),
         "{Version=0, E-ARFCN=0, Physical Cell ID=0, Serving Layer Priority=0, Measured RSRP=-140.00 dBm, "
         "Average RSRP=-140.00 dBm, Measured RSRQ=-30.00 dB, Average RSRQ=-30.00 dB, Measured RSSI=-140.00 dBm, "
         "Qrxlevmin=-140 dBm, P_Max=Not Present, Max UE Tx Power=-30 dBm, Srxlev=-30 dBm, "
         "Num of Consecutive DRX Cycles of S < 0=0, S Intra Search=Not Present, S Non Intra Search=10 dBm, "
         "Measurement Rules Updated=False, Measurement Rules=0}"},
        {RecordBuilder::ordinary(0xB17F, 32).u8(13, 1).build(), "{}"},
    };
    for (const auto& [record, expected] : rows)
        EXPECT_EQ(Bound<ServingCellMeasurement>().feed(record, 0xB17F).shown(), expected);
}

// The last serving-cell records of three real captures, from offset 13:
// - qmdl_example (twelve 0xB0C2 of version 2, the original layout, all alike):
//   02 | 57 00 | 94 16 | E4 5C | 32 | 32 | 0F 0B 6D 08 | 40 87 | 11 00 00 00: PCI 0x57 = 87, E-ARFCN
//   0x1694 = 5780 down and 0x5CE4 = 23780 up (band 17's pair), 0x32 = 50 resource blocks = 10 MHz
//   each way, cell 0x086D0B0F = 141363983, TAC 0x8740 = 34624, band 0x11 = 17; its two 0xB0C1
//   (version 1) hold 02 at offset 20: two transmit antennas.
// - cmcc (the 62nd and last 0xB0C2, version 3): 03 | 51 01 | 0C 94 00 00 | 0C 94 00 00 | 64 | 64 |
//   03 B9 11 01 | D6 11 | 26 00 00 00 | CC 01 02 00 00: PCI 337, E-ARFCN 0x940C = 37900 both ways
//   (band 38 is TDD), 100 resource blocks = 20 MHz, cell 0x0111B903 = 17938691, TAC 0x11D6 = 4566,
//   band 0x26 = 38 (MCC 460, MNC 00); the last 0xB0C1 (version 2): 02 | 51 01 | 0C 94 00 00 | 00 02 |
//   02 | 64: SFN 512, two antennas.
// - sprint (the 840th and last 0xB0C2, version 3): 03 | 18 00 | D9 21 00 00 | 29 68 00 00 | 19 | 19 |
//   01 75 C1 0B | 0A 5E | 19 00 00 00 | ...: PCI 24, E-ARFCN 0x21D9 = 8665 / 0x6829 = 26665, 25
//   resource blocks = 5 MHz, cell 0x0BC17501 = 197227777, TAC 0x5E0A = 24074, band 25.
TEST(LTEServingCellInfoSection, TheCapturedServingCellRecordsOfEachLayoutShowTheServingCell) {
    const std::pair<const char*, const char*> rows[] = {
        {"qmdl_example.qmdl", "{Physical Cell ID=87, Download Frequency=5780, Upload Frequency=23780, "
                              "Download Bandwidth=10 MHz, Upload Bandwidth=10 MHz, Cell Identity=141363983, "
                              "Tracking Area Code=34624, Freq Band Indicator=17, Num Tx Antennas=2}"},
        {"cmcc.mi2log", "{Num Tx Antennas=2, Physical Cell ID=337, Download Frequency=37900, Upload Frequency=37900, "
                        "Download Bandwidth=20 MHz, Upload Bandwidth=20 MHz, Cell Identity=17938691, "
                        "Tracking Area Code=4566, Freq Band Indicator=38}"},
        {"sprint.mi2log", "{Physical Cell ID=24, Download Frequency=8665, Upload Frequency=26665, "
                          "Download Bandwidth=5 MHz, Upload Bandwidth=5 MHz, Cell Identity=197227777, "
                          "Tracking Area Code=24074, Freq Band Indicator=25, Num Tx Antennas=2}"},
    };
    for (const auto& [file, expected] : rows) {
        const RecordedLog log = QmdlReader::readFile(std::string(VANTOREL_CAPTURES_DIR) + "/" + file);
        ASSERT_TRUE(log.ok()) << log.error;
        Bound<LTEServingCellInfo> info;
        for (const RecordedEntry& e : log.entries)
            if (e.logCode == 0xB0C2 || e.logCode == 0xB0C1) info.feed(e.record, e.logCode);
        EXPECT_EQ(info.shown(), expected) << file;
    }
    // A version-3 payload published with a peer tool: E-ARFCN 1825/19825, band 3, 15 MHz, PCI 77,
    // TAC 0x9B15 = 39701, cell 0x09B0C833 = 162580531; one byte short of its 42, it is ignored.
    const Bytes v3 = RecordBuilder::ordinary(0xB0C2, 42)
                         .bytes(13, {0x03, 0x4d, 0x00, 0x21, 0x07, 0x00, 0x00, 0x71, 0x4d, 0x00, 0x00, 0x4b, 0x4b, 0x33,
                                     0xc8, 0xb0, 0x09, 0x15, 0x9b, 0x03, 0x00, 0x00, 0x00, 0xcc, 0x01, 0x02, 0x0b, 0x00, 0x00})
                         .build();
    EXPECT_EQ(Bound<LTEServingCellInfo>().feed(Bytes(v3.begin(), v3.end() - 1), 0xB0C2).shown(), "{}");
    EXPECT_EQ(Bound<LTEServingCellInfo>().feed(v3, 0xB0C2).shown(),
              "{Physical Cell ID=77, Download Frequency=1825, Upload Frequency=19825, Download Bandwidth=15 MHz, "
              "Upload Bandwidth=15 MHz, Cell Identity=162580531, Tracking Area Code=39701, Freq Band Indicator=3}");
}

}  // namespace
}  // namespace vantorel

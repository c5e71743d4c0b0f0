// LTENeighbourSectionsTest: the idle-mode neighbour (0xB180) and reselection (0xB186) sections fed built records.
#include "LogGenerator/LTE/NeighborCellsList.h"
#include "LogGenerator/LTE/NeighborMeasurementMisc.h"
#include "LogGenerator/LTE/ReselectionCandidatesList.h"
#include "LogGenerator/LTE/ReselectionCandidatesMisc.h"
#include "LogGenerator/SectionTesting.h"

#include <gtest/gtest.h>

namespace vantorel {
namespace {

using namespace sectiontest;

// 0xB180: u16 at 19 = Qrxlevmin 63 (bits 0-5), count - 1 (bits 6-10), noise in bits 11-15;
// 20-byte neighbours from 21, each with noise in the never-read bytes 16-19.
struct Neighbour { uint32_t pci, rssi, rsrp, avgRsrp, rsrq, avgRsrq, srxlev, freqOffset, frame, sample; };
Bytes neighbourRecord(unsigned countField, std::vector<Neighbour> cells, size_t length) {
    RecordBuilder b =
        RecordBuilder::ordinary(0xB180, length).u8(13, 1).u16(17, 5230).u16(19, (countField << 6) | 0xF83F);
    for (size_t i = 0, at = 21; i < cells.size(); ++i, at += 20) {
        const Neighbour& n = cells[i];
        b.u32(at, n.pci | n.rssi << 9 | n.rsrp << 17)
            .u32(at + 4, n.avgRsrp | n.rsrq << 9 | n.avgRsrq << 16 | n.srxlev << 23)
            .u16(at + 8, n.freqOffset).u32(at + 12, n.frame | n.sample << 11).u32(at + 16, 0xA5A5A5A5);
    }
    return b.resize(length).build();
}
const Neighbour kA{503, 0, 511, 280, 0, 127, 30, 65535, 2047, 524287}, kB{1, 255, 0, 0, 127, 0, 127, 0, 0, 1};
const char* const kAShown =
    "{Physical Cell ID=503, Measured RSSI=-140.00 dBm, Measured RSRP=115.50 dBm, Average RSRP=0.00 dBm, "
    "Measured RSRQ=-30.00 dB, Average RSRQ=1.75 dB, Srxlev=0 dBm, Frequency Offset=65535, Ant 0 Frame Offset=2047, "
    "Ant 0 Sample Offset=524287, Ant 1 Frame Offset=2047, Ant 1 Sample Offset=524287}";
const char* const kBShown =
    "{Physical Cell ID=1, Measured RSSI=-12.50 dBm, Measured RSRP=-140.00 dBm, Average RSRP=-140.00 dBm, "
    "Measured RSRQ=1.75 dB, Average RSRQ=-30.00 dB, Srxlev=97 dBm, Frequency Offset=0, Ant 0 Frame Offset=0, "
    "Ant 0 Sample Offset=1, Ant 1 Frame Offset=0, Ant 1 Sample Offset=1}";

TEST(LTENeighbourSections, CountIsTheFieldPlusOneEntriesStopAtTheRecordsEndAndShortRecordsChangeNothing) {
    const Bytes both = neighbourRecord(1, {kA, kB}, 61);
    const std::string bothShown = std::string("[") + kAShown + ", " + kBShown + "]";
    const std::pair<std::vector<Bytes>, std::string> rows[] = {
        {{both}, bothShown},
        {{neighbourRecord(0, {kA, kB}, 61)}, std::string("[") + kAShown + "]"},
        {{neighbourRecord(2, {kA, kB}, 80)}, bothShown},
        {{both, neighbourRecord(0, {}, 20)}, bothShown},
        {{both, neighbourRecord(0, {}, 40)}, "[]"},
    };
    for (const auto& [records, expected] : rows)
        EXPECT_EQ(Bound<NeighborCellsList>(true).feed(records, 0xB180).shown(), expected);

    const std::pair<Bytes, const char*> misc[] = {
        {both, "{Version=1, E-ARFCN=5230, Qrxlevmin=-14 dBm}"},
        {RecordBuilder::ordinary(0xB180, 21).u8(19, 0xC0).build(), "{Version=0, E-ARFCN=0, Qrxlevmin=-140 dBm}"},
        {RecordBuilder::ordinary(0xB180, 20).u8(13, 1).build(), "{}"},
    };
    for (const auto& [record, expected] : misc)
        EXPECT_EQ(Bound<NeighborMeasurementMisc>().feed(record, 0xB180).shown(), expected);
}

// Versions 4 and 5: Qrxlevmin 22 (-96 dBm) and the count as it is, then 32-byte cells in 1/16 dB
// from 21 (version 4, E-ARFCN u16 17) or 25 (version 5, E-ARFCN u32 17, count in the u32 at 21).
// Cell A: PCI 503, RSSI 800 (-60 dBm), RSRP 1600 / average 1604 (-80, -79.75 dBm), RSRQ 200 /
// average 184 (-17.5, -18.5 dB), Srxlev 40 (10), every unread bit set; cell B: PCI 1, Srxlev 63.
Bytes sixteenthNeighbours(uint8_t version, unsigned count, size_t length) {
    const size_t v5 = version == 5 ? 4 : 0;
    RecordBuilder b = RecordBuilder::ordinary(0xB180, length).u8(13, version);
    (v5 ? b.u32(17, 66486).u32(21, count << 6 | 22) : b.u16(17, 1300).u16(19, count << 6 | 22))
        .u32(21 + v5, 503 | 800 << 9 | 1600u << 20).u32(25 + v5, 0xFF000FFF | 1604 << 12)
        .u32(29 + v5, 0xFFC00FFF | 200 << 12).u32(33 + v5, 0xFC0FFC00 | 184 | 40 << 20)
        .u32(53 + v5, 1).u32(65 + v5, 63 << 20);
    return b.resize(length).build();
}

TEST(LTENeighbourSections, VersionsFourAndFiveCountCellsAsTheyAreInSixteenthsOfADecibel) {
    const std::string a = "{Physical Cell ID=503, Measured RSSI=-60.00 dBm, Measured RSRP=-80.00 dBm, "
                          "Average RSRP=-79.75 dBm, Measured RSRQ=-17.50 dB, Average RSRQ=-18.50 dB, Srxlev=10 dBm}";
    const std::string ab = "[" + a + ", {Physical Cell ID=1, Measured RSSI=-110.00 dBm, Measured RSRP=-180.00 dBm, "
                           "Average RSRP=-180.00 dBm, Measured RSRQ=-30.00 dB, Average RSRQ=-30.00 dB, Srxlev=33 dBm}]";
    const Bytes v5 = sixteenthNeighbours(5, 2, 89);
    struct Row { std::vector<Bytes> records; std::string list, misc; };
    const Row rows[] = {
        {{sixteenthNeighbours(4, 2, 85)}, ab, "{Version=4, E-ARFCN=1300, Qrxlevmin=-96 dBm}"},
        {{v5}, ab, "{Version=5, E-ARFCN=66486, Qrxlevmin=-96 dBm}"},
        {{sixteenthNeighbours(5, 1, 89)}, "[" + a + "]", "{Version=5, E-ARFCN=66486, Qrxlevmin=-96 dBm}"},
        {{sixteenthNeighbours(4, 1023, 84)}, "[" + a + "]", "{Version=4, E-ARFCN=1300, Qrxlevmin=-96 dBm}"},
        {{v5, sixteenthNeighbours(5, 0, 89)}, "[]", "{Version=5, E-ARFCN=66486, Qrxlevmin=-96 dBm}"},
        {{v5, sixteenthNeighbours(5, 2, 24)}, ab, "{Version=5, E-ARFCN=66486, Qrxlevmin=-96 dBm}"},
        {{sixteenthNeighbours(5, 2, 24)}, "[]", "{}"},
    };
    for (const Row& row : rows) {
        EXPECT_EQ(Bound<NeighborCellsList>(true).feed(row.records, 0xB180).shown(), row.list);
        EXPECT_EQ(Bound<NeighborMeasurementMisc>().feed(row.records, 0xB180).shown(), row.misc);
    }
}

// 0xB186: version 3, serving E-ARFCN 1300, cell 65535, the count at 19, then 16-bit words
// from 21; candidates start every 4 bytes, so one's technology part is the next one's head.
Bytes candidates(uint16_t count, std::vector<uint16_t> words, size_t length = 0) {
    RecordBuilder b = RecordBuilder::ordinary(0xB186, 21).u8(13, 3).u16(15, 1300).u16(17, 65535).u16(19, count);
    for (size_t i = 0; i < words.size(); ++i) b.u16(21 + 2 * i, words[i]);
    return (length ? b.resize(length) : b).build();
}

TEST(LTENeighbourSections, EveryDecibelValueIsLoggedUnderTheRSSILabelAndOtherCodesAreUnknown) {
    SystemLogCapture capture;
    Bound<NeighborCellsList> list(true);
    list.feed(neighbourRecord(0, {kA}, 41), 0xB180);
    std::string dbLines;
    for (const auto& line : capture.lines())
        if (line.text.rfind("Measured RSSI: ", 0) == 0) dbLines += line.text;
    EXPECT_EQ(dbLines,
              "Measured RSSI: -140.000000\nMeasured RSSI: 115.500000\nMeasured RSSI: 0.000000\n"
              "Measured RSSI: -30.000000\nMeasured RSSI: 1.750000\n");
    EXPECT_TRUE(capture.contains(SystemLog::kWarning, "Number of neighboring cells being reported: 1\n"));
    EXPECT_TRUE(capture.contains(SystemLog::kWarning, "Physical Cell ID: 503\n"));
    capture.clear();
    EXPECT_EQ(list.feed(neighbourRecord(1, {kB, kB}, 61), 0xB186).shown(), std::string("[") + kAShown + "]");
    EXPECT_EQ(Bound<ReselectionCandidatesMisc>().feed(candidates(1, {1, 0}), 0xB180).shown(), "{}");
    EXPECT_EQ(errorLines(capture), (std::vector<std::string>{"Received an unknown log message: 45446",
                                                             "Received an unknown log message: 45440"}));
}

TEST(LTEReselectionSections, CandidatesOfEachTechnologyAtA4ByteStrideBoundedByTheRecordsEnd) {
    const Bytes utran = candidates(2, {7, 1, 10700, 300});
    const char* const utranShown =
        "[{Candidate Priority=7, Candidate RAT Type=UTRAN, U ARFCN=10700, PSC=300}, "
        "{Candidate Priority=10700, Candidate RAT Type=??}]";
    const std::pair<std::vector<Bytes>, const char*> rows[] = {
        {{utran}, utranShown},
        {{candidates(0x101, {1, 0, 65535, 0xFBFF})},
         "[{Candidate Priority=1, Candidate RAT Type=LTE, E ARFCN=65535, Cell ID=503}]"},
        {{candidates(1, {2, 2, 871, 0x3F05})},
         "[{Candidate Priority=2, Candidate RAT Type=GERAN, ARFCN=871, Band=5, BSIC ID=63}]"},
        {{candidates(1, {0, 3, 0x0207, 9, 283, 511})},
         "[{Candidate Priority=0, Candidate RAT Type=CDMA1XRTT, Band=7, Channel=283, Pilot=511}]"},
        // The second candidate (an LTE one read from the first's part) fits, the third would not.
        {{candidates(9, {0, 4, 1, 0, 1, 2})},
         "[{Candidate Priority=0, Candidate RAT Type=CDMAHRPD, Band=1, Channel=1, Pilot=2}, "
         "{Candidate Priority=1, Candidate RAT Type=LTE, E ARFCN=1, Cell ID=0}]"},
        {{candidates(2, {0, 4, 1, 0, 1, 2}, 32)}, "[]"},  // its CDMA part runs one byte past the end
        {{candidates(3, {9, 5, 8, 7})},
         "[{Candidate Priority=9, Candidate RAT Type=??}, {Candidate Priority=8, Candidate RAT Type=??}]"},
        {{utran, candidates(0x100, {1, 0, 0, 0, 0, 0})}, "[]"},  // 256: the low 8 bits are 0
        {{utran, candidates(1, {}, 20)}, utranShown},
    };
    for (const auto& [records, expected] : rows)
        EXPECT_EQ(Bound<ReselectionCandidatesList>(true).feed(records, 0xB186).shown(), expected);
    EXPECT_EQ(Bound<ReselectionCandidatesMisc>().feed({utran, candidates(0, {}, 20)}, 0xB186).shown(),
              "{Version=3, Serving EARFCN=1300, Serving Cell ID=65535}");
}

}  // namespace
}  // namespace vantorel

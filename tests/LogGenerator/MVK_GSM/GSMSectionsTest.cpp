// GSMSectionsTest: the GSM cell, radio-resource, mobile-allocation, BLER and HSDPA sections, fed built records and checked by what they show.
#include "LogGenerator/MVK_GSM/BLER.h"
#include "LogGenerator/MVK_GSM/GPRSInformation.h"
#include "LogGenerator/MVK_GSM/GSMRRInfo.h"
#include "LogGenerator/MVK_GSM/GSMServingCell.h"
#include "LogGenerator/MVK_GSM/HSDPAInformation.h"
#include "LogGenerator/MVK_GSM/MobileAllocation.h"
#include "LogGenerator/MVK_GSM/NeighboringCells.h"
#include "LogGenerator/SectionTesting.h"

#include <gtest/gtest.h>

namespace vantorel {
namespace {

using namespace sectiontest;

// An ordinary record of `length` bytes with `bytes` written from `offset`.
Bytes rec(int32_t code, size_t length, size_t offset = 13, std::initializer_list<uint8_t> bytes = {}) {
    return RecordBuilder::ordinary(code, length).bytes(offset, bytes).resize(length).build();
}

template <class Section>
std::string show(const std::vector<Bytes>& records, int32_t code) {
    return Bound<Section>().feed(records, code).shown();
}
using Show = std::string (*)(const std::vector<Bytes>&, int32_t);
const Show kServing = show<GSMServingCell>, kRR = show<GSMRRInfo>, kGPRS = show<GPRSInformation>;
const Show kMA = show<MobileAllocation>, kBLER = show<BLER>, kHSDPA = show<HSDPAInformation>;

// 0x5137: 15 level, 16..19 and 20..23 u32 words, 26 hysteresis.
const Bytes kMeasurement =
    RecordBuilder::ordinary(0x5137, 29).bytes(15, {40, 0x10, 0, 1, 0, 5, 0, 2, 0}).u8(26, 1).build();

TEST(GSMSections, RecordsShowTheirFields) {
    // A zeroed record too short to be read must leave the first one's values as they are.
    const auto andShort = [](const Bytes& full, size_t length) { return std::vector<Bytes>{full, Bytes(length)}; };
    struct Row {
        Show show;
        int32_t code;
        std::vector<Bytes> records;
        const char* expected;
    };
    const Row rows[] = {
        {kServing, 0x5137, {kMeasurement}, "{RSSI=40 dBm, C1 Value=16, C2 Value=5}"},
        {kRR, 0x5137, {kMeasurement}, "{Serving Rx Level=40, Rx Quality Full=65552, Rx Quality Sub=131077}"},
        {kGPRS, 0x5137, {kMeasurement}, "{Cell Reselect Hysteresis=Applied}"},
        {kServing, 0x5134, {rec(0x5134, 26, 13, {0x2C, 1, 5, 0, 0x34, 0x12})}, "{Cell ID=4660, ARFCN=300, BSIC=5}"},
        {kServing, 0x5076, andShort(rec(0x5076, 17, 13, {0x2C, 1}), 16), "{MA Dedicated ARFCN=44}"},
        {kGPRS, 0x51F6, {rec(0x51F6, 24, 15, {9, 4, 1})}, "{T3192=?? ms, Access Burst Type=11-bit format, DRX Timer Max=4}"},
        {kGPRS, 0x51F6, {rec(0x51F6, 24, 15, {3, 0, 0})}, "{T3192=0 ms, Access Burst Type=8-bit format, DRX Timer Max=0}"},
        {kGPRS, 0x51F5, {rec(0x51F5, 18, 13, {255, 255, 255})},
         "{Network Control Order=Not Available, PFC Supported=Available, Priority Access Threshold=Not Available}"},
        {kGPRS, 0x51F5, {rec(0x51F5, 18, 13, {2, 8, 3})},
         "{Network Control Order=Unknown, PFC Supported=Unknown, Priority Access Threshold=Unknown}"},
        {kGPRS, 0x51F5, {rec(0x51F5, 18, 13, {1, 0, 2})},
         "{Network Control Order=NC2, PFC Supported=Supported, "
         "Priority Access Threshold=Barred (PKT access not allowed in the Cell)}"},
        {kGPRS, 0x7135, andShort(rec(0x7135, 28, 13, {3}), 27), "{Network Operating Mode=Unknown}"},
        {kGPRS, 0x51F4, andShort(rec(0x51F4, 15, 14, {255}), 14), "{SI13 Position=Not Available}"},
        {kGPRS, 0x51FD, {rec(0x51FD, 35, 13, {1, 2, 3, 4})},
         "{Ext Measurement Order=4, Packet PSI Status=1, Packet SI Status=Not Supported, Count LR=2, Count HR=3}"},
        {kRR, 0x512C, {rec(0x512C, 17, 13, {13, 2, 3, 1})},
         "{RR State=RR_W2G_INTERRAT_HANDOVER_ PROGRESS, RR Sub State=2, RR Status=3, RR Mode=Data}"},
        {kRR, 0x512C, {rec(0x512C, 17, 13, {22})}, "{RR State=Unknown, RR Sub State=0, RR Status=0, RR Mode=Voice}"},
        {kRR, 0x51F6, {rec(0x51F6, 24, 16, {4})}, "{DRX Used=4 sec}"},
        {kRR, 0x5072, andShort(rec(0x5072, 20, 19, {1}), 19), "{DTX Used=ON}"},
        {kMA, 0x51F8, andShort(rec(0x51F8, 15, 13, {7, 0}), 14), "{HSN=7, ARFCNs=[]}"},
        // Three ARFCNs claimed, two present.
        {kMA, 0x51F8, {rec(0x51F8, 19, 13, {7, 3, 0x2C, 1, 5, 0})}, "{HSN=7, ARFCNs=[300, 5]}"},
        // Two channels claimed, one present; its error count is negative.
        {kBLER, 0x4116, andShort(rec(0x4116, 25, 13, {2, 0x10, 0, 4, 10, 0, 0, 0, 0xFF, 0xFF, 0xFF, 0xFF}), 15),
         "{Window Size=16, Transport Channels=[{Transport Channel ID=4, CRC Received=10, CRC Received in Error=-1}]}"},
        {kHSDPA, 0x4221, andShort(rec(0x4221, 18, 13, {2, 0x10, 0x07}), 17),
         "{Version=2, Sub Frames=784, Carrier Info=MIMO, Primary HARQ Process=[], Secondary HARQ Process=[]}"},
        // Counts of 255 each in an 18-byte record: nothing past its end is read.
        {kHSDPA, 0x4221, {rec(0x4221, 18, 13, {0, 0xFF, 0x0C, 255, 255})},
         "{Version=0, Sub Frames=255, Carrier Info=Reserved, Primary HARQ Process=[], Secondary HARQ Process=[]}"},
        // P = 0: the secondary entry at 18.
        {kHSDPA, 0x4221, {rec(0x4221, 27, 16, {0, 1, 3, 0xE8, 3, 0, 0, 5, 0, 1, 0})},
         "{Version=0, Sub Frames=0, Carrier Info=Single Carrier, Primary HARQ Process=[], Secondary HARQ Process=["
         "{Process ID=3, No Rx Bits=1000, New Tx=5, Block Errors=1}]}"},
        // P = 1: the primary entry at 18, the secondary one 162 bytes on, at 180.
        {kHSDPA, 0x4221,
         {RecordBuilder::ordinary(0x4221, 189).bytes(16, {1, 1, 1}).u32(19, 7).u8(180, 2).u16(187, 9).build()},
         "{Version=0, Sub Frames=0, Carrier Info=Single Carrier, Primary HARQ Process=["
         "{Process ID=1, No Rx Bits=7, New Tx=0, Block Errors=0}], Secondary HARQ Process=["
         "{Process ID=2, No Rx Bits=0, New Tx=0, Block Errors=9}]}"},
    };
    for (const Row& row : rows) EXPECT_EQ(row.show(row.records, row.code), row.expected) << row.expected;
}

// 0x5137 with neighbour entries (14 bytes from 29: u16 ARFCN, level, u32 C1) and a 0x51FF
// BSIC report (4-byte entries from 15: u16 ARFCN, BSIC).
Bytes neighbours(uint8_t count, std::initializer_list<uint8_t> entries) {
    return RecordBuilder::ordinary(0x5137, 29).u8(28, count).bytes(29, entries).build();
}
Bytes bsics(uint8_t count, std::initializer_list<uint8_t> entries) {
    return RecordBuilder::ordinary(0x51FF, 15).u8(14, count).bytes(15, entries).build();
}

TEST(NeighboringCellsSection, NeighboursShowTheBSICOfTheLastReportNamingTheirARFCN) {
    const Bytes two = neighbours(2, {0x2C, 1, 20, 12, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 5, 0, 30, 0xFF, 0xFF, 0xFF, 0xFF, 0, 0,
                                     0, 0, 0, 0, 0});
    const std::string plain = "[{ARFCN=300, RSSI=20, C1 Value=12}, {ARFCN=5, RSSI=30, C1 Value=-1}]";
    struct Row {
        std::vector<std::pair<Bytes, int32_t>> records;
        std::string expected;
    };
    const Row rows[] = {
        {{{two, 0x5137}}, plain},
        {{{bsics(1, {0x2C, 1, 7, 0}), 0x51FF}, {two, 0x5137}},
         "[{ARFCN=300, RSSI=20, C1 Value=12, BSIC=7}, {ARFCN=5, RSSI=30, C1 Value=-1}]"},
        // A later report without ARFCN 300 forgets its BSIC; a short one changes nothing.
        {{{bsics(1, {0x2C, 1, 7, 0}), 0x51FF}, {bsics(1, {9, 0, 1, 0}), 0x51FF}, {two, 0x5137}}, plain},
        {{{bsics(1, {0x2C, 1, 7, 0}), 0x51FF}, {rec(0x51FF, 14), 0x51FF}, {two, 0x5137}},
         "[{ARFCN=300, RSSI=20, C1 Value=12, BSIC=7}, {ARFCN=5, RSSI=30, C1 Value=-1}]"},
        // Reports claiming more entries than they hold read only the whole ones.
        {{{bsics(3, {0x2C, 1, 7, 0, 5, 0}), 0x51FF}, {neighbours(9, {0x2C, 1, 20, 12, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 5}),
                                                      0x5137}},
         "[{ARFCN=300, RSSI=20, C1 Value=12, BSIC=7}]"},
        {{{two, 0x5137}, {rec(0x5137, 28), 0x5137}}, plain},
        {{{two, 0x5137}, {neighbours(0, {}), 0x5137}}, "[]"},
    };
    for (const Row& row : rows) {
        Bound<NeighboringCells> cells(true);
        for (const auto& [record, code] : row.records) cells.feed(record, code);
        EXPECT_EQ(cells.shown(), row.expected);
    }
}

TEST(GSMCellMonitor, ServingAndNeighbourCellsShowWhatTheyCarryAndSayWhatIsMissing) {
    const char *gsm = kTSCellMonitorRadioAccessTechnologyGSM, *serving = kTSCellMonitorCellTypeServing,
               *neighbour = kTSCellMonitorCellTypeNeighbor;
    const Bytes cells = cellMonitor({
        // A technology that is a number, not a name, matches nothing.
        cell(nullptr, serving, {{kTSCellMonitorCellRadioAccessTechnology, 1}, {kTSCellMonitorCellId, 7}}),
        cell(kTSCellMonitorRadioAccessTechnologyUMTS, neighbour, {{kTSCellMonitorARFCN, 1}}),
        cell(gsm, neighbour, {{kTSCellMonitorARFCN, 0x10000 + 12}, {kTSCellMonitorRSSI, 32767}}),
        cell(gsm, serving, {{kTSCellMonitorCellId, 99}, {kTSCellMonitorARFCN, 20}}),
        cell(gsm, neighbour, {{kTSCellMonitorARFCN, 13}, {kTSCellMonitorRSSI, -50}}),
        cell(gsm, neighbour, {}),
        cell(gsm, serving, {{kTSCellMonitorCellId, 1}}),
    });
    const Bytes noArray = RecordBuilder::extraPropertyList(1, cell(gsm, serving, {{kTSCellMonitorCellId, 5}}));
    const Bytes unparsable = RecordBuilder::extra(0xFF0001, 20).build();
    const std::string cellArray = "Failed to get Cell Array\n";
    SystemLogCapture capture;
    Bound<GSMServingCell> servingCell;
    servingCell.feed({cells, noArray, unparsable}, 0xFF0001);
    EXPECT_EQ(servingCell.shown(), "{Cell ID=99, ARFCN=20}");
    EXPECT_EQ(errorLines(capture), (std::vector<std::string>{cellArray, cellArray}));

    capture.clear();
    Bound<NeighboringCells> list(true);
    list.feed(cells, 0xFF0001);
    EXPECT_EQ(list.shown(), "[{ARFCN=12, RSSI=}, {ARFCN=13, RSSI=-100 dBm}, {}]");
    list.feed(neighbours(1, {1, 0, 2, 3, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0}), 0x5137).feed(noArray, 0xFF0001);
    EXPECT_EQ(list.shown(), "[]");
    EXPECT_EQ(errorLines(capture), (std::vector<std::string>{"NeighboringCells: Failed to retrieve ARFCN\n",
                                                             "NeighboringCells: Failed to retrieve RSSI\n", cellArray}));
}

}  // namespace
}  // namespace vantorel

// UTRANSectionsTest: the TD-SCDMA sections fed built records (bit fields, offsets, entries past the end, short records) and the UTRAN decoder end to end.
#include "LogGenerator/UTRAN/CCTRCHSIRMeasurement.h"
#include "LogGenerator/UTRAN/GSMNeighbhorMeasurements.h"
#include "LogGenerator/UTRAN/RRC_State.h"
#include "LogGenerator/UTRAN/TRCHBLERMeasurement.h"
#include "LogGenerator/UTRAN/UTRANLogGenerator.h"
#include "LogGenerator/UTRAN/UTRANNeighbhorMeasurements.h"
#include "LogGenerator/UTRAN/UTRANServingCellInfo.h"
#include "LogGenerator/SectionTesting.h"
#include "Platform/ResourceBundle.h"

#include <QFile>
#include <QTemporaryDir>
#include <gtest/gtest.h>

#include <clocale>
#include <string>

namespace vantorel {
namespace {

using namespace sectiontest;

TEST(RRCStateSection, TheModeCountsOnlyWhenByte13Is1AndShortRecordsAreReportedThenDecoded) {
    struct Row {
        size_t length;
        uint8_t b13, b14;
        const char* state;
    };
    const Row rows[] = {
        {15, 1, 2, "Cell Fach"},        {15, 1, 5, "Cell URA PCH"},     {15, 1, 6, "Unknown RRC Mode"},
        {15, 0, 2, "Unknown RRC Mode"}, {15, 2, 2, "Unknown RRC Mode"}, {20, 1, 0, "Disconnected"},
        {14, 1, 0, "Unknown RRC Mode"},
    };
    for (const Row& row : rows) {
        SystemLogCapture capture;
        const Bytes record = RecordBuilder::ordinary(0xD0E0, 15).u8(13, row.b13).u8(14, row.b14).resize(row.length).build();
        EXPECT_EQ(Bound<RRC_State>().feed(record, 0xD0E0).shown(), std::string("{State=") + row.state + "}");
        const std::string lengthLine = "LogCode_0xD0E0 is length is " + std::to_string(row.length) + " expected size 15";
        EXPECT_EQ(capture.contains(SystemLog::kWarning, lengthLine), row.length < 15) << row.length;
    }
    EXPECT_EQ(Bound<RRC_State>().feed(RecordBuilder::ordinary(0xD0E0, 15).u8(13, 1).build(), 0xD0E2).shown(), "{}");
}

// 0xD0E2: 14 access restrictions, 15 URA ID, 17 uplink UARFCN, 19 downlink UARFCN,
// 21 cell ID (signed 32), 25 bit 0 allowed access; 26 bytes.
Bytes servingCellRecord(uint8_t restrictions, uint8_t ura, uint16_t up, uint16_t down, uint32_t cellId, uint8_t access,
                        size_t length = 26) {
    return RecordBuilder::ordinary(0xD0E2, 26)
        .u8(14, restrictions).u8(15, ura).u16(17, up).u16(19, down).u32(21, cellId).u8(25, access)
        .resize(length)
        .build();
}

TEST(ServingCellInfoSection, ServingCellRecordsShowEveryFieldAtItsOffset) {
    struct Row {
        Bytes record;
        const char* expected;
    };
    const Row rows[] = {
        {servingCellRecord(7, 42, 9612, 10562, 0x1234567, 0x01),
         "{Cell Access Restrictions=7, Cell ID=19088743, Downlink UARFCN=10562, Uplink UARFCN=9612, URA ID=42, "
         "Allowed Access=Emergency Calls Only}"},
        {servingCellRecord(255, 0, 0xFFFF, 1, 0xFFFFFFFE, 0xFE),
         "{Cell Access Restrictions=255, Cell ID=-2, Downlink UARFCN=1, Uplink UARFCN=65535, URA ID=0, "
         "Allowed Access=All Calls}"},
        {servingCellRecord(7, 42, 9612, 10562, 0x1234567, 0x01, 25), "{}"},
    };
    for (const Row& row : rows) EXPECT_EQ(Bound<UTRANServingCellInfo>().feed(row.record, 0xD0E2).shown(), row.expected);
}

TEST(ServingCellInfoSection, TheLastServingUTRANCellOfTheCellMonitorWinsAndItsUARFCNFillsBothDirections) {
    const char* const utran = kTSCellMonitorRadioAccessTechnologyUTRAN2;
    const char* const serving = kTSCellMonitorCellTypeServing;
    auto full = [&](int lac, int id) {
        return cell(utran, serving, {{kTSCellMonitorLAC, lac}, {kTSCellMonitorCellId, id}, {kTSCellMonitorBandInfo, 34},
                                     {kTSCellMonitorSCN, 77}, {kTSCellMonitorUARFCN, 10054}});
    };
    const std::pair<Bytes, const char*> rows[] = {
        {cellMonitor({full(1, 11), cell(utran, kTSCellMonitorCellTypeNeighbor, {}), full(2, 22)}),
         "{Local Area Code=2, Cell ID=22, Freq Band Indicator=34, Cell Scrambling Code=77, Uplink UARFCN=10054, "
         "Downlink UARFCN=10054}"},
        {cellMonitor({cell(kTSCellMonitorRadioAccessTechnologyGSM, serving, {{kTSCellMonitorLAC, 1}}),
                      cell(utran, kTSCellMonitorCellTypeNeighbor, {{kTSCellMonitorLAC, 1}})}),
         "{}"},
    };
    for (const auto& [record, expected] : rows)
        EXPECT_EQ(Bound<UTRANServingCellInfo>().feed(record, 0xFF0001).shown(), expected);
}

// One 16-byte 0xD00A entry whose first little-endian word packs the fields.
uint32_t neighbourWord(uint32_t uarfcn, uint32_t cellId, uint32_t rscp, uint32_t status, uint32_t inJDCS) {
    return uarfcn | (cellId << 14) | (rscp << 21) | (status << 29) | (inJDCS << 31);
}

// 0xD00A: byte 16 = count << 1 (bit 0 is noise), entries at 168 + 16i.
Bytes neighbourRecord(std::initializer_list<uint32_t> words, unsigned count, size_t length) {
    RecordBuilder b = RecordBuilder::ordinary(0xD00A, length).u8(16, static_cast<uint8_t>((count << 1) | 1));
    size_t offset = 168;
    for (uint32_t w : words) {
        b.u32(offset, w);
        offset += 16;
    }
    return b.resize(length).build();
}

// Run under a locale that writes 0,5: the display always shows 0.500000.
TEST(NeighbourCellListSection, EveryBitFieldOfAnEntryAndEntriesPastTheRecordsEndWhateverTheLocale) {
    const std::string previous = std::setlocale(LC_ALL, nullptr);
    ASSERT_NE(std::setlocale(LC_ALL, "de_DE.UTF-8"), nullptr)
        << "the de_DE.UTF-8 locale is missing: scripts/install-deps compiles it";
    const Bytes one = neighbourRecord({neighbourWord(10088, 5, 128, 1, 0)}, 1, 184);
    const char* const oneShown = "[{UARFCN=10088, Cell ID=5, Filter RSCP=0.500000, Status=MSET, inJDCS=FALSE}]";
    const std::pair<std::vector<Bytes>, const char*> rows[] = {
        {{one}, oneShown},
        // Each field at its maximum, the others zero.
        {{neighbourRecord({neighbourWord(0x3FFF, 0, 0, 0, 0), neighbourWord(0, 0x7F, 0, 2, 0),
                           neighbourWord(0, 0, 0xFF, 3, 0), neighbourWord(0, 0, 0, 0, 1)},
                          4, 232)},
         "[{UARFCN=16383, Cell ID=0, Filter RSCP=0.000000, Status=ASET, inJDCS=FALSE}, "
         "{UARFCN=0, Cell ID=127, Filter RSCP=0.000000, Status=DSET, inJDCS=FALSE}, "
         "{UARFCN=0, Cell ID=0, Filter RSCP=0.996094, inJDCS=FALSE}, "
         "{UARFCN=0, Cell ID=0, Filter RSCP=0.000000, Status=ASET, inJDCS=TRUE}]"},
        // A count past the record's end stops at the last whole entry.
        {{neighbourRecord({neighbourWord(1, 1, 0, 0, 0)}, 3, 199)},
         "[{UARFCN=1, Cell ID=1, Filter RSCP=0.000000, Status=ASET, inJDCS=FALSE}]"},
        {{one, neighbourRecord({}, 1, 183)}, "[]"},
        {{one, neighbourRecord({}, 0, 20)}, oneShown},  // a 20-byte record changes nothing
        {{one, neighbourRecord({}, 0, 21)}, "[]"},       // 21 bytes is the shortest that rebuilds
    };
    for (const auto& [records, expected] : rows)
        EXPECT_EQ(Bound<UTRANNeighbhorMeasurements>(true).feed(records, 0xD00A).shown(), expected);
    std::setlocale(LC_ALL, previous.c_str());
}

// 0xD00C: the u16 at 14 holds the TRCH count t in bits 6-11, byte 15's high nibble the
// CCTRCH count c; TRCH entries at 17 + 2i, CCTRCH entries at 289 + 34t + 8j.
RecordBuilder blerRecord(unsigned trch, unsigned cctrch, size_t length) {
    return RecordBuilder::ordinary(0xD00C, length)
        .u16(14, static_cast<uint16_t>((trch << 6) | (cctrch << 12) | 0x3F))
        .resize(length);
}

TEST(BLERAndSIRSections, TRCHAndCCTRCHEntriesAtTheirOffsetsStoppingAtTheRecordsEnd) {
    const Bytes two = blerRecord(2, 1, 365).bytes(17, {3, 9, 4, 10}).bytes(357, {1, 2, 10, 11, 12, 13, 14, 15}).build();
    const char* const twoTrch = "[{TRCH ID=3, TRCH BLER Measurement=9}, {TRCH ID=4, TRCH BLER Measurement=10}]";
    const char* const twoCctrch = "[{CCTRCH ID=1, TSNUM=2, SIR=[10, 11, 12, 13, 14, 15]}]";  // at 289 + 68
    struct Row {
        std::vector<Bytes> records;
        const char* trch;
        const char* cctrch;
    };
    const Row rows[] = {
        {{two}, twoTrch, twoCctrch},
        // No TRCH: the CCTRCH entries start at 289.
        {{blerRecord(0, 2, 305).bytes(289, {5, 6, 1, 2, 3, 4, 5, 6, 7, 8, 0, 0, 0, 0, 0, 255}).build()}, "[]",
         "[{CCTRCH ID=5, TSNUM=6, SIR=[1, 2, 3, 4, 5, 6]}, {CCTRCH ID=7, TSNUM=8, SIR=[0, 0, 0, 0, 0, 255]}]"},
        {{blerRecord(63, 15, 20).bytes(17, {1, 2, 3}).build()}, "[{TRCH ID=1, TRCH BLER Measurement=2}]", "[]"},
        {{two, blerRecord(0, 0, 16).build()}, twoTrch, twoCctrch},  // a 16-byte record changes nothing
    };
    for (const Row& row : rows) {
        EXPECT_EQ(Bound<TRCHBLERMeasurement>(true).feed(row.records, 0xD00C).shown(), row.trch);
        EXPECT_EQ(Bound<CCTRCHSIRMeasurement>(true).feed(row.records, 0xD00C).shown(), row.cctrch);
    }
}

TEST(GSMNeighbourCellListSection, ARecordEmptiesTheListAndAShortOneLeavesIt) {
    Bound<GSMNeighbhorMeasurements> gsm(true);
    gsm.list->append("earlier");
    EXPECT_EQ(gsm.feed(RecordBuilder::ordinary(0xD00E, 16).build(), 0xD00E).shown(), "[earlier]");
    // One well-formed entry: decoded, and on purpose never shown.
    gsm.feed(RecordBuilder::ordinary(0xD00E, 25).u8(16, 1).bytes(17, {1, 2, 3, 4, 5, 6, 7, 8}).build(), 0xD00E);
    EXPECT_EQ(gsm.shown(), "[]");
}

// A resource folder holding copies of the UTRAN template under the given names.
struct TemplateFolder {
    QTemporaryDir dir;
    explicit TemplateFolder(const std::vector<const char*>& names) {
        for (const char* n : names)
            QFile::copy(QStringLiteral(VANTOREL_TEMPLATES_DIR "/UTRAN.plist"), dir.filePath(QString::fromUtf8(n)));
        ResourceBundle::setDirectory(dir.path().toStdString());
    }
    ~TemplateFolder() { ResourceBundle::setDirectory(""); }
};

TEST(UTRANDecoder, TheFirstTemplateWhoseNameHoldsUTRANInAnyCaseIsUsedAndNoneLeavesTheDecoderUnusable) {
    const std::pair<std::vector<const char*>, const char*> rows[] = {
        {{"utran_extra.plist", "UTRAN.plist"}, "UTRAN"}, {{"My-utran-template.plist"}, "My-utran-template"}};
    for (const auto& [names, used] : rows) {
        TemplateFolder folder(names);
        auto g = UTRANLogGenerator::generator();
        ASSERT_TRUE(g->isUsable()) << used;
        EXPECT_EQ(dynamic_cast<MVKLogGenerator2&>(*g).templateName(), used);
    }
    TemplateFolder none({"GSM.plist"});
    EXPECT_FALSE(UTRANLogGenerator::generator()->isUsable());
    EXPECT_EQ(LogGenerator::generatorFromTechnology(kTSLogChannelTechnology_Morvek_UTRAN2), nullptr);
}

// What the display shows under group, section and (for a dictionary section) field.
std::string at(const DictionaryRef& display, const char* group, const char* section, const char* field = nullptr) {
    const DictionaryRef g = display->get(group).asDictionary();
    const Value v = g ? g->get(section) : Value();
    return render(field && v.asDictionary() ? v.asDictionary()->get(field) : v);
}

TEST(UTRANDecoder, BuiltRecordsReachTheirPlacesInTheDisplayAndNoiseIsShruggedOff) {
    auto g = LogGenerator::generatorFromTechnology(kTSLogChannelTechnology_Morvek_UTRAN2);
    ASSERT_TRUE(g);
    Dictionary state;
    EXPECT_EQ(g->generateLogUsingState(state), nullptr);  // the first call builds the display

    g->updateState(state, RecordBuilder::ordinary(0xD0E0, 15).u8(13, 1).u8(14, 3).buildWithPrefix());
    g->updateState(state, servingCellRecord(0, 7, 10054, 10055, 31337, 1));
    g->updateState(state, neighbourRecord({neighbourWord(10088, 5, 128, 1, 0)}, 1, 184));
    g->updateState(state, blerRecord(1, 1, 331).bytes(17, {3, 9}).bytes(323, {1, 2, 10, 11, 12, 13, 14, 15}).build());
    g->updateState(state, cellMonitor({cell(kTSCellMonitorRadioAccessTechnologyUTRAN2, kTSCellMonitorCellTypeServing,
                                            {{kTSCellMonitorLAC, 0x5A1F}, {kTSCellMonitorSCN, 77}})}));
    auto sim = Dictionary::create();
    sim->set("kSimFile_ICCID", "898600");
    g->updateState(state, RecordBuilder::extraPropertyList(0, Value(sim), true));
    auto pdp = Dictionary::create();
    pdp->set("APN", "cmnet");
    g->updateState(state, RecordBuilder::extraPropertyList(2, Value(Array::of({Value(pdp)}))));
    g->updateState(state, RecordBuilder::ordinary(0xD00E, 25).u8(16, 1).build());
    // Noise: too short, a wrong type byte, a SIM payload that is not a property list.
    g->updateState(state, Bytes{1, 2, 3});
    g->updateState(state, RecordBuilder(2, 0xD0E0, 15).u8(13, 1).u8(14, 0).build());
    g->updateState(state, RecordBuilder::extra(0, 20).bytes(13, {'n', 'o', 't', ' ', 'a'}).build());

    const DictionaryRef display = g->generateLogUsingState(state);
    ASSERT_TRUE(display);
    EXPECT_EQ(at(display, "1;Serving Cell", "RRC Info", "State"), "Cell DCH");
    EXPECT_EQ(at(display, "1;Serving Cell", "Serving Cell Info", "Allowed Access"), "Emergency Calls Only");
    EXPECT_EQ(at(display, "1;Serving Cell", "Serving Cell Info", "Local Area Code"), "23071");
    EXPECT_EQ(at(display, "1;Serving Cell", "Serving Cell Info", "Downlink UARFCN"), "10055");
    EXPECT_EQ(at(display, "2;Neighbours", "Neighbor Cell List"),
              "[{UARFCN=10088, Cell ID=5, Filter RSCP=0.500000, Status=MSET, inJDCS=FALSE}]");
    EXPECT_EQ(at(display, "2;Neighbours", "GSM Neighbor Cell List"), "[]");
    EXPECT_EQ(at(display, "3;Link Quality", "TRCH BLER"), "[{TRCH ID=3, TRCH BLER Measurement=9}]");
    EXPECT_EQ(at(display, "3;Link Quality", "CCTRCH SIR"), "[{CCTRCH ID=1, TSNUM=2, SIR=[10, 11, 12, 13, 14, 15]}]");
    EXPECT_EQ(at(display, "4;Packet Data", "PDP Context Info"), "[{APN=cmnet}]");
    EXPECT_EQ(at(display, "5;SIM", "SIM Info", "EF-ICCID"), "898600");
}

}  // namespace
}  // namespace vantorel

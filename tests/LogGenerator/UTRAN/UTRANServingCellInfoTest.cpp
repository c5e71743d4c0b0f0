// UTRANServingCellInfoTest: tests src/LogGenerator/UTRAN/UTRANServingCellInfo.cpp, the "Serving Cell Info" section of Part 7.2 (0xD0E2 and extra 0xFF0001).
#include "LogGenerator/UTRAN/UTRANServingCellInfo.h"

#include "Platform/RecordBuilder.h"
#include "Platform/SystemLog.h"
#include "Platform/SystemLogCapture.h"
#include "Platform/TelephonyIdentifiers.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"

#include <gtest/gtest.h>

using namespace vantorel;

namespace {

constexpr int32_t kCellMonitor = 0xFF0001;

const char* const kFailLAC = "Serving Cell Info: Failed to retrieve LAC\n";
const char* const kFailCellID = "Serving Cell Info: Failed to retrieve Cell ID\n";
const char* const kFailBand = "Serving Cell Info: Failed to retrieve Freq Band Indicator\n";
const char* const kFailSCN = "Serving Cell Info: Failed to retrieve Cell Scrambling Code\n";
const char* const kFailUARFCN = "Serving Cell Info: Failed to retrieve UARFCN\n";

// A cell-monitor dictionary with the given technology and type and the five values
// this section reads.
Value cell(const char* rat, const char* type, int lac, int cellId, int band, int scn, int uarfcn) {
    auto d = Dictionary::create();
    d->set(kTSCellMonitorCellRadioAccessTechnology, Value(rat));
    d->set(kTSCellMonitorCellType, Value(type));
    d->set(kTSCellMonitorLAC, Value::integer(lac));
    d->set(kTSCellMonitorCellId, Value::integer(cellId));
    d->set(kTSCellMonitorBandInfo, Value::integer(band));
    d->set(kTSCellMonitorSCN, Value::integer(scn));
    d->set(kTSCellMonitorUARFCN, Value::integer(uarfcn));
    return Value(d);
}

Value servingUTRAN(int lac, int cellId, int band, int scn, int uarfcn) {
    return cell(kTSCellMonitorRadioAccessTechnologyUTRAN2, kTSCellMonitorCellTypeServing, lac, cellId, band, scn,
                uarfcn);
}

// Extra record 1 (type 255 at 0, code 1 at 3..4), its plist payload from offset 13.
Bytes cellMonitorRecord(std::vector<Value> cells) {
    return RecordBuilder::extraPropertyList(1, Value(Array::of(std::move(cells))));
}

// Record 0xD0E2, 26 bytes: 14 access restrictions, 15 URA ID, 17..18 uplink UARFCN,
// 19..20 downlink UARFCN, 21..24 cell ID (signed), 25 bit 0 allowed access.
RecordBuilder servingCellRecord(size_t length = 26) {
    RecordBuilder b = RecordBuilder::ordinary(0xD0E2, 26);
    b.u8(14, 7)              // Cell Access Restrictions
        .u8(15, 42)          // URA ID
        .u16(17, 9612)       // Uplink UARFCN
        .u16(19, 10562)      // Downlink UARFCN
        .u32(21, 0x1234567)  // Cell ID 19088743
        .u8(25, 0x01);       // Allowed Access bit 0: emergency calls only
    b.resize(length);
    return b;
}

class UTRANServingCellInfoTest : public ::testing::Test {
protected:
    void SetUp() override { section.updateSectionRef(Value(dict)); }

    std::string text(const std::string& key) const {
        const Value* v = dict->find(key);
        if (!v) return "<absent>";
        const std::string* s = v->asString();
        return s ? *s : "<not a string>";
    }

    // The error-priority lines captured, in order.
    static std::vector<std::string> errors(const SystemLogCapture& cap) {
        std::vector<std::string> out;
        for (const auto& l : cap.lines())
            if (l.priority == SystemLog::kError) out.push_back(l.text);
        return out;
    }

    UTRANServingCellInfo section;
    DictionaryRef dict = Dictionary::create();
};

}  // namespace

TEST_F(UTRANServingCellInfoTest, NameAndLogCodes) {
    EXPECT_EQ(section.getSectionName(), "Serving Cell Info");
    EXPECT_EQ(section.getLogCodeArray(), (std::vector<int32_t>{0xD0E2, 0xFF0001}));
}

TEST_F(UTRANServingCellInfoTest, RegistersUnderBothCodes) {
    ClassDictionary classDict;
    CodeDictionary codeDict;
    section.initWithDict(classDict, codeDict);
    EXPECT_EQ(classDict.at("Serving Cell Info"), &section);
    ASSERT_NE(codeDict.find("53474"), nullptr);     // 0xD0E2
    ASSERT_NE(codeDict.find("16711681"), nullptr);  // 0xFF0001
    EXPECT_EQ(*codeDict.find("16711681"), SectionList{&section});
}

// Edge: "An 0xFF0001 array holding a serving GSM cell and a neighbour UTRAN cell changes
// nothing."
TEST_F(UTRANServingCellInfoTest, FF0001ArrayHoldingAServingGSMCellAndANeighbourUTRANCellChangesNothing) {
    dict->set("Cell ID", Value("old"));
    dict->set("Local Area Code", Value("old LAC"));
    const DictionaryRef before = dict->deepCopy();
    SystemLogCapture cap;
    section.updateWithData(
        cellMonitorRecord({cell(kTSCellMonitorRadioAccessTechnologyGSM, kTSCellMonitorCellTypeServing, 1, 2, 3, 4, 5),
                           cell(kTSCellMonitorRadioAccessTechnologyUTRAN2, kTSCellMonitorCellTypeNeighbor, 6, 7, 8, 9,
                                10)}),
        kCellMonitor);
    EXPECT_EQ(*dict, *before);
    EXPECT_TRUE(errors(cap).empty());
}

TEST_F(UTRANServingCellInfoTest, D0E2StoresEveryFieldOfItsTable) {
    section.updateWithData(servingCellRecord().build(), 0xD0E2);
    EXPECT_EQ(text("Cell Access Restrictions"), "7");
    EXPECT_EQ(text("URA ID"), "42");
    EXPECT_EQ(text("Uplink UARFCN"), "9612");
    EXPECT_EQ(text("Downlink UARFCN"), "10562");
    EXPECT_EQ(text("Cell ID"), "19088743");
    EXPECT_EQ(text("Allowed Access"), "Emergency Calls Only");
    EXPECT_EQ(dict->size(), 6u);
}

TEST_F(UTRANServingCellInfoTest, D0E2CellIDIsSigned32BitsAndUARFCNsUnsigned16) {
    const Bytes record = servingCellRecord()
                             .u16(17, 0xFFFF)      // Uplink UARFCN 65535
                             .u16(19, 0x8000)      // Downlink UARFCN 32768
                             .u32(21, 0xFFFFFFFE)  // Cell ID -2
                             .build();
    section.updateWithData(record, 0xD0E2);
    EXPECT_EQ(text("Uplink UARFCN"), "65535");
    EXPECT_EQ(text("Downlink UARFCN"), "32768");
    EXPECT_EQ(text("Cell ID"), "-2");
}

TEST_F(UTRANServingCellInfoTest, D0E2AllowedAccessReadsOnlyBit0OfByte25) {
    section.updateWithData(servingCellRecord().u8(25, 0xFE).build(), 0xD0E2);  // bit 0 clear, others set
    EXPECT_EQ(text("Allowed Access"), "All Calls");
    section.updateWithData(servingCellRecord().u8(25, 0x01).build(), 0xD0E2);
    EXPECT_EQ(text("Allowed Access"), "Emergency Calls Only");
}

TEST_F(UTRANServingCellInfoTest, D0E2Of26BytesIsTheMinimumAnd25BytesAreIgnored) {
    SystemLogCapture cap;
    const Bytes shortRecord = servingCellRecord(25).build();  // byte 25 cut off
    ASSERT_EQ(shortRecord.size(), 25u);
    section.updateWithData(shortRecord, 0xD0E2);
    EXPECT_TRUE(dict->empty());
    EXPECT_EQ(cap.lines().size(), 1u);  // only "Serving Cell Info": ignored silently

    const Bytes record = servingCellRecord(26).build();
    ASSERT_EQ(record.size(), 26u);
    section.updateWithData(record, 0xD0E2);
    EXPECT_EQ(text("URA ID"), "42");
    EXPECT_EQ(text("Allowed Access"), "Emergency Calls Only");
}

TEST_F(UTRANServingCellInfoTest, D0E2ShortRecordKeepsTheOldValues) {
    section.updateWithData(servingCellRecord().build(), 0xD0E2);
    section.updateWithData(RecordBuilder::ordinary(0xD0E2, 20).u8(15, 99).build(), 0xD0E2);
    EXPECT_EQ(text("URA ID"), "42");
}

TEST_F(UTRANServingCellInfoTest, FF0001ServingUTRAN2CellIsRead) {
    SystemLogCapture cap;
    section.updateWithData(cellMonitorRecord({servingUTRAN(4660, 268435455, 1, 311, 10700)}), kCellMonitor);
    EXPECT_EQ(text("Local Area Code"), "4660");
    EXPECT_EQ(text("Cell ID"), "268435455");
    EXPECT_EQ(text("Freq Band Indicator"), "1");
    EXPECT_EQ(text("Cell Scrambling Code"), "311");
    EXPECT_EQ(text("Uplink UARFCN"), "10700");
    EXPECT_EQ(text("Downlink UARFCN"), "10700");
    EXPECT_TRUE(errors(cap).empty());
}

TEST_F(UTRANServingCellInfoTest, FF0001BinaryPropertyListIsReadToo) {
    const Bytes record =
        RecordBuilder::extraPropertyList(1, Value(Array::of({servingUTRAN(1, 2, 3, 4, 5)})), /*binary=*/true);
    section.updateWithData(record, kCellMonitor);
    EXPECT_EQ(text("Cell Scrambling Code"), "4");
}

TEST_F(UTRANServingCellInfoTest, FF0001LastMatchingElementWins) {
    section.updateWithData(cellMonitorRecord({servingUTRAN(100, 200, 1, 300, 10562),
                                              cell(kTSCellMonitorRadioAccessTechnologyUTRAN2,
                                                   kTSCellMonitorCellTypeNeighbor, 9, 9, 9, 9, 9),
                                              servingUTRAN(101, 201, 2, 301, 10563)}),
                           kCellMonitor);
    EXPECT_EQ(text("Local Area Code"), "101");
    EXPECT_EQ(text("Cell ID"), "201");
    EXPECT_EQ(text("Freq Band Indicator"), "2");
    EXPECT_EQ(text("Cell Scrambling Code"), "301");
    EXPECT_EQ(text("Downlink UARFCN"), "10563");
}

TEST_F(UTRANServingCellInfoTest, FF0001MissingKeysEachLogTheirExactLineInOrder) {
    auto bare = Dictionary::create();
    bare->set(kTSCellMonitorCellRadioAccessTechnology, Value(kTSCellMonitorRadioAccessTechnologyUTRAN2));
    bare->set(kTSCellMonitorCellType, Value(kTSCellMonitorCellTypeServing));
    SystemLogCapture cap;
    section.updateWithData(cellMonitorRecord({Value(bare)}), kCellMonitor);
    EXPECT_EQ(errors(cap), (std::vector<std::string>{kFailLAC, kFailCellID, kFailBand, kFailSCN, kFailUARFCN}));
    EXPECT_TRUE(dict->empty());
}

TEST_F(UTRANServingCellInfoTest, FF0001AMissingOrNonIntegerValueIsLoggedAndTheOthersAreStillRead) {
    Value c = servingUTRAN(4660, 77, 1, 311, 10700);
    c.asDictionary()->remove(kTSCellMonitorCellId);                   // missing
    c.asDictionary()->set(kTSCellMonitorSCN, Value("not a number"));  // not an integer
    SystemLogCapture cap;
    section.updateWithData(cellMonitorRecord({c}), kCellMonitor);
    EXPECT_EQ(errors(cap), (std::vector<std::string>{kFailCellID, kFailSCN}));
    EXPECT_EQ(text("Local Area Code"), "4660");
    EXPECT_EQ(text("Freq Band Indicator"), "1");
    EXPECT_EQ(text("Uplink UARFCN"), "10700");
    EXPECT_FALSE(dict->contains("Cell ID"));
    EXPECT_FALSE(dict->contains("Cell Scrambling Code"));
}

TEST_F(UTRANServingCellInfoTest, FF0001ElementWithoutTechnologyOrTypeIsSkipped) {
    Value noType = servingUTRAN(1, 2, 3, 4, 5);
    noType.asDictionary()->remove(kTSCellMonitorCellType);
    Value noRat = servingUTRAN(1, 2, 3, 4, 5);
    noRat.asDictionary()->remove(kTSCellMonitorCellRadioAccessTechnology);
    SystemLogCapture cap;
    section.updateWithData(cellMonitorRecord({noType, noRat, Value("not a dictionary")}), kCellMonitor);
    EXPECT_TRUE(dict->empty());
    EXPECT_TRUE(errors(cap).empty());
}

TEST_F(UTRANServingCellInfoTest, FF0001UnparsablePayloadLogsCellInfoArrayDataCouldNotBeConstructed) {
    dict->set("Cell ID", Value("old"));
    const Bytes record = RecordBuilder::extra(1, 13)
                             .bytes(13, {'<', 'p', 'l', 'i', 's', 't', 0x00, 0xFF})  // payload: not a plist
                             .build();
    SystemLogCapture cap;
    section.updateWithData(record, kCellMonitor);
    EXPECT_EQ(errors(cap), std::vector<std::string>{"Cell Info Array data could not be constructed"});
    EXPECT_EQ(text("Cell ID"), "old");
}

TEST_F(UTRANServingCellInfoTest, FF0001WithoutPayloadLogsCellInfoArrayDataCouldNotBeConstructed) {
    SystemLogCapture cap;
    section.updateWithData(RecordBuilder::extra(1).build(), kCellMonitor);  // header only
    EXPECT_EQ(cap.count(SystemLog::kError, "Cell Info Array data could not be constructed"), 1);
}

TEST_F(UTRANServingCellInfoTest, FF0001RootThatIsNotAnArrayIsTreatedAsEmpty) {
    auto root = Dictionary::create();
    root->set(kTSCellMonitorCellRadioAccessTechnology, Value(kTSCellMonitorRadioAccessTechnologyUTRAN2));
    root->set(kTSCellMonitorCellType, Value(kTSCellMonitorCellTypeServing));
    root->set(kTSCellMonitorLAC, Value::integer(5));
    SystemLogCapture cap;
    section.updateWithData(RecordBuilder::extraPropertyList(1, Value(root)), kCellMonitor);
    EXPECT_TRUE(dict->empty());
    EXPECT_TRUE(errors(cap).empty());
}

TEST_F(UTRANServingCellInfoTest, D0E2AndFF0001WriteTheSameKeys) {
    section.updateWithData(servingCellRecord().build(), 0xD0E2);
    section.updateWithData(cellMonitorRecord({servingUTRAN(1, 555, 3, 4, 4400)}), kCellMonitor);
    EXPECT_EQ(text("Cell ID"), "555");
    EXPECT_EQ(text("Uplink UARFCN"), "4400");
    EXPECT_EQ(text("URA ID"), "42");  // not touched by the cell monitor
}

TEST_F(UTRANServingCellInfoTest, LogsServingCellInfoOnEveryCallEvenForAForeignCode) {
    SystemLogCapture cap;
    section.updateWithData(servingCellRecord().build(), 0xD0E0);  // another section's code
    EXPECT_EQ(cap.count(SystemLog::kWarning, "Serving Cell Info"), 1);
    EXPECT_TRUE(dict->empty());
    section.updateWithData(servingCellRecord().build(), 0xD0E2);
    section.updateWithData(cellMonitorRecord({}), kCellMonitor);
    EXPECT_EQ(cap.count(SystemLog::kWarning, "Serving Cell Info"), 3);
    EXPECT_EQ(cap.lines().size(), 3u);
}

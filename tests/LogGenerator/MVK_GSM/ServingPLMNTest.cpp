// ServingPLMNTest: tests ServingPLMN (Part 5.2 "Serving PLMN": 0x7132, 0x7135 BCD PLMN, 0xFF0001 cell-monitor list).
#include "LogGenerator/MVK_GSM/ServingPLMN.h"

#include "Platform/RecordBuilder.h"
#include "Platform/SystemLog.h"
#include "Platform/SystemLogCapture.h"
#include "Platform/TelephonyIdentifiers.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"

#include <gtest/gtest.h>

#include <optional>

namespace vantorel {
namespace {

constexpr int32_t kRegistrationState = 0x7132;
constexpr int32_t kServingPLMNAndArea = 0x7135;
constexpr int32_t kCellMonitor = 0xFF0001;

// A 0x7135 record of the minimum length 28:
//   14 service type, 15..17 BCD PLMN, 18..19 LAC big-endian, 20 RAC.
RecordBuilder plmnRecord(uint8_t serviceType, uint8_t b15, uint8_t b16, uint8_t b17, uint16_t lac, uint8_t rac) {
    return RecordBuilder::ordinary(0x7135, 28)
        .u8(14, serviceType)  // 14: service type
        .u8(15, b15)          // 15: MCC digit 2 | MCC digit 1
        .u8(16, b16)          // 16: MNC digit 3 | MCC digit 3
        .u8(17, b17)          // 17: MNC digit 2 | MNC digit 1
        .u16be(18, lac)       // 18..19: LAC, high byte first
        .u8(20, rac);         // 20: RAC
}

// A 0x7132 record of the minimum length 16 with the selection mode at 14.
Bytes selectionModeRecord(uint8_t mode) {
    return RecordBuilder::ordinary(0x7132, 16).u8(14, mode).build();  // 14: PLMN selection mode
}

// One cell-monitor dictionary; MCC, MNC and LAC only when given.
Value cell(const char* rat, const char* type, std::optional<int> mcc, std::optional<int> mnc,
           std::optional<int> lac) {
    auto d = Dictionary::create();
    if (rat) d->set(kTSCellMonitorCellRadioAccessTechnology, Value(rat));
    if (type) d->set(kTSCellMonitorCellType, Value(type));
    if (mcc) d->set(kTSCellMonitorMCC, Value::integer(*mcc));
    if (mnc) d->set(kTSCellMonitorMNC, Value::integer(*mnc));
    if (lac) d->set(kTSCellMonitorLAC, Value::integer(*lac));
    return Value(d);
}

// The 0xFF0001 extra record: payload from offset 13 is the serialised cell list.
Bytes cellMonitorRecord(std::vector<Value> cells, bool binary = false) {
    return RecordBuilder::extraPropertyList(0x0001, Value(Array::of(std::move(cells))), binary);
}

class ServingPLMNTest : public ::testing::Test {
protected:
    void SetUp() override { section.updateSectionRef(Value(dict)); }

    std::string text(const std::string& key) const {
        const Value* v = dict->find(key);
        return v && v->asString() ? *v->asString() : std::string("<absent>");
    }

    // True when the only captured line is the section's entry line.
    static bool onlyEntryLine(const SystemLogCapture& cap) {
        const auto lines = cap.lines();
        return lines.size() == 1 && lines[0].priority == SystemLog::kWarning && lines[0].text == "Serving PLMN";
    }

    DictionaryRef dict = Dictionary::create();
    ServingPLMN section;
};

// --- Section protocol --------------------------------------------------------------

TEST_F(ServingPLMNTest, NameAndLogCodesFollowTheSectionTable) {
    EXPECT_EQ(section.getSectionName(), "Serving PLMN");
    EXPECT_EQ(section.getLogCodeArray(), (std::vector<int32_t>{0x7135, 0x7132, 0xFF0001}));
}

TEST_F(ServingPLMNTest, EveryUpdateLogsServingPLMNAtWarningPriority) {
    SystemLogCapture cap;
    section.updateWithData(selectionModeRecord(0), kRegistrationState);
    section.updateWithData(RecordBuilder::ordinary(0x7135, 10).build(), kServingPLMNAndArea);
    EXPECT_EQ(cap.count(SystemLog::kWarning, "Serving PLMN"), 2);
}

TEST_F(ServingPLMNTest, UnknownCodeIsLoggedAndChangesNothing) {
    dict->set("PLMN Sel Mod", Value("Manual"));
    SystemLogCapture cap;
    section.updateWithData(selectionModeRecord(0), 0x7131);
    EXPECT_TRUE(cap.contains(SystemLog::kError, "Received an unknown log message: 28977"));
    EXPECT_EQ(dict->size(), 1u);
    EXPECT_EQ(text("PLMN Sel Mod"), "Manual");
}

TEST_F(ServingPLMNTest, UnboundSectionDecodesWithoutWriting) {
    ServingPLMN unbound;
    EXPECT_NO_THROW(unbound.updateWithData(plmnRecord(1, 0x13, 0xF0, 0x01, 1, 1).build(), kServingPLMNAndArea));
    EXPECT_EQ(unbound.sectionDictionary(), nullptr);
    EXPECT_TRUE(dict->empty());  // the other section's dictionary is untouched
}

// --- Edge cases worth testing (Part 5.2) ------------------------------------------

TEST_F(ServingPLMNTest, Bcd13F001ShowsMcc310AndMnc10WithTrailingBlank) {
    section.updateWithData(plmnRecord(3, 0x13, 0xF0, 0x01, 0, 0).build(), kServingPLMNAndArea);
    EXPECT_EQ(text("Mobile Country Code"), "310");
    EXPECT_EQ(text("Mobile Network Code"), "10 ");
}

TEST_F(ServingPLMNTest, ByteAFAndF2ShowMccOfTwoBlanksFollowedBy2) {
    section.updateWithData(plmnRecord(3, 0xAF, 0xF2, 0x01, 0, 0).build(), kServingPLMNAndArea);
    EXPECT_EQ(text("Mobile Country Code"), "  2");
}

TEST_F(ServingPLMNTest, LacBytes12And34Show4660) {
    section.updateWithData(plmnRecord(3, 0x13, 0xF0, 0x01, 0x1234, 0).build(), kServingPLMNAndArea);
    EXPECT_EQ(text("Location Area Code"), "4660");
}

TEST_F(ServingPLMNTest, A27ByteRecordChangesNothing) {
    dict->set("Mobile Country Code", Value("001"));
    SystemLogCapture cap;
    section.updateWithData(plmnRecord(3, 0x13, 0xF0, 0x01, 0x1234, 7).resize(27).build(), kServingPLMNAndArea);
    EXPECT_EQ(dict->size(), 1u);
    EXPECT_EQ(text("Mobile Country Code"), "001");
    EXPECT_TRUE(onlyEntryLine(cap));
}

TEST_F(ServingPLMNTest, CellMonitorWithNoServingGsmOrUmtsCellChangesNothingAndLogsNothing) {
    dict->set("Mobile Country Code", Value("001"));
    SystemLogCapture cap;
    section.updateWithData(
        cellMonitorRecord({
            cell(kTSCellMonitorRadioAccessTechnologyGSM, kTSCellMonitorCellTypeNeighbor, 310, 10, 1),
            cell(kTSCellMonitorRadioAccessTechnologyUMTS, kTSCellMonitorCellTypeNeighbor, 310, 10, 1),
            cell(kTSCellMonitorRadioAccessTechnologyLTE, kTSCellMonitorCellTypeServing, 310, 10, 1),
            cell(kTSCellMonitorRadioAccessTechnologyUTRAN2, kTSCellMonitorCellTypeServing, 310, 10, 1),
        }),
        kCellMonitor);
    EXPECT_EQ(dict->size(), 1u);
    EXPECT_EQ(text("Mobile Country Code"), "001");
    EXPECT_TRUE(onlyEntryLine(cap));
}

// --- 0x7132: PLMN selection mode ----------------------------------------------------

TEST_F(ServingPLMNTest, SelectionModeTable) {
    const std::pair<uint8_t, const char*> rows[] = {
        {0, "Automatic"},          {1, "Manual"},  {2, "Limited"}, {3, "LIMITED_ROUTINE_ACQ"},
        {4, "LIMITED_MANUAL_ACQ"}, {5, "Unknown"}, {255, "Unknown"},
    };
    for (const auto& [value, expected] : rows) {
        section.updateWithData(selectionModeRecord(value), kRegistrationState);
        EXPECT_EQ(text("PLMN Sel Mod"), expected) << "value " << int(value);
    }
}

TEST_F(ServingPLMNTest, SelectionModeRecordShorterThan16IsIgnoredSilently) {
    SystemLogCapture cap;
    section.updateWithData(RecordBuilder::ordinary(0x7132, 15).u8(14, 1).build(), kRegistrationState);
    EXPECT_TRUE(dict->empty());
    EXPECT_TRUE(onlyEntryLine(cap));
}

// --- 0x7135: serving PLMN and area --------------------------------------------------

TEST_F(ServingPLMNTest, ServiceTypeTable) {
    const std::pair<uint8_t, const char*> rows[] = {
        {0, "NO_SERVICE"},      {1, "CS_ONLY"}, {2, "PS_ONLY"},   {3, "CS_PS_SERVICE"},
        {4, "LIMITED_SERVICE"}, {5, "Unknown"}, {255, "Unknown"},
    };
    for (const auto& [value, expected] : rows) {
        section.updateWithData(plmnRecord(value, 0x13, 0xF0, 0x01, 0, 0).build(), kServingPLMNAndArea);
        EXPECT_EQ(text("Service Type"), expected) << "value " << int(value);
    }
}

TEST_F(ServingPLMNTest, ThreeDigitMncAndRoutingAreaCode) {
    // 0x21 0x43 0x65: MCC 1,2,3; MNC 5,6,4 (byte 17 low, byte 17 high, byte 16 high).
    section.updateWithData(plmnRecord(1, 0x21, 0x43, 0x65, 0xFFFF, 255).build(), kServingPLMNAndArea);
    EXPECT_EQ(text("Mobile Country Code"), "123");
    EXPECT_EQ(text("Mobile Network Code"), "564");
    EXPECT_EQ(text("Location Area Code"), "65535");
    EXPECT_EQ(text("Routing Area Code"), "255");
    EXPECT_EQ(text("Service Type"), "CS_ONLY");
}

TEST_F(ServingPLMNTest, HighNibbleBlankRuleTestsTheWholeByte) {
    // 0x9A: low nibble A is blank, high nibble 9 is a digit; 0xA9: the reverse.
    section.updateWithData(plmnRecord(1, 0x9A, 0xA9, 0xA9, 0, 0).build(), kServingPLMNAndArea);
    EXPECT_EQ(text("Mobile Country Code"), " 99");
    EXPECT_EQ(text("Mobile Network Code"), "9  ");
}

TEST_F(ServingPLMNTest, KeysAreWrittenInTheOrderMccMncLacRacServiceType) {
    section.updateWithData(plmnRecord(3, 0x13, 0xF0, 0x01, 0x1234, 5).build(), kServingPLMNAndArea);
    EXPECT_EQ(dict->keys(), (std::vector<std::string>{"Mobile Country Code", "Mobile Network Code",
                                                      "Location Area Code", "Routing Area Code", "Service Type"}));
}

TEST_F(ServingPLMNTest, LongerRecordIsDecodedFromTheSameOffsets) {
    section.updateWithData(plmnRecord(2, 0x13, 0xF0, 0x01, 0x0102, 9).resize(64).build(), kServingPLMNAndArea);
    EXPECT_EQ(text("Location Area Code"), "258");
    EXPECT_EQ(text("Routing Area Code"), "9");
    EXPECT_EQ(text("Service Type"), "PS_ONLY");
}

// --- 0xFF0001: cell-monitor list ----------------------------------------------------

TEST_F(ServingPLMNTest, CellMonitorServingUmtsCellGivesPlainNumbers) {
    SystemLogCapture cap;
    section.updateWithData(
        cellMonitorRecord({cell(kTSCellMonitorRadioAccessTechnologyUMTS, kTSCellMonitorCellTypeServing, 310, 10, 4660)}),
        kCellMonitor);
    EXPECT_EQ(text("Mobile Country Code"), "310");
    EXPECT_EQ(text("Mobile Network Code"), "10");
    EXPECT_EQ(text("Location Area Code"), "4660");
    EXPECT_EQ(dict->size(), 3u);
    EXPECT_TRUE(onlyEntryLine(cap));
}

TEST_F(ServingPLMNTest, CellMonitorServingGsmCellIsRead) {
    section.updateWithData(
        cellMonitorRecord({cell(kTSCellMonitorRadioAccessTechnologyGSM, kTSCellMonitorCellTypeServing, 234, 15, 77)}),
        kCellMonitor);
    EXPECT_EQ(text("Mobile Country Code"), "234");
    EXPECT_EQ(text("Mobile Network Code"), "15");
    EXPECT_EQ(text("Location Area Code"), "77");
}

TEST_F(ServingPLMNTest, CellMonitorFirstMatchingElementWins) {
    section.updateWithData(
        cellMonitorRecord({
            cell(kTSCellMonitorRadioAccessTechnologyGSM, kTSCellMonitorCellTypeNeighbor, 1, 1, 1),
            cell(kTSCellMonitorRadioAccessTechnologyLTE, kTSCellMonitorCellTypeServing, 2, 2, 2),
            cell(nullptr, kTSCellMonitorCellTypeServing, 3, 3, 3),             // no technology: skipped
            cell(kTSCellMonitorRadioAccessTechnologyUMTS, nullptr, 4, 4, 4),   // no cell type: skipped
            cell(kTSCellMonitorRadioAccessTechnologyGSM, kTSCellMonitorCellTypeServing, 5, 5, 5),
            cell(kTSCellMonitorRadioAccessTechnologyUMTS, kTSCellMonitorCellTypeServing, 6, 6, 6),
        }),
        kCellMonitor);
    EXPECT_EQ(text("Mobile Country Code"), "5");
    EXPECT_EQ(text("Mobile Network Code"), "5");
    EXPECT_EQ(text("Location Area Code"), "5");
}

TEST_F(ServingPLMNTest, CellMonitorMissingMccLogsItsLineAndTheOthersAreWritten) {
    dict->set("Mobile Country Code", Value("001"));
    SystemLogCapture cap;
    section.updateWithData(
        cellMonitorRecord({cell(kTSCellMonitorRadioAccessTechnologyUMTS, kTSCellMonitorCellTypeServing, std::nullopt, 10, 4660)}),
        kCellMonitor);
    EXPECT_TRUE(cap.contains(SystemLog::kError, "ServingPLMN: Failed to retrieve MCC\n"));
    EXPECT_EQ(text("Mobile Country Code"), "001");
    EXPECT_EQ(text("Mobile Network Code"), "10");
    EXPECT_EQ(text("Location Area Code"), "4660");
}

TEST_F(ServingPLMNTest, CellMonitorMissingMncLogsItsLineAndTheOthersAreWritten) {
    SystemLogCapture cap;
    section.updateWithData(
        cellMonitorRecord({cell(kTSCellMonitorRadioAccessTechnologyGSM, kTSCellMonitorCellTypeServing, 310, std::nullopt, 4660)}),
        kCellMonitor);
    EXPECT_TRUE(cap.contains(SystemLog::kError, "ServingPLMN: Failed to retrieve MNC\n"));
    EXPECT_EQ(text("Mobile Country Code"), "310");
    EXPECT_EQ(text("Mobile Network Code"), "<absent>");
    EXPECT_EQ(text("Location Area Code"), "4660");
}

TEST_F(ServingPLMNTest, CellMonitorMissingLacLogsItsLineAndTheOthersAreWritten) {
    SystemLogCapture cap;
    section.updateWithData(
        cellMonitorRecord({cell(kTSCellMonitorRadioAccessTechnologyGSM, kTSCellMonitorCellTypeServing, 310, 10, std::nullopt)}),
        kCellMonitor);
    EXPECT_TRUE(cap.contains(SystemLog::kError, "ServingPLMN: Failed to retrieve LAC\n"));
    EXPECT_EQ(text("Mobile Country Code"), "310");
    EXPECT_EQ(text("Mobile Network Code"), "10");
    EXPECT_EQ(text("Location Area Code"), "<absent>");
}

TEST_F(ServingPLMNTest, CellMonitorNonNumericValueCountsAsMissing) {
    auto d = cell(kTSCellMonitorRadioAccessTechnologyUMTS, kTSCellMonitorCellTypeServing, std::nullopt, 10, 20);
    d.asDictionary()->set(kTSCellMonitorMCC, Value("310"));
    SystemLogCapture cap;
    section.updateWithData(cellMonitorRecord({d}), kCellMonitor);
    EXPECT_TRUE(cap.contains(SystemLog::kError, "ServingPLMN: Failed to retrieve MCC\n"));
    EXPECT_FALSE(dict->contains("Mobile Country Code"));
    EXPECT_EQ(text("Mobile Network Code"), "10");
}

TEST_F(ServingPLMNTest, CellMonitorMissingAllThreeLogsAllThreeLines) {
    SystemLogCapture cap;
    section.updateWithData(
        cellMonitorRecord({cell(kTSCellMonitorRadioAccessTechnologyUMTS, kTSCellMonitorCellTypeServing,
                                std::nullopt, std::nullopt, std::nullopt)}),
        kCellMonitor);
    const auto lines = cap.lines();
    ASSERT_EQ(lines.size(), 4u);
    EXPECT_EQ(lines[1].text, "ServingPLMN: Failed to retrieve MCC\n");
    EXPECT_EQ(lines[2].text, "ServingPLMN: Failed to retrieve MNC\n");
    EXPECT_EQ(lines[3].text, "ServingPLMN: Failed to retrieve LAC\n");
    EXPECT_TRUE(dict->empty());
}

TEST_F(ServingPLMNTest, CellMonitorBinaryPropertyListIsRead) {
    section.updateWithData(
        cellMonitorRecord({cell(kTSCellMonitorRadioAccessTechnologyUMTS, kTSCellMonitorCellTypeServing, 460, 0, 9)},
                          /*binary=*/true),
        kCellMonitor);
    EXPECT_EQ(text("Mobile Country Code"), "460");
    EXPECT_EQ(text("Mobile Network Code"), "0");
    EXPECT_EQ(text("Location Area Code"), "9");
}

TEST_F(ServingPLMNTest, CellMonitorXmlPropertyListIsRead) {
    section.updateWithData(
        cellMonitorRecord({cell(kTSCellMonitorRadioAccessTechnologyGSM, kTSCellMonitorCellTypeServing, 460, 1, 10)},
                          /*binary=*/false),
        kCellMonitor);
    EXPECT_EQ(text("Mobile Country Code"), "460");
    EXPECT_EQ(text("Mobile Network Code"), "1");
    EXPECT_EQ(text("Location Area Code"), "10");
}

TEST_F(ServingPLMNTest, CellMonitorParseFailureLogsBothLinesAndChangesNothing) {
    dict->set("Mobile Country Code", Value("001"));
    SystemLogCapture cap;
    // 13..: bytes that are neither an XML nor a binary property list.
    section.updateWithData(RecordBuilder::extra(0x0001).bytes(13, {'n', 'o', 't', ' ', 'a', ' ', 'p', 'l', 'i', 's', 't'}).build(),
                           kCellMonitor);
    const auto lines = cap.lines();
    ASSERT_EQ(lines.size(), 3u);
    EXPECT_EQ(lines[1].priority, SystemLog::kError);
    EXPECT_EQ(lines[1].text, "Cell Info Array data could not be constructed");
    EXPECT_EQ(lines[2].priority, SystemLog::kError);
    EXPECT_EQ(lines[2].text, "Failed to get Cell Array\n");
    EXPECT_EQ(dict->size(), 1u);
    EXPECT_EQ(text("Mobile Country Code"), "001");
}

TEST_F(ServingPLMNTest, CellMonitorEmptyPayloadIsAParseFailure) {
    SystemLogCapture cap;
    section.updateWithData(RecordBuilder::extra(0x0001).build(), kCellMonitor);  // 13 bytes: no payload
    EXPECT_TRUE(cap.contains(SystemLog::kError, "Cell Info Array data could not be constructed"));
    EXPECT_TRUE(cap.contains(SystemLog::kError, "Failed to get Cell Array\n"));
    EXPECT_TRUE(dict->empty());
}

TEST_F(ServingPLMNTest, CellMonitorRootThatIsNotAnArrayIsTreatedAsEmpty) {
    auto root = Dictionary::create();
    root->set(kTSCellMonitorCellRadioAccessTechnology, Value(kTSCellMonitorRadioAccessTechnologyGSM));
    root->set(kTSCellMonitorCellType, Value(kTSCellMonitorCellTypeServing));
    root->set(kTSCellMonitorMCC, Value::integer(310));
    SystemLogCapture cap;
    section.updateWithData(RecordBuilder::extraPropertyList(0x0001, Value(root)), kCellMonitor);
    EXPECT_TRUE(dict->empty());
    EXPECT_TRUE(onlyEntryLine(cap));
}

TEST_F(ServingPLMNTest, CellMonitorEmptyArrayChangesNothing) {
    SystemLogCapture cap;
    section.updateWithData(cellMonitorRecord({}), kCellMonitor);
    EXPECT_TRUE(dict->empty());
    EXPECT_TRUE(onlyEntryLine(cap));
}

TEST_F(ServingPLMNTest, WhicheverSourceCameLastIsShown) {
    section.updateWithData(plmnRecord(3, 0x13, 0xF0, 0x01, 0x1234, 0).build(), kServingPLMNAndArea);
    EXPECT_EQ(text("Mobile Network Code"), "10 ");
    section.updateWithData(
        cellMonitorRecord({cell(kTSCellMonitorRadioAccessTechnologyUMTS, kTSCellMonitorCellTypeServing, 310, 10, 4660)}),
        kCellMonitor);
    EXPECT_EQ(text("Mobile Network Code"), "10");
    EXPECT_EQ(text("Service Type"), "CS_PS_SERVICE");  // a key 0xFF0001 does not carry keeps its value
    section.updateWithData(plmnRecord(3, 0x13, 0xF0, 0x01, 0x1234, 0).build(), kServingPLMNAndArea);
    EXPECT_EQ(text("Mobile Network Code"), "10 ");
}

}  // namespace
}  // namespace vantorel

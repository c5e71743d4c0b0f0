// SimInfoTest: tests SimInfo (Part 5.6 "SIM Info": SIM elementary files of the 0xFF0000 extra record).
#include "LogGenerator/MVK_GSM/SimInfo.h"

#include "Platform/RecordBuilder.h"
#include "Platform/SystemLog.h"
#include "Platform/SystemLogCapture.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"

#include <gtest/gtest.h>

namespace vantorel {
namespace {

constexpr int32_t kSimFiles = 0xFF0000;

// The 0xFF0000 extra record: payload from offset 13 is the serialised SIM-file dictionary.
Bytes simRecord(const DictionaryRef& files, bool binary = false) {
    return RecordBuilder::extraPropertyList(0x0000, Value(files), binary);
}

// The SIM-file table of Part 5.6, in its order.
const std::pair<const char*, const char*> kTable[] = {
    {"kSimFile_ICCID", "EF-ICCID"},
    {"kSimFile_MSISDN", "EF-MSISDN"},
    {"kSimFile_MBDN", "EF-3GPP MAIL BOX DIALING NUMBER"},
    {"kSimFile_HPPLMN", "EF-HPPLMN SEARCH PERIOD"},
    {"kSimFile_LOCI", "EF-LOCI"},
    {"kSimFile_PSLOCI", "EF-GPRS/PS-LOCI"},
    {"kSimFile_ACC", "EF-ACCESS CONTROL CLASS"},
    {"kSimFile_AD", "EF-ADMINISTRATIVE DATA"},
    {"kSimFile_FPLMN", "EF-FPLMN"},
    {"kSimFile_AHPLMN", "EF-ACTING HPLMN"},
    {"kSimFile_RATMODE", "EF-RAT MODE"},
    {"kSimFile_PNN", "EF-PLMN NETWORK NAME"},
    {"kSimFile_OPL", "EF-OPERATOR PLMN LIST"},
    {"kSimFile_OPLMNAcT", "EF-OPLMNAcT"},
};

class SimInfoTest : public ::testing::Test {
protected:
    void SetUp() override { section.updateSectionRef(Value(dict)); }

    DictionaryRef dict = Dictionary::create();
    SimInfo section;
};

TEST_F(SimInfoTest, NameAndLogCodesFollowTheSectionTable) {
    EXPECT_EQ(section.getSectionName(), "SIM Info");
    EXPECT_EQ(section.getLogCodeArray(), (std::vector<int32_t>{0xFF0000}));
}

TEST_F(SimInfoTest, EveryUpdateLogsSimInfoAtWarningPriority) {
    SystemLogCapture cap;
    section.updateWithData(simRecord(Dictionary::create()), kSimFiles);
    const auto lines = cap.lines();
    ASSERT_EQ(lines.size(), 1u);
    EXPECT_EQ(lines[0].priority, SystemLog::kWarning);
    EXPECT_EQ(lines[0].text, "SimInfo");
}

TEST_F(SimInfoTest, UnknownCodeIsLoggedAndChangesNothing) {
    auto files = Dictionary::create();
    files->set("kSimFile_ICCID", Value("8901"));
    SystemLogCapture cap;
    section.updateWithData(simRecord(files), 0xFF0001);
    EXPECT_TRUE(cap.contains(SystemLog::kError, "Received an unknown log message: 16711681"));
    EXPECT_TRUE(dict->empty());
}

// --- Edge cases worth testing (Part 5.6) --------------------------------------------

TEST_F(SimInfoTest, DictionaryHoldingOnlyICCIDChangesOnlyEFICCID) {
    dict->set("EF-MSISDN", Value("old msisdn"));
    auto files = Dictionary::create();
    files->set("kSimFile_ICCID", Value("89014103211118510720"));
    section.updateWithData(simRecord(files), kSimFiles);
    EXPECT_EQ(dict->keys(), (std::vector<std::string>{"EF-MSISDN", "EF-ICCID"}));
    EXPECT_EQ(dict->get("EF-ICCID"), Value("89014103211118510720"));
    EXPECT_EQ(dict->get("EF-MSISDN"), Value("old msisdn"));
}

TEST_F(SimInfoTest, DictionaryHoldingOnlyKeysNotInTheTableChangesNothing) {
    dict->set("EF-ICCID", Value("old"));
    auto files = Dictionary::create();
    files->set("kSimFile_IMSI", Value("310410123456789"));
    files->set("EF-ICCID", Value("display key, not a SIM-file key"));
    section.updateWithData(simRecord(files), kSimFiles);
    EXPECT_EQ(dict->size(), 1u);
    EXPECT_EQ(dict->get("EF-ICCID"), Value("old"));
}

TEST_F(SimInfoTest, EmptyPayloadRaisesTheErrorAndLogsSimFileDictionaryDataCouldNotBeConstructed) {
    dict->set("EF-ICCID", Value("old"));
    SystemLogCapture cap;
    EXPECT_THROW(section.updateWithData(RecordBuilder::extra(0x0000).build(), kSimFiles), SectionError);  // 13 bytes
    EXPECT_TRUE(cap.contains(SystemLog::kError, "SIM File dictionary data could not be constructed"));
    EXPECT_EQ(dict->size(), 1u);
    EXPECT_EQ(dict->get("EF-ICCID"), Value("old"));
}

// --- Algorithm ------------------------------------------------------------------------

TEST_F(SimInfoTest, MalformedPayloadRaisesTheErrorAndWritesNothing) {
    SystemLogCapture cap;
    // 13..: bytes that are neither an XML nor a binary property list.
    EXPECT_THROW(section.updateWithData(RecordBuilder::extra(0x0000).bytes(13, {'<', 'x', 'm', 'l'}).build(), kSimFiles),
                 SectionError);
    EXPECT_EQ(cap.count(SystemLog::kError, "SIM File dictionary data could not be constructed"), 1);
    EXPECT_TRUE(dict->empty());
}

TEST_F(SimInfoTest, EveryTableRowMapsToItsDisplayKeyInTableOrder) {
    auto files = Dictionary::create();
    // Inserted in reverse, so the display order can only come from the table.
    for (auto it = std::rbegin(kTable); it != std::rend(kTable); ++it)
        files->set(it->first, Value(std::string("value of ") + it->first));
    section.updateWithData(simRecord(files), kSimFiles);
    std::vector<std::string> expectedKeys;
    for (const auto& [simKey, displayKey] : kTable) {
        expectedKeys.push_back(displayKey);
        EXPECT_EQ(dict->get(displayKey), Value(std::string("value of ") + simKey)) << displayKey;
    }
    EXPECT_EQ(dict->keys(), expectedKeys);
}

TEST_F(SimInfoTest, ValuesAreStoredUnchangedWhateverTheirType) {
    auto files = Dictionary::create();
    const Value data = Value::data({0x98, 0x10, 0x14, 0x30});
    const Value number = Value::integer(60);
    auto nested = Dictionary::create();
    nested->set("Record 1", Value::data({0x01, 0x02}));
    const Value array = Value(Array::of({Value("a"), Value::integer(2)}));
    files->set("kSimFile_ICCID", data);
    files->set("kSimFile_HPPLMN", number);
    files->set("kSimFile_PNN", Value(nested));
    files->set("kSimFile_FPLMN", array);
    section.updateWithData(simRecord(files), kSimFiles);
    EXPECT_EQ(dict->get("EF-ICCID"), data);
    EXPECT_EQ(dict->get("EF-HPPLMN SEARCH PERIOD"), number);
    EXPECT_EQ(dict->get("EF-PLMN NETWORK NAME"), Value(nested));
    EXPECT_EQ(dict->get("EF-FPLMN"), array);
}

TEST_F(SimInfoTest, BinaryPropertyListIsRead) {
    auto files = Dictionary::create();
    files->set("kSimFile_MSISDN", Value("+15551234567"));
    files->set("kSimFile_AD", Value::data({0x00, 0x00, 0x00, 0x02}));
    section.updateWithData(simRecord(files, /*binary=*/true), kSimFiles);
    EXPECT_EQ(dict->get("EF-MSISDN"), Value("+15551234567"));
    EXPECT_EQ(dict->get("EF-ADMINISTRATIVE DATA"), Value::data({0x00, 0x00, 0x00, 0x02}));
}

TEST_F(SimInfoTest, XmlPropertyListIsRead) {
    auto files = Dictionary::create();
    files->set("kSimFile_OPLMNAcT", Value("00F110"));
    section.updateWithData(simRecord(files, /*binary=*/false), kSimFiles);
    EXPECT_EQ(dict->get("EF-OPLMNAcT"), Value("00F110"));
}

TEST_F(SimInfoTest, AbsentFilesKeepTheirEarlierValues) {
    auto first = Dictionary::create();
    first->set("kSimFile_ICCID", Value("iccid 1"));
    first->set("kSimFile_LOCI", Value("loci 1"));
    section.updateWithData(simRecord(first), kSimFiles);
    auto second = Dictionary::create();
    second->set("kSimFile_LOCI", Value("loci 2"));
    section.updateWithData(simRecord(second), kSimFiles);
    EXPECT_EQ(dict->get("EF-ICCID"), Value("iccid 1"));
    EXPECT_EQ(dict->get("EF-LOCI"), Value("loci 2"));
}

TEST_F(SimInfoTest, RootThatIsNotADictionaryWritesNothingAndRaisesNothing) {
    SystemLogCapture cap;
    EXPECT_NO_THROW(section.updateWithData(
        RecordBuilder::extraPropertyList(0x0000, Value(Array::of({Value("kSimFile_ICCID")}))), kSimFiles));
    EXPECT_TRUE(dict->empty());
    EXPECT_EQ(cap.lines().size(), 1u);  // the entry line only
}

}  // namespace
}  // namespace vantorel

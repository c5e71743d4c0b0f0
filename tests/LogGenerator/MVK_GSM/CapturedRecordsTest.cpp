// CapturedRecordsTest: replays the real captures' 0x7130, 0x7131, 0x7132, 0x7135 and 0x7150 records through the Part 5.2 sections, routed as Part 5.1 orders them.
#include "LogGenerator/ClassIndex.h"
#include "LogGenerator/MVK_GSM/EquivalentPLMNList.h"
#include "LogGenerator/MVK_GSM/ProcessCO.h"
#include "LogGenerator/MVK_GSM/ProcessCS.h"
#include "LogGenerator/MVK_GSM/ProcessPS.h"
#include "LogGenerator/MVK_GSM/ServingPLMN.h"
#include "Platform/SystemLog.h"
#include "Platform/SystemLogCapture.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"
#include "TelephonyService/Replay/QmdlReader.h"

#include <gtest/gtest.h>

#include <map>
#include <memory>
#include <string>

namespace vantorel {
namespace {

RecordedLog readCapture(const char* name) { return QmdlReader::readFile(std::string(VANTOREL_CAPTURES_DIR) + "/" + name); }

// The five sections of Part 5.2 that these codes reach, created in the order of Part 5.1's
// section table (rows 8, 14, 15, 17, 21), so that getSubscribers gives Part 5.1's call
// order: 0x7132 reaches Process PS, Process CO, Serving PLMN, Process CS.
class CapturedCodesIndex : public ClassIndex {
public:
    CapturedCodesIndex() {
        processPS = createSection<ProcessPS>();
        processCO = createSection<ProcessCO>();
        servingPLMN = createSection<ServingPLMN>();
        equivalentPLMNList = createSection<EquivalentPLMNList>();
        processCS = createSection<ProcessCS>();
        processPS->updateSectionRef(Value(ps));
        processCO->updateSectionRef(Value(co));
        servingPLMN->updateSectionRef(Value(plmn));
        equivalentPLMNList->updateSectionRef(Value(eplmns));
        processCS->updateSectionRef(Value(cs));
    }

    // Part 3.2's routing loop, for one recorded entry.
    void deliver(const RecordedEntry& entry) const {
        if (const SectionList* subscribers = getSubscribers(entry.logCode))
            for (Base* section : *subscribers) section->updateWithData(entry.record, entry.logCode);
    }

    std::unique_ptr<ProcessPS> processPS;
    std::unique_ptr<ProcessCO> processCO;
    std::unique_ptr<ServingPLMN> servingPLMN;
    std::unique_ptr<EquivalentPLMNList> equivalentPLMNList;
    std::unique_ptr<ProcessCS> processCS;
    DictionaryRef ps = Dictionary::create();
    DictionaryRef co = Dictionary::create();
    DictionaryRef plmn = Dictionary::create();
    DictionaryRef cs = Dictionary::create();
    ArrayRef eplmns = Array::create();
};

std::string text(const DictionaryRef& dict, const std::string& key) {
    const Value* v = dict->find(key);
    return v && v->asString() ? *v->asString() : std::string("<absent>");
}

std::vector<std::pair<std::string, std::string>> plmnPairs(const Array& list) {
    std::vector<std::pair<std::string, std::string>> out;
    for (const Value& v : list) {
        auto d = v.asDictionary();
        if (d) out.emplace_back(text(d, "Mobile Country Code"), text(d, "Mobile Network Code"));
    }
    return out;
}

const RecordedEntry* firstEntry(const RecordedLog& log, uint16_t code, size_t payloadByte, uint8_t value) {
    for (const RecordedEntry& e : log.entries)
        if (e.logCode == code && e.record.size() > 13 + payloadByte && e.record[13 + payloadByte] == value) return &e;
    return nullptr;
}

TEST(MVK_GSMCapturedRecordsTest, EveryCaptureHoldsTheCodesItsReadmeLists) {
    const std::map<std::string, std::map<uint16_t, size_t>> expected = {
        {"qmdl_example.qmdl", {{0x7130, 17}, {0x7131, 11}, {0x7132, 4}, {0x7150, 1}}},
        {"offline_log_example.mi2log", {{0x7130, 7}, {0x7131, 2}, {0x7132, 2}, {0x7150, 1}}},
        {"cmcc.mi2log", {{0x7130, 68}, {0x7131, 55}, {0x7132, 8}, {0x7135, 13}, {0x7150, 7}}},
        {"sprint.mi2log", {{0x7130, 520}, {0x7131, 11}, {0x7132, 18}, {0x7150, 94}}},
    };
    for (const auto& [file, counts] : expected) {
        const RecordedLog log = readCapture(file.c_str());
        ASSERT_TRUE(log.ok()) << log.error;
        for (const auto& [code, n] : counts) EXPECT_EQ(log.count(code), n) << file << " code " << code;
    }
}

TEST(MVK_GSMCapturedRecordsTest, EveryCapturedStateRecordShowsATableTextAndNothingIsRejected) {
    for (const char* file : {"qmdl_example.qmdl", "offline_log_example.mi2log", "cmcc.mi2log", "sprint.mi2log"}) {
        const RecordedLog log = readCapture(file);
        ASSERT_TRUE(log.ok()) << log.error;
        CapturedCodesIndex index;
        SystemLogCapture cap;
        size_t delivered = 0;
        for (const RecordedEntry& e : log.entries) {
            if (!index.getSubscribers(e.logCode)) continue;
            index.deliver(e);
            ++delivered;
            for (const auto& dict : {index.ps, index.co, index.plmn, index.cs})
                for (const auto& [key, value] : *dict)
                    EXPECT_NE(*value.asString(), "Unknown") << file << ": " << key << " after code " << e.logCode;
        }
        EXPECT_GT(delivered, 0u) << file;
        for (const auto& line : cap.lines())
            EXPECT_NE(line.priority, SystemLog::kError) << file << ": " << line.text;
    }
}

TEST(MVK_GSMCapturedRecordsTest, QmdlExampleEndsInTheStatesOfItsLastRecords) {
    const RecordedLog log = readCapture("qmdl_example.qmdl");
    ASSERT_TRUE(log.ok()) << log.error;
    CapturedCodesIndex index;
    for (const RecordedEntry& e : log.entries) index.deliver(e);
    // Last 0x7130: 03 05 00; last 0x7131: 13 06 00; last 0x7132: 01 00 00; 0x7150: count 0.
    EXPECT_EQ(text(index.ps, "MM State"), "GMM_REGISTERED");
    EXPECT_EQ(text(index.ps, "MM Sub State"), "GMM_NO_CELL_AVAILABLE");
    EXPECT_EQ(text(index.ps, "Attach Reject Cause"), "GMM_GU1_UPDATED");
    EXPECT_EQ(text(index.ps, "MM Service State"), "REG_STATE_IDLE");
    EXPECT_EQ(text(index.cs, "MM State"), "MM_IDLE");
    EXPECT_EQ(text(index.cs, "MM Sub State"), "MM_NO_CELL_AVAILABLE");
    EXPECT_EQ(text(index.cs, "LU Reject Cause"), "UPDATED");
    EXPECT_EQ(text(index.cs, "MM Service State"), "REG_STATE_IDLE");
    EXPECT_EQ(index.co->keys(), (std::vector<std::string>{"MM Service State", "MM State"}));
    EXPECT_EQ(text(index.co, "MM State"), "MM_IDLE");
    EXPECT_EQ(text(index.plmn, "PLMN Sel Mod"), "Automatic");
    EXPECT_TRUE(index.eplmns->empty());
}

TEST(MVK_GSMCapturedRecordsTest, CmccServingPLMNShowsChinaMobile460And00WithTrailingBlank) {
    const RecordedLog log = readCapture("cmcc.mi2log");
    ASSERT_TRUE(log.ok()) << log.error;
    CapturedCodesIndex index;
    for (const RecordedEntry& e : log.entries) index.deliver(e);
    // The last 0x7135: 14 = 03, 15..17 = 64 F0 00, 18..19 = 11 D6, 20 = 64.
    EXPECT_EQ(text(index.plmn, "Mobile Country Code"), "460");
    EXPECT_EQ(text(index.plmn, "Mobile Network Code"), "00 ");
    EXPECT_EQ(text(index.plmn, "Location Area Code"), "4566");
    EXPECT_EQ(text(index.plmn, "Routing Area Code"), "100");
    EXPECT_EQ(text(index.plmn, "Service Type"), "CS_PS_SERVICE");
}

TEST(MVK_GSMCapturedRecordsTest, CmccNoServiceRecordShowsBlankPLMNDigits) {
    const RecordedLog log = readCapture("cmcc.mi2log");
    ASSERT_TRUE(log.ok()) << log.error;
    // The first 0x7135 with service type 0 (payload byte 1 = record offset 14):
    // 15..20 = FF FF FF FF FF ..: every BCD nibble is a filler.
    const RecordedEntry* e = firstEntry(log, 0x7135, 1, 0x00);
    ASSERT_NE(e, nullptr);
    CapturedCodesIndex index;
    index.deliver(*e);
    EXPECT_EQ(text(index.plmn, "Service Type"), "NO_SERVICE");
    EXPECT_EQ(text(index.plmn, "Mobile Country Code"), "   ");
    EXPECT_EQ(text(index.plmn, "Mobile Network Code"), "   ");
    EXPECT_EQ(text(index.plmn, "Location Area Code"), "65535");
}

// The captured 0x7150 version carries BCD PLMNs; the spec's single-digit reading (Part 5.2,
// kept unchanged) makes these numbers of them.
TEST(MVK_GSMCapturedRecordsTest, CapturedEquivalentPLMNRecordsDecodeWithTheSingleDigitReading) {
    const RecordedLog cmcc = readCapture("cmcc.mi2log");
    ASSERT_TRUE(cmcc.ok()) << cmcc.error;
    // 16 = count 1; 17..22 = 64 F0 70 FF FF FF.
    const RecordedEntry* one = firstEntry(cmcc, 0x7150, 3, 0x01);
    ASSERT_NE(one, nullptr);
    CapturedCodesIndex index;
    index.deliver(*one);
    EXPECT_EQ(plmnPairs(*index.eplmns), (std::vector<std::pair<std::string, std::string>>{{"11375", "26805"}}));
    // 16 = count 0: the list is emptied.
    const RecordedEntry* none = firstEntry(cmcc, 0x7150, 3, 0x00);
    ASSERT_NE(none, nullptr);
    index.deliver(*none);
    EXPECT_TRUE(index.eplmns->empty());

    const RecordedLog sprint = readCapture("sprint.mi2log");
    ASSERT_TRUE(sprint.ok()) << sprint.error;
    // 13..16 = 13 00 21 01 (count 1); 17..22 = 13 01 94 FF FF FF.
    const RecordedEntry* first = firstEntry(sprint, 0x7150, 1, 0x00);
    ASSERT_NE(first, nullptr);
    index.deliver(*first);
    EXPECT_EQ(plmnPairs(*index.eplmns), (std::vector<std::pair<std::string, std::string>>{{"3635", "2905"}}));
}

}  // namespace
}  // namespace vantorel

// CapturedRecordsTest: replays the real captures' GSM/UMTS registration records through their sections, in the decoder's routing order.
#include "LogGenerator/ClassIndex.h"
#include "LogGenerator/MVK_GSM/EquivalentPLMNList.h"
#include "LogGenerator/MVK_GSM/ProcessCO.h"
#include "LogGenerator/MVK_GSM/ProcessCS.h"
#include "LogGenerator/MVK_GSM/ProcessPS.h"
#include "LogGenerator/MVK_GSM/ServingPLMN.h"
#include "LogGenerator/SectionTesting.h"
#include "TelephonyService/Replay/QmdlReader.h"

#include <gtest/gtest.h>

#include <memory>
#include <string>

namespace vantorel {
namespace {

using sectiontest::render;

RecordedLog readCapture(const std::string& name) {
    return QmdlReader::readFile(std::string(VANTOREL_CAPTURES_DIR) + "/" + name);
}

// The five sections these codes reach, created in the order that makes 0x7132 reach
// Process PS, Process CO, Serving PLMN, then Process CS.
struct CapturedCodesIndex : ClassIndex {
    void deliver(const RecordedEntry& entry) const {
        if (const SectionList* subscribers = getSubscribers(entry.logCode))
            for (Base* section : *subscribers) section->updateWithData(entry.record, entry.logCode);
    }
    template <class Section>
    std::unique_ptr<Section> bound(Value container) {
        auto section = createSection<Section>();
        section->updateSectionRef(container);
        return section;
    }

    DictionaryRef ps = Dictionary::create(), co = Dictionary::create(), plmn = Dictionary::create(),
                  cs = Dictionary::create();
    ArrayRef eplmns = Array::create();
    std::unique_ptr<ProcessPS> processPS = bound<ProcessPS>(Value(ps));
    std::unique_ptr<ProcessCO> processCO = bound<ProcessCO>(Value(co));
    std::unique_ptr<ServingPLMN> servingPLMN = bound<ServingPLMN>(Value(plmn));
    std::unique_ptr<EquivalentPLMNList> equivalentPLMNList = bound<EquivalentPLMNList>(Value(eplmns));
    std::unique_ptr<ProcessCS> processCS = bound<ProcessCS>(Value(cs));
};

// The first entry of a code whose payload byte (record offset 13 + n) has the value.
const RecordedEntry* firstEntry(const RecordedLog& log, uint16_t code, size_t payloadByte, uint8_t value) {
    for (const RecordedEntry& e : log.entries)
        if (e.logCode == code && e.record.size() > 13 + payloadByte && e.record[13 + payloadByte] == value) return &e;
    return nullptr;
}

TEST(CapturedRecords, EveryCapturedStateRecordShowsATableTextNothingIsRejectedAndTheLastRecordsWin) {
    // qmdl_example's last 0x7130: 03 05 00; last 0x7131: 13 06 00; last 0x7132: 01 00 00; 0x7150: count 0.
    // cmcc's last 0x7135: 14 = 03, 15..17 = 64 F0 00, 18..19 = 11 D6, 20 = 64.
    const std::pair<const char*, const char*> rows[] = {
        {"qmdl_example.qmdl",
         "{MM Service State=REG_STATE_IDLE, MM State=GMM_REGISTERED, MM Sub State=GMM_NO_CELL_AVAILABLE, "
         "Attach Reject Cause=GMM_GU1_UPDATED} {MM Service State=REG_STATE_IDLE, MM State=MM_IDLE} "
         "{PLMN Sel Mod=Automatic} {MM Service State=REG_STATE_IDLE, MM State=MM_IDLE, "
         "MM Sub State=MM_NO_CELL_AVAILABLE, LU Reject Cause=UPDATED} []"},
        {"offline_log_example.mi2log", nullptr},
        {"cmcc.mi2log",
         "{MM State=GMM_REGISTERED, MM Sub State=GMM_NO_CELL_AVAILABLE, Attach Reject Cause=GMM_GU1_UPDATED, "
         "MM Service State=REG_STATE_IDLE} {MM State=MM_IDLE, MM Service State=REG_STATE_IDLE} {PLMN Sel Mod=Automatic, "
         "Mobile Country Code=460, Mobile Network Code=00 , Location Area Code=4566, Routing Area Code=100, "
         "Service Type=CS_PS_SERVICE} {MM State=MM_IDLE, MM Sub State=MM_NO_CELL_AVAILABLE, LU Reject Cause=UPDATED, "
         "MM Service State=REG_STATE_IDLE} []"},
        {"sprint.mi2log", nullptr},
    };
    for (const auto& [file, finalStates] : rows) {
        const RecordedLog log = readCapture(file);
        ASSERT_TRUE(log.ok() && log.count(0x7130) > 0) << file << log.error;
        CapturedCodesIndex index;
        SystemLogCapture capture;
        for (const RecordedEntry& e : log.entries) {
            index.deliver(e);
            for (const auto& dict : {index.ps, index.co, index.plmn, index.cs})
                for (const auto& [key, value] : *dict)
                    EXPECT_NE(render(value), "Unknown") << file << ": " << key << " after code " << e.logCode;
        }
        EXPECT_TRUE(sectiontest::errorLines(capture).empty()) << file;
        if (finalStates) {
            EXPECT_EQ(render(Value(index.ps)) + " " + render(Value(index.co)) + " " + render(Value(index.plmn)) + " " +
                          render(Value(index.cs)) + " " + render(Value(index.eplmns)),
                      finalStates);
        }
    }
}

TEST(CapturedRecords, CmccServingPLMNWithoutServiceShowsEveryBCDNibbleAndTheLACAsFillers) {
    const RecordedLog log = readCapture("cmcc.mi2log");
    ASSERT_TRUE(log.ok()) << log.error;
    const RecordedEntry* noService = firstEntry(log, 0x7135, 1, 0x00);
    ASSERT_NE(noService, nullptr);
    CapturedCodesIndex fresh;
    fresh.deliver(*noService);
    EXPECT_EQ(render(Value(fresh.plmn)), "{Mobile Country Code=   , Mobile Network Code=   , Location Area Code=65535, "
                                         "Routing Area Code=100, Service Type=NO_SERVICE}");
}

// The phones' 0x7150 records carry BCD PLMN identities: the registered PLMN at 13..15,
// the count at 16, the equivalent PLMNs from 17, then 0xFF filler.
TEST(CapturedRecords, EquivalentPLMNRecordsShowThePhonesBCDPLMNs) {
    const RecordedLog cmcc = readCapture("cmcc.mi2log");
    const RecordedLog sprint = readCapture("sprint.mi2log");
    ASSERT_TRUE(cmcc.ok() && sprint.ok());
    struct Row {
        const RecordedEntry* entry;
        const char* expected;
    };
    const Row rows[] = {
        {firstEntry(cmcc, 0x7150, 3, 0x01), "[{Mobile Country Code=460, Mobile Network Code=07}]"},  // 64 F0 70
        {firstEntry(cmcc, 0x7150, 3, 0x00), "[]"},                                                  // count 0
        {firstEntry(sprint, 0x7150, 1, 0x00), "[{Mobile Country Code=311, Mobile Network Code=490}]"},  // 13 01 94
        {firstEntry(sprint, 0x7150, 1, 0x01), "[{Mobile Country Code=310, Mobile Network Code=120}]"},  // 13 00 21
    };
    CapturedCodesIndex index;
    for (const Row& row : rows) {
        ASSERT_NE(row.entry, nullptr) << row.expected;
        index.deliver(*row.entry);
        EXPECT_EQ(render(Value(index.eplmns)), row.expected);
    }
}

}  // namespace
}  // namespace vantorel

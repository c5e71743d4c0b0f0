// MVKSectionsTest: the GSM/UMTS registration sections, each fed built records and checked by what it shows.
#include "LogGenerator/ArrayLock.h"
#include "LogGenerator/MVK_GSM/EquivalentPLMNList.h"
#include "LogGenerator/MVK_GSM/PDPContextList.h"
#include "LogGenerator/MVK_GSM/ProcessCO.h"
#include "LogGenerator/MVK_GSM/ProcessCS.h"
#include "LogGenerator/MVK_GSM/ProcessPS.h"
#include "LogGenerator/MVK_GSM/ServingPLMN.h"
#include "LogGenerator/MVK_GSM/SimInfo.h"
#include "LogGenerator/SectionTesting.h"
#include "Platform/SystemLogCapture.h"
#include "support/HostilePlist.h"

#include <gtest/gtest.h>

namespace vantorel {
namespace {

using testing::withNulCharacter;

using namespace sectiontest;

// A 16-byte ordinary record with bytes 13, 14 and 15 set (the state records' layout).
Bytes stateRecord(uint16_t code, uint8_t b13, uint8_t b14, uint8_t b15, size_t length = 16) {
    return RecordBuilder::ordinary(code, 16).u8(13, b13).u8(14, b14).u8(15, b15).resize(length).build();
}

template <class Section>
std::string showState(const Bytes& record, int32_t code) {
    return Bound<Section>().feed(record, code).shown();
}

TEST(MMStateSections, StateRecordsShowTheTableTextsOfTheirBytes) {
    std::string (*const CS)(const Bytes&, int32_t) = showState<ProcessCS>;
    std::string (*const CO)(const Bytes&, int32_t) = showState<ProcessCO>;
    std::string (*const PS)(const Bytes&, int32_t) = showState<ProcessPS>;
    struct Row {
        std::string (*show)(const Bytes&, int32_t);
        uint16_t code;
        uint8_t b13, b14, b15;
        size_t length;
        const char* expected;
    };
    const Row rows[] = {
        {CS, 0x7131, 19, 8, 0, 16, "{MM State=MM_IDLE, MM Sub State=MM_NORMAL_SERVICE, LU Reject Cause=UPDATED}"},
        // 4 is a gap in the MM state table; 9 and 4 lie past the other two.
        {CS, 0x7131, 4, 9, 4, 16, "{MM State=Unknown, MM Sub State=Unknown, LU Reject Cause=Unknown}"},
        {CS, 0x7131, 19, 8, 0, 15, "{}"},
        {CS, 0x7131, 3, 8, 1, 40, "{MM State=MM_LOCATION_UPDATE_INITIATED, MM Sub State=MM_NORMAL_SERVICE, "
                                  "LU Reject Cause=NOT_UPDATED}"},
        {CS, 0x7132, 6, 0, 0, 16, "{MM Service State=REG_STATE_OFFLINE}"},
        {CO, 0x7131, 19, 8, 0, 16, "{MM State=MM_IDLE}"},
        {CO, 0x7132, 0, 0, 0, 16, "{MM Service State=REG_STATE_INACTIVE}"},
        {PS, 0x7130, 3, 9, 3, 16, "{MM State=GMM_REGISTERED, MM Sub State=GMM_ATTEMPING_TO_UPDATE, "
                                  "Attach Reject Cause=GMM_GU3_ROUTING_AREA_NOT_ALLOWED}"},
        {PS, 0x7130, 7, 13, 4, 16, "{MM State=Unknown, MM Sub State=Unknown, Attach Reject Cause=Unknown}"},
        {PS, 0x7132, 1, 0, 0, 16, "{MM Service State=REG_STATE_IDLE}"},
        {PS, 0x7130, 3, 9, 3, 15, "{}"},
    };
    for (const Row& row : rows)
        EXPECT_EQ(row.show(stateRecord(row.code, row.b13, row.b14, row.b15, row.length), row.code), row.expected);
}

// 0x7135: 14 service type, 15..17 BCD PLMN, 18..19 LAC big-endian, 20 RAC; 28 bytes.
Bytes plmnRecord(std::initializer_list<uint8_t> bytes14to20, size_t length = 28) {
    return RecordBuilder::ordinary(0x7135, 28).bytes(14, bytes14to20).resize(length).build();
}

TEST(ServingPLMNSection, RecordsShowBCDDigitsAreaCodesAndTableTexts) {
    struct Row {
        Bytes record;
        int32_t code;
        const char* expected;
    };
    const Row rows[] = {
        {plmnRecord({3, 0x13, 0xF0, 0x01, 0x12, 0x34, 5}), 0x7135,
         "{Mobile Country Code=310, Mobile Network Code=10 , Location Area Code=4660, Routing Area Code=5, "
         "Service Type=CS_PS_SERVICE}"},
        // Three-digit MNC: MNC3 is the high nibble of byte 16.
        {plmnRecord({1, 0x32, 0x54, 0x10, 0x00, 0x01, 0}), 0x7135,
         "{Mobile Country Code=234, Mobile Network Code=015, Location Area Code=1, Routing Area Code=0, "
         "Service Type=CS_ONLY}"},
        // Filler nibbles show as blanks; 0x9F's high nibble 9 is a digit, 0xAF's A is not.
        {plmnRecord({5, 0xAF, 0xF2, 0x9F, 0xFF, 0xFF, 255}), 0x7135,
         "{Mobile Country Code=  2, Mobile Network Code= 9 , Location Area Code=65535, Routing Area Code=255, "
         "Service Type=Unknown}"},
        {plmnRecord({3, 0x13, 0xF0, 0x01, 0x12, 0x34, 5}, 27), 0x7135, "{}"},
        {RecordBuilder::ordinary(0x7132, 16).u8(14, 1).build(), 0x7132, "{PLMN Sel Mod=Manual}"},
        {RecordBuilder::ordinary(0x7132, 16).u8(14, 5).build(), 0x7132, "{PLMN Sel Mod=Unknown}"},
        {RecordBuilder::ordinary(0x7132, 15).u8(14, 1).build(), 0x7132, "{}"},
    };
    for (const Row& row : rows) EXPECT_EQ(showState<ServingPLMN>(row.record, row.code), row.expected) << row.expected;
}

TEST(ServingPLMNSection, TheFirstServingGSMOrUMTSCellOfTheCellMonitorGivesPlainNumbers) {
    const char* const umts = kTSCellMonitorRadioAccessTechnologyUMTS;
    const char* const gsm = kTSCellMonitorRadioAccessTechnologyGSM;
    const char* const serving = kTSCellMonitorCellTypeServing;
    const char* const neighbour = kTSCellMonitorCellTypeNeighbor;
    const std::pair<Bytes, const char*> rows[] = {
        {cellMonitor({cell(umts, neighbour, {{kTSCellMonitorMCC, 1}, {kTSCellMonitorMNC, 1}, {kTSCellMonitorLAC, 1}}),
                      cell(gsm, serving, {{kTSCellMonitorMCC, 460}, {kTSCellMonitorMNC, 0}, {kTSCellMonitorLAC, 4566}}),
                      cell(umts, serving, {{kTSCellMonitorMCC, 310}, {kTSCellMonitorMNC, 10}, {kTSCellMonitorLAC, 9}})}),
         "{Mobile Country Code=460, Mobile Network Code=0, Location Area Code=4566}"},
        // A missing number leaves its field out; the others are still shown.
        {cellMonitor({cell(umts, serving, {{kTSCellMonitorMCC, 310}, {kTSCellMonitorLAC, 9}})}, true),
         "{Mobile Country Code=310, Location Area Code=9}"},
        {cellMonitor({cell(kTSCellMonitorRadioAccessTechnologyUTRAN2, serving, {{kTSCellMonitorMCC, 1}})}), "{}"},
        {cellMonitor({cell(nullptr, serving, {}), cell(gsm, nullptr, {})}), "{}"},
        {RecordBuilder::extraPropertyList(1, Value(Dictionary::create())), "{}"},
        {RecordBuilder::extra(1, 20).bytes(13, {'n', 'o', 't', ' ', 'a', 'n', 'y'}).build(), "{}"},
    };
    for (const auto& [record, expected] : rows) EXPECT_EQ(showState<ServingPLMN>(record, 0xFF0001), expected);
}

// 0x7150: 16 count, entry i at 17 + 3i, six single-digit bytes (entries overlap by three).
Bytes plmnListRecord(uint8_t count, std::initializer_list<uint8_t> from17, size_t length) {
    return RecordBuilder::ordinary(0x7150, length).u8(16, count).bytes(17, from17).resize(length).build();
}

TEST(EquivalentPLMNListSection, EntriesOverlapStopAtTheRecordsEndAndEachRecordRebuildsTheList) {
    const Bytes two = plmnListRecord(2, {3, 1, 1, 0, 0, 0, 0, 0, 1}, 26);
    const char* const twoShown =
        "[{Mobile Country Code=310, Mobile Network Code=100}, {Mobile Country Code=0, Mobile Network Code=1}]";
    const std::pair<std::vector<Bytes>, const char*> rows[] = {
        {{two}, twoShown},
        {{plmnListRecord(3, {3, 1, 1, 0, 0, 0, 0, 0, 1}, 26)}, twoShown},  // the third entry is past the end
        {{two, plmnListRecord(0, {}, 17)}, "[]"},
        {{two, plmnListRecord(1, {1, 2, 3, 4, 5}, 22)}, "[]"},  // one byte short of an entry
        {{two, plmnListRecord(0, {}, 16)}, twoShown},        // a 16-byte record changes nothing
    };
    for (const auto& [records, expected] : rows)
        EXPECT_EQ(Bound<EquivalentPLMNList>(true).feed(records, 0x7150).shown(), expected);
}

TEST(EquivalentPLMNListSection, EntriesWithBytesAboveNineAreBCDPLMNIdentities) {
    const auto list = [](uint8_t count, std::initializer_list<uint8_t> from17, size_t length) {
        return Bound<EquivalentPLMNList>(true).feed(plmnListRecord(count, from17, length), 0x7150).shown();
    };
    const char* const sprint = "[{Mobile Country Code=311, Mobile Network Code=490}]";
    const std::pair<std::string, const char*> rows[] = {
        // As a phone writes it: 311-490 followed by unused 0xFF bytes.
        {list(1, {0x13, 0x01, 0x94, 0xFF, 0xFF, 0xFF}, 30), sprint},
        {list(2, {0x13, 0x00, 0x21, 0x13, 0x01, 0x94}, 23),
         "[{Mobile Country Code=310, Mobile Network Code=120}, {Mobile Country Code=311, Mobile Network Code=490}]"},
        // Leading zeros stay; a two-digit MNC drops its 0xF filler.
        {list(2, {0x02, 0xF8, 0x10, 0x00, 0xF1, 0x10}, 23),
         "[{Mobile Country Code=208, Mobile Network Code=01}, {Mobile Country Code=001, Mobile Network Code=01}]"},
        // A BCD entry needs only its three bytes inside the record; the list ends at the next.
        {list(3, {0x13, 0x01, 0x94}, 20), sprint},
        {list(2, {0x13, 0x01, 0x94, 0x13}, 22), sprint},
        // Six single-digit bytes keep the digit-per-byte reading, without leading zeros.
        {list(1, {0, 0, 0, 1, 1, 0, 0xFF}, 24), "[{Mobile Country Code=1, Mobile Network Code=10}]"},
    };
    for (const auto& [shown, expected] : rows) EXPECT_EQ(shown, expected);
}

Bytes pdpRecord(Value root) { return RecordBuilder::extraPropertyList(2, root); }

Value context(const char* apn) {
    auto d = Dictionary::create();
    d->set("APN", apn);
    d->set("Context ID", Value::integer(1));
    return Value(d);
}

TEST(PDPContextListSection, AnArrayReplacesTheListAnythingElseLeavesIt) {
    const Bytes internet = pdpRecord(Value(Array::of({context("internet")})));
    const char* const internetShown = "[{APN=internet, Context ID=<integer>}]";
    const std::pair<std::vector<Bytes>, const char*> rows[] = {
        {{internet}, internetShown},
        {{internet, pdpRecord(Value(Array::create()))}, "[]"},
        {{internet, pdpRecord(context("x"))}, internetShown},
        {{internet, RecordBuilder::extra(2, 16).bytes(13, {'x', 'y', 'z'}).build()}, internetShown},
        {{internet, RecordBuilder::extra(2).bytes(13, withNulCharacter(Value(Array::of({context("\u00e9-")})))).build()},
         internetShown},
    };
    SystemLogCapture log;
    for (const auto& [records, expected] : rows)
        EXPECT_EQ(Bound<PDPContextList>(true).feed(records, 0xFF0002).shown(), expected);
    EXPECT_TRUE(log.contains(SystemLog::kWarning, "Extra record 0xFF0002 skipped: string holds a NUL character"));
}

Bytes simRecord(std::initializer_list<std::pair<const char*, Value>> files) {
    auto d = Dictionary::create();
    for (const auto& [key, value] : files) d->set(key, value);
    return RecordBuilder::extraPropertyList(0, Value(d), true);
}

TEST(SimInfoSection, KnownFilesAreShownAsDeliveredInTableOrderAbsentOnesKeepTheirValuesBadPayloadsThrow) {
    Bound<SimInfo> sim;
    sim.feed(simRecord({{"kSimFile_MSISDN", "+8613800"}, {"kSimFile_ICCID", "898600"}, {"kSimFile_Unknown", "x"}}),
             0xFF0000);
    EXPECT_EQ(sim.shown(), "{EF-ICCID=898600, EF-MSISDN=+8613800}");
    sim.feed(simRecord({{"kSimFile_OPLMNAcT", Value::data({0x64, 0xF0})}, {"kSimFile_ICCID", Value::integer(7)}}),
             0xFF0000);
    EXPECT_EQ(sim.shown(), "{EF-ICCID=<integer>, EF-MSISDN=+8613800, EF-OPLMNAcT=<data>}");
    // A root that is not a dictionary holds no files.
    sim.feed(RecordBuilder::extraPropertyList(0, Value(Array::of({"a"}))), 0xFF0000);
    EXPECT_EQ(sim.shown(), "{EF-ICCID=<integer>, EF-MSISDN=+8613800, EF-OPLMNAcT=<data>}");
    // A payload that is not a property list raises the section's error and changes nothing.
    EXPECT_THROW(sim.feed(RecordBuilder::extra(0, 18).bytes(13, {'n', 'o', 'p', 'e'}).build(), 0xFF0000), SectionError);
    EXPECT_EQ(sim.shown(), "{EF-ICCID=<integer>, EF-MSISDN=+8613800, EF-OPLMNAcT=<data>}");
}

}  // namespace
}  // namespace vantorel

// Tests for UTRANLogGenerator and UTRANClassIndex (Part 7.1): template choice, section order, start command, and the decoder end to end.
#include "LogGenerator/UTRAN/UTRANLogGenerator.h"

#include "LogGenerator/UTRAN/UTRANClassIndex.h"
#include "Model/VantorelModelNode.h"
#include "Platform/RecordBuilder.h"
#include "Platform/ResourceBundle.h"
#include "Platform/SystemLog.h"
#include "Platform/SystemLogCapture.h"
#include "Platform/TelephonyIdentifiers.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"

#include <QDir>
#include <QFile>
#include <QTemporaryDir>
#include <gtest/gtest.h>

#include <set>

using namespace vantorel;

namespace {

// A resource folder holding the given template names (each a copy of the real UTRAN template).
class TemplateFolder {
public:
    explicit TemplateFolder(std::initializer_list<const char*> names) {
        for (const char* n : names)
            QFile::copy(QStringLiteral(VANTOREL_TEMPLATES_DIR "/UTRAN.plist"), dir_.filePath(QString::fromUtf8(n)));
        ResourceBundle::setDirectory(dir_.path().toStdString());
    }
    ~TemplateFolder() { ResourceBundle::setDirectory(""); }

private:
    QTemporaryDir dir_;
};

MVKLogGenerator2& asTemplateGenerator(std::unique_ptr<LogGenerator>& g) {
    return dynamic_cast<MVKLogGenerator2&>(*g);
}

Value cell(const char* rat, const char* type, std::initializer_list<std::pair<const char*, int>> ints) {
    auto d = Dictionary::create();
    d->set(kTSCellMonitorCellRadioAccessTechnology, rat);
    d->set(kTSCellMonitorCellType, type);
    for (auto [k, v] : ints) d->set(k, Value::integer(v));
    return Value(d);
}

}  // namespace

TEST(UTRANLogGenerator, TwoResourcesUTRANAndUtranExtraTheFirstInListingOrderIsUsedTheMatchIgnoresCase) {
    TemplateFolder folder({"utran_extra.plist", "UTRAN.plist"});
    auto g = UTRANLogGenerator::generator();
    ASSERT_TRUE(g->isUsable());
    // Listed by name: "UTRAN.plist" sorts before "utran_extra.plist".
    EXPECT_EQ(asTemplateGenerator(g).templateName(), "UTRAN");

    TemplateFolder lowerOnly({"utran_extra.plist"});
    auto lower = UTRANLogGenerator::generator();
    EXPECT_EQ(asTemplateGenerator(lower).templateName(), "utran_extra");
}

TEST(UTRANLogGenerator, AResourceNamedMyUTRANTemplateMatches) {
    TemplateFolder folder({"Another.plist", "MyUTRANTemplate.plist"});
    SystemLogCapture capture;
    auto g = UTRANLogGenerator::generator();
    EXPECT_EQ(asTemplateGenerator(g).templateName(), "MyUTRANTemplate");
    EXPECT_TRUE(capture.contains(SystemLog::kError, "Created UTRANLogGenerator object"));
    Dictionary state;
    g->generateLogUsingState(state);
    EXPECT_TRUE(state.get("Display").asDictionary());
}

TEST(UTRANLogGenerator, NoResourceContainingUTRANLeavesAnUnusableDecoderAndLogsNothingOfIt) {
    TemplateFolder folder({"MVK_GSM.plist", "LTE.plist"});
    SystemLogCapture capture;
    auto g = UTRANLogGenerator::generator();
    EXPECT_FALSE(g->isUsable());
    EXPECT_FALSE(capture.containsText("Created UTRANLogGenerator object"));
    EXPECT_EQ(LogGenerator::generatorFromTechnology(kTSLogChannelTechnology_Morvek_UTRAN2), nullptr);
    // An uninitialised decoder is still safe to drive.
    Dictionary state;
    g->updateState(state, RecordBuilder::ordinary(0xD0E0, 15).u8(13, 1).build());
    EXPECT_TRUE(asTemplateGenerator(g).getStartCommand()->get("SetMorvekLogCodes").asArray()->empty());
}

TEST(UTRANLogGenerator, GeneratorFromTechnologyMapsUTRAN2ToTheUTRANDecoder) {
    auto g = LogGenerator::generatorFromTechnology(kTSLogChannelTechnology_Morvek_UTRAN2);
    ASSERT_TRUE(g);
    auto& t = asTemplateGenerator(g);
    EXPECT_EQ(t.templateName(), "UTRAN");
    EXPECT_TRUE(dynamic_cast<UTRANClassIndex*>(t.classIndex()));
}

TEST(UTRANClassIndex, SectionsAreCreatedInTableOrderSo0xD00CReachesTRCHBLERBeforeCCTRCHSIR) {
    UTRANClassIndex index;
    const SectionList* d00c = index.getSubscribers(0xD00C);
    ASSERT_TRUE(d00c);
    ASSERT_EQ(d00c->size(), 2u);
    EXPECT_EQ((*d00c)[0]->getSectionName(), "TRCH BLER");
    EXPECT_EQ((*d00c)[1]->getSectionName(), "CCTRCH SIR");
    const char* names[] = {"RRC Info", "Serving Cell Info", "Neighbor Cell List", "GSM Neighbor Cell List",
                           "TRCH BLER", "CCTRCH SIR", "PDP Context Info", "SIM Info"};
    for (const char* n : names) EXPECT_TRUE(index.getClass(n)) << n;
    EXPECT_EQ(*index.getSubscribers(0xFF0001), SectionList{index.getClass("Serving Cell Info")});
}

TEST(UTRANClassIndex, StartCommandHoldsExactlyTheSubscribedOrdinaryCodesAndExtraCodes012) {
    auto g = LogGenerator::generatorFromTechnology(kTSLogChannelTechnology_Morvek_UTRAN2);
    DictionaryRef command = g->getStartCommand();
    std::multiset<int64_t> ordinary, extra;
    for (const Value& v : *command->get("SetMorvekLogCodes").asArray()) ordinary.insert(*v.asInteger());
    for (const Value& v : *command->get("SetTsExtraCodes").asArray()) extra.insert(*v.asInteger());
    EXPECT_EQ(ordinary, (std::multiset<int64_t>{0xD0E0, 0xD0E2, 0xD00A, 0xD00E, 0xD00C}));
    EXPECT_EQ(extra, (std::multiset<int64_t>{0, 1, 2}));
}

TEST(UTRANLogGenerator, TheCompiledInTemplateHoldsEverySectionOnceWithTheContainerItNeeds) {
    auto tmpl = ResourceBundle::loadPropertyList("UTRAN", "plist");
    ASSERT_TRUE(tmpl);
    std::map<std::string, int> seen;
    std::map<std::string, Value::Type> types;
    std::function<void(const Value&)> walk = [&](const Value& v) {
        if (auto d = v.asDictionary())
            for (const auto& [k, child] : *d) {
                ++seen[k];
                types[k] = child.type();
                walk(child);
            }
        if (auto a = v.asArray())
            for (const Value& child : *a) walk(child);
    };
    walk(*tmpl);
    const std::pair<const char*, Value::Type> expected[] = {
        {"RRC Info", Value::Type::Dictionary},        {"Serving Cell Info", Value::Type::Dictionary},
        {"Neighbor Cell List", Value::Type::Array},   {"GSM Neighbor Cell List", Value::Type::Array},
        {"TRCH BLER", Value::Type::Array},            {"CCTRCH SIR", Value::Type::Array},
        {"PDP Context Info", Value::Type::Array},     {"SIM Info", Value::Type::Dictionary}};
    for (auto [name, type] : expected) {
        EXPECT_EQ(seen[name], 1) << name;
        EXPECT_EQ(types[name], type) << name;
    }
}

TEST(UTRANLogGenerator, BuiltRecordsInADisplayTreeOutEndToEnd) {
    auto g = LogGenerator::generatorFromTechnology(kTSLogChannelTechnology_Morvek_UTRAN2);
    Dictionary state;
    EXPECT_EQ(g->generateLogUsingState(state), nullptr);  // builds the display

    // RRC state: byte 13 valid = 1, byte 14 mode = 3 (Cell DCH); sent behind the 0x81 prefix.
    g->updateState(state, RecordBuilder::ordinary(0xD0E0, 15).u8(13, 1).u8(14, 3).buildWithPrefix());
    // Serving cell 0xD0E2: 14 restrictions, 15 URA ID, 17 UL UARFCN, 19 DL UARFCN, 21 Cell ID (s32), 25 bit 0.
    g->updateState(state, RecordBuilder::ordinary(0xD0E2, 26)
                              .u8(14, 0).u8(15, 7).u16(17, 10054).u16(19, 10055).u32(21, 31337).u8(25, 1)
                              .build());
    // Neighbour list 0xD00A: byte 16 = count << 1 (1 entry); entry 0 at 168:
    //   UARFCN 10088 in byte 0 + bits 0-5 of byte 1; Cell ID 5 in bits 6-7 of byte 1 + bits 0-4 of byte 2;
    //   Filter RSCP 128 in bits 5-7 of byte 2 + bits 0-4 of byte 3; Status 1 (MSET) in bits 5-6 of byte 3.
    const uint32_t uarfcn = 10088, cellId = 5, rscp = 128, status = 1;
    const uint32_t packed = uarfcn | (cellId << 14) | (rscp << 21) | (status << 29);
    g->updateState(state, RecordBuilder::ordinary(0xD00A, 184).u8(16, 1 << 1).u32(168, packed).build());
    // BLER/SIR 0xD00C: value at 14 with t = 1 in bits 6-11, c = 1 in bits 4-7 of byte 15;
    //   TRCH 0 at 17 (ID 3, BLER 9); CCTRCH 0 at 289 + 34 = 323 (ID 1, TSNUM 2, SIR 10..15).
    g->updateState(state, RecordBuilder::ordinary(0xD00C)
                              .u16(14, (1 << 6) | (1 << 12)).u8(17, 3).u8(18, 9)
                              .bytes(323, {1, 2, 10, 11, 12, 13, 14, 15})
                              .build());
    // Cell monitor 0xFF0001: the serving UTRAN2 cell.
    g->updateState(state, RecordBuilder::extraPropertyList(
                              1, Value(Array::of({cell(kTSCellMonitorRadioAccessTechnologyUTRAN2, kTSCellMonitorCellTypeServing,
                                                       {{kTSCellMonitorLAC, 0x5A1F}, {kTSCellMonitorCellId, 31337},
                                                        {kTSCellMonitorBandInfo, 34}, {kTSCellMonitorSCN, 77},
                                                        {kTSCellMonitorUARFCN, 10054}})}))));
    // SIM 0xFF0000 and PDP 0xFF0002.
    auto sim = Dictionary::create();
    sim->set("kSimFile_ICCID", "898600");
    g->updateState(state, RecordBuilder::extraPropertyList(0, Value(sim), true));
    auto pdp = Dictionary::create();
    pdp->set("APN", "cmnet");
    g->updateState(state, RecordBuilder::extraPropertyList(2, Value(Array::of({Value(pdp)}))));
    // Noise the decoder must shrug off: short, wrong type, unparsable SIM plist.
    g->updateState(state, Bytes{1, 2, 3});
    g->updateState(state, RecordBuilder(2, 0xD0E0, 15).build());
    g->updateState(state, RecordBuilder::extra(0, 20).bytes(13, {'n', 'o', 't', ' ', 'a'}).build());

    DictionaryRef display = g->generateLogUsingState(state);
    ASSERT_TRUE(display);
    PathDictionary paths;
    NodeRef root = VantorelModelNode::makeTreeFromObject(Value(display), paths);
    auto at = [&](const std::string& p) -> std::string {
        auto it = paths.find(p);
        return it != paths.end() && it->second->value() ? *it->second->value() : "<missing " + p + ">";
    };
    EXPECT_EQ(at("/Technology"), "UTRAN (TD-SCDMA)");
    EXPECT_EQ(at("/Serving Cell/RRC Info/State"), "Cell DCH");
    EXPECT_EQ(at("/Serving Cell/Serving Cell Info/URA ID"), "7");
    EXPECT_EQ(at("/Serving Cell/Serving Cell Info/Allowed Access"), "Emergency Calls Only");
    EXPECT_EQ(at("/Serving Cell/Serving Cell Info/Local Area Code"), "23071");
    EXPECT_EQ(at("/Serving Cell/Serving Cell Info/Cell Scrambling Code"), "77");
    EXPECT_EQ(at("/Serving Cell/Serving Cell Info/Downlink UARFCN"), "10054");
    EXPECT_EQ(at("/Neighbours/Neighbor Cell List/0/UARFCN"), "10088");
    EXPECT_EQ(at("/Neighbours/Neighbor Cell List/0/Cell ID"), "5");
    EXPECT_EQ(at("/Neighbours/Neighbor Cell List/0/Filter RSCP"), "0.500000");
    EXPECT_EQ(at("/Neighbours/Neighbor Cell List/0/Status"), "MSET");
    EXPECT_EQ(at("/Link Quality/TRCH BLER/0/TRCH BLER Measurement"), "9");
    EXPECT_EQ(at("/Link Quality/CCTRCH SIR/0/TSNUM"), "2");
    EXPECT_EQ(at("/Link Quality/CCTRCH SIR/0/SIR/5"), "15");
    EXPECT_EQ(at("/Packet Data/PDP Context Info/0/APN"), "cmnet");
    EXPECT_EQ(at("/SIM/SIM Info/EF-ICCID"), "898600");
    ASSERT_TRUE(paths.count("/Neighbours/GSM Neighbor Cell List"));
    EXPECT_TRUE(paths.at("/Neighbours/GSM Neighbor Cell List")->childNodes()->empty());
}

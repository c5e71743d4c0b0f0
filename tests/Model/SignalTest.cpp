// Tests the signal series: numbers read from display strings, the bounded series, the sampler's marks, and its keys on every emulated modem's tree.
#include "Model/SignalCatalogue.h"
#include "Model/SignalSampler.h"
#include "Model/SignalValue.h"

#include "LogGenerator/LogGenerator.h"
#include "Platform/TelephonyIdentifiers.h"
#include "PropertyList/Dictionary.h"
#include "TelephonyService/Emulator/CDMAScenario.h"
#include "TelephonyService/Emulator/GSMScenario.h"
#include "TelephonyService/Emulator/IFXScenario.h"
#include "TelephonyService/Emulator/LTEScenario.h"
#include "TelephonyService/Emulator/UTRANScenario.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <set>
#include <clocale>
#include <memory>

using namespace vantorel;

namespace {

TEST(SignalValue, TakesTheLeadingNumberWhateverTheLocale) {
    const struct {
        std::string display;
        std::optional<double> value;
    } rows[] = {
        {"-95.50 dBm", -95.5}, {"  +3 dB", 3},       {"0.179688", 0.179688}, {"12 (old)", 12}, {"17", 17},
        {"1.5.6", 1.5},        {"2,5 dB", 2},        {"-0.25%", -0.25},      {"5.dB", 5},      {"Not Present", {}},
        {"Unknown", {}},       {"-", {}},            {"", {}},               {"0x1A", {}},     {"nan dBm", {}},
        {"- 3 dB", {}},        {"N/A", {}},          {"inf", {}},            {std::string(400, '9'), {}},
    };
    // A German locale writes and reads "1,5": the parse must not follow it.
    const std::string previous = std::setlocale(LC_ALL, nullptr);
    for (const char* locale : {"C", "de_DE.utf8"}) {
        if (!std::setlocale(LC_ALL, locale)) continue;
        for (const auto& row : rows) {
            SCOPED_TRACE(std::string(locale) + " '" + row.display + "'");
            EXPECT_EQ(SignalValue::parse(row.display), row.value);
        }
    }
    std::setlocale(LC_ALL, previous.c_str());
}

// The display tree of `leaves` (path, display string), list entries as "0", "1", ...
PathDictionary treeOf(const std::vector<std::pair<std::string, std::string>>& leaves) {
    auto top = Dictionary::create();
    for (const auto& [path, text] : leaves) {
        DictionaryRef at = top;
        const std::vector<std::string> names = SignalCatalogue::components(path);
        for (size_t i = 0; i + 1 < names.size(); ++i) {
            if (!at->get(names[i]).isDictionary()) at->set(names[i], Value(Dictionary::create()));
            at = at->get(names[i]).asDictionary();
        }
        at->set(names.back(), Value(text));
    }
    PathDictionary index;
    VantorelModelNode::makeTreeFromObject(Value(top), index);
    return index;
}

// The display strings say "dBm" for a GSM level and an LTE margin, "dB" for a UMTS power, and
// nothing for TD-SCDMA's RSCP: the values, their units and the CSV headers come from the
// catalogue; a key it does not hold keeps the display string's unit.
TEST(SignalSampler, TakesUnitsAndScalesFromTheCatalogueNotFromTheDisplayStrings) {
    const std::string lte = kTSLogChannelTechnology_Morvek_LTE, gsm = kTSLogChannelTechnology_Morvek_GSM;
    const struct {
        std::string technology, key, leaf, shown;
        double value;
        std::string unit, title;
    } rows[] = {
        {lte, "/Serving Cell/Serving Cell Measurements/Srxlev", "", "37 dBm", 37, "dB", "(dB)"},
        {lte, "/Serving Cell/Serving Cell Measurements/Measured RSRP", "", "-87.75 dBm", -87.75, "dBm", "(dBm)"},
        {lte, "/Neighbours/Neighbor Cells List/[#1 Srxlev]/Srxlev", "/Neighbours/Neighbor Cells List/0/Srxlev", "22 dBm", 22, "dB", "(dB)"},
        {gsm, "/Serving Cell/GSM Serving Cell/RSSI", "", "36 dBm", 36, "level", "(level)"},
        {gsm, "/Cell Sets/Active Set/0/RSCP", "", "-81 dB", -81, "dBm", "(dBm)"},
        {gsm, "/GSM Neighbours/Neighboring Cells/0/RSSI", "", "23", 23, "level", "(level)"},
        {gsm, "/GSM Neighbours/Neighboring Cells/0/RSSI", "", "-70 dBm", 41, "level", "(level)"},  // the cell monitor's form
        {gsm, "/GSM Neighbours/Neighboring Cells/0/RSSI", "", "-115 dBm", 0, "level", "(level)"},  // below RxLev 1
        {kTSLogChannelTechnology_Morvek_UTRAN2, "/Neighbours/Neighbor Cell List/[Status=ASET]/Filter RSCP",
         "/Neighbours/Neighbor Cell List/0/Filter RSCP", "0.183594", -69, "dBm", "(dBm)"},
        {kTSLogChannelTechnology_Morvek_CDMA, "/Data Rates/Forward Link", "", "153.60 kbps", 153.6, "kbit/s", "(kbit/s)"},
        {kTSLogChannelTechnology_IFX, "/Serving Cell/Measurement/RxLev", "", "31", 31, "level", "(level)"},
        {lte, "/Serving Cell/Serving Cell Info/Download Bandwidth", "", "10 MHz", 10, "MHz", ""},  // not catalogued
        {lte, "/Serving Cell/Serving Cell Measurements/Srxlev", "", "Not Present", 0, "dB", "(dB)"},  // no value, still dB
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.key + " = " + row.shown);
        std::vector<std::pair<std::string, std::string>> leaves = {{row.leaf.empty() ? row.key : row.leaf, row.shown}};
        if (!row.leaf.empty()) leaves.push_back({row.leaf.substr(0, row.leaf.rfind('/')) + "/Status", "ASET"});
        SignalSampler sampler;
        sampler.setKeys({row.key});
        sampler.sample(0, row.technology, treeOf(leaves));
        const bool shown = SignalValue::parse(row.shown).has_value();
        EXPECT_EQ(sampler.lastRow().front(), shown ? std::optional<double>(row.value) : std::nullopt);
        ASSERT_EQ(sampler.quantity(row.key).has_value(), shown || !row.title.empty());
        if (sampler.quantity(row.key)) {
            EXPECT_EQ(sampler.quantity(row.key)->unitLabel(), row.unit);
        }
        EXPECT_EQ(sampler.columnTitle(row.key), row.title.empty() ? row.key : row.key + " " + row.title);
        // A CSV header given back as a key is the key.
        EXPECT_EQ(SignalCatalogue::keyOfColumn(sampler.columnTitle(row.key)), row.key);
    }
}

size_t valuesOf(const std::deque<SignalSeries::Point>& points) {
    return size_t(std::count_if(points.begin(), points.end(), [](const auto& p) { return !SignalSeries::isGap(p); }));
}

TEST(SignalSeries, ADayOfTicksStaysBoundedKeepingOrderBothEndsAndTheGaps) {
    SignalSeries series;
    constexpr int64_t kTicks = 24 * 3600 / 2;
    // k0 always has a value; k1 misses 5 ticks in every 1000; k2 every second tick.
    auto value = [](int key, int64_t t) -> std::optional<double> {
        if ((key == 1 && t % 1000 >= 995) || (key == 2 && t % 2)) return std::nullopt;
        return double(t);
    };
    for (int64_t t = 0; t < kTicks; ++t) {
        series.addTick(t * 2000);
        for (int k = 0; k < 3; ++k) series.add("k" + std::to_string(k), t * 2000, value(k, t));
    }
    size_t total = 0;
    for (const std::string& key : series.keys()) {
        const auto& points = series.points(key);
        SCOPED_TRACE(key);
        ASSERT_LE(points.size(), SignalSeries::kMaxPoints);
        for (size_t i = 1; i < points.size(); ++i) ASSERT_LT(points[i - 1].timeMs, points[i].timeMs);
        // The latest minutes stay at full resolution.
        EXPECT_EQ(points[points.size() - 2].timeMs, points.back().timeMs - 2000);
        total += points.size();
    }
    EXPECT_EQ(series.pointCount(), total);
    EXPECT_EQ(series.points("k0").front().timeMs, 0);
    EXPECT_GT(series.points("k0").size(), SignalSeries::kMaxPoints / 2);
    EXPECT_EQ(series.points("k0").back().timeMs, (kTicks - 1) * 2000);
    EXPECT_EQ(series.latest("k0"), double(kTicks - 1));
    EXPECT_EQ(series.latest("k2"), std::nullopt);  // the last tick was a gap
    // Every run of missing ticks still breaks k1's line, the oldest ones too.
    const auto& k1 = series.points("k1");
    EXPECT_EQ(k1.size() - valuesOf(k1), size_t(kTicks / 1000));
    EXPECT_LE(series.ticks().size(), SignalSeries::kMaxPoints);
    EXPECT_EQ(series.ticks().front(), 0);
    for (int m = 0; m < 5000; ++m) series.addMark({m, SignalSeries::Mark::Kind::Handover, ""});
    EXPECT_LE(series.marks().size(), SignalSeries::kMaxMarks);
    EXPECT_EQ(series.marks().front().timeMs, 0);
    EXPECT_EQ(series.marks().back().timeMs, 4999);
}

TEST(SignalSampler, MarksHandoversAndTechnologyChangesOncePerChange) {
    const std::string lte = kTSLogChannelTechnology_Morvek_LTE, utran = kTSLogChannelTechnology_Morvek_UTRAN2;
    SignalSampler sampler;
    sampler.setKeys({"/Serving Cell/Serving Cell Info/Physical Cell ID", "/nowhere"});
    // Leaves under "/Serving Cell/Serving Cell Info", one tick each.
    const std::pair<std::string, std::vector<std::pair<const char*, const char*>>> ticks[] = {
        {lte, {{"Physical Cell ID", "-"}, {"Download Frequency", "-"}}},     // nothing shown yet
        {lte, {{"Physical Cell ID", "301"}, {"Download Frequency", "6300"}}},  // first cell: no handover
        {lte, {{"Physical Cell ID", "301"}, {"Download Frequency", "6300"}}},
        {lte, {{"Physical Cell ID", "17"}}},                                   // frequency missing: no verdict
        {lte, {{"Physical Cell ID", "17"}, {"Download Frequency", "6300"}}},   // handover
        {utran, {{"Cell Scrambling Code", "11"}, {"Downlink UARFCN", "10055"}}},  // technology change only
        {utran, {{"Cell Scrambling Code", "24"}, {"Downlink UARFCN", "10055"}}},  // handover
    };
    int64_t time = 0;
    for (const auto& [technology, leaves] : ticks) {
        auto info = Dictionary::create(), serving = Dictionary::create(), top = Dictionary::create();
        for (const auto& [name, value] : leaves) info->set(name, Value(value));
        serving->set("Serving Cell Info", Value(info));
        top->set("Serving Cell", Value(serving));
        PathDictionary index;
        VantorelModelNode::makeTreeFromObject(Value(top), index);
        sampler.sample(time, technology, index);
        time += 2000;
    }

    std::vector<std::string> marks;
    for (const auto& m : sampler.series().marks())
        marks.push_back(std::to_string(m.timeMs) + (m.kind == SignalSeries::Mark::Kind::Handover ? " H " : " T ") + m.text);
    EXPECT_EQ(marks, (std::vector<std::string>{"8000 H Physical Cell ID 301 → 17", "10000 T LTE → UTRAN (TD-SCDMA)",
                                               "12000 H Cell Scrambling Code 11 → 24"}));
    // Chosen keys stay chosen across the technology change; the last tick had neither value.
    EXPECT_EQ(sampler.keys().size(), 2u);
    EXPECT_EQ(valuesOf(sampler.series().points("/Serving Cell/Serving Cell Info/Physical Cell ID")), 4u);
    EXPECT_EQ(sampler.lastRow(), (std::vector<std::optional<double>>{std::nullopt, std::nullopt}));
}

// Every default key holds a number at some tick of that technology's emulated modem,
// read through its decoder as the monitor does.
// Every default key holds a number at some tick of each emulated modem, read through
// its decoder as the monitor does, and the modem's cell changes are marked.
TEST(SignalSampler, DefaultKeysExistInEachDecodersTree) {
    std::unique_ptr<EmulatorScenario> modems[] = {std::make_unique<LTEScenario>(3), std::make_unique<UTRANScenario>(3),
                                                  std::make_unique<GSMScenario>(3), std::make_unique<CDMAScenario>(3),
                                                  std::make_unique<IFXScenario>(3)};
    for (auto& scenario : modems) {
        const std::string technology = scenario->technology();
        SCOPED_TRACE(technology);
        auto decoder = LogGenerator::generatorFromTechnology(technology);
        Dictionary state;
        SignalSampler sampler;
        // The catalogue's paths, "*" for any one component, against the tree's.
        std::set<std::string> unseen;
        for (const SignalCatalogue::Entry& entry : SignalCatalogue::entries(technology)) unseen.insert(entry.path);
        for (uint64_t tick = 0; tick < 150; ++tick) {
            for (const Bytes& record : scenario->recordsForTick(tick)) decoder->updateState(state, record);
            DictionaryRef display = decoder->generateLogUsingState(state);
            PathDictionary index;
            VantorelModelNode::makeTreeFromObject(display ? Value(display) : Value(), index);
            sampler.sample(int64_t(tick) * 2000, technology, index);
            for (const auto& [path, node] : index)
                for (auto it = unseen.begin(); it != unseen.end();) {
                    const auto want = SignalCatalogue::components(*it), have = SignalCatalogue::components(path);
                    bool same = node->value() && want.size() == have.size();
                    for (size_t i = 0; same && i < want.size(); ++i) same = want[i] == "*" || want[i] == have[i];
                    it = same ? unseen.erase(it) : std::next(it);
                }
        }
        // Not leaves of the tree: a list the UTRAN decoder keeps empty, and the BLER the
        // sampler computes from the CRC counts.
        for (const char* never : {"/Neighbours/GSM Neighbor Cell List/*/RSSI", "/Link Quality/BLER/Transport Channels/*/BLER %"})
            unseen.erase(never);
        EXPECT_EQ(unseen, std::set<std::string>{}) << "catalogue paths no tick of the modem showed";
        ASSERT_FALSE(SignalSampler::defaultKeys(technology).empty());
        for (const std::string& key : SignalSampler::defaultKeys(technology))
            EXPECT_FALSE(sampler.series().points(key).empty()) << key;
        EXPECT_FALSE(sampler.series().marks().empty()) << "no handover in 150 ticks";
    }
}

}  // namespace

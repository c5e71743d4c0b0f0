// Tests display paths that pick list entries by what they show, and the sampler's lines that follow the strongest cells through a reordering list.
#include "Model/DisplayPath.h"
#include "Model/SignalSampler.h"

#include "Platform/TelephonyIdentifiers.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"

#include <gtest/gtest.h>

#include <algorithm>

using namespace vantorel;

namespace {

using Leaves = std::vector<std::pair<std::string, std::string>>;

Value entry(const Leaves& leaves) {
    auto d = Dictionary::create();
    for (const auto& [k, v] : leaves) d->set(k, Value(v));
    return Value(d);
}

Value list(const std::vector<Leaves>& entries) {
    auto a = Array::create();
    for (const Leaves& e : entries) a->append(entry(e));
    return Value(a);
}

// {"Neighbours": {name: list, ...}} as the model indexes it.
PathDictionary tree(const std::vector<std::pair<std::string, Value>>& lists, const Leaves& more = {}) {
    auto neighbours = Dictionary::create(), top = Dictionary::create();
    for (const auto& [name, value] : lists) neighbours->set(name, value);
    top->set("Neighbours", Value(neighbours));
    for (const auto& [k, v] : more) top->set(k, Value(v));
    PathDictionary index;
    VantorelModelNode::makeTreeFromObject(Value(top), index);
    return index;
}

TEST(DisplayPath, ASelectorPicksTheEntryByWhatItShowsOrByRank) {
    const PathDictionary nodes = tree({
        {"Cells", list({{{"Physical Cell ID", "236"}, {"RSRP", "-98.00 dBm"}},
                        {{"Physical Cell ID", "78"}, {"RSRP", "-106.50 dBm"}},
                        {{"Physical Cell ID", "95"}, {"RSRP", "-101.00 dBm"}},
                        {{"Physical Cell ID", "7"}, {"RSRP", "-"}}})},
        {"UTRAN", list({{{"UARFCN", "10055"}, {"Cell ID", "11"}, {"RSCP", "0.17"}, {"Status", "ASET"}},
                        {{"UARFCN", "10096"}, {"Cell ID", "24"}, {"RSCP", "0.14"}, {"Status", "MSET"}},
                        {{"UARFCN", "10055"}, {"Cell ID", "50"}, {"RSCP", "0.20"}}})},
    });
    const std::vector<std::pair<std::string, const char*>> rows = {
        {"/Neighbours/Cells/1/RSRP", "-106.50 dBm"},
        {"/Neighbours/Cells/[Physical Cell ID=95]/RSRP", "-101.00 dBm"},
        {"/Neighbours/Cells/[Physical Cell ID=999]/RSRP", nullptr},
        {"/Neighbours/Cells/[#1 RSRP]/Physical Cell ID", "236"},
        {"/Neighbours/Cells/[#2 RSRP]/Physical Cell ID", "95"},
        {"/Neighbours/Cells/[#3 RSRP]/Physical Cell ID", "78"},
        {"/Neighbours/Cells/[#4 RSRP]/Physical Cell ID", nullptr},  // "-" is no number
        {"/Neighbours/UTRAN/[Status=ASET]/RSCP", "0.17"},
        {"/Neighbours/UTRAN/[#1 RSCP,Status!=ASET]/Cell ID", "50"},  // a missing Status is not ASET
        {"/Neighbours/UTRAN/[#2 RSCP,Status!=ASET]/Cell ID", "24"},
        {"/Neighbours/UTRAN/[UARFCN=10055,Cell ID=50]/RSCP", "0.20"},
        {"/Neighbours/UTRAN/[UARFCN=10096,Cell ID=11]/RSCP", nullptr},
        // What is not a selector finds nothing.
        {"/Neighbours/Cells/[#0 RSRP]/RSRP", nullptr},
        {"/Neighbours/Cells/[#x RSRP]/RSRP", nullptr},
        {"/Neighbours/Cells/[#1]/RSRP", nullptr},
        {"/Neighbours/Cells/[#1 ]/RSRP", nullptr},
        {"/Neighbours/Cells/[RSRP]/RSRP", nullptr},
        {"/Neighbours/Cells/[=95]/RSRP", nullptr},
        {"/Neighbours/Cells/[]/RSRP", nullptr},
        {"/Neighbours/Cells/[Physical Cell ID=95", nullptr},
        {"/Neighbours/Nowhere/[Physical Cell ID=95]/RSRP", nullptr},
    };
    for (const auto& [path, text] : rows) {
        const std::string* found = DisplayPath::leafText(path, nodes);
        EXPECT_EQ(found ? *found : std::string("(nothing)"), text ? text : "(nothing)") << path;
    }

    // A list position becomes the cell it shows, and finds that cell again.
    const std::vector<std::pair<std::string, std::string>> following = {
        {"/Neighbours/Cells/2/RSRP", "/Neighbours/Cells/[Physical Cell ID=95]/RSRP"},
        {"/Neighbours/UTRAN/1/RSCP", "/Neighbours/UTRAN/[UARFCN=10096,Cell ID=24]/RSCP"},
        {"/Neighbours/Cells", "/Neighbours/Cells"},
    };
    for (const auto& [path, stable] : following) {
        EXPECT_EQ(DisplayPath::following(path, nodes), stable);
        EXPECT_EQ(DisplayPath::resolve(stable, nodes), DisplayPath::resolve(path, nodes)) << stable;
    }

    const std::vector<std::pair<std::string, std::string>> labels = {
        {"/Neighbours/Cells/[Physical Cell ID=95,E-ARFCN=6300]/RSRP", "RSRP (PCI 95, EARFCN 6300)"},
        {"/Neighbours/Cells/[#2 RSRP]/RSRP", "RSRP (2nd strongest)"},
        {"/Neighbours/Cells/[#11 RSRP]/RSRP", "RSRP (11th strongest)"},
        {"/Neighbours/Cells/[#23 RSRP]/RSRP", "RSRP (23rd strongest)"},
        {"/Neighbours/UTRAN/[#1 RSCP,Status!=ASET]/RSCP", "RSCP (strongest)"},
        {"/Neighbours/UTRAN/[Status=ASET]/RSCP", "RSCP (Status ASET)"},
        {"/Serving Cell/RSRP", "RSRP"},
    };
    for (const auto& [path, label] : labels) EXPECT_EQ(DisplayPath::label(path), label);
}

// An LTE tick: serving cell 301 and its measured neighbours in the decoder's order.
PathDictionary lteTick(const std::vector<std::pair<const char*, const char*>>& neighbours) {
    std::vector<Leaves> entries;
    for (const auto& [pci, rsrp] : neighbours) entries.push_back({{"Physical Cell ID", pci}, {"Filtered RSRP", rsrp}});
    return tree({{"Measured Neighbor Cells", list(entries)}});
}

std::string cell(const char* pci) { return "/Neighbours/Measured Neighbor Cells/[Physical Cell ID=" + std::string(pci) + "]/Filtered RSRP"; }

TEST(SignalSampler, LinesFollowTheStrongestCellsWhateverTheirPlaceInTheList) {
    SignalSampler sampler;
    const std::string lte = kTSLogChannelTechnology_Morvek_LTE;
    const std::vector<std::vector<std::pair<const char*, const char*>>> ticks = {
        {{"10", "-100 dBm"}, {"20", "-90 dBm"}, {"30", "-110 dBm"}, {"40", "-120 dBm"}},
        {{"40", "-95 dBm"}, {"10", "-101 dBm"}, {"30", "-112 dBm"}, {"20", "-91 dBm"}},  // 40 rises, 30 drops out
        {{"20", "-92 dBm"}},
    };
    for (size_t t = 0; t < ticks.size(); ++t) sampler.sample(int64_t(t) * 2000, lte, lteTick(ticks[t]));

    auto values = [&](const std::string& key) {
        std::vector<std::string> shown;
        for (const auto& p : sampler.series().points(key))
            shown.push_back(SignalSeries::isGap(p) ? "gap" : std::to_string(int(p.value)));
        return shown;
    };
    EXPECT_EQ(values(cell("20")), (std::vector<std::string>{"-90", "-91", "-92"}));
    EXPECT_EQ(values(cell("10")), (std::vector<std::string>{"-100", "-101", "gap"}));
    EXPECT_EQ(values(cell("30")), (std::vector<std::string>{"-110", "gap"}));
    EXPECT_EQ(values(cell("40")), (std::vector<std::string>{"-95", "gap"}));
    const std::vector<std::string> plotted = sampler.plotKeys();
    EXPECT_EQ(std::count_if(plotted.begin(), plotted.end(), [](const std::string& k) { return DisplayPath::isRanked(k); }), 0);
    EXPECT_EQ(std::count(plotted.begin(), plotted.end(), cell("40")), 1);
    // The serving cell's identity is a CSV column, and a handover mark rather than a line.
    const std::string pci = "/Serving Cell/Serving Cell Info/Physical Cell ID";
    EXPECT_EQ(std::count(sampler.keys().begin(), sampler.keys().end(), pci), 1);
    EXPECT_EQ(std::count(plotted.begin(), plotted.end(), pci), 0);

    // The CSV columns rank the cells: the strongest now is 20, then none.
    const std::vector<std::string>& keys = sampler.keys();
    auto column = [&](const std::string& key) {
        const size_t i = size_t(std::find(keys.begin(), keys.end(), key) - keys.begin());
        return i < keys.size() ? sampler.lastRow()[i] : std::optional<double>(-1);
    };
    EXPECT_EQ(column("/Neighbours/Measured Neighbor Cells/[#1 Filtered RSRP]/Physical Cell ID"), 20);
    EXPECT_EQ(column("/Neighbours/Measured Neighbor Cells/[#1 Filtered RSRP]/Filtered RSRP"), -92);
    EXPECT_EQ(column("/Neighbours/Measured Neighbor Cells/[#2 Filtered RSRP]/Filtered RSRP"), std::nullopt);
}

TEST(SignalSampler, TheCellLinesStayWithinTheirBudget) {
    SignalSampler sampler;
    for (int t = 0; t < 100; ++t) {
        const std::string pci = std::to_string(t);
        sampler.sample(t * 2000, kTSLogChannelTechnology_Morvek_LTE, lteTick({{pci.c_str(), "-90 dBm"}}));
    }
    const std::vector<std::string> plotted = sampler.plotKeys();
    EXPECT_EQ(std::count_if(plotted.begin(), plotted.end(), [](const std::string& k) { return k.find("/[Physical") != k.npos; }),
              long(SignalSampler::kMaxCellLines));
    EXPECT_EQ(std::count(plotted.begin(), plotted.end(), cell("99")), 1) << "the newest cells stay";
    EXPECT_TRUE(sampler.series().points(cell("0")).empty()) << "the oldest go, points and all";
}

TEST(SignalSampler, UMTSBlockErrorRateIsTheShareOfCRCErrors) {
    const std::string key = "/Link Quality/BLER/Transport Channels/0/BLER %";
    const std::vector<std::tuple<const char*, const char*, std::optional<double>>> rows = {
        {"200", "5", 2.5}, {"200", "0", 0.0}, {"0", "0", std::nullopt}, {"-", "3", std::nullopt}};
    for (const auto& [received, errors, bler] : rows) {
        auto channel = Dictionary::create(), section = Dictionary::create(), quality = Dictionary::create(),
             top = Dictionary::create();
        channel->set("CRC Received", Value(received));
        channel->set("CRC Received in Error", Value(errors));
        auto channels = Array::create();
        channels->append(Value(channel));
        section->set("Transport Channels", Value(channels));
        quality->set("BLER", Value(section));
        top->set("Link Quality", Value(quality));
        PathDictionary index;
        VantorelModelNode::makeTreeFromObject(Value(top), index);
        EXPECT_EQ(SignalSampler::valueAt(key, index), bler) << received << " " << errors;
    }
}

}  // namespace

// Tests LTEScenario: its records as the LTE decoder displays them over a ten-minute drive (one serving cell in every section, slow fading, cell changes by hysteresis and time-to-trigger), and the malformed records it mixes in.
#include "TelephonyService/Emulator/LTEScenario.h"

#include "LogGenerator/LogGenerator.h"
#include "LogGenerator/SectionTesting.h"
#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "PropertyList/PropertyListSerialization.h"
#include "TelephonyService/LogMask.h"

#include <gtest/gtest.h>

#include <cmath>
#include <map>
#include <set>
#include <string>

namespace vantorel {
namespace {

using sectiontest::at;

constexpr uint64_t kTenMinutes = 1200;  // ticks of 500 ms
constexpr uint64_t kSeeds[] = {1, 2, 3, 4};

// What the display shows after one tick's records.
struct Shown {
    std::map<std::string, std::string> pci, earfcn;  // by section, "-" left out
    std::set<std::string> listedPcis;                // every neighbour list of the display
    bool measured = false;                           // the tick carried a measurement record
    double servingRsrp = 0;                          // filtered (connected) or average (idle), dBm
    std::map<std::string, double> neighbourRsrp;     // by PCI, from this tick's records
};

double dBm(const std::string& text) {
    return std::stod(text);
}

// Rows of a display list as PCI -> RSRP text under `level`.
std::map<std::string, std::string> rows(const DictionaryRef& display, const char* list, const char* level) {
    std::map<std::string, std::string> out;
    Value v(display);
    for (const char* key : {"2;Neighbours", list}) {
        const Value* next = v.asDictionary() ? v.asDictionary()->find(key) : nullptr;
        if (!next) {
            ADD_FAILURE() << "no " << key << " in the display";
            return out;
        }
        v = *next;
    }
    if (!v.asArray()) return out;
    for (const Value& row : *v.asArray()) {
        const DictionaryRef d = row.asDictionary();
        out[sectiontest::render(d->get("Physical Cell ID"))] = level ? sectiontest::render(d->get(level)) : "";
    }
    return out;
}

// The drive of a seed through the LTE decoder, the display read after every tick.
std::vector<Shown> drive(uint64_t seed, uint64_t ticks) {
    LTEScenario scenario(seed);
    auto decoder = LogGenerator::generatorFromTechnology(kTSLogChannelTechnology_Morvek_LTE);
    Dictionary state;
    decoder->generateLogUsingState(state);  // builds the display
    const DictionaryRef display = decoder->generateLogUsingState(state);  // the live one the records fill
    std::vector<Shown> out;
    for (uint64_t tick = 0; tick < ticks; ++tick) {
        std::set<int32_t> codes;
        for (const Bytes& record : scenario.recordsForTick(tick)) {
            if (auto c = LogMask::classify(record)) codes.insert(c->effectiveCode());
            decoder->updateState(state, record);
        }
        Shown s;
        const auto keep = [](std::map<std::string, std::string>& to, const char* section, const std::string& value) {
            if (value != "-" && value != "<missing>") to[section] = value;
        };
        const std::vector<std::string> info{"1;Serving Cell", "Serving Cell Info"};
        const std::vector<std::string> idle{"1;Serving Cell", "Serving Cell Measurements"};
        const std::vector<std::string> connected{"1;Serving Cell", "Connected mode LTE Intra-frequency Measurement"};
        const std::vector<std::string> reselection{"3;Reselection", "Reselection Candidates"};
        const auto field = [&](std::vector<std::string> path, const char* key) {
            path.push_back(key);
            return at(display, path);
        };
        keep(s.pci, "Serving Cell Info", field(info, "Physical Cell ID"));
        keep(s.pci, "Serving Cell Measurements", field(idle, "Physical Cell ID"));
        keep(s.pci, "Connected mode", field(connected, "Serving Physical Cell ID"));
        keep(s.pci, "Reselection Candidates", field(reselection, "Serving Cell ID"));
        keep(s.earfcn, "Serving Cell Info", field(info, "Download Frequency"));
        keep(s.earfcn, "Serving Cell Info (cell monitor)", field(info, "UARFCN"));
        keep(s.earfcn, "Serving Cell Measurements", field(idle, "E-ARFCN"));
        keep(s.earfcn, "Connected mode", field(connected, "E-ARFCN"));
        keep(s.earfcn, "Neighbor Measurements", at(display, {"2;Neighbours", "Neighbor Measurements", "E-ARFCN"}));
        keep(s.earfcn, "Reselection Candidates", field(reselection, "Serving EARFCN"));
        for (const char* list : {"Measured Neighbor Cells", "Detected Cells", "Neighbor Cells List"})
            for (const auto& [pci, unused] : rows(display, list, nullptr)) s.listedPcis.insert(pci);
        // The levels the cell-change rule works on, from the mode whose records this tick carried.
        if (codes.count(LogCode::kLTEIntraFreqMeasurement) && !codes.count(LogCode::kLTEServingCellMeasurement)) {
            s.measured = true;
            s.servingRsrp = dBm(field(connected, "Serving Filtered RSRP"));
            for (const auto& [pci, level] : rows(display, "Measured Neighbor Cells", "Filtered RSRP"))
                s.neighbourRsrp[pci] = dBm(level);
        } else if (codes.count(LogCode::kLTEIdleNeighbourMeasurements) && !codes.count(LogCode::kLTEIntraFreqMeasurement)) {
            s.measured = true;
            s.servingRsrp = dBm(field(idle, "Average RSRP"));
            for (const auto& [pci, level] : rows(display, "Neighbor Cells List", "Average RSRP"))
                s.neighbourRsrp[pci] = dBm(level);
        }
        out.push_back(std::move(s));
    }
    return out;
}

const std::vector<Shown>& tenMinutes(uint64_t seed) {
    static std::map<uint64_t, std::vector<Shown>> drives;
    auto it = drives.find(seed);
    if (it == drives.end()) it = drives.emplace(seed, drive(seed, kTenMinutes)).first;
    return it->second;
}

std::string servingPci(const Shown& s) {
    return s.pci.at("Serving Cell Info");
}

TEST(LTEScenario, EverySectionNamesTheOneServingCellWhichNoNeighbourListHolds) {
    for (uint64_t seed : kSeeds) {
        SCOPED_TRACE(seed);
        const std::vector<Shown>& shown = tenMinutes(seed);
        for (size_t tick = 0; tick < shown.size(); ++tick) {
            const Shown& s = shown[tick];
            std::set<std::string> pcis, earfcns;
            for (const auto& [section, pci] : s.pci) pcis.insert(pci);
            for (const auto& [section, earfcn] : s.earfcn) earfcns.insert(earfcn);
            ASSERT_EQ(pcis.size(), 1u) << "tick " << tick << ": " << ::testing::PrintToString(s.pci);
            ASSERT_EQ(earfcns.size(), 1u) << "tick " << tick << ": " << ::testing::PrintToString(s.earfcn);
            ASSERT_EQ(s.listedPcis.count(*pcis.begin()), 0u) << "tick " << tick << ": serving PCI listed as a neighbour";
        }
    }
}

TEST(LTEScenario, TheServingLevelFadesSlowlyAndCellsChangeOnlyForANeighbourBetterByTheHysteresisForTheTimeToTrigger) {
    constexpr double kHysteresis = 3.0;   // dB
    constexpr size_t kTriggerTicks = 2;   // 640 ms of time-to-trigger at 500 ms measurements
    constexpr double kLargestStep = 4.0;  // dB from one tick to the next within a cell
    for (uint64_t seed : kSeeds) {
        SCOPED_TRACE(seed);
        const std::vector<Shown>& shown = tenMinutes(seed);
        size_t changes = 0;
        size_t firstChange = 0;
        for (size_t tick = 1; tick < shown.size(); ++tick) {
            const Shown& s = shown[tick];
            const Shown& before = shown[tick - 1];
            if (servingPci(s) == servingPci(before)) {
                if (s.measured && before.measured) {
                    EXPECT_LE(std::abs(s.servingRsrp - before.servingRsrp), kLargestStep) << "tick " << tick;
                }
                continue;
            }
            ++changes;
            if (firstChange == 0) firstChange = tick;
            ASSERT_GT(tick, kTriggerTicks);
            for (size_t k = tick - kTriggerTicks; k < tick; ++k) {
                const auto target = shown[k].neighbourRsrp.find(servingPci(s));
                ASSERT_NE(target, shown[k].neighbourRsrp.end()) << "tick " << tick << ": the new cell unmeasured at " << k;
                EXPECT_GE(target->second, shown[k].servingRsrp + kHysteresis) << "tick " << tick << ", measured at " << k;
            }
        }
        // A drive in town: a cell change every minute or three, the first one soon after the start.
        EXPECT_GE(changes, 3u);
        EXPECT_LE(changes, kTenMinutes / 60);  // at most one per 30 s
        EXPECT_GT(firstChange, 0u);
        EXPECT_LE(firstChange, 150u);
    }
}

TEST(LTEScenario, TwoHundredTicksCarryEveryRecordAndEightMalformedRecords) {
    LTEScenario scenario(5);
    std::set<int32_t> codes;
    size_t malformed = 0;
    for (uint64_t tick = 0; tick < 200; ++tick) {
        for (const Bytes& m : scenario.recordsForTick(tick)) {
            const ByteReader r(m[0] == LogMask::kPrefixByte ? ByteView(m).subspan(2) : ByteView(m));
            const auto c = LogMask::classify(m);
            const bool badType = r.u8(0) != LogCode::kOrdinaryType && r.u8(0) != LogCode::kExtraType;
            const bool badList = c && !c->isOrdinary() && !PropertyListSerialization::read(r.bytes().subspan(13)).value;
            const bool tooShort = c && c->effectiveCode() == 0xB179 && r.size() < 29;  // its minimum length
            malformed += badType || badList || tooShort;
            if (!badType && c) codes.insert(c->effectiveCode());
        }
    }
    EXPECT_EQ(codes, (std::set<int32_t>{0xB0C1, 0xB0C2, 0xB179, 0xB17F, 0xB180, 0xB186, LogCode::kSimFiles,
                                        LogCode::kCellMonitor, LogCode::kPDPContexts}));
    EXPECT_EQ(malformed, 200 / LTEScenario::kMalformedPeriod);
}

}  // namespace
}  // namespace vantorel

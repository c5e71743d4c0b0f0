// Tests EmulatorBackend: tick records emitted in the scenario's order on its timer, stop, and the scenario lookup by technology.
#include "TelephonyService/EmulatorBackend.h"

#include "Platform/TelephonyIdentifiers.h"
#include "TelephonyService/Emulator/UTRANScenario.h"
#include "TelephonyService/ServiceTestSupport.h"

#include <gtest/gtest.h>

#include <vector>

namespace vantorel {
namespace {

using servicetest::Collector;
using servicetest::spin;
using servicetest::waitUntil;

// The records of ticks 0..n-1 of a fresh UTRAN scenario with that seed.
std::vector<Bytes> scenarioRecords(uint64_t seed, uint64_t ticks) {
    UTRANScenario scenario(seed);
    std::vector<Bytes> out;
    for (uint64_t t = 0; t < ticks; ++t) {
        const std::vector<Bytes> records = scenario.recordsForTick(t);
        out.insert(out.end(), records.begin(), records.end());
    }
    return out;
}

TEST(EmulatorBackendTest, EmitsEachTicksRecordsInTheScenariosOrder) {
    EmulatorBackend backend(std::make_unique<UTRANScenario>(7), std::chrono::milliseconds(10));
    Collector c;
    c.attach(backend);
    EXPECT_EQ(backend.state(), ModemBackend::State::Idle);
    backend.start();
    EXPECT_EQ(backend.state(), ModemBackend::State::Streaming);
    ASSERT_TRUE(waitUntil([&] { return backend.ticks() >= 4; }));
    backend.stop();
    const std::vector<Bytes> expected = scenarioRecords(7, backend.ticks());
    EXPECT_EQ(c.messages, expected);
    EXPECT_EQ(backend.messagesEmitted(), expected.size());
    EXPECT_EQ(c.states, (std::vector<ModemBackend::State>{ModemBackend::State::Streaming, ModemBackend::State::Idle}));
}

TEST(EmulatorBackendTest, TickZeroComesAtOnceThenOnePerInterval) {
    EmulatorBackend backend(std::make_unique<UTRANScenario>(1), std::chrono::milliseconds(60000));
    Collector c;
    c.attach(backend);
    backend.start();
    EXPECT_TRUE(c.messages.empty());  // from the event loop, not inside start()
    ASSERT_TRUE(waitUntil([&] { return backend.ticks() == 1; }));
    spin(50);
    EXPECT_EQ(backend.ticks(), 1u);  // the next tick is a minute away
    EXPECT_EQ(c.messages, scenarioRecords(1, 1));
}

TEST(EmulatorBackendTest, StopStopsTheTicksAndPausingIsIgnored) {
    EmulatorBackend backend(std::make_unique<UTRANScenario>(1), std::chrono::milliseconds(5));
    backend.setPaused(true);  // a live modem does not wait
    backend.start();
    ASSERT_TRUE(waitUntil([&] { return backend.ticks() >= 2; }));
    backend.stop();
    const uint64_t ticks = backend.ticks();
    spin(40);
    EXPECT_EQ(backend.ticks(), ticks);
    EXPECT_EQ(backend.state(), ModemBackend::State::Idle);
}

TEST(EmulatorBackendTest, UsesTheScenariosTickIntervalByDefault) {
    EmulatorBackend backend(std::make_unique<UTRANScenario>(1));
    EXPECT_EQ(backend.tickInterval(), UTRANScenario(1).tickInterval());
    EXPECT_EQ(backend.technology(), kTSLogChannelTechnology_Morvek_UTRAN2);
    EXPECT_EQ(backend.description(), "emulator (utran scenario, seed 1, tick 500 ms)");
}

TEST(EmulatorBackendTest, ScenarioForUtranByNameOrIdentifier) {
    for (const char* name : {"utran", "UTRAN", kTSLogChannelTechnology_Morvek_UTRAN2}) {
        std::string error;
        auto scenario = EmulatorBackend::scenarioFor(name, &error, 3);
        ASSERT_TRUE(scenario) << name;
        EXPECT_EQ(scenario->technology(), kTSLogChannelTechnology_Morvek_UTRAN2);
        EXPECT_EQ(scenario->seed(), 3u);
        EXPECT_TRUE(error.empty());
    }
}

TEST(EmulatorBackendTest, OtherTechnologiesHaveNoScenarioYet) {
    for (const char* name : {"ifx", "gsm", "cdma", "lte"}) {
        std::string error;
        EXPECT_FALSE(EmulatorBackend::scenarioFor(name, &error));
        EXPECT_EQ(error, std::string("no emulator scenario for ") + name + " yet (available: utran)");
    }
    std::string error;
    EXPECT_FALSE(EmulatorBackend::scenarioFor(kTSLogChannelTechnology_Morvek_LTE, &error));
    EXPECT_EQ(error, std::string("no emulator scenario for ") + kTSLogChannelTechnology_Morvek_LTE +
                         " yet (available: utran)");
}

TEST(EmulatorBackendTest, UnknownTechnologyNamesTheKnownOnes) {
    std::string error;
    EXPECT_FALSE(EmulatorBackend::scenarioFor("wimax", &error));
    EXPECT_EQ(error,
              "unknown technology \"wimax\" (names: ifx, gsm, cdma, lte, utran, or a full identifier such as "
              "kTSLogChannelTechnology_Morvek_UTRAN2)");
}

}  // namespace
}  // namespace vantorel

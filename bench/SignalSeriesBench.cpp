// SignalSeriesBench: the memory a signal plot keeps over a long session: the LTE emulator through its decoder, one display tick (tree + sample) per 2 s of simulated time, for 1 h, 6 h and 24 h.
#include "LogGenerator/LogGenerator.h"
#include "Model/MonitorClock.h"
#include "Model/SignalSampler.h"
#include "Platform/TelephonyIdentifiers.h"
#include "PropertyList/Dictionary.h"
#include "TelephonyService/Emulator/LTEScenario.h"

#include <benchmark/benchmark.h>

#include <cstdio>
#include <unistd.h>

using namespace vantorel;

namespace {

// Resident set size in KiB (/proc/self/statm's second field, in pages).
double residentKiB() {
    long pages = 0, resident = 0;
    if (std::FILE* f = std::fopen("/proc/self/statm", "r")) {
        if (std::fscanf(f, "%ld %ld", &pages, &resident) != 2) resident = 0;
        std::fclose(f);
    }
    return static_cast<double>(resident) * static_cast<double>(sysconf(_SC_PAGESIZE)) / 1024.0;
}

// range(0): simulated seconds. Counters: points kept (all keys, and per key at most),
// the points' bytes (16 per point; a deque adds one 512-byte block per 32 points),
// and the resident-set growth over the last three quarters of the session (after the
// series of a key fills, at 4.5 h, it stays flat).
void BM_SignalSeriesSession(benchmark::State& state) {
    const int64_t seconds = state.range(0);
    const int64_t tickMs = MonitorClock::kDisplayUpdateInterval.count();
    for (auto _ : state) {
        LTEScenario scenario(1);
        auto decoder = LogGenerator::generatorFromTechnology(kTSLogChannelTechnology_Morvek_LTE);
        Dictionary decoderState;
        SignalSampler sampler;
        const uint64_t scenarioTicksPerDisplay = static_cast<uint64_t>(tickMs / scenario.tickInterval().count());
        uint64_t scenarioTick = 0;
        double afterFirstQuarter = 0;
        for (int64_t t = 0; t < seconds * 1000; t += tickMs) {
            for (uint64_t i = 0; i < scenarioTicksPerDisplay; ++i)
                for (const Bytes& record : scenario.recordsForTick(scenarioTick++)) decoder->updateState(decoderState, record);
            DictionaryRef display = decoder->generateLogUsingState(decoderState);
            PathDictionary index;
            VantorelModelNode::makeTreeFromObject(display ? Value(display) : Value(), index);
            sampler.sample(t, kTSLogChannelTechnology_Morvek_LTE, index);
            if (t == seconds * 1000 / 4) afterFirstQuarter = residentKiB();
        }
        size_t perKey = 0;
        for (const std::string& key : sampler.series().keys()) perKey = std::max(perKey, sampler.series().points(key).size());
        state.counters["ticks"] = static_cast<double>(seconds * 1000 / tickMs);
        state.counters["keys"] = static_cast<double>(sampler.keys().size());
        state.counters["series"] = static_cast<double>(sampler.series().keys().size());  // keys and cell lines
        state.counters["points"] = static_cast<double>(sampler.series().pointCount());
        state.counters["pointsPerKeyMax"] = static_cast<double>(perKey);
        state.counters["pointBytes"] = static_cast<double>(sampler.series().pointCount() * sizeof(SignalSeries::Point));
        state.counters["marks"] = static_cast<double>(sampler.series().marks().size());
        state.counters["rssGrowthKiB"] = residentKiB() - afterFirstQuarter;
    }
}

}  // namespace

BENCHMARK(BM_SignalSeriesSession)->Arg(3600)->Arg(6 * 3600)->Arg(24 * 3600)->Iterations(1)->Unit(benchmark::kMillisecond);

// RoutingBench: records/s through a decoder's updateState (framing, routing to the sections, section decoding) for 2,000 ticks of its emulator scenario (UTRAN, LTE, GSM/UMTS, CDMA, IFX), with the model's display snapshot every 4 ticks; and the cost of one snapshot.
#include "LogGenerator/LogGenerator.h"
#include "PropertyList/Dictionary.h"
#include "TelephonyService/EmulatorBackend.h"

#include <benchmark/benchmark.h>

#include <map>
#include <memory>
#include <string>
#include <syslog.h>
#include <vector>

using namespace vantorel;

namespace {

constexpr uint64_t kTicks = 2000;
// The model asks for the display every 4 ticks (2.0 s at the scenario's 500 ms).
constexpr uint64_t kTicksPerDisplay = 4;

struct Stream {
    std::string technology;
    std::vector<std::vector<Bytes>> ticks;
    size_t records = 0;
    size_t extras = 0;  // type-255 records (property-list payloads, parsed with libplist)
    std::string error;  // why there is no stream (no emulator scenario for the technology)
};

// The records of ticks 0..kTicks-1 of a technology's emulator scenario (seed 1), generated once.
const Stream& stream(const std::string& technology) {
    static std::map<std::string, Stream> streams;
    auto it = streams.find(technology);
    if (it != streams.end()) return it->second;
    Stream& out = streams[technology];
    std::unique_ptr<EmulatorScenario> scenario = EmulatorBackend::scenarioFor(technology, &out.error, 1);
    if (!scenario) return out;
    out.technology = scenario->technology();
    for (uint64_t tick = 0; tick < kTicks; ++tick) {
        out.ticks.push_back(scenario->recordsForTick(tick));
        out.records += out.ticks.back().size();
        for (const Bytes& record : out.ticks.back()) {
            const size_t type = !record.empty() && record[0] == 0x81 ? 2 : 0;  // after the 0x81 0x00 prefix
            if (record.size() > type && record[type] == 0xFF) ++out.extras;
        }
    }
    return out;
}

// One pass over the stream as the model drives a decoder.
void replay(const Stream& stream, LogGenerator& generator, Dictionary& state) {
    const auto& ticks = stream.ticks;
    for (size_t tick = 0; tick < ticks.size(); ++tick) {
        for (const Bytes& record : ticks[tick]) generator.updateState(state, record);
        if (tick % kTicksPerDisplay == kTicksPerDisplay - 1) benchmark::DoNotOptimize(generator.generateLogUsingState(state));
    }
}

// A decoder whose display is already built (the first generateLogUsingState builds it
// and returns null), or null after SkipWithError.
std::unique_ptr<LogGenerator> readyGenerator(const Stream& stream, benchmark::State& state, Dictionary& decoderState) {
    if (!stream.error.empty()) {
        state.SkipWithError(stream.error.c_str());
        return nullptr;
    }
    auto generator = LogGenerator::generatorFromTechnology(stream.technology);
    if (!generator) {
        state.SkipWithError(("no usable decoder for " + stream.technology).c_str());
        return nullptr;
    }
    generator->generateLogUsingState(decoderState);
    return generator;
}

// range(0): 1 masks every syslog(3) priority but LOG_EMERG while timing, to show what
// the sections' per-record log lines cost (the lines are still formatted).
void BM_Routing(benchmark::State& state, const char* technology) {
    const Stream& records = stream(technology);
    Dictionary decoderState;
    auto generator = readyGenerator(records, state, decoderState);
    if (!generator) return;
    const bool masked = state.range(0) != 0;
    const int oldMask = masked ? setlogmask(LOG_MASK(LOG_EMERG)) : 0;
    for (auto _ : state) replay(records, *generator, decoderState);
    if (masked) setlogmask(oldMask);
    state.SetItemsProcessed(static_cast<int64_t>(state.iterations()) * static_cast<int64_t>(records.records));
    state.counters["records/pass"] = static_cast<double>(records.records);
    state.counters["extras/pass"] = static_cast<double>(records.extras);
    state.SetLabel(masked ? "syslog masked" : "syslog on");
}
BENCHMARK_CAPTURE(BM_Routing, UTRANScenario, "utran")->ArgName("syslogMasked")->Arg(0)->Arg(1)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(BM_Routing, LTEScenario, "lte")->ArgName("syslogMasked")->Arg(0)->Arg(1)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(BM_Routing, GSMScenario, "gsm")->ArgName("syslogMasked")->Arg(0)->Arg(1)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(BM_Routing, CDMAScenario, "cdma")->ArgName("syslogMasked")->Arg(0)->Arg(1)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(BM_Routing, IFXScenario, "ifx")->ArgName("syslogMasked")->Arg(0)->Arg(1)->Unit(benchmark::kMillisecond);

// One generateLogUsingState on a display filled by the whole stream: the 4-tick
// snapshot (DisplayState hand-over, History trim, deep copies of Display and ExtraInfo).
void BM_DisplaySnapshot(benchmark::State& state) {
    const Stream& records = stream("utran");
    Dictionary decoderState;
    auto generator = readyGenerator(records, state, decoderState);
    if (!generator) return;
    replay(records, *generator, decoderState);
    for (auto _ : state) benchmark::DoNotOptimize(generator->generateLogUsingState(decoderState));
    state.SetItemsProcessed(static_cast<int64_t>(state.iterations()));
}
BENCHMARK(BM_DisplaySnapshot)->Unit(benchmark::kMicrosecond);

}  // namespace

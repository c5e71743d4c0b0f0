// TreeBuildBench: µs per VantorelModelNode::makeTreeFromObject of a large display shaped like a real one (a "_sorted" root, groups of keys, lists of dictionaries, CCTRCH SIR-like nested arrays), with a fresh PathDictionary each time.
#include "LogGenerator/LogGenerator.h"
#include "Model/VantorelModelNode.h"
#include "Platform/StringFormat.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"
#include "TelephonyService/Emulator/UTRANScenario.h"

#include <benchmark/benchmark.h>

#include <memory>
#include <string>

using namespace vantorel;

namespace {

constexpr int kGroups = 20;
constexpr int kKeysPerGroup = 50;
constexpr int kLists = 10;
constexpr int kEntriesPerList = 200;
constexpr int kStringsPerEntry = 8;
constexpr int kSIRLists = 4;
constexpr int kCCTRCHPerList = 16;
constexpr int kSIRValues = 6;

// The display, like UTRAN.plist's after some records, but large:
//   "_sorted", "00;Technology"
//   "01;Group 01" .. "20;Group 20": 50 "Key nn" -> value strings each
//   "21;Lists": 10 arrays of 200 dictionaries of 8 strings (neighbour-list-like)
//   "22;Link Quality": 4 arrays of 16 {"CCTRCH ID", "TSNUM", "SIR": [6 strings]} (nested arrays)
Value makeDisplay() {
    auto root = Dictionary::create();
    root->set("_sorted", "_sorted");
    root->set("00;Technology", "UTRAN (TD-SCDMA)");
    for (int g = 1; g <= kGroups; ++g) {
        auto group = Dictionary::create();
        for (int k = 0; k < kKeysPerGroup; ++k)
            group->set(StringFormat::format("Key %02d", k), Value(StringFormat::format("%d", -60 - k)));
        root->set(StringFormat::format("%02d;Group %02d", g, g), Value(group));
    }
    auto lists = Dictionary::create();
    for (int l = 0; l < kLists; ++l) {
        auto list = Array::create();
        for (int e = 0; e < kEntriesPerList; ++e) {
            auto entry = Dictionary::create();
            for (int s = 0; s < kStringsPerEntry; ++s)
                entry->set(StringFormat::format("Field %d", s), Value(StringFormat::format("%d", 10054 + e + s)));
            list->append(Value(entry));
        }
        lists->set(StringFormat::format("List %d", l), Value(list));
    }
    root->set(StringFormat::format("%02d;Lists", kGroups + 1), Value(lists));
    auto quality = Dictionary::create();
    for (int l = 0; l < kSIRLists; ++l) {
        auto list = Array::create();
        for (int c = 0; c < kCCTRCHPerList; ++c) {
            auto sir = Array::create();
            for (int v = 0; v < kSIRValues; ++v) sir->append(Value(StringFormat::format("%d", v + c)));
            auto entry = Dictionary::create();
            entry->set("CCTRCH ID", Value(StringFormat::format("%d", c)));
            entry->set("TSNUM", Value(StringFormat::format("%d", c % 7)));
            entry->set("SIR", Value(sir));
            list->append(Value(entry));
        }
        quality->set(StringFormat::format("CCTRCH SIR %d", l), Value(list));
    }
    root->set(StringFormat::format("%02d;Link Quality", kGroups + 2), Value(quality));
    return Value(root);
}

// The nested SIR arrays leave ArrayLock's mutex held one level per inner array by this
// thread (ArrayLock keeps a nested walk's levels on purpose); harmless here, everything
// runs on one thread.
void BM_MakeTreeFromObject(benchmark::State& state) {
    const Value display = makeDisplay();
    size_t nodes = 0;
    for (auto _ : state) {
        // The previous tree and index are dropped inside the timing, as the model
        // drops its old tree when it builds a new one.
        PathDictionary index;
        NodeRef root = VantorelModelNode::makeTreeFromObject(display, index);
        benchmark::DoNotOptimize(root.get());
        nodes = index.size();
    }
    state.SetLabel(StringFormat::format("%zu nodes", nodes));
    state.counters["nodes"] = static_cast<double>(nodes);
}
BENCHMARK(BM_MakeTreeFromObject)->Unit(benchmark::kMicrosecond);

// For scale: the real UTRAN display after 200 ticks of UTRANScenario (seed 1), as the
// model rebuilds it every 4 ticks.
void BM_MakeTreeFromUTRANDisplay(benchmark::State& state) {
    UTRANScenario scenario(1);
    auto generator = LogGenerator::generatorFromTechnology(scenario.technology());
    if (!generator) {
        state.SkipWithError(("no usable decoder for " + scenario.technology()).c_str());
        return;
    }
    Dictionary decoderState;
    DictionaryRef display;
    for (uint64_t tick = 0; tick < 200; ++tick) {
        for (const Bytes& record : scenario.recordsForTick(tick)) generator->updateState(decoderState, record);
        if (tick % 4 == 3) display = generator->generateLogUsingState(decoderState);
    }
    if (!display) {
        state.SkipWithError("the UTRAN decoder gave no display");
        return;
    }
    const Value value(display);
    size_t nodes = 0;
    for (auto _ : state) {
        PathDictionary index;
        NodeRef root = VantorelModelNode::makeTreeFromObject(value, index);
        benchmark::DoNotOptimize(root.get());
        nodes = index.size();
    }
    state.SetLabel(StringFormat::format("%zu nodes", nodes));
    state.counters["nodes"] = static_cast<double>(nodes);
}
BENCHMARK(BM_MakeTreeFromUTRANDisplay)->Unit(benchmark::kMicrosecond);

}  // namespace

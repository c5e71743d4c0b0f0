// QmdlDeframingBench: MB/s of HdlcDeframer alone and of QmdlReader::readBytes (deframe + DIAG log packets + Morvek records) over sprint.mi2log held in memory.
#include "TelephonyService/Replay/HdlcDeframer.h"
#include "TelephonyService/Replay/QmdlReader.h"
#include "TelephonyService/Replay/RecordedLog.h"

#include <benchmark/benchmark.h>

#include <algorithm>
#include <string>

using namespace vantorel;

namespace {

const std::string kCapturePath = std::string(VANTOREL_CAPTURES_DIR) + "/sprint.mi2log";

// The capture, read once for the whole program; empty when it could not be read.
const Bytes& capture() {
    static const Bytes data = [] {
        std::string error;
        return RecordedLog::loadFile(kCapturePath, &error).value_or(Bytes());
    }();
    return data;
}

bool skipWithoutCapture(benchmark::State& state) {
    if (!capture().empty()) return false;
    state.SkipWithError(("cannot read " + kCapturePath).c_str());
    return true;
}

// range(0): chunk size fed per call, 0 for the whole buffer in one feed() (a live
// serial port hands over a few KiB at a time).
void BM_HdlcDeframer(benchmark::State& state) {
    if (skipWithoutCapture(state)) return;
    const ByteView data(capture());
    const size_t chunk = state.range(0) > 0 ? static_cast<size_t>(state.range(0)) : data.size();
    size_t frames = 0;
    size_t bodyBytes = 0;
    for (auto _ : state) {
        frames = 0;
        bodyBytes = 0;
        HdlcDeframer deframer([&](ByteView body, uint64_t) {
            ++frames;
            bodyBytes += body.size();
        });
        for (size_t at = 0; at < data.size(); at += chunk) deframer.feed(data.subspan(at, std::min(chunk, data.size() - at)));
        deframer.finish();
        benchmark::DoNotOptimize(bodyBytes);
    }
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations()) * static_cast<int64_t>(data.size()));
    state.counters["frames"] = static_cast<double>(frames);
}
BENCHMARK(BM_HdlcDeframer)->Arg(0)->Arg(4096)->Unit(benchmark::kMillisecond);

void BM_QmdlReaderReadBytes(benchmark::State& state) {
    if (skipWithoutCapture(state)) return;
    const ByteView data(capture());
    size_t entries = 0;
    size_t frames = 0;
    for (auto _ : state) {
        RecordedLog log = QmdlReader::readBytes(data);
        entries = log.entries.size();
        frames = log.frames;
        benchmark::DoNotOptimize(log.entries.data());
    }
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations()) * static_cast<int64_t>(data.size()));
    state.counters["frames"] = static_cast<double>(frames);
    state.counters["entries"] = static_cast<double>(entries);
}
BENCHMARK(BM_QmdlReaderReadBytes)->Unit(benchmark::kMillisecond);

}  // namespace

// FuzzSupport: what the fuzz targets share: a check that stops the run, the input cut into pieces, and the recorded-log invariants.
#pragma once

#include "TelephonyService/Replay/RecordedLog.h"

#include <cstdio>
#include <cstdlib>
#include <vector>

// A broken invariant is a finding like a crash: abort, so that libFuzzer (or the corpus
// replay) reports the input that broke it.
#define FUZZ_CHECK(condition)                                                                 \
    do {                                                                                      \
        if (!(condition)) {                                                                   \
            std::fprintf(stderr, "fuzz check failed: %s (%s:%d)\n", #condition, __FILE__, __LINE__); \
            std::abort();                                                                     \
        }                                                                                     \
    } while (0)

namespace vantorel::fuzz {

// The input in three pieces, for the readers that take a stream in chunks. The first
// byte chooses the first cut, so that the fuzzer explores where frames get split.
inline std::vector<ByteView> pieces(ByteView data) {
    if (data.empty()) return {data};
    const size_t first = data[0] % (data.size() + 1);
    const size_t second = first + (data.size() - first) / 2;
    return {data.first(first), data.subspan(first, second - first), data.subspan(second)};
}

// Every entry is a Morvek record: type byte 1 + a DLF record whose length field holds
// the record's own length, and the counters add up.
inline void checkEntries(const RecordedLog& log) {
    for (const RecordedEntry& e : log.entries) {
        FUZZ_CHECK(e.record.size() >= 13 && e.record[0] == 1);
        FUZZ_CHECK(size_t(e.record[1] | e.record[2] << 8) == e.record.size() - 1);
    }
    FUZZ_CHECK(log.logPackets == log.entries.size());
    (void)log.summary();
}

}  // namespace vantorel::fuzz

// ScenarioCapture: writes a capture file (docs/capture-format.md) of an emulator scenario's stream, for tests that replay or decode one.
#pragma once

#include <cstdint>
#include <string>

namespace vantorel::testing {

// `ticks` ticks of the UTRAN scenario with `seed`, one message (id 0) per record,
// `stepMicros` apart; then, when `extraMessageId` is non-zero, one 3-byte message
// with that id (which the model drops). Fails the current test on a write error.
void writeUtranCapture(const std::string& path, uint64_t seed, uint64_t ticks, int64_t stepMicros,
                       int32_t extraMessageId = 0);

}  // namespace vantorel::testing

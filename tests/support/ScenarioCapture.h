// ScenarioCapture: writes a capture file (docs/capture-format.md) of an emulator scenario's stream, for tests that replay or decode one.
#pragma once

#include "Platform/TelephonyIdentifiers.h"
#include "TelephonyService/Emulator/UTRANScenario.h"
#include "TelephonyService/Replay/CaptureWriter.h"

#include <gtest/gtest.h>

#include <cstdint>
#include <string>

namespace vantorel::testing {

// `ticks` ticks of the UTRAN scenario with `seed`, one message (id 0) per record, `stepMicros` apart; then,
// when `extraMessageId` is non-zero, one 3-byte message with that id (which the model drops).
inline void writeUtranCapture(const std::string& path, uint64_t seed, uint64_t ticks, int64_t stepMicros,
                              int32_t extraMessageId = 0) {
    std::string error;
    auto writer = CaptureWriter::create(path, kTSLogChannelTechnology_Morvek_UTRAN2, &error);
    ASSERT_TRUE(writer) << error;
    UTRANScenario scenario(seed);
    int64_t t = 1700000000000000;
    for (uint64_t tick = 0; tick < ticks; ++tick)
        for (const Bytes& record : scenario.recordsForTick(tick)) writer->write(t += stepMicros, 0, record);
    if (extraMessageId != 0) writer->write(t, extraMessageId, Bytes{1, 2, 3});
    ASSERT_TRUE(writer->flush());
}

}  // namespace vantorel::testing

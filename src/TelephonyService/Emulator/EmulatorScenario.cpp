// EmulatorScenario: the seeded random sequence and time stamps shared by the emulator's synthetic modems.
#include "TelephonyService/Emulator/EmulatorScenario.h"

namespace vantorel {

namespace {

// mt19937 takes a 32-bit seed; fold the high half in so 64-bit seeds differ too.
uint32_t foldSeed(uint64_t seed) {
    return static_cast<uint32_t>(seed ^ (seed >> 32));
}

}  // namespace

EmulatorScenario::EmulatorScenario(uint64_t seed) : seed_(seed), engine_(foldSeed(seed)) {}

EmulatorScenario::~EmulatorScenario() = default;

std::chrono::milliseconds EmulatorScenario::tickInterval() const {
    return std::chrono::milliseconds(500);
}

void EmulatorScenario::reseed() {
    engine_.seed(foldSeed(seed_));
}

uint32_t EmulatorScenario::random() {
    return static_cast<uint32_t>(engine_());
}

int32_t EmulatorScenario::uniform(int32_t low, int32_t high) {
    if (high <= low) return low;
    // Plain modulo: the tiny bias does not matter here, portability does.
    uint64_t span = static_cast<uint64_t>(static_cast<int64_t>(high) - low) + 1;
    return static_cast<int32_t>(low + static_cast<int64_t>(random() % span));
}

bool EmulatorScenario::chance(uint32_t percent) {
    return random() % 100 < percent;
}

uint64_t EmulatorScenario::timestampForTick(uint64_t tick) const {
    uint64_t ms = tick * static_cast<uint64_t>(tickInterval().count());
    return (ms * 4 / 5) << 16;
}

}  // namespace vantorel

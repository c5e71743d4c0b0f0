// FastMonitorClock: the monitor's 5 s retry and 2 s display tick as 100 ms and 40 ms, with a wall clock a test may freeze; installed once per test program.
#pragma once

#include "Model/MonitorClock.h"

#include <optional>

namespace vantorel::testing {

class FastMonitorClock : public MonitorClock {
public:
    static constexpr std::chrono::milliseconds kRetry{100};
    static constexpr std::chrono::milliseconds kTick{40};

    std::chrono::system_clock::time_point now() const override { return frozen ? *frozen : MonitorClock::now(); }
    std::chrono::milliseconds retryDelay() const override { return kRetry; }
    std::chrono::milliseconds displayUpdateInterval() const override { return tick; }

    // The one instance, installed on first use.
    static FastMonitorClock& installed() {
        static FastMonitorClock clock;
        MonitorClock::install(&clock);
        return clock;
    }

    std::optional<std::chrono::system_clock::time_point> frozen;
    std::chrono::milliseconds tick = kTick;  // read when a model starts its tick
};

}  // namespace vantorel::testing

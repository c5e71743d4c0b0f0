// MonitorClock: the wall clock and the monitor's two waits (5 s retry, 2 s display tick), read by the model and the save screen from one process-wide source.
#pragma once

#include <chrono>

namespace vantorel {

// The product runs on the system clock with fixed waits. A program
// that needs another pace (a test driving the retry path in milliseconds, a frozen
// wall clock for snapshot names) installs its own clock once, before it creates a
// model or a save screen; nothing else changes the waits.
class MonitorClock {
public:
    static constexpr std::chrono::milliseconds kRetryDelay{5000};
    static constexpr std::chrono::milliseconds kDisplayUpdateInterval{2000};

    virtual ~MonitorClock() = default;
    virtual std::chrono::system_clock::time_point now() const { return std::chrono::system_clock::now(); }
    // After a failed start, the model tries again this long after the failure.
    virtual std::chrono::milliseconds retryDelay() const { return kRetryDelay; }
    // The model's refresh tick while the channel is open.
    virtual std::chrono::milliseconds displayUpdateInterval() const { return kDisplayUpdateInterval; }

    // The installed clock, or the system clock with the fixed waits.
    static const MonitorClock& current();
    // Replaces the clock for the whole process (nullptr: the system clock again).
    // Read only on the thread that runs the models and windows.
    static void install(const MonitorClock* clock);
};

}  // namespace vantorel

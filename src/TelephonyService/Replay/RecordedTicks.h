// RecordedTicks: the monitor's 2 s display ticks laid on a recorded stream's own times, so that a replay at any speed and `decode --csv` sample the display where the recording had its ticks.
#pragma once

#include <cstdint>
#include <optional>

namespace vantorel {

// A tick at every 2 s mark of recorded time that brought messages, stamped with that
// mark: the grid starts at the first message with a time (its first mark 2 s later), a
// message at or past the next mark first closes the tick of the messages before it. A
// message without a time (a zero DIAG time stamp) joins the tick it arrives in; time that
// goes back joins it too. end() closes the last tick; a stream in which no message has a
// time gets that one tick only, without a time.
class RecordedTicks {
public:
    static constexpr int64_t kIntervalMs = 2000;

    struct Tick {
        std::optional<int64_t> timeMs;  // none for a stream without times
    };

    // Before a message with this recorded time: the tick of the messages before it, if
    // one is due.
    std::optional<Tick> before(int64_t timeMicros);
    // After the message: it belongs to the next tick.
    void after() { pending_ = true; }
    // The tick of the messages since the last one, if any; the next message starts a new
    // grid (a new file, a new pass of a looping replay).
    std::optional<Tick> end();

private:
    std::optional<int64_t> next_;  // the next mark, ms since 1970
    bool pending_ = false;
};

}  // namespace vantorel

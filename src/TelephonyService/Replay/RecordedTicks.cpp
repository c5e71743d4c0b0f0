// RecordedTicks: the recorded-time grid of display ticks.
#include "TelephonyService/Replay/RecordedTicks.h"

#include "TelephonyService/Replay/DiagPacket.h"

namespace vantorel {

std::optional<RecordedTicks::Tick> RecordedTicks::before(int64_t timeMicros) {
    static const int64_t kNoTime = DiagPacket::microsecondsSince1970(0);
    if (timeMicros == kNoTime) return std::nullopt;
    const int64_t ms = timeMicros / 1000;
    if (!next_) {
        next_ = ms + kIntervalMs;
        return std::nullopt;
    }
    if (ms < *next_) return std::nullopt;
    std::optional<Tick> tick;
    if (pending_) tick = Tick{*next_};
    pending_ = false;
    // The first mark after ms, counted without overflow for time stamps far apart.
    const uint64_t behind = static_cast<uint64_t>(ms) - static_cast<uint64_t>(*next_);
    *next_ += static_cast<int64_t>((behind / kIntervalMs + 1) * kIntervalMs);
    return tick;
}

std::optional<RecordedTicks::Tick> RecordedTicks::end() {
    std::optional<Tick> tick;
    if (pending_) tick = Tick{next_};
    pending_ = false;
    next_.reset();
    return tick;
}

}  // namespace vantorel

// ReplayBackend: paced replay of a recorded stream with looping and pausing.
#include "TelephonyService/ReplayBackend.h"

#include "Platform/StringFormat.h"

#include <algorithm>
#include <cmath>
#include <utility>

namespace vantorel {

ReplayBackend::ReplayBackend(RecordedStream stream, double speed, bool loop, std::string name, QObject* parent)
    : ModemBackend(parent), stream_(std::move(stream)), speed_(std::max(0.0, speed)), loop_(loop), name_(std::move(name)) {
    timer_.setSingleShot(true);
    timer_.setTimerType(Qt::PreciseTimer);
    connect(&timer_, &QTimer::timeout, this, &ReplayBackend::run);
}

ReplayBackend::~ReplayBackend() = default;

std::string ReplayBackend::technology() const {
    return stream_.technology();
}

std::string ReplayBackend::description() const {
    std::string speed = speed_ == 0 ? std::string("as fast as the client takes it")
                                    : StringFormat::format("speed %g", speed_);
    return StringFormat::format("replay of %s (%s, %zu messages, %s%s)", name_.empty() ? "a stream" : name_.c_str(),
                                stream_.formatName(), stream_.messages().size(), speed.c_str(),
                                loop_ ? ", looping" : "");
}

std::string ReplayBackend::source() const {
    return "replay " + (name_.empty() ? std::string("of a stream") : name_);
}

std::optional<int64_t> ReplayBackend::recordedTime() const {
    return lastTime_ > 0 ? std::optional<int64_t>(lastTime_) : std::nullopt;
}

void ReplayBackend::start() {
    if (state() == State::Streaming) return;
    index_ = 0;
    lastTime_ = 0;
    clock_.start();
    dueMicros_ = 0;
    setState(State::Streaming);
    schedule();
}

void ReplayBackend::stop() {
    timer_.stop();
    setState(State::Idle);
}

void ReplayBackend::pausedChanged() {
    if (state() != State::Streaming) return;
    if (isPaused()) {
        timer_.stop();
        return;
    }
    // Resume: the next message is due now, the pace goes on from there.
    dueMicros_ = static_cast<double>(clock_.nsecsElapsed()) / 1000.0;
    schedule();
}

double ReplayBackend::gapBefore(size_t i) const {
    if (speed_ == 0 || i == 0) return 0;
    const auto& messages = stream_.messages();
    // Differences of garbage time stamps can overflow: compare before subtracting.
    const int64_t later = messages[i].timeMicros;
    const int64_t earlier = messages[i - 1].timeMicros;
    if (later <= earlier) return 0;
    const uint64_t gap = static_cast<uint64_t>(later) - static_cast<uint64_t>(earlier);
    const uint64_t cap = static_cast<uint64_t>(kMaxGap.count());
    return static_cast<double>(std::min(gap, cap)) / speed_;
}

void ReplayBackend::schedule() {
    if (state() != State::Streaming || isPaused()) return;
    const double now = static_cast<double>(clock_.nsecsElapsed()) / 1000.0;
    const double waitMs = std::ceil((dueMicros_ - now) / 1000.0);
    // Intervals over INT_MAX ms (~24 days) are clamped; run() then waits again.
    timer_.start(waitMs <= 0 ? 0 : static_cast<int>(std::min(waitMs, 2147483647.0)));
}

void ReplayBackend::run() {
    if (state() != State::Streaming || isPaused()) return;
    const auto& messages = stream_.messages();
    size_t sent = 0;
    while (sent < kBatch) {
        if (index_ >= messages.size()) {
            if (!loop_ || messages.empty()) {
                setState(State::Finished);
                return;
            }
            index_ = 0;  // the next pass follows at once
        }
        const double now = static_cast<double>(clock_.nsecsElapsed()) / 1000.0;
        if (dueMicros_ > now) break;
        const TimedMessage& message = messages[index_++];
        if (index_ < messages.size()) dueMicros_ += gapBefore(index_);
        ++sent;
        lastTime_ = message.timeMicros;
        emitMessage(message.messageId, message.data);
        // A slot may have paused or stopped us between two messages.
        if (state() != State::Streaming || isPaused()) return;
    }
    schedule();
}

}  // namespace vantorel

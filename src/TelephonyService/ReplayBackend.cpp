// ReplayBackend: paced replay of a recorded stream with looping and pausing.
#include "TelephonyService/ReplayBackend.h"

#include "Platform/StringFormat.h"
#include "TelephonyService/LogMask.h"

#include <algorithm>
#include <cmath>
#include <utility>

namespace vantorel {

ReplayBackend::ReplayBackend(RecordedStream stream, double speed, bool loop, std::string name, QObject* parent)
    : ModemBackend(parent), stream_(std::move(stream)), speed_(std::max(0.0, speed)), loop_(loop), name_(std::move(name)) {
    technology_ = stream_.technology();
    nextSpan_ = 1;
    timer_.setSingleShot(true);
    timer_.setTimerType(Qt::PreciseTimer);
    connect(&timer_, &QTimer::timeout, this, &ReplayBackend::run);
}

ReplayBackend::~ReplayBackend() = default;

std::string ReplayBackend::technology() const {
    return technology_;
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
    rewind();
    ticks_ = RecordedTicks();
    lastTime_ = 0;
    clock_.start();
    dueMicros_ = 0;
    setState(State::Streaming);
    schedule();
}

void ReplayBackend::rewind() {
    index_ = 0;
    wantedSent_ = false;
    nextSpan_ = 1;
    const std::string first = stream_.technology();
    if (first != technology_) {
        technology_ = first;
        emit technologyChanged();
    }
}

void ReplayBackend::endPass() {
    if (const auto tick = ticks_.end()) emit displayTick(tick->timeMs);
}

bool ReplayBackend::wanted(const TimedMessage& message) const {
    // No client (a recording alone) or one that takes everything: the pace holds from the start.
    if (!codes_ || codes_->empty()) return true;
    const auto record = LogMask::classify(message.data);
    if (!record) return true;  // what no decoder can classify goes to every client
    return record->isOrdinary() && codes_->count(record->code) > 0;
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
    if (speed_ == 0 || i == 0 || !wantedSent_) return 0;
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
    const auto& spans = stream_.technologySpans();
    size_t sent = 0;
    while (sent < kBatch) {
        if (index_ >= messages.size()) {
            endPass();
            if (state() != State::Streaming || isPaused()) return;  // stopped from the last tick's slot
            if (!loop_ || messages.empty()) {
                setState(State::Finished);
                return;
            }
            rewind();  // the next pass follows at once
            if (state() != State::Streaming || isPaused()) return;
        }
        const double now = static_cast<double>(clock_.nsecsElapsed()) / 1000.0;
        if (dueMicros_ > now) break;
        const TimedMessage& message = messages[index_];
        if (const auto tick = ticks_.before(message.timeMicros)) {
            emit displayTick(tick->timeMs);
            if (state() != State::Streaming || isPaused()) return;
        }
        // The modem moved: clients switch decoders before its first record there.
        if (nextSpan_ < spans.size() && spans[nextSpan_].from <= index_) {
            technology_ = spans[nextSpan_++].technology;
            emit technologyChanged();
            if (state() != State::Streaming || isPaused()) return;
        }
        ++index_;
        wantedSent_ = wantedSent_ || wanted(message);
        if (index_ < messages.size()) dueMicros_ += gapBefore(index_);
        ++sent;
        lastTime_ = message.timeMicros;
        ticks_.after();
        emitMessage(message.messageId, message.data);
        // A slot may have paused or stopped us between two messages.
        if (state() != State::Streaming || isPaused()) return;
    }
    schedule();
}

}  // namespace vantorel

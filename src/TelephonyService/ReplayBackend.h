// ReplayBackend: the modem backend that plays a RecordedStream back at its recorded pace, faster, or as fast as the client takes it.
#pragma once

#include "TelephonyService/ModemBackend.h"
#include "TelephonyService/Replay/RecordedStream.h"

#include <QElapsedTimer>
#include <QTimer>

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>

namespace vantorel {

// Pace: speed 1 keeps the gaps between the recorded arrival times, speed 2 halves
// them, speed 0 sends without waiting (in batches from the event loop, so the
// service's flow control can pause it between any two messages). A recorded time
// that goes backwards counts as no gap. At the end the replay starts over when
// looping (a new pass; the first message of a pass follows the last one at once),
// else the state becomes Finished. While paused nothing is sent; on resume the next
// message is due at once and the pace goes on from there. A recorded gap longer than
// kMaxGap (10 s) is cut to it: real captures hold pauses of most of an hour
// and time stamps decades off (sprint.mi2log), which no one wants to wait out.
class ReplayBackend : public ModemBackend {
    Q_OBJECT
public:
    // Messages sent per event-loop turn at most, so sockets and clients get their turn.
    static constexpr size_t kBatch = 256;
    // The longest recorded gap kept (before the speed divides it); longer ones are cut.
    static constexpr std::chrono::microseconds kMaxGap{10000000};

    // name: what description() calls the stream (its file name).
    ReplayBackend(RecordedStream stream, double speed, bool loop, std::string name = {}, QObject* parent = nullptr);
    ~ReplayBackend() override;

    std::string technology() const override;
    std::string description() const override;
    // "replay <file name>"
    std::string source() const override;
    std::optional<uint64_t> totalMessages() const override { return stream_.messages().size(); }
    // The time of the last message sent; none before the first or when it has none (0 or less).
    std::optional<int64_t> recordedTime() const override;
    void start() override;
    void stop() override;

    const RecordedStream& stream() const { return stream_; }

protected:
    void pausedChanged() override;

private:
    void run();
    void schedule();
    // Wall-clock gap before message i (i > 0) in microseconds, from the recorded times
    // (none when they go backwards, at most kMaxGap), divided by the speed.
    double gapBefore(size_t i) const;

    RecordedStream stream_;
    double speed_;
    bool loop_;
    std::string name_;
    QTimer timer_;
    QElapsedTimer clock_;
    size_t index_ = 0;      // the next message to send in the current pass
    int64_t lastTime_ = 0;  // recorded time of the last message sent
    double dueMicros_ = 0;  // clock_ time at which message index_ is due
};

}  // namespace vantorel

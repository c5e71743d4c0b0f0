// ReplayBackend: the modem backend that plays a RecordedStream back at its recorded pace, faster, or as fast as the client takes it.
#pragma once

#include "TelephonyService/ModemBackend.h"
#include "TelephonyService/Replay/RecordedStream.h"
#include "TelephonyService/Replay/RecordedTicks.h"

#include <QElapsedTimer>
#include <QTimer>

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <set>
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
// and time stamps decades off (sprint.mi2log), which no one wants to wait out. Nor is
// the silence before the first record a client asked for (setLogCodes) waited out: a
// pass sends what comes before it without waiting, and the pace starts there.
//
// The technology follows the stream's serving-cell records (RecordedStream's spans):
// technologyChanged() comes before the first message of a new span; a new pass starts in
// the first span's technology again. displayTick() marks the recorded display ticks
// (RecordedTicks), the last one at the end of each pass.
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
    void setLogCodes(const std::optional<std::set<uint16_t>>& codes) override { codes_ = codes; }

    const RecordedStream& stream() const { return stream_; }

protected:
    void pausedChanged() override;

private:
    void run();
    void schedule();
    // Wall-clock gap before message i (i > 0) in microseconds, from the recorded times
    // (none when they go backwards, at most kMaxGap), divided by the speed.
    double gapBefore(size_t i) const;
    // A message some client receives: the first of a pass ends the leading silence.
    bool wanted(const TimedMessage& message) const;
    // Back to the first message and the first span's technology.
    void rewind();
    // The end of a pass: the tick of its last messages.
    void endPass();

    RecordedStream stream_;
    double speed_;
    bool loop_;
    std::string name_;
    QTimer timer_;
    QElapsedTimer clock_;
    size_t index_ = 0;      // the next message to send in the current pass
    int64_t lastTime_ = 0;  // recorded time of the last message sent
    double dueMicros_ = 0;  // clock_ time at which message index_ is due
    std::string technology_;  // of the span the next message is in
    size_t nextSpan_ = 0;     // the span that starts next
    bool wantedSent_ = false;  // a message a client asked for was sent this pass
    std::optional<std::set<uint16_t>> codes_;  // setLogCodes
    RecordedTicks ticks_;
};

}  // namespace vantorel

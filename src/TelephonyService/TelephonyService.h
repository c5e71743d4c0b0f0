// TelephonyService: the telephony service the model talks to: a well-known message port, network-monitor log channels with their log masks, a modem backend, recording (docs/protocol.md).
#pragma once

#include "PropertyList/Value.h"
#include "TelephonyService/LogMask.h"
#include "TelephonyService/ModemBackend.h"

#include <QElapsedTimer>
#include <QObject>
#include <QTimer>

#include <chrono>
#include <cstdint>
#include <deque>
#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include <sys/types.h>

namespace vantorel {

class CaptureWriter;
class DeviceLock;
class LocalMessagePort;
class RemoteMessagePort;

// What the service runs, as vantorel-telephonyd's options say it.
struct TelephonyServiceOptions {
    std::string portName;    // the well-known port; empty: TelephonyServiceConnection::defaultServiceName()
    // --allow-group GROUP: a lab service shared by a group (an absolute portName only): its
    // sockets are the group's to use and its members are served besides this user and root.
    std::string allowGroup;
    std::string emulate;     // --emulate TECH (exactly one of emulate / replay)
    std::string replay;      // --replay FILE
    std::string device;      // --device PATH or tcp:HOST:PORT: a modem's DIAG port
    std::string recordQmdl;  // --record-qmdl FILE: the device's raw DIAG stream (device only)
    std::string technology;  // --technology TECH, instead of what a replay's serving-cell records say
    double speed = 1.0;      // --speed X (replay)
    bool loop = false;       // --loop (replay)
    std::string record;      // --record FILE: every message the backend produces, as a capture
    bool replaceRecording = false;  // --force: an existing record FILE is replaced (else refused, untouched)
    uint64_t seed = 1;       // emulator scenario seed
    // Builds the backend instead of emulate / replay (tests, embedders); called on the
    // service's thread.
    std::function<std::unique_ptr<ModemBackend>()> backendFactory;
};

// The service side of docs/protocol.md:
//   - the well-known port answers a Request with message id 1 and the XML plist
//     {"Request": "CreateLogChannel", "PortName": <client's receive port>} with
//     {"ErrorDomain", "ErrorCode", "PortName"}: 0/0 and the channel's port name, or
//     domain 1 with code 1 (malformed request), 2 (client port unreachable),
//     3 (backend failed), 4 (the port named is one the service serves itself),
//     5 (kMaxChannels open already) and an empty name;
//   - each channel has a port "<well-known name>.channel.<pid>.<n>" that answers
//     {"GetTechnology": ...} with {"GetTechnology": <identifier>} and takes the start
//     command {"SetState": "Streaming", "SetMorvekLogCodes": [...], "SetTsExtraCodes": [...]}
//     as the channel's log mask (LogMask); another "SetState" stops the channel's stream;
//   - messages go to the client's receive port as Message frames, one record each, only
//     while the channel streams and only those its mask forwards; a replay's recorded
//     display ticks go with them as messages with id kDisplayTickMessageId
//     (TelephonyServiceConnection);
//   - a channel that dropped records tells its client so on the channel port, as a
//     Notification frame (id 0) {"Name": "ChannelStatus", "Info": {"Dropped", "Sent"}}, at
//     most every half second while the count grows;
//   - backend state changes are broadcast to the well-known port's connected clients as
//     Notification frames (id 0) {"Name": "BackendStateChanged", "Info": {"State",
//     "Technology", "Source", "Sent", "Total", "RecordedTime", "LogTechnologies"}}, and
//     again at most once a second while streaming when "Sent" changed.
// The backend starts on the first start command (and again after a finished replay when
// a start command comes while no channel streams) and stops when the last channel is
// freed (a replay then starts over for the next client; the emulator's ticks go on
// counting). When recording, the backend starts with the service and runs until it
// stops, clients or none: every message it produces is written, and a replay that no
// client holds back runs at its own pace. A channel whose client has more than kHighWaterBytes not yet taken keeps
// what comes next in a queue of at most kMaxQueuedBytes, dropping its oldest messages
// beyond that. A replay waits (is paused) while a client is behind but still taking
// (lossless back-pressure for slow readers) and while no streaming channel can take more;
// a client that has taken nothing for kStallMs while behind is stalled and no longer
// holds the replay: it alone loses its oldest messages, until it drains.
// A client that goes away (its receive port, or its connection to the channel port)
// frees its channel, and so does one that never connects to the channel port within
// kUnclaimedChannelMs. Everything runs on the thread that calls start(); the receive
// callbacks come from that thread's event loop.
class TelephonyService : public QObject {
    Q_OBJECT
public:
    static constexpr int32_t kCreateLogChannelMessageId = 1;
    static constexpr int32_t kChannelMessageId = 0;
    static constexpr int32_t kNotificationMessageId = 0;
    static constexpr int32_t kErrorDomain = 1;
    enum ErrorCode : int32_t {
        kNoError = 0,
        kMalformedRequest = 1,
        kClientPortUnreachable = 2,
        kBackendFailed = 3,
        kServicePortNamed = 4,
        kTooManyChannels = 5,
    };
    static constexpr int64_t kHighWaterBytes = 1 << 20;
    static constexpr int kStallMs = 1000;
    static constexpr size_t kMaxQueuedBytes = 1 << 20;
    static constexpr size_t kMaxChannels = 64;
    // Connections a channel port takes: its client's, and a few probes.
    static constexpr int kChannelPortPeers = 4;
    static constexpr int kUnclaimedChannelMs = 3000;
    static constexpr int kClientLookupTimeoutMs = 500;
    // How long stop() waits for the backend to let go of its modem.
    static constexpr int kBackendStopMs = 2000;

    struct Counters {
        uint64_t messagesSent = 0;       // Message frames posted to clients (one per channel)
        uint64_t messagesRecorded = 0;   // messages written by --record
        uint64_t channelsServed = 0;     // channels created since start
        uint64_t openChannels = 0;       // channels open now
        uint64_t messagesDropped = 0;    // messages a channel dropped, its client taking too little
        uint64_t malformedFrames = 0;    // invalid frames the ports received from clients
        uint64_t malformedRequests = 0;  // valid frames whose content was not a request we know
        uint64_t refusedPeers = 0;       // connections closed at once, a port having its peers already
        uint64_t overLimitPeers = 0;     // connections closed for going over a buffer limit
        uint64_t foreignPeers = 0;       // connections closed at once, their process another user's
    };
    using StatusCallback = std::function<void(const std::string& line)>;

    explicit TelephonyService(TelephonyServiceOptions options, QObject* parent = nullptr);
    ~TelephonyService() override;

    // The backend the options ask for; null with *error set (unknown technology, file
    // missing or unreadable, a file without a record, or without a serving-cell record
    // and no --technology, ...).
    static std::unique_ptr<ModemBackend> createBackend(const TelephonyServiceOptions& options, std::string* error);

    // Builds the backend and the recorder and listens on the well-known port; false with
    // *error set when any of it fails (then nothing is left open). A --device service first
    // takes the device's DeviceLock, naming its port there, and holds it until stop(): with
    // another service on that device, start() fails naming it.
    bool start(std::string* error);
    // Closes every channel and the port, stops the backend, flushes the recording.
    void stop();

    const std::string& portName() const { return portName_; }
    ModemBackend* backend() const { return backend_.get(); }
    Counters counters() const;
    // "listening on <port>, backend <description>, technology <display name>"
    std::string startupLine() const;

    // Progress lines (a client came or went, a replay ended), on the service's thread.
    void setStatusCallback(StatusCallback callback) { status_ = std::move(callback); }

private:
    struct Channel {
        uint64_t number = 0;
        std::string clientPortName;
        std::unique_ptr<LocalMessagePort> port;
        std::unique_ptr<RemoteMessagePort> client;
        bool streaming = false;
        bool congested = false;  // the client has kHighWaterBytes or more not yet taken
        QElapsedTimer congestedSince;  // since when, with no drain in between
        bool closing = false;
        LogMask mask;
        uint64_t sent = 0;
        uint64_t dropped = 0;
        uint64_t droppedNotified = 0;  // "Dropped" of the channel's last ChannelStatus
        std::deque<std::pair<int32_t, Bytes>> queue;  // not yet handed to the socket, oldest first
        size_t queuedBytes = 0;
        QElapsedTimer age;
    };
    // What the ports counted (malformed frames, refused and over-limit peers).
    struct PortCounts {
        uint64_t malformed = 0, refused = 0, overLimit = 0, foreign = 0;
        void add(const LocalMessagePort& port);
    };

    std::optional<Bytes> receiveOnServicePort(int32_t messageId, const Bytes& data);
    Bytes createLogChannel(const std::string& clientPortName);
    std::optional<Bytes> receiveOnChannel(uint64_t number, int32_t messageId, const Bytes& data);
    void startStreaming(Channel& channel, const Dictionary& command);
    // Frees the channel from the event loop (never inside one of its ports' callbacks).
    void scheduleClose(uint64_t number, const char* why);
    void closeChannel(uint64_t number, const std::string& why);
    void sendMessage(int32_t messageId, const Bytes& data);
    // A replay's recorded display tick to every streaming channel, in order with its records.
    void sendDisplayTick(std::optional<int64_t> recordedMs);
    // Posts to the client; false when the client is gone (the channel is then closing).
    bool deliver(uint64_t number, Channel& channel, int32_t messageId, const Bytes& data);
    void enqueue(Channel& channel, int32_t messageId, const Bytes& data);
    void drainQueue(uint64_t number);
    // True when the port named is one this service listens on (the same socket file).
    bool servesPort(const RemoteMessagePort& port) const;
    void backendStateChanged(ModemBackend::State state);
    // Tells the backend the ordinary codes the streaming channels want.
    void updateLogCodes();
    void notifyBackendState();
    // Tells the channel's client, on the channel port, how many of its records were dropped.
    void notifyChannelStatus(Channel& channel);
    void updateFlow();
    void checkHealth();
    void statusLine(const std::string& line);
    PortCounts portCountsNow() const;

    TelephonyServiceOptions options_;
    std::string portName_;
    std::unique_ptr<DeviceLock> deviceLock_;  // declared before the backend: released after it
    std::unique_ptr<ModemBackend> backend_;
    std::unique_ptr<CaptureWriter> recorder_;
    std::unique_ptr<LocalMessagePort> port_;
    std::optional<gid_t> allowedGroup_;  // of --allow-group
    std::map<uint64_t, std::unique_ptr<Channel>> channels_;
    QTimer healthTimer_;
    StatusCallback status_;
    Counters counters_;
    PortCounts closedPorts_;  // of the ports closed already
    PortCounts reported_;
    bool stopping_ = false;
    bool starting_ = false;  // the backend's first start, whose failure start() reports itself
    std::vector<std::string> logTechnologies_;  // of the ordinary log codes seen this run, first-seen order
    uint64_t notifiedSent_ = 0;                 // "Sent" of the last notification
    QElapsedTimer notified_;                    // since the last notification
};

}  // namespace vantorel

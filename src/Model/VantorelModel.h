// VantorelModel: the monitor core: the baseband log channel to the telephony service, start-up with technology selection and retries, and the cached display tree.
#pragma once

#include "LogGenerator/LogGenerator.h"
#include "Model/SourceStatus.h"
#include "Model/VantorelModelNode.h"
#include "PropertyList/Value.h"

#include <QObject>

#include <chrono>
#include <functional>
#include <memory>
#include <optional>
#include <string>

class QTimer;

namespace vantorel {

class ApplicationObject;
class LocalMessagePort;
class RemoteMessagePort;
class TelephonyServiceConnection;

class VantorelModel : public QObject {
    Q_OBJECT
public:
    // Each request to the channel waits at most this long for its send and its reply.
    // The retry delay and the display tick come from MonitorClock.
    static constexpr double kRequestTimeoutSeconds = 1.0;
    // A stream that has run this long without a record the decoder reads is reported.
    static constexpr std::chrono::seconds kNoRecordWait{10};
    // A stream that has sent nothing (no record here, no progress at the service) this
    // long after it last did has frozen: its values are shown as stale.
    static constexpr std::chrono::seconds kFrozenWait{10};
    // Start-up failing this many times in a row is shown with its cause (retries go on).
    static constexpr int kFailedStartsBeforeTelling = 2;

    // `init`: an empty state, nothing connected. `application` receives
    // updateViewControllerFromModel; `serviceName` is the telephony service's port.
    explicit VantorelModel(ApplicationObject* application, std::string serviceName = defaultServiceName());
    ~VantorelModel() override;
    static std::string defaultServiceName();
    // Asked for the service's port name before each connection attempt (a monitor that joined
    // another's service takes the device over when that one ends); unset: the name given.
    void setServiceResolver(std::function<std::string()> resolver) { serviceResolver_ = std::move(resolver); }

    // The channel: a receive port of our own, a send port the service gives us.
    bool isConnected() const { return _recvPort && _sendPort; }
    bool createPorts();
    void destroyPorts();

    // Start-up (ports, technology query, start command, display tick) and refresh.
    void startMonitor();
    void restartMonitor();
    void configureGenerator();
    // displayTick: the display timer's tick, at which observers sample the display; a
    // service notification refreshes the view without being one.
    void refresh(bool displayTick = true);
    void updateWithData(ByteView data);

    // The display tree, rebuilt at most once per refresh that saw new data.
    NodeRef topLevelNodes();
    NodeRef nodeAtPath(const std::string& path);
    // The tree's path index (built if needed), as nodeAtPath reads it.
    const PathDictionary& pathIndex();
    Value getSaveContents();

    // Observers for the terminal view, the status line and tests.
    LogGenerator* logGenerator() const { return _logGenerator.get(); }
    Dictionary& state() { return *_state; }
    bool isRunning() const { return _displayUpdateTimer != nullptr; }
    const std::string& receivePortName() const { return receivePortName_; }
    uint64_t messagesDecoded() const { return messagesDecoded_; }

    // The source and the stream's state for the status line (updatedAt left to the view).
    // `authoritative`: the launcher knows the source (in-process service); otherwise the
    // service's notifications name it.
    void setSource(std::string description, bool isReplay, bool authoritative);
    SourceStatus sourceStatus() const;
    // The time a display tick stands for, in ms since 1970: for a replay, the recorded time
    // of the tick it marked (or of its last message as the service last told it); the
    // wall clock otherwise.
    int64_t tickTimeMs() const;

signals:
    // A display tick that found new data: the tree is rebuilt on the next read, and
    // observers that sample it (plots, exports) take one value per tick.
    void displayTicked();

private:
    // The receive port's message and invalidation callbacks and the service's notifications.
    std::optional<Bytes> receiveCallback(int32_t messageId, const Bytes& data);
    void invalidationCallback(LocalMessagePort* port);
    void serviceNotificationCallback(const std::string& name, const Value& info);
    // A start-up step failed for `why` (for people): closes what was opened, says why once
    // it has failed kFailedStartsBeforeTelling times in a row, and tries again later.
    void startFailed(const std::string& why);
    void scheduleRetry();
    void readBackendState(const Value& info);
    // The channel port's notifications: the records the service dropped for us.
    void channelNotificationCallback(const Bytes& data);
    void recordedTick(const Bytes& data);
    void switchDecoder(const std::string& technology);
    bool noRecordForDecoder() const;
    bool frozen() const;
    void tellApplication();

    // Ports are QObjects that may be inside their own callback when closed: they are
    // deleted from the event loop (deleteLater), never in place.
    struct LaterDeleter {
        void operator()(QObject* object) const;
    };

    std::unique_ptr<LocalMessagePort, LaterDeleter> _recvPort;
    std::unique_ptr<RemoteMessagePort, LaterDeleter> _sendPort;
    QTimer* _displayUpdateTimer = nullptr;
    bool _updated = false;
    std::unique_ptr<LogGenerator> _logGenerator;
    DictionaryRef _state;
    NodeRef _nodes;
    PathDictionary _nodesByPath;

    // Kept while the channel is open so that the service's notifications reach
    // `refresh`.
    std::unique_ptr<TelephonyServiceConnection> serverConnection_;
    ApplicationObject* application_;
    std::string serviceName_;
    std::function<std::string()> serviceResolver_;
    std::string receivePortName_;
    uint64_t messagesDecoded_ = 0;

    SourceStatus status_;
    bool sourceFixed_ = false;
    bool statusChanged_ = false;
    bool newSinceTick_ = false;  // data shown since the last display tick's displayTicked
    uint64_t messagesThisRun_ = 0;         // since the channel started streaming
    bool recordedTicks_ = false;           // the replay marks the display ticks
    std::optional<int64_t> recordedTickMs_;  // the last one's recorded time
    bool viewStale_ = false;               // a recorded tick took new data the view has not shown
    std::chrono::system_clock::time_point streamingSince_;
    std::chrono::system_clock::time_point lastData_;      // the last record; epoch before any
    std::chrono::system_clock::time_point lastActivity_;  // the last record or progress of the service
    std::string startFailure_;     // why the current start-up attempt failed, for people
    int failedStarts_ = 0;         // start-up attempts failed in a row
    uint64_t droppedBefore_ = 0;   // dropped for the channels closed already
    uint64_t droppedNow_ = 0;      // dropped for the open channel, as its service said
};

}  // namespace vantorel

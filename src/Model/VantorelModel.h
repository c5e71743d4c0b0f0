// VantorelModel: the monitor core: the baseband log channel (Part 2.1), start-up and technology selection (Part 2.2), and the display tree cache (Part 2.3).
#pragma once

#include "LogGenerator/LogGenerator.h"
#include "Model/VantorelModelNode.h"
#include "PropertyList/Value.h"

#include <QObject>

#include <chrono>
#include <memory>
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
    // The spec's constants (Part 2.2). Tests may scale the retry delay and the
    // display interval by one factor (`timeScale`); the product never changes them.
    // The 1.0 s request timeouts are never scaled.
    static constexpr std::chrono::milliseconds kRetryDelay{5000};
    static constexpr std::chrono::milliseconds kDisplayUpdateInterval{2000};
    static constexpr double kRequestTimeoutSeconds = 1.0;

    // `init`: an empty state, nothing connected. `application` receives
    // updateViewControllerFromModel; `serviceName` is the telephony service's port.
    explicit VantorelModel(ApplicationObject* application, std::string serviceName = defaultServiceName(),
                           double timeScale = 1.0);
    ~VantorelModel() override;
    static std::string defaultServiceName();

    // Part 2.1
    bool isConnected() const { return _recvPort && _sendPort; }
    bool createPorts();
    void destroyPorts();

    // Part 2.2
    void startMonitor();
    void restartMonitor();
    void configureGenerator();
    void refresh();
    void updateWithData(ByteView data);

    // Part 2.3
    NodeRef topLevelNodes();
    NodeRef nodeAtPath(const std::string& path);
    Value getSaveContents();

    // Observers for the terminal view, the status line and tests.
    LogGenerator* logGenerator() const { return _logGenerator.get(); }
    Dictionary& state() { return *_state; }
    bool isRunning() const { return _displayUpdateTimer != nullptr; }
    const std::string& receivePortName() const { return receivePortName_; }
    uint64_t messagesDecoded() const { return messagesDecoded_; }

private:
    // The three callbacks of Part 2.1 (the model is their context).
    std::optional<Bytes> receiveCallback(int32_t messageId, const Bytes& data);
    void invalidationCallback(LocalMessagePort* port);
    void serviceNotificationCallback(const std::string& name, const Value& info);
    void scheduleRetry();
    std::chrono::milliseconds scaled(std::chrono::milliseconds ms) const;

    // Ports are QObjects that may be inside their own callback when closed: they are
    // deleted from the event loop (deleteLater), never in place.
    struct LaterDeleter {
        void operator()(QObject* object) const;
    };

    // The fields of Part 2.1, in its order.
    std::unique_ptr<LocalMessagePort, LaterDeleter> _recvPort;
    std::unique_ptr<RemoteMessagePort, LaterDeleter> _sendPort;
    QTimer* _displayUpdateTimer = nullptr;
    bool _updated = false;
    std::unique_ptr<LogGenerator> _logGenerator;
    DictionaryRef _state;
    NodeRef _nodes;
    PathDictionary _nodesByPath;

    // Kept while the channel is open so that the service's notifications reach
    // `refresh` (on the handset the run loop keeps the connection alive).
    std::unique_ptr<TelephonyServiceConnection> serverConnection_;
    ApplicationObject* application_;
    std::string serviceName_;
    double timeScale_;
    std::string receivePortName_;
    uint64_t messagesDecoded_ = 0;
};

}  // namespace vantorel

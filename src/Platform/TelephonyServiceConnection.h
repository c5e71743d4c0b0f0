// TelephonyServiceConnection: the client side of the telephony service: a server connection with notifications, and creating a network-monitor log channel (docs/protocol.md).
#pragma once

#include "PropertyList/Value.h"

#include <functional>
#include <memory>
#include <string>

namespace vantorel {

class RemoteMessagePort;

class TelephonyServiceConnection {
public:
    // On a client's receive port: message id 0 is a record; this id marks a replay's
    // display tick on its recorded time, in order with the records (data: the tick's
    // time, s64 LE ms since 1970; empty for a stream without times).
    static constexpr int32_t kDisplayTickMessageId = 2;

    // A notification's name ("BackendStateChanged", ...) and its info dictionary.
    using NotificationCallback = std::function<void(const std::string& name, const Value& info)>;

    // The service's well-known port name: $VANTOREL_SERVICE if set, else "vantorel.telephony".
    static std::string defaultServiceName();

    // Connects to the service; null when no service answers (within 1 s).
    static std::unique_ptr<TelephonyServiceConnection> open(NotificationCallback callback,
                                                            const std::string& serviceName = defaultServiceName());
    ~TelephonyServiceConnection();

    struct LogChannelResult {
        int32_t errorDomain = 0;  // 0 when errorCode is 0
        int32_t errorCode = 0;    // 0 on success
        std::string portName;     // the service's own port for this channel; empty on failure
    };
    // Asks the service for a network-monitor log channel that streams to the local
    // port `localPortName` (sent as its socket path). Blocks up to 1.0 s + 1.0 s.
    LogChannelResult createLogChannel(const std::string& localPortName);

    bool isValid() const;

private:
    explicit TelephonyServiceConnection(std::unique_ptr<RemoteMessagePort> port);
    std::unique_ptr<RemoteMessagePort> port_;
};

}  // namespace vantorel

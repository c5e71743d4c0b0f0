// FakeTelephonyService: a telephony service for the model's tests, built from the real message ports on its own thread, whose answers a test can change.
#pragma once

#include "Platform/TelephonyIdentifiers.h"
#include "PropertyList/Value.h"
#include "support/EventLoopWait.h"

#include <QThread>

#include <atomic>
#include <functional>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <vector>

namespace vantorel {
class LocalMessagePort;
class RemoteMessagePort;
}  // namespace vantorel

namespace vantorel::testing {

struct FakeServiceBehaviour {
    std::string technology = kTSLogChannelTechnology_Morvek_UTRAN2;
    bool answerGetTechnology = true;  // false: a modem that never answers the query
    bool answerWithPlist = true;      // false: an answer that is not a property list
    bool answerHasTechnology = true;  // false: a dictionary without "GetTechnology"
    int32_t channelErrorCode = 0;     // non-zero: CreateLogChannel fails
    bool emptyPortName = false;       // the service returns no channel port
};

class FakeTelephonyService {
public:
    using Behaviour = FakeServiceBehaviour;

    explicit FakeTelephonyService(Behaviour behaviour = Behaviour());
    ~FakeTelephonyService();

    const std::string& name() const { return name_; }
    void setBehaviour(const Behaviour& behaviour);

    // Sends one message to the newest channel's client port.
    bool send(const Bytes& data, int32_t messageId = 0);
    // Closes the newest channel's own port (the model's send port dies).
    void closeChannelPort();
    // Drops the connection to the newest client's receive port (the model's receive
    // port is invalidated from outside).
    void dropClient();
    // Pushes a notification to every server connection; its Info is `info` (the
    // backend's "State", "Source", "Sent", "Total", ...) or {"State": "Streaming"}.
    void notify(const std::string& name, const Value& info = Value());
    // Pushes a notification {"Name": name, "Info": info} on the newest channel's port.
    void notifyChannel(const std::string& name, const Value& info);

    int channelsCreated() const { return channelCount_.load(); }
    // The start commands received, as parsed dictionaries.
    std::vector<Value> startCommands() const;
    std::vector<std::string> clientPortNames() const;

private:
    Behaviour behaviour() const;
    // Runs fn on the service thread, where the ports live, and waits for it.
    void onServiceThread(const std::function<void()>& fn);
    std::optional<Bytes> createLogChannel(const Bytes& data);
    std::optional<Bytes> command(const Bytes& data);

    std::string name_;
    QThread thread_;
    std::unique_ptr<QObject> context_;
    std::unique_ptr<LocalMessagePort> server_;
    std::vector<std::unique_ptr<LocalMessagePort>> channels_;
    std::vector<std::unique_ptr<RemoteMessagePort>> clients_;
    mutable std::mutex mutex_;
    Behaviour behaviour_;
    std::vector<Value> startCommands_;
    std::vector<std::string> clientPorts_;
    std::atomic<int> channelCount_{0};
};

}  // namespace vantorel::testing

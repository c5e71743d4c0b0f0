// ServiceTestSupport: test-side helpers for the telephony service tests: unique port names, waiting on the event loop, in-memory streams and a model-like client.
#pragma once

#include "Platform/LocalMessagePort.h"
#include "Platform/RemoteMessagePort.h"
#include "Platform/TelephonyServiceConnection.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"
#include "PropertyList/PropertyListSerialization.h"
#include "TelephonyService/Replay/CaptureWriter.h"
#include "TelephonyService/Replay/RecordedStream.h"

#include <QCoreApplication>
#include <QDeadlineTimer>
#include <QEventLoop>
#include <QTimer>

#include <atomic>
#include <functional>
#include <initializer_list>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "TelephonyService/ModemBackend.h"
#include "support/EventLoopWait.h"

namespace vantorel::servicetest {

using vantorel::testing::spin;
using vantorel::testing::uniquePortName;
using vantorel::testing::waitUntil;

// Collects what a backend emits: its messages and its state changes, in order.
struct Collector {
    std::vector<Bytes> messages;
    std::vector<ModemBackend::State> states;
    void attach(ModemBackend& backend) {
        QObject::connect(&backend, &ModemBackend::messageReady,
                         [this](int32_t, const Bytes& data) { messages.push_back(data); });
        QObject::connect(&backend, &ModemBackend::stateChanged, [this](ModemBackend::State s) { states.push_back(s); });
    }
};

// An in-memory capture of the messages (times 1 ms apart unless given), as a RecordedStream.
inline RecordedStream streamOf(const std::vector<Bytes>& messages, const std::string& technology,
                               int64_t stepMicros = 1000) {
    Bytes file = CaptureWriter::headerBytes(technology);
    int64_t time = 1700000000000000;
    for (const Bytes& m : messages) {
        const Bytes one = CaptureWriter::messageBytes(time, 0, m);
        file.insert(file.end(), one.begin(), one.end());
        time += stepMicros;
    }
    return RecordedStream::fromBytes(file);
}

inline Bytes xmlOf(const DictionaryRef& dict) {
    return PropertyListSerialization::write(Value(dict), PropertyListSerialization::Format::XML).value();
}

inline DictionaryRef startCommand(std::initializer_list<int64_t> ordinary, std::initializer_list<int64_t> extra) {
    auto codes = Array::create();
    for (int64_t c : ordinary) codes->append(Value::integer(c));
    auto extras = Array::create();
    for (int64_t c : extra) extras->append(Value::integer(c));
    auto dict = Dictionary::create();
    dict->set("SetState", Value("Streaming"));
    dict->set("SetMorvekLogCodes", Value(codes));
    dict->set("SetTsExtraCodes", Value(extras));
    return dict;
}

// The model's side of the channel (Parts 2.1, 2.2): a receive port, the service
// connection, the channel's send port; every message with id 0 is kept.
class TestClient {
public:
    struct Notification {
        std::string name;
        Value info;
    };

    std::vector<Bytes> received;
    std::vector<Notification> notifications;
    TelephonyServiceConnection::LogChannelResult channel;

    // Creates the receive port and asks the service for a channel; true when the
    // channel's port was found. keepConnection: keep the server connection (for
    // notifications) instead of releasing it as the model does.
    bool connect(const std::string& serviceName, bool keepConnection = false) {
        recvName_ = uniquePortName("client");
        recv_ = LocalMessagePort::create(recvName_, [this](int32_t id, const Bytes& data) -> std::optional<Bytes> {
            if (id == 0) received.push_back(data);
            return std::nullopt;
        });
        if (!recv_) return false;
        connection_ = TelephonyServiceConnection::open(
            [this](const std::string& name, const Value& info) { notifications.push_back({name, info}); }, serviceName);
        if (!connection_) return false;
        channel = connection_->createLogChannel(recvName_);
        if (!keepConnection) connection_.reset();
        if (channel.errorCode != 0 || channel.portName.empty()) return false;
        send_ = RemoteMessagePort::lookup(channel.portName);
        return send_ != nullptr;
    }

    std::optional<std::string> getTechnology() {
        auto query = Dictionary::create();
        query->set("GetTechnology", Value("GetTechnology"));
        std::optional<Bytes> reply;
        if (send_->sendRequest(0, xmlOf(query), 1.0, 1.0, &reply) != RemoteMessagePort::Success || !reply)
            return std::nullopt;
        PropertyListResult parsed = PropertyListSerialization::readDictionary(*reply);
        if (!parsed) return std::nullopt;
        const std::string* tech = parsed.value->asDictionary()->get("GetTechnology").asString();
        return tech ? std::optional<std::string>(*tech) : std::nullopt;
    }

    bool send(const DictionaryRef& command) {
        return send_->sendRequest(0, xmlOf(command), 1.0, 0, nullptr) == RemoteMessagePort::Success;
    }

    // Closes both ports, as the model's destroyPorts does.
    void close() {
        if (recv_) recv_->invalidate();
        if (send_) send_->invalidate();
    }

    const std::string& receivePortName() const { return recvName_; }

private:
    std::string recvName_;
    std::unique_ptr<LocalMessagePort> recv_;
    std::unique_ptr<TelephonyServiceConnection> connection_;
    std::unique_ptr<RemoteMessagePort> send_;
};

}  // namespace vantorel::servicetest

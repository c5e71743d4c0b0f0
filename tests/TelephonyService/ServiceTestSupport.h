// ServiceTestSupport: test-side helpers for the telephony service tests: HDLC frames, DIAG log packets, in-memory streams, start commands, a fast UTRAN modem and a model-like client.
#pragma once

#include "Platform/LocalMessagePort.h"
#include "Platform/RecordBuilder.h"
#include "Platform/RemoteMessagePort.h"
#include "Platform/TelephonyIdentifiers.h"
#include "Platform/TelephonyServiceConnection.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"
#include "PropertyList/PropertyListSerialization.h"
#include "TelephonyService/Device/DiagCommand.h"
#include "TelephonyService/Emulator/UTRANScenario.h"
#include "TelephonyService/Replay/DiagPacket.h"
#include "TelephonyService/Replay/CaptureWriter.h"
#include "TelephonyService/Replay/HdlcDeframer.h"
#include "TelephonyService/Replay/RecordedStream.h"
#include "support/EventLoopWait.h"

#include <initializer_list>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace vantorel::servicetest {

using vantorel::testing::spin;
using vantorel::testing::uniquePortName;
using vantorel::testing::waitUntil;

inline std::string capturePath(const std::string& name) { return std::string(VANTOREL_CAPTURES_DIR) + "/" + name; }

inline void append(Bytes& out, ByteView more) { out.insert(out.end(), more.begin(), more.end()); }

// escape(body + CRC16 LE) + 7E; a non-zero crcXor spoils the CRC on purpose.
inline Bytes hdlcFrame(ByteView body, uint16_t crcXor = 0) { return DiagCommand::frame(body, crcXor); }

inline Bytes morvekRecord(uint16_t code, uint64_t timeStamp, std::initializer_list<uint8_t> payload) {
    return RecordBuilder::ordinary(code).timestamp(timeStamp).bytes(13, ByteView(payload.begin(), payload.size())).build();
}

// A DIAG log packet: 10 00 <len LE>, then the Morvek record without its type byte.
inline Bytes logPacketBody(uint16_t code, uint64_t timeStamp, std::initializer_list<uint8_t> payload) {
    return DiagPacket::logPacketFromRecord(morvekRecord(code, timeStamp, payload));
}

// An in-memory UTRAN capture of the messages at the given times (1 ms apart when none are given).
inline RecordedStream streamOf(const std::vector<Bytes>& messages, const std::vector<int64_t>& times = {}) {
    Bytes file = CaptureWriter::headerBytes(kTSLogChannelTechnology_Morvek_UTRAN2);
    for (size_t i = 0; i < messages.size(); ++i)
        append(file, CaptureWriter::messageBytes(times.empty() ? 1700000000000000 + int64_t(i) * 1000 : times[i], 0,
                                                 messages[i]));
    return RecordedStream::fromBytes(file);
}

inline Bytes xmlOf(const DictionaryRef& dict) {
    return PropertyListSerialization::write(Value(dict), PropertyListSerialization::Format::XML).value();
}

// {"SetState": "Streaming"} with the code lists, or with none when withLists is false.
inline DictionaryRef startCommand(std::initializer_list<int64_t> ordinary, std::initializer_list<int64_t> extra,
                                  bool withLists = true) {
    auto dict = Dictionary::create();
    dict->set("SetState", Value("Streaming"));
    if (!withLists) return dict;
    auto codes = Array::create(), extras = Array::create();
    for (int64_t c : ordinary) codes->append(Value::integer(c));
    for (int64_t c : extra) extras->append(Value::integer(c));
    dict->set("SetMorvekLogCodes", Value(codes));
    dict->set("SetTsExtraCodes", Value(extras));
    return dict;
}

// The UTRAN modem ticking every 20 ms, so the tests need not wait.
class FastUTRANScenario : public UTRANScenario {
public:
    explicit FastUTRANScenario(uint64_t seed = 1) : UTRANScenario(seed) {}
    std::chrono::milliseconds tickInterval() const override { return std::chrono::milliseconds(20); }
};

// The model's side of a log channel: a receive port keeping every message with id 0,
// the service connection, the channel's send port.
class TestClient {
public:
    std::vector<Bytes> received;
    std::vector<std::pair<std::string, Value>> notifications;
    std::vector<Value> channelNotifications;  // on the channel port, whole
    TelephonyServiceConnection::LogChannelResult channel;

    // keepConnection: keep the server connection (for notifications) instead of releasing it as the model does.
    // recvName: a receive port the caller made (one that never reads); by default the client makes its own.
    bool connect(const std::string& serviceName, bool keepConnection = false, std::string recvName = {}) {
        if (recvName.empty()) {
            recvName = uniquePortName("client");
            recv_ = LocalMessagePort::create(recvName, [this](int32_t id, const Bytes& data) -> std::optional<Bytes> {
                if (id == 0) received.push_back(data);
                return std::nullopt;
            });
            if (!recv_) return false;
        }
        connection_ = TelephonyServiceConnection::open(
            [this](const std::string& name, const Value& info) { notifications.emplace_back(name, info); }, serviceName);
        if (!connection_) return false;
        channel = connection_->createLogChannel(recvName);
        if (!keepConnection) connection_.reset();
        send_ = RemoteMessagePort::lookup(channel.portName);
        if (send_)
            send_->setNotificationCallback([this](int32_t, const Bytes& data) {
                const PropertyListResult parsed = PropertyListSerialization::readDictionary(data);
                if (parsed) channelNotifications.push_back(*parsed.value);
            });
        return channel.errorCode == 0 && send_ != nullptr;
    }

    std::optional<std::string> getTechnology() {
        auto query = Dictionary::create();
        query->set("GetTechnology", Value("GetTechnology"));
        std::optional<Bytes> reply;
        if (send_->sendRequest(0, xmlOf(query), 1.0, 1.0, &reply) != RemoteMessagePort::Success || !reply) return {};
        PropertyListResult parsed = PropertyListSerialization::readDictionary(*reply);
        const std::string* tech = parsed ? parsed.value->asDictionary()->get("GetTechnology").asString() : nullptr;
        return tech ? std::optional<std::string>(*tech) : std::nullopt;
    }

    bool send(const DictionaryRef& command) {
        return send_->sendRequest(0, xmlOf(command), 1.0, 0, nullptr) == RemoteMessagePort::Success;
    }

    // Closes both ports, as the model does when it lets go of the channel.
    void close() {
        if (recv_) recv_->invalidate();
        send_->invalidate();
    }

    // The states of the BackendStateChanged notifications heard so far.
    std::vector<std::string> backendStates() const {
        std::vector<std::string> states;
        for (const auto& [name, info] : notifications)
            if (const DictionaryRef d = info.asDictionary(); d && name == "BackendStateChanged")
                states.push_back(d->get("State").asString() ? *d->get("State").asString() : "?");
        return states;
    }

    // "Dropped" of the last ChannelStatus heard, if any.
    std::optional<int64_t> dropped() const {
        for (auto it = channelNotifications.rbegin(); it != channelNotifications.rend(); ++it) {
            const DictionaryRef d = it->asDictionary();
            const std::string* name = d ? d->get("Name").asString() : nullptr;
            const DictionaryRef info = d ? d->get("Info").asDictionary() : nullptr;
            if (name && *name == "ChannelStatus" && info) return info->get("Dropped").asInteger();
        }
        return std::nullopt;
    }

private:
    std::unique_ptr<LocalMessagePort> recv_;
    std::unique_ptr<TelephonyServiceConnection> connection_;
    std::unique_ptr<RemoteMessagePort> send_;
};

}  // namespace vantorel::servicetest

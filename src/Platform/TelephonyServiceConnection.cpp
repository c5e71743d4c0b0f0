// TelephonyServiceConnection: client of the telephony service's well-known port: notifications and CreateLogChannel (docs/protocol.md).
#include "Platform/TelephonyServiceConnection.h"

#include "Platform/PortDirectory.h"
#include "Platform/RemoteMessagePort.h"
#include "PropertyList/Dictionary.h"
#include "PropertyList/PropertyListSerialization.h"

#include <cstdlib>

namespace vantorel {

namespace {

constexpr const char* kDefaultServiceName = "vantorel.telephony";
constexpr int kLookupTimeoutMs = 1000;
constexpr int32_t kCreateLogChannelMessageId = 1;
constexpr double kCreateLogChannelSendTimeout = 1.0;
constexpr double kCreateLogChannelReceiveTimeout = 1.0;
// Error domain of failures on the client side of the request (docs/protocol.md).
constexpr int32_t kTransportErrorDomain = 2;
constexpr int32_t kUnparsableReply = -6;

TelephonyServiceConnection::LogChannelResult transportError(int32_t code) {
    TelephonyServiceConnection::LogChannelResult result;
    result.errorDomain = kTransportErrorDomain;
    result.errorCode = code;
    return result;
}

}  // namespace

std::string TelephonyServiceConnection::defaultServiceName() {
    const char* name = std::getenv("VANTOREL_SERVICE");
    return (name && *name) ? std::string(name) : std::string(kDefaultServiceName);
}

TelephonyServiceConnection::TelephonyServiceConnection(std::unique_ptr<RemoteMessagePort> port)
    : port_(std::move(port)) {}

TelephonyServiceConnection::~TelephonyServiceConnection() = default;

std::unique_ptr<TelephonyServiceConnection> TelephonyServiceConnection::open(NotificationCallback callback,
                                                                             const std::string& serviceName) {
    std::unique_ptr<RemoteMessagePort> port = RemoteMessagePort::lookup(serviceName, kLookupTimeoutMs);
    if (!port) return nullptr;
    if (callback) {
        // A notification is {"Name": string, "Info": dictionary}; anything else is ignored.
        port->setNotificationCallback([callback = std::move(callback)](int32_t, const Bytes& data) {
            PropertyListResult parsed = PropertyListSerialization::readDictionary(data);
            if (!parsed) return;
            DictionaryRef dict = parsed.value->asDictionary();
            const std::string* name = dict->get("Name").asString();
            if (!name) return;
            Value info = dict->get("Info");
            if (info.isNull()) info = Value(Dictionary::create());
            if (!info.isDictionary()) return;
            callback(*name, info);
        });
    }
    return std::unique_ptr<TelephonyServiceConnection>(new TelephonyServiceConnection(std::move(port)));
}

bool TelephonyServiceConnection::isValid() const { return port_ && port_->isValid(); }

TelephonyServiceConnection::LogChannelResult TelephonyServiceConnection::createLogChannel(
    const std::string& localPortName) {
    auto request = Dictionary::create();
    request->set("Request", Value("CreateLogChannel"));
    // The socket path, not the bare name: a service of another user (root, serving a
    // group) resolves bare names in its own runtime directory, not in ours.
    std::string refused;
    const std::string socketPath = PortDirectory::socketPathFor(localPortName, &refused);
    request->set("PortName", Value(socketPath.empty() ? localPortName : socketPath));
    std::optional<Bytes> xml = PropertyListSerialization::write(Value(request), PropertyListSerialization::Format::XML);
    if (!xml) return transportError(kUnparsableReply);  // cannot happen for two strings

    std::optional<Bytes> reply;
    const int32_t status = port_->sendRequest(kCreateLogChannelMessageId, *xml, kCreateLogChannelSendTimeout,
                                              kCreateLogChannelReceiveTimeout, &reply);
    if (status != RemoteMessagePort::Success) return transportError(status);
    if (!reply) return transportError(kUnparsableReply);

    PropertyListResult parsed = PropertyListSerialization::readDictionary(*reply);
    if (!parsed) return transportError(kUnparsableReply);
    DictionaryRef dict = parsed.value->asDictionary();

    // Absent error entries mean success; present ones must be integers, the port
    // name a string.
    LogChannelResult result;
    for (auto [key, field] : {std::pair{"ErrorDomain", &result.errorDomain}, std::pair{"ErrorCode", &result.errorCode}}) {
        const Value* value = dict->find(key);
        if (!value) continue;
        std::optional<int32_t> number = value->asInteger() ? value->asInt32() : std::nullopt;
        if (!number) return transportError(kUnparsableReply);
        *field = *number;
    }
    if (const Value* name = dict->find("PortName")) {
        if (!name->asString()) return transportError(kUnparsableReply);
        result.portName = *name->asString();
    }
    if (result.errorCode == 0) {
        result.errorDomain = 0;
    } else {
        result.portName.clear();
    }
    return result;
}

}  // namespace vantorel

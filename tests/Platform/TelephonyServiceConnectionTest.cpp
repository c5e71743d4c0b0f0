// Tests for TelephonyServiceConnection against a fake service on a LocalMessagePort: CreateLogChannel results, notifications, no service (Parts 2.1, 2.2; docs/protocol.md).
#include "Platform/TelephonyServiceConnection.h"

#include "MessagePortTestHarness.h"
#include "Platform/LocalMessagePort.h"
#include "Platform/RemoteMessagePort.h"
#include "PropertyList/Dictionary.h"
#include "PropertyList/PropertyListSerialization.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <mutex>

using namespace vantorel;
using namespace vantorel::test;

namespace {

Bytes xml(const DictionaryRef& dict) {
    return *PropertyListSerialization::write(Value(dict), PropertyListSerialization::Format::XML);
}

Bytes channelReply(int64_t domain, int64_t code, const char* portName) {
    auto dict = Dictionary::create();
    dict->set("ErrorDomain", Value::integer(domain));
    dict->set("ErrorCode", Value::integer(code));
    dict->set("PortName", Value(portName));
    return xml(dict);
}

// The service's well-known port with a canned reply; records what it was asked.
class FakeService {
public:
    explicit FakeService(std::optional<Bytes> reply) : name_(uniquePortName("service")) {
        port_ = server_.create(name_, [this, reply](int32_t id, const Bytes& data) {
            std::lock_guard<std::mutex> lock(mutex_);
            requests_.emplace_back(id, data);
            return reply;
        });
        if (port_) server_.run([this] { port_->setStaysValidWithoutPeers(true); });
    }
    const std::string& name() const { return name_; }
    LocalMessagePort* port() { return port_; }
    ServerThread& server() { return server_; }
    std::vector<std::pair<int32_t, Bytes>> requests() {
        std::lock_guard<std::mutex> lock(mutex_);
        return requests_;
    }

private:
    std::string name_;
    LocalMessagePort* port_ = nullptr;
    std::mutex mutex_;
    std::vector<std::pair<int32_t, Bytes>> requests_;
    ServerThread server_;  // last: stopped first, before what its callback uses
};

}  // namespace

TEST(TelephonyServiceConnection, CreateLogChannelSendsTheRequestAndReturnsTheServicesPortName) {
    FakeService service(channelReply(0, 0, "vantorel.telephony.channel.1.1"));
    ASSERT_NE(service.port(), nullptr);
    auto connection = TelephonyServiceConnection::open(nullptr, service.name());
    ASSERT_NE(connection, nullptr);
    EXPECT_TRUE(connection->isValid());

    auto result = connection->createLogChannel("VantorelApp.1234");
    EXPECT_EQ(result.errorDomain, 0);
    EXPECT_EQ(result.errorCode, 0);
    EXPECT_EQ(result.portName, "vantorel.telephony.channel.1.1");

    auto requests = service.requests();
    ASSERT_EQ(requests.size(), 1u);
    EXPECT_EQ(requests[0].first, 1);
    auto parsed = PropertyListSerialization::readDictionary(requests[0].second);
    ASSERT_TRUE(parsed);
    auto dict = parsed.value->asDictionary();
    EXPECT_EQ(dict->size(), 2u);
    EXPECT_EQ(dict->get("Request"), Value("CreateLogChannel"));
    EXPECT_EQ(dict->get("PortName"), Value("VantorelApp.1234"));
    // The request went out as an XML property list.
    const std::string text(requests[0].second.begin(), requests[0].second.end());
    EXPECT_EQ(text.rfind("<?xml", 0), 0u);
}

TEST(TelephonyServiceConnection, AnErrorFromTheServiceIsReturnedWithoutAPortName) {
    FakeService service(channelReply(1, 2, "ignored"));
    ASSERT_NE(service.port(), nullptr);
    auto connection = TelephonyServiceConnection::open(nullptr, service.name());
    ASSERT_NE(connection, nullptr);
    auto result = connection->createLogChannel("VantorelApp.x");
    EXPECT_EQ(result.errorDomain, 1);
    EXPECT_EQ(result.errorCode, 2);
    EXPECT_EQ(result.portName, "");
}

TEST(TelephonyServiceConnection, AnUnparsableReplyGivesTheTransportDomainAndMinus6) {
    for (const Bytes& reply : {Bytes{'n', 'o', 't', ' ', 'a', ' ', 'p', 'l', 'i', 's', 't'}, Bytes{},
                               xml([] {
                                   auto d = Dictionary::create();
                                   d->set("ErrorCode", Value("zero"));  // not an integer
                                   return d;
                               }())}) {
        FakeService service(reply);
        ASSERT_NE(service.port(), nullptr);
        auto connection = TelephonyServiceConnection::open(nullptr, service.name());
        ASSERT_NE(connection, nullptr);
        auto result = connection->createLogChannel("VantorelApp.y");
        EXPECT_EQ(result.errorDomain, 2);
        EXPECT_EQ(result.errorCode, -6);
        EXPECT_EQ(result.portName, "");
    }
}

TEST(TelephonyServiceConnection, AFailedRequestGivesTheTransportDomainAndTheSendStatus) {
    FakeService service(channelReply(0, 0, "p"));
    ASSERT_NE(service.port(), nullptr);
    auto connection = TelephonyServiceConnection::open(nullptr, service.name());
    ASSERT_NE(connection, nullptr);
    ASSERT_TRUE(waitUntil([&] { return service.server().peerCount(service.port()) == 1; }));
    service.server().destroy(service.port());  // the service goes away
    auto result = connection->createLogChannel("VantorelApp.z");
    EXPECT_EQ(result.errorDomain, 2);
    EXPECT_EQ(result.errorCode, RemoteMessagePort::BecameInvalidError);
    EXPECT_EQ(result.portName, "");
    EXPECT_FALSE(connection->isValid());
    result = connection->createLogChannel("VantorelApp.z");
    EXPECT_EQ(result.errorCode, RemoteMessagePort::IsInvalid);
}

TEST(TelephonyServiceConnection, OpenWithNoServiceGivesNull) {
    EXPECT_EQ(TelephonyServiceConnection::open(nullptr, uniquePortName("noservice")), nullptr);
}

TEST(TelephonyServiceConnection, ANotificationReachesTheCallbackWithItsNameAndInfo) {
    FakeService service(std::nullopt);
    ASSERT_NE(service.port(), nullptr);
    std::vector<std::pair<std::string, Value>> seen;
    auto connection = TelephonyServiceConnection::open(
        [&](const std::string& name, const Value& info) { seen.emplace_back(name, info); }, service.name());
    ASSERT_NE(connection, nullptr);
    ASSERT_TRUE(waitUntil([&] { return service.server().peerCount(service.port()) == 1; }));

    auto info = Dictionary::create();
    info->set("State", Value("Streaming"));
    info->set("Technology", Value("Morvek_LTE"));
    auto note = Dictionary::create();
    note->set("Name", Value("BackendStateChanged"));
    note->set("Info", Value(info));
    auto noName = Dictionary::create();
    noName->set("Info", Value(Dictionary::create()));
    service.server().run([&] {
        service.port()->broadcastNotification(0, Bytes{'x'});  // not a plist: ignored
        service.port()->broadcastNotification(0, xml(noName));  // no name: ignored
        service.port()->broadcastNotification(0, xml(note));
    });
    ASSERT_TRUE(waitUntil([&] { return !seen.empty(); }));
    QCoreApplication::processEvents();
    ASSERT_EQ(seen.size(), 1u);
    EXPECT_EQ(seen[0].first, "BackendStateChanged");
    EXPECT_EQ(seen[0].second, Value(info));
}

TEST(TelephonyServiceConnection, TheDefaultServiceNameComesFromTheEnvironment) {
    const char* saved = std::getenv("VANTOREL_SERVICE");
    const std::string restore = saved ? saved : "";
    unsetenv("VANTOREL_SERVICE");
    EXPECT_EQ(TelephonyServiceConnection::defaultServiceName(), "vantorel.telephony");
    setenv("VANTOREL_SERVICE", "my.service", 1);
    EXPECT_EQ(TelephonyServiceConnection::defaultServiceName(), "my.service");
    if (saved) {
        setenv("VANTOREL_SERVICE", restore.c_str(), 1);
    } else {
        unsetenv("VANTOREL_SERVICE");
    }
}

// FakeTelephonyService: a scriptable telephony service on its own thread, built from the real message ports.
#include "support/FakeTelephonyService.h"

#include "Platform/LocalMessagePort.h"
#include "Platform/RemoteMessagePort.h"
#include "PropertyList/Dictionary.h"
#include "PropertyList/PropertyListSerialization.h"

#include <QMetaObject>

namespace vantorel::testing {

namespace {
Bytes xml(const DictionaryRef& d) { return *PropertyListSerialization::write(Value(d), PropertyListSerialization::Format::XML); }
}  // namespace

// Lives on the service thread; owns the ports there.
struct FakeServiceWorker : QObject {
    explicit FakeServiceWorker(FakeTelephonyService* owner) : owner_(owner) {}

    void start() {
        server_ = LocalMessagePort::create(owner_->name_, [this](int32_t id, const Bytes& data) {
            return id == 1 ? createLogChannel(data) : std::nullopt;
        });
        // The well-known port outlives its clients' connections.
        if (server_) server_->setStaysValidWithoutPeers(true);
    }

    std::optional<Bytes> createLogChannel(const Bytes& data) {
        const FakeTelephonyService::Behaviour b = owner_->behaviour();
        const auto request = PropertyListSerialization::readDictionary(data);
        const std::string* clientPort = request ? request.value->asDictionary()->get("PortName").asString() : nullptr;
        auto reply = Dictionary::create();
        if (b.channelErrorCode != 0 || !clientPort || clientPort->empty()) {
            reply->set("ErrorDomain", Value::integer(1));
            reply->set("ErrorCode", Value::integer(b.channelErrorCode ? b.channelErrorCode : 1));
            reply->set("PortName", "");
            return xml(reply);
        }
        const std::string channelName = owner_->name_ + ".channel." + std::to_string(++owner_->channels_);
        channels_.push_back(LocalMessagePort::create(channelName, [this](int32_t, const Bytes& c) { return command(c); }));
        clients_.push_back(RemoteMessagePort::lookup(*clientPort, 1000));
        {
            std::lock_guard<std::mutex> lock(owner_->mutex_);
            owner_->clientPorts_.push_back(*clientPort);
        }
        reply->set("ErrorDomain", Value::integer(0));
        reply->set("ErrorCode", Value::integer(0));
        reply->set("PortName", b.emptyPortName ? "" : channelName);
        return xml(reply);
    }

    std::optional<Bytes> command(const Bytes& data) {
        const auto parsed = PropertyListSerialization::readDictionary(data);
        if (!parsed) return std::nullopt;
        const DictionaryRef command = parsed.value->asDictionary();
        if (!command->contains("GetTechnology")) {
            std::lock_guard<std::mutex> lock(owner_->mutex_);
            owner_->startCommands_.push_back(Value(command));
            return std::nullopt;
        }
        const FakeTelephonyService::Behaviour b = owner_->behaviour();
        if (!b.answerGetTechnology) {
            QThread::msleep(1500);  // longer than any receive timeout in the tests
            return std::nullopt;
        }
        if (!b.answerWithPlist) return Bytes{'n', 'o', 't', ' ', 'a', ' ', 'p', 'l', 'i', 's', 't'};
        auto answer = Dictionary::create();
        answer->set(b.answerHasTechnology ? "GetTechnology" : "Something", b.answerHasTechnology ? b.technology : "else");
        return xml(answer);
    }

    RemoteMessagePort* lastClient() { return clients_.empty() ? nullptr : clients_.back().get(); }

    FakeTelephonyService* owner_;
    std::unique_ptr<LocalMessagePort> server_;
    std::vector<std::unique_ptr<LocalMessagePort>> channels_;
    std::vector<std::unique_ptr<RemoteMessagePort>> clients_;
};

FakeTelephonyService::FakeTelephonyService(Behaviour behaviour)
    : name_(uniquePortName("fake-service")), behaviour_(behaviour) {
    worker_ = new FakeServiceWorker(this);
    worker_->moveToThread(&thread_);
    thread_.start();
    onServiceThread([](FakeServiceWorker& w) { w.start(); });
}

FakeTelephonyService::~FakeTelephonyService() {
    onServiceThread([](FakeServiceWorker& worker) { delete &worker; });
    thread_.quit();
    thread_.wait();
}

void FakeTelephonyService::onServiceThread(const std::function<void(FakeServiceWorker&)>& fn) {
    QMetaObject::invokeMethod(worker_, [&] { fn(*worker_); }, Qt::BlockingQueuedConnection);
}

FakeTelephonyService::Behaviour FakeTelephonyService::behaviour() const {
    std::lock_guard<std::mutex> lock(mutex_);
    return behaviour_;
}

void FakeTelephonyService::setBehaviour(const Behaviour& behaviour) {
    std::lock_guard<std::mutex> lock(mutex_);
    behaviour_ = behaviour;
}

bool FakeTelephonyService::send(const Bytes& data, int32_t messageId) {
    bool ok = false;
    onServiceThread([&](FakeServiceWorker& w) { ok = w.lastClient() && w.lastClient()->isValid() && w.lastClient()->post(messageId, data); });
    return ok;
}

void FakeTelephonyService::closeChannelPort() {
    onServiceThread([](FakeServiceWorker& w) { if (!w.channels_.empty()) w.channels_.back()->invalidate(); });
}

void FakeTelephonyService::dropClient() {
    onServiceThread([](FakeServiceWorker& w) { if (w.lastClient()) w.lastClient()->invalidate(); });
}

void FakeTelephonyService::notify(const std::string& name) {
    auto info = Dictionary::create();
    info->set("State", "Streaming");
    auto notification = Dictionary::create();
    notification->set("Name", name);
    notification->set("Info", Value(info));
    onServiceThread([&](FakeServiceWorker& w) { if (w.server_) w.server_->broadcastNotification(0, xml(notification)); });
}

std::vector<Value> FakeTelephonyService::startCommands() const {
    std::lock_guard<std::mutex> lock(mutex_);
    return startCommands_;
}

std::vector<std::string> FakeTelephonyService::clientPortNames() const {
    std::lock_guard<std::mutex> lock(mutex_);
    return clientPorts_;
}

}  // namespace vantorel::testing

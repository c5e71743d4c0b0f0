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

FakeTelephonyService::FakeTelephonyService(Behaviour behaviour)
    : name_(uniquePortName("fake-service")), context_(std::make_unique<QObject>()), behaviour_(behaviour) {
    context_->moveToThread(&thread_);
    thread_.start();
    onServiceThread([this] {
        server_ = LocalMessagePort::create(name_, [this](int32_t id, const Bytes& data) {
            return id == 1 ? createLogChannel(data) : std::nullopt;
        });
        if (server_) server_->setStaysValidWithoutPeers(true);  // the well-known port outlives its clients
    });
}

FakeTelephonyService::~FakeTelephonyService() {
    onServiceThread([this] {
        server_.reset();
        channels_.clear();
        clients_.clear();
        context_.reset();
    });
    thread_.quit();
    thread_.wait();
}

void FakeTelephonyService::onServiceThread(const std::function<void()>& fn) {
    QMetaObject::invokeMethod(context_.get(), fn, Qt::BlockingQueuedConnection);
}

std::optional<Bytes> FakeTelephonyService::createLogChannel(const Bytes& data) {
    const Behaviour b = behaviour();
    const auto request = PropertyListSerialization::readDictionary(data);
    const std::string* clientPort = request ? request.value->asDictionary()->get("PortName").asString() : nullptr;
    auto reply = Dictionary::create();
    const bool fails = b.channelErrorCode != 0 || !clientPort || clientPort->empty();
    const std::string channelName = name_ + ".channel." + std::to_string(channelCount_ + 1);
    reply->set("ErrorDomain", Value::integer(fails ? 1 : 0));
    reply->set("ErrorCode", Value::integer(fails ? (b.channelErrorCode ? b.channelErrorCode : 1) : 0));
    reply->set("PortName", fails || b.emptyPortName ? "" : channelName);
    if (fails) return xml(reply);
    ++channelCount_;
    channels_.push_back(LocalMessagePort::create(channelName, [this](int32_t, const Bytes& c) { return command(c); }));
    clients_.push_back(RemoteMessagePort::lookup(*clientPort, 1000));
    std::lock_guard<std::mutex> lock(mutex_);
    clientPorts_.push_back(*clientPort);
    return xml(reply);
}

std::optional<Bytes> FakeTelephonyService::command(const Bytes& data) {
    const auto parsed = PropertyListSerialization::readDictionary(data);
    if (!parsed) return std::nullopt;
    const DictionaryRef command = parsed.value->asDictionary();
    if (!command->contains("GetTechnology")) {
        std::lock_guard<std::mutex> lock(mutex_);
        startCommands_.push_back(Value(command));
        return std::nullopt;
    }
    const Behaviour b = behaviour();
    if (!b.answerGetTechnology) {
        QThread::msleep(1500);  // longer than any receive timeout in the tests
        return std::nullopt;
    }
    if (!b.answerWithPlist) return Bytes{'n', 'o', 't', ' ', 'a', ' ', 'p', 'l', 'i', 's', 't'};
    auto answer = Dictionary::create();
    answer->set(b.answerHasTechnology ? "GetTechnology" : "Something", b.answerHasTechnology ? b.technology : "else");
    return xml(answer);
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
    onServiceThread([&] { ok = !clients_.empty() && clients_.back()->isValid() && clients_.back()->post(messageId, data); });
    return ok;
}

void FakeTelephonyService::closeChannelPort() {
    onServiceThread([this] { if (!channels_.empty()) channels_.back()->invalidate(); });
}

void FakeTelephonyService::dropClient() {
    onServiceThread([this] { if (!clients_.empty()) clients_.back()->invalidate(); });
}

void FakeTelephonyService::notify(const std::string& name, const Value& info) {
    auto streaming = Dictionary::create();
    streaming->set("State", "Streaming");
    auto notification = Dictionary::create();
    notification->set("Name", name);
    notification->set("Info", info.asDictionary() ? info : Value(streaming));
    onServiceThread([&] { if (server_) server_->broadcastNotification(0, xml(notification)); });
}

void FakeTelephonyService::notifyChannel(const std::string& name, const Value& info) {
    auto notification = Dictionary::create();
    notification->set("Name", name);
    notification->set("Info", info);
    onServiceThread([&] { if (!channels_.empty()) channels_.back()->broadcastNotification(0, xml(notification)); });
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

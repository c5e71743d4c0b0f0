// FakeTelephonyService: a scriptable telephony service on its own thread, built from the real message ports.
#include "support/FakeTelephonyService.h"

#include "Platform/LocalMessagePort.h"
#include "Platform/RemoteMessagePort.h"
#include "PropertyList/Dictionary.h"
#include "PropertyList/PropertyListSerialization.h"

#include <QCoreApplication>
#include <QElapsedTimer>
#include <QMetaObject>

#include <unistd.h>

namespace vantorel::testing {

namespace {
Bytes xml(const Value& v) { return *PropertyListSerialization::write(v, PropertyListSerialization::Format::XML); }
}  // namespace

// Lives on the service thread; owns the ports there.
class FakeServiceWorker : public QObject {
public:
    explicit FakeServiceWorker(FakeTelephonyService* owner) : owner_(owner) {}

    void start() {
        server_ = LocalMessagePort::create(owner_->name_, [this](int32_t id, const Bytes& data) {
            return onServerRequest(id, data);
        });
        // The well-known port outlives its clients' connections.
        if (server_) server_->setStaysValidWithoutPeers(true);
    }
    void stop() {
        channels_.clear();
        clients_.clear();
        server_.reset();
    }

    std::optional<Bytes> onServerRequest(int32_t id, const Bytes& data) {
        if (id != 1) return std::nullopt;
        auto request = PropertyListSerialization::readDictionary(data);
        auto reply = Dictionary::create();
        FakeTelephonyService::Behaviour b;
        {
            std::lock_guard<std::mutex> lock(owner_->mutex_);
            b = owner_->behaviour_;
        }
        const std::string clientPort =
            request && request.value->asDictionary()->get("PortName").asString()
                ? *request.value->asDictionary()->get("PortName").asString()
                : "";
        if (b.channelErrorCode != 0 || clientPort.empty()) {
            reply->set("ErrorDomain", Value::integer(1));
            reply->set("ErrorCode", Value::integer(b.channelErrorCode ? b.channelErrorCode : 1));
            reply->set("PortName", "");
            return xml(Value(reply));
        }
        const int n = ++owner_->channels_;
        const std::string channelName = owner_->name_ + ".channel." + std::to_string(n);
        auto channel = LocalMessagePort::create(channelName, [this](int32_t cid, const Bytes& cdata) {
            return onChannelCommand(cid, cdata);
        });
        clients_.push_back(RemoteMessagePort::lookup(clientPort, 1000));
        {
            std::lock_guard<std::mutex> lock(owner_->mutex_);
            owner_->clientPorts_.push_back(clientPort);
        }
        channels_.push_back(std::move(channel));
        reply->set("ErrorDomain", Value::integer(0));
        reply->set("ErrorCode", Value::integer(0));
        reply->set("PortName", b.emptyPortName ? "" : channelName);
        return xml(Value(reply));
    }

    std::optional<Bytes> onChannelCommand(int32_t, const Bytes& data) {
        auto parsed = PropertyListSerialization::readDictionary(data);
        if (!parsed) return std::nullopt;
        DictionaryRef command = parsed.value->asDictionary();
        if (command->contains("GetTechnology")) {
            ++owner_->queries_;
            FakeTelephonyService::Behaviour b;
            {
                std::lock_guard<std::mutex> lock(owner_->mutex_);
                b = owner_->behaviour_;
            }
            if (!b.answerGetTechnology) {
                QThread::msleep(1500);  // longer than any receive timeout in the tests
                return std::nullopt;
            }
            if (!b.answerWithPlist) {
                const std::string text = "not a property list";
                return Bytes(text.begin(), text.end());
            }
            auto answer = Dictionary::create();
            if (b.answerHasTechnology) answer->set("GetTechnology", b.technology);
            else answer->set("Something", "else");
            return xml(Value(answer));
        }
        std::lock_guard<std::mutex> lock(owner_->mutex_);
        owner_->startCommands_.push_back(Value(command));
        return std::nullopt;
    }

    bool send(const Bytes& data, int32_t id) {
        if (clients_.empty() || !clients_.back() || !clients_.back()->isValid()) return false;
        return clients_.back()->post(id, data);
    }
    void closeChannelPort() {
        if (!channels_.empty() && channels_.back()) channels_.back()->invalidate();
    }
    void dropClient() {
        if (!clients_.empty() && clients_.back()) clients_.back()->invalidate();
    }
    void notify(const std::string& name) {
        auto info = Dictionary::create();
        info->set("State", "Streaming");
        auto n = Dictionary::create();
        n->set("Name", name);
        n->set("Info", Value(info));
        if (server_) server_->broadcastNotification(0, xml(Value(n)));
    }

private:
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
    QMetaObject::invokeMethod(worker_, [this] { worker_->start(); }, Qt::BlockingQueuedConnection);
}

FakeTelephonyService::~FakeTelephonyService() {
    QMetaObject::invokeMethod(worker_, [this] { worker_->stop(); delete worker_; }, Qt::BlockingQueuedConnection);
    thread_.quit();
    thread_.wait();
}

void FakeTelephonyService::setBehaviour(const Behaviour& behaviour) {
    std::lock_guard<std::mutex> lock(mutex_);
    behaviour_ = behaviour;
}

bool FakeTelephonyService::send(const Bytes& data, int32_t messageId) {
    bool ok = false;
    QMetaObject::invokeMethod(worker_, [&] { ok = worker_->send(data, messageId); }, Qt::BlockingQueuedConnection);
    return ok;
}

void FakeTelephonyService::closeChannelPort() {
    QMetaObject::invokeMethod(worker_, [this] { worker_->closeChannelPort(); }, Qt::BlockingQueuedConnection);
}

void FakeTelephonyService::dropClient() {
    QMetaObject::invokeMethod(worker_, [this] { worker_->dropClient(); }, Qt::BlockingQueuedConnection);
}

void FakeTelephonyService::notify(const std::string& name) {
    QMetaObject::invokeMethod(worker_, [this, name] { worker_->notify(name); }, Qt::BlockingQueuedConnection);
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

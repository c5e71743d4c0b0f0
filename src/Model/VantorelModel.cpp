// VantorelModel: opens the log channel, picks the decoder for the modem's technology, retries every 5 s, refreshes the display every 2 s.
#include "Model/VantorelModel.h"

#include "Model/ApplicationObject.h"
#include "Model/MonitorClock.h"
#include "Platform/LocalMessagePort.h"
#include "Platform/RemoteMessagePort.h"
#include "Platform/SystemLog.h"
#include "Platform/TelephonyServiceConnection.h"
#include "PropertyList/Dictionary.h"
#include "PropertyList/PropertyListSerialization.h"

#include <QMetaObject>
#include <QTimer>
#include <QUuid>


namespace vantorel {

void VantorelModel::LaterDeleter::operator()(QObject* object) const {
    if (object) object->deleteLater();
}

VantorelModel::VantorelModel(ApplicationObject* application, std::string serviceName)
    : _state(Dictionary::create()), application_(application), serviceName_(std::move(serviceName)) {}

VantorelModel::~VantorelModel() { destroyPorts(); }

std::string VantorelModel::defaultServiceName() { return TelephonyServiceConnection::defaultServiceName(); }

// ---- The channel ---------------------------------------------------------

bool VantorelModel::createPorts() {
    const QString uuid = QUuid::createUuid().toString(QUuid::WithoutBraces).toUpper();
    if (uuid.isEmpty()) return false;
    const std::string name = "VantorelApp." + uuid.toStdString();
    receivePortName_ = name;

    // Not checked here: a missing receive port shows later as a channel that is
    // not connected.
    _recvPort.reset(LocalMessagePort::create(name, [this](int32_t id, const Bytes& data) {
                        return receiveCallback(id, data);
                    }).release());
    if (_recvPort) _recvPort->setInvalidationCallback([this](LocalMessagePort* port) { invalidationCallback(port); });

    serverConnection_ = TelephonyServiceConnection::open(
        [this](const std::string& n, const Value& info) { serviceNotificationCallback(n, info); }, serviceName_);
    if (!serverConnection_) {
        SystemLog::log(SystemLog::kError, "Could not create TSServerConnection");
        return false;
    }

    const TelephonyServiceConnection::LogChannelResult channel = serverConnection_->createLogChannel(name);
    if (channel.errorCode != 0) {
        SystemLog::log(SystemLog::kError, "_TSServerConnectionNetworkMonitorCreateLogChannel returns error: %ld!",
                       static_cast<long>(channel.errorCode));
        return false;
    }
    if (channel.portName.empty()) {
        SystemLog::log(SystemLog::kError, "Could not create a log channel (TS returned null port)!");
        return false;
    }
    _sendPort.reset(RemoteMessagePort::lookup(channel.portName, 1000)
                        .release());
    if (!_sendPort) {
        SystemLog::log(SystemLog::kError, "Could not create the remote port!");
        return false;
    }
    SystemLog::log(SystemLog::kError, " ***** Created ports (send=%p, recv=%p)", static_cast<void*>(_sendPort.get()),
                   static_cast<void*>(_recvPort.get()));
    return true;
}

void VantorelModel::destroyPorts() {
    if (_displayUpdateTimer) {
        _displayUpdateTimer->stop();
        delete _displayUpdateTimer;
        _displayUpdateTimer = nullptr;
    }
    if (_recvPort) {
        // Cleared first, so that closing the port on purpose does not restart.
        _recvPort->setInvalidationCallback(nullptr);
        _recvPort->invalidate();
        _recvPort.reset();
    }
    if (_sendPort) {
        _sendPort->setInvalidationCallback(nullptr);
        _sendPort->invalidate();
        _sendPort.reset();
    }
    serverConnection_.reset();
}

std::optional<Bytes> VantorelModel::receiveCallback(int32_t messageId, const Bytes& data) {
    if (messageId != 0) return std::nullopt;
    updateWithData(data);  // whole and unchanged
    return std::nullopt;
}

void VantorelModel::invalidationCallback(LocalMessagePort* port) {
    SystemLog::log(SystemLog::kError, " ***** INVALIDATED %p *****", static_cast<void*>(port));
    // The port is inside its own callback: restart once it has returned.
    QMetaObject::invokeMethod(this, [this] { restartMonitor(); }, Qt::QueuedConnection);
}

void VantorelModel::serviceNotificationCallback(const std::string&, const Value&) { refresh(); }

// ---- Start-up and refresh -------------------------------------------------

void VantorelModel::scheduleRetry() {
    QTimer::singleShot(MonitorClock::current().retryDelay(), this, [this] { startMonitor(); });
}

void VantorelModel::startMonitor() {
    if (_displayUpdateTimer) return;

    if (!createPorts()) {
        SystemLog::log(SystemLog::kError, "Could not create the ports necessary");
        destroyPorts();
        scheduleRetry();
        return;
    }

    configureGenerator();
    if (!_logGenerator) {
        SystemLog::log(SystemLog::kError, "No log generator technology works");
        destroyPorts();
        scheduleRetry();
        return;
    }

    DictionaryRef command = _logGenerator->getStartCommand();
    std::optional<Bytes> xml =
        command ? PropertyListSerialization::write(Value(command), PropertyListSerialization::Format::XML) : std::nullopt;
    if (!xml) {
        SystemLog::log(SystemLog::kError, " Could not generate PLIST");
        destroyPorts();
        scheduleRetry();
        return;
    }

    const double timeout = kRequestTimeoutSeconds;
    int32_t status = _sendPort->sendRequest(0, *xml, timeout, 0, nullptr);
    if (status != 0) {
        SystemLog::log(SystemLog::kError, " ***** Could not send the START command (got error=%d)", status);
        destroyPorts();
        scheduleRetry();
        return;
    }

    SystemLog::log(SystemLog::kError, "Starting the display update timer");
    _displayUpdateTimer = new QTimer(this);
    _displayUpdateTimer->setInterval(MonitorClock::current().displayUpdateInterval());
    connect(_displayUpdateTimer, &QTimer::timeout, this, [this] { refresh(); });
    _displayUpdateTimer->start();
}

void VantorelModel::restartMonitor() {
    destroyPorts();
    startMonitor();
}

void VantorelModel::configureGenerator() {
    auto query = Dictionary::create();
    query->set("GetTechnology", "GetTechnology");
    std::optional<Bytes> xml = PropertyListSerialization::write(Value(query), PropertyListSerialization::Format::XML);
    if (!xml) {
        SystemLog::log(SystemLog::kError, " Could not generate GetTechnology command; cannot configure");
        return;
    }

    const double timeout = kRequestTimeoutSeconds;
    std::optional<Bytes> reply;
    int32_t status = _sendPort->sendRequest(0, *xml, timeout, timeout, &reply);
    if (status != 0) {
        SystemLog::log(SystemLog::kError, " ***** Could not send the GetTechnology command (got error=%d)", status);
        return;
    }
    if (!reply || reply->empty()) {
        SystemLog::log(SystemLog::kError, " ***** No response to GetTechnology; cannot configure");
        return;
    }
    PropertyListResult parsed = PropertyListSerialization::read(*reply);
    if (!parsed) {
        SystemLog::log(SystemLog::kError, " ***** Could not parse reply to GetTechnology; cannot configure");
        return;
    }
    DictionaryRef answer = parsed.value->asDictionary();
    const Value* technology = answer ? answer->find("GetTechnology") : nullptr;
    if (!technology) {
        SystemLog::log(SystemLog::kError, " ***** Reply to GetTechnology had no answer; cannot configure");
        return;
    }

    std::unique_ptr<LogGenerator> chosen =
        technology->asString() ? LogGenerator::generatorFromTechnology(*technology->asString()) : nullptr;
    // The state (and its history) outlives decoders; the display a previous decoder
    // built in it is bound to that decoder's sections, so a new decoder starts its own.
    if (chosen) LogGenerator::forgetDisplay(*_state);
    _logGenerator = std::move(chosen);
    SystemLog::log(SystemLog::kError, "Got log generated: %p", static_cast<void*>(_logGenerator.get()));
}

void VantorelModel::refresh() {
    // Channel probe: a dead send port invalidates the receive port, whose callback
    // logs and restarts the monitor.
    if (_recvPort && _sendPort && !_sendPort->isValid()) _recvPort->invalidate();

    if (!_updated) return;
    _updated = false;
    _nodes.reset();
    _nodesByPath.clear();
    if (application_)
        QMetaObject::invokeMethod(
            this, [this] { if (application_) application_->updateViewControllerFromModel(); }, Qt::QueuedConnection);
}

void VantorelModel::updateWithData(ByteView data) {
    if (_logGenerator) {
        _logGenerator->updateState(*_state, data);
        ++messagesDecoded_;
    }
    _updated = true;
}

// ---- The display tree ----------------------------------------------------

NodeRef VantorelModel::topLevelNodes() {
    if (_nodes) return _nodes;
    if (!_logGenerator) return nullptr;
    DictionaryRef display = _logGenerator->generateLogUsingState(*_state);
    PathDictionary index;
    _nodes = VantorelModelNode::makeTreeFromObject(display ? Value(display) : Value(), index);
    _nodesByPath = std::move(index);
    return _nodes;
}

NodeRef VantorelModel::nodeAtPath(const std::string& path) {
    if (_nodesByPath.empty()) topLevelNodes();
    auto it = _nodesByPath.find(path);
    return it == _nodesByPath.end() ? nullptr : it->second;
}

Value VantorelModel::getSaveContents() {
    if (!_logGenerator) return Value();
    return _logGenerator->getSaveContentsFromState(*_state);
}

}  // namespace vantorel

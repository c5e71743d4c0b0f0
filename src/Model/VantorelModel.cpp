// VantorelModel: opens the log channel, picks the decoder for the modem's technology, retries every 5 s, refreshes the display every 2 s.
#include "Model/VantorelModel.h"

#include "Model/ApplicationObject.h"
#include "Model/MonitorClock.h"
#include "Platform/LocalMessagePort.h"
#include "Platform/RemoteMessagePort.h"
#include "Platform/SystemLog.h"
#include "Platform/TechnologyNames.h"
#include "Platform/TelephonyServiceConnection.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"
#include "PropertyList/PropertyListSerialization.h"

#include <QMetaObject>

#include <algorithm>
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

    if (serviceResolver_) serviceName_ = serviceResolver_();
    serverConnection_ = TelephonyServiceConnection::open(
        [this](const std::string& n, const Value& info) { serviceNotificationCallback(n, info); }, serviceName_);
    const std::string service = "the service on port " + serviceName_;
    if (!serverConnection_) {
        SystemLog::log(SystemLog::kError, "Could not create TSServerConnection");
        startFailure_ = "nothing serves port " + serviceName_;
        return false;
    }

    const TelephonyServiceConnection::LogChannelResult channel = serverConnection_->createLogChannel(name);
    if (channel.errorCode != 0) {
        SystemLog::log(SystemLog::kError, "_TSServerConnectionNetworkMonitorCreateLogChannel returns error: %ld!",
                       static_cast<long>(channel.errorCode));
        // The codes of docs/protocol.md: domain 1 the service's, domain 2 our transport's.
        constexpr int32_t kService = 1, kTransport = 2;
        if (channel.errorDomain == kService && channel.errorCode == 3)
            startFailure_ = service + " could not start its source";
        else if (channel.errorDomain == kService && channel.errorCode == 5)
            startFailure_ = service + " serves as many monitors as it can";
        else if (channel.errorDomain == kTransport && channel.errorCode == -2)
            startFailure_ = service + " does not answer";
        else
            startFailure_ = service + " refused a log channel (error " + std::to_string(channel.errorDomain) + "/" +
                            std::to_string(channel.errorCode) + ")";
        return false;
    }
    if (channel.portName.empty()) {
        SystemLog::log(SystemLog::kError, "Could not create a log channel (TS returned null port)!");
        startFailure_ = service + " gave no channel port";
        return false;
    }
    _sendPort.reset(RemoteMessagePort::lookup(channel.portName, 1000)
                        .release());
    if (!_sendPort) {
        SystemLog::log(SystemLog::kError, "Could not create the remote port!");
        startFailure_ = service + " gave a channel port nothing serves";
        return false;
    }
    _sendPort->setNotificationCallback([this](int32_t, const Bytes& data) { channelNotificationCallback(data); });
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
        _sendPort->setNotificationCallback(nullptr);
        _sendPort->setInvalidationCallback(nullptr);
        _sendPort->invalidate();
        _sendPort.reset();
    }
    serverConnection_.reset();
    // The next channel's service counts from zero again.
    droppedBefore_ += droppedNow_;
    droppedNow_ = 0;
}

std::optional<Bytes> VantorelModel::receiveCallback(int32_t messageId, const Bytes& data) {
    if (messageId == TelephonyServiceConnection::kDisplayTickMessageId) {
        recordedTick(data);
        return std::nullopt;
    }
    if (messageId != 0) return std::nullopt;
    // The first data of a run is shown at once, not at the next tick of the display timer.
    if (messagesThisRun_++ == 0) QMetaObject::invokeMethod(this, [this] { refresh(false); }, Qt::QueuedConnection);
    updateWithData(data);  // whole and unchanged
    return std::nullopt;
}

// A replay marks the display ticks of its recording: from the first one on, they are
// the ticks observers sample (at any replay speed, one per recorded tick that brought
// messages, whether or not this decoder reads them, as `decode --csv` does), stamped with
// the recorded time; the display timer goes on redrawing the view at its own pace.
void VantorelModel::recordedTick(const Bytes& data) {
    recordedTicks_ = true;
    if (data.size() == 8) {
        uint64_t bits = 0;
        for (size_t i = 0; i < 8; ++i) bits |= uint64_t{data[i]} << (8 * i);
        recordedTickMs_ = static_cast<int64_t>(bits);
    }
    if (_updated) {
        _nodes.reset();
        _nodesByPath.clear();
        _updated = false;
        viewStale_ = true;
    }
    newSinceTick_ = false;
    emit displayTicked();
}

void VantorelModel::invalidationCallback(LocalMessagePort* port) {
    SystemLog::log(SystemLog::kError, " ***** INVALIDATED %p *****", static_cast<void*>(port));
    // The values on screen are now stale: say so at once, before any reconnection.
    status_.phase = SourceStatus::Phase::Disconnected;
    status_.disconnectedAt = QDateTime::fromMSecsSinceEpoch(
        std::chrono::duration_cast<std::chrono::milliseconds>(MonitorClock::current().now().time_since_epoch()).count());
    tellApplication();
    // The port is inside its own callback: restart once it has returned.
    QMetaObject::invokeMethod(this, [this] { restartMonitor(); }, Qt::QueuedConnection);
}

void VantorelModel::serviceNotificationCallback(const std::string&, const Value& info) {
    readBackendState(info);
    refresh(false);
}

// The backend's state notification: any key may be missing or of the wrong type
// (an older or foreign service); what is readable is taken, the rest is kept.
void VantorelModel::readBackendState(const Value& info) {
    const DictionaryRef d = info.asDictionary();
    if (!d) return;
    auto integer = [&](const char* key) { const Value* v = d->find(key); return v ? v->asInteger() : std::nullopt; };
    const Value* state = d->find("State");
    const std::string* stateName = state ? state->asString() : nullptr;
    if (stateName && *stateName == "Finished" && _displayUpdateTimer) status_.phase = SourceStatus::Phase::Finished;
    if (stateName && *stateName == "Streaming" && status_.phase == SourceStatus::Phase::Finished)
        status_.phase = SourceStatus::Phase::Streaming;  // a looping replay started again
    const Value* source = d->find("Source");
    if (!sourceFixed_ && source && source->asString() && !source->asString()->empty()) {
        status_.source = *source->asString();
        status_.isReplay = status_.source.rfind("replay ", 0) == 0;
    }
    const std::optional<int64_t> sent = integer("Sent");
    if (sent && *sent != status_.sent.value_or(-1)) lastActivity_ = MonitorClock::current().now();  // not frozen
    status_.sent = sent;
    status_.total = integer("Total");
    const std::optional<int64_t> recorded = integer("RecordedTime");
    status_.recordedAt = recorded ? QDateTime::fromMSecsSinceEpoch(*recorded / 1000) : QDateTime();
    status_.logTechnologies.clear();
    const Value* codes = d->find("LogTechnologies");
    if (const ArrayRef list = codes ? codes->asArray() : ArrayRef())
        for (const Value& element : *list)
            if (element.asString()) status_.logTechnologies.push_back(*element.asString());
    const Value* problem = d->find("Problem");
    const bool failed = stateName && *stateName == "Failed";
    status_.backendProblem = failed && problem && problem->asString() ? *problem->asString() : std::string();
    statusChanged_ = true;

    // The modem moved to another technology (a live device): the decoder follows, on the
    // same state, so the history goes on.
    const Value* technology = d->find("Technology");
    const std::string* identifier = technology ? technology->asString() : nullptr;
    if (identifier && _logGenerator && *identifier != status_.decoderTechnology &&
        TechnologyNames::shortName(*identifier) != *identifier) {
        SystemLog::log(SystemLog::kNotice, "The modem is now on %s: switching to its decoder", identifier->c_str());
        switchDecoder(*identifier);
    }
}

// On the same channel: closing it would stop a replay, which the next channel would
// start over in its first technology.
void VantorelModel::switchDecoder(const std::string& technology) {
    std::unique_ptr<LogGenerator> chosen = LogGenerator::generatorFromTechnology(technology);
    DictionaryRef command = chosen ? chosen->getStartCommand() : nullptr;
    std::optional<Bytes> xml =
        command ? PropertyListSerialization::write(Value(command), PropertyListSerialization::Format::XML) : std::nullopt;
    if (!xml || !_sendPort || _sendPort->sendRequest(0, *xml, kRequestTimeoutSeconds, 0, nullptr) != 0) {
        QMetaObject::invokeMethod(this, [this] { restartMonitor(); }, Qt::QueuedConnection);
        return;
    }
    LogGenerator::forgetDisplay(*_state);
    status_.decoderTechnology = technology;
    _logGenerator = std::move(chosen);
    _updated = true;
}

void VantorelModel::setSource(std::string description, bool isReplay, bool authoritative) {
    status_.source = std::move(description);
    status_.isReplay = isReplay;
    sourceFixed_ = authoritative;
}

void VantorelModel::channelNotificationCallback(const Bytes& data) {
    // {"Name": "ChannelStatus", "Info": {"Dropped": n}} (docs/protocol.md); anything else is not ours.
    const PropertyListResult parsed = PropertyListSerialization::readDictionary(data);
    if (!parsed) return;
    const DictionaryRef notification = parsed.value->asDictionary();
    const std::string* name = notification->get("Name").asString();
    const DictionaryRef info = notification->get("Info").asDictionary();
    if (!name || *name != "ChannelStatus" || !info) return;
    const std::optional<int64_t> dropped = info->get("Dropped").asInteger();
    if (!dropped || *dropped < 0 || static_cast<uint64_t>(*dropped) == droppedNow_) return;
    droppedNow_ = static_cast<uint64_t>(*dropped);
    statusChanged_ = true;  // shown at the next tick
}

bool VantorelModel::frozen() const {
    if (status_.phase != SourceStatus::Phase::Streaming || !_displayUpdateTimer || messagesDecoded_ == 0) return false;
    return MonitorClock::current().now() - lastActivity_ >= kFrozenWait;
}

bool VantorelModel::noRecordForDecoder() const {
    if (status_.phase != SourceStatus::Phase::Streaming || !_displayUpdateTimer) return false;
    if (MonitorClock::current().now() - streamingSince_ < kNoRecordWait) return false;
    if (messagesDecoded_ == 0) return true;
    // Messages arrive; whether any is this decoder's, the service's list of the
    // stream's technologies tells (without it, arriving messages count as read).
    const auto& seen = status_.logTechnologies;
    return !seen.empty() && std::find(seen.begin(), seen.end(), status_.decoderTechnology) == seen.end();
}

SourceStatus VantorelModel::sourceStatus() const {
    SourceStatus status = status_;
    status.forDecoder = messagesDecoded_;
    status.noRecordForDecoder = noRecordForDecoder();
    status.frozen = frozen();
    if (messagesDecoded_ > 0)
        status.lastDataAt = QDateTime::fromMSecsSinceEpoch(
            std::chrono::duration_cast<std::chrono::milliseconds>(lastData_.time_since_epoch()).count());
    status.dropped = droppedBefore_ + droppedNow_;
    status.retryDelay = MonitorClock::current().retryDelay();
    return status;
}

int64_t VantorelModel::tickTimeMs() const {
    if (recordedTickMs_) return *recordedTickMs_;
    if (status_.isReplay && status_.recordedAt.isValid()) return status_.recordedAt.toMSecsSinceEpoch();
    return std::chrono::duration_cast<std::chrono::milliseconds>(MonitorClock::current().now().time_since_epoch()).count();
}

void VantorelModel::tellApplication() {
    if (application_)
        QMetaObject::invokeMethod(
            this, [this] { if (application_) application_->updateViewControllerFromModel(); }, Qt::QueuedConnection);
}

// ---- Start-up and refresh -------------------------------------------------

void VantorelModel::scheduleRetry() {
    QTimer::singleShot(MonitorClock::current().retryDelay(), this, [this] { startMonitor(); });
}

void VantorelModel::startFailed(const std::string& why) {
    destroyPorts();
    scheduleRetry();
    // One failure may be a service still starting; more in a row are said, with the
    // cause, while the retries go on.
    if (++failedStarts_ < kFailedStartsBeforeTelling || why == status_.connectProblem) return;
    status_.connectProblem = why;
    tellApplication();
}

void VantorelModel::startMonitor() {
    if (_displayUpdateTimer) return;

    startFailure_.clear();
    if (!createPorts()) {
        SystemLog::log(SystemLog::kError, "Could not create the ports necessary");
        return startFailed(startFailure_);
    }

    configureGenerator();
    if (!_logGenerator) {
        SystemLog::log(SystemLog::kError, "No log generator technology works");
        return startFailed(startFailure_.empty() ? "the service on port " + serviceName_ + " did not tell a technology this monitor decodes"
                                                 : startFailure_);
    }

    DictionaryRef command = _logGenerator->getStartCommand();
    std::optional<Bytes> xml =
        command ? PropertyListSerialization::write(Value(command), PropertyListSerialization::Format::XML) : std::nullopt;
    if (!xml) {
        SystemLog::log(SystemLog::kError, " Could not generate PLIST");
        return startFailed("the decoder has no start command");
    }

    const double timeout = kRequestTimeoutSeconds;
    int32_t status = _sendPort->sendRequest(0, *xml, timeout, 0, nullptr);
    if (status != 0) {
        SystemLog::log(SystemLog::kError, " ***** Could not send the START command (got error=%d)", status);
        return startFailed("the service on port " + serviceName_ + " did not take the start command");
    }

    SystemLog::log(SystemLog::kError, "Starting the display update timer");
    _displayUpdateTimer = new QTimer(this);
    _displayUpdateTimer->setInterval(MonitorClock::current().displayUpdateInterval());
    connect(_displayUpdateTimer, &QTimer::timeout, this, [this] { refresh(!recordedTicks_); });
    _displayUpdateTimer->start();
    // Back from a lost channel: the stale mark goes at the next tick, data or not.
    if (status_.phase == SourceStatus::Phase::Disconnected || !status_.connectProblem.empty()) statusChanged_ = true;
    status_.phase = SourceStatus::Phase::Streaming;
    status_.connectProblem.clear();
    failedStarts_ = 0;
    streamingSince_ = lastActivity_ = MonitorClock::current().now();
    messagesThisRun_ = 0;
    recordedTicks_ = false;
    recordedTickMs_.reset();
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
    if (chosen) status_.decoderTechnology = *technology->asString();
    _logGenerator = std::move(chosen);
    SystemLog::log(SystemLog::kError, "Got log generated: %p", static_cast<void*>(_logGenerator.get()));
}

void VantorelModel::refresh(bool displayTick) {
    // Channel probe: a dead send port invalidates the receive port, whose callback
    // logs and restarts the monitor.
    if (_recvPort && _sendPort && !_sendPort->isValid()) _recvPort->invalidate();

    const bool noRecord = noRecordForDecoder();
    if (noRecord != status_.noRecordForDecoder) statusChanged_ = true;
    status_.noRecordForDecoder = noRecord;
    const bool isFrozen = frozen();
    if (isFrozen != status_.frozen) statusChanged_ = true;
    status_.frozen = isFrozen;

    if (_updated) {
        _nodes.reset();
        _nodesByPath.clear();
        newSinceTick_ = true;
    }
    const bool changed = _updated || statusChanged_ || viewStale_;
    _updated = false;
    viewStale_ = false;
    statusChanged_ = false;
    // Samples are taken on the timer's ticks only, so they come at its pace whatever the
    // service's notifications show in between.
    if (displayTick && newSinceTick_) {
        newSinceTick_ = false;
        emit displayTicked();
    }
    if (changed) tellApplication();
}

void VantorelModel::updateWithData(ByteView data) {
    if (_logGenerator) {
        _logGenerator->updateState(*_state, data);
        ++messagesDecoded_;
        lastData_ = lastActivity_ = MonitorClock::current().now();
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

const PathDictionary& VantorelModel::pathIndex() {
    if (_nodesByPath.empty()) topLevelNodes();
    return _nodesByPath;
}

Value VantorelModel::getSaveContents() {
    if (!_logGenerator) return Value();
    return _logGenerator->getSaveContentsFromState(*_state);
}

}  // namespace vantorel

// TelephonyService: the service's well-known port, log channels, streaming with log masks and flow control, notifications and recording (docs/protocol.md).
#include "TelephonyService/TelephonyService.h"

#include "Platform/LocalMessagePort.h"
#include "Platform/PeerCredentials.h"
#include "Platform/PortDirectory.h"
#include "Platform/RemoteMessagePort.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"
#include "Platform/TechnologyNames.h"
#include "Platform/TelephonyServiceConnection.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"
#include "PropertyList/PropertyListSerialization.h"
#include "TelephonyService/Device/DeviceBackend.h"
#include "TelephonyService/Device/DeviceLock.h"
#include "TelephonyService/EmulatorBackend.h"
#include "TelephonyService/ReplayBackend.h"
#include "TelephonyService/Replay/CaptureWriter.h"

#include <QCoreApplication>
#include <QFileInfo>
#include <QScopeGuard>

#include <sys/stat.h>

#include <algorithm>
#include <atomic>
#include <cmath>
#include <vector>

namespace vantorel {

namespace {

constexpr int kHealthIntervalMs = 500;
// Progress ("Sent") is notified at most this often; the health check looks twice as often.
constexpr int kProgressIntervalMs = 1000;

// Dictionary → XML plist bytes; our own dictionaries of strings and numbers always serialise.
Bytes xml(const DictionaryRef& dict) {
    return PropertyListSerialization::write(Value(dict), PropertyListSerialization::Format::XML).value_or(Bytes{});
}

Bytes channelReply(int32_t code, const std::string& portName) {
    auto reply = Dictionary::create();
    reply->set("ErrorDomain", Value::integer(code == TelephonyService::kNoError ? 0 : TelephonyService::kErrorDomain));
    reply->set("ErrorCode", Value::integer(code));
    reply->set("PortName", Value(portName));
    return xml(reply);
}

}  // namespace

TelephonyService::TelephonyService(TelephonyServiceOptions options, QObject* parent)
    : QObject(parent), options_(std::move(options)) {
    connect(&healthTimer_, &QTimer::timeout, this, &TelephonyService::checkHealth);
}

TelephonyService::~TelephonyService() {
    status_ = nullptr;  // whatever the callback refers to may be gone already
    stop();
}

std::unique_ptr<ModemBackend> TelephonyService::createBackend(const TelephonyServiceOptions& options,
                                                              std::string* error) {
    auto fail = [error](std::string text) -> std::unique_ptr<ModemBackend> {
        if (error) *error = std::move(text);
        return nullptr;
    };
    if (options.backendFactory) {
        std::unique_ptr<ModemBackend> backend = options.backendFactory();
        if (!backend) return fail("the backend could not be made");
        return backend;
    }
    const int sources = !options.emulate.empty() + !options.replay.empty() + !options.device.empty();
    if (sources != 1) return fail("give exactly one of --emulate TECH, --replay FILE and --device PATH");
    if (!options.recordQmdl.empty() && options.device.empty()) return fail("--record-qmdl applies to --device only");
    if (!options.device.empty()) {
        std::string technology;
        if (!options.technology.empty()) {
            const std::optional<std::string> identifier = ModemBackend::technologyIdentifier(options.technology, error);
            if (!identifier) return nullptr;
            if (*identifier == TechnologyNames::identifierFor("ifx"))
                return fail("the IFX modem has no DIAG port: --device reads LTE, GSM/UMTS, CDMA and UTRAN modems");
            technology = *identifier;
        }
        auto device = std::make_unique<DeviceBackend>(options.device, technology);
        if (!options.recordQmdl.empty() && !device->recordQmdl(options.recordQmdl, options.replaceRecording, error))
            return nullptr;
        return device;
    }
    if (!options.emulate.empty()) {
        std::unique_ptr<EmulatorScenario> scenario = EmulatorBackend::scenarioFor(options.emulate, error, options.seed);
        if (!scenario) return nullptr;
        return std::make_unique<EmulatorBackend>(std::move(scenario));
    }

    std::string technology;
    if (!options.technology.empty()) {
        const std::optional<std::string> identifier = ModemBackend::technologyIdentifier(options.technology, error);
        if (!identifier) return nullptr;
        technology = *identifier;
    }
    if (!std::isfinite(options.speed) || options.speed < 0)
        return fail(StringFormat::format("speed %g: give 0 (as fast as the client takes it) or more", options.speed));
    RecordedStream stream = RecordedStream::open(options.replay, technology);
    if (!stream.ok()) return fail(stream.error());
    if (const std::string why = stream.unusable(true); !why.empty()) return fail(options.replay + ": " + why);
    if (!technology.empty() && !stream.declaredTechnology().empty() && technology != stream.declaredTechnology())
        SystemLog::log(SystemLog::kWarning, "Telephony service: --technology %s ignored, the capture %s says %s",
                       options.technology.c_str(), options.replay.c_str(),
                       TechnologyNames::displayName(stream.declaredTechnology()).c_str());
    const std::string name = QFileInfo(QString::fromStdString(options.replay)).fileName().toStdString();
    return std::make_unique<ReplayBackend>(std::move(stream), options.speed, options.loop, name);
}

bool TelephonyService::start(std::string* error) {
    if (port_) return true;
    stopping_ = false;
    portName_ = options_.portName.empty() ? TelephonyServiceConnection::defaultServiceName() : options_.portName;
    allowedGroup_.reset();
    if (!options_.allowGroup.empty()) {
        // A bare name lives in this user's runtime directory, which no group can reach.
        if (portName_.front() != '/') {
            if (error) *error = "--allow-group needs --port /PATH in a directory the group can reach";
            return false;
        }
        allowedGroup_ = PeerCredentials::groupNamed(options_.allowGroup);
        if (!allowedGroup_) {
            if (error) *error = "--allow-group " + options_.allowGroup + ": no such group";
            return false;
        }
    }

    // One service per modem: a second one would take this one's replies and clear its mask.
    if (!options_.device.empty() && !options_.backendFactory && !deviceLock_) {
        std::optional<DeviceLock::Holder> holder;
        std::string why;
        deviceLock_ = DeviceLock::acquire(options_.device, portName_, &holder, &why);
        if (!deviceLock_) {
            if (holder) why = DeviceLock::describe(options_.device, *holder);
            if (error) *error = why;
            return false;
        }
    }
    // Whatever fails from here lets the device go again.
    auto releaseDevice = qScopeGuard([this] { deviceLock_.reset(); });
    if (!backend_) {
        backend_ = createBackend(options_, error);
        if (!backend_) return false;
    }

    // Recording onto the file being replayed would destroy it, --force or not.
    if (!options_.record.empty() && !options_.replay.empty()) {
        const QFileInfo recorded(QString::fromStdString(options_.record)), replayed(QString::fromStdString(options_.replay));
        if (recorded.exists() && recorded.canonicalFilePath() == replayed.canonicalFilePath()) {
            if (error) *error = options_.record + ": the file being replayed cannot be recorded onto";
            return false;
        }
    }

    LocalMessagePort::CreateFailure failure;
    port_ = LocalMessagePort::create(
        portName_, [this](int32_t messageId, const Bytes& data) { return receiveOnServicePort(messageId, data); }, &failure);
    if (!port_) {
        if (error)
            *error = failure.nameInUse ? StringFormat::format(
                                             "cannot listen on port %s: the name is in use (is another service running?)",
                                             portName_.c_str())
                                       : StringFormat::format("cannot listen on port %s: %s", portName_.c_str(),
                                                              failure.reason.c_str());
        return false;
    }
    std::string unshared;
    if (allowedGroup_ && !port_->shareWithGroup(*allowedGroup_, &unshared)) {
        if (error) *error = StringFormat::format("cannot listen on port %s: %s", portName_.c_str(), unshared.c_str());
        port_.reset();
        return false;
    }
    // The channel sockets a killed service left beside its port (the runtime directory
    // is cleared as a whole; a port under an absolute path has neighbours not ours).
    const QFileInfo socket(QString::fromStdString(port_->socketPath()));
    PortDirectory::removeStaleSockets(socket.absolutePath().toStdString(), socket.fileName().toStdString() + ".channel.");
    // Clients come and go on the well-known port; it serves until stop().
    port_->setStaysValidWithoutPeers(true);
    port_->setInvalidationCallback([this](LocalMessagePort*) {
        if (!stopping_) SystemLog::log(SystemLog::kError, "Telephony service: port %s was invalidated", portName_.c_str());
    });

    // Only now: a port in use must not have truncated an earlier recording.
    if (!options_.record.empty()) {
        recorder_ = CaptureWriter::create(options_.record, backend_->technology(), error, options_.replaceRecording);
        if (!recorder_) {
            if (error && !options_.replaceRecording && QFileInfo::exists(QString::fromStdString(options_.record)))
                *error += "; it is left as it is (--force replaces it)";
            port_->setInvalidationCallback(nullptr);
            port_.reset();
            return false;
        }
    }

    connect(backend_.get(), &ModemBackend::messageReady, this, &TelephonyService::sendMessage);
    connect(backend_.get(), &ModemBackend::stateChanged, this, &TelephonyService::backendStateChanged);
    connect(backend_.get(), &ModemBackend::statusLine, this, &TelephonyService::statusLine);
    connect(backend_.get(), &ModemBackend::technologyChanged, this, [this] { notifyBackendState(); });
    connect(backend_.get(), &ModemBackend::displayTick, this, &TelephonyService::sendDisplayTick);
    healthTimer_.start(kHealthIntervalMs);
    // A recording starts with the modem, not with the first client; so does a modem whose
    // technology is learnt from its stream.
    if (recorder_ || backend_->startsWithService()) {
        backend_->setLogCodes(std::set<uint16_t>{});
        starting_ = true;
        backend_->start();
        starting_ = false;
        // A device that cannot even be opened is a mistake on the command line, said at once.
        if (backend_->state() == ModemBackend::State::Failed && !backend_->problem().empty()) {
            if (error) *error = backend_->problem();
            stop();
            backend_.reset();
            return false;
        }
    }
    releaseDevice.dismiss();
    return true;
}

void TelephonyService::stop() {
    stopping_ = true;
    healthTimer_.stop();
    std::vector<uint64_t> numbers;
    for (const auto& entry : channels_) numbers.push_back(entry.first);
    for (uint64_t number : numbers) closeChannel(number, "the service stopped");
    if (backend_) {
        // Its last status lines (a modem's logging switched off) still come through.
        disconnect(backend_.get(), &ModemBackend::messageReady, this, nullptr);
        disconnect(backend_.get(), &ModemBackend::stateChanged, this, nullptr);
        disconnect(backend_.get(), &ModemBackend::technologyChanged, this, nullptr);
        disconnect(backend_.get(), &ModemBackend::displayTick, this, nullptr);
        backend_->stop();
        backend_->finishStopping(kBackendStopMs);
        disconnect(backend_.get(), nullptr, this, nullptr);
    }
    if (port_) {
        port_->setInvalidationCallback(nullptr);
        closedPorts_.add(*port_);
        port_->invalidate();
        port_.reset();
    }
    if (recorder_) {
        recorder_->flush();
        recorder_.reset();
    }
    // Only once the modem has been left quiet: a monitor that starts next may open it at once.
    deviceLock_.reset();
}

TelephonyService::Counters TelephonyService::counters() const {
    Counters c = counters_;
    c.openChannels = channels_.size();
    const PortCounts ports = portCountsNow();
    c.malformedFrames = ports.malformed;
    c.refusedPeers = ports.refused;
    c.overLimitPeers = ports.overLimit;
    c.foreignPeers = ports.foreign;
    return c;
}

void TelephonyService::PortCounts::add(const LocalMessagePort& port) {
    malformed += port.malformedFrames();
    refused += port.refusedPeers();
    overLimit += port.overLimitPeers();
    foreign += port.foreignPeers();
}

TelephonyService::PortCounts TelephonyService::portCountsNow() const {
    PortCounts counts = closedPorts_;
    if (port_) counts.add(*port_);
    for (const auto& entry : channels_) counts.add(*entry.second->port);
    return counts;
}

std::string TelephonyService::startupLine() const {
    return StringFormat::format("listening on %s, backend %s, technology %s", portName_.c_str(),
                                backend_ ? backend_->description().c_str() : "none",
                                backend_ ? TechnologyNames::displayName(backend_->technology()).c_str() : "none");
}

void TelephonyService::statusLine(const std::string& line) {
    if (status_)
        status_(line);
    else
        SystemLog::log(SystemLog::kNotice, "Telephony service: %s", line.c_str());
}

// ---- the well-known port ----

void TelephonyService::updateLogCodes() {
    if (!backend_) return;
    std::set<uint16_t> codes;
    for (const auto& entry : channels_) {
        const Channel& channel = *entry.second;
        if (!channel.streaming || channel.closing) continue;
        if (channel.mask.forwardsAll()) return backend_->setLogCodes(std::nullopt);
        codes.insert(channel.mask.ordinaryCodes().begin(), channel.mask.ordinaryCodes().end());
    }
    backend_->setLogCodes(codes);
}

std::optional<Bytes> TelephonyService::receiveOnServicePort(int32_t messageId, const Bytes& data) {
    auto malformed = [&](const char* why) {
        ++counters_.malformedRequests;
        SystemLog::log(SystemLog::kWarning, "Telephony service: malformed request on %s (%s)", portName_.c_str(), why);
        return channelReply(kMalformedRequest, "");
    };
    if (messageId != kCreateLogChannelMessageId) return malformed("unknown message id");
    const PropertyListResult parsed = PropertyListSerialization::readDictionary(data);
    if (!parsed) return malformed("not a property-list dictionary");
    const DictionaryRef request = parsed.value->asDictionary();
    const std::string* name = request->get("Request").asString();
    if (!name || *name != "CreateLogChannel") return malformed("not a CreateLogChannel request");
    const std::string* clientPort = request->get("PortName").asString();
    if (!clientPort || clientPort->empty()) return malformed("no PortName");
    return createLogChannel(*clientPort);
}

Bytes TelephonyService::createLogChannel(const std::string& clientPortName) {
    // A device that went away is tried again by its backend: clients may wait for it.
    if (!backend_ || (backend_->state() == ModemBackend::State::Failed && !backend_->startsWithService())) {
        SystemLog::log(SystemLog::kError, "Telephony service: no log channel for %s: the backend failed",
                       clientPortName.c_str());
        return channelReply(kBackendFailed, "");
    }
    if (channels_.size() >= kMaxChannels) {
        SystemLog::log(SystemLog::kError, "Telephony service: no log channel for %s: %zu channels are open already",
                       clientPortName.c_str(), channels_.size());
        return channelReply(kTooManyChannels, "");
    }
    std::unique_ptr<RemoteMessagePort> client =
        RemoteMessagePort::lookup(clientPortName, kClientLookupTimeoutMs, allowedGroup_);
    if (!client) {
        SystemLog::log(SystemLog::kError, "Telephony service: no log channel for %s: that port does not answer",
                       clientPortName.c_str());
        return channelReply(kClientPortUnreachable, "");
    }
    // Such a channel would stream to the service itself and keep itself alive.
    if (servesPort(*client)) {
        SystemLog::log(SystemLog::kError, "Telephony service: no log channel for %s: that is a port of the service itself",
                       clientPortName.c_str());
        return channelReply(kServicePortNamed, "");
    }
    // Process-wide, so two services (on two threads) never make the same name.
    static std::atomic<uint64_t> nextNumber{0};
    const uint64_t number = ++nextNumber;
    const std::string name = StringFormat::format("%s.channel.%lld.%llu", portName_.c_str(),
                                                  static_cast<long long>(QCoreApplication::applicationPid()),
                                                  static_cast<unsigned long long>(number));
    std::unique_ptr<LocalMessagePort> port = LocalMessagePort::create(
        name, [this, number](int32_t messageId, const Bytes& data) { return receiveOnChannel(number, messageId, data); });
    std::string unshared;
    if (!port || (allowedGroup_ && !port->shareWithGroup(*allowedGroup_, &unshared))) {
        SystemLog::log(SystemLog::kError, "Telephony service: no log channel for %s: cannot listen on %s%s%s",
                       clientPortName.c_str(), name.c_str(), unshared.empty() ? "" : ": ", unshared.c_str());
        return channelReply(kBackendFailed, "");
    }
    port->setMaxPeers(kChannelPortPeers);
    port->setInvalidationCallback([this, number](LocalMessagePort*) { scheduleClose(number, "the client closed it"); });
    client->setInvalidationCallback(
        [this, number](RemoteMessagePort*) { scheduleClose(number, "the client's receive port went away"); });
    connect(client.get(), &RemoteMessagePort::drained, this, [this, number] { drainQueue(number); });

    auto channel = std::make_unique<Channel>();
    channel->number = number;
    channel->clientPortName = clientPortName;
    channel->port = std::move(port);
    channel->client = std::move(client);
    channel->age.start();
    channels_[number] = std::move(channel);
    ++counters_.channelsServed;
    statusLine(StringFormat::format("client connected: channel %llu on %s for %s, technology %s; %zu open",
                                    static_cast<unsigned long long>(number), name.c_str(), clientPortName.c_str(),
                                    TechnologyNames::displayName(backend_->technology()).c_str(), channels_.size()));
    return channelReply(kNoError, name);
}

// ---- channels ----

std::optional<Bytes> TelephonyService::receiveOnChannel(uint64_t number, int32_t messageId, const Bytes& data) {
    auto it = channels_.find(number);
    if (it == channels_.end() || it->second->closing) return std::nullopt;
    Channel& channel = *it->second;
    auto malformed = [&](const char* why) -> std::optional<Bytes> {
        ++counters_.malformedRequests;
        SystemLog::log(SystemLog::kWarning, "Telephony service: channel %llu: ignoring a message (%s)",
                       static_cast<unsigned long long>(number), why);
        return std::nullopt;
    };
    if (messageId != kChannelMessageId) return malformed("unknown message id");
    const PropertyListResult parsed = PropertyListSerialization::readDictionary(data);
    if (!parsed) return malformed("not a property-list dictionary");
    const DictionaryRef command = parsed.value->asDictionary();

    if (command->contains("GetTechnology")) {
        auto reply = Dictionary::create();
        reply->set("GetTechnology", Value(backend_->technology()));
        return xml(reply);
    }
    if (const Value* state = command->find("SetState")) {
        const std::string* text = state->asString();
        if (text && *text == "Streaming") {
            startStreaming(channel, *command);
        } else if (channel.streaming) {
            channel.streaming = false;
            statusLine(StringFormat::format("channel %llu stopped streaming", static_cast<unsigned long long>(number)));
            updateLogCodes();
            updateFlow();
        }
        return std::nullopt;
    }
    return malformed("unknown command");
}

void TelephonyService::startStreaming(Channel& channel, const Dictionary& command) {
    std::string problem;
    channel.mask = LogMask::fromStartCommand(command, &problem);
    if (!problem.empty())
        SystemLog::log(SystemLog::kWarning, "Telephony service: channel %llu: %s",
                       static_cast<unsigned long long>(channel.number), problem.c_str());
    bool othersStreaming = false;
    for (const auto& entry : channels_)
        if (entry.second.get() != &channel && entry.second->streaming && !entry.second->closing) othersStreaming = true;
    channel.streaming = true;
    updateLogCodes();
    statusLine(StringFormat::format("channel %llu streaming (%s)", static_cast<unsigned long long>(channel.number),
                                    channel.mask.description().c_str()));
    const ModemBackend::State state = backend_->state();
    // A finished replay starts over for a client that comes after it, not under a
    // client that is still watching it.
    if (state == ModemBackend::State::Idle || (state == ModemBackend::State::Finished && !othersStreaming))
        backend_->start();
    updateFlow();
}

void TelephonyService::scheduleClose(uint64_t number, const char* why) {
    auto it = channels_.find(number);
    if (it == channels_.end() || it->second->closing) return;
    it->second->closing = true;
    const std::string reason = why;
    QMetaObject::invokeMethod(this, [this, number, reason] { closeChannel(number, reason); }, Qt::QueuedConnection);
}

void TelephonyService::closeChannel(uint64_t number, const std::string& why) {
    auto it = channels_.find(number);
    if (it == channels_.end()) return;
    std::unique_ptr<Channel> channel = std::move(it->second);
    channels_.erase(it);
    channel->port->setInvalidationCallback(nullptr);
    channel->client->setInvalidationCallback(nullptr);
    disconnect(channel->client.get(), nullptr, this, nullptr);
    closedPorts_.add(*channel->port);
    channel->port->invalidate();
    channel->client->invalidate();
    statusLine(StringFormat::format("client left: channel %llu closed (%s) after %llu messages, %llu dropped; %zu open",
                                    static_cast<unsigned long long>(number), why.c_str(),
                                    static_cast<unsigned long long>(channel->sent),
                                    static_cast<unsigned long long>(channel->dropped), channels_.size()));
    if (stopping_) return;
    // Nobody listens any more: the modem's logging is switched off (docs/protocol.md).
    updateLogCodes();
    if (channels_.empty() && !recorder_ && backend_ &&
        (backend_->state() == ModemBackend::State::Streaming ||
         (backend_->state() == ModemBackend::State::Failed && backend_->startsWithService()))) {
        backend_->stop();
        statusLine("no client left: backend stopped");
    }
    updateFlow();
}

// ---- streaming ----

void TelephonyService::sendMessage(int32_t messageId, const Bytes& data) {
    // Written first and unbuffered: whatever happens to clients or to this process
    // afterwards, the message is in the file.
    if (recorder_) {
        if (recorder_->write(CaptureWriter::nowMicros(), messageId, data)) {
            ++counters_.messagesRecorded;
        } else {
            SystemLog::log(SystemLog::kError, "Telephony service: recording stopped: %s", recorder_->error().c_str());
            statusLine("recording stopped: " + recorder_->error());
            recorder_.reset();
        }
    }
    if (const auto record = LogMask::classify(data); record && record->isOrdinary())
        if (const auto technology = TechnologyNames::identifierForLogCode(record->code);
            technology && std::find(logTechnologies_.begin(), logTechnologies_.end(), *technology) == logTechnologies_.end())
            logTechnologies_.push_back(*technology);

    bool congestion = false;
    for (auto& [number, channel] : channels_) {
        if (!channel->streaming || channel->closing || !channel->mask.forwards(data)) continue;
        // Behind what waits already, so that the client gets its messages in order.
        if (channel->congested || !channel->queue.empty()) {
            enqueue(*channel, messageId, data);
        } else if (deliver(number, *channel, messageId, data)) {
            congestion = congestion || channel->congested;
        }
    }
    if (congestion) updateFlow();
}

void TelephonyService::sendDisplayTick(std::optional<int64_t> recordedMs) {
    // Not recorded: a replay of the recording marks its own ticks.
    Bytes data;
    if (recordedMs) {
        const uint64_t bits = static_cast<uint64_t>(*recordedMs);
        for (int shift = 0; shift < 64; shift += 8) data.push_back(static_cast<uint8_t>(bits >> shift));
    }
    bool congestion = false;
    for (auto& [number, channel] : channels_) {
        if (!channel->streaming || channel->closing) continue;
        if (channel->congested || !channel->queue.empty()) {
            enqueue(*channel, TelephonyServiceConnection::kDisplayTickMessageId, data);
        } else if (deliver(number, *channel, TelephonyServiceConnection::kDisplayTickMessageId, data)) {
            congestion = congestion || channel->congested;
        }
    }
    if (congestion) updateFlow();
}

bool TelephonyService::deliver(uint64_t number, Channel& channel, int32_t messageId, const Bytes& data) {
    if (!channel.client->post(messageId, data)) {
        scheduleClose(number, "the client's receive port went away");
        return false;
    }
    ++channel.sent;
    ++counters_.messagesSent;
    const bool wasCongested = channel.congested;
    channel.congested = channel.client->bytesPending() >= kHighWaterBytes;
    if (channel.congested && !wasCongested) {
        channel.congestedSince.start();
        // Look again when the client would count as stalled.
        QTimer::singleShot(kStallMs + 10, this, [this] { updateFlow(); });
    }
    return true;
}

void TelephonyService::enqueue(Channel& channel, int32_t messageId, const Bytes& data) {
    channel.queue.emplace_back(messageId, data);
    channel.queuedBytes += data.size();
    // The newest message always stays, however long.
    while (channel.queuedBytes > kMaxQueuedBytes && channel.queue.size() > 1) {
        channel.queuedBytes -= channel.queue.front().second.size();
        channel.queue.pop_front();
        ++counters_.messagesDropped;
        if (channel.dropped++ == 0)
            statusLine(StringFormat::format("channel %llu: its client takes too little, its oldest messages are dropped",
                                            static_cast<unsigned long long>(channel.number)));
    }
}

void TelephonyService::drainQueue(uint64_t number) {
    auto it = channels_.find(number);
    if (it == channels_.end() || it->second->closing) return;
    Channel& channel = *it->second;
    channel.congested = false;
    while (!channel.queue.empty() && !channel.congested) {
        auto [messageId, data] = std::move(channel.queue.front());
        channel.queue.pop_front();
        channel.queuedBytes -= data.size();
        if (!deliver(number, channel, messageId, data)) return;
    }
    updateFlow();
}

void TelephonyService::updateFlow() {
    if (!backend_) return;
    // A client behind but still taking holds the replay back (nothing is lost for a
    // slow reader); one that has taken nothing for kStallMs no longer does, and only
    // its own queue drops. With no channel able to take more, the replay waits.
    // With no client streaming, only a recording takes the messages, at the replay's pace.
    bool canTake = false, holdsBack = false, streaming = false;
    for (const auto& entry : channels_) {
        const Channel& channel = *entry.second;
        if (!channel.streaming || channel.closing) continue;
        streaming = true;
        if (!channel.congested)
            canTake = true;
        else if (channel.congestedSince.elapsed() < kStallMs)
            holdsBack = true;
    }
    backend_->setPaused(streaming ? !canTake || holdsBack : !recorder_);
}

void TelephonyService::notifyBackendState() {
    auto info = Dictionary::create();
    info->set("State", Value(ModemBackend::stateName(backend_->state())));
    info->set("Technology", Value(backend_->technology()));
    info->set("Source", Value(backend_->source()));
    info->set("Sent", Value::integer(static_cast<int64_t>(backend_->messagesThisRun())));
    if (const auto total = backend_->totalMessages()) info->set("Total", Value::integer(static_cast<int64_t>(*total)));
    if (const auto time = backend_->recordedTime()) info->set("RecordedTime", Value::integer(*time));
    auto technologies = Array::create();
    for (const std::string& identifier : logTechnologies_) technologies->append(Value(identifier));
    info->set("LogTechnologies", Value(technologies));
    if (const std::string problem = backend_->problem(); !problem.empty()) info->set("Problem", Value(problem));
    auto notification = Dictionary::create();
    notification->set("Name", Value("BackendStateChanged"));
    notification->set("Info", Value(info));
    if (port_) port_->broadcastNotification(kNotificationMessageId, xml(notification));
    notifiedSent_ = backend_->messagesThisRun();
    notified_.start();
}

void TelephonyService::notifyChannelStatus(Channel& channel) {
    auto info = Dictionary::create();
    info->set("Dropped", Value::integer(static_cast<int64_t>(channel.dropped)));
    info->set("Sent", Value::integer(static_cast<int64_t>(channel.sent)));
    auto notification = Dictionary::create();
    notification->set("Name", Value("ChannelStatus"));
    notification->set("Info", Value(info));
    // On the channel port, not behind the records queued for the receive port: the client
    // hears of the loss while it is still behind.
    channel.port->broadcastNotification(kNotificationMessageId, xml(notification));
    channel.droppedNotified = channel.dropped;
}

void TelephonyService::backendStateChanged(ModemBackend::State state) {
    // A new run: what its stream holds is learnt afresh.
    if (state == ModemBackend::State::Streaming) logTechnologies_.clear();
    notifyBackendState();

    if (state == ModemBackend::State::Finished) {
        const auto* replay = qobject_cast<const ReplayBackend*>(backend_.get());
        const RecordedLog* report = replay ? &replay->stream().report() : nullptr;
        statusLine(StringFormat::format(
            "replay finished: %llu messages replayed, %llu sent to clients, %llu dropped (clients too slow); bad frames: "
            "%zu in the file, %llu from clients",
            static_cast<unsigned long long>(backend_->messagesEmitted()),
            static_cast<unsigned long long>(counters_.messagesSent),
            static_cast<unsigned long long>(counters_.messagesDropped),
            report ? report->badCrc + report->malformed + report->truncated : 0,
            static_cast<unsigned long long>(portCountsNow().malformed)));
    } else if (state == ModemBackend::State::Failed && !starting_) {
        statusLine(backend_->problem().empty() ? "backend failed" : "backend failed: " + backend_->problem());
    }
}

void TelephonyService::checkHealth() {
    const PortCounts ports = portCountsNow();
    if (ports.malformed > reported_.malformed || ports.refused > reported_.refused ||
        ports.overLimit > reported_.overLimit || ports.foreign > reported_.foreign) {
        statusLine(StringFormat::format("from clients so far: %llu malformed frames, %llu connections refused (too many), "
                                        "%llu closed over a buffer limit, %llu refused (another user's); still serving",
                                        static_cast<unsigned long long>(ports.malformed),
                                        static_cast<unsigned long long>(ports.refused),
                                        static_cast<unsigned long long>(ports.overLimit),
                                        static_cast<unsigned long long>(ports.foreign)));
        reported_ = ports;
    }
    if (backend_ && backend_->state() == ModemBackend::State::Streaming &&
        backend_->messagesThisRun() != notifiedSent_ && notified_.isValid() && notified_.hasExpired(kProgressIntervalMs - 50))
        notifyBackendState();
    for (const auto& entry : channels_) {
        if (entry.second->closing) continue;
        if (entry.second->dropped != entry.second->droppedNotified) notifyChannelStatus(*entry.second);
        // A client that died without its invalidation reaching us.
        if (!entry.second->client->isValid())
            scheduleClose(entry.first, "the client's receive port went away");
        // A client that asked for a channel and never came to it.
        else if (!entry.second->port->hadConnection() && entry.second->age.hasExpired(kUnclaimedChannelMs))
            scheduleClose(entry.first, "nobody connected to its port");
    }
}

bool TelephonyService::servesPort(const RemoteMessagePort& port) const {
    // By file identity, so that another path to the same socket (a symbolic or hard
    // link, "/tmp/./name") is recognised as well.
    struct stat target {};
    if (::stat(port.socketPath().c_str(), &target) != 0) return false;
    auto same = [&](const LocalMessagePort& own) {
        struct stat st {};
        return ::stat(own.socketPath().c_str(), &st) == 0 && st.st_dev == target.st_dev && st.st_ino == target.st_ino;
    };
    if (port_ && same(*port_)) return true;
    for (const auto& entry : channels_)
        if (same(*entry.second->port)) return true;
    return false;
}

}  // namespace vantorel

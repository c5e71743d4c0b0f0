// FakeDiagModem: request handling, the radio behind the log mask, and the fault modes of a software DIAG modem.
#include "fakediag/FakeDiagModem.h"

#include "Platform/ByteReader.h"
#include "Platform/RecordBuilder.h"
#include "Platform/StringFormat.h"
#include "Platform/TechnologyNames.h"
#include "TelephonyService/Device/DiagCommand.h"
#include "TelephonyService/ModemBackend.h"
#include "TelephonyService/Replay/DiagPacket.h"
#include "TelephonyService/Replay/HdlcDeframer.h"
#include "fakediag/PseudoTerminal.h"
#include "fakediag/TcpModemLink.h"

#include <array>
#include <utility>

namespace vantorel {

namespace {

struct FaultName {
    FakeDiagModem::Fault fault;
    const char* name;
};
constexpr std::array<FaultName, 6> kFaultNames{{
    {FakeDiagModem::Fault::Trickle, "trickle"},
    {FakeDiagModem::Fault::PartialFirstFrame, "partial-first-frame"},
    {FakeDiagModem::Fault::BadCrc, "bad-crc"},
    {FakeDiagModem::Fault::Unsolicited, "unsolicited"},
    {FakeDiagModem::Fault::NoReply, "no-reply"},
    {FakeDiagModem::Fault::Garbage, "garbage"},
}};

constexpr uint64_t kBadCrcEvery = 4;
constexpr uint16_t kSpoilCrc = 0x5A5A;

// What a modem's AT command port says to bytes it does not understand.
constexpr char kAtError[] = "\r\nERROR\r\n";

// 79 <ts type u8> <args u8> <drops u8> <time stamp u64> <line u16> <subsystem u16> <u32> <text, NUL> <file, NUL>
Bytes debugMessage(const char* text) {
    Bytes body{DiagOpcode::kMessage, 0x00, 0x00, 0x00};
    body.resize(body.size() + 8 + 2 + 2 + 4, 0);
    for (const char* p = text; *p; ++p) body.push_back(static_cast<uint8_t>(*p));
    body.push_back(0);
    for (const char* p = "fakediag.c"; *p; ++p) body.push_back(static_cast<uint8_t>(*p));
    body.push_back(0);
    return body;
}

Bytes dualSim(uint32_t subscription, ByteView inner) {
    Bytes body{DiagOpcode::kMultiSim, 0x01, 0x00, 0x00};
    for (int i = 0; i < 4; ++i) body.push_back(static_cast<uint8_t>(subscription >> (8 * i)));
    body.insert(body.end(), inner.begin(), inner.end());
    return body;
}

}  // namespace

std::optional<FakeDiagModem::Fault> FakeDiagModem::faultNamed(const std::string& name) {
    for (const FaultName& f : kFaultNames)
        if (name == f.name) return f.fault;
    return std::nullopt;
}

std::string FakeDiagModem::faultNames() {
    std::string text;
    for (const FaultName& f : kFaultNames) text += (text.empty() ? "" : ", ") + std::string(f.name);
    return text;
}

FakeDiagModem::FakeDiagModem(std::vector<std::unique_ptr<ModemBackend>> sources, Options options, QObject* parent)
    : QObject(parent), sources_(std::move(sources)), options_(std::move(options)),
      responder_(options_.itemCounts, options_.buildId) {
    for (const auto& source : sources_) {
        connect(source.get(), &ModemBackend::messageReady, this,
                [this](int32_t, const Bytes& record) { onRecord(record); });
        connect(source.get(), &ModemBackend::stateChanged, this, [this](ModemBackend::State state) {
            if (state == ModemBackend::State::Finished)
                emit statusLine("the recording has ended: logging stays on, nothing more to send");
        });
    }
    settle_.setSingleShot(true);
    connect(&settle_, &QTimer::timeout, this, &FakeDiagModem::startRadio);
    connect(&switch_, &QTimer::timeout, this, &FakeDiagModem::switchTechnology);
    vanish_.setSingleShot(true);
    connect(&vanish_, &QTimer::timeout, this, &FakeDiagModem::vanish);
    back_.setSingleShot(true);
    connect(&back_, &QTimer::timeout, this, [this] {
        std::string error;
        if (!openLink(&error)) emit statusLine("cannot come back: " + error);
    });
}

FakeDiagModem::~FakeDiagModem() {
    stopRadio();
}

bool FakeDiagModem::open(std::string* error) {
    if (sources_.size() > 1 && options_.switchEvery.count() > 0) switch_.start(options_.switchEvery);
    return openLink(error);
}

std::string FakeDiagModem::path() const {
    return options_.link.empty() || options_.tcpPort >= 0 ? linkPath() : options_.link;
}

std::string FakeDiagModem::linkPath() const {
    return link_ ? link_->path() : std::string();
}

bool FakeDiagModem::openLink(std::string* error) {
    std::unique_ptr<ModemLink> link;
    if (options_.tcpPort >= 0)
        link = TcpModemLink::listen(static_cast<uint16_t>(options_.tcpPort), error);
    else
        link = PseudoTerminal::open(options_.link, error);
    if (!link) return false;
    // A modem that comes back on TCP comes back on the same port.
    if (options_.tcpPort == 0) options_.tcpPort = std::stoi(link->path().substr(link->path().rfind(':') + 1));
    link_ = std::move(link);
    link_->setTrickle(has(Fault::Trickle));
    // A modem that comes back has forgotten every mask; a frame cut by the last link
    // is not carried into the new one.
    responder_ = DiagResponder(options_.itemCounts, options_.buildId);
    auto deframer = std::make_shared<HdlcDeframer>(
        [this](ByteView body, uint64_t) { onRequest(body); },
        [this](HdlcDeframer::Problem, uint64_t, const std::string&) { ++counters_.badRequests; });
    connect(link_.get(), &ModemLink::received, this, [deframer](const Bytes& bytes) { deframer->feed(bytes); });
    // A recording waits for a host that reads slowly (an emulated radio does not).
    connect(link_.get(), &ModemLink::drained, this, [this] {
        if (!sources_.empty() && sources_[current_]->isPaused()) sources_[current_]->setPaused(false);
    });
    emit linkOpened(link_->path());
    return true;
}

void FakeDiagModem::vanish() {
    if (!link_) return;
    stopRadio();
    settle_.stop();
    vanish_.stop();
    options_.vanishAfter = std::chrono::milliseconds(0);
    // From the event loop: this may run inside the link's own signal.
    const std::string gone = link_->path();
    disconnect(link_.get(), nullptr, this, nullptr);
    link_.release()->deleteLater();
    emit statusLine(options_.backAfter.count() >= 0
                        ? StringFormat::format("unplugged: %s closed; back in %lld ms", gone.c_str(),
                                               static_cast<long long>(options_.backAfter.count()))
                        : "unplugged: " + gone + " closed");
    if (options_.backAfter.count() >= 0) back_.start(options_.backAfter);
}

void FakeDiagModem::onRequest(ByteView request) {
    if (!link_) return;
    ++counters_.requests;
    requests_.emplace_back(request.begin(), request.end());
    emit requestReceived(requests_.back());
    if (has(Fault::NoReply)) return;
    if (has(Fault::Garbage)) {
        link_->write(ByteView(reinterpret_cast<const uint8_t*>(kAtError), sizeof kAtError - 1));
        return;
    }
    const Bytes reply = responder_.answer(request);
    if (has(Fault::PartialFirstFrame) && ByteReader(request).u8(0) == DiagOpcode::kEventReport) {
        // The second half of a log packet's frame, closing flag included: what a host
        // that opens the port in the middle of the modem's output reads first.
        const Bytes older = DiagCommand::frame(
            DiagPacket::logPacketFromRecord(RecordBuilder::ordinary(0xB0C2, 40).u32(20, 0x7E7D7E7D).build()));
        link_->write(ByteView(older).subspan(older.size() / 2));
    }
    if (has(Fault::Unsolicited)) {
        const Bytes message = debugMessage("fake modem: a debug message before the reply");
        send(message);
        send(dualSim(options_.subscription.value_or(1), message));
    }
    send(reply, has(Fault::BadCrc) && ++replies_ % kBadCrcEvery == 0);
    updateLogging();
}

void FakeDiagModem::updateLogging() {
    if (!responder_.logging()) {
        settle_.stop();
        if (streaming_) emit statusLine("logging off");
        stopRadio();
        return;
    }
    if (!streaming_)
        settle_.start(kSettle);  // the host sets one equipment at a time: wait for the last
    else if (responder_.maskSummary() != mask_)
        emit statusLine("log mask now " + (mask_ = responder_.maskSummary()));
}

void FakeDiagModem::startRadio() {
    if (streaming_ || !link_ || !responder_.logging() || sources_.empty()) return;
    streaming_ = true;
    ModemBackend& source = *sources_[current_];
    mask_ = responder_.maskSummary();
    emit statusLine(StringFormat::format("logging on (%s): %s", mask_.c_str(),
                                         source.source().c_str()));
    source.start();
    if (options_.vanishAfter.count() > 0) vanish_.start(options_.vanishAfter);
}

void FakeDiagModem::stopRadio() {
    if (!streaming_) return;
    streaming_ = false;
    vanish_.stop();
    sources_[current_]->stop();
    sources_[current_]->setPaused(false);
}

void FakeDiagModem::switchTechnology() {
    if (sources_.empty()) return;
    const bool wasStreaming = streaming_;
    stopRadio();
    current_ = (current_ + 1) % sources_.size();
    emit statusLine("now on " + TechnologyNames::displayName(sources_[current_]->technology()));
    if (wasStreaming) startRadio();
}

void FakeDiagModem::onRecord(const Bytes& record) {
    if (!streaming_ || !link_) return;
    const Bytes packet = DiagPacket::logPacketFromRecord(record);
    if (packet.empty()) return;  // extra records and IFX messages have no DIAG form
    // 10 00 <len u16> <len u16> <code u16>: the code at 6.
    if (!responder_.enabled(ByteReader(packet).u16(6).value_or(0))) {
        ++counters_.notEnabled;
        return;
    }
    const bool spoil = has(Fault::BadCrc) && (counters_.logPackets + counters_.hostBehind + 1) % kBadCrcEvery == 0;
    if (send(options_.subscription ? dualSim(*options_.subscription, packet) : packet, spoil)) ++counters_.logPackets;
    if (link_ && link_->pending() > ModemLink::kHighWater) sources_[current_]->setPaused(true);
}

bool FakeDiagModem::send(ByteView body, bool spoil) {
    if (!link_) return false;
    if (link_->write(DiagCommand::frame(body, spoil ? kSpoilCrc : 0))) return true;
    ++counters_.hostBehind;
    return false;
}

}  // namespace vantorel

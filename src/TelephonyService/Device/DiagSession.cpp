// DiagSession: request queue with retransmission, the open and clearing sequences, and the modem's unsolicited traffic.
#include "TelephonyService/Device/DiagSession.h"

#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"
#include "TelephonyService/Device/DiagPort.h"
#include "TelephonyService/Replay/DiagPacket.h"

namespace vantorel {

DiagSession::DiagSession(DiagPort* port, QObject* parent)
    : QObject(parent),
      port_(port),
      deframer_([this](ByteView body, uint64_t) { onFrame(body); },
                [this](HdlcDeframer::Problem problem, uint64_t, const std::string& why) {
                    // The bytes before the first good frame may be the end of a frame sent
                    // before we listened: dropped without counting.
                    if (!sawGoodFrame_) return;
                    if (problem == HdlcDeframer::Problem::BadCrc)
                        ++counters_.badCrc;
                    else
                        ++counters_.malformed;
                    if (counters_.badCrc + counters_.malformed == 1)
                        SystemLog::log(SystemLog::kWarning, "Device %s: dropped a bad frame (%s); later ones are counted",
                                       portName().c_str(), why.c_str());
                }) {
    replyTimer_.setSingleShot(true);
    connect(&replyTimer_, &QTimer::timeout, this, &DiagSession::timedOut);
    connect(port_, &DiagPort::received, this, &DiagSession::onBytes);
    clearDeadline_.setSingleShot(true);
    connect(&clearDeadline_, &QTimer::timeout, this, [this] { endClear(false); });
    connect(port_, &DiagPort::closed, this, [this] { endClear(false); });
}

DiagSession::~DiagSession() = default;

std::string DiagSession::portName() const { return port_->name(); }

void DiagSession::send(Bytes body, std::function<void(const Reply&)> done) {
    queue_.push_back({std::move(body), std::move(done), 0});
    if (queue_.size() == 1) transmit();
}

void DiagSession::transmit() {
    if (queue_.empty()) return;
    Request& request = queue_.front();
    if (request.attempts++ > 0) ++counters_.retransmits;
    port_->write(DiagCommand::frame(request.body));
    replyTimer_.start(kReplyTimeoutMs);
}

void DiagSession::timedOut() {
    if (queue_.empty()) return;
    if (queue_.front().attempts < kAttempts) {
        transmit();
        return;
    }
    Request request = std::move(queue_.front());
    queue_.pop_front();
    if (request.done) request.done(std::nullopt);
    sendNext();
}

void DiagSession::sendNext() {
    // The callback that just ran may have queued (and so sent) a request itself.
    if (!queue_.empty() && queue_.front().attempts == 0) transmit();
}

void DiagSession::onBytes(const Bytes& bytes) { deframer_.feed(bytes); }

void DiagSession::onFrame(ByteView body) {
    sawGoodFrame_ = true;
    if (!queue_.empty() && DiagCommand::answers(body, queue_.front().body)) {
        replyTimer_.stop();
        Request request = std::move(queue_.front());
        queue_.pop_front();
        if (request.done) request.done(Bytes(body.begin(), body.end()));
        sendNext();
        return;
    }
    const DiagPacket packet(body);
    if (packet.kind() == DiagPacket::Kind::Malformed) {
        ++counters_.malformed;
        return;
    }
    if (!packet.isLogPacket()) {
        ++counters_.notLog;
        return;
    }
    if (!ready_ || (!all_ && !enabled_.count(packet.logCode()))) {
        ++counters_.unsubscribed;
        return;
    }
    ++counters_.logPackets;
    emit record(packet.morvekRecord(), packet.logCode(), packet.subscriptionId());
}

void DiagSession::fail(const std::string& why) {
    opening_ = false;
    ready_ = false;
    replyTimer_.stop();
    queue_.clear();
    emit failed(why);
}

void DiagSession::open(std::optional<std::set<uint16_t>> codes) {
    wanted_ = std::move(codes);
    queue_.clear();
    replyTimer_.stop();
    opening_ = true;
    ready_ = false;
    sawGoodFrame_ = false;
    enabled_.clear();
    all_ = false;
    requested_.clear();
    refusals_.clear();
    counts_.reset();
    buildId_.clear();
    port_->discardPending();
    deframer_.finish();  // a frame cut by the discard is not carried into the new stream

    const std::string name = portName();
    // A modem that ignores the very first request is not a DIAG port at all.
    send(DiagCommand::eventReportsOff(), [this, name](const Reply& reply) {
        if (!reply)
            fail(StringFormat::format("no DIAG reply from %s within %d s: is this the diagnostic interface?",
                                      name.c_str(), kReplyTimeoutMs * kAttempts / 1000));
    });
    auto required = [this](const Bytes& request) {
        return [this, request](const Reply& reply) {
            if (!reply && opening_) fail("no reply to " + DiagCommand::describe(request) + " from " + portName());
        };
    };
    const Bytes disable = DiagCommand::logConfig(DiagLogConfigOp::kDisable);
    send(disable, required(disable));
    send(DiagCommand::messageLevelsOff(), required(DiagCommand::messageLevelsOff()));
    send(DiagCommand::version(), [this](const Reply& reply) {
        if (!opening_) return;
        if (!reply) return fail("no reply to the version request from " + portName());
        const std::string error = DiagCommand::errorName(*reply);
        if (!error.empty())
            fail(StringFormat::format("%s answered the version request with \"%s\": not a DIAG port?",
                                      portName().c_str(), error.c_str()));
    });
    send(DiagCommand::buildId(), [this](const Reply& reply) {
        // Some modems answer 7C with an error: the build ID is only shown.
        if (reply) buildId_ = DiagCommand::buildIdOf(*reply);
    });
    send(DiagCommand::logConfig(DiagLogConfigOp::kRetrieveRanges), [this](const Reply& reply) {
        if (!opening_) return;
        const std::string error = reply ? DiagCommand::errorName(*reply) : std::string();
        if (reply && error.empty()) counts_ = DiagCommand::itemCounts(*reply);
        if (!counts_)
            return fail(StringFormat::format("%s did not say how many log items it has (%s)", portName().c_str(),
                                             !reply ? "no reply" : !error.empty() ? error.c_str() : "a bad reply"));
        applyCodes();
        finishOpen();
    });
}

void DiagSession::finishOpen() {
    // A version request after the set-masks: its reply comes after theirs. Codes changed
    // meanwhile (a client's start command during the handshake) queued more set-masks behind
    // it: ready waits for those too, so the handshake ends with the mask the clients want.
    send(DiagCommand::version(), [this](const Reply&) {
        if (!opening_) return;
        if (!queue_.empty()) return finishOpen();
        opening_ = false;
        ready_ = true;
        emit ready();
    });
}

void DiagSession::setCodes(std::optional<std::set<uint16_t>> codes) {
    wanted_ = std::move(codes);
    // Before the item counts the open sequence plans from wanted_ itself; once they are known
    // (opening or ready) the change is queued now, never left for a later event.
    if ((opening_ || ready_) && !clearing_) applyCodes();
}

void DiagSession::applyCodes() {
    if (!counts_) return;
    const DiagCommand::ItemCounts counts = *counts_;
    std::map<uint32_t, Bytes> requests;
    std::map<uint32_t, std::set<uint16_t>> codesOf;
    std::vector<Refusal> refused;
    if (!wanted_) {
        for (uint32_t equipment = 0; equipment < DiagCommand::kEquipmentCount; ++equipment) {
            if (counts[equipment] == 0) continue;
            std::set<uint32_t> items;
            for (uint32_t item = 0; item < counts[equipment] && item < 0x1000; ++item) items.insert(item);
            requests[equipment] = DiagCommand::setMask(equipment, counts[equipment], items);
        }
    } else {
        const DiagCommand::MaskPlan plan = DiagCommand::planMasks(*wanted_, counts);
        requests = plan.requests;
        for (uint16_t code : *wanted_) {
            const DiagLogItem item = DiagLogItem::of(code);
            if (plan.requests.count(item.equipment) && item.item < counts[item.equipment]) codesOf[item.equipment].insert(code);
        }
        for (uint16_t code : plan.skipped) {
            const DiagLogItem item = DiagLogItem::of(code);
            refused.push_back({code, StringFormat::format("item 0x%03X is beyond the modem's %u items of equipment 0x%X",
                                                          item.item, counts[item.equipment], item.equipment)});
            SystemLog::log(SystemLog::kWarning, "Device %s: log code 0x%04X skipped: %s", portName().c_str(), code,
                           refused.back().why.c_str());
        }
    }
    // An equipment enabled before (or asked to be) and wanted no more gets an empty mask.
    for (const auto& entry : requested_)
        if (entry.second.on && !requests.count(entry.first))
            requests[entry.first] = DiagCommand::setMask(entry.first, counts[entry.first], {});

    // Refusals of codes still wanted are kept; the new plan's are added.
    std::erase_if(refusals_, [&](const Refusal& r) { return !wanted_ || !wanted_->count(r.code); });
    for (const Refusal& r : refused)
        if (std::none_of(refusals_.begin(), refusals_.end(), [&](const Refusal& k) { return k.code == r.code; }))
            refusals_.push_back(r);

    const bool all = !wanted_;
    for (const auto& entry : requests) {
        // Named variables: clang 14 (the fuzz build) cannot capture structured bindings in a lambda.
        const uint32_t equipment = entry.first;
        const Bytes& request = entry.second;
        // The modem has this mask already, or will have once what is queued is answered. Compared
        // with the last mask queued, not the last accepted: a change back while another is in
        // flight must still be sent.
        if (const auto it = requested_.find(equipment); it != requested_.end() && it->second.request == request) continue;
        const std::set<uint16_t> codes = codesOf[equipment];
        requested_[equipment] = {request, all || !codes.empty()};
        send(request, [this, equipment, codes, all, request](const Reply& reply) {
            std::string why;
            if (!reply)
                why = "no reply";
            else if (!DiagCommand::errorName(*reply).empty())
                why = DiagCommand::errorName(*reply);
            else if (const auto status = DiagCommand::logConfigStatus(*reply); status != 0u)
                why = status ? StringFormat::format("status %u", *status) : std::string("a short reply");
            std::erase_if(enabled_, [&](uint16_t c) { return DiagLogItem::of(c).equipment == equipment; });
            if (why.empty()) {
                enabled_.insert(codes.begin(), codes.end());
                if (all) all_ = true;
                return;
            }
            // Asked again at the next change, and emptied when no longer wanted.
            if (const auto it = requested_.find(equipment); it != requested_.end() && it->second.request == request)
                it->second = {Bytes{}, true};
            SystemLog::log(SystemLog::kWarning, "Device %s: the modem refused the log mask of equipment 0x%X (%s)",
                           portName().c_str(), equipment, why.c_str());
            for (uint16_t code : codes)
                if (std::none_of(refusals_.begin(), refusals_.end(), [&](const Refusal& k) { return k.code == code; }))
                    refusals_.push_back({code, why});
        });
    }
    if (!all) all_ = false;
}

void DiagSession::clear(int timeoutMs, std::function<void(bool answered)> done) {
    opening_ = false;
    ready_ = false;
    queue_.clear();
    replyTimer_.stop();
    enabled_.clear();
    all_ = false;
    requested_.clear();
    counts_.reset();
    if (clearing_) endClear(false);  // an older clear gives way
    clearing_ = std::move(done);
    clearAnswers_ = 0;
    const std::vector<Bytes> sequence = DiagCommand::clearingSequence();
    for (size_t i = 0; i < sequence.size(); ++i) {
        const bool last = i + 1 == sequence.size();
        send(sequence[i], [this, last, total = int(sequence.size())](const Reply& reply) {
            if (reply) ++clearAnswers_;
            if (last) endClear(clearAnswers_ == total);
        });
    }
    clearDeadline_.start(timeoutMs);
}

void DiagSession::endClear(bool answered) {
    if (!clearing_) return;
    clearDeadline_.stop();
    queue_.clear();
    replyTimer_.stop();
    // From the event loop: the callback may delete this session.
    QMetaObject::invokeMethod(this, [done = std::move(clearing_), answered] { done(answered); }, Qt::QueuedConnection);
    clearing_ = nullptr;
}

}  // namespace vantorel

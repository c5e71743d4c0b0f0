// DiagSession: one conversation with a DIAG modem over an open port: the open handshake, log-mask changes, the clearing sequence, and the log packets in between.
#pragma once

#include "PropertyList/Value.h"
#include "TelephonyService/Device/DiagCommand.h"
#include "TelephonyService/Replay/HdlcDeframer.h"

#include <QObject>
#include <QTimer>

#include <cstdint>
#include <deque>
#include <functional>
#include <map>
#include <optional>
#include <set>
#include <string>
#include <vector>

namespace vantorel {

class DiagPort;

// Requests go one at a time. A reply is the first frame that DiagCommand::answers() the
// request in flight; everything else the modem sends meanwhile (log packets, dual-SIM
// frames, debug messages, events) is unsolicited traffic. A request without a reply within
// kReplyTimeoutMs is sent again, kAttempts times in all.
//
// open() runs, in order: pending bytes discarded; event reports off (60 00), log masks
// cleared (73 op 0), debug messages off (7D 05); version (00, must answer), build ID (7C, may
// answer with an error); the sixteen item counts (73 op 1); then one set-mask (73 op 3) per
// equipment with a wanted code, each reply checked for opcode, op and status 0. A modem that
// does not answer the first request is not a DIAG port; the session then fails at once.
//
// The modem's mask always ends as the last codes given: a setCodes() at any point of the open
// sequence, or while an earlier change is still in flight, is planned against the last mask
// queued for each equipment (requests are answered in order), and ready() comes only once the
// set-masks of every change so far have their replies.
//
// Log packets of enabled codes come out as records (type 1 and the DLF record, as the replay
// of a QMDL file gives them); the rest is counted and dropped.
class DiagSession : public QObject {
    Q_OBJECT
public:
    static constexpr int kReplyTimeoutMs = 667;
    static constexpr int kAttempts = 3;  // so a silent port is given up after 2 s

    struct Counters {
        uint64_t logPackets = 0;    // forwarded
        uint64_t badCrc = 0;        // frames whose CRC did not match
        uint64_t malformed = 0;     // frames cut, over-long (over HdlcDeframer::kMaxFrameLength), or bad log packets
        uint64_t notLog = 0;        // unsolicited frames that are not log packets (debug messages, events, stray replies)
        uint64_t unsubscribed = 0;  // log packets of codes not enabled
        uint64_t retransmits = 0;
    };
    struct Refusal {
        uint16_t code = 0;
        std::string why;  // "beyond the modem's 0x0B8 items of equipment 0xB", "bad parameter", "status 1"
    };

    // The port is not owned and must outlive the session.
    DiagSession(DiagPort* port, QObject* parent = nullptr);
    ~DiagSession() override;

    // Runs the open sequence, enabling `codes` (all: every item the modem has); ends with
    // ready() or failed().
    void open(std::optional<std::set<uint16_t>> codes);
    // Changes the enabled codes: the set-masks are queued at once once the item counts are
    // known (before that, the open sequence plans from these codes).
    void setCodes(std::optional<std::set<uint16_t>> codes);
    // Cancels what is in flight and sends the clearing sequence (60 00, 73 op 0, 7D 05);
    // `done` runs once, from the event loop, when the last request has its reply, or after
    // timeoutMs, or when the port closes: true when the modem answered all three.
    void clear(int timeoutMs, std::function<void(bool answered)> done);
    bool isClearing() const { return clearing_ != nullptr; }

    bool isReady() const { return ready_; }
    const std::set<uint16_t>& enabledCodes() const { return enabled_; }
    bool allEnabled() const { return all_; }
    const std::vector<Refusal>& refusals() const { return refusals_; }
    const Counters& counters() const { return counters_; }
    // The build ID the modem gave (empty when it answered with an error).
    const std::string& buildId() const { return buildId_; }

signals:
    void ready();
    void failed(const std::string& why);
    // A log packet of an enabled code, as a type-1 record; subscription: the dual-SIM id.
    void record(const vantorel::Bytes& record, uint16_t code, std::optional<uint32_t> subscription);

private:
    using Reply = std::optional<Bytes>;  // empty: no reply after every attempt
    struct Request {
        Bytes body;
        std::function<void(const Reply&)> done;
        int attempts = 0;
    };

    void send(Bytes body, std::function<void(const Reply&)> done);
    void transmit();
    void sendNext();
    void timedOut();
    void onBytes(const Bytes& bytes);
    void onFrame(ByteView body);
    void fail(const std::string& why);
    void endClear(bool answered);
    // Queues the set-mask requests that take the modem from the last mask queued to the wanted one.
    void applyCodes();
    // The last step of the open sequence: ready once nothing is queued behind it.
    void finishOpen();
    std::string portName() const;

    DiagPort* port_;
    HdlcDeframer deframer_;
    std::deque<Request> queue_;
    QTimer replyTimer_;
    bool opening_ = false;
    bool ready_ = false;
    bool sawGoodFrame_ = false;  // the first frame after open may be the tail of an older one
    std::optional<std::set<uint16_t>> wanted_;  // empty: all
    std::set<uint16_t> enabled_;
    bool all_ = false;
    // Per equipment, the last set-mask queued (or accepted), and whether it sets a bit; a refused
    // one is forgotten (an empty request, taken as on), so that it is asked again.
    struct Requested {
        Bytes request;
        bool on = false;
    };
    std::map<uint32_t, Requested> requested_;
    std::optional<DiagCommand::ItemCounts> counts_;
    std::vector<Refusal> refusals_;
    std::string buildId_;
    Counters counters_;
    std::function<void(bool)> clearing_;  // the clear's `done`, while it runs
    int clearAnswers_ = 0;
    QTimer clearDeadline_;
};

}  // namespace vantorel

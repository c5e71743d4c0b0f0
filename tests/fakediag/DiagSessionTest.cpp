// Tests for a DIAG session against a modem in memory: the clearing sequence's outcome, a log mask the modem refuses, and codes that change while the handshake or an earlier change is under way.
#include "TelephonyService/Device/DiagCommand.h"
#include "TelephonyService/Device/DiagPort.h"
#include "TelephonyService/Device/DiagSession.h"
#include "TelephonyService/Replay/HdlcDeframer.h"
#include "fakediag/DiagResponder.h"
#include "support/EventLoopWait.h"

#include <gtest/gtest.h>

#include <functional>
#include <optional>
#include <set>
#include <vector>

using namespace vantorel;
using vantorel::testing::waitUntil;

namespace {

// A modem in memory: each request gets the fake modem's answer, changed or withheld by `reply`,
// from the event loop as a serial port would deliver it.
class MemoryModem : public DiagPort {
public:
    using Reply = std::function<std::optional<Bytes>(ByteView request, Bytes answer)>;
    explicit MemoryModem(Reply reply)
        : DiagPort("memory"), reply_(std::move(reply)), requests_([this](ByteView body, uint64_t) {
              if (onRequest) onRequest(count_++);
              const std::optional<Bytes> answer = reply_(body, responder_.answer(body));
              if (!answer) return;
              QMetaObject::invokeMethod(
                  this, [this, frame = DiagCommand::frame(*answer)] { emit received(frame); }, Qt::QueuedConnection);
          }) {}
    bool write(ByteView bytes) override {
        requests_.feed(bytes);
        return true;
    }
    void discardPending() override {}
    void unplug() { emit closed("unplugged"); }
    const DiagResponder& responder() const { return responder_; }
    // Called with each request's number (from 0) as it arrives, before its reply is on its way.
    std::function<void(size_t)> onRequest;

private:
    size_t count_ = 0;
    Reply reply_;
    DiagResponder responder_;
    HdlcDeframer requests_;
};

std::optional<Bytes> asIs(ByteView, Bytes answer) { return answer; }

}  // namespace

TEST(DiagSession, TheClearingSequenceSaysWhetherTheModemAnsweredIt) {
    struct Row {
        const char* what;
        MemoryModem::Reply reply;
        bool unplug;
        bool answered;
    };
    const std::vector<Row> rows = {
        {"a modem that answers", asIs, false, true},
        {"a modem that has gone quiet", [](ByteView, Bytes) { return std::optional<Bytes>(); }, false, false},
        {"a modem unplugged meanwhile", [](ByteView, Bytes) { return std::optional<Bytes>(); }, true, false},
    };
    for (const Row& row : rows) {
        MemoryModem modem(row.reply);
        DiagSession session(&modem);
        std::optional<bool> answered;
        session.clear(400, [&](bool yes) { answered = yes; });
        EXPECT_TRUE(session.isClearing()) << row.what;
        if (row.unplug) modem.unplug();
        ASSERT_TRUE(waitUntil([&] { return answered.has_value(); }, 2000)) << row.what;
        EXPECT_EQ(*answered, row.answered) << row.what;
        EXPECT_FALSE(session.isClearing()) << row.what;
    }
}

TEST(DiagSession, AMaskTheModemRefusesIsReportedWithItsStatusAndTheRestIsEnabled) {
    // Equipment 0xB's set-mask (73 00 00 00, op 3, equipment 0xB) answered with status 2 at offset 8.
    MemoryModem modem([](ByteView request, Bytes answer) -> std::optional<Bytes> {
        if (request.size() >= 12 && request[0] == 0x73 && request[4] == 3 && request[8] == 0xB && answer.size() >= 12)
            answer[8] = 2;
        return answer;
    });
    DiagSession session(&modem);
    bool ready = false;
    QObject::connect(&session, &DiagSession::ready, [&] { ready = true; });
    session.open(std::set<uint16_t>{0xB0C2, 0x4127});
    ASSERT_TRUE(waitUntil([&] { return ready; }, 3000));
    ASSERT_EQ(session.refusals().size(), 1u);
    EXPECT_EQ(session.refusals()[0].code, 0xB0C2);
    EXPECT_EQ(session.refusals()[0].why, "status 2");
    EXPECT_EQ(session.enabledCodes(), std::set<uint16_t>{0x4127});
}

namespace {

const std::set<uint16_t> kServingCells = {0xB0C1, 0xB0C2, 0x4127, 0x5134, 0x119C, 0x1183, 0xD0E2};
const std::set<uint16_t> kLte = {0xB0C1, 0xB0C2, 0xB179, 0xB17F, 0xB180, 0xB186};

std::set<uint16_t> unite(std::set<uint16_t> a, const std::set<uint16_t>& b) {
    a.insert(b.begin(), b.end());
    return a;
}

// The codes of `probe` the modem's mask lets out.
std::set<uint16_t> enabledOn(const MemoryModem& modem, const std::set<uint16_t>& probe) {
    std::set<uint16_t> on;
    for (uint16_t code : probe)
        if (modem.responder().enabled(code)) on.insert(code);
    return on;
}

}  // namespace

// The monitor's start command can reach the service at any moment of the handshake (the
// handshake starts with the service, before any client): whatever the moment, the handshake
// ends with the decoder's codes enabled on the modem.
TEST(DiagSession, CodesGivenAtAnyPointOfTheHandshakeAreOnTheModemWhenItIsReady) {
    struct Row {
        const char* what;
        std::set<uint16_t> atOpen, later;
        size_t requests;  // in the handshake: 6 before the set-masks, one per equipment, the last version
    };
    const std::vector<Row> rows = {
        {"technology learnt from the modem", kServingCells, unite(kServingCells, kLte), 6 + 5 + 1},
        {"technology given: nothing wanted until the client", {}, kLte, 6 + 0 + 1},
    };
    for (const Row& row : rows) {
        for (size_t at = 0; at < row.requests; ++at) {
            SCOPED_TRACE(::testing::Message() << row.what << ", codes given during request " << at);
            MemoryModem modem(asIs);
            DiagSession session(&modem);
            modem.onRequest = [&, at](size_t n) {
                if (n == at)
                    QMetaObject::invokeMethod(&session, [&] { session.setCodes(row.later); }, Qt::QueuedConnection);
            };
            std::optional<std::set<uint16_t>> enabledAtReady;
            QObject::connect(&session, &DiagSession::ready, [&] { enabledAtReady = session.enabledCodes(); });
            session.open(row.atOpen);
            ASSERT_TRUE(waitUntil([&] { return enabledAtReady.has_value(); }, 3000));
            EXPECT_EQ(*enabledAtReady, row.later);
            EXPECT_EQ(enabledOn(modem, unite(kServingCells, kLte)), row.later);
        }
    }
}

// Clients come and go while a set-mask is still waiting for its reply: the modem ends with
// the last codes given, including a return to a mask the modem had before.
TEST(DiagSession, TheModemEndsWithTheLastCodesGivenWhenChangesOverlap) {
    const std::set<uint16_t> gsm = {0x4005, 0x4127, 0x5134, 0x7130};
    struct Row {
        const char* what;
        std::vector<std::set<uint16_t>> changes;  // given back to back, after the handshake
    };
    const std::vector<Row> rows = {
        {"a client leaves and another comes with the same decoder", {kServingCells, unite(kServingCells, kLte)}},
        {"every code off and on again", {{}, unite(kServingCells, kLte)}},
        {"a client comes and leaves at once", {unite(kLte, gsm), kLte}},
        {"three changes", {kServingCells, unite(kServingCells, gsm), unite(kServingCells, kLte)}},
    };
    const std::set<uint16_t> probe = unite(unite(kServingCells, kLte), gsm);
    for (const Row& row : rows) {
        SCOPED_TRACE(row.what);
        MemoryModem modem(asIs);
        DiagSession session(&modem);
        bool ready = false;
        QObject::connect(&session, &DiagSession::ready, [&] { ready = true; });
        session.open(unite(kServingCells, kLte));
        ASSERT_TRUE(waitUntil([&] { return ready; }, 3000));
        for (const auto& codes : row.changes) session.setCodes(codes);
        const std::set<uint16_t>& last = row.changes.back();
        EXPECT_TRUE(waitUntil([&] { return enabledOn(modem, probe) == last && session.enabledCodes() == last; }, 2000))
            << "the modem has " << enabledOn(modem, probe).size() << " of the probed codes on";
    }
}

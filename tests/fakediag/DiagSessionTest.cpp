// Tests for a DIAG session against a modem in memory: the clearing sequence's outcome, and a log mask the modem refuses.
#include "TelephonyService/Device/DiagCommand.h"
#include "TelephonyService/Device/DiagPort.h"
#include "TelephonyService/Device/DiagSession.h"
#include "TelephonyService/Replay/HdlcDeframer.h"
#include "fakediag/DiagResponder.h"
#include "support/EventLoopWait.h"

#include <gtest/gtest.h>

#include <functional>
#include <optional>

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

private:
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

// Fuzz target: what a modem sends on its DIAG port, in pieces, to a session in the middle of its handshake; and the same frames as requests to the fake modem.
#include "FuzzSupport.h"
#include "TelephonyService/Device/DiagCommand.h"
#include "TelephonyService/Device/DiagPort.h"
#include "TelephonyService/Device/DiagSession.h"
#include "TelephonyService/Replay/HdlcDeframer.h"
#include "fakediag/DiagResponder.h"

#include <QCoreApplication>

using namespace vantorel;

namespace {

// A port in memory: what the session writes is kept, what the modem says is fed by hand.
class MemoryPort : public DiagPort {
public:
    MemoryPort() : DiagPort("fuzz") {}
    bool write(ByteView bytes) override {
        written.insert(written.end(), bytes.begin(), bytes.end());
        return true;
    }
    void discardPending() override {}
    void modemSays(ByteView bytes) { emit received(Bytes(bytes.begin(), bytes.end())); }
    Bytes written;
};

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    static int argc = 1;
    static char name[] = "fuzz";
    static char* argv[] = {name, nullptr};
    static QCoreApplication app(argc, argv);
    const ByteView input(data, size);

    MemoryPort port;
    DiagSession session(&port);
    size_t records = 0;
    QObject::connect(&session, &DiagSession::record, [&](const Bytes& record, uint16_t, std::optional<uint32_t>) {
        FUZZ_CHECK(record.size() >= 13 && record[0] == 1);
        ++records;
    });
    session.open(std::set<uint16_t>{0xB0C1, 0xB0C2, 0x4127, 0x7130});
    for (ByteView piece : fuzz::pieces(input)) port.modemSays(piece);
    FUZZ_CHECK(session.counters().logPackets == records);
    FUZZ_CHECK(session.buildId().size() <= DiagCommand::kMaxBuildIdLength);
    // Whatever the modem said, every request the session sent is a whole frame.
    HdlcDeframer requests;
    requests.feed(port.written);
    requests.finish();
    FUZZ_CHECK(requests.counters().badCrc + requests.counters().malformed + requests.counters().truncated == 0);

    // The same frames as a host's requests to the fake modem: always an answer.
    DiagResponder modem;
    HdlcDeframer frames([&](ByteView body, uint64_t) { FUZZ_CHECK(!modem.answer(body).empty()); });
    frames.feed(input);
    return 0;
}

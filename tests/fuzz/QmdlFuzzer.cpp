// Fuzz target: QMDL / mi2log bytes: the HDLC deframer fed in pieces finds what it finds fed whole, and QmdlReader reads them.
#include "FuzzSupport.h"
#include "TelephonyService/Replay/HdlcDeframer.h"
#include "TelephonyService/Replay/QmdlReader.h"

using namespace vantorel;

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    const ByteView input(data, size);
    HdlcDeframer whole, cut;
    whole.feed(input);
    whole.finish();
    for (ByteView piece : fuzz::pieces(input)) cut.feed(piece);
    cut.finish();
    FUZZ_CHECK(whole.takeFrames() == cut.takeFrames());
    const auto &a = whole.counters(), &b = cut.counters();
    FUZZ_CHECK(a.badCrc == b.badCrc && a.malformed == b.malformed && a.truncated == b.truncated);

    const RecordedLog log = QmdlReader::readBytes(input);
    FUZZ_CHECK(log.frames == a.frames && log.logPackets + log.otherPackets <= log.frames);
    fuzz::checkEntries(log);
    return 0;
}

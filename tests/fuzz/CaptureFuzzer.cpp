// Fuzz target: capture-file bytes through CaptureReader: what it reads writes back as the bytes it came from.
#include "FuzzSupport.h"
#include "TelephonyService/Replay/CaptureReader.h"
#include "TelephonyService/Replay/CaptureWriter.h"

#include <algorithm>

using namespace vantorel;

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    const Capture capture = CaptureReader::readBytes(ByteView(data, size));
    (void)capture.report.summary();
    if (!capture.ok()) {
        FUZZ_CHECK(capture.messages.empty());
        return 0;
    }
    // Only a truncated last message is left out: the rest re-encodes to the input.
    Bytes written = CaptureWriter::headerBytes(capture.technology);
    for (const TimedMessage& m : capture.messages) {
        const Bytes message = CaptureWriter::messageBytes(m.timeMicros, m.messageId, m.data);
        written.insert(written.end(), message.begin(), message.end());
    }
    FUZZ_CHECK(written.size() <= size && std::equal(written.begin(), written.end(), data));
    FUZZ_CHECK(capture.report.truncated == (written.size() < size ? 1u : 0u));
    return 0;
}

// Fuzz target: message-port connection bytes through MessagePortFrameDecoder, fed whole and in pieces.
#include "FuzzSupport.h"
#include "Platform/MessagePortFrame.h"

using namespace vantorel;

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    const ByteView input(data, size);
    MessagePortFrameDecoder whole, cut;
    std::vector<MessagePortFrame> frames = whole.feed(input), pieced;
    for (ByteView piece : fuzz::pieces(input))
        for (MessagePortFrame& f : cut.feed(piece)) pieced.push_back(std::move(f));
    // Where the stream is cut must not change what it holds.
    FUZZ_CHECK(whole.error() == cut.error() && whole.buffered() == cut.buffered());
    FUZZ_CHECK(frames.size() == pieced.size());
    size_t used = 0;
    for (size_t i = 0; i < frames.size(); ++i) {
        const Bytes encoded = frames[i].encode();
        FUZZ_CHECK(encoded == pieced[i].encode());
        used += encoded.size();
    }
    FUZZ_CHECK(used + whole.buffered() == (whole.failed() ? used : size));
    return 0;
}

// TerminalText: control characters and broken UTF-8 written as \xNN.
#include "Platform/TerminalText.h"

#include "PropertyList/Utf8.h"

#include <cstdint>

namespace vantorel {

namespace {

void appendEscaped(std::string& out, uint8_t byte) {
    static constexpr char kHex[] = "0123456789abcdef";
    out += "\\x";
    out += kHex[byte >> 4];
    out += kHex[byte & 0xF];
}

}  // namespace

std::string TerminalText::visible(std::string_view text) {
    std::string out;
    out.reserve(text.size());
    for (size_t i = 0; i < text.size();) {
        const auto byte = static_cast<uint8_t>(text[i]);
        if (byte >= 0x20 && byte < 0x7F) {
            out += text[i++];
            continue;
        }
        const size_t length = byte >= 0x80 ? Utf8::sequenceLength(text, i) : 0;
        // U+0080..U+009F (C2 80..C2 9F) are the C1 controls: CSI among them.
        const bool c1 = length == 2 && byte == 0xC2 && static_cast<uint8_t>(text[i + 1]) <= 0x9F;
        if (length == 0 || c1) {
            const size_t n = c1 ? 2 : 1;
            for (size_t k = 0; k < n; ++k) appendEscaped(out, static_cast<uint8_t>(text[i + k]));
            i += n;
            continue;
        }
        out.append(text, i, length);
        i += length;
    }
    return out;
}

}  // namespace vantorel

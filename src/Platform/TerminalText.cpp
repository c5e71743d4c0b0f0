// TerminalText: control characters and broken UTF-8 written as \xNN.
#include "Platform/TerminalText.h"

#include <cstdint>

namespace vantorel {

namespace {

void appendEscaped(std::string& out, uint8_t byte) {
    static constexpr char kHex[] = "0123456789abcdef";
    out += "\\x";
    out += kHex[byte >> 4];
    out += kHex[byte & 0xF];
}

// Length of the valid UTF-8 sequence for a non-ASCII character at text[i], or 0 when
// the bytes there are not one (stray continuation, overlong form, surrogate, past
// U+10FFFF, or cut off by the end of the text).
size_t utf8Length(std::string_view text, size_t i) {
    const auto at = [&](size_t k) { return static_cast<uint8_t>(text[k]); };
    const uint8_t lead = at(i);
    size_t length = 0;
    uint8_t low = 0x80, high = 0xBF;  // allowed range of the second byte
    if (lead >= 0xC2 && lead <= 0xDF) length = 2;
    else if (lead >= 0xE0 && lead <= 0xEF) {
        length = 3;
        if (lead == 0xE0) low = 0xA0;
        if (lead == 0xED) high = 0x9F;
    } else if (lead >= 0xF0 && lead <= 0xF4) {
        length = 4;
        if (lead == 0xF0) low = 0x90;
        if (lead == 0xF4) high = 0x8F;
    } else
        return 0;
    if (i + length > text.size()) return 0;
    if (at(i + 1) < low || at(i + 1) > high) return 0;
    for (size_t k = 2; k < length; ++k)
        if (at(i + k) < 0x80 || at(i + k) > 0xBF) return 0;
    return length;
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
        const size_t length = byte >= 0x80 ? utf8Length(text, i) : 0;
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

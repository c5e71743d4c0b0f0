// Utf8: where a UTF-8 character starts and how long it is, for texts that came from outside.
#pragma once

#include <cstddef>
#include <string_view>

namespace vantorel {

class Utf8 {
public:
    // Length of the well-formed UTF-8 sequence starting at text[i] (1 for ASCII), or 0
    // when the bytes there are not one: a stray continuation byte, an overlong form, a
    // surrogate, a code point past U+10FFFF, or a sequence cut off by the end.
    static size_t sequenceLength(std::string_view text, size_t i);
    static bool isValid(std::string_view text);
};

}  // namespace vantorel

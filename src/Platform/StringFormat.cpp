// StringFormat: snprintf into a std::string (DESIGN.md "Decoding records safely").
#include "Platform/StringFormat.h"

#include <cstdarg>
#include <cstdio>
#include <vector>

namespace vantorel {

std::string StringFormat::format(const char* format, ...) {
    va_list args;
    va_start(args, format);
    std::string out = vformat(format, args);
    va_end(args);
    return out;
}

std::string StringFormat::vformat(const char* format, va_list args) {
    // Display strings are short: one pass into a stack buffer, a second only when
    // the text does not fit.
    char small[256];
    va_list copy;
    va_copy(copy, args);
    int n = std::vsnprintf(small, sizeof small, format, copy);
    va_end(copy);
    if (n <= 0) return std::string();
    if (static_cast<size_t>(n) < sizeof small) return std::string(small, static_cast<size_t>(n));
    std::vector<char> buf(static_cast<size_t>(n) + 1);
    std::vsnprintf(buf.data(), buf.size(), format, args);
    return std::string(buf.data(), static_cast<size_t>(n));
}

}  // namespace vantorel

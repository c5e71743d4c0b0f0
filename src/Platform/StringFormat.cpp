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
    va_list copy;
    va_copy(copy, args);
    int n = std::vsnprintf(nullptr, 0, format, copy);
    va_end(copy);
    std::string out;
    if (n > 0) {
        std::vector<char> buf(static_cast<size_t>(n) + 1);
        std::vsnprintf(buf.data(), buf.size(), format, args);
        out.assign(buf.data(), static_cast<size_t>(n));
    }
    return out;
}

}  // namespace vantorel

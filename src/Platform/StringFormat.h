// StringFormat: printf-style display strings ("%d", "%d dBm", "%+.2f dB", ...) made at decode time (DESIGN.md "Decoding records safely").
#pragma once

#include <cstdarg>
#include <string>

namespace vantorel {

class StringFormat {
public:
    static std::string format(const char* format, ...) __attribute__((format(printf, 1, 2)));
    static std::string vformat(const char* format, va_list args);
};

}  // namespace vantorel

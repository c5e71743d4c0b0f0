// StringFormat: printf-style display strings ("%d", "%d dBm", "%+.2f dB", ...) made at decode time, the same bytes in every locale.
#pragma once

#include <cstdarg>
#include <string>

namespace vantorel {

// Formats always in the "C" locale: a user whose LC_NUMERIC writes a decimal comma
// (QCoreApplication adopts the environment's locale at start-up) still sees
// "0.500000", and log lines, JSON and snapshots keep one spelling of every number.
class StringFormat {
public:
    static std::string format(const char* format, ...) __attribute__((format(printf, 1, 2)));
    static std::string vformat(const char* format, va_list args);
};

}  // namespace vantorel

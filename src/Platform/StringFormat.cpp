// StringFormat: snprintf into a std::string under the "C" locale.
#include "Platform/StringFormat.h"

#include <clocale>
#include <cstdio>
#include <locale.h>
#include <vector>

namespace vantorel {

namespace {

// The thread's locale switched to "C" for one formatting call. uselocale() affects only
// the calling thread, so the service thread and the UI thread never see each other's switch.
class CLocaleScope {
public:
    CLocaleScope() : previous_(cLocale() ? uselocale(cLocale()) : static_cast<locale_t>(nullptr)) {}
    ~CLocaleScope() {
        if (previous_) uselocale(previous_);
    }
    CLocaleScope(const CLocaleScope&) = delete;
    CLocaleScope& operator=(const CLocaleScope&) = delete;

private:
    static locale_t cLocale() {
        static const locale_t c = newlocale(LC_ALL_MASK, "C", static_cast<locale_t>(nullptr));
        return c;
    }
    locale_t previous_;
};

}  // namespace

std::string StringFormat::format(const char* format, ...) {
    va_list args;
    va_start(args, format);
    std::string out = vformat(format, args);
    va_end(args);
    return out;
}

std::string StringFormat::vformat(const char* format, va_list args) {
    const CLocaleScope cLocale;
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

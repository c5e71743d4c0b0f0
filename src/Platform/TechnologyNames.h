// TechnologyNames: the short names users type for the five technology identifiers (ifx, gsm, cdma, lte, utran).
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace vantorel {

class TechnologyNames {
public:
    // "utran" (any case) or the full identifier → the identifier; empty when unknown.
    static std::optional<std::string> identifierFor(const std::string& nameOrIdentifier);
    // The identifier's short name ("utran"); the identifier itself when unknown.
    static std::string shortName(const std::string& identifier);
    // "ifx, gsm, cdma, lte, utran" for help texts and error messages.
    static std::string listing();
    // The name an engineer reads ("LTE", "UTRAN (TD-SCDMA)", "GSM/UMTS", "CDMA2000",
    // "GSM (IFX)"); the identifier itself when unknown.
    static std::string displayName(const std::string& identifier);
    // The technology whose decoder reads an ordinary record of this log code, by the
    // modem's code ranges (0x1xxx CDMA, 0x4xxx/0x5xxx/0x7xxx GSM/UMTS, 0xBxxx LTE, 0xDxxx
    // UTRAN); empty for a code of none of them.
    static std::optional<std::string> identifierForLogCode(int32_t code);
};

}  // namespace vantorel

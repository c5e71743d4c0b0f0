// TechnologyNames: the short names users type for the five technology identifiers (ifx, gsm, cdma, lte, utran).
#pragma once

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
};

}  // namespace vantorel

// TechnologyNames: short names for the telephony service's technology identifiers.
#include "Platform/TechnologyNames.h"

#include "Platform/TelephonyIdentifiers.h"

#include <algorithm>
#include <cctype>

namespace vantorel {

namespace {
struct Row {
    const char* name;
    const char* identifier;
};
const Row kRows[] = {
    {"ifx", kTSLogChannelTechnology_IFX},
    {"gsm", kTSLogChannelTechnology_Morvek_GSM},
    {"cdma", kTSLogChannelTechnology_Morvek_CDMA},
    {"lte", kTSLogChannelTechnology_Morvek_LTE},
    {"utran", kTSLogChannelTechnology_Morvek_UTRAN2},
};
}  // namespace

std::optional<std::string> TechnologyNames::identifierFor(const std::string& nameOrIdentifier) {
    std::string lower = nameOrIdentifier;
    std::transform(lower.begin(), lower.end(), lower.begin(), [](unsigned char c) { return std::tolower(c); });
    for (const Row& row : kRows)
        if (lower == row.name || nameOrIdentifier == row.identifier) return std::string(row.identifier);
    return std::nullopt;
}

std::string TechnologyNames::shortName(const std::string& identifier) {
    for (const Row& row : kRows)
        if (identifier == row.identifier) return row.name;
    return identifier;
}

std::string TechnologyNames::listing() {
    std::string out;
    for (const Row& row : kRows) out += (out.empty() ? "" : ", ") + std::string(row.name);
    return out;
}

}  // namespace vantorel

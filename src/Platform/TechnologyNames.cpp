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
    const char* displayName;
};
const Row kRows[] = {
    {"ifx", kTSLogChannelTechnology_IFX, "GSM (IFX)"},
    {"gsm", kTSLogChannelTechnology_Morvek_GSM, "GSM/UMTS"},
    {"cdma", kTSLogChannelTechnology_Morvek_CDMA, "CDMA2000"},
    {"lte", kTSLogChannelTechnology_Morvek_LTE, "LTE"},
    {"utran", kTSLogChannelTechnology_Morvek_UTRAN2, "UTRAN (TD-SCDMA)"},
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

std::string TechnologyNames::displayName(const std::string& identifier) {
    for (const Row& row : kRows)
        if (identifier == row.identifier) return row.displayName;
    return identifier;
}

std::optional<std::string> TechnologyNames::identifierForLogCode(int32_t code) {
    // The diagnostic log code's top nibble is its equipment (subsystem) ID.
    switch ((code >> 12) & 0xF) {
        case 0x1: return std::string(kTSLogChannelTechnology_Morvek_CDMA);
        case 0x4:
        case 0x5:
        case 0x7: return std::string(kTSLogChannelTechnology_Morvek_GSM);
        case 0xB: return std::string(kTSLogChannelTechnology_Morvek_LTE);
        case 0xD: return std::string(kTSLogChannelTechnology_Morvek_UTRAN2);
        default: return std::nullopt;
    }
}

}  // namespace vantorel

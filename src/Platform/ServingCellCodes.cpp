// ServingCellCodes: the table of serving-cell log codes and their technologies.
#include "Platform/ServingCellCodes.h"

#include "Platform/LogCodes.h"
#include "Platform/TechnologyNames.h"

#include <map>

namespace vantorel {

namespace {

const std::map<uint16_t, const char*>& table() {
    static const std::map<uint16_t, const char*> codes{
        {LogCode::kLTEMasterInfoBlock, "lte"},     {LogCode::kLTEServingCellInfo, "lte"},
        {LogCode::kUMTSCellIdentity, "gsm"},       {LogCode::kGSMServingCellIdentity, "gsm"},
        {LogCode::kC2K1xStatus, "cdma"},           {LogCode::kC2KHDRStatus, "cdma"},
        {LogCode::kUTRANServingCell, "utran"},
    };
    return codes;
}

}  // namespace

std::string ServingCellCodes::technologyOf(uint16_t code) {
    const auto it = table().find(code);
    return it == table().end() ? std::string() : TechnologyNames::identifierFor(it->second).value_or("");
}

const std::set<uint16_t>& ServingCellCodes::codes() {
    static const std::set<uint16_t> all = [] {
        std::set<uint16_t> set;
        for (const auto& entry : table()) set.insert(entry.first);
        return set;
    }();
    return all;
}

}  // namespace vantorel

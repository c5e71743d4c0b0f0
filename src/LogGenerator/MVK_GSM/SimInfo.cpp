// SimInfo: the "SIM Info" section: selected SIM elementary files from the 0xFF0000 extra record, stored as delivered.
#include "LogGenerator/MVK_GSM/SimInfo.h"

#include "Platform/LogCodes.h"
#include "Platform/SystemLog.h"
#include "PropertyList/Dictionary.h"

namespace vantorel {

namespace {

struct SimFile {
    const char* simFileKey;
    const char* displayKey;
};

// In the order of lookup (and so the order a fresh dictionary keeps).
const SimFile kSimFileTable[] = {
    {"kSimFile_ICCID", "EF-ICCID"},
    {"kSimFile_MSISDN", "EF-MSISDN"},
    {"kSimFile_MBDN", "EF-3GPP MAIL BOX DIALING NUMBER"},
    {"kSimFile_HPPLMN", "EF-HPPLMN SEARCH PERIOD"},
    {"kSimFile_LOCI", "EF-LOCI"},
    {"kSimFile_PSLOCI", "EF-GPRS/PS-LOCI"},
    {"kSimFile_ACC", "EF-ACCESS CONTROL CLASS"},
    {"kSimFile_AD", "EF-ADMINISTRATIVE DATA"},
    {"kSimFile_FPLMN", "EF-FPLMN"},
    {"kSimFile_AHPLMN", "EF-ACTING HPLMN"},
    {"kSimFile_RATMODE", "EF-RAT MODE"},
    {"kSimFile_PNN", "EF-PLMN NETWORK NAME"},
    {"kSimFile_OPL", "EF-OPERATOR PLMN LIST"},
    {"kSimFile_OPLMNAcT", "EF-OPLMNAcT"},
};

}  // namespace

std::string SimInfo::getSectionName() const { return "SIM Info"; }

std::vector<int32_t> SimInfo::getLogCodeArray() const { return {LogCode::kSimFiles}; }

void SimInfo::updateWithData(ByteView data, int32_t logCode) {
    SystemLog::log(SystemLog::kWarning, "%s", "SimInfo");
    if (logCode != LogCode::kSimFiles) {
        logUnknownCode(logCode);
        return;
    }
    // Payload: offset 13 to the end, a property list whose root is a dictionary keyed by
    // SIM-file name.
    const PropertyListResult parsed = parseExtraPayload(data);
    if (!parsed) {
        SystemLog::log(SystemLog::kError, "%s", "SIM File dictionary data could not be constructed");
        throw SectionError("SIM File dictionary data could not be constructed");
    }
    // Any root other than a dictionary has no SIM files to show.
    const DictionaryRef files = parsed.value->asDictionary();
    const DictionaryRef section = sectionDictionary();
    if (!files || !section) return;
    // Values are stored as delivered, whatever their property-list type; absent files
    // keep their display key as it was.
    for (const SimFile& row : kSimFileTable) {
        if (const Value* v = files->find(row.simFileKey)) section->set(row.displayKey, *v);
    }
}

}  // namespace vantorel

// LogGenerator: the abstract decoder, its snapshot history and the choice of decoder by technology.
#include "LogGenerator/LogGenerator.h"

#include "LogGenerator/C2K/C2KLogGenerator.h"
#include "LogGenerator/GSM/GSMLogGenerator.h"
#include "LogGenerator/LTE/LTELogGenerator.h"
#include "LogGenerator/MVK_GSM/MVK_GSMLogGenerator.h"
#include "LogGenerator/UTRAN/UTRANLogGenerator.h"
#include "Platform/DateDescription.h"
#include "Platform/ProgrammingError.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"
#include "Platform/TelephonyIdentifiers.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"

namespace vantorel {

LogGenerator::LogGenerator() {
    SystemLog::log(SystemLog::kWarning, "Creating Log object: %p", static_cast<void*>(this));
}

LogGenerator::~LogGenerator() = default;

void LogGenerator::updateState(Dictionary&, ByteView) {
    ProgrammingError::unrecognisedOperation("LogGenerator", "updateState:withData:", this);
}

DictionaryRef LogGenerator::generateLogUsingState(Dictionary&) {
    ProgrammingError::unrecognisedOperation("LogGenerator", "generateLogUsingState:", this);
}

DictionaryRef LogGenerator::getStartCommand() {
    ProgrammingError::unrecognisedOperation("LogGenerator", "getStartCommand", this);
}

Value LogGenerator::getSaveContentsFromState(Dictionary&) {
    ProgrammingError::unrecognisedOperation("LogGenerator", "getSaveContentsFromState:", this);
}

void LogGenerator::forgetDisplay(Dictionary& state) {
    state.remove("Display");
    state.remove("Template");
    state.remove("ExtraInfo");
    state.remove("Lookup");  // the CDMA decoder's bindings into its display
}

void LogGenerator::updateHistoryInState(Dictionary& state) {
    ArrayRef history = state.get("History").asArray();
    if (history) {
        if (history->size() >= 5) history->removeRange(0, history->size() - 4);
    } else {
        history = Array::create();
        state.set("History", Value(history));
    }

    // The entry is built from these pairs in order and stops at the first absent
    // value (deliberate: no "DisplayState" gives an empty entry, and the history
    // still counts it).
    auto entry = Dictionary::create();
    const std::string date = DateDescription::now();
    const std::string description = StringFormat::format("Snapshot (%s)", DateDescription::now().c_str());
    const std::pair<const char*, Value> pairs[] = {
        {"DisplayState", state.get("DisplayState").deepCopy()},
        {"Display", state.get("Display").deepCopy()},
        {"ExtraInfo", state.get("ExtraInfo").deepCopy()},
        {"Date", Value(date)},
        {"Description", Value(description)},
    };
    for (const auto& [key, value] : pairs) {
        if (value.isNull()) break;
        entry->set(key, value);
    }
    history->append(Value(entry));
}

namespace {

using Factory = std::unique_ptr<LogGenerator> (*)();

struct TechnologyRow {
    const char* identifier;
    Factory generator;
};

// Channel technology to decoder, compared by value, first match wins.
const TechnologyRow kTechnologies[] = {
    {kTSLogChannelTechnology_IFX, &GSMLogGenerator::generator},
    {kTSLogChannelTechnology_Morvek_GSM, &MVK_GSMLogGenerator::generator},
    {kTSLogChannelTechnology_Morvek_CDMA, &C2KLogGenerator::generator},
    {kTSLogChannelTechnology_Morvek_LTE, &LTELogGenerator::generator},
    {kTSLogChannelTechnology_Morvek_UTRAN2, &UTRANLogGenerator::generator},
};

}  // namespace

std::unique_ptr<LogGenerator> LogGenerator::generatorFromTechnology(const std::string& technology) {
    for (const auto& row : kTechnologies) {
        if (technology != row.identifier) continue;
        // A decoder that could not set itself up (no display template resource) is
        // unusable: the model gets none, as for an unknown identifier.
        std::unique_ptr<LogGenerator> generator = row.generator();
        if (!generator || !generator->isUsable()) return nullptr;
        return generator;
    }
    return nullptr;
}

}  // namespace vantorel

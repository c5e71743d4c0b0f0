// MVKLogGenerator: the snapshot contents and the DLF log file of the Morvek-channel decoders.
#include "LogGenerator/MVKLogGenerator.h"

#include "BuildInfo.h"
#include "LogGenerator/DLFAddVersionReport.h"
#include "Platform/DateDescription.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"

#include <chrono>

namespace vantorel {

MVKLogGenerator::MVKLogGenerator() = default;
MVKLogGenerator::~MVKLogGenerator() = default;

std::string MVKLogGenerator::versionText() {
    const std::string version = VANTOREL_BUILD_VERSION;
    return version.empty() ? "(none)" : StringFormat::format("Vantorel %s", version.c_str());
}

const char* MVKLogGenerator::buildDateText() { return VANTOREL_BUILD_DATE; }

std::optional<Bytes> MVKLogGenerator::generateDlfFromState(Dictionary& state) {
    Bytes dlf(kDLFVersionReportLength, 0);
    const auto now = std::chrono::system_clock::now();
    const auto seconds = std::chrono::duration_cast<std::chrono::seconds>(now.time_since_epoch()).count();
    const auto zoneMinutes = static_cast<int16_t>(DateDescription::utcOffsetSeconds(now) / 60);
    const int16_t daylight = DateDescription::isDaylightSaving(now) ? 1 : 0;
    unsigned written = 0;
    const std::string version = versionText();
    int result = DLFAddVersionReport(dlf.data(), kDLFVersionReportLength, &written, 1, 1, version.c_str(),
                                     "EXECUTABLE_NAME", buildDateText(), static_cast<uint32_t>(seconds),
                                     zoneMinutes, daylight);
    if (result != 0) {
        SystemLog::log(SystemLog::kDlf, "Could not write DLF header (result=%d)", result);
        return std::nullopt;
    }

    if (ArrayRef history = state.get("History").asArray()) {
        for (const Value& entry : *history) {
            DictionaryRef e = entry.asDictionary();
            const Value* displayState = e ? e->find("DisplayState") : nullptr;
            if (!displayState) continue;
            const Bytes* bytes = displayState->asData();
            if (!bytes) {
                SystemLog::log(SystemLog::kDlf,
                               "Got wrong class writing history to DLF; aborting writing the DLF file");
                return std::nullopt;
            }
            // Only the first byte of each buffer is dropped, however many records it
            // holds: deliberate, so our DLFs keep the byte layout of the ones saved before.
            if (bytes->size() >= 2) dlf.insert(dlf.end(), bytes->begin() + 1, bytes->end());
        }
    }
    return dlf;
}

Value MVKLogGenerator::getSaveContentsFromState(Dictionary& state) {
    auto contents = Array::create();
    if (ArrayRef history = state.get("History").asArray())
        for (const Value& entry : *history) contents->append(entry);
    std::optional<Bytes> dlf = generateDlfFromState(state);
    if (!dlf) return Value(contents);
    auto entry = Dictionary::create();
    entry->set("Description", StringFormat::format("DLF binary (%d bytes)", static_cast<int>(dlf->size())));
    entry->set("DLF", Value::data(std::move(*dlf)));
    contents->append(Value(entry));
    return Value(contents);
}

}  // namespace vantorel

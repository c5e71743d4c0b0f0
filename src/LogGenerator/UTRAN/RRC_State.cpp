// RRC_State: the "RRC Info" section: the RRC mode of record 0xD0E0 as a text under "State".
#include "LogGenerator/UTRAN/RRC_State.h"

#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"
#include "PropertyList/Dictionary.h"

namespace vantorel {

namespace {

// Record 0xD0E0 (offsets from the record's first byte):
//   13  validity flag: the mode counts only when it is 1
//   14  RRC mode (index into kRRCModes)
constexpr size_t kValidOffset = 13;
constexpr size_t kModeOffset = 14;
constexpr size_t kExpectedLength = 15;
constexpr unsigned kNotValidMode = 255;

static const char* const kRRCModes[] = {
    "Disconnected",  // 0
    "Connecting",    // 1
    "Cell Fach",     // 2
    "Cell DCH",      // 3
    "Cell PCH",      // 4
    "Cell URA PCH",  // 5
};

// A short description of the section dictionary for the console line: its keys and
// values in braces ("{State = Cell Fach}"), "(null)" when the section is unbound.
std::string describe(const DictionaryRef& dict) {
    if (!dict) return "(null)";
    std::string text = "{";
    bool first = true;
    for (const auto& [key, value] : *dict) {
        if (!first) text += "; ";
        first = false;
        text += key + " = ";
        if (const std::string* s = value.asString())
            text += *s;
        else
            text += std::string("<") + value.typeName() + ">";
    }
    return text + "}";
}

}  // namespace

std::string RRC_State::getSectionName() const { return "RRC Info"; }

std::vector<int32_t> RRC_State::getLogCodeArray() const { return {LogCode::kUTRANRRCState}; }

void RRC_State::updateWithData(ByteView data, int32_t logCode) {
    SystemLog::log(SystemLog::kWarning, "%s", "RRC Info");
    if (logCode != LogCode::kUTRANRRCState) return;

    const ByteReader reader(data);
    // A short record is reported, then decoded all the same.
    if (reader.size() < kExpectedLength)
        SystemLog::log(SystemLog::kWarning, "LogCode_0xD0E0 is length is %ld expected size %ld",
                       static_cast<long>(reader.size()), static_cast<long>(kExpectedLength));

    // Bytes 13 and 14 may lie past the end of a short record; nothing is read outside
    // it. A missing byte 13 counts as "not valid" (mode 255); a missing byte 14 with
    // byte 13 == 1 also gives 255. Either way the text is "Unknown RRC Mode", as for
    // any mode outside the table.
    unsigned mode = kNotValidMode;
    if (reader.u8(kValidOffset) == uint8_t{1}) mode = reader.u8(kModeOffset).value_or(kNotValidMode);

    const char* text = tableText(kRRCModes, mode, "Unknown RRC Mode");
    setValue("State", text);
    SystemLog::log(SystemLog::kConsole, "Display Dict = %s, rrc mode = %d %s", describe(sectionDictionary()).c_str(),
                   static_cast<int>(mode), text);
}

}  // namespace vantorel

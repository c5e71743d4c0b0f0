// Tests the emulator's UTRAN scenario (src/TelephonyService/Emulator) fed to UTRANLogGenerator (Part 7.1): every section of the UTRAN display gets values, and the malformed records are shrugged off.
#include "LogGenerator/UTRAN/UTRANLogGenerator.h"

#include "Platform/SystemLog.h"
#include "Platform/SystemLogCapture.h"
#include "Platform/TelephonyIdentifiers.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"
#include "TelephonyService/Emulator/UTRANScenario.h"

#include <gtest/gtest.h>

#include <map>

using namespace vantorel;

namespace {

DictionaryRef group(const DictionaryRef& display, const char* key) { return display->get(key).asDictionary(); }

}  // namespace

TEST(UTRANScenarioStream, TheEmulatorsUTRANStreamFillsEverySectionOfTheTemplate) {
    UTRANScenario scenario(1);
    auto generator = LogGenerator::generatorFromTechnology(scenario.technology());
    ASSERT_TRUE(generator);
    Dictionary state;
    SystemLogCapture capture;

    // What each section showed at some display tick (every 4 ticks = 2.0 s at 500 ms).
    std::map<std::string, bool> filled;
    for (uint64_t tick = 0; tick < 200; ++tick) {
        for (const Bytes& message : scenario.recordsForTick(tick)) generator->updateState(state, message);
        if (tick % 4 != 3) continue;
        DictionaryRef display = generator->generateLogUsingState(state);
        if (!display) continue;
        DictionaryRef serving = group(display, "1;Serving Cell");
        if (*serving->get("RRC Info").asDictionary()->get("State").asString() != "-") filled["RRC Info"] = true;
        bool allServing = true;
        for (const auto& [key, value] : *serving->get("Serving Cell Info").asDictionary())
            allServing = allServing && *value.asString() != "-";
        if (allServing) filled["Serving Cell Info"] = true;
        if (!group(display, "2;Neighbours")->get("Neighbor Cell List").asArray()->empty()) filled["Neighbor Cell List"] = true;
        if (!group(display, "2;Neighbours")->get("GSM Neighbor Cell List").asArray()->empty())
            filled["GSM Neighbor Cell List"] = true;
        if (!group(display, "3;Link Quality")->get("TRCH BLER").asArray()->empty()) filled["TRCH BLER"] = true;
        if (!group(display, "3;Link Quality")->get("CCTRCH SIR").asArray()->empty()) filled["CCTRCH SIR"] = true;
        if (!group(display, "4;Packet Data")->get("PDP Context Info").asArray()->empty()) filled["PDP Context Info"] = true;
        if (group(display, "5;SIM")->get("SIM Info").asDictionary()->contains("EF-ICCID")) filled["SIM Info"] = true;
    }
    for (const char* section : {"RRC Info", "Serving Cell Info", "Neighbor Cell List", "TRCH BLER", "CCTRCH SIR",
                                "PDP Context Info", "SIM Info"})
        EXPECT_TRUE(filled[section]) << section;
    // The GSM list is cleared, never filled (Part 7.2, required as stated).
    EXPECT_FALSE(filled["GSM Neighbor Cell List"]);
    EXPECT_TRUE(capture.containsText("GSM Neighbor Cell List"));

    // The malformed records were met and shrugged off.
    EXPECT_TRUE(capture.contains(SystemLog::kError, "Invalid log type: 2. Dropping."));
    EXPECT_TRUE(capture.contains(SystemLog::kError, "SIM File dictionary data could not be constructed"));
    EXPECT_EQ(state.get("History").asArray()->size(), 5u);
}

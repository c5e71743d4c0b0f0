// C2KLogGenerator: the CDMA2000 decoder: a display template whose leaves name lookup keys, and a dispatcher that routes each 1x/EV-DO record to its routine.
#pragma once

#include "LogGenerator/MVKLogGenerator.h"

#include <memory>

namespace vantorel {

// Unlike the section-based decoders, this one has no class index: the template
// ("C2KTemplate.plist") is copied into the display with every string leaf replaced by ""
// and registered in the lookup under the lookup key it named ("kChannel", ...); the eight
// routines of C2KHDRDecoders and C2K1xDecoders deliver their values through the lookup.
class C2KLogGenerator : public MVKLogGenerator {
public:
    static std::unique_ptr<LogGenerator> generator();
    ~C2KLogGenerator() override;

    // Builds the display on the first call, then routes the record.
    void updateState(Dictionary& state, ByteView withData) override;
    // The display, with the raw records since the last call handed to the history.
    DictionaryRef generateLogUsingState(Dictionary& state) override;
    // {"SetState": "Streaming", "SetMorvekLogCodes": the eight codes}.
    DictionaryRef getStartCommand() override;

    // Copies template into display: a dictionary becomes a nested display dictionary, the
    // string "_sorted" is copied, any other string becomes "" bound in lookup to the lookup
    // key it names (several places may share one key), anything else is left out.
    static void processTemplate(const Dictionary& templateDict, const DictionaryRef& display, Dictionary& lookup);
    // The state's display, built from the template on first use ("Template", "Display",
    // "Lookup", "ExtraInfo"); null when the template cannot be loaded (retried every call).
    static DictionaryRef getDisplayFromState(Dictionary& state);
    // The dispatcher: framing, then one of the eight routines; records of those codes are
    // kept for the DLF.
    void updateFromLog(ByteView data, const DictionaryRef& lookup, Dictionary& state);

private:
    C2KLogGenerator() = default;
};

}  // namespace vantorel

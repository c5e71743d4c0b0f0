// MVKLogGenerator: base of the Morvek-channel decoders: the raw-record buffer, the DLF writer and the snapshot contents.
#pragma once

#include "LogGenerator/LogGenerator.h"

#include <optional>

namespace vantorel {

class MVKLogGenerator : public LogGenerator {
public:
    MVKLogGenerator();
    ~MVKLogGenerator() override;

    // The DLF: the version report, then each history entry's "DisplayState" bytes
    // without their first byte. Empty on failure (logged at priority 16).
    std::optional<Bytes> generateDlfFromState(Dictionary& state);
    // The history's entries, then {"Description": "DLF binary (%d bytes)", "DLF": bytes}.
    Value getSaveContentsFromState(Dictionary& state) override;

    // The texts the snapshot writer passes (fixed at build time).
    static std::string versionText();  // "Vantorel %@" with the build version, or "(none)"
    static const char* buildDateText();

protected:
    // The raw records received since the last display generation.
    Bytes _binData;
};

}  // namespace vantorel

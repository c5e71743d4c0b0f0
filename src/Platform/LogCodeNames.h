// LogCodeNames: the name an engineer reads for each log code the decoders know (LogCodes.h).
#pragma once

#include <cstdint>
#include <string>

namespace vantorel {

class LogCodeNames {
public:
    // "LTE RRC serving cell info" for LogCode::kLTEServingCellInfo; empty for a code
    // no decoder reads.
    static std::string nameOf(int32_t code);
};

}  // namespace vantorel

// LTELogGenerator: the LTE decoder's template and class index, and its creation and teardown log lines.
#include "LogGenerator/LTE/LTELogGenerator.h"

#include "LogGenerator/LTE/LTEClassIndex.h"
#include "Platform/SystemLog.h"

namespace vantorel {

std::unique_ptr<LogGenerator> LTELogGenerator::generator() {
    // Said before the class index and its sections exist, as the decoder starts.
    SystemLog::log(SystemLog::kError, "%s", "Creating LTELogGenerator object");
    return std::unique_ptr<LogGenerator>(new LTELogGenerator());
}

LTELogGenerator::LTELogGenerator() : MVKLogGenerator2("LTE", std::make_unique<LTEClassIndex>()) {}

LTELogGenerator::~LTELogGenerator() {
    SystemLog::log(SystemLog::kWarning, "LTELogGenerator is destructed %p", static_cast<const void*>(this));
}

}  // namespace vantorel

// MVK_GSMLogGenerator: the GSM/UMTS decoder's template and class index, and its creation and teardown log lines.
#include "LogGenerator/MVK_GSM/MVK_GSMLogGenerator.h"

#include "LogGenerator/MVK_GSM/MVK_GSMClassIndex.h"
#include "Platform/SystemLog.h"

namespace vantorel {

std::unique_ptr<LogGenerator> MVK_GSMLogGenerator::generator() {
    // Said before the class index and its sections exist, as the decoder starts.
    SystemLog::log(SystemLog::kError, "%s", "Creating MVK_GSMLogGenerator object");
    return std::unique_ptr<LogGenerator>(new MVK_GSMLogGenerator());
}

MVK_GSMLogGenerator::MVK_GSMLogGenerator() : MVKLogGenerator2("MVK_GSM", std::make_unique<MVK_GSMClassIndex>()) {}

MVK_GSMLogGenerator::~MVK_GSMLogGenerator() {
    SystemLog::log(SystemLog::kWarning, "MVK_GSMLogGenerator is destructed %p", static_cast<const void*>(this));
}

}  // namespace vantorel

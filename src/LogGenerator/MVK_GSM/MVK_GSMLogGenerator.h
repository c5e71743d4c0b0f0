// MVK_GSMLogGenerator: the GSM/UMTS decoder: the template-driven generator on the "MVK_GSM" template with MVK_GSMClassIndex.
#pragma once

#include "LogGenerator/MVKLogGenerator2.h"

#include <memory>

namespace vantorel {

class MVK_GSMLogGenerator : public MVKLogGenerator2 {
public:
    // A new GSM/UMTS decoder on the "MVK_GSM.plist" template resource.
    static std::unique_ptr<LogGenerator> generator();
    ~MVK_GSMLogGenerator() override;

private:
    MVK_GSMLogGenerator();
};

}  // namespace vantorel

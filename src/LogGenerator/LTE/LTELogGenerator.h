// LTELogGenerator: the LTE decoder: the template-driven generator on the "LTE" template with LTEClassIndex.
#pragma once

#include "LogGenerator/MVKLogGenerator2.h"

#include <memory>

namespace vantorel {

class LTELogGenerator : public MVKLogGenerator2 {
public:
    // A new LTE decoder on the "LTE.plist" template resource.
    static std::unique_ptr<LogGenerator> generator();
    ~LTELogGenerator() override;

private:
    LTELogGenerator();
};

}  // namespace vantorel

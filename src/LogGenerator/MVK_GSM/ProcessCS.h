// ProcessCS: the "Process CS" section (circuit-switched MM state, sub-state, update status and service state).
#pragma once

#include "LogGenerator/Base.h"

namespace vantorel {

class ProcessCS : public Base {
public:
    std::string getSectionName() const override;
    std::vector<int32_t> getLogCodeArray() const override;
    void updateWithData(ByteView data, int32_t logCode) override;

    // The MM state and service-state tables, shared with ProcessCO and ProcessPS
    // (same tables, same keys); "Unknown" outside them and in the MM state gaps.
    static const char* mmStateText(unsigned value);
    static const char* serviceStateText(unsigned value);
};

}  // namespace vantorel

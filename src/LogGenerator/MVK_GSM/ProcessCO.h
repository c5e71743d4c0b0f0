// ProcessCO: the "Process CO" section (MM state and service state only).
#pragma once

#include "LogGenerator/Base.h"

namespace vantorel {

class ProcessCO : public Base {
public:
    std::string getSectionName() const override;
    std::vector<int32_t> getLogCodeArray() const override;
    void updateWithData(ByteView data, int32_t logCode) override;
};

}  // namespace vantorel

// ProcessPS: the "Process PS" section (packet-switched GMM state, sub-state, update status and service state).
#pragma once

#include "LogGenerator/Base.h"

namespace vantorel {

class ProcessPS : public Base {
public:
    std::string getSectionName() const override;
    std::vector<int32_t> getLogCodeArray() const override;
    void updateWithData(ByteView data, int32_t logCode) override;
};

}  // namespace vantorel

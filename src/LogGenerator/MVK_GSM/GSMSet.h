// GSMSet: the "GSM Set" section: the ranked GSM cells of the reselection-ranking record 0x4005.
#pragma once

#include "LogGenerator/Base.h"

namespace vantorel {

class GSMSet : public Base {
public:
    std::string getSectionName() const override;
    std::vector<int32_t> getLogCodeArray() const override;
    void updateWithData(ByteView data, int32_t logCode) override;
};

}  // namespace vantorel

// GSMRRInfo: the "GSM RR Info" section: RR state, serving level and quality, DRX and DTX use.
#pragma once

#include "LogGenerator/Base.h"

namespace vantorel {

class GSMRRInfo : public Base {
public:
    std::string getSectionName() const override;
    std::vector<int32_t> getLogCodeArray() const override;
    void updateWithData(ByteView data, int32_t logCode) override;
};

}  // namespace vantorel

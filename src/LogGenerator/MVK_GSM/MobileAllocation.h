// MobileAllocation: the "Mobile Allocation" section: hopping sequence number and the ARFCN list of the GSM frequency-hopping allocation (0x51F8).
#pragma once

#include "LogGenerator/Base.h"

namespace vantorel {

class MobileAllocation : public Base {
public:
    std::string getSectionName() const override;
    std::vector<int32_t> getLogCodeArray() const override;
    void updateWithData(ByteView data, int32_t logCode) override;
};

}  // namespace vantorel

// CCTRCHSIRMeasurement: the "CCTRCH SIR" list section (record 0xD00C, CCTRCH entries with six SIR values).
#pragma once

#include "LogGenerator/Base.h"

namespace vantorel {

class CCTRCHSIRMeasurement : public Base {
public:
    std::string getSectionName() const override;
    std::vector<int32_t> getLogCodeArray() const override;
    void updateWithData(ByteView data, int32_t logCode) override;
};

}  // namespace vantorel

// GPRSInformation: the "GPRS Information" section: GPRS cell options, general parameters, PBCCH and packet system information, network operating mode.
#pragma once

#include "LogGenerator/Base.h"

namespace vantorel {

class GPRSInformation : public Base {
public:
    std::string getSectionName() const override;
    std::vector<int32_t> getLogCodeArray() const override;
    void updateWithData(ByteView data, int32_t logCode) override;
};

}  // namespace vantorel

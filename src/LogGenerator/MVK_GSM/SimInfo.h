// SimInfo: the "SIM Info" section (SIM elementary files of the 0xFF0000 extra record).
#pragma once

#include "LogGenerator/Base.h"

namespace vantorel {

class SimInfo : public Base {
public:
    std::string getSectionName() const override;
    std::vector<int32_t> getLogCodeArray() const override;
    void updateWithData(ByteView data, int32_t logCode) override;
};

}  // namespace vantorel

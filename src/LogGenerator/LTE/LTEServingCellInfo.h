// LTEServingCellInfo: the "Serving Cell Info" section (records 0xB0C2 and 0xB0C1, the cell-monitor extra record 0xFF0001).
#pragma once

#include "LogGenerator/Base.h"

namespace vantorel {

class LTEServingCellInfo : public Base {
public:
    std::string getSectionName() const override;
    std::vector<int32_t> getLogCodeArray() const override;
    void updateWithData(ByteView data, int32_t logCode) override;
};

}  // namespace vantorel

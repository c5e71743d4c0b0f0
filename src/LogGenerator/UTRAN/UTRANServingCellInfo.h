// UTRANServingCellInfo: the "Serving Cell Info" section (record 0xD0E2 and the cell-monitor extra record 0xFF0001).
#pragma once

#include "LogGenerator/Base.h"

namespace vantorel {

class UTRANServingCellInfo : public Base {
public:
    std::string getSectionName() const override;
    std::vector<int32_t> getLogCodeArray() const override;
    void updateWithData(ByteView data, int32_t logCode) override;
};

}  // namespace vantorel

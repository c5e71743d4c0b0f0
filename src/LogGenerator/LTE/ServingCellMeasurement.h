// ServingCellMeasurement: the "Serving Cell Measurements" section (idle-mode record 0xB17F).
#pragma once

#include "LogGenerator/Base.h"

namespace vantorel {

class ServingCellMeasurement : public Base {
public:
    std::string getSectionName() const override;
    std::vector<int32_t> getLogCodeArray() const override;
    void updateWithData(ByteView data, int32_t logCode) override;
};

}  // namespace vantorel

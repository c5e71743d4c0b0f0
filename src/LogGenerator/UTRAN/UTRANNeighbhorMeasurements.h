// UTRANNeighbhorMeasurements: the "Neighbor Cell List" list section (record 0xD00A).
#pragma once

#include "LogGenerator/Base.h"

namespace vantorel {

class UTRANNeighbhorMeasurements : public Base {
public:
    std::string getSectionName() const override;
    std::vector<int32_t> getLogCodeArray() const override;
    void updateWithData(ByteView data, int32_t logCode) override;
};

}  // namespace vantorel

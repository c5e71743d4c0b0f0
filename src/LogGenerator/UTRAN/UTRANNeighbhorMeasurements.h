// UTRANNeighbhorMeasurements: the "Neighbor Cell List" list section of Part 7.2 (record 0xD00A).
#pragma once

#include "LogGenerator/Base.h"

namespace vantorel {

class UTRANNeighbhorMeasurements : public Base {
public:
    static constexpr int32_t kLogCode = 0xD00A;

    std::string getSectionName() const override;
    std::vector<int32_t> getLogCodeArray() const override;
    void updateWithData(ByteView data, int32_t logCode) override;
};

}  // namespace vantorel

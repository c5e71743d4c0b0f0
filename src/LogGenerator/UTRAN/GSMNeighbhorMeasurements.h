// GSMNeighbhorMeasurements: the "GSM Neighbor Cell List" list section of Part 7.2 (record 0xD00E; its list is cleared, never filled).
#pragma once

#include "LogGenerator/Base.h"

namespace vantorel {

class GSMNeighbhorMeasurements : public Base {
public:
    static constexpr int32_t kLogCode = 0xD00E;

    std::string getSectionName() const override;
    std::vector<int32_t> getLogCodeArray() const override;
    void updateWithData(ByteView data, int32_t logCode) override;
};

}  // namespace vantorel

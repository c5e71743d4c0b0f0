// GSMNeighbhorMeasurements: the "GSM Neighbor Cell List" list section (record 0xD00E; its list is cleared, never filled).
#pragma once

#include "LogGenerator/Base.h"

namespace vantorel {

class GSMNeighbhorMeasurements : public Base {
public:
    std::string getSectionName() const override;
    std::vector<int32_t> getLogCodeArray() const override;
    void updateWithData(ByteView data, int32_t logCode) override;
};

}  // namespace vantorel

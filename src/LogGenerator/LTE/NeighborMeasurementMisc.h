// NeighborMeasurementMisc: the "Neighbor Measurements" dictionary section (record 0xB180: version, E-ARFCN, Qrxlevmin).
#pragma once

#include "LogGenerator/Base.h"

namespace vantorel {

class NeighborMeasurementMisc : public Base {
public:
    std::string getSectionName() const override;
    std::vector<int32_t> getLogCodeArray() const override;
    void updateWithData(ByteView data, int32_t logCode) override;
};

}  // namespace vantorel

// GSMServingCell: the "GSM Serving Cell" section: serving cell identity, level, C1/C2 and dedicated ARFCN, from the modem and the cell monitor.
#pragma once

#include "LogGenerator/Base.h"

namespace vantorel {

class GSMServingCell : public Base {
public:
    std::string getSectionName() const override;
    std::vector<int32_t> getLogCodeArray() const override;
    void updateWithData(ByteView data, int32_t logCode) override;
};

}  // namespace vantorel

// TRCHBLERMeasurement: the "TRCH BLER" list section (record 0xD00C, transport-channel entries).
#pragma once

#include "LogGenerator/Base.h"

namespace vantorel {

class TRCHBLERMeasurement : public Base {
public:
    std::string getSectionName() const override;
    std::vector<int32_t> getLogCodeArray() const override;
    void updateWithData(ByteView data, int32_t logCode) override;
};

}  // namespace vantorel

// RRC_State: the "RRC Info" section (record 0xD0E0: RRC mode).
#pragma once

#include "LogGenerator/Base.h"

namespace vantorel {

class RRC_State : public Base {
public:
    std::string getSectionName() const override;
    std::vector<int32_t> getLogCodeArray() const override;
    void updateWithData(ByteView data, int32_t logCode) override;
};

}  // namespace vantorel

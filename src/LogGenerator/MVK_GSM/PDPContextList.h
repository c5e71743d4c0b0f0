// PDPContextList: the "PDP Context Info" list section (0xFF0002 packet-data contexts).
#pragma once

#include "LogGenerator/Base.h"

namespace vantorel {

class PDPContextList : public Base {
public:
    std::string getSectionName() const override;
    std::vector<int32_t> getLogCodeArray() const override;
    void updateWithData(ByteView data, int32_t logCode) override;
};

}  // namespace vantorel

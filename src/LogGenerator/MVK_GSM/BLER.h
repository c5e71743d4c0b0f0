// BLER: the "BLER" section: UMTS transport-channel block error counts (0x4116).
#pragma once

#include "LogGenerator/Base.h"

namespace vantorel {

class BLER : public Base {
public:
    std::string getSectionName() const override;
    std::vector<int32_t> getLogCodeArray() const override;
    void updateWithData(ByteView data, int32_t logCode) override;
};

}  // namespace vantorel

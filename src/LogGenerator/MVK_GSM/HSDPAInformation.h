// HSDPAInformation: the "HSDPA Info" section: HSDPA carrier configuration and per-HARQ-process statistics (0x4221).
#pragma once

#include "LogGenerator/Base.h"

namespace vantorel {

class HSDPAInformation : public Base {
public:
    std::string getSectionName() const override;
    std::vector<int32_t> getLogCodeArray() const override;
    void updateWithData(ByteView data, int32_t logCode) override;
};

}  // namespace vantorel

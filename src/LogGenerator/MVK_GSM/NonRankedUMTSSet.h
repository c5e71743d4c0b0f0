// NonRankedUMTSSet: the "Non-Ranked UMTS Set" section, which no record fills.
#pragma once

#include "LogGenerator/Base.h"

namespace vantorel {

class NonRankedUMTSSet : public Base {
public:
    std::string getSectionName() const override;
    std::vector<int32_t> getLogCodeArray() const override;
    void updateWithData(ByteView data, int32_t logCode) override;
};

}  // namespace vantorel

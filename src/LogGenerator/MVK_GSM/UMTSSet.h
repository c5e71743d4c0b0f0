// UMTSSet: the "UMTS Set" section: ranked UMTS cells (0x4005) or the cell monitor's UMTS neighbours (0xFF0001).
#pragma once

#include "LogGenerator/Base.h"

namespace vantorel {

class UMTSSet : public Base {
public:
    std::string getSectionName() const override;
    std::vector<int32_t> getLogCodeArray() const override;
    void updateWithData(ByteView data, int32_t logCode) override;

private:
    void updateFromRanking(ByteView data) const;      // 0x4005
    void updateFromCellMonitor(ByteView data) const;  // 0xFF0001
};

}  // namespace vantorel

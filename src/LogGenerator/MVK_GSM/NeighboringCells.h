// NeighboringCells: the "Neighboring Cells" list section: the GSM neighbours of 0x5137 (with the BSICs of the last 0x51FF) or of the cell monitor (0xFF0001).
#pragma once

#include "LogGenerator/Base.h"

#include <unordered_map>

namespace vantorel {

class NeighboringCells : public Base {
public:
    std::string getSectionName() const override;
    std::vector<int32_t> getLogCodeArray() const override;
    void updateWithData(ByteView data, int32_t logCode) override;

private:
    void updateFromMeasurement(ByteView data) const;  // 0x5137
    void updateBSICs(ByteView data);                   // 0x51FF
    void updateFromCellMonitor(ByteView data) const;  // 0xFF0001

    // ARFCN -> BSIC, both as shown ("%d"), from the last BSIC report.
    std::unordered_map<std::string, std::string> arfcnToBsic_;
};

}  // namespace vantorel

// DetectedCells: the "Detected Cells" list section (the detected-cell entries of record 0xB179).
#pragma once

#include "LogGenerator/Base.h"

namespace vantorel {

class DetectedCells : public Base {
public:
    std::string getSectionName() const override;
    std::vector<int32_t> getLogCodeArray() const override;
    void updateWithData(ByteView data, int32_t logCode) override;
};

}  // namespace vantorel

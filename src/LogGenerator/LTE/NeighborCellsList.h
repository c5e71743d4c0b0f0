// NeighborCellsList: the "Neighbor Cells List" list section (record 0xB180: idle-mode neighbour cells).
#pragma once

#include "LogGenerator/Base.h"

namespace vantorel {

class NeighborCellsList : public Base {
public:
    std::string getSectionName() const override;
    std::vector<int32_t> getLogCodeArray() const override;
    void updateWithData(ByteView data, int32_t logCode) override;
};

}  // namespace vantorel

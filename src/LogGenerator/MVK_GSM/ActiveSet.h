// ActiveSet: the "Active Set" section: the active-set cells of the searcher record 0x417A, and the searcher walk the other searcher sets share.
#pragma once

#include "LogGenerator/Base.h"

namespace vantorel {

class ActiveSet : public Base {
public:
    std::string getSectionName() const override;
    std::vector<int32_t> getLogCodeArray() const override;
    void updateWithData(ByteView data, int32_t logCode) override;

    // A searcher record shorter than this leaves every searcher set as it was.
    static constexpr size_t kSearcherMinLength = 16;
    // Whether a set lists a searcher cell, by the cell's set type (0 = active set).
    using KeepCell = bool (*)(unsigned setType);
    static bool keepNoCell(unsigned) { return false; }

    // The one walk over a searcher record for all four searcher sets: a row (scrambling
    // code, RSCP, Ec/Io) per cell that `keep` accepts, in record order; null when the
    // record announces no cells.
    static ArrayRef searcherCells(const ByteReader& record, KeepCell keep);
};

}  // namespace vantorel

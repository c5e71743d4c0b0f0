// ReselectionCandidatesList: the "Reselection Candidates List" list section (record 0xB186: reselection candidates).
#pragma once

#include "LogGenerator/Base.h"

namespace vantorel {

class ReselectionCandidatesList : public Base {
public:
    std::string getSectionName() const override;
    std::vector<int32_t> getLogCodeArray() const override;
    void updateWithData(ByteView data, int32_t logCode) override;
};

}  // namespace vantorel

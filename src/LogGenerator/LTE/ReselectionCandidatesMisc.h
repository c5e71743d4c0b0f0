// ReselectionCandidatesMisc: the "Reselection Candidates" dictionary section (record 0xB186: version, serving cell).
#pragma once

#include "LogGenerator/Base.h"

namespace vantorel {

class ReselectionCandidatesMisc : public Base {
public:
    std::string getSectionName() const override;
    std::vector<int32_t> getLogCodeArray() const override;
    void updateWithData(ByteView data, int32_t logCode) override;
};

}  // namespace vantorel

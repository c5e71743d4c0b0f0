// EquivalentPLMNList: the "Equivalent PLMN List" list section (0x7150).
#pragma once

#include "LogGenerator/Base.h"

namespace vantorel {

class EquivalentPLMNList : public Base {
public:
    std::string getSectionName() const override;
    std::vector<int32_t> getLogCodeArray() const override;
    void updateWithData(ByteView data, int32_t logCode) override;
};

}  // namespace vantorel

// ServingPLMN: the "Serving PLMN" section (0x7132 selection mode, 0x7135 BCD PLMN and area, 0xFF0001 serving cell).
#pragma once

#include "LogGenerator/Base.h"

namespace vantorel {

class ServingPLMN : public Base {
public:
    std::string getSectionName() const override;
    std::vector<int32_t> getLogCodeArray() const override;
    void updateWithData(ByteView data, int32_t logCode) override;

private:
    void updateRegistrationState(ByteView data) const;  // 0x7132
    void updateServingPLMN(ByteView data) const;        // 0x7135
    void updateFromCellMonitor(ByteView data) const;    // 0xFF0001
};

}  // namespace vantorel

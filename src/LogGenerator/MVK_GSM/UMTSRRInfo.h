// UMTSRRInfo: the "UMTS RR Info" section: RRC state, frequencies and identity, transmit power, ciphering of the UMTS serving cell.
#pragma once

#include "LogGenerator/Base.h"

namespace vantorel {

class UMTSRRInfo : public Base {
public:
    std::string getSectionName() const override;
    std::vector<int32_t> getLogCodeArray() const override;
    void updateWithData(ByteView data, int32_t logCode) override;

private:
    void updateCellIdentity(const ByteReader& r) const;  // 0x4127
    void updateTransmitPower(const ByteReader& r) const;  // 0x4031
    void updateFromCellMonitor(ByteView data) const;      // 0xFF0001
};

}  // namespace vantorel

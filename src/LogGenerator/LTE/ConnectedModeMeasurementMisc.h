// ConnectedModeMeasurementMisc: the "Connected mode LTE Intra-frequency Measurement" section (serving cell of record 0xB179); holds the 0xB179 layout and conversions.
#pragma once

#include "LogGenerator/Base.h"

namespace vantorel {

class ConnectedModeMeasurementMisc : public Base {
public:
    // Record 0xB179 (offsets from the record's first byte; at least 29 bytes, shorter
    // records are ignored by all three sections that read it):
    //   17..18          u16 LE  E-ARFCN
    //   19..20          u16 LE  serving physical cell identity
    //   21..22          u16 LE  subframe number
    //   23..24          u16 LE  serving filtered RSRP (rsrpText)
    //   25..26          u16 LE  serving filtered RSRQ (rsrqText)
    //   27              u8      number of measured neighbour cells n
    //   28              u8      number of detected cells d
    //   29 + 6i         neighbour entry i, i < n: PCI u16, filtered RSRP u16, filtered RSRQ u16
    //   29 + 6n + 2j    detected-cell entry j, j < d: PCI u16
    // The counts are the modem's word: entries that do not lie wholly inside the record
    // are not read.
    static constexpr size_t kMinLength = 29;
    static constexpr size_t kNeighbourCount = 27;
    static constexpr size_t kDetectedCount = 28;
    static constexpr size_t kFirstEntry = 29;
    static constexpr size_t kNeighbourEntrySize = 6;
    static constexpr size_t kDetectedEntrySize = 2;

    // RSRP in quarter dB above -140 dBm, "%4.2f dBm" (the idle-mode record uses it too).
    static std::string rsrpText(unsigned raw);
    // 0xB179's RSRQ in eighth dB above -20 dB, "%4.2f dB".
    static std::string rsrqText(unsigned raw);

    std::string getSectionName() const override;
    std::vector<int32_t> getLogCodeArray() const override;
    void updateWithData(ByteView data, int32_t logCode) override;
};

}  // namespace vantorel

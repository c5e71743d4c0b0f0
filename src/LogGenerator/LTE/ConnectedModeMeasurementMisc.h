// ConnectedModeMeasurementMisc: the "Connected mode LTE Intra-frequency Measurement" section (serving cell of record 0xB179); holds the 0xB179 layouts and conversions.
#pragma once

#include "LogGenerator/Base.h"

namespace vantorel {

class ConnectedModeMeasurementMisc : public Base {
public:
    // Record 0xB179. Byte 13 is the record's layout version; version 4 (today's phones) has
    // its own layout, every other version keeps the original one. Offsets from the record's
    // first byte, little-endian:
    //                                original     version 4
    //   E-ARFCN                      u16 17       u32 21
    //   serving physical cell id     u16 19       u16 25
    //   subframe number              u16 21       u16 27
    //   serving filtered RSRP        u16 23       bits 0-11 of u32 29
    //   serving filtered RSRQ        u16 25       bits 0-9 of u32 33
    //   neighbour count n            u8  27       u8  37
    //   detected-cell count d        u8  28       u8  38
    //   first neighbour entry        29           41
    //   neighbour entry i            6 bytes      12 bytes: PCI u16 0, RSRP u32 2, RSRQ u32 6
    //   then detected-cell entry j   2 bytes      16 bytes: PCI u16 0
    // Records shorter than the first entry's offset are ignored by all three sections that
    // read them. The counts are the modem's word: entries that do not lie wholly inside the
    // record are not read.
    struct Layout {
        size_t minLength, earfcn, earfcnWidth, pci, subframe, rsrp, rsrq, neighbourCount, detectedCount, firstEntry;
        size_t neighbourSize, neighbourRsrp, neighbourRsrq, detectedSize;
        std::string (*rsrpAt)(const ByteReader& r, size_t offset);  // "%4.2f dBm"
        std::string (*rsrqAt)(const ByteReader& r, size_t offset);  // "%4.2f dB"
    };
    static const Layout& layoutOf(const ByteReader& record);

    // RSRP in quarter dB above -140 dBm, "%4.2f dBm" (the idle-mode record uses it too).
    static std::string rsrpText(unsigned raw);
    // 0xB179's RSRQ in eighth dB above -20 dB, "%4.2f dB".
    static std::string rsrqText(unsigned raw);

    std::string getSectionName() const override;
    std::vector<int32_t> getLogCodeArray() const override;
    void updateWithData(ByteView data, int32_t logCode) override;
};

}  // namespace vantorel

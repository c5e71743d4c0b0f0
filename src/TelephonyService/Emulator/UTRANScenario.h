// UTRANScenario: the emulator's TD-SCDMA (UTRAN2) modem, a China Mobile-like cell over time, in the record layouts the UTRAN decoders read.
#pragma once

#include "TelephonyService/Emulator/EmulatorScenario.h"

#include <array>

namespace vantorel {

// A TD-SCDMA cell in band A (UARFCN 10054..10121, MCC 460, MNC 00, LAC 0x5A1F)
// whose state changes over time:
//  - the RRC mode walks Disconnected -> Connecting -> Cell FACH -> Cell DCH ->
//    Cell FACH / Cell PCH / Cell URA PCH -> (Cell FACH again | Disconnected) ...;
//  - serving and neighbour RSCP drift (-60..-110 dBm), 2 to 6 neighbours come
//    and go, and a neighbour that stays 4 dB above the serving cell for 3 ticks
//    takes over (reselection / handover);
//  - GSM neighbours come and go, transport channels report BLER and SIR in
//    Cell FACH and Cell DCH, and packet-data contexts get activated;
//  - now and then a malformed record and a record behind the 0x81 0x00 prefix.
// Schedule (tick n): the three extras at n = 0 (and later periodically or on a
// change), 0xD00A every tick (behind the prefix when n % 7 == 3), 0xD0E0 at
// n = 0, on a mode change and every 5 ticks (validity flag 0 when n % 30 == 15),
// 0xD0E2 at n = 0, on a cell change and every 10 ticks, 0xD00E when n % 4 == 1,
// 0xD00C in every Cell FACH / Cell DCH tick, a malformed record when
// n % 25 == 12 (short, wrong type, bad 0xFF0000 payload in turn).
// Units: 0xD00A "Filter RSCP" in 3GPP TS 25.123 PCCPCH_RSCP_LEV steps (dBm + 116,
// so -60..-110 dBm is 56..6), 0xD00C BLER in percent and SIR in dB, 0xD00E RSSI
// in dBm, cell-monitor RSCP in dBm.
// Ticks out of order replay from the seed, so recordsForTick(n) depends only on
// the seed and n.
class UTRANScenario : public EmulatorScenario {
public:
    // RRC modes of 0xD0E0 byte 14.
    enum RRCMode : uint8_t {
        kDisconnected = 0,
        kConnecting = 1,
        kCellFach = 2,
        kCellDCH = 3,
        kCellPCH = 4,
        kCellURAPCH = 5,
    };

    explicit UTRANScenario(uint64_t seed = 1);

    std::string technology() const override;
    std::string description() const override;

private:
    // A TD-SCDMA cell: frequency, cell parameter ID (0..127, the "Cell ID" of
    // 0xD00A and the cell monitor's scrambling code), 28-bit UTRAN cell identity
    // (RNC-ID << 16 | C-ID, the "Cell ID" of 0xD0E2), P-CCPCH RSCP in dBm.
    struct TDCell {
        uint16_t uarfcn = 0;
        uint8_t cellParameterId = 0;
        int32_t cellIdentity = 0;
        int32_t rscp = -90;
        bool listed = true;    // in the neighbour list (MSET) or only detected (DSET)
        bool present = false;  // measured now
    };
    struct GSMCell {
        uint16_t arfcn = 0;
        uint16_t cellId = 0;  // 14 bits in 0xD00E
        uint8_t ncc = 0;
        uint8_t bcc = 0;
        int32_t rssi = -90;  // dBm
        bool present = false;
    };
    struct TransportChannel {
        uint8_t id = 0;
        uint8_t bler = 0;  // percent
    };
    static constexpr size_t kNeighbourPool = 9;
    static constexpr size_t kGSMPool = 5;

    void restart() override;
    std::vector<Bytes> step() override;

    // State changes of one tick; each returns true when the display should hear of it.
    bool evolveRadio();
    void evolveGSM();
    bool evolveRRC();
    bool evolvePDP();
    void enterRRC(RRCMode mode);
    void chooseTransportChannels();
    size_t presentNeighbours() const;

    // Records.
    Bytes rrcStateRecord(uint64_t tick, bool valid) const;
    Bytes servingCellRecord(uint64_t tick);
    Bytes neighbourListRecord(uint64_t tick, bool withPrefix) const;
    Bytes gsmNeighbourListRecord(uint64_t tick) const;
    Bytes blerSIRRecord(uint64_t tick);
    Bytes cellMonitorRecord(bool binary) const;
    Bytes malformedRecord(uint64_t tick) const;


    // Fixed per seed.
    SimFiles sim_;

    // The radio picture.
    TDCell serving_;
    uint8_t uraId_ = 1;
    std::array<TDCell, kNeighbourPool> neighbours_{};
    std::array<GSMCell, kGSMPool> gsmCells_{};
    int betterTicks_ = 0;  // ticks a neighbour has been 4 dB above the serving cell

    // RRC and transport channels.
    RRCMode rrc_ = kDisconnected;
    int dwell_ = 0;        // ticks left in the current mode
    bool goingUp_ = true;  // Cell FACH on the way to Cell DCH (else on the way down)
    std::vector<TransportChannel> trchs_;
    std::vector<uint8_t> cctrchTimeslots_;  // one CCTRCH per entry, its TSNUM

    std::array<PacketContext, 2> pdp_{};
};

}  // namespace vantorel

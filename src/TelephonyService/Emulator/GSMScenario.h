// GSMScenario: the emulator's GSM/UMTS modem, a 234-15-like handset moving between GSM and UMTS, in the record layouts the GSM/UMTS decoders read.
#pragma once

#include "TelephonyService/Emulator/EmulatorScenario.h"

#include <array>
#include <deque>
#include <initializer_list>

namespace vantorel {

// A dual-mode handset of MCC 234, MNC 15 that cycles through three phases:
//  1. GSM idle (first 14..18 ticks, later 20..30): camped on a GSM 900 / DCS 1800
//     cell whose RxLev, C1/C2 and RxQual drift, with 4 to 6 neighbours; the RR
//     state walks idle -> cell reselection -> idle (a reselection 8 ticks into the
//     phase and whenever a neighbour is 6 levels stronger);
//  2. UMTS (at least 30..40 ticks): reselection to a band I cell (UARFCN 10564..10838);
//     the RRC state walks Disconnected -> Connecting -> CELL_FACH -> CELL_DCH ->
//     CELL_FACH -> CELL_PCH / URA_PCH -> CELL_FACH -> CELL_DCH ...; in CELL_DCH an
//     active set of 1..3 cells follows Ec/Io, HSDPA HARQ processes and BLER counts
//     run; a voice call set up in the second half ends the phase by a handover;
//  3. GSM dedicated (10..16 ticks): the call on a frequency-hopping channel, then
//     release, a location update and GSM idle again.
// MM, GMM and registration states follow scripts for power-on, change of location
// area, call setup and release, and the service request out of CELL_PCH.
// Schedule (tick n, the state evolving before the tick's records are built):
//  - always: the three extras at n = 0 (cell monitor on a cell or phase change and
//    every 10 ticks, PDP contexts on a change and every 20, SIM files every 60);
//    0x7130 / 0x7131 / 0x7132 on a NAS change and every 10 ticks, 0x7135 and 0x7150
//    on a phase change and every 10 ticks; 0x512C on a change and every 10 ticks;
//  - on GSM: 0x5137 every tick, 0x5134 on a cell or phase change and every 10
//    ticks, 0x51FF every 5 ticks and on a change; idle: the GPRS records 0x51F4,
//    0x51F5, 0x51F6, 0x51FB, 0x51FD on entry and every 10 ticks; dedicated: 0x51F8
//    and 0x5076 on entry and every 5 ticks, 0x5072 every other tick;
//  - on UMTS: 0x417A every tick, 0x4125 on a change and every 5 ticks, 0x4127 on
//    entry and every 10 ticks, 0x4157 on connection and every 10 ticks, 0x4005 every
//    other tick outside CELL_DCH, 0x4031 and 0x4116 in CELL_FACH / CELL_DCH, 0x4221
//    in CELL_DCH;
//  - a malformed record when n % 25 == 12 (too short, wrong type byte, cut property
//    list, a count larger than the record holds, in turn).
// Units: 0x5137 RxLev 0..63 (dBm + 110), C1 in its low 16 bits with RxQual above;
// 0x417A Ec/Io as linear energies, receive AGC from the carrier RSSI; cell-monitor
// GSM neighbour RSSI in 2 dB steps, 32767 for a level not measured yet.
// Ticks out of order replay from the seed, so recordsForTick(n) depends only on
// the seed and n.
class GSMScenario : public EmulatorScenario {
public:
    // A malformed record at n % kMalformedPeriod == 12.
    static constexpr uint64_t kMalformedPeriod = 25;

    enum Phase : uint8_t { kGSMIdle, kUMTS, kGSMDedicated };
    // RRC states of 0x4125 byte 13.
    enum RRCState : uint8_t { kDisconnected, kConnecting, kCellFACH, kCellDCH, kCellPCH, kURAPCH };

    explicit GSMScenario(uint64_t seed = 1);

    std::string technology() const override;
    std::string description() const override;

    // One step of the MM / GMM / registration scripts: MM state, MM sub-state, update
    // status, GMM state, GMM sub-state, GMM update status, service state; -1 keeps a value.
    using NasStep = std::array<int8_t, 7>;

private:
    struct GSMCell {
        uint16_t arfcn = 0;
        uint8_t bsic = 0;  // NCC << 3 | BCC
        uint16_t cellId = 0;
        int32_t rxlev = 30;  // 0..63
        bool present = false;
    };
    struct UMTSCell {
        uint16_t uarfcn = 0;
        uint16_t psc = 0;
        int32_t rscp = -90;  // dBm
        int32_t ecio = -10;  // dB
        uint8_t set = 1;     // searcher set: 0 active, 1 monitored, 2 detected
        bool present = false;
    };
    struct TransportChannel {
        uint8_t id = 0;
        int32_t received = 0;
        int32_t errors = 0;
    };
    static constexpr size_t kGSMPool = 8;
    static constexpr size_t kUMTSPool = 8;

    void restart() override;
    std::vector<Bytes> step() override;

    // State changes of one tick.
    bool evolveGSM();
    void evolveUMTS();
    bool evolveRRC();
    bool evolvePhase();
    bool evolvePDP();
    void enterRRC(RRCState state);
    void queueNas(std::span<const NasStep> script);
    void queueRR(std::initializer_list<uint8_t> states);
    void reselectGSM(size_t to);
    void enterUMTS();
    void enterDedicated();

    // Records.
    Bytes nasRecord(uint64_t tick, int32_t code) const;
    Bytes servingPLMNRecord(uint64_t tick) const;
    Bytes equivalentPLMNRecord(uint64_t tick, uint8_t count, size_t length) const;
    Bytes rrStateRecord(uint64_t tick) const;
    Bytes gsmIdentityRecord(uint64_t tick, uint8_t type) const;
    Bytes gsmMeasurementRecord(uint64_t tick) const;
    Bytes bsicRecord(uint64_t tick) const;
    std::vector<Bytes> gprsRecords(uint64_t tick);
    Bytes mobileAllocationRecord(uint64_t tick) const;
    Bytes dedicatedRecord(uint64_t tick) const;
    Bytes channelParametersRecord(uint64_t tick);
    Bytes rrcStateRecord(uint64_t tick) const;
    Bytes umtsIdentityRecord(uint64_t tick) const;
    Bytes cipheringRecord(uint64_t tick) const;
    Bytes searcherRecord(uint64_t tick);
    Bytes rankingRecord(uint64_t tick) const;
    Bytes transmitPowerRecord(uint64_t tick);
    Bytes blerRecord(uint64_t tick);
    Bytes hsdpaRecord(uint64_t tick);
    Bytes cellMonitorRecord(bool binary);
    Bytes malformedRecord(uint64_t tick) const;

    SimFiles sim_;

    Phase phase_ = kGSMIdle;
    int phaseTicks_ = 0;   // ticks spent in the phase
    int phaseLength_ = 0;  // ticks it lasts (UMTS: at least)

    // GSM.
    std::array<GSMCell, kGSMPool> gsm_{};
    size_t gsmServing_ = 0;
    int betterTicks_ = 0;
    int32_t rxqual_ = 0;
    uint8_t hsn_ = 0;
    std::vector<uint16_t> mobileAllocation_;
    bool dtx_ = true;
    std::deque<uint8_t> rrQueue_;
    uint8_t rrState_ = 0;

    // UMTS.
    std::array<UMTSCell, kUMTSPool> umts_{};
    int32_t umtsCellId_ = 0;
    uint16_t uraId_ = 0;
    RRCState rrc_ = kDisconnected;
    int rrcDwell_ = 0;
    bool goingUp_ = true;
    bool uraNext_ = false;  // the next paging state is URA_PCH
    bool callActive_ = false;
    int32_t txPower_ = 0;  // dBm
    std::vector<TransportChannel> trchs_;
    bool dualCarrier_ = false;

    // NAS.
    NasStep nas_{};
    std::deque<NasStep> nasQueue_;
    std::array<PacketContext, 2> pdp_{};
};

}  // namespace vantorel

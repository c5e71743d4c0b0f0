// LTEScenario: the emulator's LTE modem, a 262-01-like cell over time, in the record layouts the LTE decoders read.
#pragma once

#include "TelephonyService/Emulator/EmulatorScenario.h"

#include <array>

namespace vantorel {

// An LTE UE of MCC 262, MNC 01 on three carriers (band 3 EARFCN 1300, 20 MHz;
// band 20 EARFCN 6300, 10 MHz; band 7 EARFCN 3050, 20 MHz) whose state changes
// over time:
//  - RRC idle and RRC connected periods alternate (idle 8..20 ticks, connected
//    15..40 ticks, a short first idle period);
//  - serving RSRP, RSRQ and RSSI drift (RSRP -128..-65 dBm, RSRQ -19..-4 dB, RSSI from
//    both and the bandwidth), RSRP falling from about -80 to -116 dBm between two
//    cell changes, so the idle measurement rules change as Srxlev falls,
//    intra-frequency neighbours appear (weak), get measured and disappear, a few
//    cells are only detected;
//  - every 40 ticks (n % 40 == 39) the UE changes cell: handover when connected,
//    reselection when idle; intra-frequency (new PCI) and inter-frequency (new
//    PCI and EARFCN, another band and bandwidth) in turn;
//  - in idle mode the reselection candidate list holds LTE, UTRAN and GERAN cells
//    (2 to 5 of them) that come and go;
//  - the default bearer of APN "internet" is up, an IMS bearer comes and goes.
// Schedule (tick n): the three extras at n = 0 (cell monitor on a cell change and
// every 10 ticks, PDP contexts on a change and every 20, SIM files every 60);
// 0xB0C2 at n = 0, on a cell change and every 10 ticks; 0xB0C1 at n = 0, on a
// cell change and every 20 ticks; connected: 0xB179 every tick (behind the
// 0x81 0x00 prefix when n % 7 == 3); idle: 0xB17F every tick, 0xB180 every
// other tick, 0xB186 every 5 ticks and on a change of candidates or cell (the
// state evolves before the tick's records are built); a malformed record when
// n % 25 == 12 (too short, wrong type byte, cut property list in turn).
// Ticks out of order replay from the seed, so recordsForTick(n) depends only on
// the seed and n.
class LTEScenario : public EmulatorScenario {
public:
    // Ticks between two cell changes (the change happens at n % kCellChangePeriod == kCellChangePeriod - 1).
    static constexpr uint64_t kCellChangePeriod = 40;
    // A malformed record at n % kMalformedPeriod == 12.
    static constexpr uint64_t kMalformedPeriod = 25;

    explicit LTEScenario(uint64_t seed = 1);

    std::string technology() const override;
    std::string description() const override;

private:
    // An LTE cell; signal levels in quarter dB (RSRP, RSRQ) and half dB (RSSI).
    struct LTECell {
        size_t carrier = 0;  // index into the carrier table
        uint16_t pci = 0;    // physical cell identity, 0..503
        int32_t cellIdentity = 0;  // 28 bits: eNodeB ID << 8 | cell
        int32_t rsrp = -95 * 4;
        int32_t rsrq = -10 * 4;
        int32_t rssi = -70 * 2;
        int32_t timing = 0;         // frame timing against the serving cell, samples at 30.72 MHz (0..307199)
        bool detectedOnly = false;  // found by the searcher, not in the neighbour list
        bool present = false;
    };
    // A reselection candidate of another RAT or frequency.
    struct Candidate {
        uint16_t rat = 0;       // 0 LTE, 1 UTRAN, 2 GERAN
        uint16_t priority = 0;  // cell reselection priority 0..7
        uint16_t channel = 0;   // EARFCN, UARFCN or ARFCN
        uint16_t identity = 0;  // PCI, PSC or BSIC
        uint8_t band = 0;       // GERAN band indicator
        bool present = false;
    };
    static constexpr size_t kNeighbourPool = 8;
    static constexpr size_t kCandidatePool = 6;

    void restart() override;
    std::vector<Bytes> step() override;

    // State changes of one tick; those returning bool say whether the display should hear of it.
    void evolveRadio();
    void evolveMode();
    bool evolveCandidates();
    bool evolveBearers();
    void changeCell();
    void retuneLTECandidates();
    LTECell newCell(size_t carrier);
    size_t presentNeighbours() const;
    uint8_t measurementRules() const;

    // Records.
    Bytes servingCellRecord(uint64_t tick) const;
    Bytes antennaRecord(uint64_t tick) const;
    Bytes connectedMeasurementRecord(uint64_t tick, bool withPrefix) const;
    Bytes servingMeasurementRecord(uint64_t tick);
    Bytes neighbourMeasurementRecord(uint64_t tick);
    Bytes reselectionCandidatesRecord(uint64_t tick) const;
    Bytes cellMonitorRecord(bool binary) const;
    Bytes malformedRecord(uint64_t tick) const;


    // Fixed per seed.
    SimFiles sim_;
    int32_t enodeBase_ = 0;  // the eNodeB IDs of the area start here

    // The radio picture.
    LTECell serving_;
    uint8_t txAntennas_ = 2;
    std::array<LTECell, kNeighbourPool> neighbours_{};
    std::array<Candidate, kCandidatePool> candidates_{};
    int32_t avgRsrp_ = 0;  // filtered serving RSRP / RSRQ, quarter dB
    int32_t avgRsrq_ = 0;
    int32_t drxBelowZero_ = 0;  // consecutive idle ticks with Srxlev < 0
    uint8_t lastRules_ = 0;
    uint64_t cellChanges_ = 0;
    uint64_t ticksInCell_ = 0;

    bool connected_ = false;
    int dwell_ = 0;  // ticks left in the current RRC mode

    std::array<PacketContext, 2> bearers_{};
};

}  // namespace vantorel

// LTEScenario: the emulator's LTE modem, a UE driving a loop through a 262-01-like network, in the record layouts the LTE decoders read.
#pragma once

#include "TelephonyService/Emulator/EmulatorScenario.h"

#include <array>

namespace vantorel {

// An LTE UE of MCC 262, MNC 01 in a car on a 16 km loop road at 30..60 km/h,
// through eleven sites that each carry one cell on the drive's carrier (band 3
// EARFCN 1300, 20 MHz; band 20 EARFCN 6300, 10 MHz; or band 7 EARFCN 3050, 20 MHz,
// chosen by the seed). Each tick (500 ms):
//  - the UE moves; every cell's RSRP is its path gain (the 3GPP macro model
//    128.1 + 37.6 log10(d/km) dB, less on 800 MHz, more on 2600 MHz) plus
//    log-normal shadowing (4 dB, a first-order process that decorrelates over
//    80 m of road, half of it shared by all cells) plus a little fast variation
//    (+-0.6 dB); the UE's layer 3
//    filter (coefficient 1/2 per 500 ms) gives the filtered / average RSRP;
//  - RSSI is the power of all cells on the carrier (each by its load: reference
//    signals always, data in proportion to the load) plus thermal noise, over the
//    bandwidth; RSRQ = N x RSRP / RSSI (the same RSSI for every cell, RSRQ no
//    lower than -19.5 dB);
//  - the five strongest other cells above -124 dBm are measured neighbours, the
//    next two above -134 dBm are only detected; the serving cell is never one;
//  - a cell change (handover when connected, event A3; reselection when idle,
//    ranking with Qhyst) happens when a measured neighbour's filtered RSRP, as the
//    records show it, was at least kHysteresisQuarterDB above the serving cell's in
//    the kTimeToTriggerTicks ticks before (a 640 ms time-to-trigger or 1 s
//    Treselection at 500 ms measurements); it runs at the next tick;
//  - RRC idle and connected periods alternate (idle 8..20 ticks, connected 15..40,
//    a short first idle period); the serving cell carries the UE's own traffic
//    while connected;
//  - the reselection candidate list holds the two other LTE carriers, UTRAN and
//    GERAN cells (2 to 5 of them) that come and go;
//  - the default bearer of APN "internet" is up, an IMS bearer comes and goes.
// The drive starts a few hundred metres before a cell border, so the first
// handover comes within the first minute or so; later ones every one to three minutes.
// Schedule (tick n): the three extras at n = 0 (cell monitor on a cell change and
// every 10 ticks, PDP contexts on a change and every 20, SIM files every 60);
// 0xB0C2 at n = 0, on a cell change and every 10 ticks; 0xB0C1 at n = 0, on a
// cell change and every 20 ticks; connected: 0xB179 every tick (behind the
// 0x81 0x00 prefix when n % 7 == 3); idle: 0xB17F and 0xB180 every tick, 0xB186
// every 5 ticks and on a change of candidates or cell. On a cell change (and at
// n = 0) the measurement records of both modes go out, so every section names the
// new serving cell at once. A malformed record when n % 25 == 12 (too short, wrong
// type byte, cut property list in turn). Ticks out of order replay from the seed,
// so recordsForTick(n) depends only on the seed and n.
class LTEScenario : public EmulatorScenario {
public:
    // A malformed record at n % kMalformedPeriod == 12.
    static constexpr uint64_t kMalformedPeriod = 25;
    // The cell-change rule: a neighbour this much better (quarter dB) on this many ticks' measurements.
    static constexpr int32_t kHysteresisQuarterDB = 3 * 4;
    static constexpr int kTimeToTriggerTicks = 2;

    explicit LTEScenario(uint64_t seed = 1);

    std::string technology() const override;
    std::string description() const override;

private:
    static constexpr size_t kSiteCount = 11;
    static constexpr size_t kMeasuredCells = 5;
    static constexpr size_t kDetectedCells = 2;

    // The drive's cell of one site; levels in hundredths of a dB (dBm or dB).
    struct LTECell {
        uint16_t pci = 0;          // physical cell identity, 0..503
        int32_t cellIdentity = 0;  // 28 bits: eNodeB ID << 8 | cell
        uint8_t txAntennas = 2;
        int32_t timing = 0;        // frame timing against the serving cell, samples at 30.72 MHz (0..307199)
        uint16_t frequencyOffset = 0;  // Hz
        int32_t shadow = 0;        // this cell's own shadowing, the slow part of the fading
        int32_t load = 30;         // resource blocks in use, percent
        int32_t loadTarget = 30;
        int32_t local = 0;         // path gain + shadowing: the local mean RSRP
        int32_t rsrp = 0;          // this tick's measurement
        int32_t filteredRsrp = 0;  // layer 3 filtered
        int32_t rsrq = 0;
        int32_t filteredRsrq = 0;
        int betterTicks = 0;       // consecutive ticks this cell met the cell-change rule
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
    static constexpr size_t kCandidatePool = 6;

    void restart() override;
    std::vector<Bytes> step() override;

    // The drive: the UE's place, the radio levels there, the neighbour ranking and the cell-change rule.
    void drive();
    void measure(int64_t travelledCm);
    void rankNeighbours();
    void countBetterTicks();
    int32_t shadowDraw();
    bool changeCellIfTriggered();
    // State changes of one tick; those returning bool say whether the display should hear of it.
    void evolveMode();
    bool evolveCandidates();
    bool evolveBearers();
    void retuneLTECandidates();
    uint8_t measurementRules() const;
    // The filtered RSRP in quarter dB as the measurement records show it (a half-dB grid).
    int32_t shownFilteredRsrp(const LTECell& c) const;

    // Records.
    Bytes servingCellRecord(uint64_t tick) const;
    Bytes antennaRecord(uint64_t tick) const;
    Bytes connectedMeasurementRecord(uint64_t tick, bool withPrefix) const;
    Bytes servingMeasurementRecord(uint64_t tick);
    Bytes neighbourMeasurementRecord(uint64_t tick) const;
    Bytes reselectionCandidatesRecord(uint64_t tick) const;
    Bytes cellMonitorRecord(bool binary) const;
    Bytes malformedRecord(uint64_t tick) const;

    // Fixed per seed.
    SimFiles sim_;
    size_t carrier_ = 0;  // index into the carrier table

    // The drive.
    int64_t position_ = 0;   // along the loop, centimetres from its first point
    int32_t speed_ = 1250;   // centimetres per second
    int32_t commonShadow_ = 0;  // the shadowing around the UE, shared by every cell
    std::array<LTECell, kSiteCount> cells_{};
    size_t serving_ = 0;
    std::vector<size_t> measured_;  // measured neighbours, strongest first
    std::vector<size_t> detected_;  // detected-only cells
    int32_t rssi_ = 0;              // wideband RSSI, hundredths of a dBm
    int32_t drxBelowZero_ = 0;      // consecutive idle ticks with Srxlev < 0
    uint8_t lastRules_ = 0;

    std::array<Candidate, kCandidatePool> candidates_{};
    bool connected_ = false;
    int dwell_ = 0;  // ticks left in the current RRC mode

    std::array<PacketContext, 2> bearers_{};
};

}  // namespace vantorel

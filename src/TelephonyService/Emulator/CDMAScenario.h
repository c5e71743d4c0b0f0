// CDMAScenario: the emulator's CDMA2000 modem, a hybrid 1x / EV-DO handset over time, in the record layouts the C2K decoders read.
#pragma once

#include "TelephonyService/Emulator/EmulatorScenario.h"

#include <array>

namespace vantorel {

// A hybrid 1x / EV-DO handset on band class 0 (800 MHz cellular) or 1 (PCS), the
// band and carriers drawn from the seed (1x channels such as 283 / 384 / 1019 or
// PCS 25..1175, an EV-DO carrier of the same band), that cycles through:
//  1. 1x idle (6..12 ticks, the first time 3..5): device state 6 Paging on the
//     strongest pilot;
//  2. a 1x voice call (25..40 ticks): state 8 Traffic, an active set of 1 to 3
//     pilots (PN offsets 0..511 in 64-chip units) whose energies drift, pilots
//     joining and leaving it and the reference pilot moving on soft hand-off;
//     frames in error come in bursts (one at the latest 12 ticks before the end);
//  3. 1x idle again (4..8 ticks): the call has ended;
//  4. EV-DO (hybrid, the 1x side paging or in slotted sleep): the HDR state walks
//     Acquisition -> Sync -> Idle (2..4) -> Access (1..2) -> Connected (30..45) ->
//     Idle (3..6), with 1 to 4 sectors in the active set, fingers on their paths,
//     and forward / reverse data rates that move; then back to 1.
// One system change (SID, NID, packet zone, protocol revision, roaming indicator,
// new pilots and a new EV-DO subnet: new UATI and colour code) happens at a tick
// drawn in 100..140, or later once neither a call nor an EV-DO connection is up.
// The forward-link sequence number starts 4..20 records below 2^32, so it wraps
// during the first EV-DO connection.
// Schedule (tick n, the state evolving before the tick's records are built):
//  - 0x134f at n = 0, on a change of base station (1x reference pilot) or system,
//    and every 10 ticks;
//  - 0x119c every tick; 0x119d every tick in Traffic (behind the 0x81 0x00 prefix
//    when n % 7 == 3);
//  - in EV-DO: 0x1183 every tick; from Idle on 0x108a every tick and 0x12b6 every
//    other tick and on an active-set change; in Connected 0x1192 and 0x127e every
//    tick (their sequence numbers advance by one per record);
//  - a malformed record when n % 25 == 12 (a 49-byte 0x1183, a 0x108a whose count
//    does not match its length, a 0x119c whose first subpacket claims size 0, a
//    0x134f of version 1, in turn).
// Units: 0x119c Rx AGC raw (dBm = raw x 0.334 - 63.248), Tx AGC in tenths of dBm,
// pilot energies as raw correlator energies; 0x1183 AGCs in dBm; EV-DO pilot
// strengths and finger C/I as linear values x 512.
// Ticks out of order replay from the seed, so recordsForTick(n) depends only on
// the seed and n.
class CDMAScenario : public EmulatorScenario {
public:
    // A malformed record at n % kMalformedPeriod == 12.
    static constexpr uint64_t kMalformedPeriod = 25;

    // The phases of the cycle; EV-DO phases are named by their HDR device state.
    enum Phase : uint8_t { kIdle1x, kCall1x, kIdleAfterCall, kHDRAcquisition, kHDRSync, kHDRIdle, kHDRAccess,
                           kHDRConnected, kHDRDormant };

    explicit CDMAScenario(uint64_t seed = 1);

    std::string technology() const override;
    std::string description() const override;

private:
    // A pilot (1x) or sector (EV-DO) of the neighbourhood.
    struct Pilot {
        uint16_t pn = 0;      // PN offset, 64-chip units
        int32_t level = 0;    // 1x: correlator energy; EV-DO: strength x 512
        int32_t target = 0;   // where the level drifts to
        uint16_t baseId = 0;  // base station of a 1x pilot
        bool active = false;  // in the active set
    };
    // A cumulative packet counter set of the EV-DO data link.
    struct Counters {
        uint32_t sequence = 0;
        std::vector<uint32_t> counts;
        int32_t rateKbps = 0;  // the rate the next record's increments carry
    };
    static constexpr size_t kPool = 4;
    static constexpr size_t kFingers = 8;

    void restart() override;
    std::vector<Bytes> step() override;

    // State changes of one tick; those returning bool say whether the display should hear of it.
    void drawSystem(bool home);
    void evolvePhase();
    void enterPhase(Phase phase);
    void evolveRadio();
    void evolve1xPilots();
    bool evolveHDRPilots();
    void evolveRates(Counters& c, int32_t step, int32_t target, int32_t low, int32_t high);
    bool hdr() const { return phase_ >= kHDRAcquisition; }
    uint8_t hdrState() const;
    size_t activeCount(const std::array<Pilot, kPool>& pool) const;

    // Records.
    Bytes systemIdentityRecord(uint64_t tick, uint8_t version) const;
    Bytes status1xRecord(uint64_t tick, uint8_t state, bool zeroSize) const;
    Bytes trafficRecord(uint64_t tick, bool frameError, bool withPrefix) const;
    Bytes hdrStatusRecord(uint64_t tick, size_t length) const;
    Bytes hdrActiveSetRecord(uint64_t tick) const;
    Bytes fingerRecord(uint64_t tick, bool badCount) const;
    Bytes forwardRateRecord(uint64_t tick);
    Bytes reverseRateRecord(uint64_t tick);
    Bytes malformedRecord(uint64_t tick);

    // Fixed per seed.
    uint8_t band_ = 0;
    uint16_t channel1x_ = 0;
    uint16_t channelHDR_ = 0;
    uint64_t systemChangeTick_ = 0;

    // The system (changes once).
    uint16_t sid_ = 0;
    uint16_t nid_ = 0;
    uint8_t packetZone_ = 0;
    uint8_t protocolRevision_ = 6;
    uint32_t roamingIndicator_ = 1;
    uint32_t uati_ = 0;
    uint8_t colorCode_ = 0;
    uint8_t sessionState_ = 0;  // HDR session: 0 closed, 1 AMP setup, 4 open
    bool systemChanged_ = false;

    // The radio picture.
    std::array<Pilot, kPool> pilots1x_{};
    std::array<Pilot, kPool> sectors_{};
    size_t reference_ = 0;  // 1x reference pilot
    size_t serving_ = 0;    // EV-DO serving sector
    uint16_t lastBaseId_ = 0;
    int32_t rxAGC1x_ = 0;   // raw, both chains
    int32_t rxAGC1xDiv_ = 0;
    int32_t txAGC1x_ = 0;   // tenths of dBm
    int32_t rxAGCHDR_ = 0;  // dBm, both chains
    int32_t rxAGCHDRDiv_ = 0;
    int32_t txAGCHDR_ = 0;  // dBm
    int burstLeft_ = 0;     // frames in error still to come
    bool frameError_ = false;
    std::array<int32_t, kFingers> fingerJitter_{};  // per-finger C/I spread of the tick, x 512

    Phase phase_ = kIdle1x;
    int dwell_ = 0;  // ticks left in the phase
    bool firstCycle_ = true;
    Counters forward_;
    Counters reverse_;
};

}  // namespace vantorel

// IFXScenario: the emulator's older GSM modem on the IFX channel, which sends each display as one serialised property list.
#pragma once

#include "TelephonyService/Emulator/EmulatorScenario.h"

#include <array>

namespace vantorel {

// A GSM handset of MCC 208, MNC 10 camped on 900 / 1800 MHz cells. Every tick (1 s)
// sends exactly one message: a property list, XML except every fifth tick (n % 5 == 4)
// which is binary, shaped as the display the receiver simplifies (it collapses a
// one-entry dictionary inside a container to its value, drops the first element of
// every array, never collapses the top level):
//   {"Serving Cell": {"Identity": {"Cell": {MCC, MNC, LAC, Cell ID, ARFCN, BSIC}},
//                     "Measurement": {RxLev, RxQual, C1, C2}},
//    "Neighbours": ["<n> cells", {"Cell": {ARFCN, BSIC, RxLev}}, ...],
//    "Radio Resource": {RR State, Channel Type, Timing Advance, Tx Power Level, DTX,
//                       and in a call "Hopping": ["MA", "<arfcn>", ...]},
//    "Registration": {"Status": "<text>"}}
// The "Identity" wrapper collapses to the cell dictionary, each neighbour wrapper to
// its three strings and "Registration" to its text; there are always 3 to 6
// neighbours and at least two hopping carriers, so no group is left empty. Every leaf
// is a string ("%d" numbers: RxLev 0..63, RxQual 0..7, C1 / C2 and the levels drift).
// The serving cell changes when a neighbour is 6 levels stronger for two ticks and at
// the latest 25 ticks after the last change; the old serving cell becomes a
// neighbour. A call of 8..14 ticks (dedicated mode on a hopping TCH/F) starts 30..40
// ticks after the last one ended.
// Every kRefusedPeriod ticks (n % kRefusedPeriod == kRefusedPeriod / 2) the message is
// one the receiver must refuse, in turn: XML cut off in transfer (not a property
// list), and a binary display whose serving RxLev is an integer, not a string.
// Ticks out of order replay from the seed, so recordsForTick(n) depends only on the
// seed and n.
class IFXScenario : public EmulatorScenario {
public:
    static constexpr uint64_t kRefusedPeriod = 20;

    explicit IFXScenario(uint64_t seed = 1);

    std::string technology() const override;
    std::string description() const override;
    std::chrono::milliseconds tickInterval() const override;

private:
    struct Cell {
        int32_t arfcn = 0;
        int32_t ncc = 0;
        int32_t bcc = 0;
        int32_t cellId = 0;
        int32_t lac = 0;
        int32_t rxlev = 30;  // 0..63
        bool present = false;
    };
    static constexpr size_t kPool = 8;

    void restart() override;
    std::vector<Bytes> step() override;

    // State changes of one tick.
    void evolveLevels();
    bool evolveServing();
    void evolveCall();

    // The display as sent; a refused message carries an integer RxLev when integerRxLev.
    Value display(bool integerRxLev) const;
    Bytes refusedMessage(uint64_t tick) const;

    std::array<Cell, kPool> cells_{};
    size_t serving_ = 0;
    int sinceChange_ = 0;
    int betterTicks_ = 0;
    int32_t rxqual_ = 0;
    bool reselecting_ = false;
    bool inCall_ = false;
    int callTicks_ = 0;     // left in the call, or till the next one
    int32_t timingAdvance_ = 0;
    int32_t txPowerLevel_ = 0;
    bool dtx_ = false;
    std::vector<int32_t> hopping_;
};

}  // namespace vantorel

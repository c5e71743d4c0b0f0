// IFXScenario: the emulator's IFX-channel GSM modem, drifting levels, cell changes and calls sent as serialised display property lists.
#include "TelephonyService/Emulator/IFXScenario.h"

#include "Platform/StringFormat.h"
#include "Platform/TelephonyIdentifiers.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"
#include "PropertyList/PropertyListSerialization.h"

#include <algorithm>
#include <string_view>

// Every random draw below is its own statement: the order in which a function's
// arguments are evaluated is unspecified, and the byte stream must not depend on it.

namespace vantorel {

namespace {

constexpr int32_t kLACs[] = {0x2B1C, 0x2B1D};
constexpr int32_t kRxLevAccessMin = 6;
constexpr int32_t kReselectOffset = 4;

std::string number(int32_t v) {
    return StringFormat::format("%d", v);
}

// A dictionary of string leaves, in the given order.
DictionaryRef strings(std::initializer_list<std::pair<const char*, std::string>> entries) {
    auto d = Dictionary::create();
    for (const auto& [key, value] : entries) d->set(key, Value(value));
    return d;
}

// A one-entry dictionary around value, which the receiver collapses to value.
Value wrapped(const char* key, Value value) {
    auto d = Dictionary::create();
    d->set(key, std::move(value));
    return Value(d);
}

}  // namespace

IFXScenario::IFXScenario(uint64_t seed) : EmulatorScenario(seed) {
    restart();
}

std::string IFXScenario::technology() const {
    return kTSLogChannelTechnology_IFX;
}

std::string IFXScenario::description() const {
    return "GSM handset of 208-10 on the IFX channel: display property lists, cell changes and calls";
}

std::chrono::milliseconds IFXScenario::tickInterval() const {
    return std::chrono::milliseconds(1000);
}

// ---- state -------------------------------------------------------------------

void IFXScenario::restart() {
    reseed();
    nextTick_ = 0;
    for (size_t k = 0; k < kPool; ++k) {
        Cell& c = cells_[k];
        c = Cell{};
        if (k % 2 == 0) {
            c.arfcn = uniform(1, 124);
        } else {
            c.arfcn = uniform(512, 885);
        }
        c.ncc = uniform(0, 7);
        c.bcc = uniform(0, 7);
        c.cellId = uniform(1000, 65000);
        c.lac = kLACs[k < 5 ? 0 : 1];
        c.rxlev = uniform(12, 32);
        c.present = k < 6;
    }
    serving_ = 0;
    cells_[0].rxlev = uniform(34, 44);
    sinceChange_ = 0;
    betterTicks_ = 0;
    rxqual_ = 0;
    reselecting_ = false;
    inCall_ = false;
    callTicks_ = uniform(30, 40);
    timingAdvance_ = uniform(1, 12);
    txPowerLevel_ = 5;
    dtx_ = false;
    hopping_.clear();
}

void IFXScenario::evolveLevels() {
    for (Cell& c : cells_) {
        int32_t step = uniform(-2, 2);
        c.rxlev = std::clamp(pulled(c.rxlev, step, 28), 0, 63);
    }
    int32_t q = uniform(-1, 1);
    rxqual_ = std::clamp(rxqual_ + q, 0, cells_[serving_].rxlev < 20 ? 7 : 3);
    // Neighbours come and go, 3 to 6 of them besides the serving cell.
    if (chance(10)) {
        const size_t k = static_cast<size_t>(uniform(0, static_cast<int32_t>(kPool) - 1));
        const auto n = std::count_if(cells_.begin(), cells_.end(), [](const Cell& c) { return c.present; });
        if (k != serving_) {
            if (cells_[k].present && n > 4) {
                cells_[k].present = false;
            } else if (!cells_[k].present && n < 7) {
                cells_[k].present = true;
            }
        }
    }
    if (inCall_) {
        int32_t ta = uniform(-1, 1);
        timingAdvance_ = std::clamp(timingAdvance_ + ta, 0, 63);
        int32_t p = uniform(-1, 1);
        txPowerLevel_ = std::clamp(txPowerLevel_ + p, 5, 19);
    }
}

bool IFXScenario::evolveServing() {
    reselecting_ = false;
    ++sinceChange_;
    if (inCall_) return false;  // a handover is not modelled; the call stays on its cell
    size_t best = serving_;
    for (size_t k = 0; k < kPool; ++k) {
        if (cells_[k].present && cells_[k].rxlev > cells_[best].rxlev) best = k;
    }
    const bool stronger = best != serving_ && cells_[best].rxlev >= cells_[serving_].rxlev + 6;
    betterTicks_ = stronger ? betterTicks_ + 1 : 0;
    if (betterTicks_ < 2 && sinceChange_ < 25) return false;
    if (best == serving_) {
        // No neighbour stronger after 25 ticks: the network moves us to the next listed one.
        best = (serving_ + 1) % kPool;
        while (!cells_[best].present) best = (best + 1) % kPool;
        cells_[best].rxlev = std::max(cells_[best].rxlev, cells_[serving_].rxlev + 2);
    }
    cells_[serving_].present = true;  // the old serving cell stays listed, as a neighbour
    serving_ = best;
    sinceChange_ = 0;
    betterTicks_ = 0;
    reselecting_ = true;
    return true;
}

void IFXScenario::evolveCall() {
    if (--callTicks_ > 0) return;
    inCall_ = !inCall_;
    if (!inCall_) {
        callTicks_ = uniform(30, 40);
        hopping_.clear();
        return;
    }
    callTicks_ = uniform(8, 14);
    int32_t d = uniform(0, 1);
    dtx_ = d == 1;
    // The traffic channel hops over 2..5 GSM 900 carriers, 4 apart.
    const int32_t count = uniform(2, 5);
    const int32_t first = uniform(1, 124 - 4 * count);
    hopping_.clear();
    for (int32_t i = 0; i < count; ++i) hopping_.push_back(first + 4 * i);
}

std::vector<Bytes> IFXScenario::step() {
    const uint64_t tick = nextTick_++;
    if (tick > 0) {
        evolveLevels();
        evolveServing();
        evolveCall();
    }
    if (tick % kRefusedPeriod == kRefusedPeriod / 2) return {refusedMessage(tick)};
    const auto format = tick % 5 == 4 ? PropertyListSerialization::Format::Binary : PropertyListSerialization::Format::XML;
    return {PropertyListSerialization::write(display(false), format).value_or(Bytes{})};
}

// ---- messages ------------------------------------------------------------------

Value IFXScenario::display(bool integerRxLev) const {
    const Cell& s = cells_[serving_];
    const int32_t c1 = s.rxlev - kRxLevAccessMin;
    auto identity = strings({{"MCC", "208"}, {"MNC", "10"}, {"LAC", number(s.lac)}, {"Cell ID", number(s.cellId)},
                             {"ARFCN", number(s.arfcn)}, {"BSIC", number(s.ncc) + number(s.bcc)}});
    auto measurement = strings({{"RxLev", number(s.rxlev)}, {"RxQual", number(rxqual_)}, {"C1", number(c1)},
                                {"C2", number(c1 + kReselectOffset)}});
    if (integerRxLev) measurement->set("RxLev", Value::integer(s.rxlev));
    auto serving = Dictionary::create();
    serving->set("Identity", wrapped("Cell", Value(identity)));
    serving->set("Measurement", Value(measurement));

    auto neighbours = Array::create();
    std::vector<const Cell*> listed;
    for (size_t k = 0; k < kPool; ++k) {
        if (k != serving_ && cells_[k].present) listed.push_back(&cells_[k]);
    }
    neighbours->append(Value(StringFormat::format("%zu cells", listed.size())));
    for (const Cell* c : listed) {
        auto cell = strings({{"ARFCN", number(c->arfcn)}, {"BSIC", number(c->ncc) + number(c->bcc)},
                             {"RxLev", number(c->rxlev)}});
        neighbours->append(wrapped("Cell", Value(cell)));
    }

    const char* rrState = inCall_ ? "Dedicated" : reselecting_ ? "Cell Reselection" : "Idle";
    auto rr = strings({{"RR State", rrState},
                       {"Channel Type", inCall_ ? "TCH/F" : "BCCH"},
                       {"Timing Advance", inCall_ ? number(timingAdvance_) : "Not Available"},
                       {"Tx Power Level", inCall_ ? number(txPowerLevel_) : "Not Available"},
                       {"DTX", dtx_ && inCall_ ? "On" : "Off"}});
    if (inCall_) {
        auto ma = Array::create();
        ma->append(Value("MA"));
        for (int32_t arfcn : hopping_) ma->append(Value(number(arfcn)));
        rr->set("Hopping", Value(ma));
    }

    auto top = Dictionary::create();
    top->set("Serving Cell", Value(serving));
    top->set("Neighbours", Value(neighbours));
    top->set("Radio Resource", Value(rr));
    top->set("Registration",
             wrapped("Status", Value(s.rxlev > kRxLevAccessMin ? "Registered, home network" : "Limited service")));
    return Value(top);
}

Bytes IFXScenario::refusedMessage(uint64_t tick) const {
    if ((tick / kRefusedPeriod) % 2 == 1) {
        return PropertyListSerialization::write(display(true), PropertyListSerialization::Format::Binary)
            .value_or(Bytes{});
    }
    constexpr std::string_view kCut =
        "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<plist version=\"1.0\">\n<dict>\n\t<key>Serving Cell</key>\n\t<dict>\n\t\t<key>Ide";
    return Bytes(kCut.begin(), kCut.end());
}

}  // namespace vantorel

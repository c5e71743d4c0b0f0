// LTEScenario: the emulator's LTE modem driving through its network, the radio levels and cell changes computed tick by tick and sent in the byte layouts the LTE decoders read.
#include "TelephonyService/Emulator/LTEScenario.h"

#include "Platform/LogCodes.h"
#include "Platform/RecordBuilder.h"
#include "Platform/StringFormat.h"
#include "Platform/TelephonyIdentifiers.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"

#include <algorithm>
#include <bit>
#include <cmath>
#include <string_view>

// Portability notes: the order in which a function's arguments are evaluated is
// unspecified, so every random draw below is its own statement (never two draws
// in one expression); and the radio levels are integer arithmetic (hundredths of a
// dB, a logarithm computed bit by bit, a table for adding powers), never the
// floating-point library's logarithms, whose last bits differ between libraries.
// That keeps the byte stream the same with every compiler and machine.

namespace vantorel {

namespace {

// A carrier of the network: downlink EARFCN (uplink = downlink + 18000 on these
// FDD bands), 3GPP band, bandwidth in resource blocks, idle-mode layer priority,
// whether SIB1 carries P-Max, and the reference signal's EIRP per resource element
// in hundredths of a dBm (less path loss on 800 MHz, more on 2600 MHz, folded in).
struct Carrier {
    uint16_t earfcn;
    int32_t band;
    uint8_t resourceBlocks;
    uint8_t priority;
    bool pMax;
    int32_t eirp;
};
constexpr Carrier kCarriers[] = {
    {1300, 3, 100, 5, true, 2700},   // 1800 MHz, 20 MHz wide
    {6300, 20, 50, 3, false, 3400},  // 800 MHz, 10 MHz wide
    {3050, 7, 100, 6, true, 2300},   // 2600 MHz, 20 MHz wide
};
constexpr size_t kCarrierCount = std::size(kCarriers);

// The map, in metres: the loop road the UE drives (a closed polygon, about 16.4 km)
// and the sites, most of them 150..600 m beside the road, one on a hill inside the loop.
struct Point {
    int32_t x, y;
};
constexpr Point kRoute[] = {{0, 0},       {2500, -300}, {4200, 400},  {4800, 2000}, {4300, 3600},
                            {2600, 4300}, {800, 4000},  {-600, 3000}, {-900, 1400}};
constexpr Point kSites[] = {{350, 250},   {1800, -550}, {3300, 250}, {4650, 1150}, {4350, 2700}, {3600, 4200},
                            {2000, 3850}, {450, 4300},  {-950, 2400}, {-350, 800},  {2200, 2100}};
constexpr int64_t kAntennaHeight = 30;  // m above the road, in the distance

constexpr int32_t kSpeedMin = 800;      // cm/s: 29 km/h
constexpr int32_t kSpeedMax = 1700;     // 61 km/h
constexpr int32_t kSpeedTypical = 1250; // 45 km/h

constexpr int32_t kShadowSigma = 400;          // 4 dB
constexpr int64_t kShadowDistanceCm = 80 * 100;  // decorrelation distance, 80 m
constexpr int32_t kFastVariation = 60;         // +-0.6 dB per measurement
constexpr int32_t kRSRQFloor = -1950;          // -19.5 dB
constexpr int32_t kNoisePerRE = -12520;        // -174 dBm/Hz + 15 kHz + 7 dB noise figure
constexpr int32_t kMeasuredThreshold = -12400; // measured neighbours from -124 dBm
constexpr int32_t kDetectedThreshold = -13400; // detected cells from -134 dBm

constexpr int64_t kMCC = 262;
constexpr int64_t kMNC = 1;
constexpr int64_t kTAC = 0x6A4D;
constexpr int32_t kLAC = 0x6A4C;  // the overlaid 2G/3G location area (combined attach)

// Idle-mode parameters broadcast by every cell (SIB1 / SIB3), in the raw units of 0xB17F.
constexpr int32_t kQrxlevmin = -124;     // dBm; raw (x + 140) / 2 = 8
constexpr uint32_t kSIntraSearch = 20;   // 40 dB in 2 dB steps
constexpr uint32_t kSNonIntraSearch = 5; // 10 dB in 2 dB steps
constexpr uint32_t kUEMaxPower = 53;     // 23 dBm (power class 3), raw x - 30

uint32_t clampRaw(int32_t raw, uint32_t bits) {
    return static_cast<uint32_t>(std::clamp(raw, 0, static_cast<int32_t>((1u << bits) - 1)));
}

// a / b rounded to the nearest integer (halves upwards), for negative a too (b > 0).
int32_t roundedDiv(int64_t a, int64_t b) {
    int64_t n = a + b / 2;
    return static_cast<int32_t>(n >= 0 ? n / b : -((-n + b - 1) / b));
}

// log2(x) in units of 1/65536 for x >= 1: the integer part from the top bit, the
// fraction bit by bit (squaring the mantissa, kept in [1, 2) as Q30, doubles it).
int64_t log2Q16(uint64_t x) {
    const int n = 63 - std::countl_zero(x | 1);
    int64_t result = static_cast<int64_t>(n) << 16;
    uint64_t m = n <= 30 ? x << (30 - n) : x >> (n - 30);
    for (int bit = 15; bit >= 0; --bit) {
        m = (m * m) >> 30;
        if (m >= (uint64_t{2} << 30)) {
            m >>= 1;
            result += int64_t{1} << bit;
        }
    }
    return result;
}

// 10 log10(x) in hundredths of a dB (x >= 1): 301.03 x log2(x).
int32_t hundredthsDB(uint64_t x) {
    return roundedDiv(log2Q16(x) * 30103, int64_t{100} << 16);
}

// The power sum of two levels in hundredths of a dB: the larger plus
// 10 log10(1 + 10^(-difference / 10)), from this table at 1 dB steps, interpolated.
constexpr int32_t kPowerSumTable[] = {301, 254, 212, 176, 146, 119, 97, 79, 64, 51, 41, 33, 27,
                                      21,  17,  14,  11,  9,   7,   5,  4,  3,  3,  2,  2,  0};
int32_t powerSum(int32_t a, int32_t b) {
    const int32_t high = std::max(a, b);
    const int32_t difference = high - std::min(a, b);
    const size_t i = static_cast<size_t>(difference / 100);
    if (i + 1 >= std::size(kPowerSumTable)) return high;
    const int32_t fraction = difference % 100;
    return high + kPowerSumTable[i] + (kPowerSumTable[i + 1] - kPowerSumTable[i]) * fraction / 100;
}

// The loop's length and the UE's point at a position along it, in centimetres.
int64_t segmentLengthCm(size_t i) {
    const Point& a = kRoute[i];
    const Point& b = kRoute[(i + 1) % std::size(kRoute)];
    const int64_t dx = int64_t{b.x - a.x} * 100;
    const int64_t dy = int64_t{b.y - a.y} * 100;
    // sqrt is exactly rounded (IEEE 754), so this is the same everywhere.
    return static_cast<int64_t>(std::sqrt(static_cast<double>(dx * dx + dy * dy)));
}
int64_t routeLengthCm() {
    int64_t total = 0;
    for (size_t i = 0; i < std::size(kRoute); ++i) total += segmentLengthCm(i);
    return total;
}
struct PointCm {
    int64_t x, y;
};
PointCm pointAt(int64_t positionCm) {
    for (size_t i = 0; i < std::size(kRoute); ++i) {
        const int64_t length = segmentLengthCm(i);
        if (positionCm < length || i + 1 == std::size(kRoute)) {
            const Point& a = kRoute[i];
            const Point& b = kRoute[(i + 1) % std::size(kRoute)];
            return {int64_t{a.x} * 100 + int64_t{b.x - a.x} * 100 * positionCm / length,
                    int64_t{a.y} * 100 + int64_t{b.y - a.y} * 100 * positionCm / length};
        }
        positionCm -= length;
    }
    return {0, 0};
}

// The path gain from a site to a point, hundredths of a dB: EIRP - (15.3 + 37.6 log10(d / m)),
// with 37.6 log10(d) = 1.88 x 10 log10(d^2).
int32_t pathGain(const Carrier& carrier, const Point& site, PointCm at) {
    const int64_t dx = (at.x - int64_t{site.x} * 100) / 100;
    const int64_t dy = (at.y - int64_t{site.y} * 100) / 100;
    const uint64_t d2 = static_cast<uint64_t>(dx * dx + dy * dy + kAntennaHeight * kAntennaHeight);
    return carrier.eirp - (1530 + roundedDiv(int64_t{hundredthsDB(d2)} * 188, 100));
}

// A standard normal draw in thousandths, from three uniform draws (their sum has
// unit variance and stays within three deviations).
template <class Uniform>
int32_t normalThousandths(Uniform&& uniform) {
    int32_t sum = uniform(-1000, 1000);
    sum += uniform(-1000, 1000);
    sum += uniform(-1000, 1000);
    return sum;
}

// The share of a cell's resource elements that carry power at a load (percent), in
// hundredths of a dB: reference signals always (1/6 of the elements in their symbols),
// data elements by the load.
int32_t activityDB(int32_t loadPercent) {
    const int32_t perMille = 167 + 833 * std::clamp(loadPercent, 0, 100) / 100;
    return hundredthsDB(static_cast<uint64_t>(perMille)) - 3000;
}

// Srxlev = measured RSRP - Qrxlevmin (no power compensation at 23 dBm), in dB, from quarter dB.
int32_t srxlev(int32_t rsrpQuarter) {
    return rsrpQuarter / 4 - kQrxlevmin;
}

int32_t quarterDB(int32_t hundredths) {
    return roundedDiv(hundredths, 25);
}

}  // namespace

LTEScenario::LTEScenario(uint64_t seed) : EmulatorScenario(seed) {
    restart();
}

std::string LTEScenario::technology() const {
    return kTSLogChannelTechnology_Morvek_LTE;
}

std::string LTEScenario::description() const {
    return "LTE UE of 262-01 driving a loop: path loss and shadowing, neighbours, A3 handovers, idle reselection candidates";
}

// ---- state -------------------------------------------------------------------

void LTEScenario::restart() {
    reseed();
    nextTick_ = 0;
    drxBelowZero_ = 0;

    // SIM identity: ICCID 89 49 01 (telecom, Germany, issuer) + 12 digits + Luhn.
    drawSubscriber(sim_, "894901", 12, "+49151");
    sim_.plmn = "62F210";  // 262-01
    sim_.lac = static_cast<int>(kLAC);
    sim_.hpplmn = "05";  // 5 x 6 min
    sim_.ptmsiSignature = "5E7A01";
    sim_.acc = "0008";  // access class 3
    sim_.fplmn = "62F22062F230FFFFFFFFFFFF";  // 262-02, 262-03 forbidden
    sim_.oplmnAcT = "62F2104000";  // 262-01 with E-UTRAN
    const int32_t enodeBase = uniform(0x10000, 0xF0000);
    carrier_ = static_cast<size_t>(uniform(0, static_cast<int32_t>(kCarrierCount) - 1));

    commonShadow_ = shadowDraw();

    // The cells: PCIs planned as 3 x group + sector with a group of its own per site.
    std::array<bool, 168> groupUsed{};
    for (size_t k = 0; k < kSiteCount; ++k) {
        LTECell& c = cells_[k];
        c = LTECell{};
        int32_t group = uniform(0, 167);
        while (groupUsed[static_cast<size_t>(group)]) group = (group + 1) % 168;
        groupUsed[static_cast<size_t>(group)] = true;
        const int32_t sector = uniform(0, 2);
        c.pci = static_cast<uint16_t>(3 * group + sector);
        c.cellIdentity = ((enodeBase + static_cast<int32_t>(k)) << 8) | (sector + 1 + 10 * static_cast<int32_t>(carrier_));
        const int32_t fourAntennas = uniform(0, 2);
        c.txAntennas = fourAntennas == 0 ? 4 : 2;
        c.timing = uniform(0, 307199);
        c.frequencyOffset = static_cast<uint16_t>(uniform(0, 300));
        c.shadow = shadowDraw();
        c.loadTarget = uniform(15, 70);
        c.load = c.loadTarget;
    }

    // The start: a random place on the loop, moved to a few hundred metres before the
    // next point where another cell's path gain overtakes the best one's.
    const int64_t length = routeLengthCm();
    int64_t start = static_cast<int64_t>(random() % static_cast<uint32_t>(length));
    const auto bestAt = [this](int64_t position) {
        const PointCm at = pointAt(position);
        size_t best = 0;
        for (size_t k = 1; k < kSiteCount; ++k)
            if (pathGain(kCarriers[carrier_], kSites[k], at) > pathGain(kCarriers[carrier_], kSites[best], at)) best = k;
        return best;
    };
    const size_t first = bestAt(start);
    int64_t border = start;
    for (int64_t walked = 0; walked < length && bestAt(border) == first; walked += 1000) border = (border + 1000) % length;
    const int32_t lead = uniform(250, 400);
    position_ = (border + length - int64_t{lead} * 100) % length;
    speed_ = kSpeedTypical;

    serving_ = 0;
    connected_ = false;
    measure(0);
    for (LTECell& c : cells_) {
        c.filteredRsrp = c.rsrp;
        c.filteredRsrq = c.rsrq;
    }
    for (size_t k = 1; k < kSiteCount; ++k)
        if (cells_[k].filteredRsrp > cells_[serving_].filteredRsrp) serving_ = k;
    rankNeighbours();
    lastRules_ = measurementRules();

    // Reselection candidates: the two other LTE carriers, two UMTS band I carriers,
    // a GSM 900 and a DCS 1800 cell.
    for (size_t k = 0; k < kCandidatePool; ++k) {
        Candidate& c = candidates_[k];
        c = Candidate{};
        if (k < 2) {
            c.rat = 0;
            c.identity = static_cast<uint16_t>(uniform(0, 503));
        } else if (k < 4) {
            c.rat = 1;
            c.priority = 2;
            c.channel = k == 2 ? 10737 : 10812;
            c.identity = static_cast<uint16_t>(uniform(0, 511));
        } else {
            c.rat = 2;
            c.priority = 1;
            c.channel = static_cast<uint16_t>(k == 4 ? uniform(1, 124) : uniform(512, 885));
            c.band = 0;  // DCS 1800 interpretation of 512..885
            int32_t ncc = uniform(0, 7);
            int32_t bcc = uniform(0, 7);
            c.identity = static_cast<uint16_t>(ncc * 8 + bcc);
        }
        c.present = k != 3 && k != 5;
    }
    retuneLTECandidates();

    connected_ = false;
    dwell_ = uniform(3, 5);  // a short first idle period, so both modes show soon

    bearers_[0] = PacketContext{"internet", "IP", "0.0.0.0", 5, false};
    bearers_[1] = PacketContext{"ims", "IPV6", "::", 6, false};
    int32_t b = uniform(0, 255);
    int32_t c = uniform(0, 255);
    int32_t d = uniform(2, 254);
    bearers_[0].address = dottedAddress(10, b, c, d);  // the default bearer comes with the attach
    bearers_[0].active = true;
}

void LTEScenario::retuneLTECandidates() {
    // The LTE candidates are the carriers other than the serving one.
    size_t k = 0;
    for (size_t carrier = 0; carrier < kCarrierCount && k < 2; ++carrier) {
        if (carrier == carrier_) continue;
        candidates_[k].channel = kCarriers[carrier].earfcn;
        candidates_[k].priority = kCarriers[carrier].priority;
        ++k;
    }
}

void LTEScenario::drive() {
    // The speed wanders between town and through-road speeds.
    const int32_t change = uniform(-40, 40);
    speed_ = std::clamp(pulled(speed_, change, kSpeedTypical), kSpeedMin, kSpeedMax);
    const int64_t travelled = int64_t{speed_} * tickInterval().count() / 1000;
    position_ = (position_ + travelled) % routeLengthCm();
    measure(travelled);
    rankNeighbours();
}

void LTEScenario::measure(int64_t travelledCm) {
    const Carrier& carrier = kCarriers[carrier_];
    const PointCm at = pointAt(position_);
    // Shadowing as a first-order process over distance: s' = a s + sqrt(1 - a^2) sigma w,
    // a = 1 - travelled / decorrelation distance (thousandths).
    const int64_t a = std::max<int64_t>(0, 1000 - travelledCm * 1000 / kShadowDistanceCm);
    const int64_t innovation = static_cast<int64_t>(std::sqrt(static_cast<double>(1000000 - a * a)));
    const auto fade = [&](int32_t& shadow) {
        const int32_t w = normalThousandths([this](int32_t lo, int32_t hi) { return uniform(lo, hi); });
        shadow = static_cast<int32_t>((a * shadow + innovation * kShadowSigma * w / 1000) / 1000);
    };
    if (travelledCm > 0) fade(commonShadow_);
    int32_t total = kNoisePerRE;
    for (size_t k = 0; k < kSiteCount; ++k) {
        LTECell& c = cells_[k];
        if (travelledCm > 0) fade(c.shadow);
        // The load wanders around the cell's own level; the UE's traffic adds to its serving cell.
        const int32_t change = uniform(-3, 3);
        c.load = std::clamp(pulled(c.load, change, c.loadTarget), 5, 95);
        // Half of the shadowing is the surroundings of the UE, common to every site (correlation 0.5).
        c.local = pathGain(carrier, kSites[k], at) + roundedDiv(int64_t{707} * (commonShadow_ + c.shadow), 1000);
        const int32_t fast = uniform(-kFastVariation, kFastVariation);
        c.rsrp = c.local + fast;
        const int32_t load = c.load + (connected_ && k == serving_ ? 25 : 0);
        total = powerSum(total, c.local + activityDB(load));
        const int32_t drift = uniform(-16, 16);
        c.timing = std::clamp(c.timing + drift, 0, 307199);
    }
    // RSRQ = N x RSRP / RSSI with RSSI = 12 N x the power per resource element: RSRP - total - 10 log10 12.
    rssi_ = total + hundredthsDB(12u * carrier.resourceBlocks);
    const int32_t twelve = hundredthsDB(12);
    for (LTECell& c : cells_) {
        // Below -19.5 dB the UE reports the bottom of the RSRQ range (TS 36.133).
        c.rsrq = std::max(c.rsrp - total - twelve, kRSRQFloor);
        // Layer 3 filtering, coefficient 1/2 per tick.
        c.filteredRsrp += roundedDiv(c.rsrp - c.filteredRsrp, 2);
        c.filteredRsrq += roundedDiv(c.rsrq - c.filteredRsrq, 2);
    }
}

int32_t LTEScenario::shadowDraw() {
    const int32_t w = normalThousandths([this](int32_t lo, int32_t hi) { return uniform(lo, hi); });
    return roundedDiv(int64_t{w} * kShadowSigma, 1000);
}

int32_t LTEScenario::shownFilteredRsrp(const LTECell& c) const {
    return 2 * roundedDiv(c.filteredRsrp, 50);
}

void LTEScenario::rankNeighbours() {
    std::vector<size_t> others;
    for (size_t k = 0; k < kSiteCount; ++k)
        if (k != serving_) others.push_back(k);
    std::stable_sort(others.begin(), others.end(),
                     [this](size_t a, size_t b) { return cells_[a].filteredRsrp > cells_[b].filteredRsrp; });
    measured_.clear();
    detected_.clear();
    for (size_t k : others) {
        const int32_t level = cells_[k].filteredRsrp;
        if (measured_.size() < kMeasuredCells && level >= kMeasuredThreshold) {
            measured_.push_back(k);
        } else if (detected_.size() < kDetectedCells && level >= kDetectedThreshold) {
            detected_.push_back(k);
        }
    }
}

void LTEScenario::countBetterTicks() {
    const int32_t serving = shownFilteredRsrp(cells_[serving_]);
    for (size_t k = 0; k < kSiteCount; ++k) {
        LTECell& c = cells_[k];
        const bool listed = std::find(measured_.begin(), measured_.end(), k) != measured_.end();
        const bool better = listed && shownFilteredRsrp(c) >= serving + kHysteresisQuarterDB;
        c.betterTicks = better ? c.betterTicks + 1 : 0;
    }
}

bool LTEScenario::changeCellIfTriggered() {
    // The best of the cells that met the rule for the time-to-trigger takes over.
    size_t target = kSiteCount;
    for (size_t k = 0; k < kSiteCount; ++k) {
        const LTECell& c = cells_[k];
        if (c.betterTicks < kTimeToTriggerTicks) continue;
        if (target == kSiteCount || c.filteredRsrp > cells_[target].filteredRsrp) target = k;
    }
    if (target == kSiteCount) return false;
    serving_ = target;
    for (LTECell& c : cells_) c.betterTicks = 0;
    return true;
}

// The measurement rules in force (4 bits): bit 0 intra-frequency cells
// (Srxlev <= SIntraSearch), bit 1 inter-frequency / inter-RAT layers of equal or
// lower priority (Srxlev <= SNonIntraSearch), bit 2 higher-priority layers (measured
// whenever the serving layer is not the highest).
uint8_t LTEScenario::measurementRules() const {
    const int32_t s = srxlev(shownFilteredRsrp(cells_[serving_]));
    uint8_t rules = 0;
    if (s <= static_cast<int32_t>(2 * kSIntraSearch)) rules |= 1;
    if (s <= static_cast<int32_t>(2 * kSNonIntraSearch)) rules |= 2;
    if (kCarriers[carrier_].priority < 6) rules |= 4;
    return rules;
}

void LTEScenario::evolveMode() {
    if (--dwell_ > 0) return;
    // RRC connection setup when data flows, release after the inactivity timer.
    connected_ = !connected_;
    dwell_ = connected_ ? uniform(15, 40) : uniform(8, 20);
}

bool LTEScenario::evolveCandidates() {
    if (!chance(15)) return false;
    Candidate& c = candidates_[static_cast<size_t>(uniform(0, static_cast<int32_t>(kCandidatePool) - 1))];
    auto n = std::count_if(candidates_.begin(), candidates_.end(), [](const Candidate& x) { return x.present; });
    if (c.present && n > 2) {
        c.present = false;
        return true;
    }
    if (!c.present && n < 5) {
        c.present = true;
        return true;
    }
    return false;
}

bool LTEScenario::evolveBearers() {
    // The IMS bearer is set up while connected and released now and then.
    PacketContext& ims = bearers_[1];
    if (connected_ && !ims.active && chance(6)) {
        int32_t host = uniform(1, 0xFFFF);
        ims.address = StringFormat::format("2a01:598:%x:%x::1", static_cast<unsigned>(uniform(0, 0xFFFF)),
                                           static_cast<unsigned>(host));
        ims.active = true;
        return true;
    }
    if (ims.active && chance(4)) {
        ims.active = false;
        ims.address = "::";
        return true;
    }
    return false;
}

std::vector<Bytes> LTEScenario::step() {
    const uint64_t tick = nextTick_++;
    bool cellChanged = tick == 0;
    bool candidatesChanged = tick == 0;
    bool bearersChanged = false;
    if (tick > 0) {
        // The cell change the earlier ticks' measurements triggered, then this tick's drive.
        cellChanged = changeCellIfTriggered();
        evolveMode();
        drive();
        candidatesChanged = evolveCandidates() || cellChanged;
        bearersChanged = evolveBearers();
    }
    countBetterTicks();

    std::vector<Bytes> out;
    if (tick == 0) {
        // The extras first, so the display fills at once.
        out.push_back(simFilesRecord(sim_, false));
        out.push_back(cellMonitorRecord(false));
        out.push_back(packetContextsRecord(bearers_, false));
    }
    if (cellChanged || tick % 10 == 0) out.push_back(servingCellRecord(tick));
    if (cellChanged || tick % 20 == 0) out.push_back(antennaRecord(tick));
    // Both modes' measurements on a cell change, so no section still names the old cell.
    if (connected_ || cellChanged) out.push_back(connectedMeasurementRecord(tick, tick % 7 == 3));
    if (!connected_ || cellChanged) {
        out.push_back(servingMeasurementRecord(tick));
        if (!measured_.empty()) out.push_back(neighbourMeasurementRecord(tick));
        if (candidatesChanged || tick % 5 == 0) out.push_back(reselectionCandidatesRecord(tick));
    }
    if (tick > 0 && (cellChanged || tick % 10 == 0)) out.push_back(cellMonitorRecord((tick / 10) % 2 == 1));
    if (tick > 0 && (bearersChanged || tick % 20 == 0)) out.push_back(packetContextsRecord(bearers_, (tick / 20) % 2 == 1));
    if (tick > 0 && tick % 60 == 0) out.push_back(simFilesRecord(sim_, (tick / 60) % 2 == 1));
    if (tick % kMalformedPeriod == 12) out.push_back(malformedRecord(tick));
    return out;
}

// ---- records -----------------------------------------------------------------

Bytes LTEScenario::servingCellRecord(uint64_t tick) const {
    const Carrier& carrier = kCarriers[carrier_];
    const LTECell& serving = cells_[serving_];
    return RecordBuilder::ordinary(LogCode::kLTEServingCellInfo, 38)
        .timestamp(timestampForTick(tick))
        .u8(13, 1)                                                // 13: record version
        .u16(14, serving.pci)                                     // 14-15: physical cell identity
        .u16(16, carrier.earfcn)                                  // 16-17: downlink EARFCN
        .u16(18, static_cast<uint16_t>(carrier.earfcn + 18000))   // 18-19: uplink EARFCN
        .u8(20, carrier.resourceBlocks)                           // 20: downlink bandwidth in RBs
        .u8(21, carrier.resourceBlocks)                           // 21: uplink bandwidth in RBs
        .u32(22, static_cast<uint32_t>(serving.cellIdentity))     // 22-25: 28-bit cell identity
        .u16(26, static_cast<uint16_t>(kTAC))                     // 26-27: tracking area code
        .u32(28, static_cast<uint32_t>(carrier.band))             // 28-31: frequency band indicator
        .build();
}

Bytes LTEScenario::antennaRecord(uint64_t tick) const {
    const LTECell& serving = cells_[serving_];
    return RecordBuilder::ordinary(LogCode::kLTEMasterInfoBlock, 22)
        .timestamp(timestampForTick(tick))
        .u8(13, 1)                    // 13: record version
        .u16(14, serving.pci)         // 14-15: physical cell identity
        .u8(20, serving.txAntennas)   // 20: number of eNodeB transmit antennas (PBCH detection)
        .build();
}

Bytes LTEScenario::connectedMeasurementRecord(uint64_t tick, bool withPrefix) const {
    const LTECell& serving = cells_[serving_];
    const size_t n = measured_.size();
    const size_t d = detected_.size();
    // 23-24 and neighbour RSRP: (dBm + 140) x 4; 25-26 and neighbour RSRQ: (dB + 20) x 8.
    auto rawRSRP = [](int32_t quarter) { return static_cast<uint16_t>(clampRaw(quarter + 560, 16)); };
    auto rawRSRQ = [](int32_t hundredths) { return static_cast<uint16_t>(clampRaw(2 * quarterDB(hundredths) + 160, 16)); };
    const uint16_t subframe = static_cast<uint16_t>((tick * 500 + serving.pci) % 10240);  // SFN x 10 + subframe
    RecordBuilder b = RecordBuilder::ordinary(LogCode::kLTEIntraFreqMeasurement, 29 + 6 * n + 2 * d);
    b.timestamp(timestampForTick(tick))
        .u8(13, 1)                                          // 13: record version (the original layout)
        .u16(17, kCarriers[carrier_].earfcn)                // 17-18: EARFCN
        .u16(19, serving.pci)                               // 19-20: serving PCI
        .u16(21, subframe)                                  // 21-22: subframe number
        .u16(23, rawRSRP(shownFilteredRsrp(serving)))       // 23-24: serving filtered RSRP
        .u16(25, rawRSRQ(serving.filteredRsrq))             // 25-26: serving filtered RSRQ
        .u8(27, static_cast<uint8_t>(n))                    // 27: measured neighbours
        .u8(28, static_cast<uint8_t>(d));                   // 28: detected cells
    for (size_t i = 0; i < n; ++i) {  // 6-byte entries from 29: PCI, filtered RSRP, filtered RSRQ
        const LTECell& c = cells_[measured_[i]];
        b.u16(29 + 6 * i, c.pci);
        b.u16(31 + 6 * i, rawRSRP(shownFilteredRsrp(c)));
        b.u16(33 + 6 * i, rawRSRQ(c.filteredRsrq));
    }
    for (size_t i = 0; i < d; ++i) b.u16(29 + 6 * n + 2 * i, cells_[detected_[i]].pci);  // then 2-byte PCIs
    return withPrefix ? b.buildWithPrefix() : b.build();
}

Bytes LTEScenario::servingMeasurementRecord(uint64_t tick) {
    const Carrier& carrier = kCarriers[carrier_];
    const LTECell& serving = cells_[serving_];
    const int32_t rsrp = quarterDB(serving.rsrp);
    const int32_t averageRsrp = shownFilteredRsrp(serving);
    const int32_t s = srxlev(averageRsrp);
    drxBelowZero_ = s < 0 ? std::min(drxBelowZero_ + 1, 63) : 0;
    const uint8_t rules = measurementRules();
    const bool rulesUpdated = rules != lastRules_;
    lastRules_ = rules;

    // 19: bits 0-8 PCI, 9-12 serving layer priority.
    const uint32_t w19 = serving.pci | (static_cast<uint32_t>(carrier.priority) << 9);
    // 21: bits 0-8 RSRP, 9-17 average RSRP ((dBm + 140) x 4), 18-24 RSRQ, 25-31 average RSRQ ((dB + 30) x 4).
    const uint32_t w21 = clampRaw(rsrp + 560, 9) | (clampRaw(averageRsrp + 560, 9) << 9) |
                         (clampRaw(quarterDB(serving.rsrq) + 120, 7) << 18) |
                         (clampRaw(quarterDB(serving.filteredRsrq) + 120, 7) << 25);
    // 25: bits 0-8 RSSI ((dBm + 140) x 2), 9-14 Qrxlevmin ((dBm + 140) / 2), 15-21 P-Max (dBm + 30,
    // 64 absent), 22-27 UE maximum power (dBm + 30).
    const uint32_t w25 = clampRaw(roundedDiv(rssi_, 50) + 280, 9) | (static_cast<uint32_t>((kQrxlevmin + 140) / 2) << 9) |
                         ((carrier.pMax ? 53u : 64u) << 15) | (kUEMaxPower << 22);
    // 29: bits 0-6 Srxlev (dB + 30), 7-12 DRX cycles with S < 0, 13-18 SIntraSearch, 19-24
    // SNonIntraSearch (2 dB steps, 32 absent), 25 rules updated, 26-29 measurement rules.
    const uint32_t w29 = clampRaw(s + 30, 7) | (static_cast<uint32_t>(drxBelowZero_) << 7) | (kSIntraSearch << 13) |
                         (kSNonIntraSearch << 19) | ((rulesUpdated ? 1u : 0u) << 25) |
                         (static_cast<uint32_t>(rules) << 26);
    return RecordBuilder::ordinary(LogCode::kLTEServingCellMeasurement, 33)
        .timestamp(timestampForTick(tick))
        .u8(13, 1)                         // 13: record version
        .u16(17, carrier.earfcn)           // 17-18: EARFCN
        .u32(19, w19)
        .u32(21, w21)
        .u32(25, w25)
        .u32(29, w29)
        .resize(33)
        .build();
}

Bytes LTEScenario::neighbourMeasurementRecord(uint64_t tick) const {
    const size_t n = measured_.size();  // 1..kMeasuredCells (step() sends none without neighbours)
    const Carrier& carrier = kCarriers[carrier_];
    const uint32_t rssi = clampRaw(roundedDiv(rssi_, 50) + 280, 8);  // one wideband RSSI for every cell
    RecordBuilder b = RecordBuilder::ordinary(LogCode::kLTEIdleNeighbourMeasurements, 21 + 20 * n);
    b.timestamp(timestampForTick(tick));
    b.u8(13, 2);                   // 13: record version
    b.u16(17, carrier.earfcn);     // 17-18: EARFCN
    // 19-20: bits 0-5 Qrxlevmin ((dBm + 140) / 2), bits 6-10 neighbour count - 1.
    b.u16(19, static_cast<uint16_t>(((kQrxlevmin + 140) / 2) | ((n - 1) << 6)));
    for (size_t i = 0; i < n; ++i) {
        const LTECell& c = cells_[measured_[i]];
        const size_t e = 21 + 20 * i;  // 20-byte entries from 21; levels in half dB
        const int32_t rsrpHalf = roundedDiv(c.rsrp, 50);
        const int32_t averageHalf = shownFilteredRsrp(c) / 2;
        // +0: bits 0-8 PCI, 9-16 RSSI, 17-25 RSRP ((dBm + 140) x 2).
        b.u32(e, c.pci | (rssi << 9) | (clampRaw(rsrpHalf + 280, 9) << 17));
        // +4: bits 0-8 average RSRP, 9-15 RSRQ, 16-22 average RSRQ ((dB + 30) x 4), 23-29 Srxlev (dB + 30).
        b.u32(e + 4, clampRaw(averageHalf + 280, 9) | (clampRaw(quarterDB(c.rsrq) + 120, 7) << 9) |
                         (clampRaw(quarterDB(c.filteredRsrq) + 120, 7) << 16) |
                         (clampRaw(srxlev(2 * averageHalf) + 30, 7) << 23));
        b.u16(e + 8, c.frequencyOffset);  // +8: frequency offset, Hz
        // +12 antenna 0, +16 antenna 1: bits 0-10 frame offset (subframe of the cell's frame
        // start), 11-29 sample offset within it at 30.72 MHz.
        const uint32_t t0 = static_cast<uint32_t>(c.timing);
        const uint32_t t1 = static_cast<uint32_t>(std::min(c.timing + 3, 307199));
        b.u32(e + 12, (t0 / 30720) | ((t0 % 30720) << 11));
        b.u32(e + 16, (t1 / 30720) | ((t1 % 30720) << 11));
    }
    return b.build();
}

Bytes LTEScenario::reselectionCandidatesRecord(uint64_t tick) const {
    std::vector<const Candidate*> list;
    for (const Candidate& c : candidates_) {
        if (c.present) list.push_back(&c);
    }
    std::stable_sort(list.begin(), list.end(),
                     [](const Candidate* a, const Candidate* b) { return a->priority > b->priority; });
    const size_t n = list.size();
    // Candidates are packed at a 4-byte stride from 21 (priority, RAT), the layout the
    // decoder walks; a candidate's RAT-specific part starts at its byte 4, so it shares
    // bytes with the next candidate's header and only the last one's is its own (4 bytes
    // after it: LTE EARFCN and PCI << 7, UTRAN UARFCN and PSC, GERAN ARFCN, band, BSIC).
    RecordBuilder b = RecordBuilder::ordinary(LogCode::kLTEReselectionCandidates, 21 + 4 * n + 4);
    b.timestamp(timestampForTick(tick));
    b.u8(13, 1);                                          // 13: record version
    b.u16(15, kCarriers[carrier_].earfcn);                // 15-16: serving EARFCN
    b.u16(17, cells_[serving_].pci);                      // 17-18: serving cell (PCI)
    b.u16(19, static_cast<uint16_t>(n));                  // 19-20: candidate count
    for (size_t i = 0; i < n; ++i) {
        b.u16(21 + 4 * i, list[i]->priority);
        b.u16(23 + 4 * i, list[i]->rat);
    }
    if (n > 0) {
        const Candidate& last = *list.back();
        const size_t e = 21 + 4 * n;
        b.u16(e, last.channel);
        if (last.rat == 0) {
            b.u16(e + 2, static_cast<uint16_t>(last.identity << 7));
        } else if (last.rat == 1) {
            b.u16(e + 2, last.identity);
        } else {
            b.u8(e + 2, last.band).u8(e + 3, static_cast<uint8_t>(last.identity));
        }
    }
    return b.build();
}

Bytes LTEScenario::cellMonitorRecord(bool binary) const {
    const LTECell& s = cells_[serving_];
    auto cells = Array::create();
    auto serving = monitorCell(kTSCellMonitorRadioAccessTechnologyLTE, kTSCellMonitorCellTypeServing);
    serving->set(kTSCellMonitorMCC, Value::integer(kMCC));
    serving->set(kTSCellMonitorMNC, Value::integer(kMNC));
    serving->set(kTSCellMonitorTAC, Value::integer(kTAC));
    serving->set(kTSCellMonitorCellId, Value::integer(s.cellIdentity));
    serving->set(kTSCellMonitorPID, Value::integer(s.pci));
    serving->set(kTSCellMonitorBandInfo, Value::integer(kCarriers[carrier_].band));
    serving->set(kTSCellMonitorUARFCN, Value::integer(kCarriers[carrier_].earfcn));
    cells->append(Value(serving));

    // The three strongest measured neighbours.
    for (size_t i = 0; i < measured_.size() && i < 3; ++i) {
        auto n = monitorCell(kTSCellMonitorRadioAccessTechnologyLTE, kTSCellMonitorCellTypeNeighbor);
        n->set(kTSCellMonitorPID, Value::integer(cells_[measured_[i]].pci));
        n->set(kTSCellMonitorUARFCN, Value::integer(kCarriers[carrier_].earfcn));
        cells->append(Value(n));
    }
    return RecordBuilder::extraPropertyList(LogCode::kCellMonitor, Value(cells), binary);
}

Bytes LTEScenario::malformedRecord(uint64_t tick) const {
    const uint16_t pci = cells_[serving_].pci;
    const uint16_t earfcn = kCarriers[carrier_].earfcn;
    switch ((tick / kMalformedPeriod) % 3) {
    case 0:
        // A connected-mode measurement cut after the serving RSRP: 24 bytes, below its 29-byte minimum.
        return RecordBuilder::ordinary(LogCode::kLTEIntraFreqMeasurement, 24)
            .timestamp(timestampForTick(tick))
            .u16(17, earfcn)
            .u16(19, pci)
            .build();
    case 1:
        // A serving-cell record with record type 2, neither ordinary (1) nor extra (255).
        return RecordBuilder(2, LogCode::kLTEServingCellInfo, 38)
            .timestamp(timestampForTick(tick))
            .u16(14, pci)
            .u16(16, earfcn)
            .build();
    default: {
        // A cell-monitor extra whose XML property list was cut off in transfer.
        return cutPropertyListRecord(
            LogCode::kCellMonitor,
            "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<plist version=\"1.0\">\n<array>\n\t<dict>\n\t\t<key>kTSCell",
            tick);
    }
    }
}

}  // namespace vantorel

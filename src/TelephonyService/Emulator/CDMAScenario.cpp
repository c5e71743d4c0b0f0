// CDMAScenario: the emulator's CDMA2000 modem, its 1x calls and EV-DO connections evolving tick by tick, sent in the byte layouts the C2K decoders read.
#include "TelephonyService/Emulator/CDMAScenario.h"

#include "Platform/LogCodes.h"
#include "Platform/RecordBuilder.h"
#include "Platform/TelephonyIdentifiers.h"

#include <algorithm>

// Portability note: the order in which a function's arguments are evaluated is
// unspecified, so every random draw below is its own statement (never two draws
// in one expression); that keeps the byte stream the same with every compiler.

namespace vantorel {

namespace {

// The carriers of a band class: 1x channels and EV-DO channels.
struct BandPlan {
    uint8_t bandClass;
    std::array<uint16_t, 4> channels1x;
    std::array<uint16_t, 2> channelsHDR;
};
constexpr BandPlan kPlans[] = {
    {0, {283, 384, 691, 1019}, {777, 1013}},  // 800 MHz cellular
    {1, {25, 50, 350, 500}, {425, 1175}},     // 1900 MHz PCS
};

// 1x pilot energies (raw correlator energy X of 0x119c subpacket 3): with N = 64,
// M = 1, E = 2 the decoder's Ec/Io = 2 X / (9 x 64^2) - 1/64, so X 300 is about
// -32 dB, 1100 -14 dB (T_ADD), 750 -16 dB (T_DROP) and 9500 -3 dB.
constexpr uint16_t kEnergyN = 64;
constexpr uint8_t kEnergyM = 1;
constexpr uint8_t kEnergyE = 2;
constexpr uint8_t kEnergyWords = 1;  // k: one 16-bit energy word per pilot entry
constexpr int32_t kEnergyMin = 300;
constexpr int32_t kEnergyMax = 9500;
constexpr int32_t kAdd1x = 1100;
constexpr int32_t kDrop1x = 750;
constexpr size_t kMaxActive1x = 3;

// EV-DO sector strengths, linear x 512 (512 = 0 dB): 16 is -15 dB, 64 -9 dB (add), 40 -11 dB (drop).
constexpr int32_t kStrengthMin = 16;
constexpr int32_t kStrengthMax = 480;
constexpr int32_t kAddHDR = 64;
constexpr int32_t kDropHDR = 40;
constexpr size_t kMaxActiveHDR = 4;

// Forward-link packet kinds the counters of 0x1192 count (counter index, bits per packet);
// the kind at index 4 carries no payload (it is weighted 0).
constexpr size_t kFwdSmall = 0;     // 128 bits
constexpr size_t kFwdMedium = 3;    // 1024 bits
constexpr size_t kFwdNoPayload = 4;
struct Kind {
    size_t index;
    uint32_t bits;
};
constexpr Kind kFwdLarge[] = {{27, 2048}, {39, 3072}, {45, 4096}, {52, 5120}};
constexpr size_t kFwdCounters = 56;

// Reverse-link packet sizes of 0x127e's rate indices.
constexpr uint32_t kRevBits[] = {128, 256, 512, 768, 1024, 1536, 2048, 3072, 4096, 6144, 8192, 12288};
constexpr size_t kRevRates = std::size(kRevBits);

// A Rev A handset: forward link up to 3.1 Mbit/s, reverse link up to 1.8 Mbit/s.
constexpr int32_t kFwdMinKbps = 38;
constexpr int32_t kFwdMaxKbps = 3072;
constexpr int32_t kRevMinKbps = 10;
constexpr int32_t kRevMaxKbps = 1800;

constexpr uint32_t kSystemTypeCDMA = 2;
constexpr uint16_t kInvalidPN = 65535;

// Sizes of the 0x119c subpackets (identifier, version, u16 size, fields).
constexpr size_t kStateSubpacket = 8;
constexpr size_t kRFSubpacket = 16;

size_t roundUp4(size_t n) {
    return (n + 3) & ~size_t{3};
}

}  // namespace

CDMAScenario::CDMAScenario(uint64_t seed) : EmulatorScenario(seed) {
    restart();
}

std::string CDMAScenario::technology() const {
    return kTSLogChannelTechnology_Morvek_CDMA;
}

std::string CDMAScenario::description() const {
    return "CDMA2000 hybrid handset on band class 0/1: 1x voice calls with soft hand-off and frame errors, "
           "EV-DO connections with moving data rates, one system change";
}

// ---- state -------------------------------------------------------------------

void CDMAScenario::restart() {
    reseed();
    nextTick_ = 0;
    firstCycle_ = true;
    sessionState_ = 0;
    systemChanged_ = false;
    burstLeft_ = 0;
    frameError_ = false;
    fingerJitter_ = {};

    const BandPlan& plan = kPlans[uniform(0, static_cast<int32_t>(std::size(kPlans)) - 1)];
    band_ = plan.bandClass;
    int32_t c1x = uniform(0, static_cast<int32_t>(plan.channels1x.size()) - 1);
    channel1x_ = plan.channels1x[static_cast<size_t>(c1x)];
    int32_t cHDR = uniform(0, static_cast<int32_t>(plan.channelsHDR.size()) - 1);
    channelHDR_ = plan.channelsHDR[static_cast<size_t>(cHDR)];
    systemChangeTick_ = static_cast<uint64_t>(uniform(100, 140));

    drawSystem(true);
    lastBaseId_ = 0;
    rxAGC1x_ = uniform(-60, -20);
    rxAGC1xDiv_ = rxAGC1x_;
    txAGC1x_ = -50;
    rxAGCHDR_ = uniform(-85, -70);
    rxAGCHDRDiv_ = rxAGCHDR_;
    txAGCHDR_ = -10;

    forward_.sequence = 0u - static_cast<uint32_t>(uniform(4, 20));  // wraps in the first connection
    forward_.counts.assign(kFwdCounters, 0);
    // The modem has been up a while: the counters of the kinds in use start somewhere.
    for (size_t i : {kFwdSmall, kFwdMedium, kFwdNoPayload}) forward_.counts[i] = static_cast<uint32_t>(uniform(1, 90000));
    for (const Kind& k : kFwdLarge) forward_.counts[k.index] = static_cast<uint32_t>(uniform(1, 90000));
    forward_.rateKbps = uniform(600, 1500);
    reverse_.sequence = static_cast<uint32_t>(uniform(0, 0x3FFFFFFF));
    reverse_.counts.assign(kRevRates, 0);
    for (uint32_t& c : reverse_.counts) c = static_cast<uint32_t>(uniform(0, 20000));
    reverse_.rateKbps = uniform(100, 400);

    phase_ = kIdle1x;
    enterPhase(kIdle1x);
}

void CDMAScenario::drawSystem(bool home) {
    if (home) {
        sid_ = static_cast<uint16_t>(uniform(4096, 4351));
        roamingIndicator_ = 1;
        protocolRevision_ = 6;
    } else {
        // A neighbouring system of a roaming partner.
        int32_t offset = uniform(1, 40);
        sid_ = static_cast<uint16_t>(sid_ + offset);
        roamingIndicator_ = 2;
        protocolRevision_ = 7;
    }
    nid_ = static_cast<uint16_t>(uniform(1, 20));
    packetZone_ = static_cast<uint8_t>(uniform(1, 255));
    uati_ = random() & 0xFFFFFFu;
    colorCode_ = static_cast<uint8_t>(uniform(1, 255));

    // The pilots of the area, PN increment 4: one per quarter of the PN circle, so
    // they never collide; EV-DO sectors are overlaid on the same cells.
    const int32_t start = uniform(0, 127);
    for (size_t i = 0; i < kPool; ++i) {
        Pilot& p = pilots1x_[i];
        int32_t spread = uniform(0, 31);
        p.pn = static_cast<uint16_t>(4 * ((start + 32 * static_cast<int32_t>(i) + spread) % 128));
        int32_t cell = uniform(20, 4000);
        int32_t sector = uniform(1, 3);
        p.baseId = static_cast<uint16_t>(cell * 16 + sector);  // cell number and sector
        p.target = i == 0 ? uniform(5000, 8000) : uniform(500, 4000);
        p.level = p.target;
        p.active = i == 0;

        Pilot& s = sectors_[i];
        s.pn = p.pn;
        s.baseId = p.baseId;
        s.target = i == 0 ? uniform(250, 400) : uniform(30, 200);
        s.level = s.target;
        s.active = i == 0;
    }
    reference_ = 0;
    serving_ = 0;
}

void CDMAScenario::enterPhase(Phase phase) {
    phase_ = phase;
    switch (phase) {
    case kIdle1x:
        dwell_ = firstCycle_ ? uniform(3, 5) : uniform(6, 12);
        break;
    case kCall1x: {
        dwell_ = uniform(25, 40);
        // The handset drives towards another cell: one of the other pilots grows and
        // the reference fades, so the call hands over softly on the way.
        int32_t other = uniform(1, static_cast<int32_t>(kPool) - 1);
        Pilot& next = pilots1x_[(reference_ + static_cast<size_t>(other)) % kPool];
        next.target = uniform(7000, 9000);
        pilots1x_[reference_].target = uniform(1000, 2500);
        break;
    }
    case kIdleAfterCall:
        dwell_ = uniform(4, 8);
        burstLeft_ = 0;
        frameError_ = false;
        for (size_t i = 0; i < kPool; ++i) pilots1x_[i].active = i == reference_;
        break;
    case kHDRAcquisition:
    case kHDRSync:
        dwell_ = 1;
        break;
    case kHDRIdle:
        dwell_ = uniform(2, 4);
        if (sessionState_ == 0) sessionState_ = 1;  // the first session is negotiated now
        break;
    case kHDRAccess:
        dwell_ = uniform(1, 2);
        break;
    case kHDRConnected:
        dwell_ = uniform(30, 45);
        break;
    case kHDRDormant:
        dwell_ = uniform(3, 6);
        for (size_t i = 0; i < kPool; ++i) sectors_[i].active = i == serving_;
        break;
    }
}

void CDMAScenario::evolvePhase() {
    if (sessionState_ == 1) sessionState_ = 4;  // AMP setup done: the session is open
    if (--dwell_ > 0) return;
    if (phase_ == kHDRDormant) {
        firstCycle_ = false;
        enterPhase(kIdle1x);
    } else {
        enterPhase(static_cast<Phase>(phase_ + 1));
    }
}

uint8_t CDMAScenario::hdrState() const {
    switch (phase_) {
    case kHDRAcquisition: return 1;
    case kHDRSync: return 2;
    case kHDRAccess: return 4;
    case kHDRConnected: return 5;
    case kHDRIdle:
    case kHDRDormant: return 3;
    default: return 0;
    }
}

size_t CDMAScenario::activeCount(const std::array<Pilot, kPool>& pool) const {
    return static_cast<size_t>(std::count_if(pool.begin(), pool.end(), [](const Pilot& p) { return p.active; }));
}

void CDMAScenario::evolveRates(Counters& c, int32_t step, int32_t target, int32_t low, int32_t high) {
    c.rateKbps = std::clamp(pulled(c.rateKbps, step, target), low, high);
}

void CDMAScenario::evolveRadio() {
    int32_t step = uniform(-4, 4);
    rxAGC1x_ = std::clamp(pulled(rxAGC1x_, step, -40), -120, 30);  // raw: about -103..-53 dBm
    step = uniform(-3, 3);
    rxAGC1xDiv_ = std::clamp(pulled(rxAGC1xDiv_, step, rxAGC1x_), -120, 30);
    step = uniform(-15, 15);
    txAGC1x_ = std::clamp(pulled(txAGC1x_, step, -50), -300, 230);  // tenths of dBm, up to 23 dBm
    step = uniform(-2, 2);
    rxAGCHDR_ = std::clamp(pulled(rxAGCHDR_, step, -78), -105, -50);
    step = uniform(-2, 2);
    rxAGCHDRDiv_ = std::clamp(pulled(rxAGCHDRDiv_, step, rxAGCHDR_), -105, -50);
    step = uniform(-2, 2);
    txAGCHDR_ = std::clamp(pulled(txAGCHDR_, step, -8), -40, 23);

    if (phase_ == kCall1x) {
        // Frames in error come in bursts of 2..6 (a fade): about one burst in 20 frames,
        // and one 12 ticks before the end of every call.
        bool fade = chance(5);
        if (burstLeft_ == 0 && (fade || dwell_ == 12)) burstLeft_ = uniform(2, 6);
        frameError_ = burstLeft_ > 0;
        if (burstLeft_ > 0) --burstLeft_;
    }
    if (phase_ == kHDRConnected) {
        step = uniform(-250, 250);
        evolveRates(forward_, step, 1500, kFwdMinKbps, kFwdMaxKbps);
        step = uniform(-80, 80);
        evolveRates(reverse_, step, 400, kRevMinKbps, kRevMaxKbps);
    }
    for (int32_t& j : fingerJitter_) j = uniform(-20, 20);
}

void CDMAScenario::evolve1xPilots() {
    // Now and then one pilot's surroundings change (the handset moves); in a call the
    // drive set up when it started plays out.
    bool moved = chance(8);
    if (moved && phase_ != kCall1x) {
        int32_t which = uniform(0, static_cast<int32_t>(kPool) - 1);
        int32_t target = uniform(500, 8000);
        pilots1x_[static_cast<size_t>(which)].target = target;
    }
    for (Pilot& p : pilots1x_) {
        int32_t step = uniform(-500, 500);
        p.level = std::clamp(pulled(p.level, step, p.target), kEnergyMin, kEnergyMax);
    }
    if (phase_ == kCall1x) {
        // Soft hand-off: pilots above T_ADD join (up to three; with three, a stronger
        // candidate replaces the weakest member), below T_DROP leave.
        for (size_t i = 0; i < kPool; ++i) {
            Pilot& p = pilots1x_[i];
            if (i == reference_) continue;
            if (p.active && p.level < kDrop1x) p.active = false;
            if (p.active || p.level < kAdd1x) continue;
            if (activeCount(pilots1x_) >= kMaxActive1x) {
                Pilot* weakest = nullptr;
                for (size_t j = 0; j < kPool; ++j) {
                    Pilot& q = pilots1x_[j];
                    if (j != reference_ && q.active && (!weakest || q.level < weakest->level)) weakest = &q;
                }
                if (!weakest || weakest->level >= p.level) continue;
                weakest->active = false;
            }
            p.active = true;
        }
    }
    // The reference moves to a pilot 25 % stronger (idle hand-off when paging, among the active set in a call).
    for (size_t i = 0; i < kPool; ++i) {
        const Pilot& p = pilots1x_[i];
        if (i == reference_ || (phase_ == kCall1x && !p.active)) continue;
        if (p.level * 4 > pilots1x_[reference_].level * 5) reference_ = i;
    }
    if (phase_ != kCall1x) {
        for (size_t i = 0; i < kPool; ++i) pilots1x_[i].active = i == reference_;
    }
}

bool CDMAScenario::evolveHDRPilots() {
    if (chance(8)) {
        int32_t which = uniform(0, static_cast<int32_t>(kPool) - 1);
        int32_t target = uniform(30, 420);
        sectors_[static_cast<size_t>(which)].target = target;
    }
    for (Pilot& s : sectors_) {
        int32_t step = uniform(-40, 40);
        s.level = std::clamp(pulled(s.level, step, s.target), kStrengthMin, kStrengthMax);
    }
    if (!hdr()) return false;
    std::array<bool, kPool> before{};
    for (size_t i = 0; i < kPool; ++i) before[i] = sectors_[i].active;
    const size_t servingBefore = serving_;
    if (phase_ == kHDRConnected) {
        for (size_t i = 0; i < kPool; ++i) {
            Pilot& s = sectors_[i];
            if (i == serving_) continue;
            if (s.active && s.level < kDropHDR) s.active = false;
            else if (!s.active && s.level >= kAddHDR && activeCount(sectors_) < kMaxActiveHDR) s.active = true;
        }
    }
    // The serving sector (DRC cover) follows the strongest, with a 25 % margin.
    for (size_t i = 0; i < kPool; ++i) {
        const Pilot& s = sectors_[i];
        if (i == serving_ || (phase_ == kHDRConnected && !s.active)) continue;
        if (s.level * 4 > sectors_[serving_].level * 5) serving_ = i;
    }
    if (phase_ != kHDRConnected) {
        for (size_t i = 0; i < kPool; ++i) sectors_[i].active = i == serving_;
    }
    bool changed = serving_ != servingBefore;
    for (size_t i = 0; i < kPool; ++i) changed |= before[i] != sectors_[i].active;
    return changed;
}

std::vector<Bytes> CDMAScenario::step() {
    const uint64_t tick = nextTick_++;
    bool activeSetChanged = false;
    bool systemChange = false;
    if (tick > 0) {
        evolvePhase();
        evolveRadio();
        evolve1xPilots();
        activeSetChanged = evolveHDRPilots();
        // The system change waits until neither a call nor a connection is up.
        const bool busy = phase_ == kCall1x || phase_ == kHDRAccess || phase_ == kHDRConnected;
        if (!systemChanged_ && tick >= systemChangeTick_ && !busy) {
            drawSystem(false);
            systemChanged_ = true;
            systemChange = true;
            activeSetChanged = true;
        }
    }
    const uint16_t baseId = pilots1x_[reference_].baseId;
    const bool identityChanged = systemChange || baseId != lastBaseId_;
    lastBaseId_ = baseId;
    // In hybrid mode the 1x side sleeps between its paging slots while EV-DO works.
    const uint8_t state1x = phase_ == kCall1x ? 8 : (hdr() && tick % 2 == 1 ? 7 : 6);

    std::vector<Bytes> out;
    if (identityChanged || tick % 10 == 0) out.push_back(systemIdentityRecord(tick, 2));
    out.push_back(status1xRecord(tick, state1x, false));
    if (phase_ == kCall1x) out.push_back(trafficRecord(tick, frameError_, tick % 7 == 3));
    if (hdr()) {
        out.push_back(hdrStatusRecord(tick, 50));
        if (phase_ >= kHDRIdle) {
            out.push_back(fingerRecord(tick, false));
            if (activeSetChanged || tick % 2 == 0) out.push_back(hdrActiveSetRecord(tick));
        }
        if (phase_ == kHDRConnected) {
            out.push_back(forwardRateRecord(tick));
            out.push_back(reverseRateRecord(tick));
        }
    }
    if (tick % kMalformedPeriod == 12) out.push_back(malformedRecord(tick));
    return out;
}

// ---- records -----------------------------------------------------------------

Bytes CDMAScenario::systemIdentityRecord(uint64_t tick, uint8_t version) const {
    return RecordBuilder::ordinary(LogCode::kC2KSystemIdentity, 188)
        .timestamp(timestampForTick(tick))
        .u8(13, version)                                    // 13: record version
        .u32(42, roamingIndicator_)                         // 42-45: roaming indicator (ERI)
        .u32(46, kSystemTypeCDMA)                           // 46-49: system type
        .u16(50, sid_)                                      // 50-51: system identifier
        .u16(52, nid_)                                      // 52-53: network identifier
        .u8(131, packetZone_)                               // 131: packet zone
        .u8(133, protocolRevision_)                         // 133: protocol revision (P_REV)
        .u16(184, pilots1x_[reference_].baseId)             // 184-185: base station of the reference pilot
        .build();
}

Bytes CDMAScenario::status1xRecord(uint64_t tick, uint8_t state, bool zeroSize) const {
    std::vector<const Pilot*> active;
    active.push_back(&pilots1x_[reference_]);
    for (size_t i = 0; i < kPool; ++i) {
        if (i != reference_ && pilots1x_[i].active) active.push_back(&pilots1x_[i]);
    }
    const size_t n = active.size();
    // Pilot entries of subpacket 3 lie at a stride of (15 + 6k) AND 0xffc from its start,
    // PN offset at +12 and the energy word at +4k + 24 of each.
    const size_t stride = (15 + 6 * kEnergyWords) & 0xffc;
    const size_t asSize = roundUp4(4 * kEnergyWords + 26 + stride * (n - 1));
    const size_t fingerSize = 8 + 8 * n;
    const size_t rf = 17 + kStateSubpacket;
    const size_t as = rf + kRFSubpacket;
    const size_t fi = as + asSize;

    RecordBuilder b = RecordBuilder::ordinary(LogCode::kC2K1xStatus, fi + fingerSize);
    b.timestamp(timestampForTick(tick));
    b.u8(13, 1);  // 13: record version
    b.u8(14, 4);  // 14: subpackets, the first at 17: id, version, u16 size (header included)
    b.u8(17, 1).u8(18, 1).u16(19, static_cast<uint16_t>(zeroSize ? 0 : kStateSubpacket));
    b.u8(21, state);  // +4: 1x device state

    b.u8(rf, 2).u8(rf + 1, 1).u16(rf + 2, kRFSubpacket);
    b.u8(rf + 4, band_).u8(rf + 5, band_);                   // +4, +5: band class of both chains
    b.u16(rf + 6, channel1x_).u16(rf + 8, channel1x_);       // +6, +8: channels
    b.u8(rf + 10, static_cast<uint8_t>(rxAGC1x_));           // +10, +11: Rx AGC raw, signed
    b.u8(rf + 11, static_cast<uint8_t>(rxAGC1xDiv_));
    b.u16(rf + 12, static_cast<uint16_t>(txAGC1x_));         // +12: Tx AGC, tenths of dBm, signed

    b.u8(as, 3).u8(as + 1, 1).u16(as + 2, static_cast<uint16_t>(asSize));
    b.u16(as + 4, kEnergyN).u8(as + 6, kEnergyM).u8(as + 7, kEnergyE);  // energy scaling N, M, E
    b.u8(as + 8, static_cast<uint8_t>(n)).u8(as + 9, kEnergyWords);
    b.u16(as + 10, pilots1x_[reference_].pn);                           // reference pilot
    for (size_t i = 0; i < n; ++i) {
        b.u16(as + stride * i + 12, active[i]->pn);
        b.u16(as + stride * i + 4 * kEnergyWords + 24, static_cast<uint16_t>(active[i]->level));
    }

    // Fingers: one per active pilot, 8-byte entries from +8: PN, energy, locked.
    b.u8(fi, 4).u8(fi + 1, 1).u16(fi + 2, static_cast<uint16_t>(fingerSize));
    b.u8(fi + 4, static_cast<uint8_t>(n));
    for (size_t i = 0; i < n; ++i) {
        b.u16(fi + 8 + 8 * i, active[i]->pn);
        b.u16(fi + 10 + 8 * i, static_cast<uint16_t>(active[i]->level / 8));
        b.u8(fi + 12 + 8 * i, 1);
    }
    return b.build();
}

Bytes CDMAScenario::trafficRecord(uint64_t tick, bool frameError, bool withPrefix) const {
    constexpr size_t kDemodSize = 28;
    RecordBuilder b = RecordBuilder::ordinary(LogCode::kC2KTrafficFER, 17 + kDemodSize);
    b.timestamp(timestampForTick(tick));
    b.u8(13, 1);                                                    // 13: record version
    b.u8(14, 1);                                                    // 14: one subpacket
    b.u8(17, 11).u8(18, 1).u16(19, static_cast<uint16_t>(kDemodSize));  // traffic demodulation
    b.u8(21, 1);                                                    // +4: rate set 1
    b.u8(41, frameError ? 1 : 0);                                   // +24: frame in error
    return withPrefix ? b.buildWithPrefix() : b.build();
}

Bytes CDMAScenario::hdrStatusRecord(uint64_t tick, size_t length) const {
    const uint8_t state = hdrState();
    const uint16_t pn = phase_ == kHDRAcquisition ? kInvalidPN : sectors_[serving_].pn;
    return RecordBuilder::ordinary(LogCode::kC2KHDRStatus, 50)
        .timestamp(timestampForTick(tick))
        .u8(13, static_cast<uint8_t>(channelHDR_ & 0xFF))                                // 13: channel, low 8 bits
        .u8(14, static_cast<uint8_t>((band_ << 3) | ((channelHDR_ >> 8) & 7)))           // 14: band, channel bits 8-10
        .u8(15, static_cast<uint8_t>(rxAGCHDR_))                                         // 15, 16: Rx AGC, dBm
        .u8(16, static_cast<uint8_t>(rxAGCHDRDiv_))
        .u8(17, static_cast<uint8_t>(state >= 4 ? txAGCHDR_ : -60))                      // 17: Tx AGC, dBm
        .u16(18, pn)                                                                     // 18: serving PN offset
        .u8(36, state)                                                                   // 36: HDR device state
        .u8(37, sessionState_)                                                           // 37: session state
        .bytes(38, {static_cast<uint8_t>(uati_), static_cast<uint8_t>(uati_ >> 8),      // 38-40: UATI, low 24 bits
                    static_cast<uint8_t>(uati_ >> 16)})
        .u8(41, colorCode_)                                                              // 41: colour code
        .resize(length)
        .build();
}

Bytes CDMAScenario::hdrActiveSetRecord(uint64_t tick) const {
    std::vector<const Pilot*> active;
    active.push_back(&sectors_[serving_]);
    for (size_t i = 0; i < kPool; ++i) {
        if (i != serving_ && sectors_[i].active) active.push_back(&sectors_[i]);
    }
    RecordBuilder b = RecordBuilder::ordinary(LogCode::kC2KHDRActiveSet, 25 + 12 * active.size());
    b.timestamp(timestampForTick(tick));
    b.u8(15, static_cast<uint8_t>(active.size()));  // 15: pilots, 12-byte entries from 25
    for (size_t i = 0; i < active.size(); ++i) {
        b.u16(25 + 12 * i, active[i]->pn);                                  // +0: PN offset
        b.u16(27 + 12 * i, static_cast<uint16_t>(active[i]->level));        // +2: strength x 512
    }
    return b.build();
}

Bytes CDMAScenario::fingerRecord(uint64_t tick, bool badCount) const {
    // Two fingers on each active sector (the direct path and an echo 6 dB below),
    // the rest unassigned (PN 65535).
    std::array<uint16_t, kFingers> pn{};
    std::array<int32_t, kFingers> ci{};
    pn.fill(kInvalidPN);
    size_t used = 0;
    for (size_t i = 0; i < kPool && used + 1 < kFingers; ++i) {
        const Pilot& s = sectors_[i];
        if (!s.active) continue;
        pn[used] = s.pn;
        ci[used] = 2 * s.level;
        ++used;
        pn[used] = s.pn;
        ci[used] = s.level / 2;
        ++used;
    }
    const size_t count = badCount ? kFingers - 1 : kFingers;  // a bad record claims one finger less than it holds
    RecordBuilder b = RecordBuilder::ordinary(LogCode::kC2KFingerCI, 23 + 14 * kFingers);
    b.timestamp(timestampForTick(tick));
    b.u8(22, static_cast<uint8_t>(count));  // 22: fingers, 14-byte entries from 23
    for (size_t i = 0; i < kFingers; ++i) {
        const int32_t value = pn[i] == kInvalidPN ? 0 : std::max(ci[i] + fingerJitter_[i], 8);
        b.u16(23 + 14 * i, pn[i]);                                // +0: PN offset
        b.u16(29 + 14 * i, static_cast<uint16_t>(value));          // +6: C/I x 512
    }
    return b.build();
}

Bytes CDMAScenario::forwardRateRecord(uint64_t tick) {
    // One record per sequence step: the increments carry rate x 1024 bits, mostly in
    // large packets, the rest in 1024- and 128-bit ones, plus a few without payload.
    Counters& f = forward_;
    const uint64_t bits = static_cast<uint64_t>(f.rateKbps) * 1024;
    const Kind& large = kFwdLarge[std::min<size_t>(static_cast<size_t>(f.rateKbps / 700), std::size(kFwdLarge) - 1)];
    const uint64_t nLarge = bits * 3 / 4 / large.bits;
    const uint64_t nMedium = (bits - nLarge * large.bits) / 1024;
    const uint64_t nSmall = (bits - nLarge * large.bits - nMedium * 1024) / 128;
    f.counts[large.index] += static_cast<uint32_t>(nLarge);
    f.counts[kFwdMedium] += static_cast<uint32_t>(nMedium);
    f.counts[kFwdSmall] += static_cast<uint32_t>(nSmall);
    f.counts[kFwdNoPayload] += static_cast<uint32_t>(uniform(0, 30));
    ++f.sequence;
    RecordBuilder b = RecordBuilder::ordinary(LogCode::kC2KForwardDataRate, 241);
    b.timestamp(timestampForTick(tick));
    b.u32(13, f.sequence);  // 13: sequence number
    for (size_t i = 0; i < kFwdCounters; ++i) b.u32(17 + 4 * i, f.counts[i]);  // 17: 56 packet counters
    return b.build();
}

Bytes CDMAScenario::reverseRateRecord(uint64_t tick) {
    // The largest packet size that still fills four packets carries the rate, 128-bit packets the rest.
    Counters& r = reverse_;
    const uint64_t bits = static_cast<uint64_t>(r.rateKbps) * 1024;
    size_t large = 0;
    while (large + 1 < kRevRates && kRevBits[large + 1] * 4 <= bits) ++large;
    const uint64_t nLarge = bits / kRevBits[large];
    const uint64_t nSmall = (bits - nLarge * kRevBits[large]) / 128;
    r.counts[large] += static_cast<uint32_t>(nLarge);
    r.counts[0] += static_cast<uint32_t>(nSmall);
    ++r.sequence;
    RecordBuilder b = RecordBuilder::ordinary(LogCode::kC2KReverseDataRate, 1752);
    b.timestamp(timestampForTick(tick));
    b.u32(14, r.sequence);  // 14: sequence number
    // 18 + 24 r: the first of the 24 counters of rate index r (the others stay 0).
    for (size_t i = 0; i < kRevRates; ++i) b.u32(18 + 24 * i, r.counts[i]);
    return b.build();
}

Bytes CDMAScenario::malformedRecord(uint64_t tick) {
    switch ((tick / kMalformedPeriod) % 4) {
    case 0: return hdrStatusRecord(tick, 49);                   // one byte short
    case 1: return fingerRecord(tick, true);                    // its count does not match its length
    case 2: return status1xRecord(tick, 6, true);               // the first subpacket claims size 0
    default: return systemIdentityRecord(tick, 1);              // a version the decoder does not read
    }
}

}  // namespace vantorel

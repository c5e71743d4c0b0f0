// LTEScenario: the emulator's LTE modem, its cells and measurements evolving tick by tick, sent in the byte layouts the LTE decoders read.
#include "TelephonyService/Emulator/LTEScenario.h"

#include "Platform/LogCodes.h"
#include "Platform/RecordBuilder.h"
#include "Platform/StringFormat.h"
#include "Platform/TelephonyIdentifiers.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"

#include <algorithm>
#include <string_view>

// Portability note: the order in which a function's arguments are evaluated is
// unspecified, so every random draw below is its own statement (never two draws
// in one expression); that keeps the byte stream the same with every compiler.

namespace vantorel {

namespace {

// A carrier of the network: downlink EARFCN (uplink = downlink + 18000 on these
// FDD bands), 3GPP band, bandwidth in resource blocks, 10 log10(resource blocks)
// (RSSI = RSRP + that - RSRQ), idle-mode layer priority, and whether SIB1 carries P-Max.
struct Carrier {
    uint16_t earfcn;
    int32_t band;
    uint8_t resourceBlocks;
    int32_t tenLogRB;
    uint8_t priority;
    bool pMax;
};
constexpr Carrier kCarriers[] = {
    {1300, 3, 100, 20, 5, true},  // 1800 MHz, 20 MHz wide
    {6300, 20, 50, 17, 3, false}, // 800 MHz, 10 MHz wide
    {3050, 7, 100, 20, 6, true},  // 2600 MHz, 20 MHz wide
};
constexpr size_t kCarrierCount = std::size(kCarriers);

constexpr int64_t kMCC = 262;
constexpr int64_t kMNC = 1;
constexpr int64_t kTAC = 0x6A4D;
constexpr int32_t kLAC = 0x6A4C;  // the overlaid 2G/3G location area (combined attach)

// Idle-mode parameters broadcast by every cell (SIB1 / SIB3), in the raw units of 0xB17F.
constexpr int32_t kQrxlevmin = -124;     // dBm; raw (x + 140) / 2 = 8
constexpr uint32_t kSIntraSearch = 20;   // 40 dB in 2 dB steps
constexpr uint32_t kSNonIntraSearch = 5; // 10 dB in 2 dB steps
constexpr uint32_t kUEMaxPower = 53;     // 23 dBm (power class 3), raw x - 30

// Signal levels are kept in quarter dB (RSRP, RSRQ).
constexpr int32_t kRSRPMin = -128 * 4;
constexpr int32_t kRSRPMax = -65 * 4;
constexpr int32_t kRSRQMin = -19 * 4;
constexpr int32_t kRSRQMax = -4 * 4;

uint32_t clampRaw(int32_t raw, uint32_t bits) {
    return static_cast<uint32_t>(std::clamp(raw, 0, static_cast<int32_t>((1u << bits) - 1)));
}

// RSSI in half dB from RSRP and RSRQ in quarter dB: RSRQ = N x RSRP / RSSI.
int32_t rssiHalfDB(int32_t rsrp, int32_t rsrq, const Carrier& carrier) {
    return (rsrp - rsrq) / 2 + 2 * carrier.tenLogRB;
}

// Srxlev = measured RSRP - Qrxlevmin (no power compensation at 23 dBm), in dB.
int32_t srxlev(int32_t rsrp) {
    return rsrp / 4 - kQrxlevmin;
}


}  // namespace

LTEScenario::LTEScenario(uint64_t seed) : EmulatorScenario(seed) {
    restart();
}

std::string LTEScenario::technology() const {
    return kTSLogChannelTechnology_Morvek_LTE;
}

std::string LTEScenario::description() const {
    return "LTE cell of 262-01 on bands 3/7/20: drifting RSRP/RSRQ, neighbours, idle reselection candidates, handovers";
}


// ---- state -------------------------------------------------------------------

LTEScenario::LTECell LTEScenario::newCell(size_t carrier) {
    LTECell c;
    c.carrier = carrier;
    c.pci = static_cast<uint16_t>(uniform(0, 503));
    int32_t enodeb = enodeBase_ + uniform(0, 400);
    int32_t sector = uniform(1, 3);
    c.cellIdentity = (enodeb << 8) | (sector + 10 * static_cast<int32_t>(carrier));
    c.rsrp = uniform(-112 * 4, -96 * 4);
    c.rsrq = uniform(-16 * 4, -9 * 4);
    c.timing = uniform(0, 307199);
    return c;
}

void LTEScenario::restart() {
    reseed();
    nextTick_ = 0;
    cellChanges_ = 0;
    ticksInCell_ = 0;
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
    enodeBase_ = uniform(0x10000, 0xF0000);

    // The serving cell on a random carrier and a pool of neighbours on the same one.
    serving_ = newCell(static_cast<size_t>(uniform(0, static_cast<int32_t>(kCarrierCount) - 1)));
    serving_.rsrp = uniform(-92 * 4, -80 * 4);
    serving_.present = true;
    avgRsrp_ = serving_.rsrp;
    avgRsrq_ = serving_.rsrq;
    lastRules_ = measurementRules();
    txAntennas_ = 2;
    for (size_t k = 0; k < kNeighbourPool; ++k) {
        neighbours_[k] = newCell(serving_.carrier);
        neighbours_[k].detectedOnly = k >= 6;  // the last two are only found by the searcher
        neighbours_[k].present = k < 3 || k == 6;
    }

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
        if (carrier == serving_.carrier) continue;
        candidates_[k].channel = kCarriers[carrier].earfcn;
        candidates_[k].priority = kCarriers[carrier].priority;
        ++k;
    }
}

size_t LTEScenario::presentNeighbours() const {
    return static_cast<size_t>(std::count_if(neighbours_.begin(), neighbours_.end(),
                                             [](const LTECell& c) { return c.present; }));
}

// The measurement rules in force (4 bits): bit 0 intra-frequency cells
// (Srxlev <= SIntraSearch), bit 1 inter-frequency / inter-RAT layers of equal or
// lower priority (Srxlev <= SNonIntraSearch), bit 2 higher-priority layers (measured
// whenever the serving layer is not the highest).
uint8_t LTEScenario::measurementRules() const {
    const int32_t s = srxlev(serving_.rsrp);
    uint8_t rules = 0;
    if (s <= static_cast<int32_t>(2 * kSIntraSearch)) rules |= 1;
    if (s <= static_cast<int32_t>(2 * kSNonIntraSearch)) rules |= 2;
    if (kCarriers[serving_.carrier].priority < 6) rules |= 4;
    return rules;
}

void LTEScenario::evolveRadio() {
    // The UE moves away from the serving cell: its RSRP follows (a few dB behind) a
    // level that falls from -76 dBm after a cell change to -122 dBm at the next one.
    ++ticksInCell_;
    const int32_t target = -76 * 4 - static_cast<int32_t>((46 * 4 * ticksInCell_) / kCellChangePeriod);
    int32_t step = uniform(-6, 6);
    serving_.rsrp = std::clamp(serving_.rsrp + step + (target - serving_.rsrp) / 5, kRSRPMin, kRSRPMax);
    step = uniform(-3, 3);
    serving_.rsrq = std::clamp(pulled(serving_.rsrq, step, -10 * 4), kRSRQMin, kRSRQMax);
    // Layer 3 filtering of the averages (coefficient 1/4).
    avgRsrp_ += (serving_.rsrp - avgRsrp_) / 4;
    avgRsrq_ += (serving_.rsrq - avgRsrq_) / 4;
    for (LTECell& c : neighbours_) {
        step = uniform(-8, 8);
        c.rsrp = std::clamp(pulled(c.rsrp, step, -104 * 4), kRSRPMin, kRSRPMax);
        step = uniform(-3, 3);
        c.rsrq = std::clamp(pulled(c.rsrq, step, -13 * 4), kRSRQMin, kRSRQMax);
        step = uniform(-16, 16);
        c.timing = std::clamp(c.timing + step, 0, 307199);
    }

    // Neighbours come and go, keeping 1 to 6 of them; a newcomer starts weak.
    if (chance(12)) {
        LTECell& c = neighbours_[static_cast<size_t>(uniform(0, static_cast<int32_t>(kNeighbourPool) - 1))];
        size_t n = presentNeighbours();
        if (c.present && n > 1) {
            c.present = false;
        } else if (!c.present && n < 6) {
            c.present = true;
            c.rsrp = uniform(-118 * 4, -108 * 4);
        }
    }
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

void LTEScenario::changeCell() {
    // Handover (connected) or reselection (idle): intra-frequency to the strongest
    // listed neighbour and inter-frequency to the next carrier, in turn.
    ++cellChanges_;
    ticksInCell_ = 0;
    if (cellChanges_ % 2 == 1) {
        const size_t carrier = (serving_.carrier + 1) % kCarrierCount;
        const int32_t rsrp = serving_.rsrp;
        serving_ = newCell(carrier);
        int32_t gain = uniform(3 * 4, 8 * 4);
        serving_.rsrp = std::clamp(rsrp + gain, kRSRPMin, kRSRPMax);
        serving_.present = true;
        for (size_t k = 0; k < kNeighbourPool; ++k) {
            const bool detectedOnly = neighbours_[k].detectedOnly;
            const bool present = neighbours_[k].present;
            neighbours_[k] = newCell(carrier);
            neighbours_[k].detectedOnly = detectedOnly;
            neighbours_[k].present = present;
        }
        retuneLTECandidates();
    } else {
        size_t best = kNeighbourPool;
        for (size_t k = 0; k < kNeighbourPool; ++k) {
            const LTECell& c = neighbours_[k];
            if (c.present && !c.detectedOnly && (best == kNeighbourPool || c.rsrp > neighbours_[best].rsrp)) best = k;
        }
        if (best == kNeighbourPool) best = 0;
        LTECell& target = neighbours_[best];
        // The target cell has been the better one for the time-to-trigger (event A3, 3 dB offset).
        target.rsrp = std::max(target.rsrp, serving_.rsrp + 3 * 4);
        target.present = true;
        std::swap(serving_, target);
        target.rsrp = std::min(target.rsrp, serving_.rsrp - 3 * 4);
    }
    avgRsrp_ = serving_.rsrp;
    avgRsrq_ = serving_.rsrq;
    int32_t fourAntennas = uniform(0, 2);
    txAntennas_ = fourAntennas == 0 ? 4 : 2;
}

std::vector<Bytes> LTEScenario::step() {
    const uint64_t tick = nextTick_++;
    bool cellChanged = tick == 0;
    bool candidatesChanged = tick == 0;
    bool bearersChanged = false;
    if (tick > 0) {
        evolveRadio();
        evolveMode();
        candidatesChanged = evolveCandidates();
        bearersChanged = evolveBearers();
        if (tick % kCellChangePeriod == kCellChangePeriod - 1) {
            changeCell();
            cellChanged = true;
            candidatesChanged = true;
        }
    }

    std::vector<Bytes> out;
    if (tick == 0) {
        // The extras first, so the display fills at once.
        out.push_back(simFilesRecord(sim_, false));
        out.push_back(cellMonitorRecord(false));
        out.push_back(packetContextsRecord(bearers_, false));
    }
    if (cellChanged || tick % 10 == 0) out.push_back(servingCellRecord(tick));
    if (cellChanged || tick % 20 == 0) out.push_back(antennaRecord(tick));
    if (connected_) {
        out.push_back(connectedMeasurementRecord(tick, tick % 7 == 3));
    } else {
        out.push_back(servingMeasurementRecord(tick));
        if (tick % 2 == 0 && presentNeighbours() > 0) out.push_back(neighbourMeasurementRecord(tick));
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
    const Carrier& carrier = kCarriers[serving_.carrier];
    return RecordBuilder::ordinary(LogCode::kLTEServingCellInfo, 38)
        .timestamp(timestampForTick(tick))
        .u8(13, 1)                                                // 13: record version
        .u16(14, serving_.pci)                                    // 14-15: physical cell identity
        .u16(16, carrier.earfcn)                                  // 16-17: downlink EARFCN
        .u16(18, static_cast<uint16_t>(carrier.earfcn + 18000))   // 18-19: uplink EARFCN
        .u8(20, carrier.resourceBlocks)                           // 20: downlink bandwidth in RBs
        .u8(21, carrier.resourceBlocks)                           // 21: uplink bandwidth in RBs
        .u32(22, static_cast<uint32_t>(serving_.cellIdentity))    // 22-25: 28-bit cell identity
        .u16(26, static_cast<uint16_t>(kTAC))                     // 26-27: tracking area code
        .u32(28, static_cast<uint32_t>(carrier.band))             // 28-31: frequency band indicator
        .build();
}

Bytes LTEScenario::antennaRecord(uint64_t tick) const {
    return RecordBuilder::ordinary(LogCode::kLTEMasterInfoBlock, 22)
        .timestamp(timestampForTick(tick))
        .u8(13, 1)             // 13: record version
        .u16(14, serving_.pci)  // 14-15: physical cell identity
        .u8(20, txAntennas_)   // 20: number of eNodeB transmit antennas (PBCH detection)
        .build();
}

Bytes LTEScenario::connectedMeasurementRecord(uint64_t tick, bool withPrefix) const {
    std::vector<const LTECell*> measured;
    std::vector<const LTECell*> detected;
    for (const LTECell& c : neighbours_) {
        if (c.present) (c.detectedOnly ? detected : measured).push_back(&c);
    }
    const size_t n = measured.size();
    const size_t d = detected.size();
    // 23-24 and neighbour RSRP: (dBm + 140) x 4; 25-26 and neighbour RSRQ: (dB + 20) x 8.
    auto rawRSRP = [](int32_t q) { return static_cast<uint16_t>(clampRaw(q + 560, 16)); };
    auto rawRSRQ = [](int32_t q) { return static_cast<uint16_t>(clampRaw(2 * q + 160, 16)); };
    const uint16_t subframe = static_cast<uint16_t>((tick * 500 + serving_.pci) % 10240);  // SFN x 10 + subframe
    RecordBuilder b = RecordBuilder::ordinary(LogCode::kLTEIntraFreqMeasurement, 29 + 6 * n + 2 * d);
    b.timestamp(timestampForTick(tick))
        .u8(13, 1)                                          // 13: record version (the original layout)
        .u16(17, kCarriers[serving_.carrier].earfcn)        // 17-18: EARFCN
        .u16(19, serving_.pci)                              // 19-20: serving PCI
        .u16(21, subframe)                                  // 21-22: subframe number
        .u16(23, rawRSRP(serving_.rsrp))                    // 23-24: serving filtered RSRP
        .u16(25, rawRSRQ(serving_.rsrq))                    // 25-26: serving filtered RSRQ
        .u8(27, static_cast<uint8_t>(n))                    // 27: measured neighbours
        .u8(28, static_cast<uint8_t>(d));                   // 28: detected cells
    for (size_t i = 0; i < n; ++i) {  // 6-byte entries from 29: PCI, filtered RSRP, filtered RSRQ
        b.u16(29 + 6 * i, measured[i]->pci);
        b.u16(31 + 6 * i, rawRSRP(measured[i]->rsrp));
        b.u16(33 + 6 * i, rawRSRQ(measured[i]->rsrq));
    }
    for (size_t i = 0; i < d; ++i) b.u16(29 + 6 * n + 2 * i, detected[i]->pci);  // then 2-byte PCIs
    return withPrefix ? b.buildWithPrefix() : b.build();
}

Bytes LTEScenario::servingMeasurementRecord(uint64_t tick) {
    const Carrier& carrier = kCarriers[serving_.carrier];
    const int32_t s = srxlev(serving_.rsrp);
    drxBelowZero_ = s < 0 ? std::min(drxBelowZero_ + 1, 63) : 0;
    const uint8_t rules = measurementRules();
    const bool rulesUpdated = rules != lastRules_;
    lastRules_ = rules;

    // 19: bits 0-8 PCI, 9-12 serving layer priority.
    const uint32_t w19 = serving_.pci | (static_cast<uint32_t>(carrier.priority) << 9);
    // 21: bits 0-8 RSRP, 9-17 average RSRP ((dBm + 140) x 4), 18-24 RSRQ, 25-31 average RSRQ ((dB + 30) x 4).
    const uint32_t w21 = clampRaw(serving_.rsrp + 560, 9) | (clampRaw(avgRsrp_ + 560, 9) << 9) |
                         (clampRaw(serving_.rsrq + 120, 7) << 18) | (clampRaw(avgRsrq_ + 120, 7) << 25);
    // 25: bits 0-8 RSSI ((dBm + 140) x 2), 9-14 Qrxlevmin ((dBm + 140) / 2), 15-21 P-Max (dBm + 30,
    // 64 absent), 22-27 UE maximum power (dBm + 30).
    const uint32_t w25 = clampRaw(rssiHalfDB(serving_.rsrp, serving_.rsrq, carrier) + 280, 9) |
                         (static_cast<uint32_t>((kQrxlevmin + 140) / 2) << 9) |
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

Bytes LTEScenario::neighbourMeasurementRecord(uint64_t tick) {
    std::vector<const LTECell*> cells;
    for (const LTECell& c : neighbours_) {
        if (c.present) cells.push_back(&c);
    }
    const size_t n = std::min<size_t>(cells.size(), 32);  // 1..32 (step() sends none without neighbours)
    const Carrier& carrier = kCarriers[serving_.carrier];
    RecordBuilder b = RecordBuilder::ordinary(LogCode::kLTEIdleNeighbourMeasurements, 21 + 20 * n);
    b.timestamp(timestampForTick(tick));
    b.u8(13, 2);                   // 13: record version
    b.u16(17, carrier.earfcn);     // 17-18: EARFCN
    // 19-20: bits 0-5 Qrxlevmin ((dBm + 140) / 2), bits 6-10 neighbour count - 1.
    b.u16(19, static_cast<uint16_t>(((kQrxlevmin + 140) / 2) | ((n - 1) << 6)));
    for (size_t i = 0; i < n; ++i) {
        const LTECell& c = *cells[i];
        const size_t e = 21 + 20 * i;  // 20-byte entries from 21; levels in half dB
        const int32_t rsrpHalf = c.rsrp / 2;
        const int32_t avgHalf = rsrpHalf + uniform(-2, 2);
        const int32_t rsrqQuarter = c.rsrq;
        const int32_t avgRsrq = rsrqQuarter + uniform(-2, 2);
        // +0: bits 0-8 PCI, 9-16 RSSI, 17-25 RSRP ((dBm + 140) x 2).
        b.u32(e, c.pci | (clampRaw(rssiHalfDB(c.rsrp, c.rsrq, carrier) + 280, 8) << 9) |
                     (clampRaw(rsrpHalf + 280, 9) << 17));
        // +4: bits 0-8 average RSRP, 9-15 RSRQ, 16-22 average RSRQ ((dB + 30) x 4), 23-29 Srxlev (dB + 30).
        b.u32(e + 4, clampRaw(avgHalf + 280, 9) | (clampRaw(rsrqQuarter + 120, 7) << 9) |
                         (clampRaw(avgRsrq + 120, 7) << 16) | (clampRaw(srxlev(c.rsrp) + 30, 7) << 23));
        int32_t offsetHz = uniform(0, 300);
        b.u16(e + 8, static_cast<uint16_t>(offsetHz));  // +8: frequency offset, Hz
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
    b.u16(15, kCarriers[serving_.carrier].earfcn);        // 15-16: serving EARFCN
    b.u16(17, serving_.pci);                              // 17-18: serving cell (PCI)
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
    auto cells = Array::create();
    auto serving = monitorCell(kTSCellMonitorRadioAccessTechnologyLTE, kTSCellMonitorCellTypeServing);
    serving->set(kTSCellMonitorMCC, Value::integer(kMCC));
    serving->set(kTSCellMonitorMNC, Value::integer(kMNC));
    serving->set(kTSCellMonitorTAC, Value::integer(kTAC));
    serving->set(kTSCellMonitorCellId, Value::integer(serving_.cellIdentity));
    serving->set(kTSCellMonitorPID, Value::integer(serving_.pci));
    serving->set(kTSCellMonitorBandInfo, Value::integer(kCarriers[serving_.carrier].band));
    serving->set(kTSCellMonitorUARFCN, Value::integer(kCarriers[serving_.carrier].earfcn));
    cells->append(Value(serving));

    // The three strongest measured neighbours.
    std::vector<const LTECell*> strongest;
    for (const LTECell& c : neighbours_) {
        if (c.present && !c.detectedOnly) strongest.push_back(&c);
    }
    std::stable_sort(strongest.begin(), strongest.end(),
                     [](const LTECell* a, const LTECell* b) { return a->rsrp > b->rsrp; });
    if (strongest.size() > 3) strongest.resize(3);
    for (const LTECell* c : strongest) {
        auto n = monitorCell(kTSCellMonitorRadioAccessTechnologyLTE, kTSCellMonitorCellTypeNeighbor);
        n->set(kTSCellMonitorPID, Value::integer(c->pci));
        n->set(kTSCellMonitorUARFCN, Value::integer(kCarriers[c->carrier].earfcn));
        cells->append(Value(n));
    }
    return RecordBuilder::extraPropertyList(LogCode::kCellMonitor, Value(cells), binary);
}


Bytes LTEScenario::malformedRecord(uint64_t tick) const {
    switch ((tick / kMalformedPeriod) % 3) {
    case 0:
        // A connected-mode measurement cut after the serving RSRP: 24 bytes, below its 29-byte minimum.
        return RecordBuilder::ordinary(LogCode::kLTEIntraFreqMeasurement, 24)
            .timestamp(timestampForTick(tick))
            .u16(17, kCarriers[serving_.carrier].earfcn)
            .u16(19, serving_.pci)
            .build();
    case 1:
        // A serving-cell record with record type 2, neither ordinary (1) nor extra (255).
        return RecordBuilder(2, LogCode::kLTEServingCellInfo, 38)
            .timestamp(timestampForTick(tick))
            .u16(14, serving_.pci)
            .u16(16, kCarriers[serving_.carrier].earfcn)
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

// GSMScenario: the emulator's GSM/UMTS modem, camping, connecting and handing over between GSM and UMTS tick by tick, sent in the byte layouts the GSM/UMTS decoders read.
#include "TelephonyService/Emulator/GSMScenario.h"

#include "Platform/LogCodes.h"
#include "Platform/RecordBuilder.h"
#include "Platform/TelephonyIdentifiers.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"

#include <algorithm>

// Portability note: the order in which a function's arguments are evaluated is
// unspecified, so every random draw below is its own statement (never two draws
// in one expression); that keeps the byte stream the same with every compiler.

namespace vantorel {

namespace {

constexpr int64_t kMCC = 234;
constexpr int64_t kMNC = 15;
// 234-15 in 3GPP BCD: MCC digit 2 | digit 1, MNC digit 3 (filler F) | MCC digit 3, MNC digit 2 | digit 1.
constexpr uint8_t kPLMN[3] = {0x32, 0xF4, 0x51};
constexpr int32_t kGSMLAC = 0x01A7;
constexpr int32_t kUMTSLAC = 0x01B3;
constexpr uint8_t kGSMRAC = 3;
constexpr uint8_t kUMTSRAC = 7;
// Band I downlink carriers (uplink = downlink - 950).
constexpr uint16_t kUARFCNs[] = {10588, 10613, 10638, 10813};
constexpr int32_t kRxLevAccessMin = 8;  // RXLEV_ACCESS_MIN, RxLev units
constexpr int32_t kCellReselectOffset = 4;

// RR states of 0x512C byte 13.
enum RRState : uint8_t {
    kRRInactive = 0, kRRGoingActive = 1, kRRGoingInactive = 2, kRRCellSelection = 3, kRRIdle = 5,
    kRRCellReselection = 6, kRRConnectionPending = 7, kRRDataTransfer = 9, kRRConnectionRelease = 11,
    kRREarlyCamped = 12, kRRW2GHandover = 13, kRRG2WReselection = 18,
};

// NAS scripts, one step per tick (-1 keeps a value).
using Step = GSMScenario::NasStep;
enum NasField : size_t { kMM, kMMSub, kMMUpdate, kGMM, kGMMSub, kGMMUpdate, kService };
constexpr Step kPowerOn[] = {
    {0, 2, 1, 1, 6, 1, 5},     // MM_NULL / PLMN search, GMM deregistered, automatic search
    {13, 5, 1, 1, 2, 1, 2},    // waiting for the RR connection of the location update; registering
    {3, 4, 1, 2, 3, -1, -1},   // location update and attach initiated
    {9, -1, 0, -1, -1, 0, -1}, // waiting for the network; updated
    {19, 8, 0, 3, 0, 0, 1},    // MM idle, GMM registered, normal service
};
constexpr Step kAreaChange[] = {
    {23, 5, -1, 5, 8, -1, 2},  // location update pending, routing area update initiated
    {13, -1, -1, -1, -1, -1, -1},
    {3, 4, -1, -1, -1, -1, -1},
    {19, 8, 0, 3, 0, 0, 1},
};
constexpr Step kCallSetup[] = {
    {14, -1, -1, -1, -1, -1, -1},  // waiting for the RR connection of the CM service request
    {5, -1, -1, -1, -1, -1, -1},   // waiting for the outgoing MM connection
    {6, -1, -1, -1, -1, -1, -1},   // connection active
};
constexpr Step kHandover[] = {{-1, -1, -1, -1, 7, -1, -1}};  // GPRS suspended in the GSM call
constexpr Step kRelease[] = {{9, -1, -1, -1, -1, -1, -1}, {25, -1, -1, -1, 0, -1, -1}};
constexpr Step kServiceRequest[] = {{-1, -1, -1, 6, -1, -1, -1}, {-1, -1, -1, 3, -1, -1, -1}};

// The searcher's linear Ec/Io energy for a value in dB (-24..0): about 365000 x 10^(dB/10),
// in integer steps so every platform gives the same number.
uint32_t ecioEnergy(int32_t dB) {
    if (dB >= 0) return 530000;
    if (dB == -1) return 470000;
    uint64_t e = 365000;
    for (int32_t d = -2; d > dB; --d) e = e * 794 / 1000;
    return static_cast<uint32_t>(e);
}

}  // namespace

GSMScenario::GSMScenario(uint64_t seed) : EmulatorScenario(seed) {
    restart();
}

std::string GSMScenario::technology() const {
    return kTSLogChannelTechnology_Morvek_GSM;
}

std::string GSMScenario::description() const {
    return "GSM/UMTS handset of 234-15: GSM idle, UMTS RRC states and HSDPA, handover back to GSM dedicated";
}

// ---- state -------------------------------------------------------------------

void GSMScenario::restart() {
    reseed();
    nextTick_ = 0;
    betterTicks_ = 0;
    rrQueue_.clear();
    nasQueue_.clear();
    trchs_.clear();
    mobileAllocation_.clear();
    callActive_ = false;
    goingUp_ = true;
    uraNext_ = false;
    dtx_ = true;

    // SIM: ICCID 89 44 15 (telecom, United Kingdom, issuer) + 12 digits + Luhn.
    drawSubscriber(sim_, "894415", 12, "+447");
    sim_.plmn = "32F451";
    sim_.lac = kGSMLAC;
    sim_.hpplmn = "0A";  // 10 x 6 min
    sim_.ptmsiSignature = "3C9D12";
    sim_.acc = "0200";                        // access class 9
    sim_.fplmn = "32F40132F402FFFFFFFFFFFF";  // 234-10, 234-20 forbidden
    sim_.oplmnAcT = "32F4518080";             // 234-15 with UTRAN and GSM

    // GSM 900 and DCS 1800 cells of the area.
    for (size_t k = 0; k < kGSMPool; ++k) {
        GSMCell& c = gsm_[k];
        c = GSMCell{};
        if (k % 2 == 0) {
            c.arfcn = static_cast<uint16_t>(uniform(1, 124));
        } else {
            c.arfcn = static_cast<uint16_t>(uniform(512, 885));
        }
        int32_t ncc = uniform(0, 7);
        int32_t bcc = uniform(0, 7);
        c.bsic = static_cast<uint8_t>(ncc << 3 | bcc);
        c.cellId = static_cast<uint16_t>(uniform(1000, 65000));
        c.rxlev = uniform(15, 35);
        c.present = k < 6;
    }
    gsmServing_ = 0;
    gsm_[0].rxlev = uniform(35, 45);
    rxqual_ = 0;

    // Band I cells under one RNC; the serving cell is chosen on entering UMTS.
    const int32_t rnc = uniform(100, 4000);
    umtsCellId_ = rnc << 16 | uniform(1, 0xFFFF);
    uraId_ = static_cast<uint16_t>(uniform(1, 500));
    for (size_t k = 0; k < kUMTSPool; ++k) {
        UMTSCell& c = umts_[k];
        c = UMTSCell{};
        c.uarfcn = kUARFCNs[k < 6 ? 0 : k - 5];
        c.psc = static_cast<uint16_t>(uniform(0, 511));
        c.rscp = uniform(-105, -80);
        c.ecio = uniform(-18, -8);
        c.present = true;
    }
    umts_[0].rscp = -75;
    umts_[0].ecio = -5;
    rrc_ = kDisconnected;
    rrcDwell_ = 0;
    txPower_ = 0;
    dualCarrier_ = false;

    phase_ = kGSMIdle;
    phaseTicks_ = 0;
    phaseLength_ = uniform(14, 18);
    nas_ = kPowerOn[0];
    queueNas(std::span(kPowerOn).subspan(1));
    rrState_ = kRRInactive;
    queueRR({kRRGoingActive, kRRCellSelection, kRREarlyCamped, kRRIdle});

    pdp_[0] = PacketContext{"internet", "IP", "0.0.0.0", 5, false};
    pdp_[1] = PacketContext{"mms", "IP", "0.0.0.0", 6, false};
}

void GSMScenario::queueNas(std::span<const NasStep> script) {
    NasStep last = nasQueue_.empty() ? nas_ : nasQueue_.back();
    for (const NasStep& s : script) {
        for (size_t i = 0; i < s.size(); ++i) {
            if (s[i] >= 0) last[i] = s[i];
        }
        nasQueue_.push_back(last);
    }
}

void GSMScenario::queueRR(std::initializer_list<uint8_t> states) {
    rrQueue_.insert(rrQueue_.end(), states);
}

void GSMScenario::reselectGSM(size_t to) {
    gsm_[gsmServing_].present = true;
    gsmServing_ = to;
    betterTicks_ = 0;
    queueRR({kRRCellReselection, kRRIdle});
}

bool GSMScenario::evolveGSM() {
    for (GSMCell& c : gsm_) {
        int32_t step = uniform(-2, 2);
        c.rxlev = std::clamp(pulled(c.rxlev, step, 28), 5, 63);
    }
    int32_t q = uniform(-1, 1);
    rxqual_ = std::clamp(rxqual_ + q, 0, gsm_[gsmServing_].rxlev < 20 ? 7 : 3);
    // Neighbours come and go, 4 to 6 of them.
    if (chance(8)) {
        GSMCell& c = gsm_[static_cast<size_t>(uniform(0, static_cast<int32_t>(kGSMPool) - 1))];
        auto n = std::count_if(gsm_.begin(), gsm_.end(), [](const GSMCell& g) { return g.present; });
        if (&c != &gsm_[gsmServing_]) {
            if (c.present && n > 5) {
                c.present = false;
            } else if (!c.present && n < 7) {
                c.present = true;
            }
        }
    }
    if (phase_ != kGSMIdle) return false;
    size_t best = gsmServing_;
    for (size_t k = 0; k < kGSMPool; ++k) {
        if (gsm_[k].present && gsm_[k].rxlev > gsm_[best].rxlev) best = k;
    }
    const bool stronger = best != gsmServing_ && gsm_[best].rxlev >= gsm_[gsmServing_].rxlev + 6;
    betterTicks_ = stronger ? betterTicks_ + 1 : 0;
    if (betterTicks_ >= 2 || phaseTicks_ == 8) {
        if (best == gsmServing_) best = (gsmServing_ + 1) % kGSMPool;
        gsm_[best].present = true;
        reselectGSM(best);
        return true;
    }
    return false;
}

void GSMScenario::evolveUMTS() {
    for (UMTSCell& c : umts_) {
        int32_t step = uniform(-3, 3);
        c.rscp = std::clamp(pulled(c.rscp, step, -88), -115, -50);
        step = uniform(-1, 1);
        c.ecio = std::clamp(pulled(c.ecio, step, -11), -24, 0);
    }
    umts_[0].ecio = std::max(umts_[0].ecio, -12);  // the serving cell stays usable
    // Active set: the serving cell, and in CELL_DCH up to two more within 4 dB of it;
    // the others are monitored (listed) or detected (found by the searcher).
    size_t active = 1;
    for (size_t k = 0; k < kUMTSPool; ++k) {
        UMTSCell& c = umts_[k];
        if (k == 0) {
            c.set = 0;
        } else if (rrc_ == kCellDCH && active < 3 && c.ecio >= umts_[0].ecio - 4) {
            c.set = 0;
            ++active;
        } else {
            c.set = k < 6 ? 1 : 2;
        }
    }
    int32_t step = uniform(-2, 2);
    txPower_ = std::clamp(pulled(txPower_, step, -(umts_[0].rscp + 100)), -50, 24);
}

void GSMScenario::enterRRC(RRCState state) {
    rrc_ = state;
    switch (state) {
    case kDisconnected: rrcDwell_ = uniform(2, 3); break;
    case kConnecting: rrcDwell_ = 1; break;
    case kCellFACH: rrcDwell_ = uniform(2, 3); break;
    case kCellDCH: rrcDwell_ = uniform(8, 14); break;
    case kCellPCH:
    case kURAPCH: rrcDwell_ = uniform(4, 8); break;
    }
    trchs_.clear();
    if (state == kCellFACH) trchs_ = {{1, 0, 0}};
    if (state == kCellDCH) {
        // DCCH, the AMR classes A and B of the call, the packet bearer.
        for (uint8_t id : {uint8_t{1}, uint8_t{5}, uint8_t{6}, uint8_t{31}}) trchs_.push_back({id, 0, 0});
        dualCarrier_ = chance(40);
        if (!callActive_ && phaseTicks_ >= phaseLength_ / 2) {
            callActive_ = true;
            queueNas(kCallSetup);
        }
    }
}

bool GSMScenario::evolveRRC() {
    if (--rrcDwell_ > 0) return false;
    const bool late = phaseTicks_ >= phaseLength_;
    switch (rrc_) {
    case kDisconnected: enterRRC(kConnecting); break;
    case kConnecting: goingUp_ = true; enterRRC(kCellFACH); break;
    case kCellFACH:
        if (goingUp_) {
            enterRRC(kCellDCH);
        } else {
            // CELL_PCH and URA_PCH in turn (the network's choice by the UE's mobility).
            enterRRC(uraNext_ ? kURAPCH : kCellPCH);
            uraNext_ = !uraNext_;
        }
        break;
    case kCellDCH:
        goingUp_ = false;
        enterRRC(kCellFACH);
        break;
    case kCellPCH:
    case kURAPCH:
        // Data again: a cell update to CELL_FACH and a service request.
        goingUp_ = true;
        enterRRC(kCellFACH);
        queueNas(kServiceRequest);
        if (late) rrcDwell_ = 1;
        break;
    }
    return true;
}

void GSMScenario::enterUMTS() {
    phase_ = kUMTS;
    phaseTicks_ = 0;
    phaseLength_ = uniform(30, 40);
    callActive_ = false;
    umts_[0].rscp = uniform(-85, -70);
    umts_[0].ecio = uniform(-8, -4);
    queueRR({kRRG2WReselection, kRRGoingInactive, kRRInactive});
    queueNas(kAreaChange);
    rrc_ = kDisconnected;
    rrcDwell_ = uniform(2, 3);
}

void GSMScenario::enterDedicated() {
    phase_ = kGSMDedicated;
    phaseTicks_ = 0;
    phaseLength_ = uniform(10, 16);
    trchs_.clear();
    rrc_ = kDisconnected;
    queueRR({kRRW2GHandover, kRRDataTransfer});
    queueNas(kHandover);
    // The traffic channel hops over 4..8 GSM 900 carriers; the serving cell is the strongest.
    gsmServing_ = 0;
    for (size_t k = 0; k < kGSMPool; ++k) {
        if (gsm_[k].rxlev > gsm_[gsmServing_].rxlev) gsmServing_ = k;
    }
    gsm_[gsmServing_].present = true;
    hsn_ = static_cast<uint8_t>(uniform(1, 63));
    const int32_t count = uniform(4, 8);
    const int32_t first = uniform(1, 124 - 3 * count);
    mobileAllocation_.clear();
    for (int32_t i = 0; i < count; ++i) mobileAllocation_.push_back(static_cast<uint16_t>(first + 3 * i));
}

bool GSMScenario::evolvePhase() {
    ++phaseTicks_;
    switch (phase_) {
    case kGSMIdle:
        if (phaseTicks_ < phaseLength_) return false;
        enterUMTS();
        return true;
    case kUMTS:
        // The phase ends with the handover of the call at the end of a CELL_DCH period.
        if (!(callActive_ && rrc_ == kCellDCH && rrcDwell_ == 1)) return false;
        enterDedicated();
        return true;
    case kGSMDedicated:
        if (phaseTicks_ < phaseLength_) return false;
        phase_ = kGSMIdle;
        phaseTicks_ = 0;
        phaseLength_ = uniform(20, 30);
        callActive_ = false;
        queueRR({kRRConnectionRelease, kRRIdle});
        queueNas(kRelease);
        queueNas(kAreaChange);
        return true;
    }
    return false;
}

bool GSMScenario::evolvePDP() {
    PacketContext& internet = pdp_[0];
    PacketContext& mms = pdp_[1];
    if (!internet.active && nas_[kGMM] == 3) {
        int32_t b = uniform(0, 255);
        int32_t d = uniform(2, 254);
        internet.address = dottedAddress(10, b, 17, d);
        internet.active = true;
        return true;
    }
    if (!mms.active && rrc_ == kCellDCH && phase_ == kUMTS && chance(10)) {
        int32_t d = uniform(2, 254);
        mms.address = dottedAddress(10, 200, 1, d);
        mms.active = true;
        return true;
    }
    if (mms.active && chance(6)) {
        mms.active = false;
        mms.address = "0.0.0.0";
        return true;
    }
    return false;
}

std::vector<Bytes> GSMScenario::step() {
    const uint64_t tick = nextTick_++;
    bool phaseChanged = tick == 0;
    bool cellChanged = tick == 0;
    bool rrcChanged = false;
    bool pdpChanged = false;
    if (tick > 0) {
        phaseChanged = evolvePhase();
        cellChanged = evolveGSM() || phaseChanged;
        evolveUMTS();
        if (phase_ == kUMTS && !phaseChanged) rrcChanged = evolveRRC();
        pdpChanged = evolvePDP();
    }
    bool rrChanged = tick == 0;
    if (!rrQueue_.empty()) {
        rrState_ = rrQueue_.front();
        rrQueue_.pop_front();
        rrChanged = true;
    }
    bool nasChanged = tick == 0;
    if (!nasQueue_.empty()) {
        nas_ = nasQueue_.front();
        nasQueue_.pop_front();
        nasChanged = true;
    }

    std::vector<Bytes> out;
    if (tick == 0) {
        // The extras first, so the display fills at once.
        out.push_back(simFilesRecord(sim_, false));
        out.push_back(cellMonitorRecord(false));
        out.push_back(packetContextsRecord(pdp_, false));
    }
    if (nasChanged || tick % 10 == 0) {
        for (int32_t code : {LogCode::kGMMState, LogCode::kMMState, LogCode::kRegistrationState}) {
            out.push_back(nasRecord(tick, code));
        }
    }
    if (phaseChanged || tick % 10 == 0) {
        out.push_back(servingPLMNRecord(tick));
        out.push_back(equivalentPLMNRecord(tick, 1, 23));
    }
    if (rrChanged || tick % 10 == 0) out.push_back(rrStateRecord(tick));
    if (phase_ == kUMTS) {
        out.push_back(searcherRecord(tick));
        if (rrcChanged || phaseChanged || tick % 5 == 0) out.push_back(rrcStateRecord(tick));
        if (phaseChanged || tick % 10 == 0) out.push_back(umtsIdentityRecord(tick));
        if ((rrcChanged && rrc_ == kCellFACH) || tick % 10 == 0) out.push_back(cipheringRecord(tick));
        if (rrc_ != kCellDCH && tick % 2 == 0) out.push_back(rankingRecord(tick));
        if (rrc_ == kCellFACH || rrc_ == kCellDCH) {
            out.push_back(transmitPowerRecord(tick));
            out.push_back(blerRecord(tick));
        }
        if (rrc_ == kCellDCH) out.push_back(hsdpaRecord(tick));
    } else {
        if (cellChanged || tick % 10 == 0) out.push_back(gsmIdentityRecord(tick, LogCode::kOrdinaryType));
        out.push_back(gsmMeasurementRecord(tick));
        if (cellChanged || tick % 5 == 0) out.push_back(bsicRecord(tick));
        if (phase_ == kGSMIdle && (phaseChanged || tick % 10 == 0)) {
            for (Bytes& r : gprsRecords(tick)) out.push_back(std::move(r));
        }
        if (phase_ == kGSMDedicated) {
            if (phaseChanged || tick % 5 == 0) {
                out.push_back(mobileAllocationRecord(tick));
                out.push_back(dedicatedRecord(tick));
            }
            if (tick % 2 == 0) out.push_back(channelParametersRecord(tick));
        }
    }
    if (tick > 0 && (cellChanged || tick % 10 == 0)) out.push_back(cellMonitorRecord((tick / 10) % 2 == 1));
    if (tick > 0 && (pdpChanged || tick % 20 == 0)) out.push_back(packetContextsRecord(pdp_, (tick / 20) % 2 == 1));
    if (tick > 0 && tick % 60 == 0) out.push_back(simFilesRecord(sim_, (tick / 60) % 2 == 1));
    if (tick % kMalformedPeriod == 12) out.push_back(malformedRecord(tick));
    return out;
}

// ---- records: NAS ------------------------------------------------------------

Bytes GSMScenario::nasRecord(uint64_t tick, int32_t code) const {
    RecordBuilder b = RecordBuilder::ordinary(code, 16);
    b.timestamp(timestampForTick(tick));
    if (code == LogCode::kGMMState) {
        // 13: GMM state, 14: GMM sub-state, 15: GMM update status.
        b.u8(13, static_cast<uint8_t>(nas_[kGMM])).u8(14, static_cast<uint8_t>(nas_[kGMMSub]));
        b.u8(15, static_cast<uint8_t>(nas_[kGMMUpdate]));
    } else if (code == LogCode::kMMState) {
        // 13: MM state, 14: MM sub-state, 15: update status.
        b.u8(13, static_cast<uint8_t>(nas_[kMM])).u8(14, static_cast<uint8_t>(nas_[kMMSub]));
        b.u8(15, static_cast<uint8_t>(nas_[kMMUpdate]));
    } else {
        // 13: registration service state, 14: PLMN selection mode (automatic).
        b.u8(13, static_cast<uint8_t>(nas_[kService])).u8(14, 0);
    }
    return b.build();
}

Bytes GSMScenario::servingPLMNRecord(uint64_t tick) const {
    const bool umts = phase_ == kUMTS;
    const uint16_t lac = static_cast<uint16_t>(umts ? kUMTSLAC : kGSMLAC);
    return RecordBuilder::ordinary(LogCode::kServingPLMNAndArea, 28)
        .timestamp(timestampForTick(tick))
        .u8(13, umts ? 0 : 1)                                 // 13: network operation mode I / II
        .u8(14, phase_ == kGSMDedicated ? 1 : 3)              // 14: service type (CS only while suspended)
        .bytes(15, {kPLMN[0], kPLMN[1], kPLMN[2]})            // 15-17: BCD PLMN
        .u16be(18, lac)                                       // 18-19: LAC, big-endian
        .u8(20, umts ? kUMTSRAC : kGSMRAC)                    // 20: routing area code
        .build();
}

Bytes GSMScenario::equivalentPLMNRecord(uint64_t tick, uint8_t count, size_t length) const {
    // 16: count; from 17 the digits of the list interleaved, MCC and MNC digits in
    // turn (2 0 3 1 4 5 for 234-015), an entry every 3 bytes and 3 more at the end.
    return RecordBuilder::ordinary(LogCode::kEquivalentPLMNs, length)
        .timestamp(timestampForTick(tick))
        .u8(16, count)
        .bytes(17, {2, 0, 3, 1, 4, 5})
        .resize(length)
        .build();
}

// ---- records: GSM ------------------------------------------------------------

Bytes GSMScenario::rrStateRecord(uint64_t tick) const {
    return RecordBuilder::ordinary(LogCode::kGSMRRState, 17)
        .timestamp(timestampForTick(tick))
        .u8(13, rrState_)                                     // 13: RR state
        .u8(14, static_cast<uint8_t>(tick % 4))               // 14: sub-state
        .u8(15, rrState_ == kRRIdle ? 0 : 1)                  // 15: status
        .u8(16, phase_ == kGSMDedicated ? 0 : 1)              // 16: mode, 0 voice
        .build();
}

Bytes GSMScenario::gsmIdentityRecord(uint64_t tick, uint8_t type) const {
    const GSMCell& c = gsm_[gsmServing_];
    return RecordBuilder(type, LogCode::kGSMServingCellIdentity, 26)
        .timestamp(timestampForTick(tick))
        .u16(13, c.arfcn)   // 13-14: ARFCN
        .u16(15, c.bsic)    // 15-16: BSIC
        .u16(17, c.cellId)  // 17-18: cell identity
        .build();
}

Bytes GSMScenario::gsmMeasurementRecord(uint64_t tick) const {
    std::vector<const GSMCell*> cells;
    for (size_t k = 0; k < kGSMPool; ++k) {
        if (k != gsmServing_ && gsm_[k].present) cells.push_back(&gsm_[k]);
    }
    const GSMCell& s = gsm_[gsmServing_];
    const uint32_t c1 = static_cast<uint32_t>(std::max(s.rxlev - kRxLevAccessMin, 0));
    const uint8_t crh = tick % 40 < 20 ? 4 : 0;  // hysteresis applied near a location area border
    RecordBuilder b = RecordBuilder::ordinary(LogCode::kGSMServingMeasurement, 29 + 14 * cells.size());
    b.timestamp(timestampForTick(tick))
        .u8(15, static_cast<uint8_t>(s.rxlev))                        // 15: RxLev
        .u32(16, c1 | static_cast<uint32_t>(rxqual_) << 16)           // 16-19: C1, RxQual full above
        .u32(20, (c1 + kCellReselectOffset) | static_cast<uint32_t>(rxqual_) << 16)  // 20-23: C2, RxQual sub
        .u8(26, crh)                                                  // 26: cell reselect hysteresis
        .u8(28, static_cast<uint8_t>(cells.size()));                  // 28: neighbour count
    for (size_t i = 0; i < cells.size(); ++i) {  // 14-byte entries from 29: ARFCN, RxLev, C1
        const size_t e = 29 + 14 * i;
        b.u16(e, cells[i]->arfcn).u8(e + 2, static_cast<uint8_t>(cells[i]->rxlev));
        b.u32(e + 3, static_cast<uint32_t>(std::max(cells[i]->rxlev - kRxLevAccessMin, 0)));
    }
    return b.build();
}

Bytes GSMScenario::bsicRecord(uint64_t tick) const {
    // The BSICs decoded so far: the neighbours, the last one listed only every other report.
    std::vector<const GSMCell*> cells;
    for (size_t k = 0; k < kGSMPool; ++k) {
        if (k != gsmServing_ && gsm_[k].present) cells.push_back(&gsm_[k]);
    }
    if (!cells.empty() && (tick / 5) % 2 == 1) cells.pop_back();
    RecordBuilder b = RecordBuilder::ordinary(LogCode::kGSMBSICReport, 15 + 4 * cells.size());
    b.timestamp(timestampForTick(tick)).u8(14, static_cast<uint8_t>(cells.size()));  // 14: count
    for (size_t i = 0; i < cells.size(); ++i) {  // 4-byte entries from 15: ARFCN, BSIC, unused
        b.u16(15 + 4 * i, cells[i]->arfcn).u8(17 + 4 * i, cells[i]->bsic);
    }
    return b.build();
}

std::vector<Bytes> GSMScenario::gprsRecords(uint64_t tick) {
    const uint64_t ts = timestampForTick(tick);
    int32_t threshold = uniform(3, 7);  // priority access threshold
    int32_t t3192 = uniform(0, 7);
    const bool pbcch = chance(20);
    return {
        // 0x51F4 14: SI13 position (BCCH norm / ext).
        RecordBuilder::ordinary(LogCode::kGPRSSI13Position, 15).timestamp(ts).u8(14, static_cast<uint8_t>(gsmServing_ % 2)).build(),
        // 0x51F5 13: PFC supported, 14: priority access threshold, 15: network control order.
        RecordBuilder::ordinary(LogCode::kGPRSCellOptions, 18)
            .timestamp(ts).u8(13, 1).u8(14, static_cast<uint8_t>(threshold)).u8(15, 0).build(),
        // 0x51F6 15: T3192, 16: DRX timer max, 17: access burst type (11 bit).
        RecordBuilder::ordinary(LogCode::kGPRSGeneralParameters, 24)
            .timestamp(ts).u8(15, static_cast<uint8_t>(t3192)).u8(16, 3).u8(17, 1).build(),
        // 0x51FB 13: PBCCH present.
        RecordBuilder::ordinary(LogCode::kGPRSPBCCHDescription, 34).timestamp(ts).u8(13, pbcch ? 1 : 0).build(),
        // 0x51FD 13: PSI status, 14: PSI count low rate, 15: high rate, 16: ext. measurement order, 33: SI status.
        RecordBuilder::ordinary(LogCode::kGPRSPacketSystemInfo, 35)
            .timestamp(ts).u8(13, pbcch ? 1 : 0).u8(14, 2).u8(15, 4).u8(16, 0).u8(33, 1).build(),
    };
}

Bytes GSMScenario::mobileAllocationRecord(uint64_t tick) const {
    RecordBuilder b = RecordBuilder::ordinary(LogCode::kGSMMobileAllocation, 15 + 2 * mobileAllocation_.size());
    b.timestamp(timestampForTick(tick))
        .u8(13, hsn_)                                                  // 13: hopping sequence number
        .u8(14, static_cast<uint8_t>(mobileAllocation_.size()));       // 14: ARFCN count
    for (size_t i = 0; i < mobileAllocation_.size(); ++i) b.u16(15 + 2 * i, mobileAllocation_[i]);
    return b.build();
}

Bytes GSMScenario::dedicatedRecord(uint64_t tick) const {
    // 13-14: the ARFCN of the current burst (the hop of this frame).
    const uint16_t arfcn = mobileAllocation_[(tick + hsn_) % mobileAllocation_.size()];
    return RecordBuilder::ordinary(LogCode::kGSMDedicatedAllocation, 17).timestamp(timestampForTick(tick)).u16(13, arfcn).build();
}

Bytes GSMScenario::channelParametersRecord(uint64_t tick) {
    if (chance(20)) dtx_ = !dtx_;
    return RecordBuilder::ordinary(LogCode::kGSMChannelParameters, 20)
        .timestamp(timestampForTick(tick))
        .u8(19, dtx_ ? 1 : 0)  // 19: DTX used
        .build();
}

// ---- records: UMTS -----------------------------------------------------------

Bytes GSMScenario::rrcStateRecord(uint64_t tick) const {
    return RecordBuilder::ordinary(LogCode::kUMTSRRCState, 14).timestamp(timestampForTick(tick)).u8(13, rrc_).build();
}

Bytes GSMScenario::umtsIdentityRecord(uint64_t tick) const {
    const uint16_t dl = umts_[0].uarfcn;
    return RecordBuilder::ordinary(LogCode::kUMTSCellIdentity, 29)
        .timestamp(timestampForTick(tick))
        .u32(13, static_cast<uint32_t>(dl - 950))         // 13-16: uplink UARFCN
        .u32(17, dl)                                      // 17-20: downlink UARFCN
        .u32(21, static_cast<uint32_t>(umtsCellId_))      // 21-24: cell identity (RNC << 16 | C-ID)
        .u16(25, uraId_)                                  // 25-26: URA identity
        .build();
}

Bytes GSMScenario::cipheringRecord(uint64_t tick) const {
    const bool on = rrc_ != kDisconnected && rrc_ != kConnecting;
    return RecordBuilder::ordinary(LogCode::kUMTSCiphering, 19).timestamp(timestampForTick(tick)).u8(13, on ? 1 : 0).build();
}

Bytes GSMScenario::searcherRecord(uint64_t tick) {
    const size_t n = kUMTSPool;
    // The carrier RSSI from the serving cell (RSSI = RSCP - Ec/Io); 13-14 hold the receive
    // AGC that gives it back as (AGC + 512) / 10 - 106.
    const int32_t rssi = std::clamp(umts_[0].rscp - umts_[0].ecio, -105, -30);
    RecordBuilder b = RecordBuilder::ordinary(LogCode::kUMTSSearcher, 16 + 59 * n);
    b.timestamp(timestampForTick(tick))
        .u16(13, static_cast<uint16_t>(static_cast<int16_t>((rssi + 106) * 10 - 512 + 5)))
        .u8(15, static_cast<uint8_t>(n));  // 15: cell count
    for (size_t i = 0; i < n; ++i) {
        const UMTSCell& c = umts_[i];
        // 15-byte cell entries from 16: +7 scrambling code bits 0-7, +8 bits 0-4 its bits 8-12, bits 5-7 the set.
        b.u8(16 + 15 * i + 7, static_cast<uint8_t>(c.psc & 0xFF));
        b.u8(16 + 15 * i + 8, static_cast<uint8_t>((c.psc >> 8) | c.set << 5));
        // 44-byte measurement entries after them: +32, +36, +40 Ec/Io energies (filtered,
        // first path, second path); a detected cell has no filtered value yet.
        const size_t m = 16 + 15 * n + 44 * i;
        int32_t jitter = uniform(-1, 1);
        if (c.set != 2) b.u32(m + 32, ecioEnergy(c.ecio));
        b.u32(m + 36, ecioEnergy(std::clamp(c.ecio + jitter, -24, 0)));
        b.u32(m + 40, ecioEnergy(std::clamp(c.ecio - 3, -24, 0)));
    }
    return b.build();
}

Bytes GSMScenario::rankingRecord(uint64_t tick) const {
    // Ranked UMTS neighbours (monitored set) while the serving Ec/Io is good; below the
    // inter-RAT search threshold (or with no UMTS neighbour) the GSM cells instead. The
    // modem would list GSM entries after UMTS ones, but the display reads both lists from
    // offset 15, so this modem never reports both kinds in one record.
    std::vector<const UMTSCell*> ranked;
    std::vector<const GSMCell*> gsm;
    for (size_t k = 1; k < kUMTSPool; ++k) {
        if (umts_[k].set == 1) ranked.push_back(&umts_[k]);
    }
    if (umts_[0].ecio < -7 || ranked.empty()) {
        ranked.clear();
        for (const GSMCell& g : gsm_) {
            if (g.present) gsm.push_back(&g);
        }
    }
    const size_t u = ranked.size();
    RecordBuilder b = RecordBuilder::ordinary(LogCode::kUMTSReselectionRanking, 15 + 10 * u + 7 * gsm.size());
    b.timestamp(timestampForTick(tick)).u8(13, static_cast<uint8_t>(u)).u8(14, static_cast<uint8_t>(gsm.size()));
    for (size_t i = 0; i < u; ++i) {
        const UMTSCell& c = *ranked[i];
        const size_t e = 15 + 10 * i;  // UARFCN, PSC, RSCP + 21, rank RSCP, Ec/No in half dB, rank
        b.u16(e, c.uarfcn).u16(e + 2, c.psc).u8(e + 4, static_cast<uint8_t>(static_cast<int8_t>(c.rscp + 21)));
        b.u16(e + 5, static_cast<uint16_t>(static_cast<int16_t>(c.rscp)));
        b.u8(e + 7, static_cast<uint8_t>(static_cast<int8_t>(2 * c.ecio)));
        b.u16(e + 8, static_cast<uint16_t>(static_cast<int16_t>(c.ecio - umts_[0].ecio)));
    }
    for (size_t i = 0; i < gsm.size(); ++i) {
        const size_t e = 15 + 10 * u + 7 * i;  // ARFCN, BSIC, RSSI dBm, rank
        const int32_t rssi = gsm[i]->rxlev - 110;
        b.u16(e, gsm[i]->arfcn).u16(e + 2, gsm[i]->bsic).u8(e + 4, static_cast<uint8_t>(static_cast<int8_t>(rssi)));
        b.u16(e + 5, static_cast<uint16_t>(static_cast<int16_t>(rssi - umts_[0].rscp)));
    }
    return b.build();
}

Bytes GSMScenario::transmitPowerRecord(uint64_t tick) {
    // 14: sample count; 14-byte samples from 16, +4 the transmit gain v, signed, with
    // power (v + 512) / 10 - 70 dBm; 0 marks a slot without transmission.
    constexpr size_t kSamples = 4;
    RecordBuilder b = RecordBuilder::ordinary(LogCode::kUMTSTransmitPower, 16 + 14 * kSamples);
    b.timestamp(timestampForTick(tick)).u8(14, kSamples);
    for (size_t i = 0; i < kSamples; ++i) {
        int32_t p = uniform(-1, 1);
        const bool silent = rrc_ == kCellFACH && i % 2 == 1;
        const int32_t v = silent ? 0 : (txPower_ + p + 70) * 10 - 512 + 5;
        b.u16(16 + 14 * i + 4, static_cast<uint16_t>(static_cast<int16_t>(v)));
    }
    return b.build();
}

Bytes GSMScenario::blerRecord(uint64_t tick) {
    // 13: channel count, 14-15: window size; 9-byte entries from 16: ID, CRCs received, CRCs in error.
    RecordBuilder b = RecordBuilder::ordinary(LogCode::kUMTSBLER, 16 + 9 * trchs_.size());
    b.timestamp(timestampForTick(tick)).u8(13, static_cast<uint8_t>(trchs_.size())).u16(14, 100);
    for (size_t i = 0; i < trchs_.size(); ++i) {
        TransportChannel& t = trchs_[i];
        int32_t blocks = uniform(20, 50);
        t.received += blocks;
        // Errors come in bursts on a weak cell and clear again.
        int32_t errors = umts_[0].rscp < -95 ? uniform(0, 4) : uniform(0, 1);
        if (chance(30)) errors = 0;
        t.errors += errors;
        b.u8(16 + 9 * i, t.id).u32(17 + 9 * i, static_cast<uint32_t>(t.received)).u32(21 + 9 * i, static_cast<uint32_t>(t.errors));
    }
    return b.build();
}

Bytes GSMScenario::hsdpaRecord(uint64_t tick) {
    // 13: version, 14-15: sub-frames (10 bits), 15 bits 2-3: carriers (0 single, 2 dual),
    // 16-17: primary / secondary HARQ processes; 9-byte entries: ID, bits, new
    // transmissions, block errors; the secondary carrier's from 18 + 162 x primary count.
    constexpr uint8_t kProcesses = 6;
    const uint8_t secondary = dualCarrier_ ? kProcesses : 0;
    const uint16_t subframes = 250;  // 2 ms sub-frames in a tick
    RecordBuilder b = RecordBuilder::ordinary(LogCode::kHSDPADecodeStatistics, 18 + 162 * kProcesses + 9 * secondary);
    b.timestamp(timestampForTick(tick))
        .u8(13, 2)
        .u8(14, static_cast<uint8_t>(subframes & 0xFF))
        .u8(15, static_cast<uint8_t>(subframes >> 8 | (dualCarrier_ ? 2 : 0) << 2))
        .u8(16, kProcesses)
        .u8(17, secondary);
    auto process = [&](size_t e, uint8_t id) {
        int32_t tx = uniform(20, 42);
        int32_t errors = uniform(0, 3);
        int32_t blockBits = umts_[0].ecio > -8 ? 14000 : 5000;
        b.u8(e, id).u32(e + 1, static_cast<uint32_t>(tx * blockBits));
        b.u16(e + 5, static_cast<uint16_t>(tx)).u16(e + 7, static_cast<uint16_t>(errors));
    };
    for (uint8_t i = 0; i < kProcesses; ++i) process(18 + 9 * i, i);
    for (uint8_t i = 0; i < secondary; ++i) process(18 + 162 * kProcesses + 9 * i, i);
    return b.build();
}

// ---- records: extras and malformed -------------------------------------------

Bytes GSMScenario::cellMonitorRecord(bool binary) {
    auto cells = Array::create();
    if (phase_ == kUMTS) {
        const UMTSCell& s = umts_[0];
        auto serving = monitorCell(kTSCellMonitorRadioAccessTechnologyUMTS, kTSCellMonitorCellTypeServing);
        serving->set(kTSCellMonitorMCC, Value::integer(kMCC));
        serving->set(kTSCellMonitorMNC, Value::integer(kMNC));
        serving->set(kTSCellMonitorLAC, Value::integer(kUMTSLAC));
        serving->set(kTSCellMonitorCellId, Value::integer(umtsCellId_));
        serving->set(kTSCellMonitorUARFCN, Value::integer(s.uarfcn));
        serving->set(kTSCellMonitorSCN, Value::integer(s.psc));
        serving->set(kTSCellMonitorRSCP, Value::integer(s.rscp));
        serving->set(kTSCellMonitorECN0, Value::integer(s.ecio));
        cells->append(Value(serving));
        // Four monitored cells and a detected one (which keeps the XML form under 4 KiB).
        for (size_t k : {1, 2, 3, 4, 6}) {
            const UMTSCell& c = umts_[k];
            const bool unknown = c.set == 2 || chance(10);  // not measured yet
            auto n = monitorCell(kTSCellMonitorRadioAccessTechnologyUMTS, kTSCellMonitorCellTypeNeighbor);
            n->set(kTSCellMonitorUARFCN, Value::integer(c.uarfcn));
            n->set(kTSCellMonitorSCN, Value::integer(c.psc));
            n->set(kTSCellMonitorRSCP, Value::integer(unknown ? 32767 : c.rscp));
            n->set(kTSCellMonitorECN0, Value::integer(unknown ? 32767 : c.ecio));
            cells->append(Value(n));
        }
    } else {
        const GSMCell& s = gsm_[gsmServing_];
        auto serving = monitorCell(kTSCellMonitorRadioAccessTechnologyGSM, kTSCellMonitorCellTypeServing);
        serving->set(kTSCellMonitorMCC, Value::integer(kMCC));
        serving->set(kTSCellMonitorMNC, Value::integer(kMNC));
        serving->set(kTSCellMonitorLAC, Value::integer(kGSMLAC));
        serving->set(kTSCellMonitorCellId, Value::integer(s.cellId));
        serving->set(kTSCellMonitorARFCN, Value::integer(s.arfcn));
        cells->append(Value(serving));
        for (size_t k = 0; k < kGSMPool; ++k) {
            if (k == gsmServing_ || !gsm_[k].present) continue;
            const bool unknown = chance(10);
            auto n = monitorCell(kTSCellMonitorRadioAccessTechnologyGSM, kTSCellMonitorCellTypeNeighbor);
            n->set(kTSCellMonitorARFCN, Value::integer(gsm_[k].arfcn));
            n->set(kTSCellMonitorRSSI, Value::integer(unknown ? 32767 : (gsm_[k].rxlev - 110) / 2));
            cells->append(Value(n));
        }
    }
    return RecordBuilder::extraPropertyList(LogCode::kCellMonitor, Value(cells), binary);
}

Bytes GSMScenario::malformedRecord(uint64_t tick) const {
    switch ((tick / kMalformedPeriod) % 4) {
    case 0:
        // A serving measurement cut after the C2 field: 24 bytes, below its 29-byte minimum.
        return RecordBuilder::ordinary(LogCode::kGSMServingMeasurement, 24)
            .timestamp(timestampForTick(tick))
            .u8(15, static_cast<uint8_t>(gsm_[gsmServing_].rxlev))
            .build();
    case 1:
        // A serving-cell identity with record type 2, neither ordinary (1) nor extra (255).
        return gsmIdentityRecord(tick, 2);
    case 2:
        return cutPropertyListRecord(
            LogCode::kCellMonitor,
            "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<plist version=\"1.0\">\n<array>\n\t<dict>\n\t\t<key>kTSCellMonitorMCC",
            tick);
    default:
        // An equivalent-PLMN list announcing 9 entries with room for one.
        return equivalentPLMNRecord(tick, 9, 23);
    }
}

}  // namespace vantorel

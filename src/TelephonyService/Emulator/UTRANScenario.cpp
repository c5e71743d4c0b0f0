// UTRANScenario: the emulator's TD-SCDMA modem, its cell evolving tick by tick, sent in the byte layouts the UTRAN decoders read.
#include "TelephonyService/Emulator/UTRANScenario.h"

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

// China Mobile's TD-SCDMA band A carriers (2010-2025 MHz, UARFCN = 5 x MHz,
// 1.6 MHz raster), all inside 10054..10121.
constexpr uint16_t kCarriers[] = {10055, 10063, 10071, 10080, 10088, 10096, 10104, 10112, 10120};
constexpr int32_t kCarrierCount = static_cast<int32_t>(std::size(kCarriers));

constexpr int64_t kMCC = 460;
constexpr int64_t kMNC = 0;
constexpr int64_t kLAC = 0x5A1F;      // the TD-SCDMA location area
constexpr int64_t kGSMLAC = 0x2B5C;   // the overlaid GSM network's
constexpr int64_t kBandA = 34;        // 3GPP operating band 34 = TD-SCDMA band A

constexpr int32_t kRSCPMin = -110;
constexpr int32_t kRSCPMax = -60;

int32_t clampRSCP(int32_t dBm) {
    return std::clamp(dBm, kRSCPMin, kRSCPMax);
}

// P-CCPCH RSCP in the raw unit of the 8-bit "Filter RSCP" field: the 3GPP TS 25.123
// reporting range PCCPCH_RSCP_LEV = RSCP + 116 (0 = below -115 dBm, 91 = -25 dBm and up).
uint8_t rawRSCP(int32_t dBm) {
    return static_cast<uint8_t>(std::clamp(dBm + 116, 0, 91));
}


}  // namespace

UTRANScenario::UTRANScenario(uint64_t seed) : EmulatorScenario(seed) {
    restart();
}

std::string UTRANScenario::technology() const {
    return kTSLogChannelTechnology_Morvek_UTRAN2;
}

std::string UTRANScenario::description() const {
    return "TD-SCDMA (UTRAN2) cell of 460-00: RRC state changes, drifting neighbours, reselections";
}


// ---- state -------------------------------------------------------------------

void UTRANScenario::restart() {
    reseed();
    nextTick_ = 0;
    betterTicks_ = 0;
    goingUp_ = true;
    trchs_.clear();
    cctrchTimeslots_.clear();

    // SIM identity: ICCID 89 86 00 (telecom, China, China Mobile) + 13 digits + Luhn.
    drawSubscriber(sim_, "898600", 13, "+86138");
    sim_.plmn = "64F000";  // 460-00
    sim_.lac = static_cast<int>(kLAC);
    sim_.hpplmn = "0A";  // 10 x 6 min
    sim_.ptmsiSignature = "A1B2C3";
    sim_.acc = "0040";  // access class 6
    sim_.fplmn = "64F01064F030FFFFFFFFFFFF";  // 460-01, 460-03 forbidden

    // The serving cell and a pool of TD-SCDMA neighbours under the same RNC.
    int32_t rnc = uniform(100, 4000);
    int32_t baseParameterId = uniform(0, 127);
    serving_ = TDCell{};
    serving_.uarfcn = kCarriers[uniform(0, kCarrierCount - 1)];
    serving_.cellParameterId = static_cast<uint8_t>(baseParameterId);
    serving_.cellIdentity = (rnc << 16) | uniform(1, 0xFFFF);
    serving_.rscp = uniform(-80, -65);
    serving_.present = true;
    uraId_ = static_cast<uint8_t>(uniform(1, 200));
    for (size_t k = 0; k < kNeighbourPool; ++k) {
        TDCell& c = neighbours_[k];
        c = TDCell{};
        // About half the neighbours share the serving carrier (joint-detection candidates).
        if (chance(50)) {
            c.uarfcn = serving_.uarfcn;
        } else {
            c.uarfcn = kCarriers[uniform(0, kCarrierCount - 1)];
        }
        // 13 is prime to 128, so the pool's cell parameter IDs are all distinct.
        c.cellParameterId = static_cast<uint8_t>((baseParameterId + 13 * static_cast<int32_t>(k + 1)) % 128);
        c.cellIdentity = (rnc << 16) | uniform(1, 0xFFFF);
        c.rscp = uniform(-105, -78);
        c.listed = k < 7;  // the last two are only detected (DSET)
        c.present = k < 3;
    }
    if (chance(50)) neighbours_[3].present = true;

    // GSM900 and DCS1800 neighbours of the overlaid GSM network.
    for (size_t k = 0; k < kGSMPool; ++k) {
        GSMCell& g = gsmCells_[k];
        g = GSMCell{};
        if (k < 3) {
            g.arfcn = static_cast<uint16_t>(uniform(1, 94));
        } else {
            g.arfcn = static_cast<uint16_t>(uniform(512, 636));
        }
        g.cellId = static_cast<uint16_t>(uniform(0, 0x3FFF));
        g.ncc = static_cast<uint8_t>(uniform(0, 7));
        g.bcc = static_cast<uint8_t>(uniform(0, 7));
        g.rssi = uniform(-100, -70);
        g.present = k < 3;
    }

    rrc_ = kDisconnected;
    dwell_ = uniform(2, 3);  // a short first idle period, so the display soon shows a connection

    pdp_[0] = PacketContext{"cmnet", "IP", "0.0.0.0", 5, false};
    pdp_[1] = PacketContext{"cmwap", "IP", "0.0.0.0", 6, false};
}

size_t UTRANScenario::presentNeighbours() const {
    return static_cast<size_t>(std::count_if(neighbours_.begin(), neighbours_.end(),
                                             [](const TDCell& c) { return c.present; }));
}

bool UTRANScenario::evolveRadio() {
    int32_t step = uniform(-2, 2);
    serving_.rscp = clampRSCP(pulled(serving_.rscp, step, -78));
    for (TDCell& c : neighbours_) {
        step = uniform(-3, 3);
        c.rscp = clampRSCP(pulled(c.rscp, step, -88));
    }

    // Neighbours come and go, keeping 2 to 6 of them; a newcomer starts weak.
    if (chance(10)) {
        TDCell& c = neighbours_[static_cast<size_t>(uniform(0, static_cast<int32_t>(kNeighbourPool) - 1))];
        size_t n = presentNeighbours();
        if (c.present && n > 2) {
            c.present = false;
        } else if (!c.present && n < 6) {
            c.present = true;
            c.rscp = uniform(-108, -96);
        }
    }

    // A neighbour 4 dB above the serving cell for 3 ticks in a row takes over
    // (reselection in idle / PCH / FACH, baton handover in DCH).
    size_t best = kNeighbourPool;
    for (size_t k = 0; k < kNeighbourPool; ++k) {
        if (neighbours_[k].present && (best == kNeighbourPool || neighbours_[k].rscp > neighbours_[best].rscp)) best = k;
    }
    if (best == kNeighbourPool || neighbours_[best].rscp < serving_.rscp + 4) {
        betterTicks_ = 0;
        return false;
    }
    if (++betterTicks_ < 3) return false;
    betterTicks_ = 0;
    std::swap(serving_, neighbours_[best]);
    serving_.present = true;
    neighbours_[best].present = true;
    neighbours_[best].listed = true;
    return true;
}

void UTRANScenario::evolveGSM() {
    for (GSMCell& g : gsmCells_) {
        int32_t step = uniform(-2, 2);
        g.rssi = std::clamp(pulled(g.rssi, step, -88), -110, -60);
    }
    if (chance(6)) {
        GSMCell& g = gsmCells_[static_cast<size_t>(uniform(0, static_cast<int32_t>(kGSMPool) - 1))];
        auto n = std::count_if(gsmCells_.begin(), gsmCells_.end(), [](const GSMCell& c) { return c.present; });
        if (g.present && n > 1) {
            g.present = false;
        } else if (!g.present && n < 4) {
            g.present = true;
        }
    }
}

void UTRANScenario::enterRRC(RRCMode mode) {
    rrc_ = mode;
    switch (mode) {
    case kDisconnected: dwell_ = uniform(4, 12); break;
    case kConnecting: dwell_ = uniform(1, 2); break;
    case kCellFach: dwell_ = uniform(2, 3); break;
    case kCellDCH: dwell_ = uniform(12, 30); break;
    case kCellPCH:
    case kCellURAPCH: dwell_ = uniform(6, 15); break;
    }
    chooseTransportChannels();
}

bool UTRANScenario::evolveRRC() {
    if (--dwell_ > 0) return false;
    switch (rrc_) {
    case kDisconnected:
        goingUp_ = true;
        enterRRC(kConnecting);
        break;
    case kConnecting:
        enterRRC(kCellFach);
        break;
    case kCellFach:
        if (goingUp_) {
            enterRRC(kCellDCH);
        } else if (chance(70)) {
            enterRRC(kCellPCH);
        } else {
            enterRRC(kCellURAPCH);
        }
        break;
    case kCellDCH:
        // Inactivity: down to Cell FACH, or straight to Cell PCH.
        goingUp_ = false;
        if (chance(60)) {
            enterRRC(kCellFach);
        } else {
            enterRRC(kCellPCH);
        }
        break;
    case kCellPCH:
    case kCellURAPCH:
        // Data resumes (cell update to Cell FACH), or the RNC releases the connection.
        if (chance(65)) {
            goingUp_ = true;
            enterRRC(kCellFach);
        } else {
            enterRRC(kDisconnected);
        }
        break;
    }
    return true;
}

void UTRANScenario::chooseTransportChannels() {
    trchs_.clear();
    cctrchTimeslots_.clear();
    if (rrc_ == kCellFach) {
        // One FACH on the S-CCPCH in timeslot 0.
        trchs_.push_back({1, 0});
        cctrchTimeslots_.push_back(0);
    } else if (rrc_ == kCellDCH) {
        // An AMR 12.2 voice call (classes A, B, C + DCCH) or a PS bearer (DTCH + DCCH),
        // on one or two downlink CCTRCHs in timeslots 4-6 (3:3 switching point).
        uint8_t trchCount = chance(40) ? 4 : 2;
        for (uint8_t id = 1; id <= trchCount; ++id) trchs_.push_back({id, 0});
        int32_t cctrchs = uniform(1, 2);
        int32_t firstSlot = uniform(4, 7 - cctrchs);
        for (int32_t j = 0; j < cctrchs; ++j) cctrchTimeslots_.push_back(static_cast<uint8_t>(firstSlot + j));
    }
}

bool UTRANScenario::evolvePDP() {
    if (rrc_ != kCellDCH) return false;
    PacketContext& internet = pdp_[0];
    PacketContext& wap = pdp_[1];
    if (!internet.active) {
        int32_t b = uniform(0, 255);
        int32_t c = uniform(0, 255);
        int32_t d = uniform(2, 254);
        internet.address = dottedAddress(10, b, c, d);
        internet.active = true;
        return true;
    }
    if (!wap.active && chance(3)) {
        int32_t c = uniform(0, 255);
        int32_t d = uniform(2, 254);
        wap.address = dottedAddress(10, 0, c, d);
        wap.active = true;
        return true;
    }
    if (wap.active && chance(4)) {
        wap.active = false;
        wap.address = "0.0.0.0";
        return true;
    }
    return false;
}

std::vector<Bytes> UTRANScenario::step() {
    const uint64_t tick = nextTick_++;
    bool rrcChanged = tick == 0;
    bool servingChanged = tick == 0;
    bool pdpChanged = false;
    if (tick > 0) {
        servingChanged = evolveRadio();
        evolveGSM();
        rrcChanged = evolveRRC();
        pdpChanged = evolvePDP();
    }

    std::vector<Bytes> out;
    if (tick == 0) {
        // The extras first, so the display fills at once.
        out.push_back(simFilesRecord(sim_, false));
        out.push_back(cellMonitorRecord(false));
        out.push_back(packetContextsRecord(pdp_, false));
    }
    if (rrcChanged || tick % 5 == 0) out.push_back(rrcStateRecord(tick, tick % 30 != 15));
    if (servingChanged || tick % 10 == 0) out.push_back(servingCellRecord(tick));
    out.push_back(neighbourListRecord(tick, tick % 7 == 3));
    if (tick % 4 == 1) out.push_back(gsmNeighbourListRecord(tick));
    if (rrc_ == kCellFach || rrc_ == kCellDCH) out.push_back(blerSIRRecord(tick));
    if (tick > 0 && (servingChanged || tick % 10 == 0)) out.push_back(cellMonitorRecord((tick / 10) % 2 == 1));
    if (tick > 0 && (pdpChanged || tick % 20 == 0)) out.push_back(packetContextsRecord(pdp_, (tick / 20) % 2 == 1));
    if (tick > 0 && tick % 60 == 0) out.push_back(simFilesRecord(sim_, (tick / 60) % 2 == 1));
    if (tick % 25 == 12) out.push_back(malformedRecord(tick));
    return out;
}

// ---- records -----------------------------------------------------------------

Bytes UTRANScenario::rrcStateRecord(uint64_t tick, bool valid) const {
    return RecordBuilder::ordinary(LogCode::kUTRANRRCState, 15)
        .timestamp(timestampForTick(tick))
        .u8(13, valid ? 1 : 0)  // 13: validity flag; the mode counts only when it is 1
        .u8(14, rrc_)           // 14: RRC mode (0 Disconnected ... 5 Cell URA PCH)
        .build();
}

Bytes UTRANScenario::servingCellRecord(uint64_t tick) {
    // Now and then the cell restricts access (access class barring): emergency calls only.
    bool restricted = chance(5);
    return RecordBuilder::ordinary(LogCode::kUTRANServingCell, 26)
        .timestamp(timestampForTick(tick))
        .u8(14, restricted ? 1 : 0)                            // 14: cell access restrictions
        .u8(15, uraId_)                                        // 15: URA ID
        .u16(17, serving_.uarfcn)                              // 17-18: uplink UARFCN (TDD: the same carrier)
        .u16(19, serving_.uarfcn)                              // 19-20: downlink UARFCN
        .u32(21, static_cast<uint32_t>(serving_.cellIdentity))  // 21-24: cell ID, signed 32 bits
        .u8(25, restricted ? 1 : 0)                            // 25 bit 0: 1 emergency calls only, 0 all calls
        .build();
}

Bytes UTRANScenario::neighbourListRecord(uint64_t tick, bool withPrefix) const {
    // Entry 0 is the serving cell (ASET), then the measured neighbours.
    std::vector<const TDCell*> cells{&serving_};
    for (const TDCell& c : neighbours_) {
        if (c.present) cells.push_back(&c);
    }
    const size_t n = cells.size();
    RecordBuilder b = RecordBuilder::ordinary(LogCode::kUTRANNeighbourList, 168 + 16 * n);
    b.timestamp(timestampForTick(tick));
    // 16: bits 1-7 the entry count; bit 0 is another flag (toggled so the shift is exercised).
    b.u8(16, static_cast<uint8_t>((n << 1) | (tick & 1)));
    for (size_t i = 0; i < n; ++i) {
        const TDCell& c = *cells[i];
        uint32_t status = (i == 0) ? 0 : (c.listed ? 1 : 2);  // 0 ASET, 1 MSET, 2 DSET
        // Joint detection covers the strong cells on the serving carrier.
        uint32_t inJDCS = (i == 0 || (c.uarfcn == serving_.uarfcn && c.rscp >= -90)) ? 1 : 0;
        // Entry bytes 0-3 as one little-endian word:
        //   bits 0-13  UARFCN             (byte 0, byte 1 bits 0-5)
        //   bits 14-20 cell parameter ID  (byte 1 bits 6-7 low, byte 2 bits 0-4 high)
        //   bits 21-28 Filter RSCP        (byte 2 bits 5-7 low, byte 3 bits 0-4 high)
        //   bits 29-30 status             (byte 3 bits 5-6)
        //   bit 31     inJDCS             (byte 3 bit 7)
        uint32_t word = (static_cast<uint32_t>(c.uarfcn) & 0x3FFF) |
                        ((static_cast<uint32_t>(c.cellParameterId) & 0x7F) << 14) |
                        (static_cast<uint32_t>(rawRSCP(c.rscp)) << 21) | (status << 29) | (inJDCS << 31);
        b.u32(168 + 16 * i, word);  // entry i at 168 + 16*i, 16 bytes; bytes 4-15 unused
    }
    return withPrefix ? b.buildWithPrefix() : b.build();
}

Bytes UTRANScenario::gsmNeighbourListRecord(uint64_t tick) const {
    std::vector<const GSMCell*> cells;
    for (const GSMCell& g : gsmCells_) {
        if (g.present) cells.push_back(&g);
    }
    RecordBuilder b = RecordBuilder::ordinary(LogCode::kUTRANGSMNeighbourList, 17 + 8 * cells.size());
    b.timestamp(timestampForTick(tick));
    b.u8(16, static_cast<uint8_t>(cells.size()));  // 16: entry count
    for (size_t i = 0; i < cells.size(); ++i) {
        const GSMCell& g = *cells[i];
        const size_t e = 17 + 8 * i;  // entry i at 17 + 8*i, 8 bytes
        bool bsicValid = g.rssi > -100;
        b.u8(e, static_cast<uint8_t>(g.cellId & 0xFF));  // +0: cell ID bits 0-7
        // +1: bits 0-5 cell ID bits 8-13, bit 6 band indicator (0: DCS 1800), bit 7 BSIC valid
        b.u8(e + 1, static_cast<uint8_t>(((g.cellId >> 8) & 0x3F) | (bsicValid ? 0x80 : 0x00)));
        b.u8(e + 2, g.ncc);                                             // +2: NCC
        b.u8(e + 3, g.bcc);                                             // +3: BCC
        b.u16(e + 4, g.arfcn);                                          // +4: ARFCN, unsigned 16
        b.u16(e + 6, static_cast<uint16_t>(static_cast<int16_t>(g.rssi)));  // +6: RSSI dBm, signed 16
    }
    return b.build();
}

Bytes UTRANScenario::blerSIRRecord(uint64_t tick) {
    // BLER in percent around the 1 % target, worse on a weak cell; SIR in dB follows RSCP.
    for (TransportChannel& channel : trchs_) {
        int32_t bler = 0;
        if (serving_.rscp < -100) {
            bler = uniform(5, 30);
        } else if (serving_.rscp < -92) {
            bler = uniform(1, 8);
        } else {
            bler = uniform(0, 2);
        }
        channel.bler = static_cast<uint8_t>(bler);
    }
    const size_t t = trchs_.size();
    const size_t c = cctrchTimeslots_.size();
    // The CCTRCH entries start at 289 + 34*t (the decoder's stride of 34 per TRCH), beyond the TRCH entries.
    RecordBuilder b = RecordBuilder::ordinary(LogCode::kUTRANBLERAndSIR, 289 + 34 * t + 8 * c);
    b.timestamp(timestampForTick(tick));
    // 14-15 as one 16-bit value: bits 6-11 TRCH count t, bits 12-15 (byte 15 bits 4-7) CCTRCH count c.
    b.u16(14, static_cast<uint16_t>(((t & 0x3F) << 6) | ((c & 0x0F) << 12)));
    for (size_t i = 0; i < t; ++i) {
        b.u8(17 + 2 * i, trchs_[i].id);    // TRCH entry i at 17 + 2*i: +0 TRCH ID
        b.u8(18 + 2 * i, trchs_[i].bler);  //                           +1 BLER
    }
    const int32_t sirBase = std::max(0, (serving_.rscp + 110) / 3);
    for (size_t j = 0; j < c; ++j) {
        const size_t e = 289 + 34 * t + 8 * j;           // CCTRCH entry j
        b.u8(e, static_cast<uint8_t>(j + 1));            // +0 CCTRCH ID
        b.u8(e + 1, cctrchTimeslots_[j]);                // +1 TSNUM
        for (size_t k = 0; k < 6; ++k) {
            int32_t jitter = uniform(-2, 2);
            b.u8(e + 2 + k, static_cast<uint8_t>(std::clamp(sirBase + jitter, 0, 25)));  // +2..+7 SIR dB
        }
    }
    return b.build();
}

Bytes UTRANScenario::cellMonitorRecord(bool binary) const {
    auto cells = Array::create();

    auto serving = monitorCell(kTSCellMonitorRadioAccessTechnologyUTRAN2, kTSCellMonitorCellTypeServing);
    serving->set(kTSCellMonitorMCC, Value::integer(kMCC));
    serving->set(kTSCellMonitorMNC, Value::integer(kMNC));
    serving->set(kTSCellMonitorLAC, Value::integer(kLAC));
    serving->set(kTSCellMonitorCellId, Value::integer(serving_.cellIdentity));
    serving->set(kTSCellMonitorBandInfo, Value::integer(kBandA));
    serving->set(kTSCellMonitorSCN, Value::integer(serving_.cellParameterId));
    serving->set(kTSCellMonitorUARFCN, Value::integer(serving_.uarfcn));
    serving->set(kTSCellMonitorRSCP, Value::integer(serving_.rscp));
    cells->append(Value(serving));

    // The four strongest TD-SCDMA neighbours (which also keeps the XML form well under 4 KiB).
    std::vector<const TDCell*> strongest;
    for (const TDCell& c : neighbours_) {
        if (c.present) strongest.push_back(&c);
    }
    std::stable_sort(strongest.begin(), strongest.end(), [](const TDCell* a, const TDCell* b) { return a->rscp > b->rscp; });
    if (strongest.size() > 4) strongest.resize(4);
    for (const TDCell* cell : strongest) {
        const TDCell& c = *cell;
        auto n = monitorCell(kTSCellMonitorRadioAccessTechnologyUTRAN2, kTSCellMonitorCellTypeNeighbor);
        n->set(kTSCellMonitorUARFCN, Value::integer(c.uarfcn));
        n->set(kTSCellMonitorSCN, Value::integer(c.cellParameterId));
        n->set(kTSCellMonitorRSCP, Value::integer(c.rscp));
        cells->append(Value(n));
    }

    // The strongest GSM neighbour.
    const GSMCell* best = nullptr;
    for (const GSMCell& g : gsmCells_) {
        if (g.present && (!best || g.rssi > best->rssi)) best = &g;
    }
    if (best) {
        auto g = monitorCell(kTSCellMonitorRadioAccessTechnologyGSM, kTSCellMonitorCellTypeNeighbor);
        g->set(kTSCellMonitorMCC, Value::integer(kMCC));
        g->set(kTSCellMonitorMNC, Value::integer(kMNC));
        g->set(kTSCellMonitorLAC, Value::integer(kGSMLAC));
        g->set(kTSCellMonitorCellId, Value::integer(best->cellId));
        g->set(kTSCellMonitorARFCN, Value::integer(best->arfcn));
        g->set(kTSCellMonitorRSSI, Value::integer(best->rssi));
        cells->append(Value(g));
    }
    return RecordBuilder::extraPropertyList(LogCode::kCellMonitor, Value(cells), binary);
}


Bytes UTRANScenario::malformedRecord(uint64_t tick) const {
    switch ((tick / 25) % 3) {
    case 0:
        // Cut inside the header: 9 bytes, shorter than the 13-byte header.
        return RecordBuilder::ordinary(LogCode::kUTRANRRCState, 15).timestamp(timestampForTick(tick)).resize(9).build();
    case 1:
        // A serving-cell record with record type 2, neither ordinary (1) nor extra (255).
        return RecordBuilder(2, LogCode::kUTRANServingCell, 26)
            .timestamp(timestampForTick(tick))
            .u16(17, serving_.uarfcn)
            .u16(19, serving_.uarfcn)
            .u32(21, static_cast<uint32_t>(serving_.cellIdentity))
            .build();
    default: {
        // A SIM-files extra whose XML property list was cut off in transfer.
        return cutPropertyListRecord(
            LogCode::kSimFiles,
            "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<plist version=\"1.0\">\n<dict>\n\t<key>kSimFile_ICCID</key>\n\t<str",
            tick);
    }
    }
}

}  // namespace vantorel

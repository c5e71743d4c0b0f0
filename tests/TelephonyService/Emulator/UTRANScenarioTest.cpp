// Tests for UTRANScenario: determinism, schedule, and every record read back at Part 7.2's (and Parts 5.2, 5.6) offsets.
#include "TelephonyService/Emulator/UTRANScenario.h"

#include "Platform/ByteReader.h"
#include "Platform/TelephonyIdentifiers.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"
#include "PropertyList/PropertyListSerialization.h"

#include <gtest/gtest.h>

#include <map>
#include <optional>
#include <set>
#include <string>

using namespace vantorel;

namespace {

constexpr int32_t kExtra = 0xFF0000;

using Stream = std::vector<std::vector<Bytes>>;  // records per tick

Stream run(uint64_t seed, uint64_t ticks) {
    UTRANScenario s(seed);
    Stream out;
    for (uint64_t n = 0; n < ticks; ++n) out.push_back(s.recordsForTick(n));
    return out;
}

bool hasPrefix(const Bytes& r) {
    return r.size() >= 2 && r[0] == 0x81;
}

// The record as the generator sees it (Part 3.2): the 0x81 prefix removed.
ByteView body(const Bytes& r) {
    ByteView v(r);
    return hasPrefix(r) ? v.subspan(2) : v;
}

// The effective log code (Part 3.2), or nothing for a record the generator rejects.
std::optional<int32_t> codeOf(const Bytes& r) {
    ByteReader rd(body(r));
    if (rd.size() < 13) return std::nullopt;
    auto type = rd.u8(0);
    auto code = rd.u16(3);
    if (*type == 1) return *code;
    if (*type == 255) return kExtra | *code;
    return std::nullopt;
}

// Every well-formed record with the effective code, in order, with its tick.
std::vector<std::pair<uint64_t, ByteView>> recordsWithCode(const Stream& s, int32_t code) {
    std::vector<std::pair<uint64_t, ByteView>> out;
    for (uint64_t n = 0; n < s.size(); ++n) {
        for (const Bytes& r : s[n]) {
            if (codeOf(r) == code) out.emplace_back(n, body(r));
        }
    }
    return out;
}
// The views point into the stream: it must outlive them.
std::vector<std::pair<uint64_t, ByteView>> recordsWithCode(Stream&&, int32_t) = delete;

std::optional<Value> plistOf(ByteView record) {
    auto r = PropertyListSerialization::read(ByteReader(record).from(13));
    return r.value;
}

bool isBinaryPlist(ByteView record) {
    auto payload = ByteReader(record).from(13);
    return payload.size() >= 8 && std::string(payload.begin(), payload.begin() + 8) == "bplist00";
}

bool inBandA(uint32_t uarfcn) {
    return uarfcn >= 10054 && uarfcn <= 10121;
}

// One 0xD00A entry decoded bit by bit as Part 7.2's table says.
struct TDEntry {
    uint32_t uarfcn, cellId, rscp, status;
    bool inJDCS;
};
TDEntry entryAt(const ByteReader& rd, size_t e) {
    uint8_t b0 = *rd.u8(e), b1 = *rd.u8(e + 1), b2 = *rd.u8(e + 2), b3 = *rd.u8(e + 3);
    return TDEntry{
        static_cast<uint32_t>(b0 | ((b1 & 0x3F) << 8)),       // byte 0, bits 0-5 of byte 1 high
        static_cast<uint32_t>((b1 >> 6) | ((b2 & 0x1F) << 2)),  // bits 6-7 of byte 1 low, bits 0-4 of byte 2 high
        static_cast<uint32_t>((b2 >> 5) | ((b3 & 0x1F) << 3)),  // bits 5-7 of byte 2 low, bits 0-4 of byte 3 high
        static_cast<uint32_t>((b3 >> 5) & 0x3),                 // bits 5-6 of byte 3
        (b3 & 0x80) != 0,                                      // bit 7 of byte 3
    };
}

// The serving UTRAN2 cells of a 0xFF0001 array.
std::vector<DictionaryRef> servingUTRANCells(const ArrayRef& cells) {
    std::vector<DictionaryRef> out;
    for (const Value& v : *cells) {
        auto d = v.asDictionary();
        if (!d) continue;
        const Value* rat = d->find(kTSCellMonitorCellRadioAccessTechnology);
        const Value* type = d->find(kTSCellMonitorCellType);
        if (rat && type && rat->asString() && type->asString() &&
            *rat->asString() == kTSCellMonitorRadioAccessTechnologyUTRAN2 && *type->asString() == kTSCellMonitorCellTypeServing)
            out.push_back(d);
    }
    return out;
}

}  // namespace

TEST(UTRANScenario, ReportsTheUTRAN2TechnologyAndAOneLineDescription) {
    UTRANScenario s(1);
    EXPECT_EQ(s.technology(), kTSLogChannelTechnology_Morvek_UTRAN2);
    EXPECT_EQ(s.tickInterval(), std::chrono::milliseconds(500));
    EXPECT_FALSE(s.description().empty());
    EXPECT_EQ(s.description().find('\n'), std::string::npos);
}

TEST(UTRANScenario, SameSeedGivesIdenticalBytesOver200Ticks) {
    EXPECT_EQ(run(7, 200), run(7, 200));
}

TEST(UTRANScenario, DifferentSeedGivesDifferentBytes) {
    Stream a = run(7, 200);
    Stream b = run(8, 200);
    EXPECT_NE(a, b);
    EXPECT_NE(a[0], b[0]);  // already the first tick (SIM identity, cells)
}

TEST(UTRANScenario, TicksAskedOutOfOrderGiveTheSameRecordsAsInOrder) {
    Stream ordered = run(11, 60);
    UTRANScenario s(11);
    EXPECT_EQ(s.recordsForTick(37), ordered[37]);  // skipping ahead
    EXPECT_EQ(s.recordsForTick(5), ordered[5]);    // going back replays from the seed
    EXPECT_EQ(s.recordsForTick(6), ordered[6]);
    EXPECT_EQ(s.recordsForTick(6), ordered[6]);    // the same tick twice
}

TEST(UTRANScenario, EveryTickSendsSomething) {
    for (uint64_t seed : {1u, 2u, 3u}) {
        Stream s = run(seed, 200);
        for (uint64_t n = 0; n < s.size(); ++n) EXPECT_FALSE(s[n].empty()) << "seed " << seed << " tick " << n;
    }
}

TEST(UTRANScenario, EveryRecordKindAppearsWithinTwentyTicks) {
    const std::vector<int32_t> codes{0xD0E0, 0xD0E2, 0xD00A, 0xD00E, 0xD00C, 0xFF0000, 0xFF0001, 0xFF0002};
    for (uint64_t seed = 1; seed <= 20; ++seed) {
        Stream s = run(seed, 20);
        for (int32_t code : codes) EXPECT_FALSE(recordsWithCode(s, code).empty()) << std::hex << code << " seed " << seed;
    }
}

TEST(UTRANScenario, ExtrasComeFirstAtTickZero) {
    UTRANScenario s(5);
    auto tick0 = s.recordsForTick(0);
    ASSERT_GE(tick0.size(), 3u);
    EXPECT_EQ(codeOf(tick0[0]), 0xFF0000);
    EXPECT_EQ(codeOf(tick0[1]), 0xFF0001);
    EXPECT_EQ(codeOf(tick0[2]), 0xFF0002);
}

TEST(UTRANScenario, NoRecordIsLongerThan4KiB) {
    for (uint64_t seed = 1; seed <= 5; ++seed) {
        for (const auto& tick : run(seed, 300)) {
            for (const Bytes& r : tick) EXPECT_LE(r.size(), 4096u);
        }
    }
}

TEST(UTRANScenario, RRCStateHasValidityAtByte13AndModeAtByte14) {
    const Stream stream = run(2, 200);
    auto rrc = recordsWithCode(stream, 0xD0E0);
    ASSERT_FALSE(rrc.empty());
    std::set<uint8_t> modes;
    int invalid = 0;
    for (auto& [n, rec] : rrc) {
        ByteReader rd(rec);
        ASSERT_GE(rd.size(), 15u);
        uint8_t valid = *rd.u8(13);
        ASSERT_LE(valid, 1);
        ASSERT_LE(*rd.u8(14), 5);
        if (valid == 1) modes.insert(*rd.u8(14)); else ++invalid;
    }
    // Disconnected, Connecting, Cell FACH, Cell DCH and Cell PCH all show up, and now and then an invalid flag.
    for (uint8_t m : {0, 1, 2, 3, 4}) EXPECT_TRUE(modes.count(m)) << int(m);
    EXPECT_GT(invalid, 0);
}

TEST(UTRANScenario, RRCModeFollowsTheConnectionLifecycle) {
    // Allowed successions of valid, adjacent RRC records (25.331's state machine as the scenario walks it).
    const std::set<std::pair<int, int>> allowed{{0, 1}, {1, 2}, {2, 3}, {2, 4}, {2, 5}, {3, 2},
                                                {3, 4}, {4, 2}, {4, 0}, {5, 2}, {5, 0}};
    for (uint64_t seed = 1; seed <= 5; ++seed) {
        const Stream stream = run(seed, 300);
        auto rrc = recordsWithCode(stream, 0xD0E0);
        std::vector<int> firstModes;
        int previous = -1;  // -1: no valid mode before this record
        for (auto& [n, rec] : rrc) {
            ByteReader rd(rec);
            if (*rd.u8(13) != 1) {
                previous = -1;
                continue;
            }
            int mode = *rd.u8(14);
            if (firstModes.empty() || firstModes.back() != mode) firstModes.push_back(mode);
            if (previous >= 0 && previous != mode) {
                EXPECT_TRUE(allowed.count({previous, mode})) << "seed " << seed << " tick " << n << ": " << previous << " -> " << mode;
            }
            previous = mode;
        }
        ASSERT_GE(firstModes.size(), 4u);
        EXPECT_EQ((std::vector<int>(firstModes.begin(), firstModes.begin() + 4)), (std::vector<int>{0, 1, 2, 3}));
    }
}

TEST(UTRANScenario, ServingCellFieldsLandAtSpecOffsets) {
    Stream s = run(3, 200);
    auto serving = recordsWithCode(s, 0xD0E2);
    ASSERT_FALSE(serving.empty());
    std::set<uint8_t> access;
    for (auto& [n, rec] : serving) {
        ByteReader rd(rec);
        ASSERT_GE(rd.size(), 26u);
        EXPECT_LE(*rd.u8(14), 1);                     // 14: cell access restrictions
        EXPECT_GE(*rd.u8(15), 1);                     // 15: URA ID
        EXPECT_TRUE(inBandA(*rd.u16(17)));            // 17: uplink UARFCN
        EXPECT_EQ(*rd.u16(17), *rd.u16(19));          // 19: downlink UARFCN (TDD: same carrier)
        EXPECT_GT(*rd.s32(21), 0);                    // 21: 28-bit UTRAN cell identity, signed 32
        EXPECT_LT(*rd.s32(21), 1 << 28);
        access.insert(*rd.u8(25) & 1);                // 25 bit 0: allowed access
        EXPECT_EQ(*rd.u8(25) & 1, *rd.u8(14));        // emergency only exactly when restricted
    }
    EXPECT_TRUE(access.count(0));
}

TEST(UTRANScenario, ServingCellAgreesAcrossD0E2D00AAndCellMonitor) {
    Stream s = run(4, 1);
    auto d0e2 = recordsWithCode(s, 0xD0E2);
    auto d00a = recordsWithCode(s, 0xD00A);
    auto monitor = recordsWithCode(s, 0xFF0001);
    ASSERT_EQ(d0e2.size(), 1u);
    ASSERT_EQ(d00a.size(), 1u);
    ASSERT_EQ(monitor.size(), 1u);
    ByteReader serving(d0e2[0].second);
    TDEntry aset = entryAt(ByteReader(d00a[0].second), 168);
    auto cells = plistOf(monitor[0].second)->asArray();
    ASSERT_TRUE(cells);
    auto cell = servingUTRANCells(cells);
    ASSERT_EQ(cell.size(), 1u);
    EXPECT_EQ(aset.status, 0u);  // entry 0 is the serving cell, ASET
    EXPECT_EQ(aset.uarfcn, *serving.u16(19));
    EXPECT_EQ(cell[0]->get(kTSCellMonitorUARFCN).asInt32(), int32_t(*serving.u16(19)));
    EXPECT_EQ(cell[0]->get(kTSCellMonitorCellId).asInt32(), *serving.s32(21));
    EXPECT_EQ(cell[0]->get(kTSCellMonitorSCN).asInt32(), int32_t(aset.cellId));
}

TEST(UTRANScenario, NeighbourCountIsInBits1To7OfByte16) {
    const Stream stream = run(5, 200);
    auto lists = recordsWithCode(stream, 0xD00A);
    ASSERT_EQ(lists.size(), 200u);  // every tick
    std::set<uint8_t> bit0;
    std::set<size_t> neighbourCounts;
    for (auto& [n, rec] : lists) {
        ByteReader rd(rec);
        size_t count = *rd.u8(16) >> 1;
        bit0.insert(*rd.u8(16) & 1);
        EXPECT_EQ(rd.size(), 168 + 16 * count);  // entries at 168 + 16*i fill the record exactly
        ASSERT_GE(count, 1u);
        neighbourCounts.insert(count - 1);        // entry 0 is the serving cell
    }
    EXPECT_EQ(bit0, (std::set<uint8_t>{0, 1}));
    EXPECT_GE(*neighbourCounts.begin(), 2u);
    EXPECT_LE(*neighbourCounts.rbegin(), 6u);
    EXPECT_GE(neighbourCounts.size(), 2u);  // neighbours come and go
}

TEST(UTRANScenario, NeighbourEntriesArePackedAsPart72Says) {
    const Stream stream = run(6, 200);
    auto lists = recordsWithCode(stream, 0xD00A);
    std::set<uint32_t> statuses;
    for (auto& [n, rec] : lists) {
        ByteReader rd(rec);
        size_t count = *rd.u8(16) >> 1;
        std::set<uint32_t> ids;
        for (size_t i = 0; i < count; ++i) {
            TDEntry e = entryAt(rd, 168 + 16 * i);
            EXPECT_TRUE(inBandA(e.uarfcn)) << e.uarfcn;
            EXPECT_LT(e.cellId, 128u);
            EXPECT_TRUE(ids.insert(e.cellId).second);  // distinct cell parameter IDs
            // Filter RSCP in 25.123 units (RSCP + 116): -110..-60 dBm is 6..56.
            EXPECT_GE(e.rscp, 6u);
            EXPECT_LE(e.rscp, 56u);
            EXPECT_LE(e.status, 2u);
            EXPECT_EQ(e.status == 0, i == 0);  // only the serving cell is ASET
            if (i == 0) {
                EXPECT_TRUE(e.inJDCS);  // the serving cell is always jointly detected
            } else if (e.inJDCS) {
                EXPECT_EQ(e.uarfcn, entryAt(rd, 168).uarfcn);  // joint detection works on the serving carrier
            }
            statuses.insert(e.status);
            // Bytes 4..15 of the entry are not used.
            for (size_t k = 4; k < 16; ++k) EXPECT_EQ(*rd.u8(168 + 16 * i + k), 0);
        }
    }
    EXPECT_TRUE(statuses.count(0));
    EXPECT_TRUE(statuses.count(1));
}

TEST(UTRANScenario, NeighbourRSCPDriftsFromTickToTick) {
    const Stream stream = run(7, 50);
    auto lists = recordsWithCode(stream, 0xD00A);
    std::map<uint32_t, std::set<uint32_t>> rscpByCell;
    for (auto& [n, rec] : lists) {
        ByteReader rd(rec);
        size_t count = *rd.u8(16) >> 1;
        for (size_t i = 0; i < count; ++i) {
            TDEntry e = entryAt(rd, 168 + 16 * i);
            rscpByCell[e.cellId].insert(e.rscp);
        }
    }
    size_t drifting = 0;
    for (auto& [id, values] : rscpByCell) drifting += values.size() >= 3 ? 1 : 0;
    EXPECT_GE(drifting, 3u);
}

TEST(UTRANScenario, ServingCellChangesNowAndThen) {
    std::set<int32_t> servingIds;
    const Stream stream = run(1, 600);
    for (auto& [n, rec] : recordsWithCode(stream, 0xD0E2)) servingIds.insert(*ByteReader(rec).s32(21));
    EXPECT_GE(servingIds.size(), 2u);
}

TEST(UTRANScenario, GSMNeighbourEntriesAreEightBytesFrom17) {
    const Stream stream = run(8, 200);
    auto lists = recordsWithCode(stream, 0xD00E);
    ASSERT_EQ(lists.size(), 50u);  // ticks 1, 5, 9, ...
    for (auto& [n, rec] : lists) {
        ByteReader rd(rec);
        size_t count = *rd.u8(16);
        EXPECT_EQ(rd.size(), 17 + 8 * count);
        EXPECT_GE(count, 1u);
        EXPECT_LE(count, 4u);
        for (size_t i = 0; i < count; ++i) {
            size_t e = 17 + 8 * i;
            uint8_t b1 = *rd.u8(e + 1);
            EXPECT_EQ(b1 & 0x40, 0);  // band indicator: DCS 1800
            EXPECT_LE(*rd.u8(e + 2), 7);  // NCC
            EXPECT_LE(*rd.u8(e + 3), 7);  // BCC
            uint16_t arfcn = *rd.u16(e + 4);
            EXPECT_TRUE((arfcn >= 1 && arfcn <= 94) || (arfcn >= 512 && arfcn <= 636)) << arfcn;
            int16_t rssi = *rd.s16(e + 6);
            EXPECT_GE(rssi, -110);
            EXPECT_LE(rssi, -60);
            EXPECT_EQ((b1 & 0x80) != 0, rssi > -100);  // BSIC valid on a decodable cell
        }
    }
}

TEST(UTRANScenario, BLERSIRPutsCCTRCHEntriesAt289Plus34TPlus8J) {
    const Stream stream = run(9, 200);
    auto records = recordsWithCode(stream, 0xD00C);
    ASSERT_FALSE(records.empty());
    bool sawTwoTRCHs = false;
    for (auto& [n, rec] : records) {
        ByteReader rd(rec);
        size_t t = (*rd.u16(14) >> 6) & 0x3F;  // bits 6-11 of the 16-bit value at 14
        size_t c = *rd.u8(15) >> 4;            // bits 4-7 of byte 15
        ASSERT_GE(t, 1u);
        ASSERT_GE(c, 1u);
        ASSERT_EQ(rd.size(), 289 + 34 * t + 8 * c);
        sawTwoTRCHs = sawTwoTRCHs || (t >= 2);
        for (size_t i = 0; i < t; ++i) {
            EXPECT_EQ(*rd.u8(17 + 2 * i), i + 1);  // TRCH ID
            EXPECT_LE(*rd.u8(18 + 2 * i), 30);     // BLER percent
        }
        // Nothing between the TRCH entries and the CCTRCH entries: a reader using a factor
        // of 2 instead of 34 would find zeros, not entries.
        for (size_t k = 17 + 2 * t; k < 289 + 34 * t; ++k) ASSERT_EQ(*rd.u8(k), 0) << k;
        for (size_t j = 0; j < c; ++j) {
            size_t e = 289 + 34 * t + 8 * j;
            EXPECT_EQ(*rd.u8(e), j + 1);   // CCTRCH ID
            EXPECT_LE(*rd.u8(e + 1), 6);   // TSNUM: TD-SCDMA timeslots 0..6
            for (size_t k = 2; k < 8; ++k) EXPECT_LE(*rd.u8(e + k), 25);  // SIR dB
        }
    }
    EXPECT_TRUE(sawTwoTRCHs);
}

TEST(UTRANScenario, CellMonitorHoldsExactlyOneServingUTRAN2Cell) {
    const Stream stream = run(10, 200);
    auto records = recordsWithCode(stream, 0xFF0001);
    ASSERT_GE(records.size(), 20u);
    bool sawBinary = false, sawXML = false;
    for (auto& [n, rec] : records) {
        (isBinaryPlist(rec) ? sawBinary : sawXML) = true;
        auto value = plistOf(rec);
        ASSERT_TRUE(value);
        auto cells = value->asArray();
        ASSERT_TRUE(cells);
        auto serving = servingUTRANCells(cells);
        ASSERT_EQ(serving.size(), 1u) << "tick " << n;
        const auto& cell = serving[0];
        EXPECT_EQ(cell->get(kTSCellMonitorMCC).asInt32(), 460);
        EXPECT_EQ(cell->get(kTSCellMonitorMNC).asInt32(), 0);
        EXPECT_EQ(cell->get(kTSCellMonitorLAC).asInt32(), 0x5A1F);
        EXPECT_EQ(cell->get(kTSCellMonitorBandInfo).asInt32(), 34);
        ASSERT_TRUE(cell->get(kTSCellMonitorCellId).asInt32());
        ASSERT_TRUE(cell->get(kTSCellMonitorSCN).asInt32());
        EXPECT_LT(*cell->get(kTSCellMonitorSCN).asInt32(), 128);
        ASSERT_TRUE(cell->get(kTSCellMonitorUARFCN).asInt32());
        EXPECT_TRUE(inBandA(static_cast<uint32_t>(*cell->get(kTSCellMonitorUARFCN).asInt32())));
        auto rscp = cell->get(kTSCellMonitorRSCP).asInt32();
        ASSERT_TRUE(rscp);  // negative integers survive both plist formats
        EXPECT_GE(*rscp, -110);
        EXPECT_LE(*rscp, -60);
        size_t utranNeighbours = 0, gsm = 0;
        for (const Value& v : *cells) {
            auto d = v.asDictionary();
            ASSERT_TRUE(d);
            const std::string rat = *d->get(kTSCellMonitorCellRadioAccessTechnology).asString();
            const std::string type = *d->get(kTSCellMonitorCellType).asString();
            if (rat == kTSCellMonitorRadioAccessTechnologyUTRAN2 && type == kTSCellMonitorCellTypeNeighbor) ++utranNeighbours;
            if (rat == kTSCellMonitorRadioAccessTechnologyGSM) ++gsm;
        }
        EXPECT_GE(utranNeighbours, 2u);  // the strongest neighbours, at most four
        EXPECT_LE(utranNeighbours, 4u);
        EXPECT_EQ(gsm, 1u);
    }
    EXPECT_TRUE(sawBinary);
    EXPECT_TRUE(sawXML);
}

TEST(UTRANScenario, SimFilesAreADictionaryOfPart56Strings) {
    const std::set<std::string> part56{"kSimFile_ICCID", "kSimFile_MSISDN", "kSimFile_MBDN", "kSimFile_HPPLMN",
                                       "kSimFile_LOCI", "kSimFile_PSLOCI", "kSimFile_ACC", "kSimFile_AD",
                                       "kSimFile_FPLMN", "kSimFile_AHPLMN", "kSimFile_RATMODE", "kSimFile_PNN",
                                       "kSimFile_OPL", "kSimFile_OPLMNAcT"};
    const Stream stream = run(12, 1);
    auto records = recordsWithCode(stream, 0xFF0000);
    ASSERT_EQ(records.size(), 1u);
    auto sim = plistOf(records[0].second)->asDictionary();
    ASSERT_TRUE(sim);
    EXPECT_GE(sim->size(), 5u);
    for (const auto& [key, value] : *sim) {
        EXPECT_TRUE(part56.count(key)) << key;
        EXPECT_TRUE(value.asString()) << key;
    }
    const std::string iccid = *sim->get("kSimFile_ICCID").asString();
    ASSERT_EQ(iccid.size(), 20u);
    EXPECT_EQ(iccid.substr(0, 6), "898600");
    int sum = 0;  // Luhn over all 20 digits comes to a multiple of 10
    for (size_t i = 0; i < iccid.size(); ++i) {
        int d = iccid[iccid.size() - 1 - i] - '0';
        if (i % 2 == 1) d = d * 2 > 9 ? d * 2 - 9 : d * 2;
        sum += d;
    }
    EXPECT_EQ(sum % 10, 0);
    EXPECT_EQ(sim->get("kSimFile_MSISDN").asString()->substr(0, 3), "+86");
}

TEST(UTRANScenario, PDPContextsAreAnArrayOfDictionariesThatGetActivated) {
    const Stream stream = run(13, 200);
    auto records = recordsWithCode(stream, 0xFF0002);
    ASSERT_GE(records.size(), 2u);
    bool sawActive = false;
    for (auto& [n, rec] : records) {
        auto list = plistOf(rec)->asArray();
        ASSERT_TRUE(list);
        ASSERT_GE(list->size(), 1u);
        for (const Value& v : *list) {
            auto d = v.asDictionary();
            ASSERT_TRUE(d);
            for (const char* key : {"APN", "PDP Address", "NSAPI", "State"}) EXPECT_TRUE(d->get(key).asString()) << key;
            if (*d->get("State").asString() == "Active") {
                sawActive = true;
                EXPECT_EQ(d->get("PDP Address").asString()->substr(0, 3), "10.");
            }
        }
    }
    EXPECT_EQ(*plistOf(records[0].second)->asArray()->at(0).asDictionary()->get("State").asString(), "Inactive");
    EXPECT_TRUE(sawActive);
}

TEST(UTRANScenario, MalformedRecordsAppearWithin100Ticks) {
    bool shortRecord = false, wrongType = false, badSimPlist = false;
    for (const auto& tick : run(14, 100)) {
        for (const Bytes& r : tick) {
            ByteView b = body(r);
            if (b.size() < 13) shortRecord = true;
            if (b.size() >= 13 && b[0] != 1 && b[0] != 255) wrongType = true;
            if (codeOf(r) == 0xFF0000 && !PropertyListSerialization::read(ByteReader(b).from(13))) badSimPlist = true;
        }
    }
    EXPECT_TRUE(shortRecord);
    EXPECT_TRUE(wrongType);
    EXPECT_TRUE(badSimPlist);
}

TEST(UTRANScenario, SomeRecordsArriveBehindThe0x81Prefix) {
    Stream s = run(15, 20);
    size_t prefixed = 0;
    for (const auto& tick : s) {
        for (const Bytes& r : tick) {
            if (!hasPrefix(r)) continue;
            ++prefixed;
            EXPECT_EQ(r[1], 0x00);
            EXPECT_EQ(codeOf(r), 0xD00A);  // a whole record behind it
        }
    }
    EXPECT_GE(prefixed, 2u);  // ticks 3 and 10
}

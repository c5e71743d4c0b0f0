// EmulatorScenario: the seeded random sequence and time stamps shared by the emulator's synthetic modems.
#include "TelephonyService/Emulator/EmulatorScenario.h"

#include "Platform/LogCodes.h"
#include "Platform/RecordBuilder.h"
#include "Platform/StringFormat.h"
#include "Platform/TelephonyIdentifiers.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"

namespace vantorel {

namespace {

// mt19937 takes a 32-bit seed; fold the high half in so 64-bit seeds differ too.
uint32_t foldSeed(uint64_t seed) {
    return static_cast<uint32_t>(seed ^ (seed >> 32));
}

}  // namespace

EmulatorScenario::EmulatorScenario(uint64_t seed) : seed_(seed), engine_(foldSeed(seed)) {}

EmulatorScenario::~EmulatorScenario() = default;

std::vector<Bytes> EmulatorScenario::recordsForTick(uint64_t tick) {
    if (tick < nextTick_) restart();
    while (nextTick_ < tick) step();
    return step();
}

std::chrono::milliseconds EmulatorScenario::tickInterval() const {
    return std::chrono::milliseconds(500);
}

void EmulatorScenario::reseed() {
    engine_.seed(foldSeed(seed_));
}

uint32_t EmulatorScenario::random() {
    return static_cast<uint32_t>(engine_());
}

int32_t EmulatorScenario::uniform(int32_t low, int32_t high) {
    if (high <= low) return low;
    // Plain modulo: the tiny bias does not matter here, portability does.
    uint64_t span = static_cast<uint64_t>(static_cast<int64_t>(high) - low) + 1;
    return static_cast<int32_t>(low + static_cast<int64_t>(random() % span));
}

bool EmulatorScenario::chance(uint32_t percent) {
    return random() % 100 < percent;
}

uint64_t EmulatorScenario::timestampForTick(uint64_t tick) const {
    uint64_t ms = tick * static_cast<uint64_t>(tickInterval().count());
    return (ms * 4 / 5) << 16;
}

Bytes EmulatorScenario::packetContextsRecord(std::span<const PacketContext> contexts, bool binary) {
    auto list = Array::create();
    for (size_t i = 0; i < contexts.size(); ++i) {
        const PacketContext& p = contexts[i];
        if (i > 0 && !p.active) continue;
        auto d = Dictionary::create();
        d->set("APN", p.apn);
        d->set("PDP Type", p.type);
        d->set("PDP Address", p.address);
        d->set("NSAPI", StringFormat::format("%d", p.nsapi));
        d->set("State", p.active ? "Active" : "Inactive");
        list->append(Value(d));
    }
    return RecordBuilder::extraPropertyList(LogCode::kPDPContexts, Value(list), binary);
}

void EmulatorScenario::drawSubscriber(SimFiles& sim, const std::string& iccidPrefix, int iccidDigits,
                                      const std::string& msisdnPrefix) {
    sim.iccid = iccidPrefix;
    for (int i = 0; i < iccidDigits; ++i) sim.iccid += static_cast<char>('0' + uniform(0, 9));
    sim.iccid += luhnDigit(sim.iccid);
    sim.msisdn = msisdnPrefix;
    for (int i = 0; i < 8; ++i) sim.msisdn += static_cast<char>('0' + uniform(0, 9));
    sim.tmsi = StringFormat::format("%08X", random());
    sim.ptmsi = StringFormat::format("%08X", random() | 0xC0000000u);  // P-TMSI: top two bits set
}

Bytes EmulatorScenario::simFilesRecord(const SimFiles& sim, bool binary) {
    // The files as hex or text strings the way the service reads them; LAI = PLMN + LAC.
    const std::string lai = sim.plmn + StringFormat::format("%04X", static_cast<unsigned>(sim.lac));
    auto files = Dictionary::create();
    files->set("kSimFile_ICCID", sim.iccid);
    files->set("kSimFile_MSISDN", sim.msisdn);
    files->set("kSimFile_HPPLMN", sim.hpplmn);
    files->set("kSimFile_LOCI", sim.tmsi + lai + "FF00");                             // TMSI, LAI, RFU, updated
    files->set("kSimFile_PSLOCI", sim.ptmsi + sim.ptmsiSignature + lai + "01" + "00");  // P-TMSI, signature, RAI, updated
    files->set("kSimFile_ACC", sim.acc);
    files->set("kSimFile_AD", "00000002");  // normal operation, 2-digit MNC
    files->set("kSimFile_FPLMN", sim.fplmn);
    files->set("kSimFile_AHPLMN", sim.plmn);
    if (!sim.oplmnAcT.empty()) files->set("kSimFile_OPLMNAcT", sim.oplmnAcT);
    return RecordBuilder::extraPropertyList(LogCode::kSimFiles, Value(files), binary);
}

DictionaryRef EmulatorScenario::monitorCell(const char* technology, const char* type) {
    auto cell = Dictionary::create();
    cell->set(kTSCellMonitorCellRadioAccessTechnology, technology);
    cell->set(kTSCellMonitorCellType, type);
    return cell;
}

Bytes EmulatorScenario::cutPropertyListRecord(int32_t code, std::string_view text, uint64_t tick) const {
    return RecordBuilder::extra(code)
        .timestamp(timestampForTick(tick))
        .bytes(RecordBuilder::kHeaderLength, ByteView(reinterpret_cast<const uint8_t*>(text.data()), text.size()))
        .build();
}

char EmulatorScenario::luhnDigit(const std::string& digits) {
    int sum = 0;
    bool doubled = true;  // the digit next to the check digit is doubled
    for (size_t i = digits.size(); i-- > 0;) {
        int d = digits[i] - '0';
        if (doubled) {
            d *= 2;
            if (d > 9) d -= 9;
        }
        sum += d;
        doubled = !doubled;
    }
    return static_cast<char>('0' + (10 - sum % 10) % 10);
}

std::string EmulatorScenario::dottedAddress(int a, int b, int c, int d) {
    return StringFormat::format("%d.%d.%d.%d", a, b, c, d);
}

}  // namespace vantorel

// EmulatorScenario: the abstract synthetic modem that the emulator backend runs on a clock, one subclass per technology.
#pragma once

#include "PropertyList/Value.h"

#include <chrono>
#include <cstdint>
#include <random>
#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace vantorel {

// A scenario is a scripted modem for one technology. The backend answers
// "GetTechnology" with technology(), then every tickInterval() asks for
// recordsForTick(n), n = 0, 1, 2, ..., and streams each returned message (a
// Morvek-channel record, possibly behind the 0x81 0x00 prefix) as one message.
//
// Determinism: everything random comes from the scenario's own std::mt19937
// (whose output sequence the C++ standard fixes) through the integer helpers
// below, never through the standard distributions (whose results differ between
// library implementations). So a given seed and the same sequence of calls give
// the same bytes on every machine.
class EmulatorScenario {
public:
    explicit EmulatorScenario(uint64_t seed);
    virtual ~EmulatorScenario();

    EmulatorScenario(const EmulatorScenario&) = delete;
    EmulatorScenario& operator=(const EmulatorScenario&) = delete;

    // The technology identifier the modem reports (TelephonyIdentifiers.h).
    virtual std::string technology() const = 0;
    // One line for --help listings.
    virtual std::string description() const = 0;
    // Time between two ticks.
    virtual std::chrono::milliseconds tickInterval() const;
    // The messages the modem sends at tick n, in sending order. The state is a walk
    // from tick 0: going back restarts it from the seed, skipping ahead runs the ticks
    // in between, so tick n always gives the same bytes.
    std::vector<Bytes> recordsForTick(uint64_t tick);

    uint64_t seed() const { return seed_; }

protected:
    // A packet-data context as the 0xFF0002 extra record lists it.
    struct PacketContext {
        std::string apn;
        std::string type;  // "IP", "IPV6"
        std::string address;
        int nsapi = 0;
        bool active = false;
    };
    // The SIM's elementary files as the 0xFF0000 extra record lists them (hex strings).
    struct SimFiles {
        std::string iccid;
        std::string msisdn;
        std::string tmsi;            // 8 hex digits
        std::string ptmsi;           // 8 hex digits
        std::string plmn;            // home PLMN, 3 BCD bytes as 6 hex digits ("62F210" for 262-01)
        int lac = 0;                 // the location area of LOCI and PS-LOCI
        std::string hpplmn;          // search period, 1 byte
        std::string ptmsiSignature;  // 3 bytes
        std::string acc;             // access control class, 2 bytes
        std::string fplmn;           // forbidden PLMNs
        std::string oplmnAcT;        // operator PLMN with access technology; empty: not on this SIM
    };

    // The walk: back to the state of tick 0 (reseed() included, nextTick_ = 0), and
    // the records of tick nextTick_ (which it then advances).
    virtual void restart() = 0;
    virtual std::vector<Bytes> step() = 0;

    // Restarts the random sequence from the seed (for scenarios that replay).
    void reseed();
    // The next raw 32-bit number of the sequence.
    uint32_t random();
    // An integer in [low, high] (both included; low <= high).
    int32_t uniform(int32_t low, int32_t high);
    // True with the given probability in percent (0 never, 100 always).
    bool chance(uint32_t percent);
    // One step of a random walk pulled gently back towards target, so values wander
    // without piling up at the limits.
    static int32_t pulled(int32_t value, int32_t step, int32_t target) { return value + step + (target - value) / 10; }
    // The record time stamp (bytes 5..12, never read by the decoders) of tick n,
    // in the modem's format: 1.25 ms units since start in bits 16..63, bits 0..15 zero.
    uint64_t timestampForTick(uint64_t tick) const;

    // The 0xFF0002 extra record: the first context always, the others while active;
    // each dictionary is shown as sent, so every value is a display string.
    static Bytes packetContextsRecord(std::span<const PacketContext> contexts, bool binary);
    // Draws the subscriber of sim: ICCID iccidPrefix + iccidDigits random digits + Luhn
    // digit, MSISDN msisdnPrefix + 8 random digits, then TMSI and P-TMSI.
    void drawSubscriber(SimFiles& sim, const std::string& iccidPrefix, int iccidDigits, const std::string& msisdnPrefix);
    // The 0xFF0000 extra record.
    static Bytes simFilesRecord(const SimFiles& sim, bool binary);
    // A cell of the 0xFF0001 extra record, its technology and type (serving or neighbour) set.
    static DictionaryRef monitorCell(const char* technology, const char* type);
    // An extra record whose XML property list was cut off in transfer (`text`).
    Bytes cutPropertyListRecord(int32_t code, std::string_view text, uint64_t tick) const;
    // The Luhn check digit that ends an ICCID (ITU-T E.118).
    static char luhnDigit(const std::string& digits);
    static std::string dottedAddress(int a, int b, int c, int d);

    uint64_t nextTick_ = 0;

private:
    uint64_t seed_;
    std::mt19937 engine_;
};

}  // namespace vantorel

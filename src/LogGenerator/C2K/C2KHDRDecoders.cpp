// C2KHDRDecoders: decodes the EV-DO status, active-set, finger and data-rate records into display strings.
#include "LogGenerator/C2K/C2KHDRDecoders.h"

#include "LogGenerator/C2K/C2KLookup.h"
#include "LogGenerator/C2K/C2KTexts.h"
#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"
#include "PropertyList/Dictionary.h"

#include <cmath>
#include <cstdint>
#include <iterator>
#include <string>

namespace vantorel {

namespace {

const char* const kDeviceState[] = {"Inactive [0]", "Acquisition [1]", "Sync [2]",
                                    "Idle [3]",     "Access [4]",      "Connected [5]"};
const char* const kSessionState[] = {"Closed [0]", "AMP setup [1]", "AT-initiated neg [2]", "Initiated neg [3]",
                                     "Open [4]"};

template <size_t N>
std::string enumText(const char* const (&table)[N], unsigned value) {
    if (value < N) return table[value];
    return StringFormat::format("[Reserved %d]", static_cast<int>(value));
}

// Reads that the length rule already guarantees; a field outside the record reads as 0.
uint8_t u8At(const ByteReader& r, size_t offset) { return r.u8(offset).value_or(0); }
uint16_t u16At(const ByteReader& r, size_t offset) { return r.u16(offset).value_or(0); }
uint32_t u32At(const ByteReader& r, size_t offset) { return r.u32(offset).value_or(0); }

void set(const char* lookupKey, std::string text, const DictionaryRef& lookup) {
    C2KLookup::setLookupValue(lookupKey, Value(std::move(text)), lookup);
}

// Pilot strengths and finger C/I come in units of 1/512: shown in dB.
std::string decibels(unsigned linear) { return StringFormat::format("%+.2f dB", 10.0 * std::log10(linear / 512.0)); }

bool atLeast(const ByteReader& r, int32_t code, size_t minimum) {
    if (r.size() >= minimum) return true;
    SystemLog::log(SystemLog::kError, "Log code 0x%04x is %u bytes long but must be at least %lu bytes.",
                   static_cast<unsigned>(code), static_cast<unsigned>(r.size()), static_cast<unsigned long>(minimum));
    return false;
}

// Forward-link payload bits per packet, one weight per 32-bit counter at 17 + 4 i: the
// counters come in groups by DRC, one per packet size of that DRC and a last one for
// packets that carry no payload (weight 0).
constexpr unsigned kForwardBits[56] = {
    128, 256, 512, 1024, 0,  128, 256, 512, 1024, 0,  128, 256, 512, 1024, 0,  // 0-14
    128, 256, 512, 1024, 0,  128, 256, 512, 1024, 0,                           // 15-24
    512, 1024, 2048, 0,      128, 256, 512, 1024, 0,  512, 1024, 2048, 0,      // 25-37
    1024, 3072, 0,           512, 1024, 2048, 0,      4096, 0,                 // 38-46
    1024, 3072, 0,           4096, 0,                 5120, 0,  5120, 0,       // 47-55
};

// Reverse-link packet sizes in bits, one per rate index 0..11.
constexpr unsigned kReverseBits[12] = {128, 256, 512, 768, 1024, 1536, 2048, 3072, 4096, 6144, 8192, 12288};

uint64_t forwardBits(const ByteReader& r) {
    uint64_t bits = 0;
    for (size_t i = 0; i < std::size(kForwardBits); ++i) bits += uint64_t{u32At(r, 17 + 4 * i)} * kForwardBits[i];
    return bits;
}

// Each rate index has 24 counters: 3 blocks of 576 bytes, 4 counters in each of two
// tables (from 18 and from 306) with a stride of 24 bytes per rate index.
uint64_t reverseBits(const ByteReader& r) {
    uint64_t bits = 0;
    for (size_t rate = 0; rate < std::size(kReverseBits); ++rate) {
        uint64_t count = 0;
        for (size_t block = 0; block < 3; ++block)
            for (size_t j = 0; j < 4; ++j) {
                const size_t at = 24 * rate + 576 * block + 4 * j;
                count += u32At(r, 18 + at) + uint64_t{u32At(r, 306 + at)};
            }
        bits += count * kReverseBits[rate];
    }
    return bits;
}

// One link's rate record: where its sequence number lies, how its bit total is counted,
// and the state, "ExtraInfo" and display keys it keeps its counters and rate under.
struct RateLink {
    int32_t code;
    size_t minimumLength;
    size_t sequenceOffset;
    uint64_t (*bits)(const ByteReader&);
    const char* prefix;  // "FL" or "RL": state keys "<p>DataSeqNum", "<p>DataSent"
    const char* displayKey;
};

const RateLink kForwardLink{LogCode::kC2KForwardDataRate, 241, 13, forwardBits, "FL", "kFLDataRate"};
// The reverse record's sequence number lies one byte later than the forward one's.
const RateLink kReverseLink{LogCode::kC2KReverseDataRate, 1750, 14, reverseBits, "RL", "kRLDataRate"};

DictionaryRef extraInfo(Dictionary& state) {
    DictionaryRef extra = state.get("ExtraInfo").asDictionary();
    if (!extra) {
        extra = Dictionary::create();
        state.set("ExtraInfo", Value(extra));
    }
    return extra;
}

// The rate over the records since the previous one: bits / (sequence steps × 1024). The
// first record only primes the counters; a sequence number that did not advance (same or
// earlier, as a signed 32-bit difference so a wrap still counts forward) keeps the old rate.
void dataRate(const RateLink& link, ByteView record, Dictionary& state, const DictionaryRef& lookup) {
    const ByteReader r(record);
    if (r.size() < link.minimumLength) {
        SystemLog::log(SystemLog::kError, "Log code 0x%04x is %d bytes long but must be at least %ld bytes.",
                       static_cast<unsigned>(link.code), static_cast<int>(r.size()),
                       static_cast<long>(link.minimumLength));
        return;
    }
    const std::string seqKey = std::string(link.prefix) + "DataSeqNum";
    const std::string sentKey = std::string(link.prefix) + "DataSent";
    const uint32_t sequence = u32At(r, link.sequenceOffset);
    const int64_t bits = static_cast<int64_t>(link.bits(r));
    const Value seqValue = Value::integer(static_cast<int32_t>(sequence));
    const Value sentValue = Value::integer(bits);
    const DictionaryRef extra = extraInfo(state);

    const std::optional<int32_t> previousSeq = state.get(seqKey).asInt32();
    const std::optional<int64_t> previousSent = state.get(sentKey).asInteger();
    if (previousSeq && previousSent) {
        const int32_t steps = static_cast<int32_t>(sequence - static_cast<uint32_t>(*previousSeq));
        if (steps >= 1)
            set(link.displayKey, StringFormat::format("%.2f kbps", (bits - *previousSent) / (steps * 1024.0)), lookup);
        extra->set(seqKey + "2", state.get(seqKey));
        extra->set(sentKey + "2", state.get(sentKey));
    } else {
        set(link.displayKey, "", lookup);
    }
    state.set(seqKey, seqValue);
    state.set(sentKey, sentValue);
    extra->set(seqKey + "1", seqValue);
    extra->set(sentKey + "1", sentValue);
}

}  // namespace

// Record layout (offsets from the record start): 13 channel low 8 bits; 14 channel high 3
// bits (bits 0-2) and band class (bits 3-7); 15, 16, 17 signed Rx AGC 0, Rx AGC 1, Tx AGC
// in dBm; 18 u16 serving PN offset in 64-chip units; 36 device state; 37 session state;
// 38 UATI low 24 bits; 41 colour code.
void C2KHDRDecoders::hdrStatus(ByteView record, Dictionary&, const DictionaryRef& lookup) {
    const ByteReader r(record);
    if (r.size() != 50) {
        SystemLog::log(SystemLog::kError, "Log code 0x1183 is %u bytes long but should be %lu bytes.",
                       static_cast<unsigned>(r.size()), 50UL);
        return;
    }
    const uint8_t bandAndChannel = u8At(r, 14);
    const uint8_t deviceState = u8At(r, 36);
    // Chain 1 and the transmitter are only meaningful once the device has a connection.
    const bool connecting = deviceState >= 4;
    auto dBm = [&](size_t offset) {
        return connecting ? StringFormat::format("%+d dBm", static_cast<int8_t>(u8At(r, offset))) : std::string("N/A");
    };
    const uint16_t pn = u16At(r, 18);
    const uint32_t uati = u8At(r, 38) | u8At(r, 39) << 8 | u8At(r, 40) << 16;

    set("kChannel", StringFormat::format("%d", u8At(r, 13) + 256 * (bandAndChannel & 7)), lookup);
    set("k1xEVDODeviceState", enumText(kDeviceState, deviceState), lookup);
    set("kBandClass", C2KTexts::bandClass(bandAndChannel >> 3), lookup);
    set("kRxAGC0", StringFormat::format("%+d dBm", static_cast<int8_t>(u8At(r, 15))), lookup);
    set("kRxAGC1", dBm(16), lookup);
    set("kTxAGC", dBm(17), lookup);
    set("kServingPNOffset", pn == 65535 ? std::string("Invalid Value") : StringFormat::format("%d \u00d7 64chips", pn),
        lookup);
    set("kSessionState", enumText(kSessionState, u8At(r, 37)), lookup);
    set("kUATI24", StringFormat::format("0x%06x", uati), lookup);
    set("kColorCode", StringFormat::format("%d", u8At(r, 41)), lookup);
}

// Record layout: 15 pilot count; 12-byte pilots from 25, each u16 PN offset at +0 and
// u16 strength at +2 (1/512 units).
void C2KHDRDecoders::hdrActiveSet(ByteView record, Dictionary&, const DictionaryRef& lookup) {
    const ByteReader r(record);
    if (!atLeast(r, LogCode::kC2KHDRActiveSet, 25)) return;
    const unsigned count = u8At(r, 15);
    if (r.size() < 25 + 12 * count) {
        SystemLog::log(SystemLog::kError, "Log code 0x12b6 is %u bytes long, but has %d substructs.",
                       static_cast<unsigned>(r.size()), static_cast<int>(count));
        return;
    }
    C2KLookup::PilotList pilots;
    for (unsigned i = 0; i < count; ++i) {
        const size_t at = 25 + 12 * i;
        pilots.add(static_cast<int>(i), u16At(r, at), decibels(u16At(r, at + 2)));
    }
    C2KLookup::setLookupValue("kActiveSetPilots", pilots.value(true), lookup);
}

// Record layout: 22 finger count; 14-byte fingers from 23, each u16 PN offset at +0
// (65535 for an unassigned finger) and u16 C/I at +6 (1/512 units).
void C2KHDRDecoders::fingerCI(ByteView record, Dictionary&, const DictionaryRef& lookup) {
    const ByteReader r(record);
    if (!atLeast(r, LogCode::kC2KFingerCI, 23)) return;
    const unsigned count = u8At(r, 22);
    if (r.size() != 23 + 14 * count) {
        // The size printed is the fixed header's, as the modem tools print it.
        SystemLog::log(SystemLog::kError, "Log code 0x108a has bad length of %u bytes, but has %d substructs (size=%lu).",
                       static_cast<unsigned>(r.size()), static_cast<int>(count), 23UL);
        return;
    }
    C2KLookup::PilotList fingers;
    for (unsigned i = 0; i < count; ++i) {
        const size_t at = 23 + 14 * i;
        const uint16_t pn = u16At(r, at);
        if (pn == 65535) continue;  // unassigned: its index stays used up
        fingers.add(static_cast<int>(i), pn, decibels(u16At(r, at + 6)));
    }
    C2KLookup::setLookupValue("kFingerC2I", fingers.value(true), lookup);
}

void C2KHDRDecoders::forwardDataRate(ByteView record, Dictionary& state, const DictionaryRef& lookup) {
    dataRate(kForwardLink, record, state, lookup);
}

void C2KHDRDecoders::reverseDataRate(ByteView record, Dictionary& state, const DictionaryRef& lookup) {
    dataRate(kReverseLink, record, state, lookup);
}

}  // namespace vantorel

// C2K1xDecoders: the 1x status subpackets, traffic frame error rate and system identity, decoded into the CDMA display.
#include "LogGenerator/C2K/C2K1xDecoders.h"

#include "LogGenerator/C2K/C2KLookup.h"
#include "LogGenerator/C2K/C2KTexts.h"
#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"
#include "PropertyList/Dictionary.h"

#include <cmath>
#include <iterator>

namespace vantorel {

namespace {

// Subpacket lists: byte 14 holds the count, the first subpacket starts at 17; each begins
// with its identifier (byte 0) and its total size, header included (bytes 2-3).
constexpr size_t kListCount = 14;
constexpr size_t kListStart = 17;
constexpr size_t kMinimumLength = 17;
constexpr size_t kSystemIdentityLength = 171;

constexpr uint8_t kSystemState = 1;
constexpr uint8_t kRF = 2;
constexpr uint8_t kActiveSet = 3;
constexpr uint8_t kFingers = 4;
constexpr uint8_t kTrafficDemod = 11;

constexpr unsigned kTraffic = 8;
constexpr uint32_t kSystemTypeCDMA = 2;
// One frame's weight in the running frame error rate: an exponential average over ~64 frames.
constexpr float kFERWeight = 0.015625f;
constexpr double kEcIoFloor = 0.00001;

const char* const kDeviceState[] = {
    "Inactive [0]",          "Deep sleep in start state [1]", "Initial state for CDMA operation [2]",
    "Acquisition [3]",       "Sync [4]",                      "Slew [5]",
    "Paging [6]",            "Slotted mode sleep state [7]",  "Traffic [8]",
    "UnSlew [9]",            "Operation in PCG state [10]",   "Powerup state [11]",
};

// Enhanced roaming indicator values of the CDMA standard's ERI table.
const char* const kRoamingIndicator[] = {
    "OFF [0]",
    "ON [1]",
    "Flashing [2]",
    "Out of Neighborhood [3]",
    "Out of Building [4]",
    "Preferred system [5]",
    "Available system [6]",
    "Alliance partner [7]",
    "Premium partner [8]",
    "Full service functionality [9]",
    "Partial service functionality [10]",
    "Banner ON [11]",
    "Banner OFF [12]",
};

std::string deviceStateText(unsigned value) {
    if (value < std::size(kDeviceState)) return kDeviceState[value];
    return StringFormat::format("[Bad Value %d]", static_cast<int>(value));
}

std::string roamingText(uint32_t value) {
    if (value < std::size(kRoamingIndicator)) return kRoamingIndicator[value];
    return StringFormat::format("ERI - %d", static_cast<int>(value));
}

void show(const char* key, std::string text, const DictionaryRef& lookup) {
    C2KLookup::setLookupValue(key, Value(std::move(text)), lookup);
}

// Receive AGC: raw units of 0.334 dB above -63.248 dBm.
std::string rxAGC(int8_t raw) {
    return StringFormat::format("%+.2f dBm", raw * 334 / 1000.0 - 63.248);
}

std::optional<double> number(const Value& v) {
    if (auto r = v.asReal()) return r;
    if (auto i = v.asInteger()) return static_cast<double>(*i);
    return std::nullopt;
}

// Active set information, by offset from the subpacket start: 4-5 N, 6 M, 7 E (the scaling
// of the pilot energies), 8 pilot count, 9 energy words per pilot k, 10-11 reference PN.
// Pilot entries start at the subpacket start itself, one every (15 + 6k) & 0xffc bytes;
// in each, the PN offset is at +12 and the energy X at +24 + 4k.
Value activeSetInfo(const ByteReader& r, size_t sp) {
    const unsigned n = r.u8(sp + 8).value_or(0);
    const unsigned k = r.u8(sp + 9).value_or(0);
    const unsigned referencePN = r.u16(sp + 10).value_or(0);
    const double bigN = r.u16(sp + 4).value_or(0);
    const double m = r.u8(sp + 6).value_or(0);
    const int e = r.u8(sp + 7).value_or(0);
    const size_t stride = (15 + 6 * k) & 0xffc;
    C2KLookup::PilotList pilots;
    for (unsigned i = 0; i < n; ++i) {
        const size_t base = sp + i * stride;
        const unsigned pn = r.u16(base + 12).value_or(0);
        const double x = r.u16(base + 4 * k + 24).value_or(0);
        double ecio = std::ldexp(1.0, 2 * e - 3) * x / (m * 9 * bigN * bigN) - 1 / bigN;
        if (!(ecio > kEcIoFloor)) ecio = kEcIoFloor;  // also catches the NaN of a zero N or M
        const double db = 10 * std::log10(ecio);
        pilots.add(static_cast<int>(i), pn,
                   pn == referencePN ? StringFormat::format("(ref pilot) %+.2f dB", db)
                                     : StringFormat::format("%+.2f dB", db));
    }
    return pilots.value(false);
}

}  // namespace

std::optional<size_t> C2K1xDecoders::findSubpacket(ByteView record, uint8_t identifier) {
    const ByteReader r(record);
    const unsigned count = r.u8(kListCount).value_or(0);
    // The modem's own size check lets a subpacket claim up to 17 bytes beyond the record's
    // end; the fields themselves are still read only where the record holds them.
    const size_t bound = kListStart + record.size();
    size_t current = kListStart;
    for (unsigned index = 0; index < count; ++index) {
        const unsigned size = r.u16(current + 2).value_or(0);
        const size_t next = current + size;
        if (next >= bound) {
            SystemLog::log(SystemLog::kError, "Log code error in subpkt#%d: bad size (%d).", static_cast<int>(index),
                           static_cast<int>(size));
            return std::nullopt;
        }
        if (r.u8(current) == identifier) return current;
        // A zero size would visit the same subpacket again for every remaining count;
        // no later subpacket can be reached, so the walk ends here.
        if (size == 0) return std::nullopt;
        current = next;
    }
    return std::nullopt;
}

void C2K1xDecoders::oneXStatus(ByteView record, Dictionary& state, const DictionaryRef& lookup) {
    if (record.size() < kMinimumLength) {
        SystemLog::log(SystemLog::kError, "Log code 0x%x is %u bytes long but must be at least %lu bytes.",
                       static_cast<unsigned>(LogCode::kC2K1xStatus), static_cast<unsigned>(record.size()),
                       static_cast<unsigned long>(kMinimumLength));
        return;
    }
    const auto ss = findSubpacket(record, kSystemState);
    const auto rf = findSubpacket(record, kRF);
    const auto ai = findSubpacket(record, kActiveSet);
    const auto fi = findSubpacket(record, kFingers);  // required, though none of its fields is shown
    if (!ss || !rf || !ai || !fi) {
        SystemLog::log(SystemLog::kWarning, "Log code 0x%x: missing subpacket (ss=%d,rf=%d,ai=%d,fi=%d).",
                       static_cast<unsigned>(LogCode::kC2K1xStatus), ss ? 1 : 0, rf ? 1 : 0, ai ? 1 : 0, fi ? 1 : 0);
        return;
    }
    const ByteReader r(record);
    // RF subpacket: 4/5 band class per chain, 6/8 channel per chain, 10/11 raw Rx AGC per
    // chain, 12-13 Tx AGC in tenths of dBm.
    const unsigned deviceState = r.u8(*ss + 4).value_or(0);
    const bool traffic = deviceState == kTraffic;
    const std::string notApplicable = "N/A";
    show("k1xDeviceState", deviceStateText(deviceState), lookup);
    show("k1xRx0BandClass", C2KTexts::bandClass(r.u8(*rf + 4).value_or(0)), lookup);
    show("k1xRx0ChanNum", StringFormat::format("%d", r.u16(*rf + 6).value_or(0)), lookup);
    show("k1xRxAGC0", rxAGC(static_cast<int8_t>(r.u8(*rf + 10).value_or(0))), lookup);
    // The second chain and the transmitter only carry meaning during a call.
    show("k1xRx1BandClass", traffic ? C2KTexts::bandClass(r.u8(*rf + 5).value_or(0)) : notApplicable, lookup);
    show("k1xRx1ChanNum", traffic ? StringFormat::format("%d", r.u16(*rf + 8).value_or(0)) : notApplicable, lookup);
    show("k1xRxAGC1", traffic ? rxAGC(static_cast<int8_t>(r.u8(*rf + 11).value_or(0))) : notApplicable, lookup);
    show("k1xTxAGC", traffic ? StringFormat::format("%+.2f dBm", r.s16(*rf + 12).value_or(0) / 10.0) : notApplicable,
         lookup);
    C2KLookup::setLookupValue("k1xActiveSetInfo", activeSetInfo(r, *ai), lookup);
    if (traffic) return;
    // The call has ended: the last average stays on screen marked as stale, and the next
    // call starts a fresh one.
    if (const auto fer = number(state.get("TrafficFER"))) {
        show("k1xTrafficFER", StringFormat::format("%.02f%% (old)", *fer * 100), lookup);
        state.remove("TrafficFER");
    }
}

void C2K1xDecoders::trafficFER(ByteView record, Dictionary& state, const DictionaryRef& lookup) {
    if (record.size() < kMinimumLength) {
        SystemLog::log(SystemLog::kError, "Log code 0x%x is %d bytes long but must be at least %ld bytes.",
                       static_cast<unsigned>(LogCode::kC2KTrafficFER), static_cast<int>(record.size()),
                       static_cast<long>(kMinimumLength));
        return;
    }
    const auto demod = findSubpacket(record, kTrafficDemod);
    if (!demod) {
        SystemLog::log(SystemLog::kWarning, "Log code 0x%x: missing traffic demod subpacket.",
                       static_cast<unsigned>(LogCode::kC2KTrafficFER));
        return;
    }
    // Byte 24 of the traffic demodulation subpacket flags the frame as received in error.
    const float sample = ByteReader(record).u8(*demod + 24).value_or(0) != 0 ? 1.0f : 0.0f;
    float rate = sample * kFERWeight;
    if (const auto old = number(state.get("TrafficFER"))) rate += static_cast<float>(*old) * (1.0f - kFERWeight);
    state.set("TrafficFER", Value::real(rate));
    show("k1xTrafficFER", StringFormat::format("%.02f%%", rate * 100.0f), lookup);
}

void C2K1xDecoders::systemIdentity(ByteView record, Dictionary&, const DictionaryRef& lookup) {
    const ByteReader r(record);
    if (record.size() < kSystemIdentityLength) {
        SystemLog::log(SystemLog::kError, "Log code 0x%x is %d bytes long but must be at least %lu bytes.",
                       static_cast<unsigned>(LogCode::kC2KSystemIdentity), static_cast<int>(record.size()),
                       static_cast<unsigned long>(kSystemIdentityLength));
        return;
    }
    const unsigned version = r.u8(13).value_or(0);
    if (version < 2) {
        SystemLog::log(SystemLog::kError, "Log code 0x%x has version=%d; only version 2 or higher expected; dropping.",
                       static_cast<unsigned>(LogCode::kC2KSystemIdentity), static_cast<int>(version));
        return;
    }
    // Payload: 42 roaming indicator (u32), 46 system type (u32), 50 SID, 52 NID (u16 each),
    // 131 packet zone, 133 protocol revision, 184-185 base station ID.
    const uint32_t systemType = r.u32(46).value_or(0);
    const auto identifier = [&](size_t offset) {
        if (systemType != kSystemTypeCDMA)
            return StringFormat::format("(unknown system type %d)", static_cast<int>(systemType));
        return StringFormat::format("%d", r.u16(offset).value_or(0));
    };
    // Records of 171 to 185 bytes pass the length rule without holding the base station ID;
    // each byte it lacks counts as 0.
    const unsigned baseId = r.u8(184).value_or(0) | r.u8(185).value_or(0) << 8;
    show("k1xRoamingHome", roamingText(r.u32(42).value_or(0)), lookup);
    show("kSystemId", identifier(50), lookup);
    show("kNetworkId", identifier(52), lookup);
    show("kPacketZoneId", StringFormat::format("%d", r.u8(131).value_or(0)), lookup);
    show("kBaseId", StringFormat::format("%u", baseId), lookup);
    show("kProtocolRevision", StringFormat::format("%d", r.u8(133).value_or(0)), lookup);
}

}  // namespace vantorel

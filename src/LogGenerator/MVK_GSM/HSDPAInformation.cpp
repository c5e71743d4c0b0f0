// HSDPAInformation: the "HSDPA Info" section: version, sub-frames, carrier configuration and the primary and secondary HARQ processes of record 0x4221.
#include "LogGenerator/MVK_GSM/HSDPAInformation.h"

#include "LogGenerator/MVK_GSM/RecordFields.h"
#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/SystemLog.h"
#include "PropertyList/Dictionary.h"

namespace vantorel {

namespace {

using F = RecordFields;

const char* const kCarrierInfo[] = {"Single Carrier", "MIMO", "Dual Carrier", "Reserved"};

// 0x4221 header (at least 18 bytes; shorter records change nothing):
//   13  version
//   14  sub-frame count, 10 bits: byte 14 and bits 0-1 of byte 15
//   15  bits 2-3: carrier configuration
//   16  primary process count P
//   17  secondary process count S
const RecordFields::Field kHeader[] = {
    F::unsignedNumber("Version", 13),
    F::unsignedNumber("Sub Frames", 14, 2).bits(0, 10),
    F::text("Carrier Info", 15, kCarrierInfo).bits(2, 2),
};

// HARQ process entry, 9 bytes: ID at 0, u32 received bits at 1, u16 new transmissions
// at 5, u16 block errors at 7.
const RecordFields::Field kProcess[] = {
    F::unsignedNumber("Process ID", 0),
    F::unsignedNumber("No Rx Bits", 1, 4),
    F::unsignedNumber("New Tx", 5, 2),
    F::unsignedNumber("Block Errors", 7, 2),
};

constexpr size_t kPrimaryOffset = 18;
constexpr size_t kEntrySize = 9;
// The secondary entries start 162 bytes per primary process after offset 18 (not 9),
// where the modem places them.
constexpr size_t kSecondaryStridePerPrimary = 162;

}  // namespace

std::string HSDPAInformation::getSectionName() const { return "HSDPA Info"; }

std::vector<int32_t> HSDPAInformation::getLogCodeArray() const { return {LogCode::kHSDPADecodeStatistics}; }

void HSDPAInformation::updateWithData(ByteView data, int32_t logCode) {
    SystemLog::log(SystemLog::kWarning, "%s", "HSDPA Info");
    if (logCode != LogCode::kHSDPADecodeStatistics) {
        logUnknownCode(logCode);
        return;
    }
    const ByteReader r(data);
    if (r.size() < kPrimaryOffset) return;
    RecordFields::show(r, kHeader, [this](const std::string& key, const std::string& text) { setValue(key, text); });
    const auto processes = [&r](size_t first, unsigned count) {
        return Value(readEntries(r, first, kEntrySize, kEntrySize, count,
                                 [](const ByteReader& entry) { return RecordFields::dictionary(entry, kProcess); }));
    };
    const unsigned primary = r.u8(16).value_or(0);
    const unsigned secondary = r.u8(17).value_or(0);
    const auto d = sectionDictionary();
    if (!d) return;
    d->set("Primary HARQ Process", processes(kPrimaryOffset, primary));
    d->set("Secondary HARQ Process", processes(kPrimaryOffset + kSecondaryStridePerPrimary * primary, secondary));
}

}  // namespace vantorel

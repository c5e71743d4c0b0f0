// MobileAllocation: the "Mobile Allocation" section: hopping sequence number and ARFCN list of record 0x51F8.
#include "LogGenerator/MVK_GSM/MobileAllocation.h"

#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"
#include "PropertyList/Dictionary.h"

namespace vantorel {

std::string MobileAllocation::getSectionName() const { return "Mobile Allocation"; }

std::vector<int32_t> MobileAllocation::getLogCodeArray() const { return {LogCode::kGSMMobileAllocation}; }

// 0x51F8 (at least 15 bytes; shorter records change nothing):
//   13          HSN
//   14          ARFCN count K
//   15 + 2 * i  u16 ARFCN i
// Each record replaces the whole ARFCN list; K = 0 shows an empty one.
void MobileAllocation::updateWithData(ByteView data, int32_t logCode) {
    SystemLog::log(SystemLog::kWarning, "%s", "MobileAllocation");
    if (logCode != LogCode::kGSMMobileAllocation) {
        logUnknownCode(logCode);
        return;
    }
    const ByteReader r(data);
    if (r.size() < 15) return;
    setValue("HSN", StringFormat::format("%d", r.u8(13).value_or(0)));
    const ArrayRef arfcns = readEntries(r, 15, 2, 2, r.u8(14).value_or(0), [](const ByteReader& entry) {
        return Value(StringFormat::format("%d", entry.u16(0).value_or(0)));
    });
    if (const auto d = sectionDictionary()) d->set("ARFCNs", Value(arfcns));
}

}  // namespace vantorel

// BLER: the "BLER" section: window size and per-transport-channel CRC counts of record 0x4116.
#include "LogGenerator/MVK_GSM/BLER.h"

#include "LogGenerator/MVK_GSM/RecordFields.h"
#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"
#include "PropertyList/Dictionary.h"

namespace vantorel {

namespace {

// Transport-channel entry, 9 bytes: ID at 0, signed 32-bit CRC counts at 1 and 5.
const RecordFields::Field kTransportChannel[] = {
    RecordFields::number("Transport Channel ID", 0),
    RecordFields::number("CRC Received", 1, 4),
    RecordFields::number("CRC Received in Error", 5, 4),
};

}  // namespace

std::string BLER::getSectionName() const { return "BLER"; }

std::vector<int32_t> BLER::getLogCodeArray() const { return {LogCode::kUMTSBLER}; }

// 0x4116 (at least 16 bytes; shorter records change nothing):
//   13          transport-channel count T
//   14          u16 window size
//   16 + 9 * i  transport-channel entry i
// Each record replaces the whole channel list.
void BLER::updateWithData(ByteView data, int32_t logCode) {
    SystemLog::log(SystemLog::kWarning, "%s", "BLER");
    if (logCode != LogCode::kUMTSBLER) {
        logUnknownCode(logCode);
        return;
    }
    const ByteReader r(data);
    if (r.size() < 16) return;
    setValue("Window Size", StringFormat::format("%d", r.u16(14).value_or(0)));
    const ArrayRef channels = readEntries(r, 16, 9, 9, r.u8(13).value_or(0), [](const ByteReader& entry) {
        return RecordFields::dictionary(entry, kTransportChannel);
    });
    if (const auto d = sectionDictionary()) d->set("Transport Channels", Value(channels));
}

}  // namespace vantorel

// GSMSet: the "GSM Set" section: ARFCN, BSIC, RSSI and ranking value of each GSM cell of the reselection-ranking record 0x4005.
#include "LogGenerator/MVK_GSM/GSMSet.h"

#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"
#include "PropertyList/Dictionary.h"

namespace vantorel {

namespace {

// Reselection-ranking record 0x4005 (at least 15 bytes):
//   13  u8  UMTS cell count (read by "UMTS Set")
//   14  u8  GSM cell count G
//   15  G GSM entries of 7 bytes. They start at 15 like the UMTS entries, not after
//       them: the modem's ranking record is read so, and both sets decode the same bytes.
// GSM entry: 0 u16 ARFCN, 2 u16 BSIC, 4 s8 RSSI (dBm), 5 s16 ranking value.
constexpr size_t kMinLength = 15;
constexpr size_t kFirstEntry = 15;
constexpr size_t kEntrySize = 7;

}  // namespace

std::string GSMSet::getSectionName() const { return "GSM Set"; }

std::vector<int32_t> GSMSet::getLogCodeArray() const { return {LogCode::kUMTSReselectionRanking}; }

void GSMSet::updateWithData(ByteView data, int32_t logCode) {
    SystemLog::log(SystemLog::kWarning, "%s", "GSMSet");
    if (logCode != LogCode::kUMTSReselectionRanking) return logUnknownCode(logCode);
    rebuildList(data, kMinLength, true, [](const ByteReader& r) -> ArrayRef {
        const unsigned count = r.u8(14).value_or(0);
        if (count == 0) return nullptr;
        return readEntries(r, kFirstEntry, kEntrySize, kEntrySize, count, [](const ByteReader& e) {
            auto row = Dictionary::create();
            row->set("ARFCN", Value(StringFormat::format("%d", e.u16(0).value_or(0))));
            row->set("BSIC", Value(StringFormat::format("%d", e.u16(2).value_or(0))));
            row->set("RSSI", Value(StringFormat::format("%d dBm", static_cast<int8_t>(e.u8(4).value_or(0)))));
            row->set("Ranking Value", Value(StringFormat::format("%d", e.s16(5).value_or(0))));
            return Value(row);
        });
    });
}

}  // namespace vantorel

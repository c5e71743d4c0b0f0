// EquivalentPLMNList: the "Equivalent PLMN List" list section: the equivalent PLMNs of 0x7150, rebuilt whole on each record.
#include "LogGenerator/MVK_GSM/EquivalentPLMNList.h"

#include "LogGenerator/MVK_GSM/BCDPLMN.h"
#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"

#include <optional>

namespace vantorel {

std::string EquivalentPLMNList::getSectionName() const { return "Equivalent PLMN List"; }

std::vector<int32_t> EquivalentPLMNList::getLogCodeArray() const { return {LogCode::kEquivalentPLMNs}; }

namespace {

constexpr size_t kCountOffset = 16;
constexpr size_t kFirstEntry = 17;
constexpr size_t kStride = 3;
constexpr size_t kDigitEntrySize = 6;
constexpr size_t kBCDEntrySize = 3;

Value plmnRow(const std::string& mcc, const std::string& mnc) {
    auto plmn = Dictionary::create();
    plmn->set("Mobile Country Code", Value(mcc));
    plmn->set("Mobile Network Code", Value(mnc));
    return Value(plmn);
}

// One entry from its first byte to the end of the record, or nothing when the record
// ends before the entry does (the list ends there).
//
// Modems write the entries in one of two layouts. Some write each PLMN as single-digit
// bytes e0..e5, MCC = e0 e2 e4 and MNC = e1 e3 e5 (hundreds, tens, units), read with a
// stride of 3 so that consecutive entries overlap by three bytes: deliberate, it keeps
// the lists users already compare against. Phones in the field write the 3-byte BCD PLMN
// identity the network sends in its equivalent PLMN list (see BCDPLMN). A BCD identity
// almost always holds a byte above 9 (two digits in one byte, or the 0xF filler of a
// two-digit MNC), which a single-digit byte never does; so an entry whose six bytes are
// all single digits is read the first way, with the numbers shown without leading zeros,
// and any other entry the BCD way, with its digits as coded ("001", two-digit MNCs
// without the filler).
std::optional<Value> readEntry(const ByteReader& entry) {
    bool singleDigits = entry.has(0, kDigitEntrySize);
    bool aboveNine = false;
    for (size_t n = 0; n < kDigitEntrySize && entry.has(n, 1); ++n) {
        const uint8_t b = entry.u8(n).value_or(0);
        singleDigits = singleDigits && b <= 9;
        aboveNine = aboveNine || b > 9;
    }
    const auto digit = [&entry](size_t n) { return static_cast<int>(entry.u8(n).value_or(0)); };
    if (singleDigits)
        return plmnRow(StringFormat::format("%d", 100 * digit(0) + 10 * digit(2) + digit(4)),
                       StringFormat::format("%d", 100 * digit(1) + 10 * digit(3) + digit(5)));
    if (!aboveNine || !entry.has(0, kBCDEntrySize)) return std::nullopt;
    const BCDPLMN plmn = BCDPLMN::read(entry.u8(0).value_or(0), entry.u8(1).value_or(0), entry.u8(2).value_or(0),
                                       BCDPLMN::Filler::Drop);
    return plmnRow(plmn.mcc, plmn.mnc);
}

}  // namespace

// 0x7150 layout (at least 17 bytes; a shorter record leaves the list as it was):
//   16           count
//   17 + 3 * i   entry i (see readEntry)
// The list ends at the first entry that does not lie inside the record.
void EquivalentPLMNList::updateWithData(ByteView data, int32_t logCode) {
    SystemLog::log(SystemLog::kWarning, "%s", "Equivalent PLMN List");
    if (logCode != LogCode::kEquivalentPLMNs) {
        logUnknownCode(logCode);
        return;
    }
    rebuildList(data, kFirstEntry, true, [](const ByteReader& r) {
        const unsigned count = r.u8(kCountOffset).value_or(0);
        auto rows = Array::create();
        for (unsigned i = 0; i < count; ++i) {
            const std::optional<Value> row = readEntry(ByteReader(r.from(kFirstEntry + kStride * i)));
            if (!row) break;
            rows->append(*row);
        }
        return rows;
    });
}

}  // namespace vantorel

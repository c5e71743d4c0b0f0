// EquivalentPLMNList: the "Equivalent PLMN List" list section: the equivalent PLMNs of 0x7150, rebuilt whole on each record.
#include "LogGenerator/MVK_GSM/EquivalentPLMNList.h"

#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"
#include "PropertyList/Dictionary.h"

namespace vantorel {

std::string EquivalentPLMNList::getSectionName() const { return "Equivalent PLMN List"; }

std::vector<int32_t> EquivalentPLMNList::getLogCodeArray() const { return {LogCode::kEquivalentPLMNs}; }

// 0x7150 layout (at least 17 bytes; a shorter record leaves the list as it was):
//   16           count
//   17 + 3 * i   entry i: six single-digit bytes e0..e5,
//                MCC = e0 e2 e4, MNC = e1 e3 e5 (hundreds, tens, units)
// The stride is 3 while an entry is 6 bytes wide, so consecutive entries overlap by
// three bytes: deliberate, it keeps the lists users already compare against. The
// list ends at the first entry whose six bytes do not all lie inside the record.
void EquivalentPLMNList::updateWithData(ByteView data, int32_t logCode) {
    SystemLog::log(SystemLog::kWarning, "%s", "Equivalent PLMN List");
    if (logCode != LogCode::kEquivalentPLMNs) {
        logUnknownCode(logCode);
        return;
    }
    rebuildList(data, 17, true, [](const ByteReader& r) {
        const unsigned count = r.u8(16).value_or(0);
        return readEntries(r, 17, 3, 6, count, [](const ByteReader& e) {
            const auto digit = [&e](size_t n) { return static_cast<int>(e.u8(n).value_or(0)); };
            const int mcc = 100 * digit(0) + 10 * digit(2) + digit(4);
            const int mnc = 100 * digit(1) + 10 * digit(3) + digit(5);
            auto plmn = Dictionary::create();
            plmn->set("Mobile Country Code", Value(StringFormat::format("%d", mcc)));
            plmn->set("Mobile Network Code", Value(StringFormat::format("%d", mnc)));
            return Value(plmn);
        });
    });
}

}  // namespace vantorel

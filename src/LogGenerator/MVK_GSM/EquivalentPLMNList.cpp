// EquivalentPLMNList: Part 5.2's "Equivalent PLMN List" list section: the equivalent PLMNs of 0x7150, rebuilt whole on each record.
#include "LogGenerator/MVK_GSM/EquivalentPLMNList.h"

#include "Platform/ByteReader.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"

namespace vantorel {

namespace {
constexpr int32_t kEquivalentPLMNs = 0x7150;
}  // namespace

std::string EquivalentPLMNList::getSectionName() const { return "Equivalent PLMN List"; }

std::vector<int32_t> EquivalentPLMNList::getLogCodeArray() const { return {kEquivalentPLMNs}; }

// 0x7150 layout:
//   16           count
//   17 + 3 * i   entry i: six single-digit bytes e0..e5,
//                MCC = e0 e2 e4, MNC = e1 e3 e5 (hundreds, tens, units)
// The stride is 3 while an entry is 6 bytes wide, so consecutive entries overlap by
// three bytes; both are kept as specified. The spec reads every entry without checking
// the record's length; here the loop stops at the first entry whose six bytes do not all
// lie inside the record, which leaves every in-bounds entry unchanged.
void EquivalentPLMNList::updateWithData(ByteView data, int32_t logCode) {
    SystemLog::log(SystemLog::kWarning, "%s", "Equivalent PLMN List");
    if (logCode != kEquivalentPLMNs) {
        logUnknownCode(logCode);
        return;
    }
    const ByteReader r(data);
    if (r.size() < 17) return;

    clearSectionArray();
    const uint8_t count = *r.u8(16);
    if (count == 0) return;

    auto plmns = Array::create();
    for (uint8_t i = 0; i < count; ++i) {  // the index is 8 bits, as specified
        const size_t offset = 17 + 3 * static_cast<size_t>(i);
        const auto entry = r.slice(offset, 6);
        if (!entry) break;
        const ByteView e = *entry;
        const int mcc = 100 * e[0] + 10 * e[2] + e[4];
        const int mnc = 100 * e[1] + 10 * e[3] + e[5];
        auto plmn = Dictionary::create();
        plmn->set("Mobile Country Code", Value(StringFormat::format("%d", mcc)));
        plmn->set("Mobile Network Code", Value(StringFormat::format("%d", mnc)));
        plmns->append(Value(plmn));
    }
    replaceSectionArray(*plmns);
}

}  // namespace vantorel

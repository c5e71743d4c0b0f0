// ReselectionCandidatesList: the "Reselection Candidates List" section: one row per candidate of record 0xB186.
#include "LogGenerator/LTE/ReselectionCandidatesList.h"

#include <iterator>
#include <vector>

#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"

namespace vantorel {

namespace {

// Record 0xB186 (offsets from the record's first byte; at least 21 bytes, shorter
// records leave the list as it is):
//   19..20      u16 LE   number of candidates; only its low 8 bits count (256 gives none)
//   21 + 4*i    candidate i:
//     0..1      u16 LE   "Candidate Priority"
//     2..3      u16 LE   radio access technology (kRATs)
//     4..       the technology's own part (kRATParts)
// Candidates are read 4 bytes apart, less than a candidate with its own part, so each
// candidate after the first starts inside the part of the one before; this stride is
// deliberate and kept.
constexpr size_t kMinLength = 21;
constexpr size_t kCountOffset = 19;
constexpr size_t kFirstEntry = 21;
constexpr size_t kStride = 4;
constexpr size_t kPriorityOffset = 0;
constexpr size_t kRATOffset = 2;
constexpr size_t kRATPartOffset = 4;

static const char* const kRATs[] = {
    "LTE",        // 0
    "UTRAN",      // 1
    "GERAN",      // 2
    "CDMA1XRTT",  // 3
    "CDMAHRPD",   // 4
};

// A field of a technology's own part: bits [shift, shift + bits) of the little-endian
// value of `width` bytes at offset (from the part's start), shown with "%d".
struct Field {
    const char* key;
    size_t offset;
    size_t width;
    unsigned shift;
    unsigned bits;
};

struct RATPart {
    size_t length;  // bytes the part spans
    std::vector<Field> fields;
};

// Indexed by technology; any other technology has no part and no keys.
const RATPart kRATParts[] = {
    // 0 LTE: 0..1 E-ARFCN; 2..3 bits 7-15 physical cell identity
    {4, {{"E ARFCN", 0, 2, 0, 16}, {"Cell ID", 2, 2, 7, 9}}},
    // 1 UTRAN: 0..1 UARFCN; 2..3 primary scrambling code
    {4, {{"U ARFCN", 0, 2, 0, 16}, {"PSC", 2, 2, 0, 16}}},
    // 2 GERAN: 0..1 ARFCN; 2 band; 3 BSIC
    {4, {{"ARFCN", 0, 2, 0, 16}, {"Band", 2, 1, 0, 8}, {"BSIC ID", 3, 1, 0, 8}}},
    // 3 CDMA 1xRTT, 4 CDMA HRPD: 0 band; 4..5 channel; 6..7 pilot PN
    {8, {{"Band", 0, 1, 0, 8}, {"Channel", 4, 2, 0, 16}, {"Pilot", 6, 2, 0, 16}}},
    {8, {{"Band", 0, 1, 0, 8}, {"Channel", 4, 2, 0, 16}, {"Pilot", 6, 2, 0, 16}}},
};
const RATPart kNoPart = {0, {}};

const RATPart& ratPart(unsigned rat) { return rat < std::size(kRATParts) ? kRATParts[rat] : kNoPart; }

std::string decimal(unsigned v) { return StringFormat::format("%d", static_cast<int>(v)); }

// The candidates, stopping at the first whose part would run past the record's end.
ArrayRef candidateRows(const ByteReader& r) {
    auto rows = Array::create();
    const unsigned count = r.u16(kCountOffset).value_or(0) & 0xFF;
    for (unsigned i = 0; i < count; ++i) {
        const size_t start = kFirstEntry + kStride * i;
        const unsigned rat = r.u16(start + kRATOffset).value_or(0);
        const RATPart& part = ratPart(rat);
        const auto bytes = r.slice(start, kRATPartOffset + part.length);
        if (!bytes) break;
        const ByteReader entry(*bytes);
        auto row = Dictionary::create();
        row->set("Candidate Priority", Value(decimal(entry.u16(kPriorityOffset).value_or(0))));
        row->set("Candidate RAT Type", Value(rat < std::size(kRATs) ? kRATs[rat] : "??"));
        for (const Field& f : part.fields) {
            const size_t at = kRATPartOffset + f.offset;
            const unsigned raw = f.width == 1 ? entry.u8(at).value_or(0) : entry.u16(at).value_or(0);
            row->set(f.key, Value(decimal((raw >> f.shift) & ((1u << f.bits) - 1))));
        }
        rows->append(Value(row));
    }
    return rows;
}

}  // namespace

std::string ReselectionCandidatesList::getSectionName() const { return "Reselection Candidates List"; }

std::vector<int32_t> ReselectionCandidatesList::getLogCodeArray() const { return {LogCode::kLTEReselectionCandidates}; }

void ReselectionCandidatesList::updateWithData(ByteView data, int32_t logCode) {
    SystemLog::log(SystemLog::kWarning, "%s", "Reselection Candidates List");
    if (logCode != LogCode::kLTEReselectionCandidates) {
        logUnknownCode(logCode);
        return;
    }
    rebuildList(data, kMinLength, true, candidateRows);
}

}  // namespace vantorel

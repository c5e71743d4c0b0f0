// Fuzz target: QXDM DLF bytes through DlfReader: the entries are the file's leading records, back to back (in our own snapshot DLFs, some behind a message header).
#include "FuzzSupport.h"
#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "TelephonyService/Replay/DlfReader.h"

#include <algorithm>
#include <set>

using namespace vantorel;

namespace {

// True when a message header of `length` bytes ([type], [0x00 type] or [0x81 0x00 type])
// stands at offset and the record bytes follow it.
bool entryAt(ByteView file, size_t offset, size_t length, const Bytes& record) {
    static const uint8_t kLead[] = {0x81, 0x00};
    const size_t body = record.size() - 1;
    if (offset + length + body > file.size()) return false;
    if (length > 0 && (file[offset + length - 1] != record[0] ||
                       !std::equal(file.begin() + offset, file.begin() + offset + length - 1, kLead + (3 - length))))
        return false;
    return std::equal(record.begin() + 1, record.end(), file.begin() + offset + length);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    const ByteView file(data, size);
    const RecordedLog log = DlfReader::readBytes(file);
    (void)log.summary();
    // Only a DLF our own writer made (led by its version report) holds message headers
    // between records, and only behind one does an extra record stand.
    const ByteReader r(file);
    const bool own = r.has(0, DlfReader::kOwnVersionReportLength) && r.u16(0) == DlfReader::kOwnVersionReportLength &&
                     r.u16(2) == uint16_t{LogCode::kDlfVersionReport};
    // DLF records have no sync marks: each entry is the next record of the file, and
    // reading stops at the first bad one. Where a header could have been skipped or not
    // with the same bytes as a result, every such reading is followed.
    std::set<size_t> ends = {0};
    size_t ordinary = 0;
    for (const RecordedEntry& e : log.entries) {
        FUZZ_CHECK(e.record.size() >= 13 && size_t(e.record[1] | e.record[2] << 8) == e.record.size() - 1);
        const bool isOrdinary = e.record[0] == LogCode::kOrdinaryType;
        FUZZ_CHECK(isOrdinary || (own && e.record[0] == LogCode::kExtraType));
        ordinary += isOrdinary;
        std::set<size_t> next;
        for (size_t offset : ends)
            for (size_t header = isOrdinary ? 0 : 1; header <= (own && offset > 0 ? 3 : 0); ++header)
                if (entryAt(file, offset, header, e.record)) next.insert(offset + header + e.record.size() - 1);
        FUZZ_CHECK(!next.empty());
        ends = std::move(next);
    }
    FUZZ_CHECK(log.logPackets == ordinary && log.otherPackets == log.entries.size() - ordinary);
    // Exactly one problem when reading stopped before the end of the file.
    const bool stoppedEarly = log.malformed + log.truncated == 1;
    FUZZ_CHECK(log.malformed + log.truncated <= 1);
    FUZZ_CHECK(std::any_of(ends.begin(), ends.end(), [&](size_t end) { return (end < size) == stoppedEarly; }));
    return 0;
}

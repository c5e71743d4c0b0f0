// Fuzz target: QXDM DLF bytes through DlfReader: the entries are the file's leading records, back to back.
#include "FuzzSupport.h"
#include "TelephonyService/Replay/DlfReader.h"

#include <algorithm>

using namespace vantorel;

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    const RecordedLog log = DlfReader::readBytes(ByteView(data, size));
    fuzz::checkEntries(log);
    // DLF records have no sync marks: each entry is the next record of the file, and
    // reading stops at the first bad one.
    size_t offset = 0;
    for (const RecordedEntry& e : log.entries) {
        FUZZ_CHECK(offset + e.record.size() - 1 <= size);
        FUZZ_CHECK(std::equal(e.record.begin() + 1, e.record.end(), data + offset));
        offset += e.record.size() - 1;
    }
    FUZZ_CHECK(log.malformed + log.truncated == (offset < size ? 1u : 0u));
    return 0;
}

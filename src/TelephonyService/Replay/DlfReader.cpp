// DlfReader: QXDM DLF records into a RecordedLog of Morvek records.
#include "TelephonyService/Replay/DlfReader.h"

#include "Platform/ByteReader.h"
#include "Platform/StringFormat.h"
#include "TelephonyService/Replay/DiagPacket.h"

namespace vantorel {

RecordedLog DlfReader::readFile(const std::string& path) {
    RecordedLog log;
    auto data = RecordedLog::loadFile(path, &log.error);
    if (!data) return log;
    return readBytes(*data);
}

RecordedLog DlfReader::readBytes(ByteView data) {
    RecordedLog log;
    const ByteReader r(data);
    size_t offset = 0;
    while (offset < r.size()) {
        if (!r.has(offset, 2)) {
            ++log.truncated;
            log.addProblem(offset, "truncated record", "1 byte left, too short for a record length");
            break;
        }
        const uint16_t length = r.u16(offset).value_or(0);
        if (length < kRecordHeaderLength) {
            ++log.malformed;
            log.addProblem(offset, "malformed record",
                           StringFormat::format("length %u is below the %zu-byte record header", unsigned(length),
                                                kRecordHeaderLength));
            break;
        }
        if (!r.has(offset, length)) {
            ++log.truncated;
            log.addProblem(offset, "truncated record",
                           StringFormat::format("length %u runs past the end of the file (%zu bytes left)",
                                                unsigned(length), r.size() - offset));
            break;
        }
        // The record fits and is at least a header long, so its code and time stamp are there.
        const ByteView recordBytes = r.slice(offset, length).value_or(ByteView{});
        const ByteReader record(recordBytes);
        log.addEntry(record.u16(2).value_or(0), record.u64(4).value_or(0), DiagPacket::morvekRecordFromDlf(recordBytes));
        offset += length;
    }
    return log;
}

}  // namespace vantorel

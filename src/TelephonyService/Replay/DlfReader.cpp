// DlfReader: QXDM DLF records (Part 3.4) into a RecordedLog of Morvek records (DESIGN.md "The telephony service", Replay/).
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
    ByteReader r(data);
    size_t offset = 0;
    while (offset < r.size()) {
        const auto length = r.u16(offset);
        if (!length) {
            ++log.truncated;
            log.addProblem(offset, "truncated record", "1 byte left, too short for a record length");
            break;
        }
        if (*length < kRecordHeaderLength) {
            ++log.malformed;
            log.addProblem(offset, "malformed record",
                           StringFormat::format("length %u is below the %zu-byte record header", unsigned(*length),
                                                kRecordHeaderLength));
            break;
        }
        const auto record = r.slice(offset, *length);
        if (!record) {
            ++log.truncated;
            log.addProblem(offset, "truncated record",
                           StringFormat::format("length %u runs past the end of the file (%zu bytes left)",
                                                unsigned(*length), r.size() - offset));
            break;
        }
        // len >= 12 and the record fits, so its code and time stamp are there.
        ByteReader rec(*record);
        log.addEntry(rec.u16(2).value_or(0), rec.u64(4).value_or(0), DiagPacket::morvekRecordFromDlf(*record));
        offset += *length;
    }
    return log;
}

}  // namespace vantorel

// DlfReader: QXDM DLF records into a RecordedLog of Morvek records.
#include "TelephonyService/Replay/DlfReader.h"

#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/StringFormat.h"
#include "TelephonyService/Replay/DiagPacket.h"

#include <utility>

namespace vantorel {

namespace {

// A record whose length holds its header and stays within the file.
bool recordFits(const ByteReader& r, size_t offset) {
    const auto length = r.u16(offset);
    return length && *length >= DlfReader::kRecordHeaderLength && r.has(offset, *length);
}

bool isTypeByte(std::optional<uint8_t> b) {
    return b && (*b == LogCode::kOrdinaryType || *b == LogCode::kExtraType);
}

// The Morvek message bytes before the record at offset, when offset starts one of
// [type] [0x81 0x00 type] [0x00 type] (a message's type byte, after its optional prefix;
// the last form is a prefixed message whose first byte the writer dropped); 0 otherwise.
size_t messageHeaderAt(const ByteReader& r, size_t offset) {
    if (isTypeByte(r.u8(offset))) return 1;
    if (r.u8(offset) == uint8_t{0x00} && isTypeByte(r.u8(offset + 1))) return 2;
    if (r.u8(offset) == uint8_t{0x81} && r.u8(offset + 1) == uint8_t{0x00} && isTypeByte(r.u8(offset + 2))) return 3;
    return 0;
}

// True for a file the monitor's own DLF writer made: it always leads with its version
// report, of this code and length. Only such a file holds message headers between its
// records; any other DLF is records back to back, so a record there that does not chain
// on is damage to report, not a header to step over.
bool isOwnSnapshotDlf(const ByteReader& r) {
    return recordFits(r, 0) && r.u16(0) == DlfReader::kOwnVersionReportLength &&
           r.u16(2) == uint16_t{LogCode::kDlfVersionReport};
}

// Where the record that follows a record boundary starts, and its type: the boundary
// itself for a plain DLF (type 1), or past a message header (our own snapshot DLFs store
// whole messages after an entry's first record). A header is skipped only when the
// record behind it fits and is followed by the end of the file or by another record
// that fits, and the plain reading is not such a record.
std::pair<size_t, uint8_t> recordStart(const ByteReader& r, size_t offset) {
    auto chains = [&r](size_t at) {
        if (!recordFits(r, at)) return false;
        const size_t next = at + r.u16(at).value_or(0);
        if (next == r.size() || recordFits(r, next)) return true;
        const size_t header = messageHeaderAt(r, next);
        return header && recordFits(r, next + header);
    };
    if (chains(offset)) return {offset, LogCode::kOrdinaryType};
    const size_t header = messageHeaderAt(r, offset);
    if (header && chains(offset + header))
        return {offset + header, r.u8(offset + header - 1).value_or(LogCode::kOrdinaryType)};
    return {offset, LogCode::kOrdinaryType};
}

}  // namespace

RecordedLog DlfReader::readFile(const std::string& path) {
    RecordedLog log;
    auto data = RecordedLog::loadFile(path, &log.error);
    if (!data) return log;
    return readBytes(*data);
}

RecordedLog DlfReader::readBytes(ByteView data) {
    RecordedLog log;
    const ByteReader r(data);
    const bool headersBetweenRecords = isOwnSnapshotDlf(r);
    size_t offset = 0;
    while (offset < r.size()) {
        const auto [start, type] =
            headersBetweenRecords ? recordStart(r, offset) : std::pair{offset, LogCode::kOrdinaryType};
        offset = start;
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
        Bytes morvek = DiagPacket::morvekRecordFromDlf(recordBytes);
        if (type == LogCode::kExtraType) {
            // An extra record the service added: kept as it arrived, counted apart from log codes.
            morvek[0] = type;
            log.entries.push_back(RecordedEntry{record.u16(2).value_or(0), record.u64(4).value_or(0), std::move(morvek)});
            ++log.otherPackets;
        } else {
            log.addEntry(record.u16(2).value_or(0), record.u64(4).value_or(0), std::move(morvek));
        }
        offset += length;
    }
    return log;
}

}  // namespace vantorel

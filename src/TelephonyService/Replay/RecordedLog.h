// RecordedLog: what a recorded-stream reader (QmdlReader, DlfReader) found in a file: the Morvek records in order and the counts.
#pragma once

#include "PropertyList/Value.h"

#include <cstddef>
#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <vector>

namespace vantorel {

// One recorded log record, ready for the decoders.
struct RecordedEntry {
    uint16_t logCode = 0;
    uint64_t timeStamp = 0;  // DIAG time stamp (DiagPacket::microsecondsSince1970 converts it)
    // Morvek-channel record: type byte 1 + <len u16><code u16><time stamp u64><payload>.
    Bytes record;
};

// Entries plus counters; the readers fill it, callers read the public fields.
class RecordedLog {
public:
    // Problem texts kept in `problems` (the counters count every problem).
    static constexpr size_t kMaxProblems = 100;

    std::vector<RecordedEntry> entries;

    size_t frames = 0;        // QMDL: good HDLC frames (0 for a DLF)
    size_t logPackets = 0;    // records turned into entries (QMDL log packets, DLF records)
    size_t otherPackets = 0;  // QMDL: good frames that are not log packets
    size_t badCrc = 0;        // QMDL: frames with a wrong CRC
    size_t malformed = 0;     // bad HDLC frames, log packets whose lengths do not hold, DLF len < 12
    size_t truncated = 0;     // unclosed last frame, DLF record running past the end
    std::map<uint16_t, size_t> codeCounts;  // entries per log code
    // Entries per layout version (byte 13) of the codes whose layout varies (RecordVersions).
    std::map<uint16_t, std::map<uint8_t, size_t>> versionCounts;

    // "<what> at byte <offset>: <why>", the first kMaxProblems of them.
    std::vector<std::string> problems;
    // Non-empty when the file could not be read at all ("<path>: <reason>").
    std::string error;

    bool ok() const { return error.empty(); }
    // Entries with that log code.
    size_t count(uint16_t logCode) const;

    // Appends an entry and counts it (logPackets, codeCounts).
    void addEntry(uint16_t logCode, uint64_t timeStamp, Bytes record);
    // Keeps a problem text (up to kMaxProblems); the caller counts the problem itself.
    void addProblem(uint64_t offset, const std::string& what, const std::string& why);

    // Multi-line report: the counters on one line, then one line per log code in
    // ascending order, "0x%04X  <name>  %zu" (the name when LogCodeNames knows the code) (for a code whose layout varies, followed by its versions:
    // "  (version 2: 12, version 3: 1729)"); the error or the problems, when there are any.
    std::string summary() const;

    // The most read from a pipe or socket, whose size is not known beforehand.
    static constexpr size_t kMaxStreamBytes = size_t{256} << 20;
    // A file is held whole while it is read (its records too): one larger than this is
    // refused rather than exhausting memory (a sparse or runaway file says any size).
    static constexpr size_t kMaxFileBytes = size_t{2} << 30;

    // The whole file at path, or nothing with *error set to "<path>: <reason>": a
    // directory, a device, a pipe that brings more than kMaxStreamBytes are refused.
    static std::optional<Bytes> loadFile(const std::string& path, std::string* error);
};

}  // namespace vantorel

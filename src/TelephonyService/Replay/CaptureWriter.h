// CaptureWriter: writes Vantorel capture files, every message as the service sent it (docs/capture-format.md).
#pragma once

#include "PropertyList/Value.h"

#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>

class QFile;

namespace vantorel {

// File layout, all integers little-endian:
//   0   8 bytes  "VNTRLCAP"
//   8   u32      format version, 1
//   12  u32      n, length of the technology identifier
//   16  n bytes  technology identifier (UTF-8)
// then per message:
//   0   u64      arrival time, microseconds since 1970-01-01 00:00:00 UTC
//   8   u32      message id
//   12  u32      L, length of the data
//   16  L bytes  the message's data exactly as delivered
class CaptureWriter {
public:
    static constexpr char kMagic[8] = {'V', 'N', 'T', 'R', 'L', 'C', 'A', 'P'};
    static constexpr size_t kMagicLength = sizeof(kMagic);
    static constexpr uint32_t kFormatVersion = 1;
    static constexpr size_t kFileHeaderLength = 16;     // magic, version, n (before the identifier)
    static constexpr size_t kMessageHeaderLength = 16;  // time, id, L

    // Creates the file and writes its header; null with *error set to "<path>: <reason>"
    // when it cannot be written. An existing file is refused and left as it is
    // ("<path>: the file exists already") unless replace is true (then it is truncated).
    // Writes are unbuffered: each message reaches the file in one write, so a process
    // killed at any moment leaves a capture readable up to its last message.
    static std::unique_ptr<CaptureWriter> create(const std::string& path, const std::string& technology,
                                                 std::string* error, bool replace = false);
    // Flushes and closes the file.
    ~CaptureWriter();
    CaptureWriter(const CaptureWriter&) = delete;
    CaptureWriter& operator=(const CaptureWriter&) = delete;

    // Appends one message; false (with error() set) when the write failed.
    bool write(int64_t timeMicros, int32_t messageId, ByteView data);
    bool flush();

    const std::string& path() const { return path_; }
    const std::string& error() const { return error_; }

    // The bytes of the file header and of one message (also for tests and in-memory captures).
    static Bytes headerBytes(const std::string& technology);
    static Bytes messageBytes(int64_t timeMicros, int32_t messageId, ByteView data);
    // Microseconds since 1970 now (system clock), the time the service records.
    static int64_t nowMicros();

private:
    CaptureWriter(std::string path, std::unique_ptr<QFile> file);
    bool writeAll(const Bytes& bytes);

    std::string path_;
    std::unique_ptr<QFile> file_;
    std::string error_;
};

}  // namespace vantorel

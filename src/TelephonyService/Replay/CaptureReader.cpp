// CaptureReader: capture files (docs/capture-format.md) into messages with times and a RecordedLog-style report.
#include "TelephonyService/Replay/CaptureReader.h"

#include "Platform/ByteReader.h"
#include "Platform/StringFormat.h"
#include "TelephonyService/LogMask.h"
#include "TelephonyService/Replay/CaptureWriter.h"

#include <algorithm>

namespace vantorel {

Capture CaptureReader::readFile(const std::string& path) {
    Capture capture;
    auto data = RecordedLog::loadFile(path, &capture.report.error);
    if (!data) return capture;
    capture = readBytes(*data);
    if (!capture.report.ok()) capture.report.error = path + ": " + capture.report.error;
    return capture;
}

bool CaptureReader::hasMagic(ByteView data) {
    return data.size() >= CaptureWriter::kMagicLength &&
           std::equal(data.begin(), data.begin() + CaptureWriter::kMagicLength, CaptureWriter::kMagic);
}

Capture CaptureReader::readBytes(ByteView data) {
    Capture capture;
    RecordedLog& report = capture.report;
    ByteReader r(data);
    if (!hasMagic(data)) {
        report.error = "not a Vantorel capture (no \"VNTRLCAP\" at the start)";
        return capture;
    }
    if (!r.has(0, CaptureWriter::kFileHeaderLength)) {
        report.error = "capture header cut short";
        return capture;
    }
    const uint32_t version = r.u32(8).value_or(0);
    const uint32_t techLength = r.u32(12).value_or(0);
    if (version != CaptureWriter::kFormatVersion) {
        report.error = StringFormat::format("unsupported capture format version %u (this reader knows %u)", version,
                                            CaptureWriter::kFormatVersion);
        return capture;
    }
    if (!r.has(CaptureWriter::kFileHeaderLength, techLength)) {
        report.error = StringFormat::format("capture header cut short: technology of %u bytes runs past the end",
                                            techLength);
        return capture;
    }
    const ByteView tech = r.slice(CaptureWriter::kFileHeaderLength, techLength).value_or(ByteView{});
    capture.version = version;
    capture.technology.assign(tech.begin(), tech.end());

    // Each message is read through its own reader, at offsets from the message's start.
    size_t offset = CaptureWriter::kFileHeaderLength + techLength;
    while (offset < r.size()) {
        const ByteReader entry(r.from(offset));
        if (!entry.has(0, CaptureWriter::kMessageHeaderLength)) {
            ++report.truncated;
            report.addProblem(offset, "truncated message",
                              StringFormat::format("%zu bytes left, less than a message header", entry.size()));
            break;
        }
        const uint32_t length = entry.u32(12).value_or(0);
        if (!entry.has(CaptureWriter::kMessageHeaderLength, length)) {
            ++report.truncated;
            report.addProblem(offset, "truncated message",
                              StringFormat::format("%u bytes of data announced, %zu bytes left in the file", length,
                                                   entry.size() - CaptureWriter::kMessageHeaderLength));
            break;
        }
        const ByteView body = entry.slice(CaptureWriter::kMessageHeaderLength, length).value_or(ByteView{});
        TimedMessage message{static_cast<int64_t>(entry.u64(0).value_or(0)),
                             static_cast<int32_t>(entry.u32(8).value_or(0)), Bytes(body.begin(), body.end())};
        const auto c = LogMask::classify(message.data);
        if (c && c->isOrdinary()) {
            ++report.logPackets;
            ++report.codeCounts[c->code];
        } else {
            ++report.otherPackets;
        }
        capture.messages.push_back(std::move(message));
        offset += CaptureWriter::kMessageHeaderLength + length;
    }
    return capture;
}

}  // namespace vantorel

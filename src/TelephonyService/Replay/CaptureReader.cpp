// CaptureReader: capture files (docs/capture-format.md) into messages with times and a RecordedLog-style report (DESIGN.md "The telephony service", Replay/).
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
    const std::optional<uint32_t> version = r.u32(8);
    const std::optional<uint32_t> techLength = r.u32(12);
    if (!version || !techLength) {
        report.error = "capture header cut short";
        return capture;
    }
    if (*version != CaptureWriter::kFormatVersion) {
        report.error = StringFormat::format("unsupported capture format version %u (this reader knows %u)", *version,
                                            CaptureWriter::kFormatVersion);
        return capture;
    }
    const std::optional<ByteView> tech = r.slice(CaptureWriter::kFileHeaderLength, *techLength);
    if (!tech) {
        report.error = StringFormat::format("capture header cut short: technology of %u bytes runs past the end",
                                            *techLength);
        return capture;
    }
    capture.version = *version;
    capture.technology.assign(tech->begin(), tech->end());

    size_t offset = CaptureWriter::kFileHeaderLength + tech->size();
    while (offset < r.size()) {
        const std::optional<uint64_t> time = r.u64(offset);
        const std::optional<uint32_t> id = r.u32(offset + 8);
        const std::optional<uint32_t> length = r.u32(offset + 12);
        ByteView body;
        bool whole = time && id && length;
        if (whole) {
            const std::optional<ByteView> slice = r.slice(offset + CaptureWriter::kMessageHeaderLength, *length);
            whole = slice.has_value();
            if (whole) body = *slice;
        }
        if (!whole) {
            ++report.truncated;
            report.addProblem(offset, "truncated message",
                              length ? StringFormat::format("%u bytes of data announced, %zu bytes left in the file",
                                                            *length, r.size() - offset - CaptureWriter::kMessageHeaderLength)
                                     : StringFormat::format("%zu bytes left, less than a message header",
                                                            r.size() - offset));
            break;
        }
        TimedMessage message{static_cast<int64_t>(*time), static_cast<int32_t>(*id), Bytes(body.begin(), body.end())};
        const auto c = LogMask::classify(message.data);
        if (c && c->type == LogMask::kOrdinaryType) {
            ++report.logPackets;
            ++report.codeCounts[c->code];
        } else {
            ++report.otherPackets;
        }
        capture.messages.push_back(std::move(message));
        offset += CaptureWriter::kMessageHeaderLength + *length;
    }
    return capture;
}

}  // namespace vantorel

// RecordedStream: format detection and the common timed-message view of captures, DLF and QMDL files.
#include "TelephonyService/Replay/RecordedStream.h"

#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/StringFormat.h"
#include "Platform/TechnologyNames.h"
#include "Platform/TelephonyIdentifiers.h"
#include "PropertyList/PropertyListSerialization.h"
#include "TelephonyService/Replay/DiagPacket.h"
#include "TelephonyService/Replay/DlfReader.h"
#include "TelephonyService/Replay/QmdlReader.h"

#include <QDateTime>

#include <utility>

namespace vantorel {

namespace {

// Walks <len u16><code u16>... records from the start; true when the content is a DLF
// chain (see the class comment). A QMDL file starts with a DIAG body (10 00 <len> ...,
// or text and event packets) inside HDLC escaping, which chains only by accident and
// then not to the exact end of a file.
bool looksLikeDlf(ByteView data) {
    const ByteReader r(data);
    size_t offset = 0;
    size_t records = 0;
    while (offset < r.size()) {
        if (!r.has(offset, DlfReader::kRecordHeaderLength)) return false;
        const ByteReader record(r.from(offset));
        const uint16_t length = record.u16(0).value_or(0);
        if (length < DlfReader::kRecordHeaderLength || !record.has(0, length)) return false;
        if (records == 0 && record.u16(2).value_or(0) == LogCode::kDlfVersionReport) return true;
        ++records;
        offset += length;
    }
    return records >= 2;
}

std::string timeText(int64_t micros) {
    return QDateTime::fromMSecsSinceEpoch(micros / 1000, Qt::UTC)
        .toString(QStringLiteral("yyyy-MM-dd hh:mm:ss.zzz"))
        .toStdString();
}

}  // namespace

RecordedStream::Format RecordedStream::detect(ByteView data) {
    if (CaptureReader::hasMagic(data)) return Format::Capture;
    if (looksLikeDlf(data)) return Format::Dlf;
    return Format::Qmdl;
}

const char* RecordedStream::formatName(Format format) {
    switch (format) {
    case Format::Capture: return "capture";
    case Format::Dlf: return "DLF";
    case Format::Qmdl: return "QMDL";
    }
    return "unknown";
}

RecordedStream RecordedStream::open(const std::string& path, const std::string& technology) {
    RecordedStream stream;
    auto data = RecordedLog::loadFile(path, &stream.report_.error);
    if (!data) return stream;
    stream = fromBytes(*data, technology);
    if (!stream.ok()) stream.report_.error = path + ": " + stream.report_.error;
    return stream;
}

RecordedStream RecordedStream::fromBytes(ByteView data, const std::string& technology) {
    RecordedStream stream;
    stream.format_ = detect(data);
    stream.technology_ = technology;
    if (stream.format_ == Format::Capture) {
        Capture capture = CaptureReader::readBytes(data);
        stream.report_ = std::move(capture.report);
        if (!stream.ok()) return stream;
        if (!capture.technology.empty()) {
            stream.technology_ = std::move(capture.technology);
            stream.technologyFromFile_ = true;
        }
        stream.messages_ = std::move(capture.messages);
        if (!stream.messages_.empty())
            stream.timeSpan_ = {stream.messages_.front().timeMicros, stream.messages_.back().timeMicros};
        return stream;
    }
    stream.report_ = stream.format_ == Format::Dlf ? DlfReader::readBytes(data) : QmdlReader::readBytes(data);
    stream.messages_.reserve(stream.report_.entries.size());
    for (RecordedEntry& entry : stream.report_.entries) {
        const int64_t time = DiagPacket::microsecondsSince1970(entry.timeStamp);
        // A zero time stamp (our DLF writer's version report) carries no time.
        if (entry.timeStamp != 0)
            stream.timeSpan_ = {stream.timeSpan_ ? stream.timeSpan_->first : time, time};
        stream.messages_.push_back(TimedMessage{time, 0, std::move(entry.record)});
    }
    stream.report_.entries.clear();
    stream.report_.entries.shrink_to_fit();
    return stream;
}

bool RecordedStream::holdsRecords() const {
    return format_ == Format::Capture || report_.frames > 0 || report_.logPackets > 0 || report_.otherPackets > 0;
}

std::string RecordedStream::summary() const {
    std::string out = StringFormat::format(
        "%s, technology %s, %zu messages\n", formatName(),
        technology_.empty() ? "unknown" : TechnologyNames::displayName(technology_).c_str(), messages_.size());

    if (technology_ != kTSLogChannelTechnology_IFX || !ok()) return out + report_.summary() + timeSpanText();
    // The IFX modem sends property lists, not log records: count those instead of log codes.
    size_t lists = 0;
    for (const TimedMessage& m : messages_) lists += PropertyListSerialization::read(m.data).value.has_value();
    out += StringFormat::format("%zu property-list messages, %zu unreadable, truncated %zu\n", lists,
                                messages_.size() - lists, report_.truncated);
    for (const auto& p : report_.problems) out += p + "\n";
    return out + timeSpanText();
}

std::string RecordedStream::timeSpanText() const {
    if (!timeSpan_) return std::string();
    return StringFormat::format("time span %s to %s UTC (%.3f s)\n", timeText(timeSpan_->first).c_str(),
                                timeText(timeSpan_->second).c_str(),
                                static_cast<double>(timeSpan_->second - timeSpan_->first) / 1e6);
}

}  // namespace vantorel

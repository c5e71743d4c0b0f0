// RecordedStream: format detection and the common timed-message view of captures, DLF and QMDL files.
#include "TelephonyService/Replay/RecordedStream.h"

#include "Platform/ByteReader.h"
#include "Platform/LogCodes.h"
#include "Platform/ServingCellCodes.h"
#include "Platform/StringFormat.h"
#include "Platform/TechnologyNames.h"
#include "Platform/TelephonyIdentifiers.h"
#include "PropertyList/PropertyListSerialization.h"
#include "TelephonyService/LogMask.h"
#include "TelephonyService/Replay/DiagPacket.h"
#include "TelephonyService/Replay/DlfReader.h"
#include "TelephonyService/Replay/QmdlReader.h"

#include <QDateTime>

#include <algorithm>
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

std::string RecordedStream::unusable(bool needTechnology) const {
    if (!holdsRecords())
        return StringFormat::format("no record in it (read as %s; %zu bad frames)", formatName(),
                                    report_.badCrc + report_.malformed + report_.truncated);
    if (needTechnology && technology().empty())
        return "no serving-cell record tells its technology: add --technology (" + TechnologyNames::listing() + ")";
    return "";
}

RecordedStream RecordedStream::fromBytes(ByteView data, const std::string& technology) {
    RecordedStream stream;
    stream.format_ = detect(data);
    auto widen = [&stream](int64_t time) {
        stream.timeSpan_ = stream.timeSpan_ ? std::pair{std::min(stream.timeSpan_->first, time),
                                                        std::max(stream.timeSpan_->second, time)}
                                            : std::pair{time, time};
    };
    if (stream.format_ == Format::Capture) {
        Capture capture = CaptureReader::readBytes(data);
        stream.report_ = std::move(capture.report);
        if (!stream.ok()) return stream;
        stream.declared_ = std::move(capture.technology);
        stream.messages_ = std::move(capture.messages);
        for (const TimedMessage& m : stream.messages_) widen(m.timeMicros);
        stream.findTechnologies(technology);
        return stream;
    }
    stream.report_ = stream.format_ == Format::Dlf ? DlfReader::readBytes(data) : QmdlReader::readBytes(data);
    stream.messages_.reserve(stream.report_.entries.size());
    for (RecordedEntry& entry : stream.report_.entries) {
        const int64_t time = DiagPacket::microsecondsSince1970(entry.timeStamp);
        // A zero time stamp (our DLF writer's version report) carries no time.
        if (entry.timeStamp != 0) widen(time);
        stream.messages_.push_back(TimedMessage{time, 0, std::move(entry.record)});
    }
    stream.report_.entries.clear();
    stream.report_.entries.shrink_to_fit();
    stream.findTechnologies(technology);
    return stream;
}

void RecordedStream::findTechnologies(const std::string& override) {
    if (!override.empty() && (declared_.empty() || declared_ == override)) {
        spans_ = {TechnologySpan{0, override}};
        return;
    }
    if (!declared_.empty()) spans_ = {TechnologySpan{0, declared_}};
    for (size_t i = 0; i < messages_.size(); ++i) {
        if (messages_[i].messageId != 0) continue;  // only records reach a decoder
        const auto record = LogMask::classify(messages_[i].data);
        if (!record || !record->isOrdinary()) continue;
        const std::string technology = ServingCellCodes::technologyOf(record->code);
        if (technology.empty() || (!spans_.empty() && spans_.back().technology == technology)) continue;
        // The first serving cell tells what the records before it were, unless a header
        // did; one on the first message corrects the header.
        if (!spans_.empty() && spans_.back().from == i)
            spans_.back().technology = technology;
        else
            spans_.push_back(TechnologySpan{spans_.empty() ? 0 : i, technology});
    }
}

std::string RecordedStream::technologyAt(size_t index) const {
    // Spans are in message order: the last one starting at or before index.
    const auto after = std::upper_bound(spans_.begin(), spans_.end(), index,
                                        [](size_t i, const TechnologySpan& span) { return i < span.from; });
    return after == spans_.begin() ? std::string() : std::prev(after)->technology;
}

std::vector<std::string> RecordedStream::technologies() const {
    std::vector<std::string> out;
    for (const TechnologySpan& span : spans_)
        if (std::find(out.begin(), out.end(), span.technology) == out.end()) out.push_back(span.technology);
    return out;
}

std::string RecordedStream::summary() const {
    std::string names;
    for (const std::string& technology : technologies())
        names += (names.empty() ? "" : ", ") + TechnologyNames::displayName(technology);
    std::string out = StringFormat::format("%s, %s %s, %zu messages\n", formatName(),
                                           technologies().size() > 1 ? "technologies" : "technology",
                                           names.empty() ? "unknown" : names.c_str(), messages_.size());

    if (technology() != kTSLogChannelTechnology_IFX || !ok()) return out + report_.summary() + timeSpanText();
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
    // Garbage time stamps lie centuries apart: the difference is taken unsigned (latest >= earliest).
    const uint64_t micros = static_cast<uint64_t>(timeSpan_->second) - static_cast<uint64_t>(timeSpan_->first);
    return StringFormat::format("time span %s to %s UTC (%.3f s)\n", timeText(timeSpan_->first).c_str(),
                                timeText(timeSpan_->second).c_str(), static_cast<double>(micros) / 1e6);
}

}  // namespace vantorel

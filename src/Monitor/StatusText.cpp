// StatusText: the "Updated ... at ..." line and the stream's state, one wording for every view.
#include "Monitor/StatusText.h"

#include "Platform/StringFormat.h"
#include "Platform/TechnologyNames.h"

#include <algorithm>

namespace vantorel {

namespace {

constexpr const char* kSeparator = " \u00b7 ";

// "LTE", "LTE and GSM/UMTS", "LTE, GSM/UMTS and CDMA2000".
std::string listOfNames(const std::vector<std::string>& identifiers) {
    std::string text;
    for (std::size_t i = 0; i < identifiers.size(); ++i) {
        if (i > 0) text += i + 1 == identifiers.size() ? " and " : ", ";
        text += TechnologyNames::displayName(identifiers[i]);
    }
    return text;
}

// What the stream's log codes are, and the technology to try instead.
std::string holdsText(const SourceStatus& status) {
    const char* holder = status.isReplay ? "this file" : "this stream";
    if (status.logTechnologies.empty()) return std::string(holder) + " has sent no log codes yet";
    std::string text = std::string(holder) + " holds " + listOfNames(status.logTechnologies) + " codes";
    for (const std::string& identifier : status.logTechnologies)
        if (identifier != status.decoderTechnology && TechnologyNames::shortName(identifier) != identifier)
            return text + ": try --technology " + TechnologyNames::shortName(identifier);
    return text;
}

// "disconnected since 22:03:00", "no data since 22:03:00".
std::string since(const char* what, const QDateTime& at) {
    return std::string(what) + " since " + at.toString(QStringLiteral("HH:mm:ss")).toStdString();
}

// "nothing serves port lab (...); trying again every 5 s".
std::string retrying(const SourceStatus& status) {
    const auto ms = status.retryDelay.count();
    return status.connectProblem + "; trying again every " +
           (ms % 1000 == 0 ? std::to_string(ms / 1000) : StringFormat::format("%.1f", static_cast<double>(ms) / 1000)) +
           " s";
}

std::string noRecordText(const SourceStatus& status) {
    return "no record for the " + TechnologyNames::displayName(status.decoderTechnology) + " decoder; " + holdsText(status);
}

}  // namespace

std::string StatusText::updated(const QDateTime& at) {
    return at.toString(QStringLiteral("'Updated' yyyy-MM-dd 'at' HH:mm:ss")).toStdString();
}

std::string StatusText::line(const SourceStatus& status) {
    // Whatever the state, the messages lost on the way are said, ahead of the source so
    // that a narrow status line keeps them.
    std::string tail = status.dropped == 0 ? std::string()
                                           : kSeparator + std::to_string(status.dropped) + " messages dropped";
    if (!status.source.empty()) tail += kSeparator + status.source;
    switch (status.phase) {
    case SourceStatus::Phase::Connecting:
        if (!status.connectProblem.empty()) return std::string(kConnecting) + " " + retrying(status) + tail;
        return status.firstConnect ? kFirstConnecting : kConnecting;
    case SourceStatus::Phase::Disconnected:
        return since("disconnected", status.disconnectedAt) +
               (status.connectProblem.empty() ? std::string() : ": " + retrying(status)) + tail;
    case SourceStatus::Phase::Finished: {
        std::string text = "replay finished: " + std::to_string(status.total.value_or(status.sent.value_or(0))) +
                           " messages, " + std::to_string(status.forDecoder) + " for this decoder";
        // A fast replay ends before the 10 s wait: the hint comes with the end.
        if (status.forDecoder == 0 && !status.decoderTechnology.empty()) text += "; " + holdsText(status);
        return text + tail;
    }
    case SourceStatus::Phase::Streaming:
        break;
    }
    // A modem that went away or a stream that froze: the values shown are its last ones.
    if (isStale(status))
        return since("no data", status.lastDataAt) +
               (status.backendProblem.empty() ? std::string() : ": " + status.backendProblem) + tail;
    if (!status.backendProblem.empty()) return status.backendProblem + tail;
    if (status.noRecordForDecoder) return noRecordText(status) + tail;
    std::string text = status.updatedAt.isValid() ? updated(status.updatedAt) : std::string("Streaming");
    text += tail;
    if (status.recordedAt.isValid())
        text += kSeparator + status.recordedAt.toString(QStringLiteral("'recorded' HH:mm:ss")).toStdString();
    if (status.sent && status.total && *status.total > 0)
        text += kSeparator + std::to_string(std::clamp<int64_t>(*status.sent * 100 / *status.total, 0, 100)) + "%";
    return text;
}

bool StatusText::isStale(const SourceStatus& status) {
    if (status.phase == SourceStatus::Phase::Disconnected) return true;
    // Only values that were shown can be stale: a source that never sent any says its
    // problem on an empty display.
    return status.phase == SourceStatus::Phase::Streaming && status.lastDataAt.isValid() &&
           (status.frozen || !status.backendProblem.empty());
}

}  // namespace vantorel

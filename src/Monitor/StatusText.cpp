// StatusText: the "Updated ... at ..." line and the stream's state, one wording for every view.
#include "Monitor/StatusText.h"

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

std::string noRecordText(const SourceStatus& status) {
    return "no record for the " + TechnologyNames::displayName(status.decoderTechnology) + " decoder; " + holdsText(status);
}

}  // namespace

std::string StatusText::updated(const QDateTime& at) {
    return at.toString(QStringLiteral("'Updated' yyyy-MM-dd 'at' HH:mm:ss")).toStdString();
}

std::string StatusText::line(const SourceStatus& status) {
    const std::string source = status.source.empty() ? std::string() : kSeparator + status.source;
    switch (status.phase) {
    case SourceStatus::Phase::Connecting:
        return status.firstConnect ? kFirstConnecting : kConnecting;
    case SourceStatus::Phase::Disconnected:
        return "disconnected since " + status.disconnectedAt.toString(QStringLiteral("HH:mm:ss")).toStdString() + source;
    case SourceStatus::Phase::Finished: {
        std::string text = "replay finished: " + std::to_string(status.total.value_or(status.sent.value_or(0))) +
                           " messages, " + std::to_string(status.forDecoder) + " for this decoder";
        // A fast replay ends before the 10 s wait: the hint comes with the end.
        if (status.forDecoder == 0 && !status.decoderTechnology.empty()) text += "; " + holdsText(status);
        return text + source;
    }
    case SourceStatus::Phase::Streaming:
        break;
    }
    // A modem that went away: the values shown are its last ones.
    if (!status.backendProblem.empty()) return status.backendProblem + source;
    if (status.noRecordForDecoder) return noRecordText(status) + source;
    std::string text = status.updatedAt.isValid() ? updated(status.updatedAt) : std::string("Streaming");
    text += source;
    if (status.recordedAt.isValid())
        text += kSeparator + status.recordedAt.toString(QStringLiteral("'recorded' HH:mm:ss")).toStdString();
    if (status.sent && status.total && *status.total > 0)
        text += kSeparator + std::to_string(std::clamp<int64_t>(*status.sent * 100 / *status.total, 0, 100)) + "%";
    return text;
}

}  // namespace vantorel

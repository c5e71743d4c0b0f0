// SourceStatus: where the monitor's data comes from and how that stream stands, as plain values the status line is written from.
#pragma once

#include <QDateTime>

#include <chrono>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace vantorel {

struct SourceStatus {
    enum class Phase { Connecting, Streaming, Disconnected, Finished };

    Phase phase = Phase::Connecting;
    // Before the first update the root reads "Connecting", later "Connecting...".
    bool firstConnect = true;
    // "emulator LTE", "replay sprint.mi2log", "device /dev/ttyUSB0", "service NAME".
    std::string source;
    bool isReplay = false;
    QDateTime updatedAt;       // when new data was last shown; invalid before any
    QDateTime disconnectedAt;  // when the channel was lost (Disconnected)
    std::optional<int64_t> sent;   // messages the backend produced in this run
    std::optional<int64_t> total;  // messages in the replay file
    uint64_t forDecoder = 0;       // messages that reached this monitor's channel
    QDateTime recordedAt;          // the current record's recorded time; invalid when unknown
    std::string decoderTechnology;              // identifier of the decoder in use
    std::vector<std::string> logTechnologies;   // identifiers the stream's log codes belong to
    // The stream has run long enough without a record this decoder reads.
    bool noRecordForDecoder = false;
    // The backend's trouble as the service words it ("device /dev/ttyUSB0: the device went
    // away ..."), while it lasts; empty when all is well.
    std::string backendProblem;
    QDateTime lastDataAt;  // when the last record reached this monitor; invalid before any
    // Streaming, yet neither a record nor the service's progress for a while: the modem
    // or the service froze, and the values shown are old.
    bool frozen = false;
    // Records the service dropped for this monitor, which took them too slowly.
    uint64_t dropped = 0;
    // Why the service cannot be reached ("nothing serves port lab"), once start-up has
    // failed a few times in a row; empty while it starts or runs.
    std::string connectProblem;
    std::chrono::milliseconds retryDelay{0};  // how often start-up is tried again
};

}  // namespace vantorel

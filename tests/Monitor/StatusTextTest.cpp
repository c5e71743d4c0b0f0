// Tests for StatusText::line: what the status line says in each state of a stream.
#include "Monitor/StatusText.h"

#include "Platform/TelephonyIdentifiers.h"

#include <gtest/gtest.h>

using namespace vantorel;
using Phase = SourceStatus::Phase;

TEST(StatusText, EachStateOfTheStreamReadsAsTheUserNeedsIt) {
    const QDateTime at(QDate(2016, 6, 28), QTime(22, 1, 10));
    const std::string lte = kTSLogChannelTechnology_Morvek_LTE, gsm = kTSLogChannelTechnology_Morvek_GSM;
    auto make = [&](Phase phase, auto&& change) {
        SourceStatus s;
        s.phase = phase;
        s.firstConnect = false;
        s.source = "replay sprint.qmdl";
        s.isReplay = true;
        s.decoderTechnology = kTSLogChannelTechnology_Morvek_UTRAN2;
        change(s);
        return s;
    };
    const struct {
        SourceStatus status;
        std::string line;
    } rows[] = {
        {make(Phase::Connecting, [](SourceStatus& s) { s.firstConnect = true; }), "Connecting"},
        {make(Phase::Connecting, [](SourceStatus&) {}), "Connecting..."},
        {make(Phase::Streaming, [&](SourceStatus& s) { s.updatedAt = at; }),
         "Updated 2016-06-28 at 22:01:10 \u00b7 replay sprint.qmdl"},
        {make(Phase::Streaming, [&](SourceStatus& s) { s.updatedAt = at; s.recordedAt = at.addSecs(-60); s.sent = 45; s.total = 100; }),
         "Updated 2016-06-28 at 22:01:10 \u00b7 replay sprint.qmdl \u00b7 recorded 22:00:10 \u00b7 45%"},
        {make(Phase::Disconnected, [&](SourceStatus& s) { s.disconnectedAt = at; s.source = "service vt"; }),
         "disconnected since 22:01:10 \u00b7 service vt"},
        {make(Phase::Finished, [](SourceStatus& s) { s.sent = 120; s.total = 120; s.forDecoder = 80; }),
         "replay finished: 120 messages, 80 for this decoder \u00b7 replay sprint.qmdl"},
        {make(Phase::Finished, [](SourceStatus& s) { s.sent = 9; s.logTechnologies = {kTSLogChannelTechnology_Morvek_LTE}; }),
         "replay finished: 9 messages, 0 for this decoder; this file holds LTE codes: try --technology lte \u00b7 replay sprint.qmdl"},
        {make(Phase::Streaming, [&](SourceStatus& s) { s.noRecordForDecoder = true; s.logTechnologies = {lte, gsm}; }),
         "no record for the UTRAN (TD-SCDMA) decoder; this file holds LTE and GSM/UMTS codes: try --technology lte "
         "\u00b7 replay sprint.qmdl"},
        {make(Phase::Streaming, [](SourceStatus& s) { s.noRecordForDecoder = true; s.isReplay = false; s.source.clear(); }),
         "no record for the UTRAN (TD-SCDMA) decoder; this stream has sent no log codes yet"},
        // Values that stopped following the source say since when.
        {make(Phase::Streaming, [&](SourceStatus& s) { s.updatedAt = s.lastDataAt = at; s.frozen = true; }),
         "no data since 22:01:10 \u00b7 replay sprint.qmdl"},
        {make(Phase::Streaming, [&](SourceStatus& s) { s.lastDataAt = at; s.source = "device /dev/ttyUSB0"; s.backendProblem = "device /dev/ttyUSB0: the device hung up"; }),
         "no data since 22:01:10: device /dev/ttyUSB0: the device hung up \u00b7 device /dev/ttyUSB0"},
        {make(Phase::Streaming, [](SourceStatus& s) { s.backendProblem = "empty.bin holds no record"; }),
         "empty.bin holds no record \u00b7 replay sprint.qmdl"},
        // Lost records, in every state, ahead of the source.
        {make(Phase::Streaming, [&](SourceStatus& s) { s.updatedAt = at; s.dropped = 1087244; s.sent = 45; s.total = 100; }),
         "Updated 2016-06-28 at 22:01:10 \u00b7 1087244 messages dropped \u00b7 replay sprint.qmdl \u00b7 45%"},
        {make(Phase::Disconnected, [&](SourceStatus& s) { s.disconnectedAt = at; s.dropped = 3; }),
         "disconnected since 22:01:10 \u00b7 3 messages dropped \u00b7 replay sprint.qmdl"},
        // A service nobody runs is named, with the retries.
        {make(Phase::Connecting, [](SourceStatus& s) { s.firstConnect = true; s.source = "service lab"; s.connectProblem = "nothing serves port lab"; s.retryDelay = std::chrono::seconds(5); }),
         "Connecting... nothing serves port lab; trying again every 5 s \u00b7 service lab"},
        {make(Phase::Disconnected, [&](SourceStatus& s) { s.disconnectedAt = at; s.source = "service lab"; s.connectProblem = "nothing serves port lab"; s.retryDelay = std::chrono::milliseconds(2500); }),
         "disconnected since 22:01:10: nothing serves port lab; trying again every 2.5 s \u00b7 service lab"},
    };
    for (const auto& row : rows) EXPECT_EQ(StatusText::line(row.status), row.line);
}

TEST(StatusText, OnlyValuesThatWereShownAndNoLongerFollowTheSourceAreStale) {
    const QDateTime at(QDate(2016, 6, 28), QTime(22, 1, 10));
    auto make = [&](Phase phase, bool shown, auto&& change) {
        SourceStatus s;
        s.phase = phase;
        if (shown) s.lastDataAt = at;
        change(s);
        return s;
    };
    const struct {
        const char* what;
        SourceStatus status;
        bool stale;
    } rows[] = {
        {"streaming", make(Phase::Streaming, true, [](SourceStatus&) {}), false},
        {"the service lost", make(Phase::Disconnected, true, [](SourceStatus&) {}), true},
        {"the stream frozen", make(Phase::Streaming, true, [](SourceStatus& s) { s.frozen = true; }), true},
        {"the modem unplugged", make(Phase::Streaming, true, [](SourceStatus& s) { s.backendProblem = "gone"; }), true},
        {"a source failing before any data", make(Phase::Streaming, false, [](SourceStatus& s) { s.backendProblem = "gone"; }), false},
        {"a replay finished", make(Phase::Finished, true, [](SourceStatus&) {}), false},
        {"messages dropped", make(Phase::Streaming, true, [](SourceStatus& s) { s.dropped = 10; }), false},
    };
    for (const auto& row : rows) EXPECT_EQ(StatusText::isStale(row.status), row.stale) << row.what;
}

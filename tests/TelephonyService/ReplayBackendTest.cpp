// Tests ReplayBackend: speed 0 emits every message in order, pace from the recorded times, loop, pause, the Finished state.
#include "TelephonyService/ReplayBackend.h"

#include "Platform/RecordBuilder.h"
#include "Platform/TelephonyIdentifiers.h"
#include "TelephonyService/Replay/CaptureWriter.h"
#include "TelephonyService/ServiceTestSupport.h"

#include <QElapsedTimer>
#include <gtest/gtest.h>

#include <limits>
#include <vector>

namespace vantorel {
namespace {

using servicetest::Collector;
using servicetest::spin;
using servicetest::streamOf;
using servicetest::waitUntil;

// Starts the backend and waits until it finishes: the milliseconds it took, or -1.
qint64 runToEnd(ModemBackend& backend) {
    QElapsedTimer clock;
    clock.start();
    backend.start();
    if (!waitUntil([&] { return backend.state() == ModemBackend::State::Finished; })) return -1;
    return clock.elapsed();
}

// n distinct records: code 0xD000 + i % 16, payload byte i, i / 256.
std::vector<Bytes> numberedRecords(size_t n) {
    std::vector<Bytes> out;
    for (size_t i = 0; i < n; ++i)
        out.push_back(RecordBuilder::ordinary(static_cast<uint16_t>(0xD000 + i % 16), 16)
                          .u8(13, static_cast<uint8_t>(i))
                          .u8(14, static_cast<uint8_t>(i / 256))
                          .build());
    return out;
}

// A capture stream with messages at the given times (microseconds).
RecordedStream timedStream(const std::vector<int64_t>& times) {
    Bytes file = CaptureWriter::headerBytes(kTSLogChannelTechnology_Morvek_UTRAN2);
    const std::vector<Bytes> records = numberedRecords(times.size());
    for (size_t i = 0; i < times.size(); ++i) {
        const Bytes m = CaptureWriter::messageBytes(times[i], 0, records[i]);
        file.insert(file.end(), m.begin(), m.end());
    }
    return RecordedStream::fromBytes(file);
}

TEST(ReplayBackendTest, SpeedZeroEmitsAllMessagesInOrderThenFinishes) {
    // More than one batch, so the replay goes back to the event loop in between.
    const std::vector<Bytes> records = numberedRecords(3 * ReplayBackend::kBatch + 7);
    ReplayBackend backend(streamOf(records, kTSLogChannelTechnology_Morvek_UTRAN2, 60000000), 0, false, "x.vcap");
    Collector c;
    c.attach(backend);
    backend.start();
    ASSERT_TRUE(waitUntil([&] { return backend.state() == ModemBackend::State::Finished; }));
    EXPECT_EQ(c.messages, records);
    EXPECT_EQ(c.states,
              (std::vector<ModemBackend::State>{ModemBackend::State::Streaming, ModemBackend::State::Finished}));
    EXPECT_EQ(backend.passesCompleted(), 1u);
    EXPECT_EQ(backend.technology(), kTSLogChannelTechnology_Morvek_UTRAN2);
}

TEST(ReplayBackendTest, LoopStartsOverAtTheEnd) {
    const std::vector<Bytes> records = numberedRecords(5);
    ReplayBackend backend(streamOf(records, kTSLogChannelTechnology_Morvek_UTRAN2), 0, true);
    Collector c;
    c.attach(backend);
    backend.start();
    ASSERT_TRUE(waitUntil([&] { return c.messages.size() >= 12; }));
    backend.stop();
    for (size_t i = 0; i < c.messages.size(); ++i) EXPECT_EQ(c.messages[i], records[i % records.size()]) << i;
    EXPECT_GE(backend.passesCompleted(), 2u);
    EXPECT_EQ(c.states, (std::vector<ModemBackend::State>{ModemBackend::State::Streaming, ModemBackend::State::Idle}));
}

TEST(ReplayBackendTest, StartAfterFinishedPlaysFromTheBeginning) {
    const std::vector<Bytes> records = numberedRecords(3);
    ReplayBackend backend(streamOf(records, kTSLogChannelTechnology_Morvek_UTRAN2), 0, false);
    Collector c;
    c.attach(backend);
    backend.start();
    ASSERT_TRUE(waitUntil([&] { return backend.state() == ModemBackend::State::Finished; }));
    backend.start();
    ASSERT_TRUE(waitUntil([&] { return c.messages.size() == 6; }));
    EXPECT_EQ(std::vector<Bytes>(c.messages.begin() + 3, c.messages.end()), records);
}

TEST(ReplayBackendTest, PausedReplaySendsNothingUntilResumed) {
    const std::vector<Bytes> records = numberedRecords(4);
    ReplayBackend backend(streamOf(records, kTSLogChannelTechnology_Morvek_UTRAN2), 0, false);
    Collector c;
    c.attach(backend);
    // Pause after the second message, from the slot, as the service's flow control does.
    QObject::connect(&backend, &ModemBackend::messageReady, [&] {
        if (c.messages.size() == 2) backend.setPaused(true);
    });
    backend.start();
    ASSERT_TRUE(waitUntil([&] { return c.messages.size() == 2; }));
    spin(30);
    EXPECT_EQ(c.messages.size(), 2u);
    EXPECT_EQ(backend.state(), ModemBackend::State::Streaming);
    backend.setPaused(false);
    ASSERT_TRUE(waitUntil([&] { return backend.state() == ModemBackend::State::Finished; }));
    EXPECT_EQ(c.messages, records);
}

TEST(ReplayBackendTest, SpeedOneKeepsTheRecordedGapsAndSpeedThreeShortensThem) {
    // Three messages 150 ms apart: 300 ms at speed 1, 100 ms at speed 3.
    const std::vector<int64_t> times = {1000000, 1150000, 1300000};
    for (double speed : {1.0, 3.0}) {
        ReplayBackend backend(timedStream(times), speed, false);
        Collector c;
        c.attach(backend);
        QElapsedTimer clock;
        clock.start();
        backend.start();
        ASSERT_TRUE(waitUntil([&] { return backend.state() == ModemBackend::State::Finished; }));
        const qint64 elapsed = clock.elapsed();
        EXPECT_EQ(c.messages.size(), 3u);
        if (speed == 1.0) {
            EXPECT_GE(elapsed, 295) << "speed 1";
        } else {
            EXPECT_GE(elapsed, 95) << "speed 3";
            EXPECT_LT(elapsed, 295) << "speed 3";
        }
    }
}

TEST(ReplayBackendTest, TimeGoingBackwardsCountsAsNoGap) {
    // 10 s back, then 100 ms on: no wait for the step back.
    ReplayBackend backend(timedStream({20000000, 10000000, 10100000}), 1.0, false);
    Collector c;
    c.attach(backend);
    const qint64 elapsed = runToEnd(backend);
    ASSERT_GE(elapsed, 0) << "the replay did not finish";
    EXPECT_GE(elapsed, 95);
    EXPECT_LT(elapsed, 2000);
    EXPECT_EQ(c.messages.size(), 3u);
}

TEST(ReplayBackendTest, LongGapsAreCutToTheMaxGap) {
    // An hour's pause in the recording, then time stamps far apart at both ends of the range.
    ReplayBackend backend(timedStream({0, 3600000000, std::numeric_limits<int64_t>::min(),
                                       std::numeric_limits<int64_t>::max()}),
                          1.0, false);
    EXPECT_EQ(backend.maxGap(), std::chrono::seconds(10));
    backend.setMaxGap(std::chrono::milliseconds(50));
    Collector c;
    c.attach(backend);
    const qint64 elapsed = runToEnd(backend);
    ASSERT_GE(elapsed, 0) << "the replay did not finish";
    // Two gaps of at most 50 ms (the step back to the minimum is none).
    EXPECT_GE(elapsed, 95);
    EXPECT_LT(elapsed, 1500);
    EXPECT_EQ(c.messages.size(), 4u);
}

TEST(ReplayBackendTest, EmptyStreamFinishesAtOnceEvenWhenLooping) {
    ReplayBackend backend(streamOf({}, kTSLogChannelTechnology_Morvek_UTRAN2), 0, true);
    backend.start();
    ASSERT_TRUE(waitUntil([&] { return backend.state() == ModemBackend::State::Finished; }));
    EXPECT_EQ(backend.messagesEmitted(), 0u);
}

TEST(ReplayBackendTest, DescriptionNamesFileFormatCountAndPace) {
    ReplayBackend fast(streamOf(numberedRecords(2), kTSLogChannelTechnology_Morvek_UTRAN2), 0, true, "x.vcap");
    EXPECT_EQ(fast.description(), "replay of x.vcap (capture, 2 messages, as fast as the client takes it, looping)");
    ReplayBackend paced(streamOf(numberedRecords(2), kTSLogChannelTechnology_Morvek_UTRAN2), 2, false, "x.vcap");
    EXPECT_EQ(paced.description(), "replay of x.vcap (capture, 2 messages, speed 2)");
}

}  // namespace
}  // namespace vantorel

// Tests the modem backends and the log mask: replay pace, gaps, looping, pausing; emulator ticks and scenario lookup; which messages a start command's mask forwards.
#include "TelephonyService/EmulatorBackend.h"
#include "TelephonyService/LogMask.h"
#include "TelephonyService/ReplayBackend.h"

#include "Platform/RecordBuilder.h"
#include "Platform/TechnologyNames.h"
#include "Platform/TelephonyIdentifiers.h"
#include "PropertyList/PropertyListSerialization.h"
#include "TelephonyService/ServiceTestSupport.h"

#include <QElapsedTimer>
#include <gtest/gtest.h>

#include <optional>
#include <set>
#include <string>
#include <vector>

namespace vantorel {
namespace {

using servicetest::FastUTRANScenario;
using servicetest::spin;
using servicetest::streamOf;
using servicetest::waitUntil;
using State = ModemBackend::State;

// What a backend emits, in order.
struct Collector {
    std::vector<Bytes> messages;
    std::vector<State> states;
    explicit Collector(ModemBackend& backend) {
        QObject::connect(&backend, &ModemBackend::messageReady, [this](int32_t, const Bytes& m) { messages.push_back(m); });
        QObject::connect(&backend, &ModemBackend::stateChanged, [this](State s) { states.push_back(s); });
    }
};

std::vector<Bytes> numberedRecords(size_t n) {
    std::vector<Bytes> out;
    for (size_t i = 0; i < n; ++i)
        out.push_back(RecordBuilder::ordinary(0xD00A, 16).u16(13, static_cast<uint16_t>(i)).build());
    return out;
}

TEST(ReplayBackend, ThePaceFollowsTheRecordedGapsDividedByTheSpeed) {
    struct Row { const char* name; std::vector<int64_t> timesMicros; double speed; int minMs, maxMs; };
    std::vector<int64_t> minuteApart;
    for (size_t i = 0; i < 3 * ReplayBackend::kBatch + 7; ++i) minuteApart.push_back(int64_t(i) * 60000000);
    const std::vector<Row> rows = {
        {"speed 1 keeps 150 ms gaps", {1000000, 1150000, 1300000}, 1.0, 295, 2000},
        {"speed 3 shortens them", {1000000, 1150000, 1300000}, 3.0, 95, 295},
        {"time going backwards is no gap", {20000000, 10000000, 10100000}, 1.0, 95, 2000},
        {"an hour's gap is cut to 10 s", {0, 3600000000}, 100.0, 95, 2000},
        {"speed 0 waits for nothing, over several batches", minuteApart, 0.0, 0, 2000},
    };
    for (const Row& row : rows) {
        SCOPED_TRACE(row.name);
        const std::vector<Bytes> records = numberedRecords(row.timesMicros.size());
        ReplayBackend backend(streamOf(records, row.timesMicros), row.speed, false);
        Collector c(backend);
        QElapsedTimer clock;
        clock.start();
        backend.start();
        ASSERT_TRUE(waitUntil([&] { return backend.state() == State::Finished; }, 3000));
        EXPECT_GE(clock.elapsed(), row.minMs);
        EXPECT_LT(clock.elapsed(), row.maxMs);
        EXPECT_EQ(c.messages, records);
        EXPECT_EQ(c.states, (std::vector<State>{State::Streaming, State::Finished}));
    }
}

TEST(ReplayBackend, TheSilenceBeforeTheFirstRecordAClientWantsIsNotWaitedOut) {
    const Bytes other = RecordBuilder::ordinary(0xB0C0, 16).build(), wanted = RecordBuilder::ordinary(0xD00A, 16).build();
    struct Row { const char* name; std::vector<Bytes> records; std::vector<int64_t> times; std::optional<std::set<uint16_t>> codes; int minMs, maxMs; };
    const std::vector<Row> rows = {
        {"records nobody asked for, 9 s of them", {other, other, wanted, wanted}, {0, 5000000, 9000000, 9300000},
         std::set<uint16_t>{0xD00A}, 295, 2000},
        {"after the first wanted record the pace holds", {wanted, other, wanted}, {0, 200000, 400000},
         std::set<uint16_t>{0xD00A}, 395, 2000},
        {"a client that takes everything", {other, other}, {0, 400000}, std::nullopt, 395, 2000},
    };
    for (const Row& row : rows) {
        SCOPED_TRACE(row.name);
        ReplayBackend backend(streamOf(row.records, row.times), 1.0, false);
        backend.setLogCodes(row.codes);
        QElapsedTimer clock;
        clock.start();
        backend.start();
        ASSERT_TRUE(waitUntil([&] { return backend.state() == State::Finished; }, 3000));
        EXPECT_GE(clock.elapsed(), row.minMs);
        EXPECT_LT(clock.elapsed(), row.maxMs);
    }
}

TEST(ReplayBackend, TheTechnologyFollowsTheServingCellAndTicksMarkTheRecordedTime) {
    // A UTRAN capture whose modem moves to LTE at message 2 and back at message 4.
    const std::vector<Bytes> records = {
        RecordBuilder::ordinary(0xD00A, 16).build(), RecordBuilder::ordinary(0xD00A, 16).build(),
        RecordBuilder::ordinary(0xB0C2, 16).build(), RecordBuilder::ordinary(0xB0C0, 16).build(),
        RecordBuilder::ordinary(0xD0E2, 16).build()};
    const int64_t t0 = 1700000000000000;
    ReplayBackend backend(streamOf(records, {t0, t0 + 500000, t0 + 2100000, t0 + 2200000, t0 + 7000000}), 0, true);
    std::vector<std::string> events;  // "message <technology>", "technology", "tick <ms after t0>"
    QObject::connect(&backend, &ModemBackend::messageReady,
                     [&](int32_t, const Bytes&) { events.push_back("message " + TechnologyNames::shortName(backend.technology())); });
    QObject::connect(&backend, &ModemBackend::technologyChanged, [&] { events.push_back("technology"); });
    QObject::connect(&backend, &ModemBackend::displayTick, [&](std::optional<int64_t> ms) {
        events.push_back(ms ? "tick " + std::to_string(*ms - t0 / 1000) : "tick");
    });
    EXPECT_EQ(backend.technology(), kTSLogChannelTechnology_Morvek_UTRAN2);
    backend.start();
    ASSERT_TRUE(waitUntil([&] { return events.size() >= 15; }));
    backend.stop();
    const std::vector<std::string> pass = {"message utran", "message utran", "tick 2000", "technology", "message lte",
                                           "message lte", "tick 4000", "technology", "message utran", "tick 8000"};
    EXPECT_EQ(std::vector<std::string>(events.begin(), events.begin() + 10), pass);
    // The next pass starts over in the first technology.
    EXPECT_EQ(std::vector<std::string>(events.begin() + 10, events.begin() + 12), (std::vector<std::string>{"message utran", "message utran"}));
}

TEST(ReplayBackend, ALoopingReplayWaitsWhilePausedAndStartsOverAtItsEnd) {
    const std::vector<Bytes> records = numberedRecords(3);
    ReplayBackend backend(streamOf(records), 0, true);
    Collector c(backend);
    backend.setPaused(true);
    backend.start();
    spin(50);
    EXPECT_TRUE(c.messages.empty());
    backend.setPaused(false);
    ASSERT_TRUE(waitUntil([&] { return c.messages.size() >= 8; }));
    for (size_t i = 0; i < 8; ++i) EXPECT_EQ(c.messages[i], records[i % 3]) << i;
    backend.stop();
    EXPECT_EQ(backend.state(), State::Idle);

    ReplayBackend empty(streamOf({}), 0, true);  // an empty loop must not spin
    empty.start();
    ASSERT_TRUE(waitUntil([&] { return empty.state() == State::Finished; }));
}

TEST(EmulatorScenarios, ASeedAndATickAlwaysGiveTheSameBytesWhateverTheOrder) {
    for (const char* technology : {"cdma", "gsm", "ifx", "lte", "utran"}) {
        std::string error;
        auto one = EmulatorBackend::scenarioFor(technology, &error, 1), again = EmulatorBackend::scenarioFor(technology, &error, 1),
             other = EmulatorBackend::scenarioFor(technology, &error, 2);
        ASSERT_TRUE(one && again && other) << error;
        std::vector<std::vector<Bytes>> a;
        for (uint64_t t = 0; t < 120; ++t) a.push_back(one->recordsForTick(t));
        for (uint64_t t : {79, 3, 78, 119, 0}) EXPECT_EQ(again->recordsForTick(t), a[t]) << technology << " " << t;
        bool differs = false;
        for (uint64_t t = 0; t < 120; ++t) differs |= other->recordsForTick(t) != a[t];
        EXPECT_TRUE(differs) << technology;
    }
}

TEST(EmulatorBackend, TicksComeAtOnceThenEveryIntervalAndGoOnCountingAfterAStop) {
    EmulatorBackend backend(std::make_unique<FastUTRANScenario>(7));
    FastUTRANScenario reference(7);
    std::vector<std::vector<Bytes>> ticks;
    for (uint64_t t = 0; t < 200; ++t) ticks.push_back(reference.recordsForTick(t));
    Collector c(backend);
    backend.setPaused(true);  // a live modem does not wait for its listener
    backend.start();
    ASSERT_TRUE(waitUntil([&] { return c.messages.size() >= 4 * ticks[0].size(); }));
    backend.stop();
    // A tick's records are emitted together: the stream holds whole ticks 0..n-1.
    std::vector<Bytes> whole;
    size_t n = 0;
    for (; whole.size() < c.messages.size(); ++n) whole.insert(whole.end(), ticks[n].begin(), ticks[n].end());
    EXPECT_EQ(c.messages, whole);
    const size_t count = whole.size();
    spin(60);
    EXPECT_EQ(c.messages.size(), count) << "nothing after stop";

    c.messages.clear();
    backend.start();  // tick n follows: the modem does not rewind
    ASSERT_TRUE(waitUntil([&] { return c.messages.size() >= ticks[n].size(); }));
    c.messages.resize(ticks[n].size());
    EXPECT_EQ(c.messages, ticks[n]);
}

TEST(LogMask, AStartCommandForwardsItsCodesAndAlwaysTheJunk) {
    const Bytes prefixed = RecordBuilder::ordinary(0x7130).buildWithPrefix();
    const Bytes extra1 = RecordBuilder::extra(1).build();
    const std::vector<Bytes> messages = {
        RecordBuilder::ordinary(0x7130).build(), prefixed, RecordBuilder::ordinary(0x7131).build(), extra1,
        RecordBuilder::ordinary(1).build(),  // code 1, but ordinary
        RecordBuilder(2, 0x7130).build(),     // wrong type: junk
        Bytes{0x01, 0x10, 0x00, 0x30},        // no room for the code: junk
        *PropertyListSerialization::write(Value("IFX"), PropertyListSerialization::Format::XML),  // IFX messages
        *PropertyListSerialization::write(Value("IFX"), PropertyListSerialization::Format::Binary),
    };

    auto command = [](std::optional<std::vector<Value>> ordinaryCodes, std::optional<std::vector<Value>> extraCodes) {
        auto dict = Dictionary::create();
        dict->set("SetState", Value("Streaming"));
        if (ordinaryCodes) dict->set("SetMorvekLogCodes", Value(Array::of(*ordinaryCodes)));
        if (extraCodes) dict->set("SetTsExtraCodes", Value(Array::of(*extraCodes)));
        return dict;
    };
    struct Row { const char* name; DictionaryRef command; std::vector<bool> forwardsEach; std::string problem; };
    const std::vector<Row> rows = {
        {"no lists: all", command({}, {}), {1, 1, 1, 1, 1, 1, 1, 1, 1}, ""},
        {"one ordinary code", command(std::vector<Value>{Value::integer(0x7130)}, {}), {1, 1, 0, 0, 0, 1, 1, 1, 1}, ""},
        {"one extra code", command({}, std::vector<Value>{Value::integer(1)}), {0, 0, 0, 1, 0, 1, 1, 1, 1}, ""},
        {"entries that are no codes", command(std::vector<Value>{Value::integer(0x7131), Value::integer(-1), Value("x")},
                                              std::vector<Value>{Value::integer(0x10000)}),
         {0, 0, 1, 0, 0, 1, 1, 1, 1},
         "skipped 2 entries of SetMorvekLogCodes and 1 of SetTsExtraCodes that are not codes 0..65535"},
    };
    for (const Row& row : rows) {
        SCOPED_TRACE(row.name);
        std::string problem = "untouched";
        const LogMask mask = LogMask::fromStartCommand(*row.command, &problem);
        EXPECT_EQ(problem, row.problem);
        for (size_t i = 0; i < messages.size(); ++i) EXPECT_EQ(mask.forwards(messages[i]), row.forwardsEach[i]) << i;
    }
    EXPECT_EQ(LogMask::classify(extra1)->effectiveCode(), LogCode::kCellMonitor);
    EXPECT_EQ(LogMask::classify(prefixed)->effectiveCode(), 0x7130);
}

}  // namespace
}  // namespace vantorel

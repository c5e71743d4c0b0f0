// Tests TelephonyService end to end on loopback, the service on a TelephonyServiceThread and a model-like client on the test thread: channels, GetTechnology, log masks, clients leaving, garbage frames, flow control, notifications, --record.
#include "TelephonyService/TelephonyService.h"

#include "Platform/RecordBuilder.h"
#include "Platform/TelephonyIdentifiers.h"
#include "TelephonyService/Emulator/UTRANScenario.h"
#include "TelephonyService/LogMask.h"
#include "TelephonyService/ReplayBackend.h"
#include "TelephonyService/Replay/CaptureReader.h"
#include "TelephonyService/ServiceTestSupport.h"
#include "TelephonyService/TelephonyServiceThread.h"

#include <QLocalSocket>
#include <QThread>
#include <QTemporaryDir>
#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

namespace vantorel {
namespace {

using servicetest::startCommand;
using servicetest::streamOf;
using servicetest::TestClient;
using servicetest::uniquePortName;
using servicetest::waitUntil;
using Counters = TelephonyService::Counters;

const Bytes kCodeA = RecordBuilder::ordinary(0xD00A, 20).u8(13, 1).build();
const Bytes kCodeB = RecordBuilder::ordinary(0xD00C, 20).u8(13, 2).build();
const Bytes kExtra1 = RecordBuilder::extra(1, 20).u8(13, 3).build();
const Bytes kExtra2 = RecordBuilder::extra(2, 20).u8(13, 4).build();
const Bytes kPrefixedA = RecordBuilder::ordinary(0xD00A, 20).u8(13, 5).buildWithPrefix();
const Bytes kPrefixedB = RecordBuilder::ordinary(0xD00C, 20).u8(13, 6).buildWithPrefix();
const Bytes kJunk = Bytes{0x02, 0x00, 0x01};

const std::vector<Bytes>& mixedRecords() {
    static const std::vector<Bytes> k = {kCodeA, kCodeB, kExtra1, kExtra2, kPrefixedA, kPrefixedB, kJunk};
    return k;
}

// Options for a service on a fresh port that replays the records at speed 0.
TelephonyServiceOptions replayOptions(std::vector<Bytes> records, bool loop = false) {
    TelephonyServiceOptions options;
    options.portName = uniquePortName("service");
    options.backendFactory = [records = std::move(records), loop] {
        return std::make_unique<ReplayBackend>(streamOf(records, kTSLogChannelTechnology_Morvek_UTRAN2), 0, loop,
                                               "test");
    };
    return options;
}

TelephonyServiceOptions emulatorOptions() {
    TelephonyServiceOptions options;
    options.portName = uniquePortName("service");
    options.emulate = "utran";
    options.tickInterval = std::chrono::milliseconds(20);
    return options;
}

DictionaryRef streamingAlone() {
    auto dict = Dictionary::create();
    dict->set("SetState", Value("Streaming"));
    return dict;
}

bool waitForCounters(const TelephonyServiceThread& service, const std::function<bool(const Counters&)>& done) {
    return waitUntil([&] { return done(service.counters()); });
}

TEST(TelephonyServiceTest, CreateLogChannelAnswersWithTheChannelsPort) {
    TelephonyServiceThread service(emulatorOptions());
    std::string error;
    ASSERT_TRUE(service.start(&error)) << error;
    TestClient client;
    ASSERT_TRUE(client.connect(service.portName()));
    EXPECT_EQ(client.channel.errorDomain, 0);
    EXPECT_EQ(client.channel.errorCode, 0);
    const std::string prefix =
        service.portName() + ".channel." + std::to_string(QCoreApplication::applicationPid()) + ".";
    EXPECT_EQ(client.channel.portName.rfind(prefix, 0), 0u) << client.channel.portName;
    const Counters c = service.counters();
    EXPECT_EQ(c.openChannels, 1u);
    EXPECT_EQ(c.channelsServed, 1u);
}

TEST(TelephonyServiceTest, GetTechnologyAnswersTheBackendsIdentifier) {
    TelephonyServiceThread service(emulatorOptions());
    ASSERT_TRUE(service.start());
    TestClient client;
    ASSERT_TRUE(client.connect(service.portName()));
    EXPECT_EQ(client.getTechnology(), std::optional<std::string>(kTSLogChannelTechnology_Morvek_UTRAN2));
}

TEST(TelephonyServiceTest, NothingStreamsBeforeTheStartCommand) {
    TelephonyServiceThread service(emulatorOptions());
    ASSERT_TRUE(service.start());
    TestClient client;
    ASSERT_TRUE(client.connect(service.portName()));
    ASSERT_TRUE(client.getTechnology());
    servicetest::spin(150);  // several emulator ticks' worth
    EXPECT_TRUE(client.received.empty());
    EXPECT_EQ(service.counters().messagesSent, 0u);
}

TEST(TelephonyServiceTest, StartCommandWithAMaskForwardsOnlySubscribedCodesAndJunk) {
    TelephonyServiceThread service(replayOptions(mixedRecords()));
    ASSERT_TRUE(service.start());
    TestClient client;
    ASSERT_TRUE(client.connect(service.portName()));
    ASSERT_TRUE(client.send(startCommand({0xD00A}, {1})));
    const std::vector<Bytes> expected = {kCodeA, kExtra1, kPrefixedA, kJunk};
    ASSERT_TRUE(waitUntil([&] { return client.received.size() >= expected.size(); }));
    servicetest::spin(30);
    EXPECT_EQ(client.received, expected);
    EXPECT_EQ(service.counters().messagesSent, expected.size());
}

TEST(TelephonyServiceTest, StreamingAloneForwardsEveryMessage) {
    TelephonyServiceThread service(replayOptions(mixedRecords()));
    ASSERT_TRUE(service.start());
    TestClient client;
    ASSERT_TRUE(client.connect(service.portName()));
    ASSERT_TRUE(client.send(streamingAlone()));
    ASSERT_TRUE(waitUntil([&] { return client.received.size() >= mixedRecords().size(); }));
    EXPECT_EQ(client.received, mixedRecords());
}

TEST(TelephonyServiceTest, EmulatorStreamsOnlyTheSubscribedCodesOfItsTicks) {
    TelephonyServiceThread service(emulatorOptions());
    ASSERT_TRUE(service.start());
    TestClient client;
    ASSERT_TRUE(client.connect(service.portName()));
    ASSERT_TRUE(client.send(startCommand({UTRANScenario::kLogCodeRRCState}, {UTRANScenario::kExtraCellMonitor})));
    bool sawRRC = false;
    bool sawCellMonitor = false;
    ASSERT_TRUE(waitUntil([&] {
        for (const Bytes& m : client.received) {
            const auto c = LogMask::classify(m);
            if (!c) continue;
            sawRRC = sawRRC || c->effectiveCode() == UTRANScenario::kLogCodeRRCState;
            sawCellMonitor = sawCellMonitor || c->effectiveCode() == (0xFF0000u | UTRANScenario::kExtraCellMonitor);
        }
        return sawRRC && sawCellMonitor;
    }));
    for (const Bytes& m : client.received) {
        const auto c = LogMask::classify(m);
        if (!c) continue;  // junk passes
        EXPECT_TRUE(c->effectiveCode() == UTRANScenario::kLogCodeRRCState ||
                    c->effectiveCode() == (0xFF0000u | UTRANScenario::kExtraCellMonitor))
            << std::hex << c->effectiveCode();
    }
}

TEST(TelephonyServiceTest, TwoClientsGetTheirOwnMasks) {
    TelephonyServiceThread service(replayOptions(mixedRecords(), true));
    ASSERT_TRUE(service.start());
    TestClient a;
    TestClient b;
    ASSERT_TRUE(a.connect(service.portName()));
    ASSERT_TRUE(b.connect(service.portName()));
    ASSERT_TRUE(a.send(startCommand({0xD00A}, {})));
    ASSERT_TRUE(b.send(startCommand({}, {2})));
    ASSERT_TRUE(waitUntil([&] { return a.received.size() >= 10 && b.received.size() >= 10; }));
    for (const Bytes& m : a.received) EXPECT_TRUE(m == kCodeA || m == kPrefixedA || m == kJunk);
    for (const Bytes& m : b.received) EXPECT_TRUE(m == kExtra2 || m == kJunk);
    EXPECT_EQ(service.counters().channelsServed, 2u);
}

TEST(TelephonyServiceTest, ClientThatClosesItsPortsFreesItsChannel) {
    TelephonyServiceThread service(emulatorOptions());
    ASSERT_TRUE(service.start());
    TestClient client;
    ASSERT_TRUE(client.connect(service.portName()));
    ASSERT_TRUE(client.send(streamingAlone()));
    ASSERT_TRUE(waitUntil([&] { return !client.received.empty(); }));
    EXPECT_EQ(service.counters().openChannels, 1u);
    client.close();
    ASSERT_TRUE(waitForCounters(service, [](const Counters& c) { return c.openChannels == 0; }));
    EXPECT_EQ(service.counters().channelsServed, 1u);
}

TEST(TelephonyServiceTest, LastClientLeavingStopsTheBackend) {
    TelephonyServiceThread service(emulatorOptions());
    ASSERT_TRUE(service.start());
    TestClient watcher;  // keeps its server connection to hear the notifications
    ASSERT_TRUE(watcher.connect(service.portName(), /*keepConnection=*/true));
    TestClient client;
    ASSERT_TRUE(client.connect(service.portName()));
    ASSERT_TRUE(client.send(streamingAlone()));
    ASSERT_TRUE(waitUntil([&] { return !client.received.empty(); }));
    auto backendState = [&] {
        ModemBackend::State state = ModemBackend::State::Failed;
        service.invoke([&](TelephonyService& s) { state = s.backend()->state(); });
        return state;
    };
    client.close();
    servicetest::spin(60);
    EXPECT_EQ(backendState(), ModemBackend::State::Streaming);  // the watcher's channel is still open
    watcher.close();
    ASSERT_TRUE(waitForCounters(service, [](const Counters& c) { return c.openChannels == 0; }));
    EXPECT_EQ(backendState(), ModemBackend::State::Idle);
    // The watcher's server connection is still open (close() ends only its channel).
    ASSERT_TRUE(waitUntil([&] { return watcher.notifications.size() >= 2; }));
    std::vector<std::string> states;
    for (const auto& n : watcher.notifications) states.push_back(*n.info.asDictionary()->get("State").asString());
    EXPECT_EQ(states, (std::vector<std::string>{"Streaming", "Idle"}));
}

TEST(TelephonyServiceTest, ClientWhoseReceivePortGoesAwayFreesItsChannelBeforeStreaming) {
    TelephonyServiceThread service(emulatorOptions());
    ASSERT_TRUE(service.start());
    {
        TestClient client;
        ASSERT_TRUE(client.connect(service.portName()));
    }  // ports released without a word
    ASSERT_TRUE(waitForCounters(service, [](const Counters& c) { return c.openChannels == 0; }));
}

TEST(TelephonyServiceTest, GarbageFrameOnTheServicePortIsCountedAndTheServiceKeepsServing) {
    TelephonyServiceThread service(emulatorOptions());
    ASSERT_TRUE(service.start());
    QLocalSocket raw;
    raw.connectToServer(QString::fromStdString(service.portName()));
    ASSERT_TRUE(raw.waitForConnected(1000));
    // Kind 9 is no frame kind: the port closes this connection and counts the frame.
    raw.write(QByteArray("\x09\x01\x00\x00\x00\x00\x00\x00\x04\x00\x00\x00junk", 16));
    ASSERT_TRUE(raw.waitForBytesWritten(1000));
    ASSERT_TRUE(waitForCounters(service, [](const Counters& c) { return c.malformedFrames == 1; }));
    raw.abort();

    TestClient second;
    ASSERT_TRUE(second.connect(service.portName()));
    EXPECT_EQ(second.getTechnology(), std::optional<std::string>(kTSLogChannelTechnology_Morvek_UTRAN2));
    EXPECT_EQ(service.counters().malformedFrames, 1u);
}

TEST(TelephonyServiceTest, MalformedCreateLogChannelGetsErrorCode1) {
    TelephonyServiceThread service(emulatorOptions());
    ASSERT_TRUE(service.start());
    auto port = RemoteMessagePort::lookup(service.portName());
    ASSERT_TRUE(port);
    auto check = [&](const Bytes& request, int32_t code) {
        std::optional<Bytes> reply;
        ASSERT_EQ(port->sendRequest(1, request, 1.0, 1.0, &reply), RemoteMessagePort::Success);
        ASSERT_TRUE(reply);
        const PropertyListResult parsed = PropertyListSerialization::readDictionary(*reply);
        ASSERT_TRUE(parsed);
        EXPECT_EQ(parsed.value->asDictionary()->get("ErrorDomain").asInteger(), 1);
        EXPECT_EQ(parsed.value->asDictionary()->get("ErrorCode").asInteger(), code);
        EXPECT_EQ(*parsed.value->asDictionary()->get("PortName").asString(), "");
    };
    check(Bytes{'n', 'o', 't', ' ', 'a', ' ', 'p', 'l', 'i', 's', 't'}, 1);
    auto noPort = Dictionary::create();
    noPort->set("Request", Value("CreateLogChannel"));
    check(servicetest::xmlOf(noPort), 1);
    // A receive port that nobody listens on.
    auto unreachable = Dictionary::create();
    unreachable->set("Request", Value("CreateLogChannel"));
    unreachable->set("PortName", Value(uniquePortName("nobody")));
    check(servicetest::xmlOf(unreachable), 2);
    const Counters c = service.counters();
    EXPECT_EQ(c.malformedRequests, 2u);
    EXPECT_EQ(c.openChannels, 0u);
}

TEST(TelephonyServiceTest, BackendStateChangesAreNotifiedToConnectedClients) {
    TelephonyServiceThread service(replayOptions(mixedRecords()));
    ASSERT_TRUE(service.start());
    TestClient client;
    ASSERT_TRUE(client.connect(service.portName(), /*keepConnection=*/true));
    ASSERT_TRUE(client.send(streamingAlone()));
    ASSERT_TRUE(waitUntil([&] { return client.notifications.size() >= 2; }));
    std::vector<std::string> states;
    for (const auto& n : client.notifications) {
        EXPECT_EQ(n.name, "BackendStateChanged");
        const DictionaryRef info = n.info.asDictionary();
        ASSERT_TRUE(info);
        EXPECT_EQ(*info->get("Technology").asString(), kTSLogChannelTechnology_Morvek_UTRAN2);
        states.push_back(*info->get("State").asString());
    }
    EXPECT_EQ(states, (std::vector<std::string>{"Streaming", "Finished"}));
}

TEST(TelephonyServiceTest, SlowClientPausesTheReplayAndGetsEverythingInOrder) {
    // 4 MiB of records at speed 0 to a client that does not read for a while.
    std::vector<Bytes> records;
    for (size_t i = 0; i < 4096; ++i)
        records.push_back(RecordBuilder::ordinary(0xD00A, 1024).u16(13, static_cast<uint16_t>(i)).build());
    TelephonyServiceThread service(replayOptions(records));
    ASSERT_TRUE(service.start());
    TestClient client;
    ASSERT_TRUE(client.connect(service.portName()));
    ASSERT_TRUE(client.send(streamingAlone()));
    QThread::msleep(300);  // the client's event loop does not run: nothing is read
    bool paused = false;
    uint64_t emitted = 0;
    ASSERT_TRUE(service.invoke([&](TelephonyService& s) {
        paused = s.backend()->isPaused();
        emitted = s.backend()->messagesEmitted();
    }));
    EXPECT_TRUE(paused);
    EXPECT_LT(emitted, records.size());
    ASSERT_TRUE(waitUntil([&] { return client.received.size() == records.size(); }, 2500));
    EXPECT_EQ(client.received, records);
}

TEST(TelephonyServiceTest, RecordWritesACaptureThatReadsBackWithTheSameMessages) {
    QTemporaryDir dir;
    const std::string path = dir.filePath("rec.vcap").toStdString();
    TelephonyServiceOptions options = replayOptions(mixedRecords());
    options.record = path;
    TelephonyServiceThread service(options);
    ASSERT_TRUE(service.start());
    TestClient client;
    ASSERT_TRUE(client.connect(service.portName()));
    ASSERT_TRUE(client.send(startCommand({0xD00C}, {1, 2})));
    const std::vector<Bytes> expected = {kCodeB, kExtra1, kExtra2, kPrefixedB, kJunk};
    ASSERT_TRUE(waitUntil([&] { return client.received.size() >= expected.size(); }));
    service.stop();
    EXPECT_EQ(service.counters().messagesRecorded, expected.size());

    const Capture capture = CaptureReader::readFile(path);
    ASSERT_TRUE(capture.ok()) << capture.report.error;
    EXPECT_EQ(capture.technology, kTSLogChannelTechnology_Morvek_UTRAN2);
    std::vector<Bytes> recorded;
    for (const TimedMessage& m : capture.messages) {
        recorded.push_back(m.data);
        EXPECT_EQ(m.messageId, 0);
        EXPECT_GT(m.timeMicros, 1700000000LL * 1000000);
    }
    EXPECT_EQ(recorded, expected);
    EXPECT_EQ(recorded, client.received);
}

TEST(TelephonyServiceTest, FinishedReplayStartsOverForTheNextClient) {
    TelephonyServiceThread service(replayOptions({kCodeA, kCodeB}));
    ASSERT_TRUE(service.start());
    for (int round = 0; round < 2; ++round) {
        TestClient client;
        ASSERT_TRUE(client.connect(service.portName()));
        ASSERT_TRUE(client.send(streamingAlone()));
        ASSERT_TRUE(waitUntil([&] { return client.received.size() == 2; })) << round;
        EXPECT_EQ(client.received, (std::vector<Bytes>{kCodeA, kCodeB}));
        client.close();
        ASSERT_TRUE(waitForCounters(service, [](const Counters& c) { return c.openChannels == 0; }));
    }
}

}  // namespace
}  // namespace vantorel

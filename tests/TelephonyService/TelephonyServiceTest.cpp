// Tests the telephony service end to end over local sockets, the service on its own thread and a model-like client on the test thread: channels, GetTechnology, log masks, clients leaving, bad requests, limits on peers and buffers, flow control and dropping for a client that does not read, notifications, recording and start-up failures.
#include "TelephonyService/TelephonyService.h"

#include "Platform/MessagePortFrame.h"
#include "Platform/PortDirectory.h"
#include "Platform/RecordBuilder.h"
#include "Platform/TelephonyIdentifiers.h"
#include "TelephonyService/EmulatorBackend.h"
#include "TelephonyService/ReplayBackend.h"
#include "TelephonyService/Replay/CaptureReader.h"
#include "TelephonyService/ServiceTestSupport.h"
#include "support/HostilePlist.h"
#include "TelephonyService/TelephonyServiceThread.h"

#include <QCoreApplication>
#include <QElapsedTimer>
#include <QFile>
#include <QLocalSocket>
#include <QTemporaryDir>
#include <QThread>
#include <gtest/gtest.h>

#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <memory>
#include <string>
#include <vector>

namespace vantorel {
namespace {

using testing::withNulCharacter;
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
const Bytes kJunk = Bytes{0x02, 0x00, 0x01};
const std::vector<Bytes> kMixed = {kCodeA, kCodeB, kExtra1, kExtra2, kPrefixedA, kJunk};

// A service on a fresh port with that backend; a replay runs as fast as the client takes it.
TelephonyServiceOptions options(std::function<std::unique_ptr<ModemBackend>()> backend = {}) {
    TelephonyServiceOptions o;
    o.portName = uniquePortName("service");
    o.backendFactory = std::move(backend);
    return o;
}
TelephonyServiceOptions replayOptions(std::vector<Bytes> records, bool loop = false) {
    return options([=] { return std::make_unique<ReplayBackend>(streamOf(records), 0, loop, "test"); });
}
TelephonyServiceOptions emulatorOptions() {
    return options([] { return std::make_unique<EmulatorBackend>(std::make_unique<servicetest::FastUTRANScenario>()); });
}

bool waitForCounters(const TelephonyServiceThread& service, const std::function<bool(const Counters&)>& done,
                     int timeoutMs = 2000) {
    return waitUntil([&] { return done(service.counters()); }, timeoutMs);
}

ModemBackend::State backendState(const TelephonyServiceThread& service) {
    ModemBackend::State state = ModemBackend::State::Failed;
    service.invoke([&](TelephonyService& s) { state = s.backend()->state(); });
    return state;
}

TEST(TelephonyService, AChannelAnswersGetTechnologyAndSendsNothingBeforeTheStartCommand) {
    TelephonyServiceThread service(emulatorOptions());
    std::string error;
    ASSERT_TRUE(service.start(&error)) << error;
    TestClient client;
    ASSERT_TRUE(client.connect(service.portName()));
    const std::string prefix = service.portName() + ".channel." + std::to_string(QCoreApplication::applicationPid()) + ".";
    EXPECT_EQ(client.channel.portName.rfind(prefix, 0), 0u) << client.channel.portName;
    EXPECT_EQ(client.getTechnology(), std::optional<std::string>(kTSLogChannelTechnology_Morvek_UTRAN2));
    servicetest::spin(100);  // five emulator ticks
    EXPECT_TRUE(client.received.empty());
    EXPECT_EQ(service.counters().messagesSent, 0u);
}

TEST(TelephonyService, TwoClientsGetTheirOwnMasks) {
    TelephonyServiceThread service(replayOptions(kMixed, /*loop=*/true));
    ASSERT_TRUE(service.start());
    TestClient a, b;
    ASSERT_TRUE(a.connect(service.portName()));
    ASSERT_TRUE(b.connect(service.portName()));
    ASSERT_TRUE(a.send(startCommand({0xD00A}, {})));
    ASSERT_TRUE(b.send(startCommand({}, {2})));
    ASSERT_TRUE(waitUntil([&] { return a.received.size() >= 10 && b.received.size() >= 10; }));
    for (const Bytes& m : a.received) EXPECT_TRUE(m == kCodeA || m == kPrefixedA || m == kJunk);
    for (const Bytes& m : b.received) EXPECT_TRUE(m == kExtra2 || m == kJunk);
}

TEST(TelephonyService, ClientsThatGoAwayFreeTheirChannelsAndTheLastOneStopsTheBackend) {
    TelephonyServiceThread service(emulatorOptions());
    ASSERT_TRUE(service.start());
    {
        TestClient silent;
        ASSERT_TRUE(silent.connect(service.portName()));
    }  // ports released without a word, before any start command
    ASSERT_TRUE(waitForCounters(service, [](const Counters& c) { return c.openChannels == 0; }));

    TestClient watcher;  // keeps its server connection to hear the notifications
    ASSERT_TRUE(watcher.connect(service.portName(), /*keepConnection=*/true));
    ASSERT_TRUE(watcher.send(startCommand({}, {}, false)));
    TestClient client;
    ASSERT_TRUE(client.connect(service.portName()));
    ASSERT_TRUE(client.send(startCommand({}, {}, false)));
    ASSERT_TRUE(waitUntil([&] { return !client.received.empty(); }));
    client.close();
    ASSERT_TRUE(waitForCounters(service, [](const Counters& c) { return c.openChannels == 1; }));
    EXPECT_EQ(backendState(service), ModemBackend::State::Streaming);
    watcher.close();
    ASSERT_TRUE(waitForCounters(service, [](const Counters& c) { return c.openChannels == 0; }));
    EXPECT_EQ(backendState(service), ModemBackend::State::Idle);
    ASSERT_TRUE(waitUntil([&] { return watcher.backendStates().back() == "Idle"; }));
    std::vector<std::string> changes = watcher.backendStates();  // progress repeats "Streaming"
    changes.erase(std::unique(changes.begin(), changes.end()), changes.end());
    EXPECT_EQ(changes, (std::vector<std::string>{"Streaming", "Idle"}));
    EXPECT_EQ(service.counters().channelsServed, 3u);
}

TEST(TelephonyService, BadChannelRequestsAreAnsweredWithAnErrorAndServingGoesOn) {
    TelephonyServiceThread service(emulatorOptions());
    ASSERT_TRUE(service.start());
    TestClient client;
    ASSERT_TRUE(client.connect(service.portName()));
    const auto unclaimed = LocalMessagePort::create(uniquePortName("unclaimed"), {});  // never comes to its channel
    auto port = RemoteMessagePort::lookup(service.portName());
    ASSERT_TRUE(port);
    auto request = [](std::optional<std::string> portName) {
        auto dict = Dictionary::create();
        dict->set("Request", Value("CreateLogChannel"));
        if (portName) dict->set("PortName", Value(*portName));
        return servicetest::xmlOf(dict);
    };
    const std::vector<std::pair<Bytes, int64_t>> rows = {
        {Bytes{'n', 'o', 't', ' ', 'a', ' ', 'p', 'l', 'i', 's', 't'}, TelephonyService::kMalformedRequest},
        {request(std::nullopt), TelephonyService::kMalformedRequest},
        {request(uniquePortName("nobody")), TelephonyService::kClientPortUnreachable},
        {request(service.portName()), TelephonyService::kServicePortNamed},
        {request(PortDirectory::path(nullptr) + "/./" + service.portName()), TelephonyService::kServicePortNamed},
        {request(client.channel.portName), TelephonyService::kServicePortNamed},
        {withNulCharacter(*PropertyListSerialization::read(request("\u00e9-")).value), TelephonyService::kMalformedRequest},
        {request(unclaimed->name()), TelephonyService::kNoError},
    };
    for (const auto& [data, code] : rows) {
        std::optional<Bytes> reply;
        ASSERT_EQ(port->sendRequest(1, data, 1.0, 1.0, &reply), RemoteMessagePort::Success);
        const PropertyListResult parsed = PropertyListSerialization::readDictionary(reply.value_or(Bytes{}));
        ASSERT_TRUE(parsed);
        const DictionaryRef answer = parsed.value->asDictionary();
        EXPECT_EQ(answer->get("ErrorDomain").asInteger(), code == 0 ? 0 : 1);
        EXPECT_EQ(answer->get("ErrorCode").asInteger(), code);
        EXPECT_EQ(answer->get("PortName").asString()->empty(), code != 0);
    }
    EXPECT_EQ(service.counters().malformedRequests, 3u);
    EXPECT_EQ(service.counters().openChannels, 2u);
    EXPECT_TRUE(waitForCounters(service, [](const Counters& c) { return c.openChannels == 1; }, 4500));
}

TEST(TelephonyService, AServiceSharedWithAGroupGivesItItsSocketsAndClearsTheChannelsAKilledRunLeft) {
    QTemporaryDir dir;
    const std::string port = dir.filePath("lab").toStdString();
    const std::vector<std::pair<std::string, bool>> leftovers = {  // socket file nobody listens on, survives
        {port + ".channel.4242.1", false},
        {dir.filePath("lab.other").toStdString(), true},  // a neighbour, not the service's
    };
    for (const auto& [path, survives] : leftovers) {
        sockaddr_un address{};
        address.sun_family = AF_UNIX;
        path.copy(address.sun_path, sizeof address.sun_path - 1);
        const int fd = ::socket(AF_UNIX, SOCK_STREAM, 0);
        ASSERT_EQ(::bind(fd, reinterpret_cast<sockaddr*>(&address), sizeof address), 0);
        ::close(fd);  // as a killed process leaves it
    }
    TelephonyServiceOptions shared = emulatorOptions();
    shared.portName = port;
    shared.allowGroup = std::to_string(::getegid());
    TelephonyServiceThread service(shared);
    std::string error;
    ASSERT_TRUE(service.start(&error)) << error;
    for (const auto& [path, survives] : leftovers) EXPECT_EQ(QFile::exists(QString::fromStdString(path)), survives) << path;
    TestClient client;
    ASSERT_TRUE(client.connect(port));
    for (const std::string& socket : {port, client.channel.portName}) {
        struct stat st {};
        ASSERT_EQ(::stat(socket.c_str(), &st), 0) << socket;
        EXPECT_EQ(st.st_mode & 0777, 0660u) << socket;
        EXPECT_EQ(st.st_gid, ::getegid());
    }
}

TEST(TelephonyService, PeersOverALimitAreClosedAndOthersAreStillServed) {
    TelephonyServiceThread service(emulatorOptions());
    ASSERT_TRUE(service.start());
    static std::atomic<int> notOpen{0};  // Qt's complaint about a read or write on a closed socket
    const QtMessageHandler previous = qInstallMessageHandler([](QtMsgType, const QMessageLogContext&, const QString& text) {
        if (text.contains("device not open")) ++notOpen;
    });
    auto peer = [&](const Bytes& bytes) {  // a connection that writes as much of the bytes as the service takes
        auto socket = std::make_unique<QLocalSocket>();
        socket->connectToServer(QString::fromStdString(PortDirectory::socketPathFor(service.portName(), nullptr)));
        EXPECT_TRUE(socket->waitForConnected(1000));
        socket->write(reinterpret_cast<const char*>(bytes.data()), static_cast<qint64>(bytes.size()));
        while (socket->bytesToWrite() > 0 && socket->waitForBytesWritten(1000)) {}
        return socket;
    };
    Bytes request = MessagePortFrame{MessagePortFrame::Kind::Request, 1, servicetest::xmlOf(Dictionary::create())}.encode();
    for (int i = 0; i < 5; ++i) request.insert(request.end(), request.begin(), request.end());
    for (int i = 0; i < 5; ++i) peer(request)->abort();  // gone before its replies are written

    // All but the last byte of a frame of the longest length, from more peers than the pool can hold.
    Bytes big = MessagePortFrame{MessagePortFrame::Kind::Message, 0, Bytes(MessagePortFrame::kMaxDataLength, 'x')}.encode();
    big.pop_back();
    std::vector<std::unique_ptr<QLocalSocket>> peers;
    for (int i = 0; i < 6; ++i) peers.push_back(peer(big));
    EXPECT_TRUE(waitForCounters(service, [](const Counters& c) { return c.overLimitPeers == 2; }));
    EXPECT_LE(MessagePortFrameDecoder::pooledBytes(), MessagePortFrameDecoder::kPoolBytes);
    TestClient client;
    EXPECT_TRUE(client.connect(service.portName()));

    for (int i = 0; i < LocalMessagePort::kMaxPeers; ++i) peers.push_back(peer({}));  // 4 held already
    EXPECT_TRUE(peers.back()->state() == QLocalSocket::UnconnectedState || peers.back()->waitForDisconnected(1000));
    EXPECT_TRUE(waitForCounters(service, [](const Counters& c) { return c.refusedPeers >= 4; }));
    service.stop();
    qInstallMessageHandler(previous);
    EXPECT_EQ(notOpen.load(), 0);
}

TEST(TelephonyService, AFinishedReplayIsNotifiedAndStartsOverForTheNextClient) {
    TelephonyServiceThread service(replayOptions({kCodeA, kCodeB}));
    ASSERT_TRUE(service.start());
    for (int round = 0; round < 2; ++round) {
        SCOPED_TRACE(round);
        TestClient client;
        ASSERT_TRUE(client.connect(service.portName(), /*keepConnection=*/true));
        ASSERT_TRUE(client.send(startCommand({}, {}, false)));
        ASSERT_TRUE(waitUntil([&] { return client.backendStates().size() >= 2; }));
        EXPECT_EQ(client.backendStates(), (std::vector<std::string>{"Streaming", "Finished"}));
        EXPECT_EQ(client.received, (std::vector<Bytes>{kCodeA, kCodeB}));
        EXPECT_EQ(*client.notifications[0].second.asDictionary()->get("Technology").asString(),
                  kTSLogChannelTechnology_Morvek_UTRAN2);
        TestClient late;  // comes while the first still watches the finished replay: no restart under it
        ASSERT_TRUE(late.connect(service.portName()));
        ASSERT_TRUE(late.send(startCommand({}, {}, false)));
        servicetest::spin(100);
        EXPECT_TRUE(late.received.empty());
        EXPECT_EQ(backendState(service), ModemBackend::State::Finished);
        late.close();
        client.close();
        ASSERT_TRUE(waitForCounters(service, [](const Counters& c) { return c.openChannels == 0; }));
    }
}

TEST(TelephonyService, ASlowClientPausesTheReplayAndStillGetsEverythingInOrderBesideAnIdleChannel) {
    std::vector<Bytes> records;  // 4 MiB, four times the high-water mark
    for (size_t i = 0; i < 4096; ++i)
        records.push_back(RecordBuilder::ordinary(0xD00A, 1024).u16(13, static_cast<uint16_t>(i)).build());
    TelephonyServiceThread service(replayOptions(records));
    ASSERT_TRUE(service.start());
    TestClient client, idle;  // idle's channel streams too, but its mask takes none of the records
    ASSERT_TRUE(client.connect(service.portName()));
    ASSERT_TRUE(client.send(startCommand({}, {}, false)));
    ASSERT_TRUE(idle.connect(service.portName()));
    ASSERT_TRUE(idle.send(startCommand({0xD00C}, {})));
    QThread::msleep(300);  // the client's event loop does not run: nothing is read
    bool paused = false;
    uint64_t emitted = 0;
    ASSERT_TRUE(service.invoke([&](TelephonyService& s) {
        paused = s.backend()->isPaused();
        emitted = s.backend()->messagesEmitted();
    }));
    EXPECT_TRUE(paused);
    EXPECT_LT(emitted, records.size());
    ASSERT_TRUE(waitUntil([&] { return client.received.size() == records.size(); }, 5000));
    EXPECT_EQ(client.received, records);
}

TEST(TelephonyService, AClientThatNeverReadsLosesItsOldestMessagesAndHoldsUpNoOther) {
    std::vector<Bytes> records;  // numbered, replayed in a loop at full speed
    for (uint16_t i = 0; i < 512; ++i) records.push_back(RecordBuilder::ordinary(0xD00A, 1024).u16(13, i).build());
    TelephonyServiceThread service(replayOptions(records, /*loop=*/true));
    ASSERT_TRUE(service.start());
    // The never-reading client's receive port: a listening socket whose connections nobody accepts.
    const std::string silentName = uniquePortName("silent");
    const std::string path = PortDirectory::socketPathFor(silentName, nullptr);
    const int fd = ::socket(AF_UNIX, SOCK_STREAM, 0);
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    path.copy(address.sun_path, sizeof address.sun_path - 1);
    ASSERT_EQ(::bind(fd, reinterpret_cast<sockaddr*>(&address), sizeof address), 0);
    ASSERT_EQ(::listen(fd, 4), 0);
    TestClient silent, reader;
    ASSERT_TRUE(silent.connect(service.portName(), false, silentName));
    ASSERT_TRUE(silent.send(startCommand({}, {}, false)));
    ASSERT_TRUE(reader.connect(service.portName()));
    ASSERT_TRUE(reader.send(startCommand({}, {}, false)));
    // 4 MiB: far more than the socket buffers, the high-water mark and the queue hold together.
    ASSERT_TRUE(waitUntil([&] { return reader.received.size() > 8 * records.size(); }, 8000));
    EXPECT_GT(service.counters().messagesDropped, 0u);
    // The silent client is told on its channel port how many it lost; the reader, nothing.
    ASSERT_TRUE(waitUntil([&] { return silent.dropped().value_or(0) > 0; }, 3000));
    EXPECT_LE(static_cast<uint64_t>(*silent.dropped()), service.counters().messagesDropped);
    EXPECT_FALSE(reader.dropped());
    for (size_t i = 1; i < reader.received.size(); ++i)  // the reader lost nothing
        ASSERT_EQ(reader.received[i], records[(i + (reader.received[0][13] | reader.received[0][14] << 8)) % records.size()]);
    ::close(fd);
    ::unlink(path.c_str());
}

TEST(TelephonyService, RecordingTakesEveryMessageFromTheStartWithoutAClientAndIsOnDiskAtOnce) {
    QTemporaryDir dir;
    const std::string path = dir.filePath("rec.vcap").toStdString();
    QFile old(QString::fromStdString(path));
    ASSERT_TRUE(old.open(QIODevice::WriteOnly) && old.write("an older recording") > 0);
    old.close();
    TelephonyServiceOptions options = replayOptions(kMixed);
    options.record = path;
    options.replaceRecording = true;
    TelephonyServiceThread service(options);
    ASSERT_TRUE(service.start());
    ASSERT_TRUE(waitForCounters(service, [](const Counters& c) { return c.messagesRecorded == kMixed.size(); }));

    const Capture capture = CaptureReader::readFile(path);  // while the service still runs
    ASSERT_TRUE(capture.ok()) << capture.report.error;
    EXPECT_EQ(capture.technology, kTSLogChannelTechnology_Morvek_UTRAN2);
    ASSERT_EQ(capture.messages.size(), kMixed.size());
    for (size_t i = 0; i < kMixed.size(); ++i) {
        EXPECT_EQ(capture.messages[i].data, kMixed[i]);
        EXPECT_GT(capture.messages[i].timeMicros, 1700000000LL * 1000000);
    }
}

TEST(TelephonyService, BackendStateChangedTellsSourceProgressAndTheTechnologiesOfTheStream) {
    const Bytes lte = RecordBuilder::ordinary(0xB0C0, 20).build();
    std::vector<Bytes> records;
    std::vector<int64_t> times;
    for (int i = 0; i < 20; ++i) {  // 1.9 s at the recorded pace
        records.push_back(i % 4 == 0 ? kExtra1 : i % 4 == 3 ? lte : kCodeA);
        times.push_back(1700000000000000 + i * 100000);
    }
    TelephonyServiceThread service(
        options([=] { return std::make_unique<ReplayBackend>(streamOf(records, times), 1, false, "short.vcap"); }));
    ASSERT_TRUE(service.start());
    TestClient client;
    ASSERT_TRUE(client.connect(service.portName(), /*keepConnection=*/true));
    QElapsedTimer clock;
    clock.start();
    ASSERT_TRUE(client.send(startCommand({}, {}, false)));
    ASSERT_TRUE(waitUntil([&] { return !client.notifications.empty() && client.backendStates().back() == "Finished"; }, 5000));

    std::vector<DictionaryRef> infos;
    for (const auto& [name, info] : client.notifications) infos.push_back(info.asDictionary());
    ASSERT_GE(infos.size(), 3u);  // Streaming, progress at most once a second, Finished
    EXPECT_LE(infos.size() - 2, static_cast<size_t>((clock.elapsed() + 999) / 1000));
    for (size_t i = 0; i < infos.size(); ++i) {
        const DictionaryRef& info = infos[i];
        EXPECT_EQ(*info->get("Source").asString(), "replay short.vcap");
        EXPECT_EQ(info->get("Total").asInteger(), 20);
        if (i > 0) {
            EXPECT_GT(info->get("Sent").asInteger(), infos[i - 1]->get("Sent").asInteger());
        }
    }
    EXPECT_EQ(infos.front()->get("Sent").asInteger(), 0);
    EXPECT_FALSE(infos.front()->contains("RecordedTime"));
    EXPECT_EQ(infos.back()->get("Sent").asInteger(), 20);
    EXPECT_EQ(infos.back()->get("RecordedTime").asInteger(), times.back());
    std::vector<std::string> technologies;
    for (const Value& v : *infos.back()->get("LogTechnologies").asArray()) technologies.push_back(*v.asString());
    EXPECT_EQ(technologies, (std::vector<std::string>{kTSLogChannelTechnology_Morvek_UTRAN2, kTSLogChannelTechnology_Morvek_LTE}));
}

TEST(TelephonyService, StartsOnItsOwnThreadOrSaysWhyNotAndLeavesThePortFree) {
    const std::string qmdl = servicetest::capturePath("qmdl_example.qmdl");
    TelephonyServiceOptions running;
    running.portName = uniquePortName("service");
    running.replay = qmdl;
    running.technology = "gsm";
    TelephonyServiceThread first(running);
    std::atomic<QThread*> statusThread{nullptr};
    first.setStatusCallback([&](const std::string& line) {
        if (line.rfind("client connected: channel ", 0) == 0) statusThread = QThread::currentThread();
    });
    std::string error;
    ASSERT_TRUE(first.start(&error)) << error;
    EXPECT_TRUE(first.start(&error));  // already running: nothing more to do
    EXPECT_EQ(first.startupLine(), "listening on " + running.portName +
                                       ", backend replay of qmdl_example.qmdl (QMDL, 336 messages, speed 1), technology GSM/UMTS");
    QTemporaryDir dir;  // an earlier recording, which no failed start may touch
    const std::string existing = dir.filePath("old.vcap").toStdString();
    Bytes oldBytes = CaptureWriter::headerBytes(kTSLogChannelTechnology_Morvek_UTRAN2);
    servicetest::append(oldBytes, CaptureWriter::messageBytes(1, 0, servicetest::morvekRecord(0xD00A, 1, {})));
    auto write = [](const std::string& path, const Bytes& bytes) {
        QFile file(QString::fromStdString(path));
        ASSERT_TRUE(file.open(QIODevice::WriteOnly));
        file.write(reinterpret_cast<const char*>(bytes.data()), static_cast<qint64>(bytes.size()));
    };
    write(existing, oldBytes);
    // A capture without a message, and log packets of codes no technology owns.
    const std::string bare = dir.filePath("bare.vcap").toStdString(), mobility = dir.filePath("mobility.qmdl").toStdString();
    write(bare, CaptureWriter::headerBytes(kTSLogChannelTechnology_Morvek_UTRAN2));
    write(mobility, servicetest::hdlcFrame(servicetest::logPacketBody(0x7130, 1, {2})));

    auto with = [](auto change) {
        TelephonyServiceOptions o = options();
        change(o);
        return o;
    };
    const std::vector<std::pair<TelephonyServiceOptions, std::string>> failures = {  // options, start of the error
        {running, "cannot listen on port " + running.portName + ": the name is in use (is another service running?)"},
        {with([](auto& o) { o.emulate = "wimax"; }), "unknown technology \"wimax\" (names: ifx, gsm, cdma, lte, utran"},
        {with([](auto&) {}), "give exactly one of --emulate TECH, --replay FILE and --device PATH"},
        {with([](auto& o) { o.replay = "/nonexistent-vantorel.qmdl"; }), "/nonexistent-vantorel.qmdl: No such file or directory"},
        {with([&](auto& o) { o.replay = bare; }), bare + ": no record in it (read as capture; 0 bad frames)"},
        {with([&](auto& o) { o.replay = mobility; }), mobility + ": no serving-cell record tells its technology: add --technology ("},
        {with([](auto& o) { o.replay = "x"; o.speed = -1; }), "speed -1: give 0"},
        {with([](auto& o) { o.emulate = "utran"; o.record = "/nonexistent-dir-of-vantorel/x.vcap"; }),
         "/nonexistent-dir-of-vantorel/x.vcap: "},
        {with([&](auto& o) { o.emulate = "utran"; o.record = existing; }),
         existing + ": the file exists already; it is left as it is (--force replaces it)"},
        {with([&](auto& o) { o.replay = o.record = existing; o.replaceRecording = true; }),
         existing + ": the file being replayed cannot be recorded onto"},
        {with([](auto& o) { o.emulate = "utran"; o.portName = "/proc/vantorel-port"; }),
         "cannot listen on port /proc/vantorel-port: not a valid port name: /proc/vantorel-port ("},
        {with([](auto& o) { o.emulate = "utran"; o.allowGroup = "nogroup"; }),
         "--allow-group needs --port /PATH in a directory the group can reach"},
        {with([&](auto& o) { o.emulate = "utran"; o.allowGroup = "no-such-group-of-vantorel"; o.portName = existing + ".port"; }),
         "--allow-group no-such-group-of-vantorel: no such group"},
    };
    for (const auto& [failing, why] : failures) {
        TelephonyServiceThread service(failing);
        EXPECT_FALSE(service.start(&error));
        EXPECT_EQ(error.rfind(why, 0), 0u) << error;
        EXPECT_FALSE(service.isRunning());
        // Nothing is left listening after a failed start.
        EXPECT_TRUE(failing.portName == running.portName || !RemoteMessagePort::lookup(failing.portName, 100));
    }
    QFile oldFile(QString::fromStdString(existing));
    ASSERT_TRUE(oldFile.open(QIODevice::ReadOnly));
    EXPECT_EQ(oldFile.readAll().toStdString(), std::string(oldBytes.begin(), oldBytes.end()));

    TestClient client;
    ASSERT_TRUE(client.connect(running.portName));
    QThread* serviceThread = nullptr;
    ASSERT_TRUE(first.invoke([&](TelephonyService&) { serviceThread = QThread::currentThread(); }));
    EXPECT_NE(serviceThread, QThread::currentThread());
    EXPECT_EQ(statusThread.load(), serviceThread);
    first.stop();
    EXPECT_FALSE(first.isRunning());
    EXPECT_EQ(first.counters().channelsServed, 1u);  // the final counts
    TelephonyServiceThread again(running);
    EXPECT_TRUE(again.start());  // stop() freed the port
}

}  // namespace
}  // namespace vantorel

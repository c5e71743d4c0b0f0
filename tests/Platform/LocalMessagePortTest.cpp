// Tests for LocalMessagePort: receive callback and replies, malformed peers, self-invalidation, invalidate(), names in use (Part 2.1; docs/protocol.md).
#include "Platform/LocalMessagePort.h"

#include "MessagePortTestHarness.h"
#include "Platform/MessagePortFrame.h"
#include "Platform/RemoteMessagePort.h"
#include "Platform/SystemLog.h"
#include "Platform/SystemLogCapture.h"

#include <QDir>
#include <QFile>
#include <QLocalSocket>

#include <gtest/gtest.h>

#include <atomic>
#include <mutex>

using namespace vantorel;
using namespace vantorel::test;

namespace {

Bytes bytesOf(const std::string& s) { return Bytes(s.begin(), s.end()); }

// What a port's receive callback saw, from the server thread.
struct Received {
    std::mutex mutex;
    std::vector<std::pair<int32_t, Bytes>> messages;
    QThread* thread = nullptr;

    LocalMessagePort::ReceiveCallback callback(std::optional<Bytes> reply = std::nullopt) {
        return [this, reply](int32_t id, const Bytes& data) -> std::optional<Bytes> {
            std::lock_guard<std::mutex> lock(mutex);
            messages.emplace_back(id, data);
            thread = QThread::currentThread();
            return reply;
        };
    }
    size_t count() {
        std::lock_guard<std::mutex> lock(mutex);
        return messages.size();
    }
};

// Reads frames from a raw socket until one arrives or the socket gives up.
std::vector<MessagePortFrame> readFrames(QLocalSocket& socket, MessagePortFrameDecoder& decoder) {
    std::vector<MessagePortFrame> frames;
    while (frames.empty() && socket.waitForReadyRead(1000)) {
        QByteArray chunk = socket.readAll();
        frames = decoder.feed(ByteView(reinterpret_cast<const uint8_t*>(chunk.constData()), static_cast<size_t>(chunk.size())));
    }
    return frames;
}

}  // namespace

TEST(LocalMessagePort, ARequestGetsTheCallbacksResultAsItsReply) {
    Received received;
    ServerThread server;
    const std::string name = uniquePortName("request");
    ASSERT_NE(server.create(name, received.callback(bytesOf("pong"))), nullptr);

    auto remote = RemoteMessagePort::lookup(name, 1000);
    ASSERT_NE(remote, nullptr);
    std::optional<Bytes> reply;
    EXPECT_EQ(remote->sendRequest(0, bytesOf("ping"), 1.0, 1.0, &reply), RemoteMessagePort::Success);
    ASSERT_TRUE(reply.has_value());
    EXPECT_EQ(*reply, bytesOf("pong"));
    ASSERT_EQ(received.count(), 1u);
    EXPECT_EQ(received.messages[0].second, bytesOf("ping"));
}

TEST(LocalMessagePort, TheReplyFrameCarriesTheRequestsMessageId) {
    Received received;
    ServerThread server;
    const std::string name = uniquePortName("replyid");
    ASSERT_NE(server.create(name, received.callback(bytesOf("answer"))), nullptr);

    QLocalSocket socket;
    socket.connectToServer(QString::fromStdString(name));
    ASSERT_TRUE(socket.waitForConnected(1000));
    MessagePortFrame request;
    request.kind = MessagePortFrame::Kind::Request;
    request.messageId = 42;
    request.data = bytesOf("q");
    Bytes bytes = request.encode();
    socket.write(reinterpret_cast<const char*>(bytes.data()), static_cast<qint64>(bytes.size()));
    ASSERT_TRUE(socket.waitForBytesWritten(1000));
    MessagePortFrameDecoder decoder;
    auto frames = readFrames(socket, decoder);
    ASSERT_EQ(frames.size(), 1u);
    EXPECT_EQ(frames[0].kind, MessagePortFrame::Kind::Reply);
    EXPECT_EQ(frames[0].messageId, 42);
    EXPECT_EQ(frames[0].data, bytesOf("answer"));
}

TEST(LocalMessagePort, AnEmptyResultSendsAnEmptyReply) {
    Received received;
    ServerThread server;
    const std::string name = uniquePortName("emptyreply");
    ASSERT_NE(server.create(name, received.callback(std::nullopt)), nullptr);
    auto remote = RemoteMessagePort::lookup(name, 1000);
    ASSERT_NE(remote, nullptr);
    std::optional<Bytes> reply;
    EXPECT_EQ(remote->sendRequest(3, bytesOf("x"), 1.0, 1.0, &reply), RemoteMessagePort::Success);
    ASSERT_TRUE(reply.has_value());
    EXPECT_TRUE(reply->empty());
}

TEST(LocalMessagePort, AMessageWithoutReplyArrivesAtTheCallbackWithItsIdAndDataOnThePortsThread) {
    Received received;
    ServerThread server;
    const std::string name = uniquePortName("message");
    ASSERT_NE(server.create(name, received.callback(bytesOf("ignored"))), nullptr);
    auto remote = RemoteMessagePort::lookup(name, 1000);
    ASSERT_NE(remote, nullptr);
    EXPECT_EQ(remote->sendRequest(7, bytesOf("record"), 1.0, 0, nullptr), RemoteMessagePort::Success);
    EXPECT_EQ(remote->sendRequest(0, {}, 1.0, 0, nullptr), RemoteMessagePort::Success);
    ASSERT_TRUE(waitUntil([&] { return received.count() == 2; }));
    std::lock_guard<std::mutex> lock(received.mutex);
    EXPECT_EQ(received.messages[0].first, 7);
    EXPECT_EQ(received.messages[0].second, bytesOf("record"));
    EXPECT_EQ(received.messages[1].first, 0);
    EXPECT_TRUE(received.messages[1].second.empty());
    EXPECT_EQ(received.thread, server.thread());
}

TEST(LocalMessagePort, APeerThatSendsGarbageIsClosedAndCountedWhileAnotherPeerKeepsWorking) {
    SystemLogCapture cap;
    Received received;
    ServerThread server;
    const std::string name = uniquePortName("garbage");
    LocalMessagePort* port = server.create(name, received.callback(bytesOf("ok")));
    ASSERT_NE(port, nullptr);

    auto good = RemoteMessagePort::lookup(name, 1000);
    ASSERT_NE(good, nullptr);
    std::optional<Bytes> reply;
    ASSERT_EQ(good->sendRequest(0, bytesOf("a"), 1.0, 1.0, &reply), RemoteMessagePort::Success);

    QLocalSocket bad;
    bad.connectToServer(QString::fromStdString(name));
    ASSERT_TRUE(bad.waitForConnected(1000));
    const Bytes garbage = {9, 1, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0xDE, 0xAD};  // kind 9
    bad.write(reinterpret_cast<const char*>(garbage.data()), static_cast<qint64>(garbage.size()));
    ASSERT_TRUE(bad.waitForBytesWritten(1000));
    EXPECT_TRUE(bad.state() == QLocalSocket::UnconnectedState || bad.waitForDisconnected(1000));

    uint64_t malformed = 0;
    server.run([&] { malformed = port->malformedFrames(); });
    EXPECT_EQ(malformed, 1u);
    EXPECT_TRUE(server.isValid(port));
    EXPECT_EQ(server.peerCount(port), 1);
    EXPECT_EQ(cap.count(SystemLog::kError,
                        "Message port " + name + ": malformed frame from a peer (unknown frame kind 9); connection closed"),
              1);

    reply.reset();
    EXPECT_EQ(good->sendRequest(0, bytesOf("b"), 1.0, 1.0, &reply), RemoteMessagePort::Success);
    EXPECT_EQ(reply, bytesOf("ok"));
    EXPECT_EQ(received.count(), 2u);
}

TEST(LocalMessagePort, ItInvalidatesItselfWhenItsLastPeerDisconnectsAndCallsTheCallbackOnce) {
    Received received;
    std::atomic<int> invalidations{0};
    std::atomic<LocalMessagePort*> invalidatedPort{nullptr};
    ServerThread server;
    const std::string name = uniquePortName("lastpeer");
    LocalMessagePort* port = server.create(name, received.callback());
    ASSERT_NE(port, nullptr);
    server.run([&] {
        port->setInvalidationCallback([&](LocalMessagePort* p) {
            invalidatedPort = p;
            ++invalidations;
        });
    });

    auto first = RemoteMessagePort::lookup(name, 1000);
    auto second = RemoteMessagePort::lookup(name, 1000);
    ASSERT_TRUE(first && second);
    ASSERT_EQ(first->sendRequest(1, bytesOf("1"), 1.0, 0, nullptr), RemoteMessagePort::Success);
    ASSERT_EQ(second->sendRequest(2, bytesOf("2"), 1.0, 0, nullptr), RemoteMessagePort::Success);
    ASSERT_TRUE(waitUntil([&] { return received.count() == 2 && server.peerCount(port) == 2; }));

    first.reset();
    ASSERT_TRUE(waitUntil([&] { return server.peerCount(port) == 1; }));
    EXPECT_TRUE(server.isValid(port));
    EXPECT_EQ(invalidations.load(), 0);

    second.reset();
    ASSERT_TRUE(waitUntil([&] { return invalidations.load() > 0; }));
    EXPECT_FALSE(server.isValid(port));
    EXPECT_EQ(invalidatedPort.load(), port);
    server.run([&] { port->invalidate(); });  // already invalid: nothing more
    EXPECT_EQ(invalidations.load(), 1);
    // It stopped listening.
    EXPECT_EQ(RemoteMessagePort::lookup(name, 200), nullptr);
}

TEST(LocalMessagePort, APeerThatNeverSentAFrameDoesNotMakeThePortInvalidateItself) {
    Received received;
    ServerThread server;
    const std::string name = uniquePortName("silent");
    LocalMessagePort* port = server.create(name, received.callback());
    ASSERT_NE(port, nullptr);
    auto silent = RemoteMessagePort::lookup(name, 1000);
    ASSERT_NE(silent, nullptr);
    ASSERT_TRUE(waitUntil([&] { return server.peerCount(port) == 1; }));
    silent.reset();
    ASSERT_TRUE(waitUntil([&] { return server.peerCount(port) == 0; }));
    EXPECT_TRUE(server.isValid(port));
}

TEST(LocalMessagePort, AWellKnownPortStaysValidWhenItsClientsLeave) {
    Received received;
    ServerThread server;
    const std::string name = uniquePortName("wellknown");
    LocalMessagePort* port = server.create(name, received.callback());
    ASSERT_NE(port, nullptr);
    server.run([&] { port->setStaysValidWithoutPeers(true); });
    for (int i = 0; i < 2; ++i) {
        auto client = RemoteMessagePort::lookup(name, 1000);
        ASSERT_NE(client, nullptr);
        ASSERT_EQ(client->sendRequest(0, bytesOf("hi"), 1.0, 0, nullptr), RemoteMessagePort::Success);
        ASSERT_TRUE(waitUntil([&] { return received.count() == static_cast<size_t>(i + 1); }));
        client.reset();
        ASSERT_TRUE(waitUntil([&] { return server.peerCount(port) == 0; }));
        EXPECT_TRUE(server.isValid(port));
    }
}

TEST(LocalMessagePort, InvalidateClosesThePeersStopsListeningAndCallsTheCallbackOnce) {
    Received received;
    std::atomic<int> invalidations{0};
    ServerThread server;
    const std::string name = uniquePortName("invalidate");
    LocalMessagePort* port = server.create(name, received.callback());
    ASSERT_NE(port, nullptr);
    server.run([&] { port->setInvalidationCallback([&](LocalMessagePort*) { ++invalidations; }); });
    auto client = RemoteMessagePort::lookup(name, 1000);
    ASSERT_NE(client, nullptr);
    ASSERT_TRUE(waitUntil([&] { return server.peerCount(port) == 1; }));

    server.run([&] {
        port->invalidate();
        port->invalidate();
    });
    EXPECT_EQ(invalidations.load(), 1);
    EXPECT_FALSE(server.isValid(port));
    EXPECT_EQ(server.peerCount(port), 0);
    EXPECT_TRUE(waitUntil([&] { return !client->isValid(); }));
    EXPECT_EQ(RemoteMessagePort::lookup(name, 200), nullptr);
}

TEST(LocalMessagePort, InvalidateWithTheCallbackClearedCallsNothing) {
    Received received;
    std::atomic<int> invalidations{0};
    ServerThread server;
    const std::string name = uniquePortName("cleared");
    LocalMessagePort* port = server.create(name, received.callback());
    ASSERT_NE(port, nullptr);
    server.run([&] {
        port->setInvalidationCallback([&](LocalMessagePort*) { ++invalidations; });
        port->setInvalidationCallback(nullptr);
        port->invalidate();
    });
    EXPECT_EQ(invalidations.load(), 0);
    EXPECT_FALSE(server.isValid(port));
}

TEST(LocalMessagePort, TheInvalidationCallbackMayDestroyThePort) {
    // The model's callback restarts the monitor, which releases the port inside it.
    std::unique_ptr<LocalMessagePort> port;  // touched only on the server thread
    std::atomic<bool> destroyed{false};
    std::atomic<int> received{0};
    ServerThread server;
    const std::string name = uniquePortName("destroyincb");
    server.run([&] {
        port = LocalMessagePort::create(name, [&](int32_t, const Bytes&) -> std::optional<Bytes> {
            ++received;
            return std::nullopt;
        });
        ASSERT_NE(port, nullptr);
        port->setInvalidationCallback([&](LocalMessagePort*) {
            port.reset();
            destroyed = true;
        });
    });
    auto client = RemoteMessagePort::lookup(name, 1000);
    ASSERT_NE(client, nullptr);
    ASSERT_EQ(client->sendRequest(0, bytesOf("r"), 1.0, 0, nullptr), RemoteMessagePort::Success);
    ASSERT_TRUE(waitUntil([&] { return received.load() == 1; }));
    client.reset();
    EXPECT_TRUE(waitUntil([&] { return destroyed.load(); }));
    server.run([&] { EXPECT_EQ(port, nullptr); });
}

TEST(LocalMessagePort, CreateOnANameInUseFailsAndTheLivePortKeepsWorking) {
    SystemLogCapture cap;
    Received received;
    ServerThread server;
    const std::string name = uniquePortName("inuse");
    LocalMessagePort* live = server.create(name, received.callback(bytesOf("live")));
    ASSERT_NE(live, nullptr);

    EXPECT_EQ(LocalMessagePort::create(name, nullptr), nullptr);
    EXPECT_TRUE(cap.contains(SystemLog::kError, "Message port " + name + ": the name is in use by a live port"));

    // The failed attempt neither removed the live port's name nor invalidated it.
    auto client = RemoteMessagePort::lookup(name, 1000);
    ASSERT_NE(client, nullptr);
    std::optional<Bytes> reply;
    EXPECT_EQ(client->sendRequest(0, bytesOf("?"), 1.0, 1.0, &reply), RemoteMessagePort::Success);
    EXPECT_EQ(reply, bytesOf("live"));
    ASSERT_TRUE(waitUntil([&] { return server.peerCount(live) == 1; }));  // the probe has gone
    EXPECT_TRUE(server.isValid(live));
}

TEST(LocalMessagePort, CreateReplacesAStaleSocketFileLeftByADeadProcess) {
    const std::string name = uniquePortName("stale");
    const QString path = QDir::tempPath() + "/" + QString::fromStdString(name);
    {
        QFile stale(path);
        ASSERT_TRUE(stale.open(QIODevice::WriteOnly));
        stale.write("left behind");
    }
    Received received;
    ServerThread server;
    LocalMessagePort* port = server.create(name, received.callback(bytesOf("fresh")));
    ASSERT_NE(port, nullptr);
    auto client = RemoteMessagePort::lookup(name, 1000);
    ASSERT_NE(client, nullptr);
    std::optional<Bytes> reply;
    EXPECT_EQ(client->sendRequest(0, {}, 1.0, 1.0, &reply), RemoteMessagePort::Success);
    EXPECT_EQ(reply, bytesOf("fresh"));
}

TEST(LocalMessagePort, BroadcastNotificationReachesEveryPeer) {
    Received received;
    ServerThread server;
    const std::string name = uniquePortName("broadcast");
    LocalMessagePort* port = server.create(name, received.callback());
    ASSERT_NE(port, nullptr);
    auto a = RemoteMessagePort::lookup(name, 1000);
    auto b = RemoteMessagePort::lookup(name, 1000);
    ASSERT_TRUE(a && b);
    std::vector<std::pair<int32_t, Bytes>> gotA, gotB;
    a->setNotificationCallback([&](int32_t id, const Bytes& data) { gotA.emplace_back(id, data); });
    b->setNotificationCallback([&](int32_t id, const Bytes& data) { gotB.emplace_back(id, data); });
    ASSERT_TRUE(waitUntil([&] { return server.peerCount(port) == 2; }));

    int queued = 0;
    const Bytes note = bytesOf("state");
    server.run([&] { queued = port->broadcastNotification(11, note); });
    EXPECT_EQ(queued, 2);
    ASSERT_TRUE(waitUntil([&] { return gotA.size() == 1 && gotB.size() == 1; }));
    EXPECT_EQ(gotA[0].first, 11);
    EXPECT_EQ(gotA[0].second, note);
    EXPECT_EQ(gotB[0].second, note);
}

TEST(LocalMessagePort, CreateOnAnEmptyNameFails) { EXPECT_EQ(LocalMessagePort::create("", nullptr), nullptr); }

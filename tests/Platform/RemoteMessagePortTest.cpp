// Tests for RemoteMessagePort: lookup, request statuses and timeouts, notifications through the event loop, streaming posts, invalidation (Parts 2.1, 2.2; docs/protocol.md).
#include "Platform/RemoteMessagePort.h"

#include "MessagePortTestHarness.h"
#include "Platform/LocalMessagePort.h"
#include "Platform/SystemLog.h"
#include "Platform/SystemLogCapture.h"

#include <QLocalServer>
#include <QLocalSocket>

#include <gtest/gtest.h>

#include <atomic>
#include <future>
#include <mutex>

using namespace vantorel;
using namespace vantorel::test;

namespace {

Bytes bytesOf(const std::string& s) { return Bytes(s.begin(), s.end()); }

}  // namespace

TEST(RemoteMessagePort, LookupOfANameNobodyListensOnGivesNull) {
    EXPECT_EQ(RemoteMessagePort::lookup(uniquePortName("nobody"), 200), nullptr);
    EXPECT_EQ(RemoteMessagePort::lookup("", 200), nullptr);
}

TEST(RemoteMessagePort, ReceiveTimeoutWhenTheServerNeverReplies) {
    // A bare server that accepts nothing and answers nothing.
    QLocalServer mute;
    const std::string name = uniquePortName("mute");
    ASSERT_TRUE(mute.listen(QString::fromStdString(name)));
    auto remote = RemoteMessagePort::lookup(name, 1000);
    ASSERT_NE(remote, nullptr);
    std::optional<Bytes> reply = bytesOf("old");
    EXPECT_EQ(remote->sendRequest(0, bytesOf("GetTechnology"), 1.0, 0.2, &reply), RemoteMessagePort::ReceiveTimeout);
    EXPECT_FALSE(reply.has_value());
    EXPECT_TRUE(remote->isValid());
}

TEST(RemoteMessagePort, AReplyThatArrivesAfterTheTimeoutIsNotTakenForTheNextRequest) {
    std::promise<void> release;
    std::shared_future<void> released = release.get_future().share();
    std::atomic<int> calls{0};
    ServerThread server;
    const std::string name = uniquePortName("late");
    ASSERT_NE(server.create(name,
                            [&](int32_t, const Bytes&) -> std::optional<Bytes> {
                                if (++calls == 1) {
                                    released.wait_for(std::chrono::seconds(2));
                                    return bytesOf("late");
                                }
                                return bytesOf("second");
                            }),
              nullptr);
    auto remote = RemoteMessagePort::lookup(name, 1000);
    ASSERT_NE(remote, nullptr);
    std::optional<Bytes> reply;
    EXPECT_EQ(remote->sendRequest(0, bytesOf("1"), 1.0, 0.1, &reply), RemoteMessagePort::ReceiveTimeout);
    release.set_value();
    server.run([] {});  // the server has written the late reply by now
    EXPECT_EQ(remote->sendRequest(0, bytesOf("2"), 1.0, 1.0, &reply), RemoteMessagePort::Success);
    EXPECT_EQ(reply, bytesOf("second"));
}

TEST(RemoteMessagePort, ARequestToAPortWhoseServerIsGoneFailsAndThePortBecomesInvalid) {
    std::atomic<int> invalidations{0};
    ServerThread server;
    const std::string name = uniquePortName("gone");
    LocalMessagePort* port = server.create(name, [](int32_t, const Bytes&) { return std::optional<Bytes>(); });
    ASSERT_NE(port, nullptr);
    auto remote = RemoteMessagePort::lookup(name, 1000);
    ASSERT_NE(remote, nullptr);
    remote->setInvalidationCallback([&](RemoteMessagePort* p) {
        EXPECT_EQ(p, remote.get());
        ++invalidations;
    });
    ASSERT_TRUE(waitUntil([&] { return server.peerCount(port) == 1; }));

    server.destroy(port);
    std::optional<Bytes> reply;
    EXPECT_EQ(remote->sendRequest(0, bytesOf("x"), 1.0, 1.0, &reply), RemoteMessagePort::BecameInvalidError);
    EXPECT_FALSE(remote->isValid());
    ASSERT_TRUE(waitUntil([&] { return invalidations.load() == 1; }));
    EXPECT_EQ(remote->sendRequest(0, bytesOf("x"), 1.0, 1.0, &reply), RemoteMessagePort::IsInvalid);
    EXPECT_EQ(remote->sendRequest(0, bytesOf("x"), 1.0, 0, nullptr), RemoteMessagePort::IsInvalid);
    EXPECT_FALSE(remote->post(0, bytesOf("x")));
    remote->invalidate();  // already invalid: no second call
    QCoreApplication::processEvents();
    EXPECT_EQ(invalidations.load(), 1);
}

TEST(RemoteMessagePort, APeerThatClosesInvalidatesThePortThroughTheEventLoop) {
    std::atomic<int> invalidations{0};
    ServerThread server;
    const std::string name = uniquePortName("peerclose");
    LocalMessagePort* port = server.create(name, [](int32_t, const Bytes&) { return std::optional<Bytes>(); });
    ASSERT_NE(port, nullptr);
    auto remote = RemoteMessagePort::lookup(name, 1000);
    ASSERT_NE(remote, nullptr);
    remote->setInvalidationCallback([&](RemoteMessagePort*) { ++invalidations; });
    ASSERT_TRUE(waitUntil([&] { return server.peerCount(port) == 1; }));
    server.run([&] { port->invalidate(); });
    ASSERT_TRUE(waitUntil([&] { return invalidations.load() == 1; }));
    EXPECT_FALSE(remote->isValid());
}

TEST(RemoteMessagePort, InvalidateOnPurposeCallsTheCallbackOnceAndClosesTheConnection) {
    std::atomic<int> received{0};
    ServerThread server;
    const std::string name = uniquePortName("purpose");
    LocalMessagePort* port = server.create(name, [&](int32_t, const Bytes&) {
        ++received;
        return std::optional<Bytes>();
    });
    ASSERT_NE(port, nullptr);
    auto remote = RemoteMessagePort::lookup(name, 1000);
    ASSERT_NE(remote, nullptr);
    int invalidations = 0;
    remote->setInvalidationCallback([&](RemoteMessagePort*) { ++invalidations; });
    ASSERT_EQ(remote->sendRequest(0, bytesOf("m"), 1.0, 0, nullptr), RemoteMessagePort::Success);
    ASSERT_TRUE(waitUntil([&] { return received.load() == 1; }));

    remote->invalidate();
    EXPECT_EQ(invalidations, 1);
    remote->invalidate();
    QCoreApplication::processEvents();
    EXPECT_EQ(invalidations, 1);
    EXPECT_FALSE(remote->isValid());
    // The server saw its only (counted) peer go and invalidated itself.
    EXPECT_TRUE(waitUntil([&] { return !server.isValid(port); }));
}

TEST(RemoteMessagePort, InvalidateWithTheCallbackClearedCallsNothing) {
    QLocalServer bare;
    const std::string name = uniquePortName("remotecleared");
    ASSERT_TRUE(bare.listen(QString::fromStdString(name)));
    auto remote = RemoteMessagePort::lookup(name, 1000);
    ASSERT_NE(remote, nullptr);
    int invalidations = 0;
    remote->setInvalidationCallback([&](RemoteMessagePort*) { ++invalidations; });
    remote->setInvalidationCallback(nullptr);
    remote->invalidate();
    QCoreApplication::processEvents();
    EXPECT_EQ(invalidations, 0);
    EXPECT_FALSE(remote->isValid());
}

TEST(RemoteMessagePort, NotificationsAreDeliveredFromTheEventLoopNeverInsideSendRequest) {
    LocalMessagePort* port = nullptr;
    ServerThread server;
    const std::string name = uniquePortName("notify");
    // The server pushes a notification before it answers, so it arrives during the wait.
    port = server.create(name, [&](int32_t, const Bytes&) -> std::optional<Bytes> {
        port->broadcastNotification(5, bytesOf("note"));
        return bytesOf("reply");
    });
    ASSERT_NE(port, nullptr);
    auto remote = RemoteMessagePort::lookup(name, 1000);
    ASSERT_NE(remote, nullptr);
    std::vector<std::pair<int32_t, Bytes>> notes;
    remote->setNotificationCallback([&](int32_t id, const Bytes& data) { notes.emplace_back(id, data); });

    std::optional<Bytes> reply;
    ASSERT_EQ(remote->sendRequest(0, bytesOf("q"), 1.0, 1.0, &reply), RemoteMessagePort::Success);
    EXPECT_EQ(reply, bytesOf("reply"));
    EXPECT_TRUE(notes.empty());
    ASSERT_TRUE(waitUntil([&] { return notes.size() == 1; }));
    EXPECT_EQ(notes[0].first, 5);
    EXPECT_EQ(notes[0].second, bytesOf("note"));
}

TEST(RemoteMessagePort, PostStreamsMessagesInOrderAndSignalsDrained) {
    std::mutex mutex;
    std::vector<int32_t> ids;
    ServerThread server;
    const std::string name = uniquePortName("post");
    ASSERT_NE(server.create(name,
                            [&](int32_t id, const Bytes& data) -> std::optional<Bytes> {
                                std::lock_guard<std::mutex> lock(mutex);
                                if (data.size() == 1000) ids.push_back(id);
                                return std::nullopt;
                            }),
              nullptr);
    auto remote = RemoteMessagePort::lookup(name, 1000);
    ASSERT_NE(remote, nullptr);
    int drained = 0;
    QObject::connect(remote.get(), &RemoteMessagePort::drained, [&] { ++drained; });
    const Bytes record(1000, 0x7E);
    for (int32_t i = 0; i < 300; ++i) ASSERT_TRUE(remote->post(i, record));
    ASSERT_TRUE(waitUntil([&] {
        std::lock_guard<std::mutex> lock(mutex);
        return ids.size() == 300 && drained > 0;
    }));
    EXPECT_EQ(remote->bytesPending(), 0);
    std::lock_guard<std::mutex> lock(mutex);
    for (int32_t i = 0; i < 300; ++i) EXPECT_EQ(ids[static_cast<size_t>(i)], i);
}

TEST(RemoteMessagePort, GarbageFromTheServerIsATransportErrorAndClosesThePort) {
    SystemLogCapture cap;
    QLocalServer bare;
    const std::string name = uniquePortName("badserver");
    ASSERT_TRUE(bare.listen(QString::fromStdString(name)));
    auto remote = RemoteMessagePort::lookup(name, 1000);
    ASSERT_NE(remote, nullptr);
    int invalidations = 0;
    remote->setInvalidationCallback([&](RemoteMessagePort*) { ++invalidations; });
    ASSERT_TRUE(bare.waitForNewConnection(1000));
    QLocalSocket* peer = bare.nextPendingConnection();
    ASSERT_NE(peer, nullptr);
    const char garbage[] = {2, 7, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0};  // version 7
    peer->write(garbage, sizeof garbage);
    ASSERT_TRUE(peer->waitForBytesWritten(1000));

    std::optional<Bytes> reply;
    EXPECT_EQ(remote->sendRequest(0, bytesOf("q"), 1.0, 1.0, &reply), RemoteMessagePort::TransportError);
    EXPECT_FALSE(remote->isValid());
    EXPECT_TRUE(cap.contains(SystemLog::kError, "Message port " + name +
                                                    ": malformed frame from the remote port (unsupported frame "
                                                    "version 7); connection closed"));
    ASSERT_TRUE(waitUntil([&] { return invalidations == 1; }));
}

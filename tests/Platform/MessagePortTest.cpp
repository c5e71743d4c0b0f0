// Tests the message ports: the 12-byte frame header and stream decoding with bad headers, and a local port served on its own thread answering a remote port (replies, timeouts, garbage peers, a stale socket file).
#include "Platform/LocalMessagePort.h"
#include "Platform/MessagePortFrame.h"
#include "Platform/PortDirectory.h"
#include "Platform/RemoteMessagePort.h"
#include "support/EventLoopWait.h"

#include <QFile>
#include <QLocalSocket>
#include <QThread>
#include <gtest/gtest.h>

#include <atomic>
#include <future>
#include <memory>
#include <string>
#include <vector>

namespace vantorel {
namespace {

using testing::uniquePortName;
using testing::waitUntil;
using Kind = MessagePortFrame::Kind;

Bytes bytesOf(const std::string& s) { return Bytes(s.begin(), s.end()); }

// A bare header: kind, version, reserved, id 0, length.
Bytes header(uint8_t kind, uint8_t version, uint32_t length) {
    Bytes h{kind, version, 0, 0, 0, 0, 0, 0};
    for (int i = 0; i < 4; ++i) h.push_back(static_cast<uint8_t>(length >> (8 * i)));
    return h;
}

TEST(MessagePortFrame, HeaderIsKindVersionReservedIdLengthLittleEndian) {
    EXPECT_EQ((MessagePortFrame{Kind::Request, -2, {0xAA, 0xBB, 0xCC}}.encode()),
              (Bytes{0x01, 0x01, 0x00, 0x00, 0xFE, 0xFF, 0xFF, 0xFF, 0x03, 0x00, 0x00, 0x00, 0xAA, 0xBB, 0xCC}));
}

TEST(MessagePortFrame, StreamsDecodeTheSameHoweverTheyAreSplit) {
    const MessagePortFrame request{Kind::Request, 1000003, bytesOf("GetTechnology")};
    const MessagePortFrame empty{Kind::Notification, 0, {}};
    const MessagePortFrame reply{Kind::Reply, -1, Bytes(300, 0x7E)};
    auto cat = [](Bytes a, const Bytes& b) {
        a.insert(a.end(), b.begin(), b.end());
        return a;
    };
    struct Row {
        const char* name;
        Bytes stream;
        std::vector<MessagePortFrame> frames;
        std::string error;
        size_t buffered = 0;
    };
    const std::vector<Row> rows = {
        {"three frames", cat(cat(request.encode(), empty.encode()), reply.encode()), {request, empty, reply}, ""},
        {"reserved bytes ignored", [&] { Bytes b = request.encode(); b[2] = b[3] = 0xFF; return b; }(), {request}, ""},
        {"incomplete header waits", Bytes{9, 9, 9}, {}, "", 3},
        {"length at the limit waits for its data", header(0, 1, MessagePortFrame::kMaxDataLength), {}, "", 12},
        {"unknown kind", cat(request.encode(), header(4, 1, 0)), {request}, "unknown frame kind 4"},
        {"other version", cat(request.encode(), header(1, 2, 0)), {request}, "unsupported frame version 2"},
        {"length over the limit", header(0, 1, MessagePortFrame::kMaxDataLength + 1), {},
         "frame length 16777217 over the limit of 16777216 bytes"},
    };
    for (const Row& row : rows) {
        SCOPED_TRACE(row.name);
        const ByteView all(row.stream);
        for (size_t cut = 0; cut <= all.size(); cut += (cut < 40 ? 1 : 97)) {
            MessagePortFrameDecoder decoder;
            std::vector<MessagePortFrame> frames = decoder.feed(all.first(cut));
            for (MessagePortFrame& f : decoder.feed(all.subspan(cut))) frames.push_back(std::move(f));
            ASSERT_EQ(frames.size(), row.frames.size()) << "cut at " << cut;
            for (size_t i = 0; i < frames.size(); ++i)
                EXPECT_TRUE(frames[i].kind == row.frames[i].kind && frames[i].messageId == row.frames[i].messageId &&
                            frames[i].data == row.frames[i].data) << i;
            ASSERT_EQ(decoder.error(), row.error) << "cut at " << cut;
            EXPECT_EQ(decoder.buffered(), row.buffered);
            if (decoder.failed()) { EXPECT_TRUE(decoder.feed(request.encode()).empty()); }
        }
    }
}

// Blocking requests on the test thread need the local port served by another thread's event loop.
class ServerThread {
public:
    ServerThread() {
        thread_.start();
        context_->moveToThread(&thread_);
    }
    ~ServerThread() {
        run([this] { port_.reset(); });
        thread_.quit();
        thread_.wait();
    }
    void run(const std::function<void()>& f) { QMetaObject::invokeMethod(context_.get(), f, Qt::BlockingQueuedConnection); }
    LocalMessagePort* create(const std::string& name, LocalMessagePort::ReceiveCallback callback) {
        run([&] { port_ = LocalMessagePort::create(name, std::move(callback)); });
        return port_.get();
    }

private:
    QThread thread_;
    std::unique_ptr<QObject> context_ = std::make_unique<QObject>();
    std::unique_ptr<LocalMessagePort> port_;  // made and destroyed on the server thread
};

TEST(MessagePort, APortTakesOverAStaleSocketFileAnswersRequestsAndClosesAGarbagePeerWhileOthersGoOn) {
    const std::string name = uniquePortName("port");
    QFile stale(QString::fromStdString(PortDirectory::socketPathFor(name, nullptr)));
    ASSERT_TRUE(stale.open(QIODevice::WriteOnly));
    stale.write("left behind by a dead process");
    stale.close();
    std::atomic<int> messages{0};
    ServerThread server;
    LocalMessagePort* port = server.create(name, [&](int32_t id, const Bytes& data) -> std::optional<Bytes> {
        ++messages;
        return bytesOf(std::to_string(id) + ":" + std::string(data.begin(), data.end()));
    });
    ASSERT_NE(port, nullptr);
    EXPECT_EQ(LocalMessagePort::create(name, {}), nullptr);  // but not a live port
    EXPECT_EQ(LocalMessagePort::create("", {}), nullptr);
    EXPECT_EQ(LocalMessagePort::create("/nonexistent-vantorel-dir/port", {}), nullptr);  // cannot listen
    auto remote = RemoteMessagePort::lookup(name);
    ASSERT_NE(remote, nullptr);
    std::optional<Bytes> reply;
    ASSERT_EQ(remote->sendRequest(7, bytesOf("q"), 1.0, 1.0, &reply), RemoteMessagePort::Success);
    EXPECT_EQ(reply, bytesOf("7:q"));

    QLocalSocket bad;
    bad.connectToServer(stale.fileName());  // the socket the port took over
    ASSERT_TRUE(bad.waitForConnected(1000));
    const Bytes garbage = header(9, 1, 2);
    bad.write(reinterpret_cast<const char*>(garbage.data()), static_cast<qint64>(garbage.size()));
    ASSERT_TRUE(bad.waitForBytesWritten(1000));
    EXPECT_TRUE(bad.state() == QLocalSocket::UnconnectedState || bad.waitForDisconnected(1000));
    uint64_t malformed = 0;
    server.run([&] { malformed = port->malformedFrames(); });
    EXPECT_EQ(malformed, 1u);

    ASSERT_EQ(remote->sendRequest(8, bytesOf("r"), 1.0, 1.0, &reply), RemoteMessagePort::Success);
    EXPECT_EQ(reply, bytesOf("8:r"));
    EXPECT_EQ(messages.load(), 2);
}

TEST(MessagePort, AReplyThatComesAfterTheTimeoutIsNotTakenForTheNextRequest) {
    std::promise<void> release;
    std::shared_future<void> released = release.get_future().share();
    std::atomic<int> calls{0};
    ServerThread server;
    const std::string name = uniquePortName("late");
    ASSERT_NE(server.create(name,
                            [&](int32_t, const Bytes&) -> std::optional<Bytes> {
                                if (++calls == 1) released.wait_for(std::chrono::seconds(2));
                                return bytesOf(std::to_string(calls.load()));
                            }),
              nullptr);
    auto remote = RemoteMessagePort::lookup(name);
    ASSERT_NE(remote, nullptr);
    std::optional<Bytes> reply;
    EXPECT_EQ(remote->sendRequest(0, bytesOf("1"), 1.0, 0.1, &reply), RemoteMessagePort::ReceiveTimeout);
    EXPECT_FALSE(reply);
    release.set_value();
    server.run([] {});  // the late reply is written by now
    EXPECT_EQ(remote->sendRequest(0, bytesOf("2"), 1.0, 1.0, &reply), RemoteMessagePort::Success);
    EXPECT_EQ(reply, bytesOf("2"));
}

}  // namespace
}  // namespace vantorel

// RemoteMessagePort: a remote message port on a QLocalSocket: blocking requests with send/receive timeouts, streaming posts, notifications, invalidation (docs/protocol.md).
#include "Platform/RemoteMessagePort.h"

#include "Platform/MessagePortFrame.h"
#include "Platform/PeerCredentials.h"
#include "Platform/PortDirectory.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"

#include <QDeadlineTimer>
#include <QLocalSocket>
#include <QPointer>

#include <algorithm>
#include <climits>
#include <cmath>
#include <deque>
#include <utility>

namespace vantorel {

namespace {

qint64 toMilliseconds(double seconds) {
    if (!(seconds > 0)) return 0;  // also NaN
    return static_cast<qint64>(std::min(std::llround(seconds * 1000.0), static_cast<long long>(INT_MAX)));
}

int remainingMs(const QDeadlineTimer& deadline) {
    return static_cast<int>(std::clamp<qint64>(deadline.remainingTime(), 0, INT_MAX));
}

}  // namespace

struct RemoteMessagePort::Impl {
    MessagePortFrameDecoder decoder;
    std::deque<std::pair<int32_t, Bytes>> pending;  // notifications not yet delivered
    bool deliveryScheduled = false;
    bool drainPending = false;  // bytes were queued since drained() was last emitted
};

RemoteMessagePort::RemoteMessagePort(std::string name) : name_(std::move(name)), impl_(std::make_unique<Impl>()) {}

RemoteMessagePort::~RemoteMessagePort() {
    // Releasing is not invalidating: no callback.
    if (socket_) disconnect(socket_, nullptr, this, nullptr);
}

std::unique_ptr<RemoteMessagePort> RemoteMessagePort::lookup(const std::string& name, int timeoutMs,
                                                             std::optional<gid_t> allowedGroup) {
    if (name.empty()) return nullptr;
    std::string refused;
    const std::string path = PortDirectory::socketPathFor(name, &refused);
    if (path.empty()) {
        SystemLog::log(SystemLog::kError, "Message port %s: %s", name.c_str(), refused.c_str());
        return nullptr;
    }
    std::unique_ptr<RemoteMessagePort> port(new RemoteMessagePort(name));
    RemoteMessagePort* p = port.get();
    p->socket_ = new QLocalSocket(p);
    p->socket_->connectToServer(QString::fromStdString(path));
    if (!p->socket_->waitForConnected(std::max(0, timeoutMs))) return nullptr;
    // The listening process, as the kernel recorded it: a port another user made under
    // the name (a shared directory, an absolute path) is not ours to read.
    const std::optional<PeerCredentials> server = PeerCredentials::of(p->socket_->socketDescriptor());
    if (!server || !server->accepted(allowedGroup)) {
        SystemLog::log(SystemLog::kError, "Message port %s is served by %s, not by this user; not connected", name.c_str(),
                       server ? PeerCredentials::describeUser(server->uid).c_str() : "an unknown user");
        return nullptr;
    }
    // Queued, so that callbacks run from the event loop and never inside the
    // socket's own signal emission or inside sendRequest().
    // What a peer's frames may buffer is bounded as on a local port (MessagePortFrameDecoder);
    // Qt reads no more than this ahead of pump().
    p->socket_->setReadBufferSize(kReadChunkBytes);
    connect(p->socket_, &QLocalSocket::readyRead, p, [p] { p->readAvailable(); }, Qt::QueuedConnection);
    connect(p->socket_, &QLocalSocket::disconnected, p, [p] { p->peerClosed(); }, Qt::QueuedConnection);
    connect(p->socket_, &QLocalSocket::bytesWritten, p, [p] { p->checkDrained(); }, Qt::QueuedConnection);
    return port;
}

bool RemoteMessagePort::isValid() const {
    return !invalidated_ && socket_ && socket_->state() == QLocalSocket::ConnectedState;
}

std::string RemoteMessagePort::socketPath() const { return socket_ ? socket_->fullServerName().toStdString() : ""; }

void RemoteMessagePort::setInvalidationCallback(InvalidationCallback callback) { invalidation_ = std::move(callback); }

void RemoteMessagePort::setNotificationCallback(NotificationCallback callback) { notification_ = std::move(callback); }

int64_t RemoteMessagePort::bytesPending() const { return socket_ ? socket_->bytesToWrite() : 0; }

bool RemoteMessagePort::pump(std::optional<Bytes>* reply, bool* gotReply) {
    // Only what is there: reading a socket that a failed write closed underneath makes Qt complain.
    while (socket_ && !invalidated_ && socket_->bytesAvailable() > 0) {
        const size_t admitted = impl_->decoder.admit(static_cast<size_t>(std::min<qint64>(socket_->bytesAvailable(), kReadChunkBytes)));
        if (admitted == 0) {
            closeBroken("a frame over the buffer limit",
                        StringFormat::format("%zu bytes held, %zu of the pool of %zu lent", impl_->decoder.buffered(),
                                             MessagePortFrameDecoder::pooledBytes(), MessagePortFrameDecoder::kPoolBytes));
            return false;
        }
        const QByteArray chunk = socket_->read(static_cast<qint64>(admitted));
        if (!take(impl_->decoder.feed(ByteView(reinterpret_cast<const uint8_t*>(chunk.constData()),
                                               static_cast<size_t>(chunk.size()))),
                  reply, gotReply))
            return false;
    }
    return true;
}

bool RemoteMessagePort::take(const std::vector<MessagePortFrame>& frames, std::optional<Bytes>* reply, bool* gotReply) {
    for (const MessagePortFrame& frame : frames) {
        switch (frame.kind) {
        case MessagePortFrame::Kind::Reply:
            // Any id answers the request in flight; a reply with no request in
            // flight belongs to one that timed out and is dropped.
            if (reply && gotReply && !*gotReply) {
                *reply = frame.data;
                *gotReply = true;
            }
            break;
        case MessagePortFrame::Kind::Notification:
            // Notifications only tell the client to look again: of a flood (one that
            // comes while a request waits), the newest kMaxPendingNotifications are kept.
            if (impl_->pending.size() >= kMaxPendingNotifications) impl_->pending.pop_front();
            impl_->pending.emplace_back(frame.messageId, frame.data);
            scheduleDelivery();
            break;
        case MessagePortFrame::Kind::Message:
        case MessagePortFrame::Kind::Request:
            break;  // a remote port is not a receiver: ignored
        }
    }
    if (impl_->decoder.failed()) {
        closeBroken("malformed frame", impl_->decoder.error());
        return false;
    }
    return true;
}

void RemoteMessagePort::closeBroken(const char* what, const std::string& why) {
    SystemLog::log(SystemLog::kError, "Message port %s: %s from the remote port (%s); connection closed", name_.c_str(),
                   what, why.c_str());
    disconnect(socket_, nullptr, this, nullptr);
    socket_->abort();
    // The invalidation callback runs from the event loop, as for a peer that closed.
    QMetaObject::invokeMethod(this, [this] { peerClosed(); }, Qt::QueuedConnection);
}

int32_t RemoteMessagePort::sendRequest(int32_t messageId, ByteView data, double sendTimeout, double receiveTimeout,
                                       std::optional<Bytes>* reply) {
    if (!isValid()) return IsInvalid;
    // What arrived before this request (also what the kernel holds and the event
    // loop has not read yet): notifications are kept, replies are stale.
    if (socket_->bytesAvailable() <= 0) socket_->waitForReadyRead(0);
    if (!pump(nullptr, nullptr)) return TransportError;
    if (socket_->state() != QLocalSocket::ConnectedState) return BecameInvalidError;

    MessagePortFrame frame;
    frame.kind = reply ? MessagePortFrame::Kind::Request : MessagePortFrame::Kind::Message;
    frame.messageId = messageId;
    frame.data.assign(data.begin(), data.end());
    const Bytes bytes = frame.encode();
    const qint64 written = socket_->write(reinterpret_cast<const char*>(bytes.data()), static_cast<qint64>(bytes.size()));
    if (written != static_cast<qint64>(bytes.size())) {
        return socket_->state() == QLocalSocket::ConnectedState ? TransportError : BecameInvalidError;
    }
    impl_->drainPending = true;

    const QDeadlineTimer sendDeadline(toMilliseconds(sendTimeout));
    socket_->flush();
    while (socket_->bytesToWrite() > 0) {
        if (socket_->state() != QLocalSocket::ConnectedState) return BecameInvalidError;
        if (sendDeadline.hasExpired()) return SendTimeout;
        socket_->waitForBytesWritten(remainingMs(sendDeadline));
    }
    if (!reply) return Success;

    reply->reset();
    bool gotReply = false;
    const QDeadlineTimer receiveDeadline(toMilliseconds(receiveTimeout));
    while (true) {
        if (!pump(reply, &gotReply)) return TransportError;
        if (gotReply) return Success;
        if (socket_->state() != QLocalSocket::ConnectedState) return BecameInvalidError;
        if (receiveDeadline.hasExpired()) return ReceiveTimeout;
        socket_->waitForReadyRead(remainingMs(receiveDeadline));
    }
}

bool RemoteMessagePort::post(int32_t messageId, ByteView data) {
    if (!isValid()) return false;
    MessagePortFrame frame;
    frame.kind = MessagePortFrame::Kind::Message;
    frame.messageId = messageId;
    frame.data.assign(data.begin(), data.end());
    const Bytes bytes = frame.encode();
    const qint64 written = socket_->write(reinterpret_cast<const char*>(bytes.data()), static_cast<qint64>(bytes.size()));
    if (written != static_cast<qint64>(bytes.size())) return false;
    impl_->drainPending = true;
    socket_->flush();  // non-blocking: what the socket does not take now, the event loop writes
    return true;
}

void RemoteMessagePort::checkDrained() {
    if (!impl_->drainPending || !socket_ || socket_->bytesToWrite() != 0) return;
    impl_->drainPending = false;
    emit drained();
}

void RemoteMessagePort::readAvailable() {
    if (invalidated_) return;
    pump(nullptr, nullptr);
}

void RemoteMessagePort::scheduleDelivery() {
    if (impl_->deliveryScheduled) return;
    impl_->deliveryScheduled = true;
    QMetaObject::invokeMethod(this, [this] { deliverPending(); }, Qt::QueuedConnection);
}

void RemoteMessagePort::deliverPending() {
    impl_->deliveryScheduled = false;
    // The callback may send requests (which queue more notifications) or delete the port.
    QPointer<RemoteMessagePort> self(this);
    while (self && !impl_->pending.empty()) {
        std::pair<int32_t, Bytes> item = std::move(impl_->pending.front());
        impl_->pending.pop_front();
        if (NotificationCallback callback = notification_) callback(item.first, item.second);
    }
}

void RemoteMessagePort::peerClosed() {
    if (invalidated_) return;
    invalidated_ = true;
    if (InvalidationCallback callback = invalidation_) callback(this);
}

void RemoteMessagePort::invalidate() {
    if (invalidated_) return;
    invalidated_ = true;
    impl_->pending.clear();
    if (socket_) {
        disconnect(socket_, nullptr, this, nullptr);
        socket_->abort();
    }
    // A copy: the callback may clear it or delete the port.
    if (InvalidationCallback callback = invalidation_) callback(this);
}

}  // namespace vantorel

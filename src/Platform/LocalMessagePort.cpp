// LocalMessagePort: a named local message port on a QLocalServer in the user's runtime directory: frames in from this user's peers, replies and notifications out, invalidation (docs/protocol.md).
#include "Platform/LocalMessagePort.h"

#include "Platform/MessagePortFrame.h"
#include "Platform/PeerCredentials.h"
#include "Platform/PortDirectory.h"
#include "Platform/StringFormat.h"
#include "Platform/SystemLog.h"

#include <QFileInfo>
#include <QLocalServer>
#include <QLocalSocket>
#include <QPointer>

#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>

namespace vantorel {

namespace {

// How long create() waits for a port already listening under the name to answer.
// A live server accepts at once (the kernel queues the connection); a stale socket
// file refuses at once, so this only bounds a pathological case.
constexpr int kProbeTimeoutMs = 500;

ByteView viewOf(const QByteArray& bytes) {
    return ByteView(reinterpret_cast<const uint8_t*>(bytes.constData()), static_cast<size_t>(bytes.size()));
}

}  // namespace

// One connected peer and the decoder of its byte stream.
struct LocalMessagePort::Peer {
    QLocalSocket* socket = nullptr;  // a child of the port, deleted by closePeer()
    MessagePortFrameDecoder decoder;
};

LocalMessagePort::LocalMessagePort(std::string name, ReceiveCallback callback)
    : name_(std::move(name)), callback_(std::move(callback)) {}

LocalMessagePort::~LocalMessagePort() {
    // Destruction is not invalidation: the callback is not called (like releasing a port).
    valid_ = false;
    while (!peers_.empty()) closePeer(peers_.back()->socket);
    if (server_) server_->close();
}

std::unique_ptr<LocalMessagePort> LocalMessagePort::create(const std::string& name, ReceiveCallback callback,
                                                           CreateFailure* failure) {
    std::unique_ptr<LocalMessagePort> port(new LocalMessagePort(name, std::move(callback)));
    CreateFailure ignored;
    if (!port->listen(failure ? failure : &ignored)) return nullptr;
    return port;
}

bool LocalMessagePort::listen(CreateFailure* failure) {
    auto invalid = [&](const std::string& why) {
        failure->nameInUse = false;
        failure->reason = StringFormat::format("not a valid port name: %s (%s)", name_.c_str(), why.c_str());
        SystemLog::log(SystemLog::kError, "Message port: %s", failure->reason.c_str());
        return false;
    };
    // Another user's socket or directory: neither taken over nor listened beside.
    auto foreign = [&](const std::string& why) {
        failure->nameInUse = false;
        failure->foreign = true;
        failure->reason = why;
        SystemLog::log(SystemLog::kError, "Message port %s: %s", name_.c_str(), why.c_str());
        return false;
    };
    if (name_.empty()) return invalid("empty");
    if (name_.find('\0') != std::string::npos) return invalid("it holds a NUL character");
    // A name is a bare name in the runtime directory or an absolute socket path.
    const bool absolute = name_.front() == '/';
    if (!absolute && name_.find('/') != std::string::npos)
        return invalid("a name with a slash must be an absolute path");
    std::string refused;
    const std::string path = PortDirectory::socketPathFor(name_, &refused);
    if (path.empty()) return foreign(refused);
    server_ = new QLocalServer(this);
    const QString serverName = QString::fromStdString(path);
    const QFileInfo directory(QFileInfo(serverName).absolutePath());
    if (!directory.isDir())
        return invalid(StringFormat::format("the directory %s does not exist", directory.filePath().toStdString().c_str()));
    if (absolute) {
        refused = PortDirectory::foreignDirectory(directory.filePath().toStdString());
        if (!refused.empty()) return foreign(refused);
    }
    if (path.size() >= sizeof(sockaddr_un::sun_path)) return invalid("too long for a socket path");
    struct stat st {};
    const bool exists = ::lstat(path.c_str(), &st) == 0;
    // Under an absolute path only a socket file may be taken over: anything else there is
    // someone's file, not a port. (The runtime directory holds nothing but ours.)
    if (exists && absolute && !S_ISSOCK(st.st_mode)) return invalid("a file that is not a socket is there");
    if (exists && st.st_uid != ::geteuid())
        return foreign(StringFormat::format("the socket %s belongs to %s, not to this user", path.c_str(),
                                            PeerCredentials::describeUser(st.st_uid).c_str()));
    if (!server_->listen(serverName)) {
        if (server_->serverError() != QAbstractSocket::AddressInUseError)
            return invalid("no socket can be made there: " +
                           server_->errorString().remove(QStringLiteral("QLocalServer::listen: ")).toStdString());
        // The name is taken: by a live port (then this one cannot exist) or by a file
        // that a dead process left behind (then it is removed).
        QLocalSocket probe;
        probe.connectToServer(serverName);
        const bool live = probe.waitForConnected(kProbeTimeoutMs);
        probe.abort();
        if (live) {
            failure->nameInUse = true;
            failure->reason = "the name is in use by a live port";
            SystemLog::log(SystemLog::kError, "Message port %s: the name is in use by a live port", name_.c_str());
            return false;
        }
        QLocalServer::removeServer(serverName);
        if (!server_->listen(serverName)) return invalid(server_->errorString().toStdString());
    }
    connect(server_, &QLocalServer::newConnection, this, &LocalMessagePort::acceptPeers);
    return true;
}

bool LocalMessagePort::shareWithGroup(gid_t group, std::string* error) {
    const std::string path = socketPath();
    // Read and write for the group: connecting to a Unix socket takes write permission.
    // lchown, and chmod only on what lstat shows is our socket: a link put in its place is
    // never followed (the directory itself may not be writable by others: foreignDirectory).
    struct stat st {};
    const bool ours = !path.empty() && ::lstat(path.c_str(), &st) == 0 && S_ISSOCK(st.st_mode) && st.st_uid == ::geteuid();
    if (!ours) errno = EPERM;
    if (!ours || ::lchown(path.c_str(), static_cast<uid_t>(-1), group) != 0 || ::chmod(path.c_str(), 0660) != 0) {
        if (error)
            *error = StringFormat::format("cannot give the socket %s to group %u: %s", path.c_str(),
                                          static_cast<unsigned>(group), std::strerror(errno));
        return false;
    }
    allowedGroup_ = group;
    return true;
}

void LocalMessagePort::setInvalidationCallback(InvalidationCallback callback) { invalidation_ = std::move(callback); }

std::string LocalMessagePort::socketPath() const { return server_ ? server_->fullServerName().toStdString() : ""; }

void LocalMessagePort::acceptPeers() {
    while (server_ && server_->hasPendingConnections()) {
        QLocalSocket* socket = server_->nextPendingConnection();
        if (!socket) break;
        socket->setParent(this);
        // Who connected is known from the socket itself, whatever the file's permissions.
        const std::optional<PeerCredentials> credentials = PeerCredentials::of(socket->socketDescriptor());
        if (!credentials || !credentials->accepted(allowedGroup_)) {
            ++foreign_;
            SystemLog::log(SystemLog::kWarning, "Message port %s: a connection from %s refused: not this user's",
                           name_.c_str(),
                           credentials ? PeerCredentials::describeUser(credentials->uid).c_str() : "an unknown user");
            socket->abort();
            delete socket;
            continue;
        }
        if (static_cast<int>(peers_.size()) >= maxPeers_) {
            ++refused_;
            SystemLog::log(SystemLog::kWarning, "Message port %s: %d peers connected already; a new connection refused",
                           name_.c_str(), maxPeers_);
            socket->abort();
            delete socket;
            continue;
        }
        // Qt reads no more than this ahead of readPeer(); the kernel holds the rest back.
        socket->setReadBufferSize(kReadChunkBytes);
        hadConnection_ = true;
        auto peer = std::make_unique<Peer>();
        peer->socket = socket;
        peers_.push_back(std::move(peer));
        // Queued, so that a callback may close the peer or delete the port without
        // the socket being inside its own signal emission at that moment.
        QPointer<QLocalSocket> guard(socket);
        connect(
            socket, &QLocalSocket::readyRead, this,
            [this, guard] {
                if (guard) readPeer(guard);
            },
            Qt::QueuedConnection);
        connect(
            socket, &QLocalSocket::disconnected, this,
            [this, guard] {
                if (guard) peerGone(guard);
            },
            Qt::QueuedConnection);
    }
}

LocalMessagePort::Peer* LocalMessagePort::findPeer(QLocalSocket* socket) const {
    for (const auto& peer : peers_) {
        if (peer->socket == socket) return peer.get();
    }
    return nullptr;
}

void LocalMessagePort::closePeer(QLocalSocket* socket) {
    auto it = std::find_if(peers_.begin(), peers_.end(), [socket](const auto& p) { return p->socket == socket; });
    if (it == peers_.end()) return;
    peers_.erase(it);
    disconnect(socket, nullptr, this, nullptr);
    socket->abort();
    delete socket;
}

void LocalMessagePort::closeOverLimit(QLocalSocket* socket, const std::string& why) {
    ++overLimit_;
    SystemLog::log(SystemLog::kError, "Message port %s: a peer %s; connection closed", name_.c_str(), why.c_str());
    closePeer(socket);
    invalidateIfDeserted();
}

bool LocalMessagePort::writeFrame(QLocalSocket* socket, const Bytes& frame) {
    // A peer that left may already be closed underneath (a failed write aborts the
    // socket): nothing to write to, but it is not closed here.
    if (socket->state() != QLocalSocket::ConnectedState) return true;
    if (socket->bytesToWrite() > kMaxUnsentBytes) {
        closeOverLimit(socket, StringFormat::format("leaves %lld bytes unread", static_cast<long long>(socket->bytesToWrite())));
        return false;
    }
    socket->write(reinterpret_cast<const char*>(frame.data()), static_cast<qint64>(frame.size()));
    socket->flush();  // non-blocking: writes what the socket takes now, the event loop the rest
    return true;
}

void LocalMessagePort::readPeer(QLocalSocket* socket) {
    Peer* peer = findPeer(socket);
    // Only what is there: reading a socket that a failed write closed underneath makes Qt complain.
    const qint64 available = peer && valid_ ? socket->bytesAvailable() : 0;
    if (available <= 0) return;
    const size_t admitted = peer->decoder.admit(static_cast<size_t>(std::min<qint64>(available, kReadChunkBytes)));
    if (admitted == 0) {
        closeOverLimit(socket, StringFormat::format("sends a frame over the buffer limit (%zu bytes held, %zu of the "
                                                    "pool of %zu lent)", peer->decoder.buffered(),
                                                    MessagePortFrameDecoder::pooledBytes(),
                                                    MessagePortFrameDecoder::kPoolBytes));
        return;
    }
    const QByteArray chunk = socket->read(static_cast<qint64>(admitted));
    const std::vector<MessagePortFrame> frames = peer->decoder.feed(viewOf(chunk));
    const bool malformed = peer->decoder.failed();
    const std::string reason = peer->decoder.error();
    if (!frames.empty()) hadPeer_ = true;

    // Callbacks may invalidate or delete the port, or close this peer: re-check
    // after each one and touch nothing that may be gone.
    QPointer<LocalMessagePort> self(this);
    QPointer<QLocalSocket> guard(socket);
    // Qt signals readyRead only for new bytes: what is left is read on the next turn.
    if (!malformed && socket->bytesAvailable() > 0) {
        QMetaObject::invokeMethod(
            this, [this, guard] { if (guard) readPeer(guard); }, Qt::QueuedConnection);
    }
    for (const MessagePortFrame& frame : frames) {
        // Replies and notifications travel only towards remote ports; one sent to
        // a local port is ignored.
        if (frame.kind != MessagePortFrame::Kind::Message && frame.kind != MessagePortFrame::Kind::Request) continue;
        std::optional<Bytes> result;
        if (ReceiveCallback callback = callback_) result = callback(frame.messageId, frame.data);
        if (!self || !valid_) return;
        if (!guard || !findPeer(guard)) return;
        if (frame.kind == MessagePortFrame::Kind::Request) {
            MessagePortFrame reply;
            reply.kind = MessagePortFrame::Kind::Reply;
            reply.messageId = frame.messageId;
            if (result) reply.data = std::move(*result);
            if (!writeFrame(guard, reply.encode())) return;
        }
    }

    if (malformed) {
        ++malformed_;
        SystemLog::log(SystemLog::kError, "Message port %s: malformed frame from a peer (%s); connection closed",
                       name_.c_str(), reason.c_str());
        closePeer(socket);
        invalidateIfDeserted();
    }
}

void LocalMessagePort::peerGone(QLocalSocket* socket) {
    if (!findPeer(socket)) return;
    // Whatever the peer wrote before it closed is still delivered.
    QPointer<LocalMessagePort> self(this);
    QPointer<QLocalSocket> guard(socket);
    while (self && guard && valid_ && findPeer(guard) && guard->bytesAvailable() > 0) readPeer(guard);
    if (!self || !guard) return;
    closePeer(socket);
    invalidateIfDeserted();
}

void LocalMessagePort::invalidateIfDeserted() {
    if (valid_ && hadPeer_ && peers_.empty() && !staysValidWithoutPeers_) invalidate();
}

void LocalMessagePort::invalidate() {
    if (!valid_) return;
    valid_ = false;
    if (server_) {
        disconnect(server_, nullptr, this, nullptr);
        server_->close();
    }
    while (!peers_.empty()) closePeer(peers_.back()->socket);
    // A copy: the callback may clear it or delete the port.
    if (InvalidationCallback callback = invalidation_) callback(this);
}

int LocalMessagePort::broadcastNotification(int32_t messageId, ByteView data) {
    if (!valid_) return 0;
    MessagePortFrame frame;
    frame.kind = MessagePortFrame::Kind::Notification;
    frame.messageId = messageId;
    frame.data.assign(data.begin(), data.end());
    const Bytes bytes = frame.encode();
    // A copy: a peer that does not read is closed on the way.
    std::vector<QLocalSocket*> sockets;
    for (const auto& peer : peers_) sockets.push_back(peer->socket);
    QPointer<LocalMessagePort> self(this);  // closing a peer may invalidate the port, whose callback may delete it
    int queued = 0;
    for (QLocalSocket* socket : sockets) {
        if (!self || !valid_) break;
        if (findPeer(socket) && socket->state() == QLocalSocket::ConnectedState && writeFrame(socket, bytes)) ++queued;
    }
    return queued;
}

}  // namespace vantorel

// LocalMessagePort: a named local message port (QLocalServer) with a receive callback and an invalidation callback (docs/protocol.md).
#pragma once

#include "PropertyList/Value.h"

#include <QObject>

#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include <sys/types.h>

class QLocalServer;
class QLocalSocket;

namespace vantorel {

// Limits, so that no peer can make the port's process hold much: at most kMaxPeers
// connections (a connection beyond them is closed at once); what a peer's frames may
// buffer is bounded by MessagePortFrameDecoder (kOwnBytes each, the rest from the
// process-wide pool); and a peer that leaves more than kMaxUnsentBytes of replies and
// notifications unread gets no more. A peer over a limit is closed and counted.
class LocalMessagePort : public QObject {
    Q_OBJECT
public:
    static constexpr int kMaxPeers = 64;
    static constexpr int64_t kMaxUnsentBytes = 1 << 20;
    // Qt's read buffer of each connection, and the most read from it at a time.
    static constexpr int64_t kReadChunkBytes = 64 << 10;

    // Called for every Message or Request frame that arrives, on the thread that
    // created the port. The returned data is sent back as the Reply when the frame
    // was a Request (an empty optional sends an empty reply); ignored otherwise.
    using ReceiveCallback = std::function<std::optional<Bytes>(int32_t messageId, const Bytes& data)>;
    using InvalidationCallback = std::function<void(LocalMessagePort* port)>;

    // Why create() failed: a live port has the name; or the name cannot be a port at all
    // (empty, a NUL character, a relative name with a slash, a directory that does not
    // exist or takes no socket, an absolute path to a file that is not a socket, too long);
    // or the socket, its directory or the runtime directory belongs to another user.
    struct CreateFailure {
        bool nameInUse = false;
        bool foreign = false;  // another user's socket or directory is where the port would be
        // "the name is in use by a live port", "not a valid port name: <name> (<why>)",
        // "the directory <path> belongs to uid <n> (<user>), not to this user", ...
        std::string reason;
    };

    // Listens under `name`: a bare name in the user's runtime directory, or an absolute
    // socket path (PortDirectory). Null, with *failure set, when the name cannot be
    // listened on. A stale socket file of this user's, left by a dead process, is removed
    // first; under an absolute path, a file that is no socket is left alone. Only peers
    // of this user and root are served (PeerCredentials); others are closed at once.
    static std::unique_ptr<LocalMessagePort> create(const std::string& name, ReceiveCallback callback,
                                                    CreateFailure* failure = nullptr);
    ~LocalMessagePort() override;

    const std::string& name() const { return name_; }
    void setInvalidationCallback(InvalidationCallback callback);  // nullptr clears it
    bool isValid() const { return valid_; }
    // Stops listening, closes every peer and, if set, calls the invalidation
    // callback once. A port also invalidates itself when the last peer that had
    // connected goes away (the other side closed or died). A peer counts as having
    // connected once it sent one valid frame: a connection that only probes the
    // name (create() on a name in use) or sends nothing but garbage does not.
    void invalidate();
    // A service's well-known port serves clients that come and go: with true it
    // stays valid when its last peer leaves. Default false (the rule above).
    void setStaysValidWithoutPeers(bool stays) { staysValidWithoutPeers_ = stays; }
    // A port that serves one client needs fewer connections than kMaxPeers.
    void setMaxPeers(int peers) { maxPeers_ = peers; }
    // True once a connection was taken, even one that sent nothing yet.
    bool hadConnection() const { return hadConnection_; }
    // The socket file the port listens on (its name resolved as in docs/protocol.md).
    std::string socketPath() const;
    // Opens the port to a group (a lab service shared by its members): the socket file
    // becomes readable and writable by `group`, and peers of that group are served too.
    // False, with *error, when the file cannot be given to the group.
    bool shareWithGroup(gid_t group, std::string* error);

    // Pushes a Notification frame to every connected peer (the service's
    // notifications to its clients). Returns how many peers it was queued for.
    int broadcastNotification(int32_t messageId, ByteView data);

    // Frames from peers that were not valid frames (each closes its connection).
    uint64_t malformedFrames() const { return malformed_; }
    // Connections closed at once because kMaxPeers were connected.
    uint64_t refusedPeers() const { return refused_; }
    // Peers closed for going over a buffer limit.
    uint64_t overLimitPeers() const { return overLimit_; }
    // Connections closed at once because their process runs as another user.
    uint64_t foreignPeers() const { return foreign_; }

private:
    struct Peer;

    LocalMessagePort(std::string name, ReceiveCallback callback);
    bool listen(CreateFailure* failure);
    void acceptPeers();
    void readPeer(QLocalSocket* peer);
    void peerGone(QLocalSocket* peer);
    Peer* findPeer(QLocalSocket* socket) const;
    void closePeer(QLocalSocket* socket);
    void closeOverLimit(QLocalSocket* socket, const std::string& why);
    // Writes a frame to a connected peer; false when the peer does not read and was closed.
    bool writeFrame(QLocalSocket* socket, const Bytes& frame);
    void invalidateIfDeserted();

    std::string name_;
    ReceiveCallback callback_;
    InvalidationCallback invalidation_;
    QLocalServer* server_ = nullptr;
    std::vector<std::unique_ptr<Peer>> peers_;
    bool valid_ = true;
    bool hadPeer_ = false;
    bool hadConnection_ = false;
    bool staysValidWithoutPeers_ = false;
    int maxPeers_ = kMaxPeers;
    uint64_t malformed_ = 0;
    uint64_t refused_ = 0;
    uint64_t overLimit_ = 0;
    uint64_t foreign_ = 0;
    std::optional<gid_t> allowedGroup_;
};

}  // namespace vantorel

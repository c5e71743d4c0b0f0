// LocalMessagePort: a named local message port (QLocalServer) with a receive callback and an invalidation callback (docs/protocol.md).
#pragma once

#include "PropertyList/Value.h"

#include <QObject>

#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

class QLocalServer;
class QLocalSocket;

namespace vantorel {

class LocalMessagePort : public QObject {
    Q_OBJECT
public:
    // Called for every Message or Request frame that arrives, on the thread that
    // created the port. The returned data is sent back as the Reply when the frame
    // was a Request (an empty optional sends an empty reply); ignored otherwise.
    using ReceiveCallback = std::function<std::optional<Bytes>(int32_t messageId, const Bytes& data)>;
    using InvalidationCallback = std::function<void(LocalMessagePort* port)>;

    // Listens under `name` (a QLocalServer name). Null when the name cannot be
    // listened on (e.g. in use by a live port). A stale socket file left by a dead
    // process is removed first.
    static std::unique_ptr<LocalMessagePort> create(const std::string& name, ReceiveCallback callback);
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

    // Pushes a Notification frame to every connected peer (the service's
    // notifications to its clients). Returns how many peers it was queued for.
    int broadcastNotification(int32_t messageId, ByteView data);

    // Frames from peers that were not valid frames (each closes its connection).
    uint64_t malformedFrames() const { return malformed_; }

private:
    struct Peer;

    LocalMessagePort(std::string name, ReceiveCallback callback);
    bool listen();
    void acceptPeers();
    void readPeer(QLocalSocket* peer);
    void peerGone(QLocalSocket* peer);
    Peer* findPeer(QLocalSocket* socket) const;
    void closePeer(QLocalSocket* socket);
    void invalidateIfDeserted();

    std::string name_;
    ReceiveCallback callback_;
    InvalidationCallback invalidation_;
    QLocalServer* server_ = nullptr;
    std::vector<std::unique_ptr<Peer>> peers_;
    bool valid_ = true;
    bool hadPeer_ = false;
    bool staysValidWithoutPeers_ = false;
    uint64_t malformed_ = 0;
};

}  // namespace vantorel

// RemoteMessagePort: a remote message port looked up by name (QLocalSocket): requests with send and receive timeouts, validity, invalidation (docs/protocol.md).
#pragma once

#include "PropertyList/Value.h"

#include <QObject>

#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include <sys/types.h>

class QLocalSocket;

namespace vantorel {

struct MessagePortFrame;

class RemoteMessagePort : public QObject {
    Q_OBJECT
public:
    // Request results, as a message port's send status: 0 is success.
    enum Status : int32_t {
        Success = 0,
        SendTimeout = -1,
        ReceiveTimeout = -2,
        IsInvalid = -3,
        TransportError = -4,
        BecameInvalidError = -5,
    };
    // Qt's read buffer of the connection, and the most read from it at a time.
    static constexpr int64_t kReadChunkBytes = 64 << 10;
    // Notifications held for delivery at most; older ones are dropped.
    static constexpr size_t kMaxPendingNotifications = 64;
    using NotificationCallback = std::function<void(int32_t messageId, const Bytes& data)>;
    using InvalidationCallback = std::function<void(RemoteMessagePort* port)>;

    // Connects to the local port of that name (a bare name in the user's runtime
    // directory, or an absolute socket path); null when none answers within timeoutMs,
    // or when the process that answers runs as another user than this one, root, or a
    // member of allowedGroup (PeerCredentials): its data would be someone else's.
    static std::unique_ptr<RemoteMessagePort> lookup(const std::string& name, int timeoutMs = 1000,
                                                     std::optional<gid_t> allowedGroup = std::nullopt);
    ~RemoteMessagePort() override;

    const std::string& name() const { return name_; }
    // The socket file connected to (the name resolved as in docs/protocol.md).
    std::string socketPath() const;

    // Sends a Message (reply == nullptr) or a Request (reply != nullptr) frame and
    // blocks the calling thread: up to sendTimeout seconds for the write, then up
    // to receiveTimeout seconds for the Reply, which is stored in *reply. Frames
    // of other kinds read meanwhile are kept and delivered later.
    int32_t sendRequest(int32_t messageId, ByteView data, double sendTimeout, double receiveTimeout,
                        std::optional<Bytes>* reply);
    // Queues a Message frame without blocking (for streaming from an event loop);
    // false when the port is invalid.
    bool post(int32_t messageId, ByteView data);
    // Bytes queued but not yet written to the peer (back-pressure for streaming).
    int64_t bytesPending() const;

    bool isValid() const;
    void invalidate();  // closes the connection; calls the invalidation callback once if set
    void setInvalidationCallback(InvalidationCallback callback);
    // Notification frames pushed by the peer (the telephony service's notifications).
    void setNotificationCallback(NotificationCallback callback);

signals:
    // All queued bytes have been written (bytesPending() is 0).
    void drained();

private:
    explicit RemoteMessagePort(std::string name);
    void readAvailable();
    void deliverPending();
    // Reads what the socket holds: a Reply goes to *reply when one is awaited
    // (else it is stale and dropped), notifications are queued. False when the
    // stream was malformed (the connection is then closed).
    bool pump(std::optional<Bytes>* reply, bool* gotReply);
    bool take(const std::vector<MessagePortFrame>& frames, std::optional<Bytes>* reply, bool* gotReply);
    // A malformed or oversized stream: logs why, closes, invalidates from the event loop.
    void closeBroken(const char* what, const std::string& why);
    void scheduleDelivery();
    void peerClosed();
    void checkDrained();

    std::string name_;
    QLocalSocket* socket_ = nullptr;
    bool invalidated_ = false;
    InvalidationCallback invalidation_;
    NotificationCallback notification_;
    struct Impl;
    std::unique_ptr<Impl> impl_;
};

}  // namespace vantorel

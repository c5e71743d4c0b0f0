// ModemLink: the modem's end of the link a host reads it through (a pseudo-terminal or a TCP port), with a bounded output queue.
#pragma once

#include "PropertyList/Value.h"

#include <QObject>

#include <string>

class QTimer;

namespace vantorel {

// Output the host does not take piles up to kMaxPending bytes; beyond that, whole writes are
// dropped, as a modem drops what its host is too slow for. With trickle on, bytes go out one
// per event-loop turn, so the host reads them in pieces as small as a serial link cuts them.
class ModemLink : public QObject {
    Q_OBJECT
public:
    static constexpr size_t kMaxPending = 256 * 1024;
    // Past this much output waiting, a source that can wait should (drained() says when to go on).
    static constexpr size_t kHighWater = 64 * 1024;

    ~ModemLink() override;

    // What a host opens: "/dev/pts/N", "tcp:127.0.0.1:PORT".
    virtual std::string path() const = 0;
    // Queues bytes for the host; false (nothing queued) when the host is kMaxPending behind.
    bool write(ByteView bytes);
    size_t pending() const { return pending_.size() + buffered(); }
    void setTrickle(bool on) { trickle_ = on; }

signals:
    void received(const vantorel::Bytes& bytes);
    // Every byte queued has gone to the host.
    void drained();

protected:
    explicit ModemLink(QObject* parent = nullptr);
    // Hands bytes to the transport; returns how many it took (0: none now, flush() again when writable).
    virtual size_t put(const uint8_t* data, size_t size) = 0;
    // Bytes the transport holds that have not reached the host yet.
    virtual size_t buffered() const { return 0; }
    // Asks the transport to call flush() once it can take more.
    virtual void waitWritable(bool on) = 0;
    void flush();

private:
    Bytes pending_;
    bool trickle_ = false;
    QTimer* trickleTimer_ = nullptr;
};

}  // namespace vantorel

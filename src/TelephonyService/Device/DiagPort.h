// DiagPort: the byte pipe to a modem's diagnostic interface: a serial port, a plain character device, or a TCP bridge.
#pragma once

#include "PropertyList/Value.h"

#include <QObject>

#include <memory>
#include <string>

namespace vantorel {

// open() takes what --device names:
//   /dev/ttyUSB0, /dev/ttyHS0 ...  a tty: opened O_NOCTTY, put in raw mode (SerialDiagPort)
//   /dev/wwan0qcdm0 ...            a character device that is not a tty: read and written as it is
//   tcp:HOST:PORT                  the same HDLC byte stream over TCP (TcpDiagPort)
// Bytes arrive through `received` in chunks of any size; `closed` says the other end went away
// (unplugged, connection lost), after which the port is dead and a new one must be opened.
class DiagPort : public QObject {
    Q_OBJECT
public:
    // Bytes waiting to be written that a port keeps at most; beyond, write() fails (a modem that
    // takes nothing for that long is gone).
    static constexpr size_t kMaxPendingWrite = 1 << 20;

    // Null with *error set to a message that says what to do (no such device, the group to
    // join, the program holding the port, a bad tcp: address).
    static std::unique_ptr<DiagPort> open(const std::string& device, std::string* error);

    ~DiagPort() override;
    // Queues bytes for the modem; false when the port is closed or too far behind.
    virtual bool write(ByteView bytes) = 0;
    // Drops whatever the modem sent before now (a previous session's stream).
    virtual void discardPending() = 0;
    const std::string& name() const { return name_; }

signals:
    void received(const vantorel::Bytes& bytes);
    void closed(const std::string& why);

protected:
    explicit DiagPort(std::string name);

private:
    std::string name_;
};

}  // namespace vantorel

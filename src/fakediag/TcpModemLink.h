// TcpModemLink: the modem's end of a TCP link on the loopback interface, as a phone-side bridge forwards a DIAG port.
#pragma once

#include "fakediag/ModemLink.h"

#include <memory>
#include <string>

class QTcpServer;
class QTcpSocket;

namespace vantorel {

// One host at a time: a second connection is closed at once (a bridge serves one reader).
// While no host is connected, what the modem sends is thrown away, as a bridge does.
class TcpModemLink : public ModemLink {
    Q_OBJECT
public:
    // Listens on 127.0.0.1:port (0: any free port). Null with *error.
    static std::unique_ptr<TcpModemLink> listen(uint16_t port, std::string* error);
    ~TcpModemLink() override;

    // "tcp:127.0.0.1:PORT", as --device takes it.
    std::string path() const override;

protected:
    size_t put(const uint8_t* data, size_t size) override;
    size_t buffered() const override;
    void waitWritable(bool) override {}

private:
    explicit TcpModemLink(QTcpServer* server);
    void accept();

    QTcpServer* server_;
    QTcpSocket* host_ = nullptr;
};

}  // namespace vantorel

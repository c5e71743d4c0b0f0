// TcpDiagPort: a modem's DIAG byte stream forwarded over TCP by a phone-side bridge (tcp:HOST:PORT).
#pragma once

#include "TelephonyService/Device/DiagPort.h"

class QTcpSocket;

namespace vantorel {

class TcpDiagPort : public DiagPort {
    Q_OBJECT
public:
    static constexpr const char* kScheme = "tcp:";
    static constexpr int kConnectTimeoutMs = 2000;

    // "tcp:HOST:PORT" (HOST may be [v6]); connects, waiting at most kConnectTimeoutMs.
    static std::unique_ptr<DiagPort> open(const std::string& device, std::string* error);
    ~TcpDiagPort() override;

    bool write(ByteView bytes) override;
    void discardPending() override;

private:
    TcpDiagPort(std::string name, QTcpSocket* socket);
    QTcpSocket* socket_;
    bool closed_ = false;
};

}  // namespace vantorel

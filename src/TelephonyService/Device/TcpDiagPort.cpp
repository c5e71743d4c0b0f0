// TcpDiagPort: DIAG over a TCP connection, read from the event loop.
#include "TelephonyService/Device/TcpDiagPort.h"

#include "Platform/StringFormat.h"

#include <QTcpSocket>

namespace vantorel {

std::unique_ptr<DiagPort> TcpDiagPort::open(const std::string& device, std::string* error) {
    auto fail = [&](const std::string& why) -> std::unique_ptr<DiagPort> {
        if (error) *error = StringFormat::format("%s: %s", device.c_str(), why.c_str());
        return nullptr;
    };
    const std::string address = device.substr(std::string(kScheme).size());
    const size_t colon = address.rfind(':');
    if (colon == std::string::npos || colon == 0) return fail("give tcp:HOST:PORT, such as tcp:127.0.0.1:2500");
    std::string host = address.substr(0, colon);
    if (host.size() > 2 && host.front() == '[' && host.back() == ']') host = host.substr(1, host.size() - 2);
    bool ok = false;
    const uint port = QString::fromStdString(address.substr(colon + 1)).toUInt(&ok);
    if (!ok || port == 0 || port > 65535) return fail("the port must be a number from 1 to 65535");

    auto* socket = new QTcpSocket;
    socket->connectToHost(QString::fromStdString(host), static_cast<quint16>(port));
    if (!socket->waitForConnected(kConnectTimeoutMs)) {
        const std::string why = socket->error() == QAbstractSocket::SocketTimeoutError
                                    ? StringFormat::format("no connection within %d s", kConnectTimeoutMs / 1000)
                                    : socket->errorString().toStdString();
        delete socket;
        return fail(why + " (is the bridge running and the port forwarded?)");
    }
    socket->setSocketOption(QAbstractSocket::LowDelayOption, 1);
    return std::unique_ptr<DiagPort>(new TcpDiagPort(device, socket));
}

TcpDiagPort::TcpDiagPort(std::string name, QTcpSocket* socket) : DiagPort(std::move(name)), socket_(socket) {
    socket_->setParent(this);
    connect(socket_, &QTcpSocket::readyRead, this, [this] {
        const QByteArray data = socket_->readAll();
        if (!data.isEmpty()) emit received(Bytes(data.begin(), data.end()));
    });
    auto lost = [this] {
        if (closed_) return;
        closed_ = true;
        emit closed("the connection was closed: " + socket_->errorString().toStdString());
    };
    connect(socket_, &QTcpSocket::disconnected, this, lost);
    connect(socket_, &QTcpSocket::errorOccurred, this, lost);
}

TcpDiagPort::~TcpDiagPort() {
    disconnect(socket_, nullptr, this, nullptr);
    socket_->abort();
}

bool TcpDiagPort::write(ByteView bytes) {
    if (closed_ || socket_->bytesToWrite() > static_cast<qint64>(kMaxPendingWrite)) return false;
    return socket_->write(reinterpret_cast<const char*>(bytes.data()), static_cast<qint64>(bytes.size())) ==
           static_cast<qint64>(bytes.size());
}

void TcpDiagPort::discardPending() {
    socket_->readAll();
}

}  // namespace vantorel

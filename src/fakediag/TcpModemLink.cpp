// TcpModemLink: a loopback TCP server that carries a fake modem's byte stream to one host.
#include "fakediag/TcpModemLink.h"

#include "Platform/StringFormat.h"

#include <QTcpServer>
#include <QTcpSocket>

namespace vantorel {

std::unique_ptr<TcpModemLink> TcpModemLink::listen(uint16_t port, std::string* error) {
    auto* server = new QTcpServer;
    if (!server->listen(QHostAddress::LocalHost, port)) {
        *error = StringFormat::format("cannot listen on 127.0.0.1:%u: %s", unsigned(port),
                                      server->errorString().toStdString().c_str());
        delete server;
        return nullptr;
    }
    return std::unique_ptr<TcpModemLink>(new TcpModemLink(server));
}

TcpModemLink::TcpModemLink(QTcpServer* server) : server_(server) {
    server_->setParent(this);
    connect(server_, &QTcpServer::newConnection, this, &TcpModemLink::accept);
}

TcpModemLink::~TcpModemLink() {
    if (host_) {
        disconnect(host_, nullptr, this, nullptr);
        host_->abort();
    }
}

std::string TcpModemLink::path() const {
    return StringFormat::format("tcp:127.0.0.1:%u", unsigned(server_->serverPort()));
}

void TcpModemLink::accept() {
    while (QTcpSocket* socket = server_->nextPendingConnection()) {
        if (host_) {
            socket->abort();
            socket->deleteLater();
            continue;
        }
        host_ = socket;
        host_->setSocketOption(QAbstractSocket::LowDelayOption, 1);
        connect(host_, &QTcpSocket::readyRead, this, [this] {
            const QByteArray data = host_->readAll();
            if (!data.isEmpty()) emit received(Bytes(data.begin(), data.end()));
        });
        connect(host_, &QTcpSocket::bytesWritten, this, [this] { flush(); });
        connect(host_, &QTcpSocket::disconnected, this, [this] {
            host_->deleteLater();
            host_ = nullptr;
            flush();  // what was waiting for this host goes nowhere
        });
    }
}

size_t TcpModemLink::put(const uint8_t* data, size_t size) {
    if (!host_) return size;  // nobody listening: gone
    const qint64 n = host_->write(reinterpret_cast<const char*>(data), static_cast<qint64>(size));
    return n > 0 ? static_cast<size_t>(n) : 0;
}

size_t TcpModemLink::buffered() const {
    return host_ ? static_cast<size_t>(host_->bytesToWrite()) : 0;
}

}  // namespace vantorel

// MessagePortTestHarness: helpers for the message-port tests: a server thread with its own event loop, unique port names, waiting on the event loop.
#pragma once

#include "Platform/LocalMessagePort.h"
#include "Platform/StringFormat.h"

#include <QCoreApplication>
#include <QDeadlineTimer>
#include <QThread>

#include <atomic>
#include <functional>
#include <memory>
#include <string>
#include <unistd.h>

#include "support/EventLoopWait.h"
#include <vector>

namespace vantorel::test {

using vantorel::testing::uniquePortName;
using vantorel::testing::waitUntil;

// The server side of a loopback test: blocking waits of a RemoteMessagePort on the
// test thread need the LocalMessagePort to be served by another thread's event loop.
class ServerThread {
public:
    ServerThread() {
        thread_.start();
        context_ = new QObject;
        context_->moveToThread(&thread_);
    }
    ~ServerThread() {
        run([this] { ports_.clear(); });
        thread_.quit();
        thread_.wait();
        delete context_;
    }
    ServerThread(const ServerThread&) = delete;
    ServerThread& operator=(const ServerThread&) = delete;

    // Runs f on the server thread and waits for it.
    void run(const std::function<void()>& f) {
        QMetaObject::invokeMethod(context_, f, Qt::BlockingQueuedConnection);
    }
    // Creates a port on the server thread; owned by this object (destroyed on that thread).
    LocalMessagePort* create(const std::string& name, LocalMessagePort::ReceiveCallback callback) {
        LocalMessagePort* out = nullptr;
        run([&] {
            auto port = LocalMessagePort::create(name, std::move(callback));
            out = port.get();
            if (port) ports_.push_back(std::move(port));
        });
        return out;
    }
    void destroy(LocalMessagePort* port) {
        run([&] { std::erase_if(ports_, [port](const auto& p) { return p.get() == port; }); });
    }
    int peerCount(LocalMessagePort* port) {
        int n = 0;
        run([&] { n = port->peerCount(); });
        return n;
    }
    bool isValid(LocalMessagePort* port) {
        bool valid = false;
        run([&] { valid = port->isValid(); });
        return valid;
    }
    QThread* thread() { return &thread_; }

private:
    QThread thread_;
    QObject* context_ = nullptr;
    std::vector<std::unique_ptr<LocalMessagePort>> ports_;  // touched only on the server thread
};

}  // namespace vantorel::test

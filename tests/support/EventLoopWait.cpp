// EventLoopWait: waiting on the Qt event loop in tests.
#include "support/EventLoopWait.h"

#include <QCoreApplication>
#include <QDeadlineTimer>
#include <QThread>

#include <atomic>

namespace vantorel::testing {

bool waitUntil(const std::function<bool()>& done, int timeoutMs) {
    QDeadlineTimer deadline(timeoutMs);
    while (!done()) {
        if (deadline.hasExpired()) return done();
        QCoreApplication::processEvents(QEventLoop::AllEvents, 5);
        QThread::msleep(1);
    }
    return true;
}

void spin(int ms) {
    waitUntil([] { return false; }, ms);
}

std::string uniquePortName(const std::string& tag) {
    static std::atomic<int> counter{0};
    return "vantorel.test." + tag + "." + std::to_string(QCoreApplication::applicationPid()) + "." +
           std::to_string(++counter);
}

}  // namespace vantorel::testing

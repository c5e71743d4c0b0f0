// EventLoopWait: shared test helpers for code driven by the Qt event loop: wait for a condition, run the loop a while, unique port names.
#pragma once

#include <QCoreApplication>
#include <QDeadlineTimer>
#include <QThread>

#include <atomic>
#include <functional>
#include <string>

namespace vantorel::testing {

// Runs this thread's event loop in short slices until done() holds or timeoutMs passed; returns done().
inline bool waitUntil(const std::function<bool()>& done, int timeoutMs = 2000) {
    QDeadlineTimer deadline(timeoutMs);
    while (!done()) {
        if (deadline.hasExpired()) return done();
        QCoreApplication::processEvents(QEventLoop::AllEvents, 5);
        QThread::msleep(1);
    }
    return true;
}

// Runs this thread's event loop for ms milliseconds.
inline void spin(int ms) { waitUntil([] { return false; }, ms); }

// "vantorel.test.<tag>.<pid>.<n>": unique per process and per call.
inline std::string uniquePortName(const std::string& tag) {
    static std::atomic<int> counter{0};
    return "vantorel.test." + tag + "." + std::to_string(QCoreApplication::applicationPid()) + "." +
           std::to_string(++counter);
}

}  // namespace vantorel::testing

// TelephonyServiceThread: runs a TelephonyService on a thread of its own with its own event loop, so a program can embed the service while its main thread blocks on GetTechnology.
#pragma once

#include "TelephonyService/TelephonyService.h"

#include <condition_variable>
#include <functional>
#include <memory>
#include <mutex>
#include <string>

class QThread;

namespace vantorel {

// start() creates the service on the new thread and returns once it listens (true) or
// failed (false, *error says why); stop() stops the service there, ends the thread's
// event loop and joins it. Both, and counters() / invoke(), are called from the thread
// that owns this object; the status callback runs on the service's thread.
class TelephonyServiceThread {
public:
    explicit TelephonyServiceThread(TelephonyServiceOptions options);
    ~TelephonyServiceThread();  // stop()
    TelephonyServiceThread(const TelephonyServiceThread&) = delete;
    TelephonyServiceThread& operator=(const TelephonyServiceThread&) = delete;

    // Set before start().
    void setStatusCallback(TelephonyService::StatusCallback callback) { status_ = std::move(callback); }

    bool start(std::string* error = nullptr);
    void stop();
    bool isRunning() const;

    // The well-known port name and the startup line (valid after a successful start()).
    std::string portName() const;
    std::string startupLine() const;
    // A snapshot taken on the service's thread; after stop(), the final counts.
    TelephonyService::Counters counters() const;
    // Runs fn on the service's thread with the service and waits for it; false when
    // the service is not running.
    bool invoke(const std::function<void(TelephonyService&)>& fn) const;

private:
    class Runner;
    void run();

    TelephonyServiceOptions options_;
    TelephonyService::StatusCallback status_;
    std::unique_ptr<Runner> thread_;

    mutable std::mutex mutex_;
    std::condition_variable ready_;
    bool started_ = false;  // the thread has reported the start's outcome
    bool listening_ = false;
    std::string error_;
    std::string portName_;
    std::string startupLine_;
    TelephonyService* service_ = nullptr;  // lives on the thread's stack while it runs
    TelephonyService::Counters final_;
};

}  // namespace vantorel

// TelephonyServiceThread: the embedded service on its own QThread and event loop.
#include "TelephonyService/TelephonyServiceThread.h"

#include <QMetaObject>
#include <QThread>

namespace vantorel {

// QThread whose run() is the service's whole life; exec() is protected, hence the subclass.
class TelephonyServiceThread::Runner : public QThread {
public:
    explicit Runner(TelephonyServiceThread* owner) : owner_(owner) {}
    int runEventLoop() { return exec(); }

protected:
    void run() override { owner_->run(); }

private:
    TelephonyServiceThread* owner_;
};

TelephonyServiceThread::TelephonyServiceThread(TelephonyServiceOptions options) : options_(std::move(options)) {}

TelephonyServiceThread::~TelephonyServiceThread() {
    stop();
}

bool TelephonyServiceThread::start(std::string* error) {
    if (isRunning()) return true;
    stop();  // joins a thread whose service failed to start, if any
    {
        std::lock_guard<std::mutex> lock(mutex_);
        started_ = false;
        listening_ = false;
        error_.clear();
    }
    thread_ = std::make_unique<Runner>(this);
    thread_->setObjectName(QStringLiteral("TelephonyService"));
    thread_->start();
    std::unique_lock<std::mutex> lock(mutex_);
    ready_.wait(lock, [this] { return started_; });
    if (!listening_) {
        if (error) *error = error_;
        lock.unlock();
        thread_->wait();
        thread_.reset();
        return false;
    }
    return true;
}

void TelephonyServiceThread::run() {
    TelephonyService service(options_);
    if (status_) service.setStatusCallback(status_);
    std::string error;
    const bool ok = service.start(&error);
    {
        std::lock_guard<std::mutex> lock(mutex_);
        started_ = true;
        listening_ = ok;
        error_ = error;
        portName_ = service.portName();
        startupLine_ = ok ? service.startupLine() : std::string();
        service_ = ok ? &service : nullptr;
    }
    ready_.notify_all();
    if (!ok) return;
    thread_->runEventLoop();  // until stop() quits it
    service.stop();
    std::lock_guard<std::mutex> lock(mutex_);
    final_ = service.counters();
    service_ = nullptr;
    listening_ = false;
}

void TelephonyServiceThread::stop() {
    if (!thread_) return;
    // The service stops while its event loop still runs: a modem's backend waits there for
    // the replies to its clearing sequence, and a thread told to quit runs no loop again.
    invoke([](TelephonyService& service) { service.stop(); });
    thread_->quit();  // honoured even when the loop has not begun yet
    thread_->wait();
    thread_.reset();
}

bool TelephonyServiceThread::isRunning() const {
    std::lock_guard<std::mutex> lock(mutex_);
    return service_ != nullptr;
}

std::string TelephonyServiceThread::portName() const {
    std::lock_guard<std::mutex> lock(mutex_);
    return portName_;
}

std::string TelephonyServiceThread::startupLine() const {
    std::lock_guard<std::mutex> lock(mutex_);
    return startupLine_;
}

bool TelephonyServiceThread::invoke(const std::function<void(TelephonyService&)>& fn) const {
    TelephonyService* service = nullptr;
    {
        std::lock_guard<std::mutex> lock(mutex_);
        service = service_;
    }
    // Only the owning thread calls stop(), so the service cannot go away during the call.
    if (!service) return false;
    QMetaObject::invokeMethod(service, [&] { fn(*service); }, Qt::BlockingQueuedConnection);
    return true;
}

TelephonyService::Counters TelephonyServiceThread::counters() const {
    TelephonyService::Counters counters;
    if (invoke([&counters](TelephonyService& service) { counters = service.counters(); })) return counters;
    std::lock_guard<std::mutex> lock(mutex_);
    return final_;
}

}  // namespace vantorel

// GpsPosition: libgps on a QSocketNotifier: one gps_read per ready report, reconnection on a timer.
#include "Monitor/GpsPosition.h"

#include "Platform/SystemLog.h"

#include <QSocketNotifier>
#include <QTimer>

#include <gps.h>

#include <cerrno>
#include <cmath>
#include <fcntl.h>

namespace vantorel {

namespace {
// libgps parses one report per gps_read and keeps the rest buffered, so a wake-up reads
// until gps_waiting says nothing is left, at most this many (more at the next one).
constexpr int kReportsPerWakeUp = 64;
}  // namespace

GpsPosition::GpsPosition(std::string host, std::string port, QObject* parent)
    : QObject(parent), host_(std::move(host)), port_(std::move(port)) {
    retry_ = new QTimer(this);
    retry_->setSingleShot(true);
    retry_->setInterval(std::chrono::duration_cast<std::chrono::milliseconds>(kRetryInterval));
    connect(retry_, &QTimer::timeout, this, [this] { connectToGpsd(); });
}

GpsPosition::~GpsPosition() {
    // No WATCH_DISABLE: gpsd ends the watch when the socket closes, and a write to a
    // gpsd that has just gone would raise SIGPIPE.
    if (data_) {
        delete notifier_;
        gps_close(data_.get());
    }
}

void GpsPosition::start() {
    if (!data_) connectToGpsd();
}

void GpsPosition::connectToGpsd() {
    auto data = std::make_unique<gps_data_t>();
    if (gps_open(host_.c_str(), port_.c_str(), data.get()) != 0) {
        // Said once: without gpsd the session simply has no position.
        if (!unavailableLogged_)
            SystemLog::log(SystemLog::kWarning, "No gpsd at %s:%s (%s): no position; trying again every %llds",
                           host_.c_str(), port_.c_str(), gps_errstr(errno),
                           static_cast<long long>(kRetryInterval.count()));
        unavailableLogged_ = true;
        retry_->start();
        return;
    }
    if (gps_stream(data.get(), WATCH_ENABLE | WATCH_JSON, nullptr) != 0) {
        gps_close(data.get());
        retry_->start();
        return;
    }
    // gps_read receives when its buffer holds no whole report: on a non-blocking socket
    // a half-received report ends the wake-up instead of waiting for the rest.
    const int flags = ::fcntl(data->gps_fd, F_GETFL);
    if (flags >= 0) ::fcntl(data->gps_fd, F_SETFL, flags | O_NONBLOCK);
    data_ = std::move(data);
    unavailableLogged_ = false;
    SystemLog::log(SystemLog::kNotice, "Reading positions from gpsd at %s:%s", host_.c_str(), port_.c_str());
    notifier_ = new QSocketNotifier(static_cast<qintptr>(data_->gps_fd), QSocketNotifier::Read, this);
    connect(notifier_, &QSocketNotifier::activated, this, [this] { readReports(); });
}

void GpsPosition::readReports() {
    for (int i = 0; i < kReportsPerWakeUp; ++i) {
        data_->set = 0;
        errno = 0;
        if (gps_read(data_.get(), nullptr, 0) < 0) {
            if (errno == EAGAIN || errno == EWOULDBLOCK || errno == EINTR) return;
            disconnect("gpsd closed the connection");
            return;
        }
        if (data_->set & MODE_SET) {
            const gps_fix_t& fix = data_->fix;
            if (fix.mode >= MODE_2D && std::isfinite(fix.latitude) && std::isfinite(fix.longitude)) {
                position_ = SignalCsvWriter::Position{fix.latitude, fix.longitude,
                                                      std::isfinite(fix.speed) ? std::optional(fix.speed) : std::nullopt};
                positionAt_ = std::chrono::steady_clock::now();
            } else {
                position_.reset();
            }
        }
        if (!gps_waiting(data_.get(), 0)) return;
    }
}

void GpsPosition::disconnect(const char* why) {
    SystemLog::log(SystemLog::kWarning, "gpsd: %s; trying again every %llds", why,
                   static_cast<long long>(kRetryInterval.count()));
    delete notifier_;
    notifier_ = nullptr;
    gps_close(data_.get());
    data_.reset();
    position_.reset();
    unavailableLogged_ = true;
    retry_->start();
}

std::optional<SignalCsvWriter::Position> GpsPosition::position() const {
    if (!position_ || std::chrono::steady_clock::now() - positionAt_ > kFixLifetime) return std::nullopt;
    return position_;
}

}  // namespace vantorel
